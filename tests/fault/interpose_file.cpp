/* SPDX-License-Identifier: Apache-2.0 */
// Calls that open, move, flush and remove files. Reads and writes are in interpose_io.cpp. The 64 variants
// are separate names; a library may be compiled against either. For calls on descriptors, the decision uses
// the descriptor's path; paths given as arguments are used unchanged.

#include <cerrno>
#include <cstdarg>
#include <cstdio>

#include <dirent.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

#include "fault/plan.h"
#include "fault/real.h"

using fault::Fails;
using fault::Kind;
using fault::Quiet;
using fault::Real;
using fault::Subject;

namespace {

Subject Path(const char *path, int dirFd = AT_FDCWD) {
    return {.dirFd = dirFd, .path = path};
}
Subject Fd(int fd) {
    return {.fd = fd};
}

/// The mode argument; open has one only when it may create a file.
mode_t ModeOf(int flags, va_list args) {
    const bool creates = (flags & O_CREAT) != 0 || (flags & O_TMPFILE) == O_TMPFILE;
    return creates ? va_arg(args, mode_t) : 0;
}

template <typename Function, typename... Args> int Call(Real<Function> *real, Args... args) {
    const Quiet quiet;
    return (*real)(args...);
}

#define WITH_MODE(statement)                                                                                 \
    va_list args;                                                                                            \
    va_start(args, flags);                                                                                   \
    const mode_t mode = ModeOf(flags, args);                                                                 \
    va_end(args);                                                                                            \
    statement

int OpenPath(Real<int(const char *, int, ...)> *real, const char *path, int flags, mode_t mode) {
    if (Fails(Kind::kOpen, {.dirFd = AT_FDCWD, .path = path, .openFlags = flags})) return -1;
    return Call(real, path, flags, mode);
}

int OpenAt(Real<int(int, const char *, int, ...)> *real, int dirFd, const char *path, int flags,
           mode_t mode) {
    if (Fails(Kind::kOpen, {.dirFd = dirFd, .path = path, .openFlags = flags})) return -1;
    return Call(real, dirFd, path, flags, mode);
}

constinit Real<int(const char *, int, ...)> g_open("open");
constinit Real<int(const char *, int, ...)> g_open64("open64");
constinit Real<int(int, const char *, int, ...)> g_openat("openat");
constinit Real<int(int, const char *, int, ...)> g_openat64("openat64");

} // namespace

extern "C" {

int open(const char *path, int flags, ...) {
    WITH_MODE(return OpenPath(&g_open, path, flags, mode));
}
int open64(const char *path, int flags, ...) {
    WITH_MODE(return OpenPath(&g_open64, path, flags, mode));
}
int openat(int dirFd, const char *path, int flags, ...) {
    WITH_MODE(return OpenAt(&g_openat, dirFd, path, flags, mode));
}
int openat64(int dirFd, const char *path, int flags, ...) {
    WITH_MODE(return OpenAt(&g_openat64, dirFd, path, flags, mode));
}
// A fortified build calls these when the mode is omitted.
int __open_2(const char *path, int flags) {
    return OpenPath(&g_open, path, flags, 0);
}
int __open64_2(const char *path, int flags) {
    return OpenPath(&g_open64, path, flags, 0);
}
int __openat_2(int dirFd, const char *path, int flags) {
    return OpenAt(&g_openat, dirFd, path, flags, 0);
}
int __openat64_2(int dirFd, const char *path, int flags) {
    return OpenAt(&g_openat64, dirFd, path, flags, 0);
}

int creat(const char *path, mode_t mode) {
    return OpenPath(&g_open, path, O_CREAT | O_WRONLY | O_TRUNC, mode);
}
int creat64(const char *path, mode_t mode) {
    return OpenPath(&g_open64, path, O_CREAT | O_WRONLY | O_TRUNC, mode);
}

// The C library's streams do not open through the names above. Their allocations still count.
FILE *fopen(const char *path, const char *mode) {
    static constinit Real<FILE *(const char *, const char *)> real("fopen");
    return Fails(Kind::kOpen, Path(path)) ? nullptr : real(path, mode);
}
FILE *fopen64(const char *path, const char *mode) {
    static constinit Real<FILE *(const char *, const char *)> real("fopen64");
    return Fails(Kind::kOpen, Path(path)) ? nullptr : real(path, mode);
}
DIR *opendir(const char *path) {
    static constinit Real<DIR *(const char *)> real("opendir");
    return Fails(Kind::kOpen, Path(path)) ? nullptr : real(path);
}

int close(int fd) {
    static constinit Real<int(int)> real("close");
    // A failing close still closes: Linux releases the descriptor first.
    const bool fails = Fails(Kind::kClose, Fd(fd));
    const int error = errno;
    const int result = Call(&real, fd);
    if (!fails || result != 0) return result;
    errno = error;
    return -1;
}

#define FD_CALL(kind, name, parameters, ...)                                                                 \
    int name parameters {                                                                                    \
        static constinit Real<int parameters> real(#name);                                                   \
        return Fails(kind, Fd(fd)) ? -1 : Call(&real, __VA_ARGS__);                                          \
    }

FD_CALL(Kind::kFsync, fsync, (int fd), fd)
FD_CALL(Kind::kFsync, fdatasync, (int fd), fd)
FD_CALL(Kind::kTruncate, ftruncate, (int fd, off_t length), fd, length)
FD_CALL(Kind::kTruncate, ftruncate64, (int fd, off64_t length), fd, length)
FD_CALL(Kind::kStat, fstat, (int fd, struct stat *info), fd, info)
FD_CALL(Kind::kStat, fstat64, (int fd, struct stat64 *info), fd, info)
FD_CALL(Kind::kFlock, flock, (int fd, int operation), fd, operation)
FD_CALL(Kind::kChmod, fchmod, (int fd, mode_t mode), fd, mode)

#define PATH_CALL(kind, subject, name, parameters, ...)                                                      \
    int name parameters {                                                                                    \
        static constinit Real<int parameters> real(#name);                                                   \
        return Fails(kind, subject) ? -1 : Call(&real, __VA_ARGS__);                                         \
    }

PATH_CALL(Kind::kTruncate, Path(path), truncate, (const char *path, off_t length), path, length)
PATH_CALL(Kind::kTruncate, Path(path), truncate64, (const char *path, off64_t length), path, length)
PATH_CALL(Kind::kRename, Path(to), rename, (const char *from, const char *to), from, to)
PATH_CALL(Kind::kRename, Path(to, toFd), renameat, (int fromFd, const char *from, int toFd, const char *to),
          fromFd, from, toFd, to)
PATH_CALL(Kind::kRename, Path(to, toFd), renameat2,
          (int fromFd, const char *from, int toFd, const char *to, unsigned flags), fromFd, from, toFd, to,
          flags)
PATH_CALL(Kind::kUnlink, Path(path), unlink, (const char *path), path)
PATH_CALL(Kind::kUnlink, Path(path, dirFd), unlinkat, (int dirFd, const char *path, int flags), dirFd, path,
          flags)
PATH_CALL(Kind::kStat, Path(path), stat, (const char *path, struct stat *info), path, info)
PATH_CALL(Kind::kStat, Path(path), stat64, (const char *path, struct stat64 *info), path, info)
PATH_CALL(Kind::kStat, Path(path), lstat, (const char *path, struct stat *info), path, info)
PATH_CALL(Kind::kStat, Path(path), lstat64, (const char *path, struct stat64 *info), path, info)
PATH_CALL(Kind::kStat, Path(path, dirFd), fstatat,
          (int dirFd, const char *path, struct stat *info, int flags), dirFd, path, info, flags)
PATH_CALL(Kind::kStat, Path(path, dirFd), fstatat64,
          (int dirFd, const char *path, struct stat64 *info, int flags), dirFd, path, info, flags)
PATH_CALL(Kind::kChmod, Path(path), chmod, (const char *path, mode_t mode), path, mode)
PATH_CALL(Kind::kMkdir, Path(path), mkdir, (const char *path, mode_t mode), path, mode)
PATH_CALL(Kind::kMkdir, Path(path, dirFd), mkdirat, (int dirFd, const char *path, mode_t mode), dirFd, path,
          mode)

/// Counts only requests for record locks: the others do not depend on external state.
static bool LockFails(int fd, int command) {
    const bool isLock =
        command == F_SETLK || command == F_SETLKW || command == F_OFD_SETLK || command == F_OFD_SETLKW;
    return isLock && Fails(Kind::kLock, Fd(fd));
}

int fcntl(int fd, int command, ...) {
    static constinit Real<int(int, int, ...)> real("fcntl");
    va_list args;
    va_start(args, command);
    void *argument = va_arg(args, void *);
    va_end(args);
    return LockFails(fd, command) ? -1 : Call(&real, fd, command, argument);
}

int fcntl64(int fd, int command, ...) {
    static constinit Real<int(int, int, ...)> real("fcntl64");
    va_list args;
    va_start(args, command);
    void *argument = va_arg(args, void *);
    va_end(args);
    return LockFails(fd, command) ? -1 : Call(&real, fd, command, argument);
}

int ioctl(int fd, unsigned long request, ...) {
    static constinit Real<int(int, unsigned long, ...)> real("ioctl");
    va_list args;
    va_start(args, request);
    void *argument = va_arg(args, void *);
    va_end(args);
    return Fails(Kind::kIoctl, Fd(fd)) ? -1 : Call(&real, fd, request, argument);
}

// Counts only maps of files: the heap's maps bypass these names, and a sanitizer's maps must not fail.
void *mmap(void *address, size_t length, int protection, int flags, int fd, off_t offset) {
    static constinit Real<void *(void *, size_t, int, int, int, off_t)> real("mmap");
    if (fd >= 0 && Fails(Kind::kMmap, Fd(fd))) return MAP_FAILED;
    return real(address, length, protection, flags, fd, offset);
}
void *mmap64(void *address, size_t length, int protection, int flags, int fd, off64_t offset) {
    static constinit Real<void *(void *, size_t, int, int, int, off64_t)> real("mmap64");
    if (fd >= 0 && Fails(Kind::kMmap, Fd(fd))) return MAP_FAILED;
    return real(address, length, protection, flags, fd, offset);
}

ssize_t readlink(const char *path, char *link, size_t size) {
    static constinit Real<ssize_t(const char *, char *, size_t)> real("readlink");
    return Fails(Kind::kReadlink, Path(path)) ? -1 : real(path, link, size);
}

ssize_t getrandom(void *buffer, size_t length, unsigned flags) {
    static constinit Real<ssize_t(void *, size_t, unsigned)> real("getrandom");
    const fault::Decision decision = fault::Decide(Kind::kRandom, {});
    if (!decision.Fails()) return real(buffer, decision.Cut(length), flags);
    errno = decision.error;
    return -1;
}

} // extern "C"
