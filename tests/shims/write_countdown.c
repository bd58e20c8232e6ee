// A test-only LD_PRELOAD shim that counts the calls of its process that change a file or folder
// and, at the N-th one, either kills the process with SIGKILL right before it (a crash at that
// point) or makes it fail with an errno without doing anything (a full disk or an I/O error).
// VXM_KILL_BEFORE=N kills; VXM_FAIL_AT=N with VXM_FAIL_ERRNO=number fails (unset or 0: never).
// VXM_COUNT_FILE=path receives, at a normal exit, the number of such calls the process made;
// VXM_FAULT_NOTE_FILE=path receives the failed call as "name<TAB>path" when it happens.
// VXM_VERSIONS_DIR=folder receives every version of a file the process puts in place by a rename
// or a link (numbered files holding "mode bytes", as the tests compare trees, listed in "index").
// Counted: creating or writing opens, writes to descriptors above 2, kernel copies, renames,
// links, removals, new folders, truncation, mode and time changes, syncs. Built for tests only.

// The project builds with 64-bit file offsets, which on 32-bit systems renames open to open64 and
// so on in the headers; this file defines both names itself.
#undef _FILE_OFFSET_BITS
#define _GNU_SOURCE
#include <dlfcn.h>
#include <errno.h>
#include <fcntl.h>
#include <limits.h>
#include <signal.h>
#include <stdarg.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <sys/types.h>
#include <sys/uio.h>
#include <unistd.h>

static long kill_before;
static long fail_at;
static int fail_errno;
static long changes;

static long NumberFrom(const char* name) {
  const char* text = getenv(name);
  return text != NULL ? atol(text) : 0;
}

__attribute__((constructor)) static void ReadCountdown(void) {
  kill_before = NumberFrom("VXM_KILL_BEFORE");
  fail_at = NumberFrom("VXM_FAIL_AT");
  fail_errno = (int)NumberFrom("VXM_FAIL_ERRNO");
  if (fail_errno == 0) fail_errno = EIO;
}

__attribute__((destructor)) static void ReportChanges(void) {
  const char* path = getenv("VXM_COUNT_FILE");
  if (path == NULL) return;
  kill_before = fail_at = 0;
  FILE* file = fopen(path, "w");  // stdio's own writes do not pass through this shim
  if (file == NULL) return;
  fprintf(file, "%ld\n", changes);
  fclose(file);
}

// Where the entry path of the folder open at dir (or the current folder) is, as an absolute path.
static void AbsolutePath(int dir, const char* path, char* out, size_t size) {
  char folder[PATH_MAX] = "";
  if (path[0] != '/') {
    ssize_t n = -1;
    if (dir == AT_FDCWD) {
      n = getcwd(folder, sizeof folder) != NULL ? (ssize_t)strlen(folder) : -1;
    } else {
      char link[64];
      snprintf(link, sizeof link, "/proc/self/fd/%d", dir);
      n = readlink(link, folder, sizeof folder - 1);
    }
    folder[n > 0 ? n : 0] = '\0';
  }
  snprintf(out, size, "%s%s%s", folder, folder[0] != '\0' ? "/" : "", path);
}

// Keeps the version of the file just put in place at path (see VXM_VERSIONS_DIR).
static void KeepVersion(int dir, const char* path) {
  const char* versions = getenv("VXM_VERSIONS_DIR");
  if (versions == NULL) return;
  static long kept;
  char absolute[PATH_MAX], copy[PATH_MAX], index[PATH_MAX];
  AbsolutePath(dir, path, absolute, sizeof absolute);
  struct stat st;
  if (lstat(absolute, &st) != 0 || !S_ISREG(st.st_mode)) return;
  snprintf(copy, sizeof copy, "%s/%ld", versions, ++kept);
  snprintf(index, sizeof index, "%s/index", versions);
  FILE* in = fopen(absolute, "rb");  // stdio's own opens and writes do not pass through this shim
  FILE* out = fopen(copy, "wb");
  FILE* list = fopen(index, "a");
  if (in != NULL && out != NULL && list != NULL) {
    fprintf(out, "%04o ", (unsigned)(st.st_mode & 07777));
    char buffer[65536];
    for (size_t n; (n = fread(buffer, 1, sizeof buffer, in)) > 0;) fwrite(buffer, 1, n, out);
    fprintf(list, "%ld\t%s\n", kept, absolute);
  }
  if (in != NULL) fclose(in);
  if (out != NULL) fclose(out);
  if (list != NULL) fclose(list);
}

// Notes the failed call (see VXM_FAULT_NOTE_FILE): where it would have written, or the file open
// at fd when it names no path.
static void NoteFailure(const char* call, int fd, const char* path) {
  const char* notePath = getenv("VXM_FAULT_NOTE_FILE");
  if (notePath == NULL) return;
  char where[PATH_MAX];
  if (path != NULL) {
    AbsolutePath(fd, path, where, sizeof where);
  } else {
    char link[64];
    snprintf(link, sizeof link, "/proc/self/fd/%d", fd);
    const ssize_t n = readlink(link, where, sizeof where - 1);
    where[n > 0 ? n : 0] = '\0';
  }
  FILE* note = fopen(notePath, "w");
  if (note == NULL) return;
  fprintf(note, "%s\t%s\n", call, where);
  fclose(note);
}

// Counts one change; true when this call must fail (errno is set and nothing is done).
static int Countdown(const char* call, int fd, const char* path) {
  ++changes;
  if (changes == kill_before) kill(getpid(), SIGKILL);
  if (changes != fail_at) return 0;
  NoteFailure(call, fd, path);
  errno = fail_errno;
  return 1;
}

static int ChangesFile(int flags) { return (flags & (O_WRONLY | O_RDWR | O_CREAT | O_TRUNC)) != 0; }

// Looks the next definition of name up once and keeps it in *slot.
static void* Next(void** slot, const char* name) {
  if (*slot == NULL) *slot = dlsym(RTLD_NEXT, name);
  return *slot;
}

// One interposer per call: when counts holds, count (fd and path say what the call writes, for
// the note), then hand over to the real function with the same arguments unless it must fail.
#define FORWARD(result, name, params, args, counts, fd, path)     \
  result name params {                                            \
    static void* real;                                            \
    if ((counts) && Countdown(#name, fd, path)) return -1;        \
    return ((result(*) params)Next(&real, #name)) args;           \
  }
#define CWD AT_FDCWD
// As FORWARD, for a call that puts a file in place at path: its new version is kept.
#define FORWARD_PLACING(result, name, params, args, fd, path)                 \
  result name params {                                                        \
    static void* real;                                                        \
    if (Countdown(#name, fd, path)) return -1;                                \
    result done = ((result(*) params)Next(&real, #name)) args;                \
    if (done == 0) KeepVersion(fd, path);                                     \
    return done;                                                              \
  }

FORWARD(ssize_t, write, (int fd, const void* data, size_t size), (fd, data, size), fd > 2, fd,
        NULL)
FORWARD(ssize_t, pwrite, (int fd, const void* data, size_t size, off_t at), (fd, data, size, at),
        fd > 2, fd, NULL)
FORWARD(ssize_t, pwrite64, (int fd, const void* data, size_t size, off64_t at),
        (fd, data, size, at), fd > 2, fd, NULL)
FORWARD(ssize_t, writev, (int fd, const struct iovec* parts, int count), (fd, parts, count),
        fd > 2, fd, NULL)
FORWARD(ssize_t, copy_file_range,
        (int in, off64_t* inAt, int out, off64_t* outAt, size_t size, unsigned int flags),
        (in, inAt, out, outAt, size, flags), 1, out, NULL)
FORWARD(ssize_t, sendfile, (int out, int in, off_t* at, size_t size), (out, in, at, size), 1, out,
        NULL)
FORWARD(ssize_t, sendfile64, (int out, int in, off64_t* at, size_t size), (out, in, at, size), 1,
        out, NULL)
FORWARD_PLACING(int, rename, (const char* from, const char* to), (from, to), CWD, to)
FORWARD_PLACING(int, renameat, (int fromDir, const char* from, int toDir, const char* to),
                (fromDir, from, toDir, to), toDir, to)
FORWARD_PLACING(int, renameat2,
                (int fromDir, const char* from, int toDir, const char* to, unsigned int flags),
                (fromDir, from, toDir, to, flags), toDir, to)
FORWARD_PLACING(int, link, (const char* from, const char* to), (from, to), CWD, to)
FORWARD_PLACING(int, linkat,
                (int fromDir, const char* from, int toDir, const char* to, int flags),
                (fromDir, from, toDir, to, flags), toDir, to)
FORWARD(int, symlink, (const char* target, const char* path), (target, path), 1, CWD, path)
FORWARD(int, symlinkat, (const char* target, int dir, const char* path), (target, dir, path), 1,
        dir, path)
FORWARD(int, unlink, (const char* path), (path), 1, CWD, path)
FORWARD(int, unlinkat, (int dir, const char* path, int flags), (dir, path, flags), 1, dir, path)
FORWARD(int, rmdir, (const char* path), (path), 1, CWD, path)
FORWARD(int, mkdir, (const char* path, mode_t mode), (path, mode), 1, CWD, path)
FORWARD(int, mkdirat, (int dir, const char* path, mode_t mode), (dir, path, mode), 1, dir, path)
FORWARD(int, ftruncate, (int fd, off_t size), (fd, size), 1, fd, NULL)
FORWARD(int, ftruncate64, (int fd, off64_t size), (fd, size), 1, fd, NULL)
FORWARD(int, chmod, (const char* path, mode_t mode), (path, mode), 1, CWD, path)
FORWARD(int, fchmod, (int fd, mode_t mode), (fd, mode), 1, fd, NULL)
FORWARD(int, fchmodat, (int dir, const char* path, mode_t mode, int flags),
        (dir, path, mode, flags), 1, dir, path)
FORWARD(int, futimens, (int fd, const struct timespec times[2]), (fd, times), 1, fd, NULL)
FORWARD(int, utimensat, (int dir, const char* path, const struct timespec times[2], int flags),
        (dir, path, times, flags), 1, dir, path)
FORWARD(int, fsync, (int fd), (fd), 1, fd, NULL)
FORWARD(int, fdatasync, (int fd), (fd), 1, fd, NULL)
FORWARD(int, syncfs, (int fd), (fd), 1, fd, NULL)
FORWARD(int, mkstemp, (char* pattern), (pattern), 1, CWD, pattern)
FORWARD(int, mkstemp64, (char* pattern), (pattern), 1, CWD, pattern)
FORWARD(int, mkostemp, (char* pattern, int flags), (pattern, flags), 1, CWD, pattern)
FORWARD(int, mkostemp64, (char* pattern, int flags), (pattern, flags), 1, CWD, pattern)
FORWARD(int, creat, (const char* path, mode_t mode), (path, mode), 1, CWD, path)
FORWARD(int, creat64, (const char* path, mode_t mode), (path, mode), 1, CWD, path)

// The opens take a mode only with O_CREAT or O_TMPFILE; it is read and passed on only then.
static int TakesMode(int flags) {
  return (flags & O_CREAT) != 0 || (flags & O_TMPFILE) == O_TMPFILE;
}
// Declares mode from the variadic argument after flags where there is one, and counts the open
// when it may change a file; an open that must fail returns -1 at once.
#define TAKE_MODE_AND_COUNT(flags, mode, dir, path)                       \
  mode_t mode = 0;                                                        \
  if (TakesMode(flags)) {                                                 \
    va_list rest;                                                         \
    va_start(rest, flags);                                                \
    mode = (mode_t)va_arg(rest, int);                                     \
    va_end(rest);                                                         \
  }                                                                       \
  if (ChangesFile(flags) && Countdown(__func__, dir, path)) return -1

#define FORWARD_OPEN(name)                                                          \
  int name(const char* path, int flags, ...) {                                      \
    static void* real;                                                              \
    TAKE_MODE_AND_COUNT(flags, mode, CWD, path);                                    \
    return ((int (*)(const char*, int, ...))Next(&real, #name))(path, flags, mode); \
  }
#define FORWARD_OPENAT(name)                                                                  \
  int name(int dir, const char* path, int flags, ...) {                                       \
    static void* real;                                                                        \
    TAKE_MODE_AND_COUNT(flags, mode, dir, path);                                              \
    return ((int (*)(int, const char*, int, ...))Next(&real, #name))(dir, path, flags, mode); \
  }
FORWARD_OPEN(open)
FORWARD_OPEN(open64)
FORWARD_OPENAT(openat)
FORWARD_OPENAT(openat64)
