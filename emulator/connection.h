/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_CONNECTION_H
#define EMULATOR_CONNECTION_H

// One client: its incoming request and outgoing reply. Never blocks. Clients are untrusted: announced sizes
// use memory only as the bytes arrive, and a client that stalls in the middle of a message is disconnected.

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>

#include <sys/types.h>

#include "emulator/call.h"
#include "emulator/faults.h"

namespace dvs::emulator {

using Clock = std::chrono::steady_clock;

/// Limit for the bytes of all clients' pending requests and replies.
class MemoryBudget {
public:
    explicit MemoryBudget(uint64_t limit) : limit_(limit) {}
    [[nodiscard]] bool Take(uint64_t size) {
        if (size > limit_ - used_) return false;
        used_ += size;
        return true;
    }
    void Return(uint64_t size) { used_ -= size; }

private:
    uint64_t limit_;
    uint64_t used_ = 0;
};

class Connection {
public:
    Connection(int fd, pid_t peer, MemoryBudget *budget);
    ~Connection();
    Connection(const Connection &) = delete;
    Connection &operator=(const Connection &) = delete;

    int Fd() const { return fd_; }
    pid_t Peer() const { return peer_; }

    /// Receives what has arrived. Returns false if the client has closed, sent an invalid header, or needs
    /// more memory than the budget allows.
    [[nodiscard]] bool Receive();

    /// True if a whole request has arrived. Request() returns it; it is valid until Finish().
    bool HasRequest() const { return headerValid_ && received_ >= needed_; }
    wire::Kind RequestKind() const;
    Call Request() const;

    /// Discards the request. Returns false if the bytes after it are not a valid request.
    [[nodiscard]] bool Finish();

    /// Sends as much of a reply as possible now; Flush sends the rest. A borrowed payload is copied if it has
    /// to wait. Returns false if the client must be disconnected.
    [[nodiscard]] bool Send(const wire::ReplyHeader &header, Payload payload);
    [[nodiscard]] bool Flush();

    bool IsSending() const { return sending_; }
    bool IsIdle() const { return received_ == 0 && !sending_; }
    bool IsInMessage() const { return (received_ > 0 && !HasRequest()) || sending_; }
    Clock::time_point LastProgress() const { return lastProgress_; }

    /// The fault to apply to the current request, and when. Set by the server while it delays a reply.
    struct Delayed {
        Clock::time_point due;
        Fault fault;
    };
    std::optional<Delayed> delayed;

private:
    bool HasHeader() const { return received_ >= sizeof(wire::RequestHeader); }
    wire::RequestHeader Header() const;
    [[nodiscard]] bool Reserve(std::size_t size);
    [[nodiscard]] bool CheckHeader();

    const int fd_;
    const pid_t peer_;
    MemoryBudget *const budget_;
    Clock::time_point lastProgress_;

    // The request: `received_` bytes of at least `needed_`. The header sets `needed_`.
    std::unique_ptr<char[]> in_;
    std::size_t capacity_ = 0;
    std::size_t received_ = 0;
    std::size_t needed_ = sizeof(wire::RequestHeader);
    bool headerValid_ = false; // a valid header has arrived, so `needed_` is the size of the whole request

    // The reply.
    bool sending_ = false;
    wire::ReplyHeader outHeader_{};
    Payload out_;
    std::size_t sent_ = 0;
    uint64_t outReserved_ = 0; // of the budget
};

} // namespace dvs::emulator

#endif
