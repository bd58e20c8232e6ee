// Running-server detection: the engine and interface servers of the two server-owning products
// record their pids in files in the installation folder; a migration must not run beside them.

#include <fcntl.h>
#include <signal.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>

#include "foundation/files/file_manager.h"
#include "migrate/manager.h"

namespace {

const int kReportingServer = 20;  // "obx"
const int kTradeServer = 21;      // "tqrs"

enum ServerKind { kEngine, kInterface };

struct ServerRow {
  int productID;
  ServerKind kind;
  const char* pidFileBefore31;  // versions before 3.1
  const char* pidFileFrom31;
  const char* message;
};

const ServerRow kServers[] = {
    {kTradeServer, kEngine, "tqrs.pid", "vxtq.pid",
     "Error: Cannot migrate while Tradequill Engine Server is running - shut down to migrate"},
    {kTradeServer, kInterface, "vxinterface.pid", "vxtq_ui.pid",
     "Error: Cannot migrate while Tradequill Interface Server is running - shut down to migrate"},
    {kReportingServer, kEngine, "vxrs.pid", "vxrs.pid",
     "Error: Cannot migrate while Halden Engine Server is running - shut down to migrate"},
    {kReportingServer, kInterface, "vxinterface.pid", "vxrs_ui.pid",
     "Error: Cannot migrate while Halden Interface Server is running - shut down to migrate"},
};

// 1 (and the server's message in the log) when the pid file of that server names a live process.
// Products without servers have no pid file and never count as running, even when the
// installation "folder" given is really a file that happens to read as a pid.
int CheckServerRunning(vxMigrationManager& manager, ServerKind kind, int productID,
                       const vxVersionDescriptor& version, const vxStringBase& folder) {
  const ServerRow* row = nullptr;
  for (const ServerRow& candidate : kServers) {
    if (candidate.productID == productID && candidate.kind == kind) row = &candidate;
  }
  if (row == nullptr) return 0;
  const char* pidFile =
      version < vxVersionDescriptor("3.1") ? row->pidFileBefore31 : row->pidFileFrom31;
  vxStringBase path;
  vxFileManager::MakePath(path, folder, pidFile, 1);
  if (!manager.sendNullSignal(manager.readPid(path.c_str()))) return 0;
  manager.Log(row->message);
  return 1;
}

}  // namespace

int vxMigrationManager::CheckEngineRunning(int productID, const vxVersionDescriptor& version,
                                           int which) {
  return CheckServerRunning(*this, kEngine, productID, version,
                            which == 0 ? m_destinationDirectory : m_sourceDirectory);
}

int vxMigrationManager::CheckInterfaceRunning(int productID, const vxVersionDescriptor& version,
                                              int which) {
  return CheckServerRunning(*this, kInterface, productID, version,
                            which == 0 ? m_destinationDirectory : m_sourceDirectory);
}

// The pid at the start of the file's first 19 bytes; -1 when the file cannot be read. Text that
// is not a number reads as 0, which the null signal then finds "running" (our own process group):
// a damaged pid file errs on the side of not migrating under a live server.
int vxMigrationManager::readPid(const char* path) {
  int pid = -1;
  // Never blocks on a pipe put where the pid file should be; it then reads as empty.
  int fd = open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK);
  if (fd == 0) {
    close(fd);
    return pid;
  }
  char text[20];
  ssize_t count = read(fd, text, 19);
  if (count >= 0) {
    text[count] = '\0';
    long value = strtol(text, nullptr, 10);
    pid = (value > INT32_MAX || value < INT32_MIN) ? -1 : static_cast<int>(value);
  }
  if (fd > 0) close(fd);
  return pid;
}

bool vxMigrationManager::sendNullSignal(int pid) {
  if (pid == -1) return false;
  return kill(pid, 0) == 0;
}
