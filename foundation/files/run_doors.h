// The two doors of a run. Every file or folder a run creates, replaces, renames or removes is first
// shown to the write door, and every installation file or folder it reads is shown to the read
// door. The doors hold the run's two installations by their real paths, resolved once when the run
// starts, and compare folders by device and inode, so links, "..", two spellings of one folder and
// bind mounts all agree. Outside a run (no doors open) every path is admitted. Not thread-safe: a
// run is one thread.

#ifndef VXMIGRATE_FOUNDATION_FILES_RUN_DOORS_H_
#define VXMIGRATE_FOUNDATION_FILES_RUN_DOORS_H_

#include <sys/types.h>

#include <functional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>

#include "foundation/export.h"
#include "foundation/files/path_text.h"
#include "foundation/string/string_base.h"

// Told of each change the doors admitted, before it is made, and of each installation read. The
// run installs one (the undo journal and the run's report); the doors do not own it. A false from
// a Before call refuses the change: the old state could not be kept, so the change must not happen.
class VXM_EXPORT vxWriteObserver {
 public:
  enum class Change {
    kEntry,    // an entry at path will be created, replaced by a rename, or removed
    kInPlace,  // the file at path will be written where it stands (truncated or appended to)
    kInto,     // entries will be made inside the folder path; missing folders will be created
  };
  virtual ~vxWriteObserver() = default;
  virtual bool BeforeWrite(std::string_view path, Change change) = 0;
  // The entry name of the folder open at dirFd will be created or replaced (copies of a tree).
  virtual bool BeforeWriteAt(int dirFd, const char* name) = 0;
  virtual void AfterReadAdmitted(std::string_view path) = 0;
};

class VXM_EXPORT vxRunDoors {
 public:
  // Receives every refusal as an "Error: " text and the path it concerns.
  using Reporter = std::function<void(const char* text, const char* path)>;

  // Opens the doors of a run from source to destination and makes them the process's current
  // doors until they are destroyed. An installation folder that cannot be resolved admits no
  // write (and, for the destination, no log).
  vxRunDoors(const vxStringBase& source, const vxStringBase& destination, Reporter reporter);
  ~vxRunDoors();

  vxRunDoors(const vxRunDoors&) = delete;
  vxRunDoors& operator=(const vxRunDoors&) = delete;

  // The doors of the run in progress; null outside a run.
  static vxRunDoors* Current();

  // Both installations are one folder: the one case where writes inside the source are expected.
  bool InPlace() const { return inPlace_; }
  // The destination's real folder lies below the source's real folder.
  bool DestinationInsideSource() const { return destinationInsideSource_; }

  // An entry at path may be created, replaced, renamed or removed: the folder it lies in, after
  // resolving every link and ".." on the way (folders still to be made count as made there), is
  // inside the destination installation and not inside the source installation. A link standing
  // at path itself is replaced, never written through, so only the folders on the way count.
  bool AdmitWrite(std::string_view path);
  // Entries may be made inside folder (resolved whole, a link at its end included).
  bool AdmitWriteInto(std::string_view folder);
  // A write of the run failed with error on path. A full disk or quota (ENOSPC, EDQUOT) or a
  // failing device (EIO) takes no more writes: the first such failure is reported and from then
  // on every write is refused (errno is that error), so the run leaves what a run stopped at that
  // point leaves, which a re-run finishes. Any other error concerns that one file only.
  void NoteWriteFailure(int error, std::string_view path);
  // The error that stopped the run's writes; 0 while they go on.
  int StoppedBy() const { return stoppedBy_; }

  // path may be read. A path inside one of the installations (by its text) must lead, every link
  // followed, to an entry inside one of them; a path that leads nowhere is left to its reader to
  // report as missing. Other paths (the host's own files) are not installation reads.
  bool AdmitRead(std::string_view path);

  // Installs the observer of this run's changes (null: none). Not owned.
  void SetObserver(vxWriteObserver* observer) { observer_ = observer; }
  vxWriteObserver* Observer() const { return observer_; }

  // folder joined with a name read from a settings file, as vxFileManager::MakePath joins them,
  // except that "." parts are dropped and ".." takes back the part before it. False, with an
  // "Error: " line through the current doors, when ".." would climb above folder.
  static bool JoinBeneath(vxStringBase& result, const vxStringBase& folder,
                          const vxStringBase& name, unsigned int isFile);

 private:
  struct FolderId {
    dev_t dev = 0;
    ino_t ino = 0;
    bool known = false;
  };
  // The first installation met walking up from a real folder to the root.
  enum class Within { kNeither, kSource, kDestination };

  bool AdmitWriteBelow(const std::string& folder, std::string_view path);
  Within Locate(const std::string& realFolder);
  bool IsInstallationText(const std::string& path) const;
  void Refuse(const char* text, std::string_view path) const;
  void SweepOnce(const std::string& realFolder);

  Reporter reporter_;
  std::string sourceText_;
  std::string destinationText_;
  std::string sourceReal_;
  std::string destinationReal_;
  FolderId source_;
  FolderId destination_;
  bool inPlace_ = false;
  bool destinationInsideSource_ = false;
  int stoppedBy_ = 0;
  std::unordered_map<std::string, Within> located_;  // real folder -> first installation above it
  std::unordered_set<std::string> swept_;            // destination folders cleared of stale temps
  vxRealPaths realPaths_;
  vxRunDoors* previous_ = nullptr;
  vxWriteObserver* observer_ = nullptr;
};

// The checks of the current doors for the file layer; each admits everything outside a run.
namespace vxfiles {
VXM_EXPORT bool MayWrite(std::string_view path);
// As MayWrite, for a file that will be written where it stands rather than replaced.
VXM_EXPORT bool MayWriteInPlace(std::string_view path);
VXM_EXPORT bool MayWriteInto(std::string_view folder);
// The entry name of the folder open at dirFd (already admitted by MayWriteInto) is about to be
// created or replaced; false when the run's observer could not keep what stands there.
VXM_EXPORT bool MayWriteAt(int dirFd, const char* name);
VXM_EXPORT bool MayRead(std::string_view path);
// Tells the current doors (if any) that a write on path failed with error; errno is kept.
VXM_EXPORT void NoteWriteFailure(int error, std::string_view path);
}  // namespace vxfiles

#endif  // VXMIGRATE_FOUNDATION_FILES_RUN_DOORS_H_
