// The upgrade of an installation that keeps its log-analysis settings in "vxm_log" (the log-analysis
// product and the Halden suite) to a newer version of the same product, as one sequence of library
// operations. Shared by the two shipped plug-ins for those products; each passes its product id
// text, which chooses the sample files left behind. Never changes the source installation.

#ifndef VXMIGRATE_PLUGINS_LOG_SETTINGS_UPGRADE_H_
#define VXMIGRATE_PLUGINS_LOG_SETTINGS_UPGRADE_H_

#include "migrate/manager.h"
#include "migrate/sample_lists.h"

namespace vxplugin {

// Where the installation keeps each kind of file, relative to its folder.
constexpr const char kProfiles[] = "\\vxm_log\\datfiles";
constexpr const char kLanguages[] = "\\vxm_log\\template";

// The advanced-option files and their entry families, merged entry by entry.
struct AdvancedOptionFamily {
  const char* file;
  const char* prefix;
};
constexpr AdvancedOptionFamily kAdvancedOptions[] = {
    {"\\vxm_log\\datfiles\\contentgroups\\default.ini", "ContentGroupProfile"},
    {"\\vxm_log\\datfiles\\pathsanalysis\\default.ini", "PathsAnalysisProfile"},
    {"\\vxm_log\\datfiles\\urlreplacement\\default.ini", "URLReplacementProfile"},
    {"\\vxm_log\\datfiles\\tradequill\\default.ini", "AdCampaignProfile"},
    {"\\vxm_log\\datfiles\\tradequill\\default.ini", "ProductProfile"},
    {"\\vxm_log\\datfiles\\tradequill\\default.ini", "CategoryProfile"},
    {"\\vxm_log\\datfiles\\dynamicpages\\default.ini", "QueryProfile"},
};

// Settings first: the log-analysis settings must be in the destination before the main-settings
// merge converts their cookie keys and before the table limit reads their top count.
inline void MigrateLogSettings(vxMigrationManager* m) {
  m->MergeINIFilesRelative(m->IsInPlaceMigrate() ? "\\vxm_log\\vxm_log.vxinibak"
                                                 : "\\vxm_log\\vxm_log.ini",
                           "\\vxm_log\\vxm_log.ini");
  m->DoVantixINIMerge();
  m->DoTableLimitINIChange();
  m->DoKeywordINIMerge();
  m->DoMergeCSVFile("\\adviews.txt", "\\adviews.txt");
  m->DoMergeCSVFile("\\vxintra.txt", "\\vxintra.txt");
  for (const AdvancedOptionFamily& family : kAdvancedOptions) {
    m->MergeAdvancedOptionsFiles(family.file, family.file, family.prefix);
  }
}

// The user's profiles (log-analysis ones with their data folders), then the scheduled events that
// name them: an event is kept only when the marked copy of its profile has arrived.
inline void MigrateLogProfiles(vxMigrationManager* m, const char* product) {
  m->DoCopyLogProfiles(kProfiles, "*.wlp", "wlp", GetSampleFileList(product, "wlp"));
  m->CopyScheduledEventFiles(kProfiles, "*.evt", "evt", "*");
}

// The user's own report templates (marked copies) and languages beyond the four shipped ones.
inline void MigrateTemplatesAndLanguages(vxMigrationManager* m, const char* product) {
  m->CopyRenamedUserFiles(kProfiles, "*.mss", "mss", GetSampleFileList(product, "mss"));
  m->DoCopyLanguageFiles(kLanguages, kLanguages);
}

}  // namespace vxplugin

#endif  // VXMIGRATE_PLUGINS_LOG_SETTINGS_UPGRADE_H_
