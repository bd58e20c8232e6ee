// The manager's construction (command line, command file, executable, destination lock, doors, log
// header), its log, and the run sequence: checks, plug-in search in sorted listing order, the
// install script, last line.

#include "migrate/manager.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <exception>
#include <string>

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/files/filename.h"
#include "foundation/files/folder_lock.h"
#include "foundation/files/run_doors.h"
#include "foundation/files/run_journal.h"
#include "foundation/files/shared_lib.h"
#include "foundation/files/atomic_file.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/run_record.h"
#include "src/proc2/proc2.h"

namespace {

const char kCommandFileName[] = "migcmd.ini";
const char kLogFileName[] = "vxmigrate.log";
const char kInstallScriptName[] = "synchinstall.sh";
const char kPointerLine[] = "** See VXMigrate Log File for details:  ";

bool EndsWithSeparator(const vxStringBase& text) {
  return text.length() > 0 && (text.at(text.length() - 1) == '/' || text.at(text.length() - 1) == '\\');
}

// folder + separator (unless it already ends in one) + name.
vxStringBase JoinFolder(const vxStringBase& folder, const char* name) {
  vxStringBase path(folder);
  if (!EndsWithSeparator(path)) path.append(vxFileManager::m_slash);
  path.append(name);
  return path;
}

bool PathExists(const vxStringBase& path) { return access(path.c_str(), F_OK) == 0; }

}  // namespace

vxMigrationManager::vxMigrationManager(int argc, char** argv) {
  FindExecutable();
  Start(argc, argv);
}

vxMigrationManager::vxMigrationManager(int argc, char** argv, const vxStringBase& executable) {
  m_executable = executable;
  Start(argc, argv);
}

vxMigrationManager::vxMigrationManager(int argc, char** argv, const vxRunSettings& settings)
    : m_settings(settings) {
  FindExecutable();
  Start(argc, argv);
}

void vxMigrationManager::Start(int argc, char** argv) {
  m_cmdLineParser = new MigrationCmdLineParser(argc, argv);
  m_cmdLineParser->ParseCommand();
  if (!m_cmdLineParser->IsValid()) {
    ReadCommandFile();
    if (!m_cmdLineParser->IsValid()) return;  // incomplete run: no log, nothing written
  }

  m_sourceDirectory = m_cmdLineParser->GetValue("D1");
  m_destinationDirectory = m_cmdLineParser->GetValue("D2");
  m_sourceVersion = m_cmdLineParser->GetValue("V1");
  m_destinationVersion = m_cmdLineParser->GetValue("V2");
  m_sourceProduct = m_cmdLineParser->GetValue("P1");
  m_destinationProduct = m_cmdLineParser->GetValue("P2");
  m_sourceProductID = GetProductID(m_sourceProduct.c_str());
  m_destinationProductID = GetProductID(m_destinationProduct.c_str());
  m_sourceVersionDescriptor = new vxVersionDescriptor(m_sourceVersion);
  m_destinationVersionDescriptor = new vxVersionDescriptor(m_destinationVersion);
  // One run per destination at a time, decided before anything is written (the log included).
  m_destinationLock = std::make_unique<vxFolderLock>();
  if (m_destinationLock->Acquire(m_destinationDirectory) == vxFolderLock::kBusy) {
    m_destinationBusy = true;
    return;
  }
  OpenDoorsAndLog();
}

vxMigrationManager::~vxMigrationManager() {
  // Nobody is left to hear the result; a failure is in the log.
  if (m_record != nullptr && !m_finished) static_cast<void>(FinishRun(m_result));
  delete m_log;
  m_doors.reset();
  delete m_sourceVersionDescriptor;
  delete m_destinationVersionDescriptor;
  delete m_cmdLineParser;
}

bool vxMigrationManager::IsValid() const {
  return m_cmdLineParser != nullptr && m_cmdLineParser->IsValid() == 1;
}

void vxMigrationManager::Log(const char* text) {
  if (m_log == nullptr) return;
  m_log->m_level = kLogNormal;
  m_log->Log(text, kLogNormal);
  NoteEntry(vxLogFile::EntryText(text, nullptr));
}

void vxMigrationManager::Log(const char* text, const char* value) {
  if (m_log == nullptr) return;
  m_log->m_level = kLogNormal;
  m_log->Log(text, value, kLogNormal);
  NoteEntry(vxLogFile::EntryText(text, value));
}

// Counted and told even when the log itself could not take the entry (a full disk): the host's
// report must not depend on the log's disk.
void vxMigrationManager::NoteEntry(const std::string& entry) {
  m_counts.Count(entry);
  if (m_record != nullptr) m_record->NoteEntry(entry);
  if (m_listener != nullptr) m_listener->OnLogEntry(entry);
}

void vxMigrationManager::SetRunListener(vxRunListener* listener) {
  m_listener = listener;
  if (listener == nullptr || m_log == nullptr) return;
  WriteHeader(listener);
  // Logged right after the header, before any listener could be there.
  if (LacksJournal() && m_log->IsOpen()) {
    listener->OnLogEntry(vxLogFile::EntryText(kNoJournal, m_destinationDirectory.c_str()));
  }
}

// The command file fills in what the command line lacks: its "main" keys overwrite the options of
// the same name and its "profiles" keys become the "PF" options, present or not.
void vxMigrationManager::ReadCommandFile() {
  const vxStringBase& cmd = m_cmdLineParser->GetValue("cmd");
  const vxStringBase moduleDirectory = vxFilename(m_executable).Directory();
  const bool bareName =
      cmd.find('\\') == vxStringBase::BadIndex && cmd.find('/') == vxStringBase::BadIndex;
  // Without the executable's folder there is no command file beside it; the current folder is
  // never taken in its place.
  if (moduleDirectory.isEmpty() && (cmd.isEmpty() || bareName)) return;
  vxStringBase path;
  if (cmd.isEmpty()) {
    path = moduleDirectory;
    path.append(kCommandFileName);
  } else if (vxFilename::IsDirectory(cmd.c_str())) {
    path = JoinFolder(cmd, kCommandFileName);
  } else if (bareName) {
    path = moduleDirectory;
    path.append(cmd);
  } else {
    path = cmd;
  }
  if (!PathExists(path)) return;
  vxMappedINIFile commandFile(path);
  if (commandFile.Open(0) != 0) return;

  static const char* const kMainKeys[] = {"D1", "D2", "P1", "P2", "V1", "V2", "FT"};
  for (const char* key : kMainKeys) {
    m_cmdLineParser->SetValue(key, commandFile.GetVal("main", key));
  }
  static const char* const kProfileKeys[][2] = {{"Log", "PFLog"},
                                                {"Proxy", "PFProxy"},
                                                {"Stream", "PFStream"},
                                                {"Link", "PFLink"},
                                                {"Alert", "PFAlert"}};
  for (const auto& key : kProfileKeys) {
    m_cmdLineParser->SetValue(key[1], commandFile.GetVal("profiles", key[0]));
  }
  m_cmdLineParser->Validate();
}

// The running program as the kernel knows it: its real file, whatever name or link started it, so
// an installed link to the host finds the plug-ins beside the real file. Empty when unknown.
void vxMigrationManager::FindExecutable() { vxFileManager::GetModulePath(m_executable); }

void vxMigrationManager::OpenDoorsAndLog() {
  m_doors = std::make_unique<vxRunDoors>(
      m_sourceDirectory, m_destinationDirectory,
      [this](const char* text, const char* path) { Log(text, path); });
  // The record watches from the first write on, the log's included, so that undo gives the old
  // log back.
  if (m_settings.keepJournal || m_settings.writeReport) {
    m_record = std::make_unique<vxRunRecord>(
        m_sourceDirectory.str(), m_destinationDirectory.str(),
        m_settings.shownDestination.empty() ? m_destinationDirectory.str()
                                            : m_settings.shownDestination,
        m_settings.keepJournal);
    m_doors->SetObserver(m_record.get());
  }
  vxStringBase path;
  vxFileManager::MakePath(path, m_destinationDirectory, vxStringBase::NullStr, kLogFileName);
  m_log = new vxLogFile(path, 1);
  WriteHeader(nullptr);
  if (LacksJournal() && m_log->IsOpen()) Log(kNoJournal, m_destinationDirectory.c_str());
}

// The run still migrates (its files are as good), but a promise is broken: an error.
const char vxMigrationManager::kNoJournal[] =
    "Error: No undo journal could be kept; this run cannot be undone: ";

bool vxMigrationManager::LacksJournal() const {
  return m_settings.keepJournal && m_record != nullptr && m_record->Journal() == nullptr;
}

vxIniMergeObserver* vxMigrationManager::RecordMerge(const vxStringBase& source,
                                                    const vxStringBase& destination) {
  return m_record == nullptr ? nullptr : m_record->Merge(source.str(), destination.str());
}

std::string vxMigrationManager::GetReportPath() const {
  if (m_record == nullptr || !m_settings.writeReport) return "";
  vxStringBase path;
  vxFileManager::MakePath(path, m_destinationDirectory, vxStringBase::NullStr, kRunReportName);
  return path.str();
}

long vxMigrationManager::GetFilesWritten() const {
  return m_record == nullptr ? 0 : m_record->FilesWritten();
}

std::string vxMigrationManager::GetRunId() const {
  return m_record != nullptr && m_record->Journal() != nullptr ? m_record->Journal()->Id() : "";
}

// The report goes through the doors like any other write (so undo takes it back too), atomically.
int vxMigrationManager::FinishRun(int status) {
  if (m_record == nullptr || m_finished) return 0;
  m_finished = true;
  int result = 0;
  const std::string path = GetReportPath();
  if (!path.empty() && m_log != nullptr && m_log->IsOpen()) {
    const std::string text = m_record->ReportText(m_pluginSearch.ran);
    vxfiles::ReplaceTarget target;
    vxfiles::AtomicFileWriter writer;
    if (!vxfiles::ResolveReplaceTarget(path, &target) || !writer.Begin(target) ||
        !writer.Append(text) || !writer.Commit(true)) {
      Log("Error: Unable to write file:   ", path.c_str());
      result = 1;
    }
  }
  vxRunJournal* journal = m_record->Journal();
  if (journal != nullptr && !journal->Finish(status)) {
    Log("Error: Unable to write file:   ",
        (journal->Folder() + "/" + kRunJournalFile).c_str());
    result = 1;
  }
  return result;
}

// The header's nine entries: into the log (listener null), or told to a listener that arrives
// after the log was opened, so that it sees the whole log.
void vxMigrationManager::WriteHeader(vxRunListener* listener) {
  const char* const header[][2] = {{"VXMigrate Log File: ", m_log->GetFilename().c_str()},
                                   {"VXMigrate Executable: ", m_executable.c_str()},
                                   {"Source Path: ", m_sourceDirectory.c_str()},
                                   {"Destination Path: ", m_destinationDirectory.c_str()},
                                   {"Source Version: ", m_sourceVersion.c_str()},
                                   {"Destination Version: ", m_destinationVersion.c_str()},
                                   {"Source Product: ", m_sourceProduct.c_str()},
                                   {"Destination Product: ", m_destinationProduct.c_str()},
                                   {"\r\n\r\n", nullptr}};
  for (const auto& entry : header) {
    if (listener != nullptr) {
      listener->OnLogEntry(vxLogFile::EntryText(entry[0], entry[1]));
    } else if (entry[1] != nullptr) {
      Log(entry[0], entry[1]);
    } else {
      Log(entry[0]);
    }
  }
}

int vxMigrationManager::DoMigration() {
  if (m_destinationBusy) return 1;
  int result = DoCheckMigrateValidity();
  if (result != 0) {
    Log(kPointerLine, m_log->GetFilename().c_str());
    m_result = result;
    return result;
  }
  bool found = false;
  RunPlugins(found);
  RunInstallScript();
  // A run that says it finished has its files on the disk: one sync of the destination's file
  // system covers every file and folder the run wrote.
  if (!vxfiles::SyncFileSystemOf(m_destinationDirectory.c_str())) {
    Log("Error: Unable to flush the run's writes to disk: ", m_destinationDirectory.c_str());
  }
  if (!found) {
    Log("Error: No appropriate migration libraries found.  There may not be support for the "
        "products or versions being migrated.  Check the readme file for more info.");
  }
  Log(kPointerLine, m_log->GetFilename().c_str());
  return 0;
}

// Tries the "*.so" files beside the executable in sorted order. The first plug-in that declares
// the run's products and accepts its versions ends the search, whether or not it has "Migrate".
void vxMigrationManager::RunPlugins(bool& found) {
  found = false;
  vxStringBase folder = vxFilename(m_executable).Directory();
  if (folder.isEmpty()) {
    // Never the current folder: any "*.so" where the tool was started would run.
    Log("Error: The folder of the vxmigrate executable is unknown; no migration library loaded.");
    return;
  }
  vxFileInfoList plugins;
  vxFileManager::GetFileList(folder, "*.so", plugins, 1);
  vxMigrateInfo info;
  for (const vxFileInfo& entry : plugins) {
    const vxStringBase& path = entry.GetFilename().Pathname();
    vxSharedLib library(path.c_str());
    if (!library.IsLoaded()) {
      // Skipped without a log line, as the run has always done; the host shows why.
      // The loader's message usually names the file already.
      std::string why = library.LoadError().str();
      if (why.find(path.str()) == std::string::npos) why = path.str() + ": " + why;
      m_pluginSearch.notLoaded.push_back(why);
      continue;
    }
    auto initialize =
        reinterpret_cast<vxMigrateInitializeEntry>(library.ProcAddr("MigrateInitialize"));
    if (initialize == nullptr) continue;  // a shared object, but not a migration plug-in

    for (vxStringBase* field : {&info.sourceProduct, &info.destinationProduct, &info.note1,
                                &info.note2, &info.note3, &info.note4}) {
      field->makeNull();
    }
    try {
      initialize(&info);
    } catch (...) {
      Log("Error: Migration library failed to initialize: ", path.c_str());
      continue;
    }
    if (!m_sourceProduct.equals(info.sourceProduct, false) ||
        !m_destinationProduct.equals(info.destinationProduct, false)) {
      continue;
    }
    int versions = DoCheckVersions(info.sourceProduct, info.destinationProduct);
    if (versions == 2) {
      m_pluginSearch.rangesUnreadable = true;
      Log("Error: Can't open vxmigrate.ini - make sure it's present and isn't read only");
      return;
    }
    if (versions == 1) {
      m_pluginSearch.outOfRange.push_back(path.str());
      continue;
    }

    auto migrate = reinterpret_cast<vxMigrateEntry>(library.ProcAddr("Migrate"));
    found = migrate != nullptr;
    if (found) {
      m_pluginSearch.ran = path.str();
      DeleteAMService();
      StopAMService();
      try {
        migrate(this);
      } catch (...) {
        // A plug-in's exception must not reach the host: the run still ends with its last lines.
        Log("Error: Migration library failed: ", path.c_str());
      }
      StartAMService();
    } else {
      m_pluginSearch.withoutMigrate = path.str();
    }
    return;
  }
}

// Runs "synchinstall.sh" from the destination folder, waiting for it without a time limit.
void vxMigrationManager::RunInstallScript() {
  vxStringBase script = JoinFolder(m_destinationDirectory, kInstallScriptName);
  std::string line = "Looking for Synch Install Script: " + script.str();
  Log(line.c_str());
  if (!PathExists(script)) return;

  line = "Executing Synch Install Script: " + script.str();
  Log(line.c_str());
  char previous[4095];
  bool havePrevious = getcwd(previous, sizeof previous) != nullptr;
  if (chdir(m_destinationDirectory.c_str()) != 0) {
    // "./synchinstall.sh" anywhere else would be some other folder's script.
    Log("Error: Unable to change to the destination folder; Synch Install Script not run: ",
        m_destinationDirectory.c_str());
    return;
  }
  std::string command = std::string("./") + kInstallScriptName;
  line = "Spawning Script: " + command;
  Log(line.c_str());
  vxProc2 process;
  process.Spawn(command.c_str(), nullptr, nullptr, 1, 6);
  if (havePrevious && chdir(previous) != 0) {
    // Nothing sensible to do: the run is over apart from its last lines.
  }
  Log("Done executing Synch Install Script.");
}

int vxMigrationManager::StopAMService() { return 0; }
int vxMigrationManager::DeleteAMService() { return 0; }
int vxMigrationManager::StartAMService() { return 0; }

bool vxMigrationManager::CopiesProfileDataFolders() const {
  const vxStringBase& option = m_cmdLineParser->GetValue("FT");
  return option.isEmpty() || option.equals("Y", false) || option.equals("Yes", false);
}
