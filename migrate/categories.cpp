// Merges the source installation's "categories.ini" of one profile kind into the destination's:
// every old category and profile entry is added, pointing at the profile's new place and name,
// and everything the destination lists already keeps its number. Lookups go through hash indexes
// built once, so the merge is linear in the size of the two files. The destination is rewritten
// atomically; an unreadable categories file on either side is logged and nothing is written.

#include <algorithm>
#include <cstdint>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

#include "foundation/files/file_manager.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/exclusion_index.h"
#include "migrate/internal/marked_name.h"
#include "migrate/manager.h"

namespace {

const char kCategoriesFile[] = "categories.ini";
const char kMainSection[] = "main";
const char kCategoryCountKey[] = "NumberOfCategories";
const char kCategoryKey[] = "Category";
const char kProfileCountKey[] = "NumberOfProfiles";
const char kProfileKey[] = "Profile";
const char kExpandKey[] = "Expand";

// Counts beyond this are taken as this; a negative count lists nothing.
const int64_t kMaxCount = 0x7ffffffe;

typedef std::vector<std::pair<int64_t, vxStringBase>> NumberedValues;

int64_t ReadCount(const vxMappedINIFile& file, const vxStringBase& section, const char* key) {
  long count = file.GetVal(section, key).asLong();
  return std::min<int64_t>(std::max<long>(count, 0), kMaxCount);
}

void WriteCount(vxMappedINIFile& file, const vxStringBase& section, const char* key,
                int64_t count) {
  file.SetVal(section, key, vxStringBase(std::to_string(count)));
}

vxStringBase NumberedKey(const char* prefix, int64_t number) {
  std::string key(prefix);
  key.append(std::to_string(number));
  return vxStringBase(key);
}

// The number n when key is prefix followed by n written as append(long) writes it ("Profile12",
// any case), within 1..count; 0 otherwise.
int64_t KeyNumber(const vxStringBase& key, const std::string& foldedPrefix, int64_t count) {
  std::string_view text = key.view();
  if (text.size() <= foldedPrefix.size() || text.size() > foldedPrefix.size() + 10) return 0;
  if (vxFoldCase(text.substr(0, foldedPrefix.size())) != foldedPrefix) return 0;
  std::string_view digits = text.substr(foldedPrefix.size());
  if (digits[0] == '0') return 0;
  int64_t number = 0;
  for (char c : digits) {
    if (c < '0' || c > '9') return 0;
    number = number * 10 + (c - '0');
  }
  return number <= count ? number : 0;
}

// The values of prefix1 .. prefix<count> in a section, in number order, each as GetVal would give
// it (the first line of a key written twice); missing and empty values are left out. One pass over
// the section's lines, however large count claims to be.
NumberedValues ReadNumbered(vxMappedINIFile& file, const vxStringBase& section, const char* prefix,
                            int64_t count) {
  NumberedValues values;
  const INILineList* lines = file.GetPropertyList(section);
  if (lines == nullptr || count <= 0) return values;
  const std::string foldedPrefix = vxFoldCase(prefix);
  for (const INILine* line : *lines) {
    int64_t number = KeyNumber(line->m_key, foldedPrefix, count);
    if (number != 0) values.emplace_back(number, line->m_value);
  }
  std::stable_sort(values.begin(), values.end(),
                   [](const auto& a, const auto& b) { return a.first < b.first; });
  values.erase(std::unique(values.begin(), values.end(),
                           [](const auto& a, const auto& b) { return a.first == b.first; }),
               values.end());
  values.erase(std::remove_if(values.begin(), values.end(),
                              [](const auto& v) { return v.second.isEmpty(); }),
               values.end());
  return values;
}

// One merge: the two files and the indexes over the destination, built once per category.
class CategoriesMerge {
 public:
  CategoriesMerge(vxMigrationManager& manager, vxMappedINIFile& source,
                  vxMappedINIFile& destination, const vxStringBase& profileFolder,
                  const vxStringBase& exclusions, bool keepNames)
      : source_(source),
        destination_(destination),
        profileFolder_(profileFolder),
        excluded_(manager, exclusions, vxStringBase::NullStr, 0),
        keepNames_(keepNames) {}

  CategoriesMerge(const CategoriesMerge&) = delete;
  CategoriesMerge& operator=(const CategoriesMerge&) = delete;

  void Run() {
    int64_t categoryCount = ReadCount(destination_, kMainSection, kCategoryCountKey);
    // A new file starts with its list of categories, as the product writes it.
    if (!destination_.HasSection(kMainSection)) {
      WriteCount(destination_, kMainSection, kCategoryCountKey, categoryCount);
    }
    std::unordered_set<std::string> categoryNames;
    for (auto& entry : ReadNumbered(destination_, kMainSection, kCategoryKey, categoryCount)) {
      categoryNames.insert(entry.second.str());
    }
    const int64_t sourceCount = ReadCount(source_, kMainSection, kCategoryCountKey);
    for (auto& entry : ReadNumbered(source_, kMainSection, kCategoryKey, sourceCount)) {
      const vxStringBase& name = entry.second;
      MergeCategory(name);
      // Category names compare byte for byte, unlike the sections they name.
      if (categoryNames.insert(name.str()).second) {
        ++categoryCount;
        destination_.SetVal(kMainSection, NumberedKey(kCategoryKey, categoryCount), name);
      }
    }
    WriteCount(destination_, kMainSection, kCategoryCountKey, categoryCount);
  }

 private:
  // The destination's entries of a category, folded: paths compare ignoring case.
  std::unordered_set<std::string>& DestinationPaths(const vxStringBase& category, int64_t count) {
    auto inserted = paths_.try_emplace(vxFoldCase(category.view()));
    if (inserted.second) {
      for (auto& entry : ReadNumbered(destination_, category, kProfileKey, count)) {
        inserted.first->second.insert(vxFoldCase(entry.second.view()));
      }
    }
    return inserted.first->second;
  }

  // The source entry moved into the destination profile folder under the copy's name; empty when
  // the profile was left behind or the entry names no file.
  vxStringBase DestinationPath(const vxStringBase& sourcePath) const {
    vxStringBase name = LastPathComponent(sourcePath);
    if (name.isEmpty() || excluded_.Contains(name)) return vxStringBase();
    if (!keepNames_) name = MarkedFileNameKeepingExtension(name);
    vxStringBase path;
    vxFileManager::MakePath(path, profileFolder_, name, 1);
    return path;
  }

  void MergeCategory(const vxStringBase& category) {
    const int64_t sourceCount = ReadCount(source_, category, kProfileCountKey);
    int64_t count = ReadCount(destination_, category, kProfileCountKey);
    std::unordered_set<std::string>& known = DestinationPaths(category, count);
    for (auto& entry : ReadNumbered(source_, category, kProfileKey, sourceCount)) {
      vxStringBase path = DestinationPath(entry.second);
      if (path.isEmpty()) continue;
      // The index grows with every entry added, so a profile listed twice is entered once.
      if (!known.insert(vxFoldCase(path.view())).second) continue;
      ++count;
      destination_.SetVal(category, NumberedKey(kProfileKey, count), path);
    }
    WriteCount(destination_, category, kProfileCountKey, count);
    // The source's choice of how the category is shown wins, even an empty one.
    destination_.SetVal(category, kExpandKey, vxStringBase(source_.GetVal(category, kExpandKey)));
  }

  vxMappedINIFile& source_;
  vxMappedINIFile& destination_;
  const vxStringBase profileFolder_;
  const vxExclusionIndex excluded_;
  const bool keepNames_;
  std::unordered_map<std::string, std::unordered_set<std::string>> paths_;
};

}  // namespace

void vxMigrationManager::MergeCategoriesINIFile(const char* profileFolder, const char* pattern,
                                                const char* extension, const char* exclusionList,
                                                bool keepNames) {
  const vxStringBase relative(profileFolder);
  vxStringBase sourcePath;
  vxFileManager::MakePath(sourcePath, m_sourceDirectory, relative, kCategoriesFile);
  if (!vxFileManager::Exists(sourcePath)) return;
  vxStringBase destinationPath;
  vxFileManager::MakePath(destinationPath, m_destinationDirectory, relative, kCategoriesFile);

  vxMappedINIFile source(sourcePath);
  if (source.Open(1) != 0) {
    Log("Error: categories.ini cannot be read - not merged: ", sourcePath.c_str());
    return;
  }
  // A missing destination file starts empty and is created; an unreadable one is never replaced.
  vxMappedINIFile destination(destinationPath);
  if (destination.Open(1) != 0 && vxFileManager::Exists(destinationPath)) {
    Log("Error: categories.ini cannot be read - not merged: ", destinationPath.c_str());
    return;
  }
  vxStringBase destinationFolder;
  vxFileManager::MakePath(destinationFolder, m_destinationDirectory, relative, 0);

  CategoriesMerge(*this, source, destination, destinationFolder, vxStringBase(exclusionList),
                  keepNames)
      .Run();
  // The entries are worth keeping even when no profile came along to create the folder.
  if (vxFileManager::CreateDirectory(destinationFolder, nullptr) != 0 ||
      destination.Close(1) != 0) {
    Log("Error: categories.ini could not be written: ", destinationPath.c_str());
    return;
  }
  Log("categories.ini merged: ", destinationFolder.c_str());
}
