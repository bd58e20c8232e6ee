// Product data: the 64 report templates a Halden installation ships, 16 report families in four
// output forms each. Lookups go through a case-folded hash set built once, on first use.

#include "edition/standard_templates.h"

#include <string>
#include <unordered_set>

#include "foundation/string/string_base.h"

// Kept family by family, the four forms in a fixed order.
const char* const kHaldenStandardTemplates[] = {
    "CompleteSummary_doc.mss",  "CompleteSummary_htm.mss",  "CompleteSummary_txt.mss",
    "CompleteSummary_xls.mss",  "ExecutiveSummary_doc.mss", "ExecutiveSummary_htm.mss",
    "ExecutiveSummary_txt.mss", "ExecutiveSummary_xls.mss", "TopPages_doc.mss",
    "TopPages_htm.mss",         "TopPages_txt.mss",         "TopPages_xls.mss",
    "EntryPages_doc.mss",       "EntryPages_htm.mss",       "EntryPages_txt.mss",
    "EntryPages_xls.mss",       "ExitPages_doc.mss",        "ExitPages_htm.mss",
    "ExitPages_txt.mss",        "ExitPages_xls.mss",        "Referrers_doc.mss",
    "Referrers_htm.mss",        "Referrers_txt.mss",        "Referrers_xls.mss",
    "SearchEngines_doc.mss",    "SearchEngines_htm.mss",    "SearchEngines_txt.mss",
    "SearchEngines_xls.mss",    "SearchPhrases_doc.mss",    "SearchPhrases_htm.mss",
    "SearchPhrases_txt.mss",    "SearchPhrases_xls.mss",    "Browsers_doc.mss",
    "Browsers_htm.mss",         "Browsers_txt.mss",         "Browsers_xls.mss",
    "Platforms_doc.mss",        "Platforms_htm.mss",        "Platforms_txt.mss",
    "Platforms_xls.mss",        "Visitors_doc.mss",         "Visitors_htm.mss",
    "Visitors_txt.mss",         "Visitors_xls.mss",         "Countries_doc.mss",
    "Countries_htm.mss",        "Countries_txt.mss",        "Countries_xls.mss",
    "Downloads_doc.mss",        "Downloads_htm.mss",        "Downloads_txt.mss",
    "Downloads_xls.mss",        "ServerErrors_doc.mss",     "ServerErrors_htm.mss",
    "ServerErrors_txt.mss",     "ServerErrors_xls.mss",     "HourlyActivity_doc.mss",
    "HourlyActivity_htm.mss",   "HourlyActivity_txt.mss",   "HourlyActivity_xls.mss",
    "DailyActivity_doc.mss",    "DailyActivity_htm.mss",    "DailyActivity_txt.mss",
    "DailyActivity_xls.mss",    "",
};

namespace {

const std::unordered_set<std::string>& FoldedStandardTemplates() {
  static const std::unordered_set<std::string>* names = [] {
    auto* set = new std::unordered_set<std::string>();
    for (const char* const* name = kHaldenStandardTemplates; **name != '\0'; ++name) {
      set->insert(vxFoldCase(*name));
    }
    return set;
  }();
  return *names;
}

}  // namespace

int IsHaldenStandardTemplate(const char* name) {
  if (name == nullptr) return 0;
  return FoldedStandardTemplates().count(vxFoldCase(name)) != 0 ? 1 : 0;
}
