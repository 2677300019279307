/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSFILE_FILE_INTERNAL_H
#define DVSFILE_FILE_INTERNAL_H

// Shared by the files of this folder: sizes, the descriptor owner and message output.

#include <cerrno>
#include <chrono>
#include <cstdint>

#include <unistd.h>

#include "dvs/status.h"

namespace dvs::file {

/// Alignment of transfers in memory, in offset and in length, as required by direct I/O.
inline constexpr uint64_t kBlockSize = 512;

/// State files must be smaller than this.
inline constexpr uint64_t kSizeLimit = uint64_t{1} << 32;

constexpr uint64_t PaddedSize(uint64_t len) {
    return (len + kBlockSize - 1) & ~(kBlockSize - 1);
}

/// Owner of a file descriptor.
class Descriptor {
public:
    Descriptor() = default;
    explicit Descriptor(int fd) : fd_(fd) {}
    Descriptor(Descriptor &&other) noexcept : fd_(other.Release()) {}
    Descriptor &operator=(Descriptor &&other) noexcept {
        Reset(other.Release());
        return *this;
    }
    ~Descriptor() { Reset(-1); }

    [[nodiscard]] int Get() const { return fd_; }
    explicit operator bool() const { return fd_ >= 0; }

private:
    int Release() {
        const int fd = fd_;
        fd_ = -1;
        return fd;
    }
    void Reset(int fd) {
        // A failed close still releases the descriptor. Keep the errno of the earlier failure.
        const int savedErrno = errno;
        if (fd_ >= 0) (void)close(fd_);
        errno = savedErrno;
        fd_ = fd;
    }

    int fd_ = -1;
};

/// Sends one message to the sink or to the host's log. No debug level guards state-file messages.
void Report(const char *format, ...) __attribute__((format(printf, 1, 2)));

/// Padding after the contents of a file.
enum class Padding {
    ToBlock, ///< zeros up to the next multiple of kBlockSize: a state file
    None     ///< nothing: any other file that needs the same durability
};

/// DVSFile_WriteDurable with a wait limit for the directory's lock, for files with either padding.
[[nodiscard]] HYP_ReturnStatus WriteDurable(const char *path, const void *buf, uint32_t len,
                                            std::chrono::milliseconds lockWait,
                                            Padding padding = Padding::ToBlock);

} // namespace dvs::file

#endif
