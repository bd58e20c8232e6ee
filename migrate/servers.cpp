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

struct ServerFacts {
  const char* pidFile;  // "" for products without servers
  const char* message;
};

ServerFacts EngineFacts(int productID, const vxVersionDescriptor& version) {
  bool before31 = version < vxVersionDescriptor("3.1");
  if (productID == kTradeServer) {
    return {before31 ? "tqrs.pid" : "vxtq.pid",
            "Error: Cannot migrate while Tradequill Engine Server is running - shut down to migrate"};
  }
  if (productID == kReportingServer) {
    return {"vxrs.pid",
            "Error: Cannot migrate while Halden Engine Server is running - shut down to migrate"};
  }
  return {"", ""};
}

ServerFacts InterfaceFacts(int productID, const vxVersionDescriptor& version) {
  bool before31 = version < vxVersionDescriptor("3.1");
  if (productID == kTradeServer) {
    return {before31 ? "vxinterface.pid" : "vxtq_ui.pid",
            "Error: Cannot migrate while Tradequill Interface Server is running - shut down to "
            "migrate"};
  }
  if (productID == kReportingServer) {
    return {before31 ? "vxinterface.pid" : "vxrs_ui.pid",
            "Error: Cannot migrate while Halden Interface Server is running - shut down to migrate"};
  }
  return {"", ""};
}

}  // namespace

int vxMigrationManager::CheckEngineRunning(int productID, const vxVersionDescriptor& version,
                                           int which) {
  ServerFacts facts = EngineFacts(productID, version);
  vxStringBase path;
  vxFileManager::MakePath(path, which == 0 ? m_destinationDirectory : m_sourceDirectory,
                          facts.pidFile, 1);
  if (!sendNullSignal(readPid(path.c_str()))) return 0;
  Log(facts.message);
  return 1;
}

int vxMigrationManager::CheckInterfaceRunning(int productID, const vxVersionDescriptor& version,
                                              int which) {
  ServerFacts facts = InterfaceFacts(productID, version);
  vxStringBase path;
  vxFileManager::MakePath(path, which == 0 ? m_destinationDirectory : m_sourceDirectory,
                          facts.pidFile, 1);
  if (!sendNullSignal(readPid(path.c_str()))) return 0;
  Log(facts.message);
  return 1;
}

// The pid at the start of the file's first 19 bytes; -1 when the file cannot be read. Text that
// is not a number reads as 0, which the null signal then finds "running" (our own process group):
// a damaged pid file errs on the side of not migrating under a live server.
int vxMigrationManager::readPid(const char* path) {
  int pid = -1;
  int fd = open(path, O_RDONLY | O_CLOEXEC);
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
