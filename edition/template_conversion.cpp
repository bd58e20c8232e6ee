// Report template conversion: each user template of the Halden edition ("*.mss") becomes a copy of
// the OBX standard template "CompleteSummary.wct" with every report object switched off except the
// ones the old template's report sections ask for. A target present already is never replaced, and
// the Halden template is only read.

#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "edition/edition_util.h"
#include "edition/halden_to_obx.h"
#include "edition/standard_templates.h"
#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "migrate/manager.h"

namespace {

// Empties a template held for one conversion. Closing without saving writes nothing, so there is
// no failure to look at.
void Release(vxMappedINIFile& file) { static_cast<void>(file.Close(0)); }

const char kTemplateFolder[] = "\\vxm_log\\datfiles";
const char kServerFolder[] = "\\vxm_vxx";
const char kStandardTemplate[] = "CompleteSummary.wct";
// The standard template names its own object count; a count far beyond any real template is taken
// as damage and not followed, so that a bad number cannot make millions of sections.
const int64_t kMaxReportObjects = 100000;

// Whether the template's output form ("...htm") exists in the destination's edition: spreadsheets
// came with the OBX edition's version 3.
bool IsAcceptedOutputForm(const vxStringBase& saveAs, int destinationMajor) {
  if (saveAs.length() <= 3) return false;
  const std::string_view form = saveAs.view().substr(saveAs.length() - 3);
  if (vxEqualsIgnoreCase(form, "htm") || vxEqualsIgnoreCase(form, "doc")) return true;
  return destinationMajor >= 3 && vxEqualsIgnoreCase(form, "xls");
}

const INILine* FindLine(const INILineList* lines, const vxStringBase& key) {
  if (lines == nullptr) return nullptr;
  auto found = std::find_if(lines->begin(), lines->end(), INILine::KeyCompare(key));
  return found == lines->end() ? nullptr : *found;
}

bool IsObjectKind(std::string_view text) {
  return text == "Chapt" || text == "Graph" || text == "Table";
}

}  // namespace

// One object of the destination template that a report section can switch on.
struct HaldenToOBXHelper::ReportObject {
  int64_t number;              // j of "Object<j>"
  INILineList* lines;          // the object's section
  std::string kind;            // "Chapt", "Graph" or "Table"
};

// The destination template's objects by the leading part of their names: an object named
// "TopPagesGraph" is found under "TopPages". Built once per template, so that matching every report
// section against every object costs a lookup instead of a walk over all objects. Each list keeps
// the objects in ascending number, the order in which they are switched on.
class HaldenToOBXHelper::ReportObjectIndex {
 public:
  ReportObjectIndex(vxMappedINIFile& wct, const vxStringBase& nameKey) {
    for (int64_t j = 1;; ++j) {
      INILineList* lines = wct.GetPropertyList(vxStringBase(NumberedName("Object", j)));
      if (lines == nullptr) break;
      const INILine* name = FindLine(lines, nameKey);
      if (name == nullptr) continue;
      const std::string& text = name->m_value.str();
      for (size_t lead = 0; lead + 5 <= text.size(); ++lead) {
        std::string_view kind = std::string_view(text).substr(lead, 5);
        if (IsObjectKind(kind)) {
          objects_[text.substr(0, lead)].push_back({j, lines, std::string(kind)});
        }
      }
    }
  }
  ReportObjectIndex(const ReportObjectIndex&) = delete;
  ReportObjectIndex& operator=(const ReportObjectIndex&) = delete;

  const std::vector<ReportObject>* Find(const vxStringBase& lead) const {
    auto found = objects_.find(lead.str());
    return found == objects_.end() ? nullptr : &found->second;
  }

 private:
  std::unordered_map<std::string, std::vector<ReportObject>> objects_;
};

int HaldenToOBXHelper::DoHaldenToOBXTemplateFileMigrate() {
  vxStringBase folder;
  vxFileManager::MakePath(folder, sourceFolder_, kTemplateFolder, 0);
  vxFileInfoList listed;
  vxFileManager::GetFileList(folder, "*.mss", listed, 0);
  std::vector<vxFilename> userTemplates;
  for (const vxFileInfo& entry : listed) {
    vxFilename name = entry.GetFilename();
    if (IsValidMSSFile(name)) userTemplates.push_back(name);
  }
  for (vxFilename& name : userTemplates) ConvertMSSToWCT(name);
  return 0;
}

int HaldenToOBXHelper::IsValidMSSFile(vxFilename& file) {
  return IsHaldenStandardTemplate(file.Filename().c_str()) ? 0 : 1;
}

int HaldenToOBXHelper::ConvertMSSToWCT(vxFilename& file) {
  vxStringBase sourcePath;
  vxFileManager::MakePath(sourcePath, sourceFolder_, kTemplateFolder, 0);
  sourcePath.append(file.BaseName());
  sourcePath.append(".mss");
  vxStringBase targetPath;
  vxFileManager::MakePath(targetPath, destinationFolder_, kServerFolder, 0);
  targetPath.append(file.BaseName());
  targetPath.append("_vxmigrate.wct");

  // A template converted by an earlier run may have been edited since: never replace it.
  if (access(targetPath.c_str(), F_OK) == 0) return 0;

  sourceTemplate_.SetFilename(sourcePath);
  if (sourceTemplate_.Open(1) != 0) {
    manager_->Log("Error: Unable to open file:   ", sourcePath.c_str());
    return 0;
  }
  vxStringBase buffer;
  sourceTemplate_.GetVal("SaveAs", "SaveReportAs", buffer);
  if (!IsAcceptedOutputForm(buffer, DestinationMajor(manager_))) {
    Release(sourceTemplate_);
    return 0;
  }

  vxStringBase conversion(sourcePath);
  conversion.append(" to ");
  conversion.append(targetPath);

  // The standard template is read once per run; each conversion starts from a copy in memory.
  if (!standardTemplate_.IsLoaded()) {
    vxStringBase standardPath;
    vxFileManager::MakePath(standardPath, destinationFolder_, kServerFolder, kStandardTemplate);
    standardTemplate_.SetFilename(standardPath);
    if (standardTemplate_.Open(1) != 0) {
      Release(sourceTemplate_);
      manager_->Log("Error: MSS to WCT conversion failed: ", conversion.c_str());
      return 0;
    }
  }
  destinationTemplate_.CopyFrom(standardTemplate_);

  // Everything off first: only what the old template asked for is switched back on.
  const int64_t objects =
      std::min<int64_t>(destinationTemplate_.GetVal("content", "reportobjects").asLong(),
                        kMaxReportObjects);
  for (int64_t i = 1; i <= objects; ++i) {
    destinationTemplate_.SetVal(vxStringBase(NumberedName("Object", i)), includeWord_, "N");
  }
  destinationTemplate_.SetVal("general", "version", "2.0");

  // The header values travel through one buffer: a missing key leaves it empty (GetVal empties it).
  sourceTemplate_.GetVal("general", "description", buffer);
  destinationTemplate_.SetVal("general", "description", buffer);
  sourceTemplate_.GetVal("style", "reportstyle", buffer);
  destinationTemplate_.SetVal("general", "reportstyle", buffer);
  sourceTemplate_.GetVal("style", "reportlanguage", buffer);
  if (buffer.equals("spanish", false)) {
    buffer = "english";
    manager_->Log("** OBX version does not support Spanish language reports - changed to English");
  }
  if (buffer.find("Default", 0, false) != vxStringBase::BadIndex) buffer = "english";
  vxStringBase language("./vxm_vxx/template/");
  language.append(buffer);
  language.append(".rpl");
  destinationTemplate_.SetVal("general", "reportlanguage", language);
  sourceTemplate_.GetVal("style", "helpcards", buffer);
  destinationTemplate_.SetVal("content", "helpcards", buffer);

  ConvertReportSections(sourcePath, buffer);
  // The cursors point into the two files' lines, which closing frees.
  sourceSection_ = nullptr;
  destinationSection_ = nullptr;

  Release(sourceTemplate_);
  // Written once, complete, and never over a template that appeared since the check.
  const int written = destinationTemplate_.CreateAs(targetPath);
  Release(destinationTemplate_);
  if (written != 0) {
    manager_->Log("Error: MSS to WCT conversion failed: ", conversion.c_str());
    return 0;
  }
  vxStringBase done("MSS to WCT conversion: ");
  done.append(conversion);
  manager_->Log(done.c_str());
  return 0;
}

// Report sections are numbered from 0; the first missing number ends them. A section's name is
// its report family followed by a 12-character suffix; every object whose name is that family
// followed by a kind word belongs to it. The buffer carries over from one read to the next: a key
// missing from a section leaves the value read before it, on purpose.
void HaldenToOBXHelper::ConvertReportSections(const vxStringBase& sourcePath,
                                              vxStringBase& buffer) {
  const ReportObjectIndex objects(destinationTemplate_, nameWord_);
  for (int64_t k = 0;; ++k) {
    sectionWord_ = "Section";
    sectionWord_.append(std::to_string(k).c_str());
    sectionWord_.append('_');
    sourceSection_ = sourceTemplate_.GetPropertyList("content");
    if (sourceSection_ == nullptr) return;
    lookupKey_ = sectionWord_;
    lookupKey_.append("Name");
    vxStringBase sectionName;
    if (!ReadSourceContent(lookupKey_, sectionName)) return;

    vxStringBase family(sectionName);
    if (family.length() <= 11) continue;
    family.cut(12);
    if (family.equals("TopEntry")) family = "TopEntryPage";

    const std::vector<ReportObject>* matching = objects.Find(family);
    if (matching == nullptr) {
      vxStringBase where(sectionName);
      where.append(" in ");
      where.append(sourcePath);
      manager_->Log("Error: MSS to WCT report section left out: ", where.c_str());
      continue;
    }
    for (const ReportObject& object : *matching) {
      objectSection_ = NumberedName("Object", object.number).c_str();
      objectNameLead_ = family;
      objectKind_ = object.kind.c_str();
      destinationSection_ = object.lines;
      SwitchOnReportObject(object, buffer);
    }
  }
}

void HaldenToOBXHelper::SwitchOnReportObject(const ReportObject& object, vxStringBase& buffer) {
  const INILine* type = FindLine(object.lines, typeWord_);
  if (type == nullptr) return;
  if (type->m_value.equals("CHAPTER")) {
    SetDestObjectSectionVal(includeWord_, yesWord_);
  } else if (type->m_value.equals("Graph")) {
    GetSourceContentSectionVal("ItemType", buffer);
    if (!buffer.equals("1")) return;
    SetDestObjectSectionVal(includeWord_, yesWord_);
    GetSourceContentSectionVal("GraphType", buffer);
    GetGraphTypeFromIndex(buffer);
    SetDestObjectSectionVal(graphTypeWord_, buffer);
    GetSourceContentSectionVal(elementsWord_.c_str(), buffer);
    SetDestObjectSectionVal(graphElementsWord_, buffer);
  } else if (type->m_value.equals("Table")) {
    GetSourceContentSectionVal("ItemType", buffer);
    if (!buffer.equals("2")) return;
    SetDestObjectSectionVal(includeWord_, yesWord_);
    GetSourceContentSectionVal("Elements", buffer);
    if (!buffer.isEmpty()) SetDestObjectSectionVal("tableelements1", buffer);
    GetSourceContentSectionVal("SubElements", buffer);
    if (!buffer.isEmpty()) SetDestObjectSectionVal("tableelements2", buffer);
  }
}

void HaldenToOBXHelper::GetGraphTypeFromIndex(vxStringBase& value) {
  static const char* const kGraphTypes[] = {"MULTISTACKED", "SINGLEBAR", "MULTIBAR",
                                            "SINGLEPIE",    "MULTIAREA", "MULTILINE",
                                            "MULTIHBAR",    "MULTIHSTACKED"};
  if (value.length() == 1 && value.at(0) >= '0' && value.at(0) <= '7') {
    value = kGraphTypes[value.at(0) - '0'];
  } else {
    value = "MULTILINE";
  }
}

void HaldenToOBXHelper::GetSourceContentSectionVal(const char* key, vxStringBase& value) {
  lookupKey_ = sectionWord_;
  lookupKey_.append(key);
  vxStringBase found;
  if (ReadSourceContent(lookupKey_, found)) value = found;
}

void HaldenToOBXHelper::SetDestObjectSectionVal(const vxStringBase& key,
                                                const vxStringBase& value) {
  if (destinationSection_ == nullptr) return;
  auto found = std::find_if(destinationSection_->begin(), destinationSection_->end(),
                            INILine::KeyCompare(key));
  if (found != destinationSection_->end()) (*found)->m_value = value;
}

// The cursor holds the "content" lines of the source template. Lookups go through the INI model's
// index of that section instead of a walk over the cursor: they find the same (first) line, and a
// template with many report sections costs no more per key than a small one.
bool HaldenToOBXHelper::ReadSourceContent(const vxStringBase& key, vxStringBase& value) const {
  if (sourceSection_ == nullptr) return false;
  return sourceTemplate_.GetVal("content", key, value) == 0;
}
