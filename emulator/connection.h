/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_CONNECTION_H
#define EMULATOR_CONNECTION_H

// One client: the request that is arriving, the answer that is leaving. Never blocks. A client is not
// trusted: what it announces costs memory only as it arrives, and one that stands still in mid-message is
// given up.

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>

#include <sys/types.h>

#include "emulator/call.h"
#include "emulator/faults.h"

namespace dvs::emulator {

using Clock = std::chrono::steady_clock;

/// Bytes that all clients together may keep waiting in requests and answers.
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

    /// Takes in what has arrived. False when the client is gone, is no client, or asks for more than there
    /// is.
    [[nodiscard]] bool Receive();

    /// True when a whole request has arrived; Request gives it, lent until Finish.
    bool HasRequest() const { return judged_ && received_ >= needed_; }
    wire::Kind RequestKind() const;
    Call Request() const;

    /// Forgets the request. False when what follows it is none.
    [[nodiscard]] bool Finish();

    /// Sends an answer, now as far as it goes and the rest with Flush; a lent payload is copied if it has to
    /// wait. False when the client is to be given up.
    [[nodiscard]] bool Send(const wire::ReplyHeader &header, Payload payload);
    [[nodiscard]] bool Flush();

    bool IsSending() const { return sending_; }
    bool IsIdle() const { return received_ == 0 && !sending_; }
    bool IsInMessage() const { return (received_ > 0 && !HasRequest()) || sending_; }
    Clock::time_point LastProgress() const { return lastProgress_; }

    /// The fault that is to befall the request at hand, and when: set by the server while it delays an
    /// answer.
    struct Delayed {
        Clock::time_point due;
        Fault fault;
    };
    std::optional<Delayed> delayed;

private:
    bool HasHeader() const { return received_ >= sizeof(wire::RequestHeader); }
    wire::RequestHeader Header() const;
    [[nodiscard]] bool Reserve(std::size_t size);
    [[nodiscard]] bool JudgeHeader();

    const int fd_;
    const pid_t peer_;
    MemoryBudget *const budget_;
    Clock::time_point lastProgress_;

    // The request: `received_` bytes of at least `needed_`, which grows as the header becomes known.
    std::unique_ptr<char[]> in_;
    std::size_t capacity_ = 0;
    std::size_t received_ = 0;
    std::size_t needed_ = sizeof(wire::RequestHeader);
    bool judged_ = false; // the header has arrived and is one, so `needed_` is the whole request's

    // The answer.
    bool sending_ = false;
    wire::ReplyHeader outHeader_{};
    Payload out_;
    std::size_t sent_ = 0;
    uint64_t outTaken_ = 0; // of the budget
};

} // namespace dvs::emulator

#endif
