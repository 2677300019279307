/* SPDX-License-Identifier: Apache-2.0 */
// The plain read and write of the state file (dvs/file.h): direct I/O if the file system supports it, one
// write, one read, no flush. Called by agents, state retrieval and the upgrade. durable.cpp survives a power
// cut.
//
// Opens add O_NONBLOCK, so that a FIFO under the path's name is an error and does not block.

#include "dvs/file.h"

#include <cstdlib>
#include <cstring>
#include <memory>

#include <fcntl.h>
#include <sys/stat.h>

#include "dvsfile/file_internal.h"
#include "platform/runtime.h"

namespace {

using dvs::file::Descriptor;
using dvs::file::kBlockSize;
using dvs::file::Report;

struct Free {
    void operator()(void *block) const { std::free(block); }
};

/// A heap block with an aligned area in it.
class AlignedBlock {
public:
    explicit AlignedBlock(uint64_t size) : block_(static_cast<char *>(std::malloc(size + kBlockSize - 1))) {
        const uint64_t beyond = reinterpret_cast<uintptr_t>(block_.get()) % kBlockSize;
        offset_ = static_cast<uint32_t>((kBlockSize - beyond) % kBlockSize);
    }

    explicit operator bool() const { return block_ != nullptr; }
    [[nodiscard]] char *Start() const { return block_.get() + offset_; }
    [[nodiscard]] uint32_t Offset() const { return offset_; }
    void HandOver() { (void)block_.release(); }

private:
    std::unique_ptr<char, Free> block_;
    uint32_t offset_ = 0;
};

Descriptor OpenDirectOrPlain(const char *path, int flags) {
    constexpr mode_t kOwnerOnly = 0600;
    const int fd = open(path, flags | O_DIRECT | O_CLOEXEC | O_NONBLOCK, kOwnerOnly);
    return Descriptor(fd >= 0 ? fd : open(path, flags | O_CLOEXEC | O_NONBLOCK, kOwnerOnly));
}

/// Writes the buffer to the file `target`. `file` stays open; the caller closes it.
HYP_ReturnStatus WriteTarget(const char *target, const void *buf, uint32_t len, Descriptor *file) {
    *file = OpenDirectOrPlain(target, O_WRONLY | O_CREAT);
    if (!*file) {
        Report("failed to open dvsfile %s for write, error: %s\n", target, Err_Errno2String(errno));
        return HYP_IO_ERROR;
    }
    // One byte instead of none, kept on purpose: if nothing else is written, the file has an odd size and is
    // not empty.
    if (ftruncate(file->Get(), 1) != 0) {
        Report("failed to truncate dvsfile %s, error: %s\n", target, Err_Errno2String(errno));
        return HYP_IO_ERROR;
    }
    const uint64_t size = dvs::file::PaddedSize(len);
    const AlignedBlock staging(size);
    if (!staging) return HYP_NO_MEMORY;
    if (len > 0) std::memcpy(staging.Start(), buf, len);
    std::memset(staging.Start() + len, 0, size - len);
    errno = 0;
    const ssize_t written = pwrite(file->Get(), staging.Start(), size, 0);
    if (written < 0 || static_cast<uint64_t>(written) != size) {
        Report("failed to write dvsfile %s, error: %s\n", target, Err_Errno2String(errno));
        return HYP_WRITE_ERROR;
    }
    return HYP_OK;
}

HYP_ReturnStatus QuerySize(const char *path, const Descriptor &file, uint64_t *size) {
    struct stat info {};
    if (fstat(file.Get(), &info) != 0 || info.st_size <= 0) return HYP_FILE_EMPTY;
    *size = static_cast<uint64_t>(info.st_size);
    if (*size >= dvs::file::kSizeLimit) return HYP_BAD_PARAM;
    if (*size % kBlockSize != 0) {
        Report("failed to verify dvsfile %s with length %ld\n", path, static_cast<long>(info.st_size));
        return HYP_IO_ERROR;
    }
    return HYP_OK;
}

} // namespace

extern "C" HYP_ReturnStatus DVSFile_WriteClassical(const char *path, const void *buf, uint32_t len,
                                                   bool viaTemp) {
    if (!path) return HYP_NO_MEMORY;
    if ((!buf && len > 0) || dvs::file::PaddedSize(len) >= dvs::file::kSizeLimit) return HYP_BAD_PARAM;
    std::unique_ptr<char, Free> tempName;
    if (viaTemp) {
        tempName.reset(Str_SafeAsprintf(nullptr, "%s.%s", path, "tmp"));
        if (!tempName) return HYP_NO_MEMORY;
    }
    const char *target = viaTemp ? tempName.get() : path;
    Descriptor file; // closed last, after the rename
    const HYP_ReturnStatus status = WriteTarget(target, buf, len, &file);
    if (status != HYP_OK) return status;
    if (viaTemp && rename(target, path) != 0) {
        Report("failed to rename dvsfile %s, error: %s\n", target, Err_Errno2String(errno));
        return HYP_WRITE_ERROR;
    }
    return HYP_OK;
}

extern "C" HYP_ReturnStatus DVSFile_Write(const char *path, const void *buf, uint32_t len) {
    return DVSFile_WriteClassical(path, buf, len, true);
}

extern "C" HYP_ReturnStatus DVSFile_ReadClassical(const char *path, void **buf, uint32_t *len,
                                                  uint32_t *alignOffset) {
    if (!buf || !len || !alignOffset) return HYP_BAD_PARAM;
    const Descriptor file = OpenDirectOrPlain(path, O_RDONLY);
    if (!file) {
        Report("failed to open dvsfile %s for read, error: %s\n", path ? path : "(null)",
               Err_Errno2String(errno));
        return HYP_NOT_FOUND;
    }
    uint64_t size = 0;
    const HYP_ReturnStatus status = QuerySize(path, file, &size);
    if (status != HYP_OK) return status;
    AlignedBlock block(size);
    if (!block) return HYP_NO_MEMORY;
    const ssize_t got = read(file.Get(), block.Start(), size);
    if (got < 0 || static_cast<uint64_t>(got) != size) return HYP_READ_ERROR;
    *buf = block.Start();
    *len = static_cast<uint32_t>(size);
    *alignOffset = block.Offset();
    block.HandOver();
    return HYP_OK;
}

extern "C" HYP_ReturnStatus DVSFile_Read(const char *path, void **buf, uint32_t *len, uint32_t *alignOffset) {
    return DVSFile_ReadClassical(path, buf, len, alignOffset);
}
