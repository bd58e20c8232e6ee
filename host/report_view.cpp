// Reads the report back through the JSON reader and lays it out in columns.

#include "host/report_view.h"

#include "foundation/string/json_text.h"
#include "migrate/run_record.h"

namespace {

using Kind = vxJsonValue::Kind;

// A value as the terminal should show it: control bytes (a line feed, an escape sequence read
// from a settings file) as \n, \r, \t or \xNN, so that a value can neither break the layout
// nor drive the terminal. An empty value says so.
std::string Shown(const std::string& value) {
  if (value.empty()) return "(empty)";
  std::string shown;
  for (unsigned char c : value) {
    if (c == '\n') {
      shown += "\\n";
    } else if (c == '\r') {
      shown += "\\r";
    } else if (c == '\t') {
      shown += "\\t";
    } else if (c < 0x20 || c == 0x7f) {
      char hex[5];
      snprintf(hex, sizeof hex, "\\x%02x", c);
      shown += hex;
    } else {
      shown += static_cast<char>(c);
    }
  }
  return shown;
}

void PrintConflicts(const vxJsonValue& report, FILE* out) {
  long total = report["summary"]["conflicts"].number;
  fprintf(out, "Conflicts (both held the key; the destination's value was kept): %lld\n",
          static_cast<long long>(total));
  for (const vxJsonValue& merge : report["merges"].items) {
    if (merge["conflicts"].items.empty()) continue;
    fprintf(out, "  %s  (from %s)\n", merge["file"].text.c_str(), merge["source"].text.c_str());
    for (const vxJsonValue& c : merge["conflicts"].items) {
      fprintf(out, "    [%s] %s\n      source: %s\n      kept:   %s\n",
              Shown(c["section"].text).c_str(), Shown(c["key"].text).c_str(),
              Shown(c["source"].text).c_str(), Shown(c["kept"].text).c_str());
    }
  }
}

void PrintSummary(const vxJsonValue& report, FILE* out) {
  const vxJsonValue& s = report["summary"];
  fprintf(out,
          "Files: %lld created, %lld replaced, %lld merged, %lld converted, %lld kept, %lld removed\n"
          "Notices: %lld  Errors: %lld\n",
          s["created"].number, s["replaced"].number, s["merged"].number, s["converted"].number,
          s["kept"].number, s["removed"].number, s["notices"].number, s["errors"].number);
}

void PrintTexts(const char* title, const vxJsonValue& texts, FILE* out) {
  if (texts.items.empty()) return;
  fprintf(out, "%s:\n", title);
  for (const vxJsonValue& text : texts.items) fprintf(out, "  %s\n", text.text.c_str());
}

}  // namespace

bool PrintReport(const std::string& text, ReportParts parts, FILE* out) {
  vxJsonValue report;
  if (!vxJsonParse(text, report) || report.kind != Kind::kObject ||
      report["schema"].number != kRunReportSchema) {
    return false;
  }
  PrintConflicts(report, out);
  if (parts == ReportParts::kWhole) {
    fprintf(out, "Files:\n");
    for (const vxJsonValue& file : report["files"].items) {
      fprintf(out, "  %-9s %s", file["action"].text.c_str(), file["path"].text.c_str());
      if (!file["source"].text.empty()) fprintf(out, "  (from %s)", file["source"].text.c_str());
      fputc('\n', out);
    }
    long long added = 0;
    for (const vxJsonValue& merge : report["merges"].items) added += merge["added"].items.size();
    fprintf(out, "Keys added by INI merges: %lld\n", added);
    PrintTexts("Notices", report["notices"], out);
    PrintTexts("Errors", report["errors"], out);
  }
  PrintSummary(report, out);
  return true;
}
