/* SPDX-License-Identifier: Apache-2.0 */
// A hostile peer at the emulator's socket. The embedded device must end every call, fail calls without a
// valid reply, and never make the library loop forever.

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstring>
#include <functional>
#include <thread>

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include "dvs/dvs.h"
#include "emulator/emulator_process.h"
#include "emulator/hyp_support.h"
#include "platform/embedded/emulator_wire.h"
#include "platform/kit.h"

namespace dvs::test {
namespace {

/// The peer's reply to a request; empty closes the connection.
using Script = std::function<std::string(const wire::RequestHeader &, const DVSHYPRequest &)>;

/// Listens in its own thread and replies according to a script.
class HostilePeer {
public:
    explicit HostilePeer(Script script, bool hangsUp = false)
        : script_(std::move(script)), hangsUp_(hangsUp) {
        const std::string path = directory_ / "socket";
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        std::strcpy(address.sun_path, path.c_str());
        fd_ = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
        EXPECT_EQ(bind(fd_, reinterpret_cast<sockaddr *>(&address), sizeof address), 0);
        EXPECT_EQ(listen(fd_, 16), 0);
        setenv("DVS_EMULATOR", path.c_str(), 1);
        thread_ = std::thread([this] { Run(); });
    }
    ~HostilePeer() {
        shutdown(fd_, SHUT_RDWR);
        thread_.join();
        close(fd_);
        for (const int client : clients_)
            shutdown(client, SHUT_RDWR);
        for (std::thread &server : servers_)
            server.join();
        for (const int client : clients_)
            close(client);
    }
    unsigned Requests() const { return requests_; }

private:
    void Run() {
        for (;;) {
            const int client = accept(fd_, nullptr, nullptr);
            if (client == -1) return;
            clients_.push_back(client);
            servers_.emplace_back([this, client] { Serve(client); });
        }
    }
    void Serve(int client) {
        struct {
            wire::RequestHeader header;
            char record[wire::kRecordSize];
        } request;
        std::string rest;
        for (;;) {
            if (recv(client, &request.header, sizeof request.header, MSG_WAITALL) != sizeof request.header)
                break;
            if (request.header.kind == 1 &&
                recv(client, request.record, sizeof request.record, MSG_WAITALL) != sizeof request.record)
                break;
            rest.resize(request.header.dataSize + request.header.cmdInSize);
            if (!rest.empty()) (void)recv(client, rest.data(), rest.size(), MSG_WAITALL);
            requests_++;
            DVSHYPRequest record;
            std::memcpy(&record, request.record, sizeof record);
            const std::string reply = script_(request.header, record);
            if (reply.empty() || send(client, reply.data(), reply.size(), MSG_NOSIGNAL) < 0 || hangsUp_)
                break;
        }
        shutdown(client, SHUT_RDWR);
    }

    TempDir directory_;
    Script script_;
    const bool hangsUp_; // after each reply
    int fd_ = -1;
    std::atomic<unsigned> requests_ = 0;
    std::thread thread_;
    // Used only by the listening thread until it ends.
    std::vector<int> clients_;
    std::vector<std::thread> servers_;
};

std::string Reply(uint32_t status, int error, uint32_t length, const std::string &payload, uint32_t claimed) {
    wire::ReplyHeader header{};
    header.magic = wire::kMagic;
    header.version = wire::kVersion;
    header.status = status;
    header.error = error;
    header.dataLen = header.cmdOutLen = length;
    header.payloadSize = claimed;
    return std::string(reinterpret_cast<const char *>(&header), sizeof header) + payload;
}

/// Every function that calls the module.
std::vector<std::function<HYP_ReturnStatus()>> AllCalls() {
    return {
        [] { return Fetch(DVSHYP_StateGet).status; },
        [] { return Fetch(DVSHYP_GlobalPropGet, "s", "k").status; },
        [] { return Fetch(DVSHYP_HostPropGet, "s", "k").status; },
        [] { return Fetch(DVSHYP_PortDataGet, "s", "p", "k").status; },
        [] { return Fetch(DVSHYP_PortStateGet, "s", "p").status; },
        [] { return FetchUplink("s", "p", 1).status; },
        [] { return Exec("help").status; },
        [] { return Fetch(DVSHYP_SmartNICGlobalPropGet, "s", "k").status; },
        [] { return Fetch(DVSHYP_SmartNICHostPropGet, "s", "k").status; },
        [] { return Fetch(DVSHYP_SmartNICPortDataGet, "s", "p", "k").status; },
        [] { return Fetch(DVSHYP_PersistentStateGet).status; },
        [] { return Fetch(DVSHYP_PersistentPortStateGet, "s", "p", uint32_t{9}).status; },
        [] { return DVSHYP_StateInit("state", 5); },
        [] { return DVSHYP_StateCleanup(); },
        [] { return DVSHYP_SwitchAdd("s", "c", 1, 9); },
        [] { return DVSHYP_PortAdd("s", "p", "data", 4); },
        [] { return DVSHYP_PortFind("s", "p"); },
        [] { return DVSHYP_GlobalPropSet("s", "k", "v", 1, 16); },
    };
}

constexpr std::size_t kReceivers = 12; // the first of the list above

class HostileEmulator : public testing::Test {
protected:
    ~HostileEmulator() override { testing::internal::GetCapturedStderr(); }
    HostileEmulator() { testing::internal::CaptureStderr(); }

    /// Checks that all calls fail against this peer.
    void AllFail(const Script &script, bool receiversOnly = false) {
        HostilePeer peer(script);
        const auto calls = AllCalls();
        for (std::size_t i = 0; i < (receiversOnly ? kReceivers : calls.size()); i++)
            EXPECT_NE(calls[i](), HYP_OK) << "call " << i;
        EXPECT_GT(peer.Requests(), 0U);
    }
};

TEST_F(HostileEmulator, HangsUp) {
    AllFail([](auto &, auto &) { return std::string(); });
}

TEST_F(HostileEmulator, TalksNonsense) {
    AllFail([](auto &, auto &) { return std::string(100, 'x'); });
}

TEST_F(HostileEmulator, SpeaksAnotherVersion) {
    AllFail([](auto &, auto &) {
        std::string reply = Reply(0, 0, 0, {}, 0);
        reply[4] = 9;
        return reply;
    });
}

TEST_F(HostileEmulator, ClaimsMorePayloadThanTheBufferHolds) {
    AllFail([](auto &, auto &) { return Reply(0, 0, 40000, std::string(40000, 'x'), 40000); });
    AllFail([](auto &, auto &) { return Reply(0, 0, 0xFFFFFFFF, "x", 0xFFFFFFFF); });
}

TEST_F(HostileEmulator, AnnouncesADifferentLengthThanItSends) {
    AllFail([](auto &, auto &) { return Reply(0, 0, 10, "abc", 3); }, true);
    AllFail([](auto &, auto &) { return Reply(0, 0, 0xFFFFFFFF, "abc", 3); }, true);
    AllFail([](auto &, auto &) { return Reply(0, 0, 10, {}, 0); }, true);
}

TEST_F(HostileEmulator, SendsMoreThanItAnnounced) {
    AllFail([](auto &, auto &) { return Reply(0, 0, 3, "abcdef", 3); }, true);
}

TEST_F(HostileEmulator, SendsAPayloadWithAnError) {
    AllFail([](auto &, auto &) { return Reply(HYP_NOT_FOUND, ENOENT, 3, "abc", 3); });
}

TEST_F(HostileEmulator, RejectsEveryBufferWithoutALargerSize) {
    AllFail([](auto &, const DVSHYPRequest &record) {
        return Reply(HYP_LIMIT_EXCEEDED, ENOSPC, record.dataLen ? record.dataLen : record.cmdOutLen, {}, 0);
    });
}

TEST_F(HostileEmulator, AsksForOneByteMoreEachTime) {
    HostilePeer peer([](auto &, const DVSHYPRequest &record) {
        return Reply(HYP_LIMIT_EXCEEDED, ENOSPC, std::max(record.dataLen, record.cmdOutLen) + 1, {}, 0);
    });
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
    EXPECT_EQ(peer.Requests(), 65U); // the limit is 64 consecutive refusals
    EXPECT_EQ(Exec("help").status, HYP_FAILURE);
    EXPECT_EQ(peer.Requests(), 130U);
}

TEST_F(HostileEmulator, AsksForMoreThanTheStateLimit) {
    HostilePeer peer(
        [](auto &, auto &) { return Reply(HYP_LIMIT_EXCEEDED, ENOSPC, (256U << 20) + 1, {}, 0); });
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
    EXPECT_EQ(Exec("help").status, HYP_FAILURE);
    EXPECT_EQ(peer.Requests(), 2U);
}

TEST_F(HostileEmulator, RefusalsOfPlainCallsAreNotCounted) {
    HostilePeer peer([](auto &, auto &) { return Reply(HYP_LIMIT_EXCEEDED, ENOSPC, 0, {}, 0); });
    for (int i = 0; i < 200; i++)
        ASSERT_EQ(DVSHYP_PortAdd("s", "p", "data", 4), HYP_LIMIT_EXCEEDED) << i;
}

TEST_F(HostileEmulator, SendsAnInvalidErrno) {
    AllFail([](auto &, auto &) { return Reply(HYP_NOT_FOUND, -5, 0, {}, 0); });
    AllFail([](auto &, auto &) { return Reply(HYP_NOT_FOUND, 0x7FFFFFFF, 0, {}, 0); });
}

TEST_F(HostileEmulator, FailsWithTheStatusOfSuccess) {
    AllFail([](auto &, auto &) { return Reply(HYP_OK, EIO, 10, {}, 0); }, true);
}

TEST_F(HostileEmulator, HangsUpInTheMiddleOfAnAnswer) {
    const std::string whole = Reply(0, 0, 16, std::string(16, '\0'), 16);
    std::atomic<std::size_t> size = 0;
    HostilePeer peer([&](auto &, auto &) { return whole.substr(0, 1 + size++ % (whole.size() - 1)); }, true);
    for (std::size_t i = 0; i < whole.size() - 1; i++)
        EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
}

TEST_F(HostileEmulator, ReportsAnInvalidLimit) {
    for (const std::string &reply :
         {std::string(), Reply(0, 0, 0, {}, 0), Reply(0, 0, 0, std::string(4, '\0'), 4),
          Reply(0, EIO, 0, {}, 0), Reply(0, 0, 0, std::string(8, '\1'), 8)}) {
        HostilePeer peer([&](auto &, auto &) { return reply; });
        uint32_t ports = 77;
        EXPECT_EQ(KIT_Get(KIT_NODE_net_maxPortsSystemWide, nullptr, &ports, sizeof ports), HYP_FAILURE);
        EXPECT_EQ(ports, 77U);
    }
}

} // namespace
} // namespace dvs::test
