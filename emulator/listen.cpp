/* SPDX-License-Identifier: Apache-2.0 */
// Creates the socket (listen.h). Server closes and removes it.

#include "emulator/listen.h"

#include <cerrno>
#include <chrono>
#include <cstring>
#include <thread>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

namespace dvs::emulator {

namespace {

constexpr std::chrono::seconds kLockTimeout{10}; // emulators hold the lock only briefly
constexpr std::chrono::milliseconds kRetryInterval{2};

bool Failed(const std::string &what, std::string *why) {
    *why = what + ": " + std::strerror(errno);
    return false;
}

/// True if the path is free for a new socket: it does not exist, or is a socket without a listener.
bool FreePath(const sockaddr_un &address, std::string *why) {
    struct stat status {};
    if (lstat(address.sun_path, &status) != 0) return errno == ENOENT || Failed(address.sun_path, why);
    if (!S_ISSOCK(status.st_mode)) {
        *why = std::string(address.sun_path) + " exists and is not a socket";
        return false;
    }
    const int probe = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (probe == -1) return Failed("socket", why);
    const bool answered = connect(probe, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0;
    const int error = errno;
    close(probe);
    if (answered || error != ECONNREFUSED) {
        *why = std::string(address.sun_path) + " is in use";
        return false;
    }
    return unlink(address.sun_path) == 0 || errno == ENOENT || Failed(address.sun_path, why);
}

int BindAt(const sockaddr_un &address, std::string *why) {
    const int fd = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (fd == -1) return Failed("socket", why), -1;
    // The umask gives the socket mode 0600 from the start.
    const mode_t mask = umask(0177);
    const bool bound = bind(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0;
    const bool listens = bound && listen(fd, SOMAXCONN) == 0;
    umask(mask);
    if (listens) return fd;
    (void)Failed(address.sun_path, why);
    close(fd);
    return -1;
}

/// A lock on the socket's directory. Without it, two emulators could both find a stale socket, and the slower
/// one would unlink the new socket of the other. Locking the directory itself leaves no lock file behind.
class DirectoryLock {
public:
    DirectoryLock() = default;
    ~DirectoryLock() {
        if (fd_ != -1) close(fd_);
    }
    DirectoryLock(const DirectoryLock &) = delete;
    DirectoryLock &operator=(const DirectoryLock &) = delete;

    [[nodiscard]] bool Acquire(const std::string &path, std::string *why) {
        const std::size_t slash = path.rfind('/');
        const std::string directory = slash == std::string::npos ? "." : path.substr(0, slash + 1);
        fd_ = open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
        if (fd_ == -1) return Failed(directory, why);
        const auto end = std::chrono::steady_clock::now() + kLockTimeout;
        while (flock(fd_, LOCK_EX | LOCK_NB) != 0) {
            if (errno != EWOULDBLOCK && errno != EINTR) return Failed(directory, why);
            if (std::chrono::steady_clock::now() >= end) {
                *why = directory + " is locked by another program";
                return false;
            }
            std::this_thread::sleep_for(kRetryInterval);
        }
        return true;
    }

private:
    int fd_ = -1;
};

} // namespace

int ListenAt(const std::string &path, std::string *why) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (path.empty() || path.size() >= sizeof address.sun_path) {
        *why = "socket path must have 1 to " + std::to_string(sizeof address.sun_path - 1) + " characters";
        return -1;
    }
    std::memcpy(address.sun_path, path.c_str(), path.size());
    DirectoryLock lock;
    if (!lock.Acquire(path, why) || !FreePath(address, why)) return -1;
    return BindAt(address, why);
}

} // namespace dvs::emulator
