/* SPDX-License-Identifier: Apache-2.0 */
// The poll loop. Connection handles the bytes, Module executes the commands.

#include "emulator/server.h"

#include <algorithm>
#include <cerrno>
#include <new>
#include <string_view>

#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include "emulator/listen.h"

namespace dvs::emulator {

namespace {

constexpr std::size_t kMaxClients = 1024;
constexpr std::size_t kMaxClientsOfProcess = 256;
constexpr std::size_t kReservedDescriptors = 32; // state file, signals, standard streams
constexpr int kSendBuffer = 2 << 20;
constexpr uint64_t kWaitingBytes = 1ULL << 30;
constexpr std::chrono::seconds kStall{60};
constexpr std::chrono::seconds kStopTimeout{5};

/// The number of clients that the descriptor limit allows. Raises the soft limit if possible.
std::size_t MaxClients() {
    rlimit limit{};
    if (getrlimit(RLIMIT_NOFILE, &limit) != 0) return kMaxClients / 2;
    const rlim_t wanted = kMaxClients + kReservedDescriptors;
    if (limit.rlim_cur < wanted) {
        rlimit raised{std::min(wanted, limit.rlim_max), limit.rlim_max};
        if (setrlimit(RLIMIT_NOFILE, &raised) == 0) limit = raised;
    }
    const rlim_t usable = limit.rlim_cur > kReservedDescriptors ? limit.rlim_cur - kReservedDescriptors : 1;
    return static_cast<std::size_t>(std::min<rlim_t>(usable, kMaxClients));
}

/// Enlarges the send buffer, beyond the system's limit if permitted, so that a large reply takes few writes.
void WidenSendBuffer(int fd) {
    const int size = kSendBuffer;
    if (setsockopt(fd, SOL_SOCKET, SO_SNDBUFFORCE, &size, sizeof size) != 0)
        (void)setsockopt(fd, SOL_SOCKET, SO_SNDBUF, &size, sizeof size); // best effort
}

wire::ReplyHeader NewReply() {
    wire::ReplyHeader reply{};
    reply.magic = wire::kMagic;
    reply.version = wire::kVersion;
    return reply;
}

} // namespace

Server::Server(Module *module) : module_(module), budget_(kWaitingBytes), maxClients_(MaxClients()) {}

Server::~Server() {
    if (listenFd_ == -1) return;
    unlink(path_.c_str());
    close(listenFd_);
}

bool Server::Listen(const std::string &path, std::string *why) {
    listenFd_ = ListenAt(path, why);
    path_ = path;
    return listenFd_ != -1;
}

bool Server::MayConnect(pid_t peer) const {
    if (clients_.size() >= maxClients_) return false;
    const auto ofPeer =
        std::ranges::count_if(clients_, [&](const auto &client) { return client->Peer() == peer; });
    return static_cast<std::size_t>(ofPeer) < kMaxClientsOfProcess;
}

void Server::Accept() {
    for (;;) {
        const int fd = accept4(listenFd_, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
        if (fd == -1 && errno == EINTR) continue;
        if (fd == -1) return;
        ucred peer{};
        socklen_t size = sizeof peer;
        const bool known = getsockopt(fd, SOL_SOCKET, SO_PEERCRED, &peer, &size) == 0;
        if (!known || (peer.uid != 0 && peer.uid != geteuid()) || !MayConnect(peer.pid)) {
            close(fd);
            continue;
        }
        WidenSendBuffer(fd);
        clients_.push_back(std::make_unique<Connection>(fd, peer.pid, &budget_));
    }
}

void Server::Run(int stopFd) {
    bool stopped = false;
    while (!stopped)
        ServeOnce(stopFd, &stopped);
    FinishRequests();
}

int Server::NextTimeout() const {
    auto wait = std::chrono::milliseconds(-1);
    const auto now = Clock::now();
    const auto consider = [&](Clock::time_point when) {
        // Round up: waking early would only cause another poll.
        const auto left =
            std::max(std::chrono::ceil<std::chrono::milliseconds>(when - now), decltype(wait){0});
        if (wait.count() < 0 || left < wait) wait = left;
    };
    if (stopping_) consider(stopAt_);
    for (const auto &client : clients_) {
        if (client->delayed)
            consider(client->delayed->due);
        else if (client->IsInMessage())
            consider(client->LastProgress() + kStall);
    }
    return static_cast<int>(wait.count());
}

void Server::ServeOnce(int stopFd, bool *stopped) {
    polled_.clear();
    polled_.push_back({stopFd, POLLIN, 0});
    polled_.push_back({listenFd_, POLLIN, 0});
    for (const auto &client : clients_) {
        // Do not read from a client whose reply is delayed or not fully sent.
        const int events = client->delayed ? 0 : client->IsSending() ? POLLOUT : POLLIN;
        polled_.push_back({client->Fd(), static_cast<short>(events), 0});
    }
    if (poll(polled_.data(), polled_.size(), NextTimeout()) < 0) return;
    const auto now = Clock::now();
    for (std::size_t i = 0; i < clients_.size(); i++) {
        if (!ServeClient(clients_[i].get(), polled_[i + 2].revents, now)) clients_[i].reset();
    }
    std::erase(clients_, nullptr);
    if (polled_[1].revents) Accept();
    *stopped = polled_[0].revents != 0;
}

/// Stops accepting connections and lets in-flight requests finish. Idle clients are disconnected.
void Server::FinishRequests() {
    stopping_ = true;
    unlink(path_.c_str());
    close(listenFd_);
    listenFd_ = -1;
    stopAt_ = Clock::now(); // the first round only serves requests that have already arrived
    for (const auto &client : clients_) {
        if (client->delayed) client->delayed->due = stopAt_;
    }
    bool stopped = false;
    ServeOnce(-1, &stopped);
    stopAt_ = Clock::now() + kStopTimeout;
    for (;;) {
        std::erase_if(clients_, [](const auto &client) { return client->IsIdle(); });
        if (clients_.empty() || Clock::now() >= stopAt_) break;
        ServeOnce(-1, &stopped);
    }
    clients_.clear();
}

/// Handles one client in a poll round; false if it must be disconnected.
bool Server::ServeClient(Connection *client, short events, Clock::time_point now) {
    try {
        if (client->delayed && client->delayed->due <= now) {
            Fault fault = std::move(client->delayed->fault);
            client->delayed.reset();
            return ExecuteRequest(client, fault) && ServeRequests(client);
        }
        if (events & POLLIN) return client->Receive() && ServeRequests(client);
        if (events & POLLOUT) return client->Flush() && (client->IsSending() || ServeRequests(client));
        const bool stalled = client->IsInMessage() && now - client->LastProgress() > kStall;
        return events == 0 && !stalled;
    } catch (const std::bad_alloc &) {
        return false;
    }
}

/// Executes complete requests: one, for a client that waits for its replies.
bool Server::ServeRequests(Connection *client) {
    while (client->HasRequest() && !client->IsSending()) {
        if (client->RequestKind() == wire::Kind::Limits) {
            if (!AnswerLimits(client)) return false;
            continue;
        }
        const Call call = client->Request();
        // The fault command is exempt, so that faults can always be listed and cleared.
        const bool exempt = call.request == NumberOf(device::Command::CmdExec) && std::string_view(call.record.cmd, 5) == "fault";
        const auto fault = exempt ? std::nullopt : module_->FaultTable().Next(call.request);
        if (fault && fault->delay.count() > 0 && !stopping_) {
            client->delayed = {Clock::now() + fault->delay, *fault};
            return true;
        }
        if (!ExecuteRequest(client, fault.value_or(Fault{}))) return false;
    }
    return true;
}

bool Server::ExecuteRequest(Connection *client, const Fault &fault) {
    if (fault.drop == Drop::Before) return false;
    const Call call = client->Request();
    Answer answer;
    if (fault.Fails()) {
        answer.status = fault.status.value_or(call.record.status);
        answer.error = fault.error.value_or(ErrnoOf(answer.status));
        answer.dataLen = call.record.dataLen;
        answer.cmdOutLen = call.record.cmdOutLen;
    } else {
        answer = module_->Execute(call);
    }
    if (fault.drop == Drop::After) return false;
    wire::ReplyHeader reply = NewReply();
    reply.error = answer.error;
    reply.status = answer.status;
    reply.dataLen = answer.dataLen;
    reply.cmdOutLen = answer.cmdOutLen;
    reply.payloadSize = answer.payload.size;
    return client->Finish() && client->Send(reply, std::move(answer.payload));
}

bool Server::AnswerLimits(Connection *client) {
    wire::ReplyHeader reply = NewReply();
    Payload payload;
    payload.data = reinterpret_cast<const char *>(&uwMaxNumActivePortsSystemWide);
    payload.size = sizeof uwMaxNumActivePortsSystemWide;
    reply.payloadSize = payload.size;
    return client->Finish() && client->Send(reply, std::move(payload));
}

} // namespace dvs::emulator
