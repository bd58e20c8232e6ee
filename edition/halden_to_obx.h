// The edition converter: turns a Halden installation's log-analysis settings, report templates,
// advanced options and profiles into those of the OBX reporting-server edition. A plug-in builds one
// on the run's manager, which it refers to and never owns, and calls DoHaldenToOBXMigrate (or a
// single step). The Halden source is only read; every file written is written atomically. Every
// operation returns an integer and never throws. Not thread-safe: one converter per thread.

#ifndef VXMIGRATE_EDITION_HALDEN_TO_OBX_H_
#define VXMIGRATE_EDITION_HALDEN_TO_OBX_H_

#include "foundation/export.h"
#include "foundation/files/filename.h"
#include "foundation/inifile/ini_file.h"
#include "foundation/inifile/ini_line.h"
#include "foundation/string/string_base.h"

class vxMigrationManager;

class VXM_EXPORT HaldenToOBXHelper {
 public:
  // REQUIRES: manager is valid and outlives the converter. Its folders are copied now; later
  // changes to the manager's folders do not reach the converter.
  explicit HaldenToOBXHelper(vxMigrationManager* manager);
  ~HaldenToOBXHelper();

  HaldenToOBXHelper(const HaldenToOBXHelper&) = delete;
  HaldenToOBXHelper& operator=(const HaldenToOBXHelper&) = delete;

  // Every step below in its fixed order, then the data files and the search engines. Returns 0.
  int DoHaldenToOBXMigrate();

  // Log settings ("\vxm_log\vxm_log.ini") into the server settings ("\vxm_vxx\vxm_vxx.ini"), with
  // the file-type lists, cache lifespan, cookie check and sub-profile filter keys converted.
  // Returns 0.
  int DoVXMLogINIMigrate();
  // Merges every "*.ini" of sourceFolder into the like-named file of destinationFolder. Returns 0.
  int DoMergeINIFilesInFolder(const vxStringBase& sourceFolder,
                              const vxStringBase& destinationFolder);

  // --- Report templates (template_conversion.cpp) ---
  // Converts every user template "*.mss" into "<name>_vxmigrate.wct"; a target present already is
  // never replaced. Returns 0.
  int DoHaldenToOBXTemplateFileMigrate();
  // 1 when file is not one of the edition's standard templates (name compared ignoring case).
  int IsValidMSSFile(vxFilename& file);
  // Converts one template. Returns 0.
  int ConvertMSSToWCT(vxFilename& file);
  // Replaces a graph type index ("0".."7") by its graph type name; anything else by "MULTILINE".
  void GetGraphTypeFromIndex(vxStringBase& value);
  // The value of the current report section's key (section prefix + key) in the source template's
  // "content" section; when the key is absent, value keeps what it held.
  void GetSourceContentSectionVal(const char* key, vxStringBase& value);
  // Sets key in the current destination object when the object has it; never adds a key.
  void SetDestObjectSectionVal(const vxStringBase& key, const vxStringBase& value);

  // --- Advanced options (advanced_options_conversion.cpp) ---
  // 1 when a dynamic-pages file cannot be opened, else 0.
  int DoMergeAdvancedOptionsFiles();

  // --- Profiles (profile_conversion.cpp) ---
  // 1 when the destination's "\vxm_vxx\vxm_vxx.ini" cannot be opened, else 0.
  int DoHaldenToOBXProfileFileMigrate();

 private:
  struct ReportObject;
  class ReportObjectIndex;

  void ConvertReportSections(const vxStringBase& sourcePath, vxStringBase& buffer);
  void SwitchOnReportObject(const ReportObject& object, vxStringBase& buffer);
  bool ReadSourceContent(const vxStringBase& key, vxStringBase& value) const;

  vxMigrationManager* manager_;          // not owned
  vxStringBase sectionWord_;             // "Section", then "Section<k>_" while converting
  vxStringBase nameWord_;                // "name"
  vxStringBase includeWord_;             // "include"
  vxStringBase typeWord_;                // "type"
  vxStringBase graphTypeWord_;           // "graphtype"
  vxStringBase elementsWord_;            // "elements"
  vxStringBase objectSection_;           // "Object<j>" being examined
  vxStringBase lookupKey_;               // template key last looked up
  vxStringBase yesWord_;                 // "Y"
  vxStringBase graphElementsWord_;       // "graphelements"
  vxStringBase objectNameLead_;          // leading part of an object's name
  vxStringBase objectKind_;              // the five kind characters of an object's name
  vxStringBase sourceFolder_;
  vxStringBase destinationFolder_;
  INILineList* sourceSection_ = nullptr;       // "content" of the source template
  INILineList* destinationSection_ = nullptr;  // the destination object being set
  vxMappedINIFile sourceTemplate_;
  vxMappedINIFile destinationTemplate_;
  vxMappedINIFile standardTemplate_;  // the destination's standard template, read once per run
};

#endif  // VXMIGRATE_EDITION_HALDEN_TO_OBX_H_
