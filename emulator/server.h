/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_SERVER_H
#define EMULATOR_SERVER_H

// The socket and the loop over its clients. One thread executes one request at a time, in the order in which
// they complete, so commands never interleave.

#include <memory>
#include <string>
#include <vector>

#include <poll.h>

#include "emulator/connection.h"
#include "emulator/module.h"

namespace dvs::emulator {

class Server {
public:
    explicit Server(Module *module);
    ~Server();
    Server(const Server &) = delete;
    Server &operator=(const Server &) = delete;

    /// Listens at `path` (listen.h). On failure returns false and sets `*why`.
    [[nodiscard]] bool Listen(const std::string &path, std::string *why);

    /// Serves until `stopFd` becomes readable, then finishes requests in flight.
    void Run(int stopFd);

private:
    using Clients = std::vector<std::unique_ptr<Connection>>;

    void Accept();
    [[nodiscard]] bool MayConnect(pid_t peer) const;
    void ServeOnce(int stopFd, bool *stopped);
    void FinishRequests();
    [[nodiscard]] bool ServeClient(Connection *client, short events, Clock::time_point now);
    [[nodiscard]] bool ServeRequests(Connection *client);
    [[nodiscard]] bool ExecuteRequest(Connection *client, const Fault &fault);
    [[nodiscard]] bool AnswerLimits(Connection *client);
    [[nodiscard]] int NextTimeout() const;

    Module *const module_;
    MemoryBudget budget_;
    std::string path_;
    int listenFd_ = -1;
    std::size_t maxClients_;
    bool stopping_ = false;
    Clock::time_point stopAt_; // while stopping: the deadline
    std::vector<pollfd> polled_;
    Clients clients_;
};

} // namespace dvs::emulator

#endif
