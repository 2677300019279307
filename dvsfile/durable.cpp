/* SPDX-License-Identifier: Apache-2.0 */
// The write that survives a power cut (dvs/file.h, DVSFile_WriteDurable). Used by dvsctl and the emulator.
// All steps use one descriptor of the directory, so that lock, temporary file, rename and sync apply to the
// same directory even if the path changes meanwhile. Nothing here allocates, except the C library's directory
// stream.

#include "dvs/file.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cstdio>
#include <cstring>
#include <memory>
#include <string_view>
#include <thread>

#include <dirent.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include "dvsfile/file_internal.h"
#include "dvsfile/temp_name.h"
#include "platform/runtime.h"

namespace dvs::file {

namespace {

using std::chrono::milliseconds;

constexpr auto kLockWait = milliseconds(10'000);
constexpr auto kLockPoll = milliseconds(20);
constexpr mode_t kOwnerOnly = 0600;
constexpr int kMaxLinks = 40;     // the system's own limit
constexpr int kMaxNameTries = 16; // names are random, so more than one collision means a fault

/// A path split at its last slash. The directory part keeps its slash; it is empty for the working directory.
class TargetPath {
public:
    /// Sets `path` and follows symbolic links of its last part. Sets errno on failure.
    [[nodiscard]] bool Resolve(const char *path);

    [[nodiscard]] const char *Whole() const { return text_.data(); }
    [[nodiscard]] const char *Base() const { return text_.data() + BaseOffset(); }
    /// Opens the directory part.
    [[nodiscard]] Descriptor OpenDirectory() const;

private:
    [[nodiscard]] std::size_t BaseOffset() const {
        const std::size_t slash = std::string_view(text_.data()).rfind('/');
        return slash == std::string_view::npos ? 0 : slash + 1;
    }
    /// Puts `part` after the first `keep` characters. False if the path becomes too long.
    [[nodiscard]] bool Replace(std::size_t keep, std::string_view part);

    std::array<char, PATH_MAX> text_{};
};

bool TargetPath::Replace(std::size_t keep, std::string_view part) {
    if (keep + part.size() >= text_.size()) {
        errno = ENAMETOOLONG;
        return false;
    }
    std::memcpy(text_.data() + keep, part.data(), part.size());
    text_[keep + part.size()] = '\0';
    return true;
}

bool TargetPath::Resolve(const char *path) {
    if (!Replace(0, path)) return false;
    for (int links = 0; links <= kMaxLinks; links++) {
        std::array<char, PATH_MAX> link{};
        const ssize_t length = readlink(Whole(), link.data(), link.size());
        // EINVAL: not a link. ENOENT: the file is to be created.
        if (length < 0) return errno == EINVAL || errno == ENOENT;
        const std::string_view to(link.data(), static_cast<std::size_t>(length));
        if (!Replace(to.starts_with('/') ? 0 : BaseOffset(), to)) return false;
    }
    errno = ELOOP;
    return false;
}

Descriptor TargetPath::OpenDirectory() const {
    std::array<char, PATH_MAX> directory{"."};
    const std::size_t length = BaseOffset();
    if (length > 0) {
        std::memcpy(directory.data(), text_.data(), length);
        directory[length] = '\0';
    }
    return Descriptor(open(directory.data(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
}

/// Owns the directory's lock. Unlocks explicitly instead of by close: a process forked meanwhile by another
/// thread shares the open file and would keep the lock.
class DirectoryLock {
public:
    explicit DirectoryLock(int fd) : fd_(fd) {}
    DirectoryLock(const DirectoryLock &) = delete;
    DirectoryLock &operator=(const DirectoryLock &) = delete;
    ~DirectoryLock() {
        if (held_) (void)flock(fd_, LOCK_UN);
    }

    [[nodiscard]] bool Acquire(milliseconds wait) {
        using Clock = std::chrono::steady_clock;
        const auto deadline = Clock::now() + wait;
        while (flock(fd_, LOCK_EX | LOCK_NB) != 0) {
            if (errno == EINTR) continue;
            if (errno != EWOULDBLOCK) return false;
            if (Clock::now() >= deadline) {
                errno = EWOULDBLOCK;
                return false;
            }
            std::this_thread::sleep_for(kLockPoll);
        }
        held_ = true;
        return true;
    }

private:
    int fd_;
    bool held_ = false;
};

/// Removes files left behind by killed writers of this file. The caller holds the directory's lock, so none
/// is in use. Only regular files can be ours. Failures are ignored: the names never collide.
void RemoveStale(int directory, std::string_view base) {
    struct CloseDir {
        void operator()(DIR *stream) const { (void)closedir(stream); }
    };
    const int fd = openat(directory, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd < 0) return;
    const std::unique_ptr<DIR, CloseDir> stream(fdopendir(fd));
    if (!stream) {
        (void)close(fd);
        return;
    }
    while (const dirent *entry = readdir(stream.get())) {
        struct stat info {};
        if (!IsTempName(base, entry->d_name)) continue;
        if (fstatat(directory, entry->d_name, &info, AT_SYMLINK_NOFOLLOW) != 0 || !S_ISREG(info.st_mode))
            continue;
        (void)unlinkat(directory, entry->d_name, 0);
    }
}

/// The temporary file: created under a new name, removed by the destructor unless renamed.
class TempFile {
public:
    explicit TempFile(int directory) : directory_(directory) {}
    TempFile(const TempFile &) = delete;
    TempFile &operator=(const TempFile &) = delete;
    ~TempFile() {
        const int savedErrno = errno;
        if (file_ && !renamed_) (void)unlinkat(directory_, name_.data(), 0);
        errno = savedErrno;
    }

    [[nodiscard]] bool Create(std::string_view base) {
        for (int tries = 0; tries < kMaxNameTries; tries++) {
            if (!MakeTempName(base, &name_)) return false;
            file_ = Descriptor(openat(directory_, name_.data(),
                                      O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, kOwnerOnly));
            if (file_) return fchmod(file_.Get(), kOwnerOnly) == 0; // the umask may have cleared bits
            if (errno != EEXIST) return false;
        }
        return false;
    }

    [[nodiscard]] bool WriteAt(uint64_t offset, std::string_view bytes) const {
        while (!bytes.empty()) {
            const ssize_t written =
                pwrite(file_.Get(), bytes.data(), bytes.size(), static_cast<off_t>(offset));
            if (written < 0 && errno == EINTR) continue;
            if (written == 0) errno = ENOSPC; // no progress and no error: the device is full
            if (written <= 0) return false;
            bytes.remove_prefix(static_cast<std::size_t>(written));
            offset += static_cast<uint64_t>(written);
        }
        return true;
    }

    [[nodiscard]] bool Flush() const { return fsync(file_.Get()) == 0; }

    [[nodiscard]] bool RenameTo(const char *base) {
        renamed_ = renameat(directory_, name_.data(), directory_, base) == 0;
        return renamed_;
    }

private:
    int directory_;
    Descriptor file_;
    TempName name_{};
    bool renamed_ = false;
};

/// A rename onto a FIFO, a socket or a device would silently replace it: a save to /dev/null must not do
/// that.
bool IsSpecialFile(int directory, const char *base) {
    struct stat info {};
    if (fstatat(directory, base, &info, AT_SYMLINK_NOFOLLOW) != 0) return false;
    if (S_ISREG(info.st_mode) || S_ISDIR(info.st_mode)) return false;
    errno = EINVAL;
    return true;
}

HYP_ReturnStatus OpenFailure(const char *path) {
    Report("failed to open dvsfile %s for write, error: %s\n", path, Err_Errno2String(errno));
    return HYP_IO_ERROR;
}

HYP_ReturnStatus WriteFailure(const char *path) {
    Report("failed to write dvsfile %s, error: %s\n", path, Err_Errno2String(errno));
    return HYP_WRITE_ERROR;
}

/// The steps under the directory's lock.
HYP_ReturnStatus ReplaceFile(const char *path, int directory, const char *base, std::string_view bytes,
                             uint64_t paddedSize) {
    static constexpr std::array<char, kBlockSize> kPadding{};
    if (*base == '\0') errno = EISDIR;
    if (*base == '\0' || IsSpecialFile(directory, base)) return OpenFailure(path);
    RemoveStale(directory, base);
    TempFile temp(directory);
    if (!temp.Create(base)) return OpenFailure(path);
    const std::string_view padding(kPadding.data(), paddedSize - bytes.size());
    if (!temp.WriteAt(0, bytes) || !temp.WriteAt(bytes.size(), padding)) return WriteFailure(path);
    if (!temp.Flush()) return WriteFailure(path);
    if (!temp.RenameTo(base)) {
        Report("failed to rename dvsfile %s, error: %s\n", path, Err_Errno2String(errno));
        return HYP_WRITE_ERROR;
    }
    if (fsync(directory) != 0) return WriteFailure(path);
    return HYP_OK;
}

} // namespace

HYP_ReturnStatus WriteDurable(const char *path, const void *buf, uint32_t len, milliseconds lockWait,
                              Padding padding) {
    if (len == 0 || !buf || PaddedSize(len) >= kSizeLimit) return HYP_BAD_PARAM;
    if (!path) return HYP_NO_MEMORY;
    TargetPath target;
    if (!target.Resolve(path)) return OpenFailure(path);
    const Descriptor directory = target.OpenDirectory();
    if (!directory) return OpenFailure(path);
    DirectoryLock lock(directory.Get()); // released before the directory is closed
    if (!lock.Acquire(lockWait)) {
        Report("failed to lock the directory of dvsfile %s, error: %s\n", path, Err_Errno2String(errno));
        return HYP_IO_ERROR;
    }
    return ReplaceFile(path, directory.Get(), target.Base(), {static_cast<const char *>(buf), len},
                       padding == Padding::ToBlock ? PaddedSize(len) : len);
}

} // namespace dvs::file

extern "C" HYP_ReturnStatus DVSFile_WriteDurable(const char *path, const void *buf, uint32_t len) {
    return dvs::file::WriteDurable(path, buf, len, dvs::file::kLockWait, dvs::file::Padding::ToBlock);
}
