/* SPDX-License-Identifier: Apache-2.0 */
// Files as wholes. Leans on the library's durable write.

#include "tools/dvsctl/sources/files.h"

#include <cerrno>
#include <cstring>
#include <filesystem>

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

#include "dvsfile/file_internal.h"
#include "platform/status_text.h"

namespace dvs::ctl {

namespace {

constexpr std::uint64_t kLargestFile = std::uint64_t{1} << 32;
constexpr std::size_t kPiece = 1 << 20;
constexpr char kCheckDirectory[] = "check that the directory exists and may be written to";

class Descriptor {
public:
    explicit Descriptor(int fd) : fd_(fd) {}
    ~Descriptor() {
        if (fd_ >= 0) close(fd_);
    }
    Descriptor(const Descriptor &) = delete;
    Descriptor &operator=(const Descriptor &) = delete;
    int Get() const { return fd_; }

private:
    int fd_;
};

[[noreturn]] void ThrowRead(const std::string &source, int error) {
    Error failure(ErrorKind::Failed, "cannot read");
    failure.source = source;
    failure.why = std::strerror(error);
    if (error == EACCES || error == EPERM)
        failure.next = "state files belong to their owner alone; run as that user";
    if (error == ENOENT) failure.next = "check the name";
    throw failure;
}

const char *KindName(mode_t mode) {
    if (S_ISDIR(mode)) return "it is a directory";
    if (S_ISFIFO(mode)) return "it is a FIFO";
    if (S_ISSOCK(mode)) return "it is a socket";
    return "it is a device";
}

Error NoFile(const char *what, const std::string &source, mode_t mode) {
    return Error(ErrorKind::Failed, what).In(source).Because(KindName(mode)).Try("name a file");
}

// The library refuses these too, but with the error of whichever call fails first.
void RefuseOtherKinds(const std::string &path, const std::string &source) {
    struct stat info {};
    if (stat(path.c_str(), &info) == 0 && !S_ISREG(info.st_mode))
        throw NoFile("cannot write", source, info.st_mode);
}

// Reads to the end, waiting where the descriptor makes us wait.
std::string ReadAll(Context &context, int fd, const std::string &source, std::uint64_t expected) {
    std::string text;
    text.reserve(expected);
    for (;;) {
        pollfd waiting{fd, POLLIN, 0};
        const int ready = poll(&waiting, 1, context.deadline.MillisecondsLeft());
        if (ready < 0 && errno != EINTR) ThrowRead(source, errno);
        if (ready < 0) continue;
        if (ready == 0)
            throw Error(ErrorKind::Timeout, "waited too long for input")
                .In(source)
                .Because("its end did not come within the time of --timeout")
                .Try("check the program that writes it, or give more time: --timeout SECONDS");
        const std::size_t had = text.size();
        text.resize(had + kPiece);
        const ssize_t got = read(fd, text.data() + had, kPiece);
        const int error = errno;
        text.resize(had + (got > 0 ? static_cast<std::size_t>(got) : 0));
        if (got < 0 && error != EINTR && error != EAGAIN) ThrowRead(source, error);
        if (got == 0) return text;
        if (text.size() >= kLargestFile)
            throw Error(ErrorKind::Malformed, "the input is too large")
                .In(source)
                .Because("it has 4 GiB or more");
    }
}

} // namespace

bool FileExists(const std::string &path) {
    struct stat info {};
    return stat(path.c_str(), &info) == 0 || (errno != ENOENT && errno != ENOTDIR);
}

std::string ReadWholeFile(Context &context, const std::string &path, const std::string &source,
                          Accept accept) {
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    if (file.Get() < 0) ThrowRead(source, errno);
    struct stat info {};
    if (fstat(file.Get(), &info) != 0) ThrowRead(source, errno);
    const bool isPipe = S_ISFIFO(info.st_mode) && accept == Accept::Pipes;
    if (!S_ISREG(info.st_mode) && !isPipe) throw NoFile("cannot read", source, info.st_mode);
    const auto size = S_ISREG(info.st_mode) ? static_cast<std::uint64_t>(info.st_size) : 0;
    if (size >= kLargestFile)
        throw Error(ErrorKind::Malformed, "the input is too large")
            .In(source)
            .Because("it has 4 GiB or more");
    return ReadAll(context, file.Get(), source, size);
}

std::string ReadStandardInput(Context &context, const std::string &source) {
    return ReadAll(context, STDIN_FILENO, source, 0);
}

void CheckReplaceable(const std::string &path, const std::string &source) {
    RefuseOtherKinds(path, source);
    std::error_code ignored; // what cannot be resolved cannot be opened either
    std::filesystem::path directory = std::filesystem::weakly_canonical(path, ignored).parent_path();
    if (directory.empty()) directory = ".";
    if (faccessat(AT_FDCWD, directory.c_str(), R_OK | W_OK | X_OK, AT_EACCESS) == 0) return;
    Error failure(ErrorKind::Failed, "cannot write");
    failure.source = source;
    failure.why = std::strerror(errno);
    failure.next = kCheckDirectory;
    throw failure;
}

void ReplaceFile(Context &context, const std::string &path, const std::string &source, Bytes contents,
                 FileForm form) {
    RefuseOtherKinds(path, source);
    const auto wait = std::chrono::milliseconds(context.deadline.MillisecondsLeft());
    const auto padding = form == FileForm::State ? file::Padding::ToBlock : file::Padding::None;
    if (contents.size() >= kLargestFile - file::kBlockSize)
        throw Error(ErrorKind::Failed, "cannot write")
            .In(source)
            .Because("the file would have 4 GiB or more");
    errno = 0;
    const HYP_ReturnStatus status = file::WriteDurable(
        path.c_str(), contents.data(), static_cast<std::uint32_t>(contents.size()), wait, padding);
    if (status == HYP_OK) return;
    const int error = errno;
    const bool busy = status == HYP_IO_ERROR && error == EWOULDBLOCK;
    Error failure(busy ? ErrorKind::Busy : ErrorKind::Failed, "cannot write");
    failure.source = source;
    failure.why = busy         ? "another program is writing in that directory and did not finish in time"
                  : error != 0 ? std::strerror(error)
                               : HYP_ReturnStatusToString(status);
    failure.next = busy ? "repeat, or wait longer: --timeout SECONDS"
                   : status == HYP_WRITE_ERROR
                       ? "check the space and the health of the file system, and repeat"
                       : kCheckDirectory;
    throw failure;
}

} // namespace dvs::ctl
