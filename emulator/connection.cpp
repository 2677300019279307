/* SPDX-License-Identifier: Apache-2.0 */
// Non-blocking reassembly of requests and sending of replies for one client.

#include "emulator/connection.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

namespace dvs::emulator {

namespace {

/// Large enough for a request without a large value, so that it takes one receive.
constexpr std::size_t kFirstCapacity = 4096;

/// Buffers up to this size are not counted in the budget: every client may have one.
constexpr std::size_t kUncountedSize = 64 << 10;

constexpr uint64_t Counted(std::size_t size) {
    return size > kUncountedSize ? size : 0;
}

} // namespace

Connection::Connection(int fd, pid_t peer, MemoryBudget *budget)
    : fd_(fd), peer_(peer), budget_(budget), lastProgress_(Clock::now()) {}

Connection::~Connection() {
    budget_->Return(Counted(capacity_) + outReserved_);
    close(fd_);
}

wire::RequestHeader Connection::Header() const {
    wire::RequestHeader header;
    std::memcpy(&header, in_.get(), sizeof header);
    return header;
}

bool Connection::Reserve(std::size_t size) {
    if (size <= capacity_) return true;
    if (!budget_->Take(Counted(size))) return false;
    auto larger = std::make_unique_for_overwrite<char[]>(size);
    if (received_ > 0) std::memcpy(larger.get(), in_.get(), received_);
    in_ = std::move(larger);
    budget_->Return(Counted(capacity_));
    capacity_ = size;
    return true;
}

/// Reads the size of the request from the header.
bool Connection::CheckHeader() {
    const wire::RequestHeader header = Header();
    if (header.magic != wire::kMagic || header.version != wire::kVersion) return false;
    if (header.kind != static_cast<uint16_t>(wire::Kind::Ioctl) &&
        header.kind != static_cast<uint16_t>(wire::Kind::Limits))
        return false;
    if (header.dataSize > wire::kMaxTransfer || header.cmdInSize > wire::kMaxTransfer) return false;
    headerValid_ = true;
    if (header.kind == static_cast<uint16_t>(wire::Kind::Ioctl))
        needed_ += wire::kRecordSize + std::size_t{header.dataSize} + header.cmdInSize;
    return true;
}

bool Connection::Receive() {
    for (;;) {
        // Memory use is at most twice the bytes that have arrived, whatever the header announces. The buffer
        // grows only when it is full, not on each receive, because growing copies what has arrived.
        const std::size_t room = std::min(needed_, received_ * 2);
        if (received_ == capacity_ && !Reserve(std::max(room, kFirstCapacity))) return false;
        const ssize_t got = recv(fd_, in_.get() + received_, capacity_ - received_, MSG_DONTWAIT);
        if (got == 0) return false;
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) return errno == EAGAIN || errno == EWOULDBLOCK;
        received_ += static_cast<std::size_t>(got);
        lastProgress_ = Clock::now();
        if (!headerValid_ && HasHeader() && !CheckHeader()) return false;
        // The common request is complete by now; otherwise more may have arrived.
        if (HasRequest() || received_ < capacity_) return true;
    }
}

wire::Kind Connection::RequestKind() const {
    return static_cast<wire::Kind>(Header().kind);
}

Call Connection::Request() const {
    const wire::RequestHeader header = Header();
    Call call{};
    call.request = header.request;
    call.flags = header.flags;
    const char *at = in_.get() + sizeof header;
    std::memcpy(&call.record, at, sizeof call.record);
    at += sizeof call.record;
    call.value = {at, header.dataSize};
    call.cmdIn = {at + header.dataSize, header.cmdInSize};
    return call;
}

bool Connection::Finish() {
    // A client that did not wait for its reply may have begun the next request.
    const std::size_t surplus = received_ - needed_;
    if (surplus > 0) std::memmove(in_.get(), in_.get() + needed_, surplus);
    received_ = surplus;
    needed_ = sizeof(wire::RequestHeader);
    headerValid_ = false;
    if (Counted(capacity_) > 0 && surplus <= kFirstCapacity) {
        auto smaller = std::make_unique_for_overwrite<char[]>(kFirstCapacity);
        std::memcpy(smaller.get(), in_.get(), surplus);
        in_ = std::move(smaller);
        budget_->Return(Counted(capacity_));
        capacity_ = kFirstCapacity;
    }
    return !HasHeader() || CheckHeader();
}

bool Connection::Send(const wire::ReplyHeader &header, Payload payload) {
    outHeader_ = header;
    out_ = std::move(payload);
    sent_ = 0;
    sending_ = true;
    lastProgress_ = Clock::now();
    if (!Flush()) return false;
    if (!sending_) return true;
    if (!budget_->Take(Counted(out_.size))) return false;
    outReserved_ = Counted(out_.size);
    if (!out_.IsBorrowed()) return true;
    Block copy(std::malloc(out_.size));
    if (!copy) return false;
    std::memcpy(copy.get(), out_.data, out_.size);
    out_.data = static_cast<const char *>(copy.get());
    out_.owned = std::move(copy);
    return true;
}

bool Connection::Flush() {
    const std::size_t whole = sizeof outHeader_ + out_.size;
    while (sent_ < whole) {
        const std::size_t ofHeader = std::min(sent_, sizeof outHeader_);
        const std::size_t ofPayload = sent_ - ofHeader;
        iovec parts[] = {{reinterpret_cast<char *>(&outHeader_) + ofHeader, sizeof outHeader_ - ofHeader},
                         {const_cast<char *>(out_.data) + ofPayload, out_.size - ofPayload}};
        msghdr message{};
        message.msg_iov = parts;
        message.msg_iovlen = 2;
        const ssize_t sent = sendmsg(fd_, &message, MSG_DONTWAIT | MSG_NOSIGNAL);
        if (sent < 0 && errno == EINTR) continue;
        if (sent < 0) return errno == EAGAIN || errno == EWOULDBLOCK;
        sent_ += static_cast<std::size_t>(sent);
        lastProgress_ = Clock::now();
    }
    sending_ = false;
    out_ = {};
    budget_->Return(outReserved_);
    outReserved_ = 0;
    return true;
}

} // namespace dvs::emulator
