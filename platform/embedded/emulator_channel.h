/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_EMULATOR_CHANNEL_H
#define PLATFORM_EMBEDDED_EMULATOR_CHANNEL_H

// Descriptors of the embedded device that are connections to the emulator. A call on a device is atomic and a
// stream is not; a device outlives its module's restart and is shared across fork. A channel makes up for
// that: one mutex each, a new connection under the same descriptor number after a restart or in a forked
// child.

#include <memory>
#include <mutex>
#include <string>

#include <sys/stat.h>

#include "dvs/hyp.h"
#include "platform/embedded/emulator_wire.h"

namespace dvs::embedded {

class Channel {
public:
    /// Takes over a fresh connection to the socket at `path`.
    Channel(int fd, std::string path);

    /// The same descriptor in a forked child: the connection is the parent's, so it is not used again.
    static std::shared_ptr<Channel> AfterFork(const Channel &parents);

    /// Carries out one call: the result and errno of ioctl.
    int Call(int request, DVSHYPRequest *record);

private:
    enum class Outcome { Answered, NotSent, Lost };

    bool IsStillOurs() const;
    void FollowEnvironment();
    bool Reconnect();
    Outcome Exchange(int request, DVSHYPRequest *record, wire::ReplyHeader *reply) const;
    int Finish(int request, const wire::ReplyHeader &reply, DVSHYPRequest *record);

    const int fd_;
    std::mutex mutex_; // held for the whole of a call, guards what follows
    std::string path_;
    dev_t device_ = 0; // what the descriptor refers to: the program may have closed it behind our back
    ino_t inode_ = 0;
    bool stale_ = false;    // the connection is broken or another process's
    unsigned refusals_ = 0; // buffers refused in a row by receiving commands
};

/// The channel of a descriptor; none when it is not the emulator's.
[[nodiscard]] std::shared_ptr<Channel> FindChannel(int fd);

/// Connects to the emulator's socket and returns the new channel's descriptor; -1 with errno.
[[nodiscard]] int OpenChannel(const char *path);

/// Forgets a descriptor that is about to be closed.
void ForgetChannel(int fd);

} // namespace dvs::embedded

#endif
