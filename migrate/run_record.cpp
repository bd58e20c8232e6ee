// The run's record: the doors' observer, the merges' observer and the log's reader, and the
// report they make. A file's action is decided at the end, from its state before the run's first
// change to it and its state now, so a copy that found its destination in place reads "kept".

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "migrate/run_record.h"

#include <stdlib.h>
#include <strings.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <vector>

#include "crypt/previous_generation.h"
#include "crypt/protected_value.h"
#include "foundation/files/path_text.h"
#include "foundation/string/json_text.h"

namespace {

const char kLogName[] = "vxmigrate.log";

std::string RealFolder(const std::string& folder) {
  std::string real;
  return vxfiles::RealPath(folder, real) ? real : "";
}

bool Below(const std::string& path, const std::string& folder, std::string& relative) {
  if (folder.empty() || path.size() <= folder.size() + 1 ||
      path.compare(0, folder.size(), folder) != 0 || path[folder.size()] != '/') {
    return false;
  }
  relative = path.substr(folder.size() + 1);
  return true;
}

bool StartsWith(const std::string& text, const char* start) {
  return text.compare(0, strlen(start), start) == 0;
}

// Steps that rewrite a file for the other edition name it after their fixed text (the target
// after " to " when both are named).
const char* const kConversionTexts[] = {"MSS to WCT conversion: ", "Profile file copied: ",
                                        "Profile copied: "};

const char* const kMergeTexts[] = {"Data File Merged: ", "Advanced option file migrated: "};

std::string Trimmed(std::string text) {
  while (!text.empty() && text.front() == ' ') text.erase(0, 1);
  while (!text.empty() && text.back() == ' ') text.pop_back();
  return text;
}

void AppendMember(std::string& out, const char* name, const std::string& value, bool comma = true) {
  if (comma) out += ", ";
  vxJsonAppendString(out, name);
  out += ": ";
  vxJsonAppendString(out, value);
}

void AppendTexts(std::string& out, const char* name, const std::vector<std::string>& texts) {
  out += ",\n  ";
  vxJsonAppendString(out, name);
  out += ": [";
  for (size_t i = 0; i < texts.size(); ++i) {
    out += i == 0 ? "\n    " : ",\n    ";
    vxJsonAppendString(out, texts[i]);
  }
  out += texts.empty() ? "]" : "\n  ]";
}

bool IsPrintableText(const std::string& text) {
  return std::all_of(text.begin(), text.end(), [](char c) { return c >= 0x20 && c < 0x7f; });
}

// A value in one of the forms old installations store user names and passwords in. Stored user
// names sit under keys that do not say so ("SmtpUser", "Account"), so the form must tell. Both
// older forms read back to the clear text without a key: showing them would show the password.
//   protected:           "D9" ... "AB"
//   previous generation: 80 hexadecimal digits
//   legacy:              text XORed with a fixed pad; it holds bytes no one types and reads back
//                        as printable text (a value of three characters or fewer may print
//                        plainly and is not recognised)
// A setting that merely looks like one of them is masked too: hiding it loses nothing.
bool IsStoredCredential(std::string value) {
  if (value.empty()) return false;
  if (VXUI_IsOurTwoFish(value.data()) == 1) return true;
  char clear[vxcrypt::kPreviousGenerationMaxValue + 1];
  if (value.size() == vxcrypt::kPreviousGenerationDigits &&
      vxcrypt::DecodePreviousGeneration(value.data(), clear)) {
    return true;
  }
  if (IsPrintableText(value) || value.find('\0') != std::string::npos) return false;
  const size_t size = value.size();
  Obsolete_EncodePasswordOrUserName(value.data());  // its own inverse
  return strlen(value.c_str()) == size && IsPrintableText(value);
}

}  // namespace

std::string vxReportValue(std::string_view key, std::string_view value) {
  // An empty value hides nothing, and a credential the merge left empty must read as empty.
  if (value.empty()) return "";
  std::string keyText(key);
  for (char& c : keyText) c = static_cast<char>(tolower(static_cast<unsigned char>(c)));
  const bool namedSecret = keyText.find("password") != std::string::npos ||
                           keyText.find("passwd") != std::string::npos;
  std::string valueText(value);
  if (namedSecret || IsStoredCredential(valueText)) return "<protected>";
  return valueText;
}

class vxRunRecord::MergeRecord : public vxIniMergeObserver {
 public:
  MergeRecord(std::string file, std::string source)
      : file_(std::move(file)), source_(std::move(source)) {}

  void KeyAdded(std::string_view section, std::string_view key, std::string_view value) override {
    added_.push_back({std::string(section), std::string(key), vxReportValue(key, value), ""});
  }
  void KeyConflict(std::string_view section, std::string_view key, std::string_view otherValue,
                   std::string_view keptValue) override {
    conflicts_.push_back({std::string(section), std::string(key), vxReportValue(key, otherValue),
                          vxReportValue(key, keptValue)});
  }

  const std::string& File() const { return file_; }
  size_t Conflicts() const { return conflicts_.size(); }

  void AppendJson(std::string& out) const {
    out += "{";
    AppendMember(out, "file", file_, false);
    AppendMember(out, "source", source_);
    out += ",\n     \"added\": [";
    for (size_t i = 0; i < added_.size(); ++i) {
      out += i == 0 ? "\n      {" : ",\n      {";
      AppendMember(out, "section", added_[i].section, false);
      AppendMember(out, "key", added_[i].key);
      AppendMember(out, "value", added_[i].source);
      out += "}";
    }
    out += "],\n     \"conflicts\": [";
    for (size_t i = 0; i < conflicts_.size(); ++i) {
      out += i == 0 ? "\n      {" : ",\n      {";
      AppendMember(out, "section", conflicts_[i].section, false);
      AppendMember(out, "key", conflicts_[i].key);
      AppendMember(out, "source", conflicts_[i].source);
      AppendMember(out, "kept", conflicts_[i].kept);
      out += "}";
    }
    out += "]}";
  }

 private:
  struct Key {
    std::string section, key, source, kept;
  };
  std::string file_, source_;
  std::vector<Key> added_, conflicts_;
};

vxRunRecord::vxRunRecord(const std::string& source, const std::string& destination,
                         const std::string& shownDestination, bool keepJournal)
    : sourceReal_(RealFolder(source)),
      destinationReal_(RealFolder(destination)),
      destinationText_(destination),
      shownDestination_(shownDestination) {
  while (destinationText_.size() > 1 && destinationText_.back() == '/') destinationText_.pop_back();
  if (keepJournal && !destinationReal_.empty()) {
    journal_ = std::make_unique<vxRunJournal>(destinationReal_, sourceReal_);
    if (!journal_->IsOpen()) journal_.reset();
  }
}

vxRunRecord::~vxRunRecord() = default;

std::string vxRunRecord::RealEntry(std::string_view path) const {
  std::string real;
  return realPaths_.Entry(path, real) ? real : "";
}

bool vxRunRecord::DestinationRelative(std::string_view path, std::string& relative) const {
  return Below(RealEntry(path), destinationReal_, relative);
}

vxRunRecord::FileRecord& vxRunRecord::Touch(const std::string& relative) {
  auto found = files_.find(relative);
  if (found != files_.end()) return found->second;
  FileRecord& file = files_[relative];
  struct stat st;
  if (lstat((destinationReal_ + "/" + relative).c_str(), &st) == 0) {
    file.existed = true;
    file.dev = st.st_dev;
    file.ino = st.st_ino;
    file.size = st.st_size;
    file.mtime = st.st_mtim.tv_sec * 1000000000LL + st.st_mtim.tv_nsec;
  }
  file.source = lastSourceRead_;
  return file;
}

bool vxRunRecord::BeforeWrite(std::string_view path, Change change) {
  if (journal_ != nullptr) {
    const bool kept = change == Change::kInto ? journal_->BeforeFolder(path)
                                              : journal_->BeforeEntry(path, change == Change::kInPlace);
    if (!kept) return false;
  }
  std::string relative;
  if (change != Change::kInto && DestinationRelative(path, relative)) Touch(relative);
  return true;
}

bool vxRunRecord::BeforeWriteAt(int dirFd, const char* name) {
  char link[64];
  snprintf(link, sizeof link, "/proc/self/fd/%d", dirFd);
  std::vector<char> folder(4096);
  ssize_t n = readlink(link, folder.data(), folder.size());
  if (n <= 0 || static_cast<size_t>(n) >= folder.size()) return false;
  return BeforeWrite(std::string(folder.data(), static_cast<size_t>(n)) + "/" + name,
                     Change::kEntry);
}

void vxRunRecord::AfterReadAdmitted(std::string_view path) {
  std::string relative;
  if (Below(RealEntry(path), sourceReal_, relative)) lastSourceRead_ = relative;
}

void vxRunRecord::NoteEntry(const std::string& entry) {
  if (StartsWith(entry, "Error: ")) {
    errors_.push_back(Shown(entry));
  } else if (StartsWith(entry, "** ") && !StartsWith(entry, "** See VXMigrate Log File")) {
    notices_.push_back(Shown(entry));
  }
  for (const char* text : kConversionTexts) {
    if (!StartsWith(entry, text)) continue;
    std::string target = entry.substr(strlen(text));
    size_t to = target.rfind(" to ");
    if (to != std::string::npos) target = target.substr(to + 4);
    std::string relative;
    if (DestinationRelative(Trimmed(target), relative)) Touch(relative).converted = true;
  }
  // Merges that rewrite their file themselves (not through the INI model's merge) name it.
  for (const char* text : kMergeTexts) {
    if (!StartsWith(entry, text)) continue;
    std::string named = Trimmed(entry.substr(strlen(text)));
    // Settings names are written relative to the installation ("\\adviews.txt").
    if (!named.empty() && named[0] != '/') {
      for (char& c : named) c = c == '\\' ? '/' : c;
      named = destinationText_ + (named[0] == '/' ? "" : "/") + named;
    }
    std::string relative;
    if (DestinationRelative(named, relative)) {
      mergedNamed_.insert(relative);
    } else if (Below(RealEntry(named), sourceReal_, relative)) {
      for (auto& [path, file] : files_) {
        if (file.source == relative) file.merged = true;
      }
    }
  }
  if (entry == "keywords.ini merged") mergedNamed_.insert("keywords.ini");
  const char kExists[] = "File exists - no copy made:";
  if (StartsWith(entry, kExists)) {
    std::string relative;
    if (DestinationRelative(Trimmed(entry.substr(strlen(kExists))), relative)) Touch(relative);
  }
}

vxIniMergeObserver* vxRunRecord::Merge(const std::string& source, const std::string& destination) {
  std::string file, from;
  if (!DestinationRelative(destination, file)) return nullptr;
  if (!Below(RealEntry(source), sourceReal_, from)) from = source;
  Touch(file).merged = true;
  merges_.push_back(std::make_unique<MergeRecord>(file, from));
  return merges_.back().get();
}

// A destination path given as the run's folder text reads as the destination the user named.
std::string vxRunRecord::Shown(const std::string& text) const {
  std::string shown = text;
  for (const std::string* folder : {&destinationText_, &destinationReal_}) {
    if (folder->empty() || *folder == shownDestination_) continue;
    for (size_t at = shown.find(*folder); at != std::string::npos;
         at = shown.find(*folder, at + shownDestination_.size())) {
      shown.replace(at, folder->size(), shownDestination_);
    }
  }
  return shown;
}

std::string vxRunRecord::Action(const std::string& relative, const FileRecord& file) const {
  struct stat st;
  const bool exists = lstat((destinationReal_ + "/" + relative).c_str(), &st) == 0;
  if (!exists) return file.existed ? "removed" : "";
  if (!file.existed) return file.converted ? "converted" : "created";
  const long long mtime = st.st_mtim.tv_sec * 1000000000LL + st.st_mtim.tv_nsec;
  if (st.st_dev == file.dev && st.st_ino == file.ino && st.st_size == file.size &&
      mtime == file.mtime) {
    return "kept";
  }
  if (file.converted) return "converted";
  return file.merged || mergedNamed_.count(relative) != 0 ? "merged" : "replaced";
}

long vxRunRecord::FilesWritten() const {
  return static_cast<long>(files_.size() - files_.count(kLogName) - files_.count(kRunReportName));
}

std::string vxRunRecord::ReportText(const std::string& plugin) {
  std::map<std::string, long> counts;
  std::string list;
  for (const auto& [relative, file] : files_) {
    if (relative == kLogName || relative == kRunReportName) continue;
    const std::string action = Action(relative, file);
    if (action.empty()) continue;
    ++counts[action];
    list += list.empty() ? "\n    {" : ",\n    {";
    AppendMember(list, "path", relative, false);
    AppendMember(list, "action", action);
    AppendMember(list, "source", file.source);
    list += "}";
  }
  std::vector<const MergeRecord*> merges;
  size_t conflicts = 0;
  for (const auto& merge : merges_) {
    merges.push_back(merge.get());
    conflicts += merge->Conflicts();
  }
  std::stable_sort(merges.begin(), merges.end(), [](const MergeRecord* a, const MergeRecord* b) {
    return a->File() < b->File();
  });

  std::string out = "{\n  \"schema\": " + std::to_string(kRunReportSchema) + ",\n  ";
  vxJsonAppendString(out, "plugin");
  out += ": ";
  vxJsonAppendString(out, plugin.empty() ? std::string() : plugin.substr(plugin.rfind('/') + 1));
  out += ",\n  \"summary\": {";
  const char* const kinds[] = {"created", "replaced", "merged", "converted", "kept", "removed"};
  for (const char* kind : kinds) out += "\"" + std::string(kind) + "\": " + std::to_string(counts[kind]) + ", ";
  out += "\"conflicts\": " + std::to_string(conflicts) +
         ", \"notices\": " + std::to_string(notices_.size()) +
         ", \"errors\": " + std::to_string(errors_.size()) + "},\n  \"files\": [" + list +
         (list.empty() ? "]" : "\n  ]") + ",\n  \"merges\": [";
  for (size_t i = 0; i < merges.size(); ++i) {
    out += i == 0 ? "\n    " : ",\n    ";
    merges[i]->AppendJson(out);
  }
  out += merges.empty() ? "]" : "\n  ]";
  AppendTexts(out, "notices", notices_);
  AppendTexts(out, "errors", errors_);
  out += "\n}\n";
  return out;
}
