// A test-only LD_PRELOAD shim that kills its process with SIGKILL right before the Nth call that
// changes a file or folder, so that a test can stop a run at every point between two changes.
// VXM_KILL_BEFORE=N sets N (unset or 0: never kill); VXM_KILL_COUNT_FILE=path receives, at a
// normal exit, the number of such calls the process made. Counted: creating or writing opens,
// writes to descriptors above 2, kernel copies, renames, links, removals, new folders, truncation,
// mode and time changes. Built for tests only; never shipped.

// The project builds with 64-bit file offsets, which on 32-bit systems renames open to open64 and
// so on in the headers; this file defines both names itself.
#undef _FILE_OFFSET_BITS
#define _GNU_SOURCE
#include <dlfcn.h>
#include <fcntl.h>
#include <signal.h>
#include <stdarg.h>
#include <stdio.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <sys/types.h>
#include <sys/uio.h>
#include <unistd.h>

static long kill_before;
static long changes;

__attribute__((constructor)) static void ReadCountdown(void) {
  const char* text = getenv("VXM_KILL_BEFORE");
  kill_before = text != NULL ? atol(text) : 0;
}

__attribute__((destructor)) static void ReportChanges(void) {
  const char* path = getenv("VXM_KILL_COUNT_FILE");
  if (path == NULL) return;
  kill_before = 0;
  FILE* file = fopen(path, "w");  // stdio's own writes do not pass through this shim
  if (file == NULL) return;
  fprintf(file, "%ld\n", changes);
  fclose(file);
}

static void CountChange(void) {
  if (++changes == kill_before) kill(getpid(), SIGKILL);
}

static int ChangesFile(int flags) { return (flags & (O_WRONLY | O_RDWR | O_CREAT | O_TRUNC)) != 0; }

// Looks the next definition of name up once and keeps it in *slot.
static void* Next(void** slot, const char* name) {
  if (*slot == NULL) *slot = dlsym(RTLD_NEXT, name);
  return *slot;
}

// One interposer per call: count, then hand over to the real function with the same arguments.
#define FORWARD(result, name, params, args, counts)                 \
  result name params {                                              \
    static void* real;                                              \
    if (counts) CountChange();                                      \
    return ((result(*) params)Next(&real, #name)) args;             \
  }

FORWARD(ssize_t, write, (int fd, const void* data, size_t size), (fd, data, size), fd > 2)
FORWARD(ssize_t, pwrite, (int fd, const void* data, size_t size, off_t at), (fd, data, size, at),
        fd > 2)
FORWARD(ssize_t, pwrite64, (int fd, const void* data, size_t size, off64_t at),
        (fd, data, size, at), fd > 2)
FORWARD(ssize_t, writev, (int fd, const struct iovec* parts, int count), (fd, parts, count), fd > 2)
FORWARD(ssize_t, copy_file_range,
        (int in, off64_t* inAt, int out, off64_t* outAt, size_t size, unsigned int flags),
        (in, inAt, out, outAt, size, flags), 1)
FORWARD(ssize_t, sendfile, (int out, int in, off_t* at, size_t size), (out, in, at, size), 1)
FORWARD(ssize_t, sendfile64, (int out, int in, off64_t* at, size_t size), (out, in, at, size), 1)
FORWARD(int, rename, (const char* from, const char* to), (from, to), 1)
FORWARD(int, renameat, (int fromDir, const char* from, int toDir, const char* to),
        (fromDir, from, toDir, to), 1)
FORWARD(int, renameat2,
        (int fromDir, const char* from, int toDir, const char* to, unsigned int flags),
        (fromDir, from, toDir, to, flags), 1)
FORWARD(int, link, (const char* from, const char* to), (from, to), 1)
FORWARD(int, linkat, (int fromDir, const char* from, int toDir, const char* to, int flags),
        (fromDir, from, toDir, to, flags), 1)
FORWARD(int, symlink, (const char* target, const char* path), (target, path), 1)
FORWARD(int, unlink, (const char* path), (path), 1)
FORWARD(int, unlinkat, (int dir, const char* path, int flags), (dir, path, flags), 1)
FORWARD(int, rmdir, (const char* path), (path), 1)
FORWARD(int, mkdir, (const char* path, mode_t mode), (path, mode), 1)
FORWARD(int, mkdirat, (int dir, const char* path, mode_t mode), (dir, path, mode), 1)
FORWARD(int, ftruncate, (int fd, off_t size), (fd, size), 1)
FORWARD(int, ftruncate64, (int fd, off64_t size), (fd, size), 1)
FORWARD(int, chmod, (const char* path, mode_t mode), (path, mode), 1)
FORWARD(int, fchmod, (int fd, mode_t mode), (fd, mode), 1)
FORWARD(int, fchmodat, (int dir, const char* path, mode_t mode, int flags),
        (dir, path, mode, flags), 1)
FORWARD(int, futimens, (int fd, const struct timespec times[2]), (fd, times), 1)
FORWARD(int, utimensat, (int dir, const char* path, const struct timespec times[2], int flags),
        (dir, path, times, flags), 1)
FORWARD(int, mkstemp, (char* pattern), (pattern), 1)
FORWARD(int, mkstemp64, (char* pattern), (pattern), 1)
FORWARD(int, mkostemp, (char* pattern, int flags), (pattern, flags), 1)
FORWARD(int, mkostemp64, (char* pattern, int flags), (pattern, flags), 1)
FORWARD(int, creat, (const char* path, mode_t mode), (path, mode), 1)
FORWARD(int, creat64, (const char* path, mode_t mode), (path, mode), 1)

// The opens take a mode only with O_CREAT or O_TMPFILE; it is read and passed on only then.
static int TakesMode(int flags) {
  return (flags & O_CREAT) != 0 || (flags & O_TMPFILE) == O_TMPFILE;
}
// Declares mode from the variadic argument after flags where there is one, and counts the open
// when it may change a file.
#define TAKE_MODE_AND_COUNT(flags, mode)   \
  mode_t mode = 0;                         \
  if (TakesMode(flags)) {                  \
    va_list rest;                          \
    va_start(rest, flags);                 \
    mode = (mode_t)va_arg(rest, int);      \
    va_end(rest);                          \
  }                                        \
  if (ChangesFile(flags)) CountChange()

#define FORWARD_OPEN(name)                                                          \
  int name(const char* path, int flags, ...) {                                      \
    static void* real;                                                              \
    TAKE_MODE_AND_COUNT(flags, mode);                                               \
    return ((int (*)(const char*, int, ...))Next(&real, #name))(path, flags, mode); \
  }
#define FORWARD_OPENAT(name)                                                                  \
  int name(int dir, const char* path, int flags, ...) {                                       \
    static void* real;                                                                        \
    TAKE_MODE_AND_COUNT(flags, mode);                                                         \
    return ((int (*)(int, const char*, int, ...))Next(&real, #name))(dir, path, flags, mode); \
  }
FORWARD_OPEN(open)
FORWARD_OPEN(open64)
FORWARD_OPENAT(openat)
FORWARD_OPENAT(openat64)
