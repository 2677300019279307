/* SPDX-License-Identifier: Apache-2.0 */
// Channels to the emulator and the table of them by descriptor. Leans on the emulator's client; called by the
// embedded device only.

#include "platform/embedded/emulator_channel.h"

#include <cerrno>
#include <map>
#include <utility>

#include <fcntl.h>
#include <pthread.h>
#include <unistd.h>

#include "platform/device_commands.h"
#include "platform/embedded/emulator_client.h"

namespace {

using dvs::embedded::Channel;
using dvs::device::Transfer;

/// A receiving command whose buffer is refused more often than this in a row is answered by a peer that leads
/// its client round in circles.
constexpr unsigned kMaxRefusals = 64;

constexpr int kMaxErrno = 4095;

int Fail(int error) {
    errno = error;
    return -1;
}

template <class T> T *Pointer(uint64_t address) {
    return reinterpret_cast<T *>(static_cast<std::uintptr_t>(address));
}

struct Table {
    std::mutex mutex;
    std::map<int, std::shared_ptr<Channel>> channels; // guarded by mutex
};

void BeforeFork();
void AfterForkInParent();
void AfterForkInChild();

/// Lives as long as the process: agents may still call while it exits.
Table &Channels() {
    static Table *const table = [] {
        auto *made = new Table;
        pthread_atfork(BeforeFork, AfterForkInParent, AfterForkInChild);
        return made;
    }();
    return *table;
}

void BeforeFork() {
    Channels().mutex.lock();
}

void AfterForkInParent() {
    Channels().mutex.unlock();
}

/// A channel may be held by a thread that the child does not have, so each is replaced by one that nobody
/// holds.
void AfterForkInChild() {
    Table &table = Channels();
    for (auto &[fd, channel] : table.channels)
        channel = Channel::AfterFork(*channel);
    table.mutex.unlock();
}

} // namespace

namespace dvs::embedded {

Channel::Channel(int fd, std::string path) : fd_(fd), path_(std::move(path)) {
    struct stat status {};
    if (fstat(fd_, &status) != 0) return;
    device_ = status.st_dev;
    inode_ = status.st_ino;
}

std::shared_ptr<Channel> Channel::AfterFork(const Channel &parents) {
    auto channel = std::make_shared<Channel>(parents.fd_, parents.path_);
    channel->stale_ = true;
    return channel;
}

/// An agent that closes every descriptor, to become a daemon say, may have opened something else under this
/// number.
bool Channel::IsStillOurs() const {
    struct stat status {};
    return fstat(fd_, &status) == 0 && status.st_dev == device_ && status.st_ino == inode_;
}

/// Descriptors opened from now on go to the emulator that is configured now; one that stays open must not
/// talk to another one than they do.
void Channel::FollowEnvironment() {
    const char *path = EmulatorPath();
    if (!path || path_ == path) return;
    path_ = path;
    stale_ = true;
}

bool Channel::Reconnect() {
    const int fresh = ConnectEmulator(path_.c_str());
    if (fresh == -1) return false;
    const bool moved = dup3(fresh, fd_, O_CLOEXEC) != -1;
    struct stat status {};
    const bool known = moved && fstat(fd_, &status) == 0;
    close(fresh);
    if (!known) return false;
    device_ = status.st_dev;
    inode_ = status.st_ino;
    stale_ = false;
    return true;
}

int Channel::Call(int request, DVSHYPRequest *record) {
    const std::lock_guard guard(mutex_);
    if (!IsStillOurs()) return Fail(EBADF);
    if (device::TransferOf(request) == Transfer::ValueIn && record->dataLen > wire::kMaxTransfer) {
        record->status = HYP_LIMIT_EXCEEDED;
        return Fail(ENOSPC);
    }
    FollowEnvironment();
    wire::ReplyHeader reply{};
    // Twice: a restarted emulator shows in the first attempt, which it did not get whole and so did not carry
    // out.
    for (int attempt = 0; attempt < 2; attempt++) {
        if (stale_ && !Reconnect()) return Fail(ENODEV);
        const Outcome outcome = Exchange(request, record, &reply);
        if (outcome == Outcome::Answered) return Finish(request, reply, record);
        stale_ = true;
        // The request may have been carried out: doing it again is not this layer's to decide.
        if (outcome == Outcome::Lost) break;
    }
    return Fail(EIO);
}

Channel::Outcome Channel::Exchange(int request, DVSHYPRequest *record, wire::ReplyHeader *reply) const {
    const Transfer transfer = device::TransferOf(request);
    const bool receives = transfer == Transfer::ValueOut || transfer == Transfer::Execute;
    wire::RequestHeader header{};
    header.magic = wire::kMagic;
    header.version = wire::kVersion;
    header.kind = static_cast<uint16_t>(wire::Kind::Ioctl);
    header.request = request;
    header.flags = (record->data ? wire::HasData : 0U) | (record->cmdIn ? wire::HasCmdIn : 0U) |
                   (record->cmdOut ? wire::HasCmdOut : 0U);
    header.dataSize = transfer == Transfer::ValueIn && record->data ? record->dataLen : 0;
    header.cmdInSize = transfer == Transfer::Execute && record->cmdIn ? record->cmdInLen : 0;
    DVSHYPRequest travelling = *record;
    travelling.data = 0;
    travelling.cmdIn = 0;
    travelling.cmdOut = 0;
    iovec parts[] = {{&header, sizeof header},
                     {&travelling, sizeof travelling},
                     {Pointer<void>(record->data), header.dataSize},
                     {Pointer<void>(record->cmdIn), header.cmdInSize}};
    if (!SendWhole(fd_, parts, std::size(parts))) return Outcome::NotSent;
    const bool executes = transfer == Transfer::Execute;
    void *const buffer = Pointer<void>(executes ? record->cmdOut : record->data);
    const uint32_t capacity = executes ? record->cmdOutLen : record->dataLen;
    const bool received = ReceiveReply(fd_, reply, buffer, receives && buffer ? capacity : 0);
    return received ? Outcome::Answered : Outcome::Lost;
}

/// Judges a reply by what the module may answer, and writes the record's outputs.
int Channel::Finish(int request, const wire::ReplyHeader &reply, DVSHYPRequest *record) {
    const Transfer transfer = device::TransferOf(request);
    const bool receives = transfer == Transfer::ValueOut || transfer == Transfer::Execute;
    const uint32_t size = transfer == Transfer::Execute ? reply.cmdOutLen : reply.dataLen;
    const bool refused = reply.error != 0 && reply.status == HYP_LIMIT_EXCEEDED && receives;
    if (reply.payloadSize != (receives && reply.error == 0 ? size : 0)) {
        stale_ = true;
        return Fail(EIO);
    }
    refusals_ = refused ? refusals_ + 1 : 0;
    record->status = reply.status;
    if (refused && (size > wire::kMaxTransfer || refusals_ > kMaxRefusals)) {
        record->status = HYP_FAILURE;
        return Fail(EMSGSIZE);
    }
    if (transfer == Transfer::ValueOut) record->dataLen = reply.dataLen;
    if (transfer == Transfer::Execute) record->cmdOutLen = reply.cmdOutLen;
    if (reply.error == 0) return 0;
    return Fail(reply.error > 0 && reply.error <= kMaxErrno ? reply.error : EIO);
}

std::shared_ptr<Channel> FindChannel(int fd) {
    Table &table = Channels();
    const std::lock_guard guard(table.mutex);
    const auto found = table.channels.find(fd);
    return found == table.channels.end() ? nullptr : found->second;
}

int OpenChannel(const char *path) {
    const int fd = ConnectEmulator(path);
    if (fd == -1) return -1;
    try {
        auto channel = std::make_shared<Channel>(fd, path);
        Table &table = Channels();
        const std::lock_guard guard(table.mutex);
        table.channels[fd] = std::move(channel);
        return fd;
    } catch (const std::bad_alloc &) {
        close(fd);
        return Fail(ENOMEM);
    }
}

void ForgetChannel(int fd) {
    Table &table = Channels();
    const std::lock_guard guard(table.mutex);
    table.channels.erase(fd);
}

} // namespace dvs::embedded
