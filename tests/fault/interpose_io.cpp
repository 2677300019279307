/* SPDX-License-Identifier: Apache-2.0 */
// Transfers: reads and writes of files, sends and receives of sockets. A short count transfers that many
// bytes for real, to the disk or the peer.

#include <array>
#include <cerrno>
#include <cstddef>

#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include "fault/plan.h"
#include "fault/real.h"

using fault::Decide;
using fault::Decision;
using fault::Fails;
using fault::Kind;
using fault::Quiet;
using fault::Real;

namespace {

/// A copy of the first elements of a vector, truncated to the bytes of a decision. A truncated vector also
/// keeps at most as many elements as fit here; the result is a short count either way.
class CutVector {
public:
    CutVector(const iovec *vector, std::size_t num, const Decision &decision) : vector_(vector), num_(num) {
        if (decision.what != Decision::What::kShort) return;
        std::size_t left = decision.bytes;
        num_ = 0;
        while (num_ < num && num_ < copy_.size() && left > 0) {
            copy_[num_] = vector[num_];
            if (copy_[num_].iov_len > left) copy_[num_].iov_len = left;
            left -= copy_[num_++].iov_len;
        }
        vector_ = copy_.data();
    }
    [[nodiscard]] const iovec *Start() const { return vector_; }
    [[nodiscard]] std::size_t Num() const { return num_; }

private:
    const iovec *vector_;
    std::size_t num_;
    std::array<iovec, 64> copy_{};
};

ssize_t FailWith(const Decision &decision) {
    errno = decision.error;
    return -1;
}

} // namespace

extern "C" {

#define PLAIN_IO(kind, name, pointer)                                                                        \
    ssize_t name(int fd, pointer buffer, size_t length) {                                                    \
        static constinit Real<ssize_t(int, pointer, size_t)> real(#name);                                    \
        const Decision decision = Decide(kind, {.fd = fd});                                                  \
        if (decision.Fails()) return FailWith(decision);                                                     \
        return real(fd, buffer, decision.Cut(length));                                                       \
    }

#define PLACED_IO(kind, name, pointer, offsetType)                                                           \
    ssize_t name(int fd, pointer buffer, size_t length, offsetType offset) {                                 \
        static constinit Real<ssize_t(int, pointer, size_t, offsetType)> real(#name);                        \
        const Decision decision = Decide(kind, {.fd = fd});                                                  \
        if (decision.Fails()) return FailWith(decision);                                                     \
        return real(fd, buffer, decision.Cut(length), offset);                                               \
    }

#define VECTOR_IO(kind, name)                                                                                \
    ssize_t name(int fd, const struct iovec *vector, int num) {                                              \
        static constinit Real<ssize_t(int, const struct iovec *, int)> real(#name);                          \
        const Decision decision = Decide(kind, {.fd = fd});                                                  \
        if (decision.Fails()) return FailWith(decision);                                                     \
        const CutVector cut(vector, static_cast<std::size_t>(num), decision);                                \
        return real(fd, cut.Start(), static_cast<int>(cut.Num()));                                           \
    }

#define PLACED_VECTOR_IO(kind, name, offsetType)                                                             \
    ssize_t name(int fd, const struct iovec *vector, int num, offsetType offset) {                           \
        static constinit Real<ssize_t(int, const struct iovec *, int, offsetType)> real(#name);              \
        const Decision decision = Decide(kind, {.fd = fd});                                                  \
        if (decision.Fails()) return FailWith(decision);                                                     \
        const CutVector cut(vector, static_cast<std::size_t>(num), decision);                                \
        return real(fd, cut.Start(), static_cast<int>(cut.Num()), offset);                                   \
    }

PLAIN_IO(Kind::kRead, read, void *)
PLAIN_IO(Kind::kWrite, write, const void *)
PLACED_IO(Kind::kRead, pread, void *, off_t)
PLACED_IO(Kind::kRead, pread64, void *, off64_t)
PLACED_IO(Kind::kWrite, pwrite, const void *, off_t)
PLACED_IO(Kind::kWrite, pwrite64, const void *, off64_t)
VECTOR_IO(Kind::kRead, readv)
VECTOR_IO(Kind::kWrite, writev)
PLACED_VECTOR_IO(Kind::kRead, preadv, off_t)
PLACED_VECTOR_IO(Kind::kRead, preadv64, off64_t)
PLACED_VECTOR_IO(Kind::kWrite, pwritev, off_t)
PLACED_VECTOR_IO(Kind::kWrite, pwritev64, off64_t)

int socket(int domain, int type, int protocol) {
    static constinit Real<int(int, int, int)> real("socket");
    return Fails(Kind::kSocket, {}) ? -1 : real(domain, type, protocol);
}

int connect(int fd, const struct sockaddr *address, socklen_t length) {
    static constinit Real<int(int, const struct sockaddr *, socklen_t)> real("connect");
    return Fails(Kind::kConnect, {}) ? -1 : real(fd, address, length);
}

ssize_t send(int fd, const void *buffer, size_t length, int flags) {
    static constinit Real<ssize_t(int, const void *, size_t, int)> real("send");
    const Decision decision = Decide(Kind::kSend, {});
    return decision.Fails() ? FailWith(decision) : real(fd, buffer, decision.Cut(length), flags);
}

ssize_t recv(int fd, void *buffer, size_t length, int flags) {
    static constinit Real<ssize_t(int, void *, size_t, int)> real("recv");
    const Decision decision = Decide(Kind::kRecv, {});
    return decision.Fails() ? FailWith(decision) : real(fd, buffer, decision.Cut(length), flags);
}

ssize_t sendto(int fd, const void *buffer, size_t length, int flags, const struct sockaddr *to,
               socklen_t toLength) {
    static constinit Real<ssize_t(int, const void *, size_t, int, const struct sockaddr *, socklen_t)> real(
        "sendto");
    const Decision decision = Decide(Kind::kSend, {});
    return decision.Fails() ? FailWith(decision)
                            : real(fd, buffer, decision.Cut(length), flags, to, toLength);
}

ssize_t recvfrom(int fd, void *buffer, size_t length, int flags, struct sockaddr *from,
                 socklen_t *fromLength) {
    static constinit Real<ssize_t(int, void *, size_t, int, struct sockaddr *, socklen_t *)> real("recvfrom");
    const Decision decision = Decide(Kind::kRecv, {});
    return decision.Fails() ? FailWith(decision)
                            : real(fd, buffer, decision.Cut(length), flags, from, fromLength);
}

ssize_t sendmsg(int fd, const struct msghdr *message, int flags) {
    static constinit Real<ssize_t(int, const struct msghdr *, int)> real("sendmsg");
    const Decision decision = Decide(Kind::kSend, {});
    if (decision.Fails()) return FailWith(decision);
    const CutVector cut(message->msg_iov, message->msg_iovlen, decision);
    struct msghdr copy = *message;
    copy.msg_iov = const_cast<iovec *>(cut.Start());
    copy.msg_iovlen = cut.Num();
    return real(fd, &copy, flags);
}

ssize_t recvmsg(int fd, struct msghdr *message, int flags) {
    static constinit Real<ssize_t(int, struct msghdr *, int)> real("recvmsg");
    const Decision decision = Decide(Kind::kRecv, {});
    if (decision.Fails()) return FailWith(decision);
    const CutVector cut(message->msg_iov, message->msg_iovlen, decision);
    struct msghdr copy = *message;
    copy.msg_iov = const_cast<iovec *>(cut.Start());
    copy.msg_iovlen = cut.Num();
    const ssize_t got = real(fd, &copy, flags);
    message->msg_namelen = copy.msg_namelen;
    message->msg_controllen = copy.msg_controllen;
    message->msg_flags = copy.msg_flags;
    return got;
}

} // extern "C"
