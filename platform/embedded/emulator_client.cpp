/* SPDX-License-Identifier: Apache-2.0 */
// Whole requests out, whole replies in, over the emulator's Unix socket. The peer is not trusted: sizes are
// checked before anything is received into a caller's buffer.

#include "platform/embedded/emulator_client.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include <poll.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <sys/un.h>
#include <unistd.h>

namespace {

/// How long a message that has begun may stand still, and a connection may take to come about.
constexpr int kStallSeconds = 30;

bool WaitReadable(int fd) {
    pollfd wait{fd, POLLIN, 0};
    for (;;) {
        const int ready = poll(&wait, 1, kStallSeconds * 1000);
        if (ready > 0) return true;
        if (ready == 0) {
            errno = ETIMEDOUT;
            return false;
        }
        if (errno != EINTR) return false;
    }
}

void LimitWait(int fd, int option) {
    const timeval stall{kStallSeconds, 0};
    (void)setsockopt(fd, SOL_SOCKET, option, &stall, sizeof stall); // the default is no limit
}

/// Skips `size` sent or received bytes of the parts.
void Advance(iovec **parts, std::size_t *num, std::size_t size) {
    while (*num > 0 && size >= (*parts)->iov_len) {
        size -= (*parts)->iov_len;
        ++*parts;
        --*num;
    }
    if (*num == 0) return;
    (*parts)->iov_base = static_cast<char *>((*parts)->iov_base) + size;
    (*parts)->iov_len -= size;
}

/// One receive; false with errno at the end of the stream too.
bool ReceiveSome(int fd, iovec *parts, std::size_t num, std::size_t *size) {
    msghdr message{};
    message.msg_iov = parts;
    message.msg_iovlen = num;
    for (;;) {
        const ssize_t got = recvmsg(fd, &message, 0);
        if (got > 0) {
            *size = static_cast<std::size_t>(got);
            return true;
        }
        if (got == 0) {
            errno = ECONNRESET;
            return false;
        }
        if (errno != EINTR) return false;
    }
}

bool ReceiveRest(int fd, char *to, std::size_t size) {
    while (size > 0) {
        iovec part{to, size};
        std::size_t got = 0;
        if (!WaitReadable(fd) || !ReceiveSome(fd, &part, 1, &got)) return false;
        to += got;
        size -= got;
    }
    return true;
}

bool NotAReply() {
    errno = EPROTO;
    return false;
}

} // namespace

namespace dvs::embedded {

const char *EmulatorPath() {
    const char *path = secure_getenv("DVS_EMULATOR");
    return path && *path ? path : nullptr;
}

int ConnectEmulator(const char *path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (std::strlen(path) >= sizeof address.sun_path) {
        errno = ENAMETOOLONG;
        return -1;
    }
    std::strcpy(address.sun_path, path);
    const int fd = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (fd == -1) return -1;
    // Before connecting, which waits as well: for as long as a peer that listens takes nobody in.
    LimitWait(fd, SO_SNDTIMEO);
    while (connect(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) != 0) {
        if (errno == EINTR) continue;
        const int error = errno;
        close(fd);
        errno = error;
        return -1;
    }
    return fd;
}

void LimitReceive(int fd) {
    LimitWait(fd, SO_RCVTIMEO);
}

bool SendWhole(int fd, iovec *parts, std::size_t num) {
    while (num > 0) {
        msghdr message{};
        message.msg_iov = parts;
        message.msg_iovlen = num;
        // A peer that is gone is an error of this call, not a signal to the program.
        const ssize_t sent = sendmsg(fd, &message, MSG_NOSIGNAL);
        if (sent < 0 && errno == EINTR) continue;
        if (sent < 0) return false;
        Advance(&parts, &num, static_cast<std::size_t>(sent));
    }
    return true;
}

bool ReceiveReply(int fd, wire::ReplyHeader *header, void *payload, std::size_t capacity) {
    // Mostly one receive: header and payload arrive together and land where they belong.
    iovec parts[] = {{header, sizeof *header}, {payload, capacity}};
    std::size_t got = 0;
    if (!ReceiveSome(fd, parts, capacity ? 2 : 1, &got)) return false;
    const std::size_t ofHeader = got < sizeof *header ? got : sizeof *header;
    if (!ReceiveRest(fd, reinterpret_cast<char *>(header) + ofHeader, sizeof *header - ofHeader))
        return false;
    const std::size_t ofPayload = got - ofHeader;
    if (header->magic != wire::kMagic || header->version != wire::kVersion) return NotAReply();
    if (header->payloadSize > capacity || header->payloadSize < ofPayload) return NotAReply();
    return ReceiveRest(fd, static_cast<char *>(payload) + ofPayload, header->payloadSize - ofPayload);
}

} // namespace dvs::embedded
