// The migration manager: one run of the library, from the host's command line to the last log
// line, and every operation that migration plug-ins call back. The manager owns its parser, its log
// and its two version descriptors. No operation throws; results are integers (0 success or nothing
// to do, 1 refusal or a missing file, 2 where said). Everything runs on the caller's thread.
//
// The operations are spread over files by concern: manager.cpp (construction, log, run sequence),
// checks.cpp, servers.cpp, exclusion.cpp, copy.cpp, ini_merge.cpp, profiles.cpp, user_files.cpp,
// languages.cpp, log_profiles.cpp, alert_profiles.cpp, categories.cpp, main_settings.cpp,
// log_settings.cpp, keywords.cpp, data_files.cpp, advanced_options.cpp, obx_profiles.cpp,
// protected_values.cpp.

#ifndef VXMIGRATE_MIGRATE_MANAGER_H_
#define VXMIGRATE_MIGRATE_MANAGER_H_

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "foundation/export.h"
#include "foundation/files/log_file.h"
#include "foundation/string/string_base.h"
#include "foundation/string/version.h"
#include "migrate/cmdline_parser.h"
#include "migrate/run_report.h"

// What a plug-in's "MigrateInitialize" fills in: the pair of products it migrates between, and four
// further texts for its own use (emptied before the call, never read by the run).
struct vxMigrateInfo {
  vxStringBase sourceProduct;
  vxStringBase destinationProduct;
  vxStringBase note1;
  vxStringBase note2;
  vxStringBase note3;
  vxStringBase note4;
};

class vxMigrationManager;
class vxFolderLock;
class vxMappedINIFile;
class vxRunDoors;
class vxRunRecord;
class vxIniMergeObserver;

// What a run keeps besides its log; a host asks for these, a plug-in's tests need not.
struct vxRunSettings {
  bool keepJournal = false;  // an undo journal under the destination's ".vxmigrate"
  bool writeReport = false;  // "vxmigrate-report.json" beside the log
  // How the report names the destination; empty: as given ("-D2"). A preview runs in a scratch
  // copy and names the real destination.
  std::string shownDestination;
};

// The two entry points a migration plug-in exports with C linkage. Their results are ignored.
extern "C" {
typedef int (*vxMigrateInitializeEntry)(vxMigrateInfo* info);
typedef int (*vxMigrateEntry)(vxMigrationManager* manager);
}

class VXM_EXPORT vxMigrationManager {
 public:
  // Builds the run from the host's arguments, falling back on "migcmd.ini" when the command line
  // is incomplete. An incomplete run leaves IsValid() false and writes nothing anywhere. The run
  // takes the destination folder's lock before it writes anything, and from then on every write
  // and installation read passes the run's doors (foundation/files/run_doors.h). Plug-ins and
  // "vxmigrate.ini" are looked for beside the running executable, as the kernel reports it.
  vxMigrationManager(int argc, char** argv);
  // The same, for a host that keeps its plug-ins and "vxmigrate.ini" beside another executable
  // path (an embedding program, the tests).
  vxMigrationManager(int argc, char** argv, const vxStringBase& executable);
  // As the first constructor, keeping what settings ask for.
  vxMigrationManager(int argc, char** argv, const vxRunSettings& settings);
  virtual ~vxMigrationManager();

  vxMigrationManager(const vxMigrationManager&) = delete;
  vxMigrationManager& operator=(const vxMigrationManager&) = delete;

  bool IsValid() const;
  // Another run holds the destination's lock: this run wrote nothing and DoMigration refuses.
  bool IsDestinationBusy() const { return m_destinationBusy; }
  // REQUIRES: IsValid(). The whole run: checks, plug-in search and call, install script, last line.
  int DoMigration();

  // One log entry at level 1; nothing without a log.
  void Log(const char* text);
  // text immediately followed by value, as one entry.
  void Log(const char* text, const char* value);

  // The host's view of the run. The listener is told the entries already written (the header)
  // at once, then each entry as it is logged; it is not owned and must outlive the run.
  void SetRunListener(vxRunListener* listener);
  const vxRunCounts& GetRunCounts() const { return m_counts; }
  // Destination files the run has written so far (its log and report left out); 0 when the run
  // keeps neither report nor journal.
  long GetFilesWritten() const;
  const vxPluginSearch& GetPluginSearch() const { return m_pluginSearch; }
  // The observer for one INI merge of source into destination, for the run's report; null when
  // the run keeps no report.
  vxIniMergeObserver* RecordMerge(const vxStringBase& source, const vxStringBase& destination);
  // Writes the report and closes the journal with the run's final status. Called once; the
  // destructor calls it with DoMigration's result when the host did not. 0 when both were
  // written (or the run keeps neither); 1 when either could not be, which is logged.
  [[nodiscard]] int FinishRun(int status);
  // The report's path ("" when the run keeps none) and the journal's run id ("" when none).
  std::string GetReportPath() const;
  std::string GetRunId() const;

  MigrationCmdLineParser* GetCmdLineParser() { return m_cmdLineParser; }
  vxStringBase& GetSourceVersion() { return m_sourceVersion; }
  vxStringBase& GetDestinationVersion() { return m_destinationVersion; }
  vxStringBase& GetSourceDirectory() { return m_sourceDirectory; }
  vxStringBase& GetDestinationDirectory() { return m_destinationDirectory; }
  const vxStringBase& GetSourceProduct() const { return m_sourceProduct; }
  const vxStringBase& GetDestinationProduct() const { return m_destinationProduct; }
  const vxStringBase& GetExecutable() const { return m_executable; }
  // These assign the text only: version descriptors and product ids are not rebuilt.
  void SetSourceVersion(const vxStringBase& text) { m_sourceVersion = text; }
  void SetDestinationVersion(const vxStringBase& text) { m_destinationVersion = text; }
  void SetSourceDirectory(const vxStringBase& text) { m_sourceDirectory = text; }
  void SetDestinationDirectory(const vxStringBase& text) { m_destinationDirectory = text; }
  int GetSourceProductID() const { return m_sourceProductID; }
  int GetDestinationProductID() const { return m_destinationProductID; }
  vxVersionDescriptor* GetSourceVersionDescriptor() { return m_sourceVersionDescriptor; }
  vxVersionDescriptor* GetDestinationVersionDescriptor() { return m_destinationVersionDescriptor; }
  vxLogFile* GetLog() { return m_log; }

  // Service hooks around a plug-in's Migrate; this platform has no service manager: each returns 0.
  int StopAMService();
  int DeleteAMService();
  int StartAMService();

  // --- Product identity and version checks (checks.cpp) ---
  // The product id (1..21) of an id text, ignoring case; -1 when unknown or empty.
  static int GetProductID(const char* text);
  // The id text of a product id, or null outside 1..21.
  static const char* GetProductText(int id);
  // 0 when the run may start, 1 otherwise (each failure logs its own line).
  int DoCheckMigrateValidity();
  // 0 supported, 1 outside "vxmigrate.ini"'s ranges, 2 "vxmigrate.ini" could not be opened.
  int DoCheckVersions(const vxStringBase& sourceSection, const vxStringBase& destinationSection);
  int DoBadMigration();
  bool IsInlineMigrate() const;
  // Source and destination are one folder: the same text, or two spellings of one folder.
  bool IsInPlaceMigrate() const;
  // The installation folder joined with a name relative to it ("\vantix.ini").
  vxStringBase GetFullSourceFilename(const char* name) const;
  vxStringBase GetFullDestinationFilename(const char* name) const;

  // --- Running-server detection (servers.cpp); which: 0 destination folder, 1 source folder ---
  int CheckEngineRunning(int productID, const vxVersionDescriptor& version, int which);
  int CheckInterfaceRunning(int productID, const vxVersionDescriptor& version, int which);
  int readPid(const char* path);
  bool sendNullSignal(int pid);

  // --- Exclusion lists (exclusion.cpp) ---
  int IsExcludeFile(const vxStringBase& file, const vxStringBase& list,
                    const vxStringBase& inPlaceExtension, int fromInstallation);
  void MakeFullExclusionList(vxStringBase& result, const vxStringBase& selection,
                             const vxStringBase& folder, const char* extension,
                             const char* fixedList);

  // --- File and folder copying (copy.cpp) ---
  int CopyFilesOfType(const char* extension, unsigned int copyOption);
  int CopyFilesOfTypes(const vxStringBase& extensions, unsigned int copyOption);
  int CopyFiles(const vxStringBase& fileNames, unsigned int copyOption);
  int CopyAllFilesOfType(const vxStringBase& extension, const vxStringBase& exclusions);
  int CopyFilesInRelativeFolder(const vxStringBase& relativeFolder, const char* extension,
                                unsigned int copyOption);

  // --- INI merging (ini_merge.cpp) ---
  int MergeINIFiles(const char* sourceFile, const char* destinationFile);
  int MergeINIFilesRelative(const char* sourceRelative, const char* destinationRelative);
  int MergeAllINIFiles(const vxStringBase& exclusions);

  // --- Profiles (profiles.cpp, user_files.cpp, languages.cpp, log_profiles.cpp,
  //     alert_profiles.cpp, categories.cpp, obx_profiles.cpp) ---
  int CopyProfilesOfTypes(const vxStringBase& extensions, unsigned int option);
  int CopyAllProfilesOfType(const vxStringBase& extension, const vxStringBase& exclusions);
  int CopyRenamedUserFiles(const char* folder, const char* pattern, const char* extension,
                           const char* exclusions);
  int CopyScheduledEventFiles(const char* folder, const char* pattern, const char* extension,
                              const char* namePattern);
  int DoCopyLanguageFiles(const char* sourceFolder, const char* destinationFolder);
  int DoCopyLogProfiles(const char* folder, const char* pattern, const char* extension,
                        const char* fixedList);
  int DoCopyLinkProfiles(const char* folder, const char* pattern, const char* extension,
                         const char* fixedList);
  int DoCopyAlertProfiles(const char* folder, const char* pattern, const char* extension,
                          const char* fixedList);
  void MergeCategoriesINIFile(const char* profileFolder, const char* pattern,
                              const char* extension, const char* exclusionList, bool keepNames);
  int DoCopyOBXProfiles();

  // --- Product settings (main_settings.cpp, log_settings.cpp, keywords.cpp, data_files.cpp,
  //     advanced_options.cpp) ---
  int DoVantixINIMerge();
  int DoVXMLogINIChange();
  int DoTableLimitINIChange();
  int DoKeywordINIMerge();
  int DoMergeCSVFile(const char* sourceFile, const char* destinationFile);
  int MergeAdvancedOptionsFiles(const vxStringBase& sourceFile, const vxStringBase& destinationFile,
                                const vxStringBase& prefix);
  int DoOBXMergeAdvancedOptionsFiles();

  // --- Protected values (protected_values.cpp) ---
  int DoConvertEncryptedValue(vxStringBase& value);
  int DoDecryptValue(vxStringBase& value);

  // True when option "FT" is absent, empty, "Y" or "Yes" (ignoring case): profile data folders
  // travel with their profiles.
  bool CopiesProfileDataFolders() const;

 private:
  void Start(int argc, char** argv);
  void ReadCommandFile();
  void FindExecutable();
  void OpenDoorsAndLog();
  // The run was asked to keep an undo journal and could not start one.
  bool LacksJournal() const;
  static const char kNoJournal[];
  void WriteHeader(vxRunListener* listener);
  void NoteEntry(const std::string& entry);
  void RunPlugins(bool& found);
  // CopyRenamedUserFiles, each marked copy converted on its way when convert is given. A false
  // from convert carries the file as it is, and the error text it left (followed by the copy's
  // path) is logged after the copy's line. The paths of the copies made are added to made.
  using MarkedCopyConversion = std::function<bool(vxMappedINIFile&, std::string& declined)>;
  void CopyMarkedFiles(const char* folder, const char* pattern, const char* extension,
                       const char* exclusions, const MarkedCopyConversion* convert,
                       std::vector<vxStringBase>* made);
  void RunInstallScript();

  vxStringBase m_sourceVersion;
  vxStringBase m_sourceDirectory;
  vxStringBase m_destinationVersion;
  vxStringBase m_destinationDirectory;
  vxStringBase m_sourceProduct;
  vxStringBase m_destinationProduct;
  vxStringBase m_executable;
  int32_t m_sourceProductID = -1;
  int32_t m_destinationProductID = -1;
  vxVersionDescriptor* m_sourceVersionDescriptor = nullptr;
  vxVersionDescriptor* m_destinationVersionDescriptor = nullptr;
  vxLogFile* m_log = nullptr;
  MigrationCmdLineParser* m_cmdLineParser = nullptr;
  std::unique_ptr<vxFolderLock> m_destinationLock;
  std::unique_ptr<vxRunDoors> m_doors;
  bool m_destinationBusy = false;
  vxRunCounts m_counts;
  vxPluginSearch m_pluginSearch;
  vxRunListener* m_listener = nullptr;
  vxRunSettings m_settings;
  std::unique_ptr<vxRunRecord> m_record;
  bool m_finished = false;
  int m_result = 0;
};

#endif  // VXMIGRATE_MIGRATE_MANAGER_H_
