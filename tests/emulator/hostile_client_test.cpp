/* SPDX-License-Identifier: Apache-2.0 */
// Clients that violate the wire format: random and mutated requests, floods, clients that stop in
// mid-request. The emulator must keep running and serve its other clients meanwhile.

#include <cstring>
#include <fstream>
#include <random>

#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include "dvs/dvs.h"
#include "emulator/connection.h"
#include "emulator/emulator_process.h"
#include "emulator/hyp_support.h"
#include "platform/embedded/emulator_client.h"

namespace dvs::test {
namespace {

/// A raw connection without the device: sends bytes, receives a reply.
class RawClient {
public:
    explicit RawClient(const std::string &socket) : fd_(embedded::ConnectEmulator(socket.c_str())) {}
    ~RawClient() { close(fd_); }
    RawClient(const RawClient &) = delete;
    RawClient &operator=(const RawClient &) = delete;

    void Send(const std::string &bytes) {
        iovec part{const_cast<char *>(bytes.data()), bytes.size()};
        (void)embedded::SendWhole(fd_, &part, 1); // the emulator may have hung up
    }

    /// Returns true when a reply or the end of the connection arrives within `ms`.
    bool Answered(int ms, bool *ended = nullptr) {
        pollfd polled{fd_, POLLIN, 0};
        if (poll(&polled, 1, ms) != 1) return false;
        char buffer[65536];
        const ssize_t got = recv(fd_, buffer, sizeof buffer, MSG_DONTWAIT);
        if (ended) *ended = got <= 0;
        return true;
    }

    /// Returns true when a whole reply with this payload arrives.
    bool Received(const std::string &payload) {
        wire::ReplyHeader header{};
        std::string got(payload.size(), '\0');
        return embedded::ReceiveReply(fd_, &header, got.data(), got.size()) && got == payload;
    }

private:
    int fd_;
};

struct Parts {
    wire::RequestHeader header{};
    DVSHYPRequest record{};
    std::string value;
    std::string cmdIn;

    std::string Bytes() const {
        std::string bytes(reinterpret_cast<const char *>(&header), sizeof header);
        bytes.append(reinterpret_cast<const char *>(&record), sizeof record);
        return bytes + value + cmdIn;
    }
};

Parts ValidRequest(Command command, const std::string &value = {}) {
    Parts parts;
    parts.header.magic = wire::kMagic;
    parts.header.version = wire::kVersion;
    parts.header.kind = static_cast<uint16_t>(wire::Kind::Ioctl);
    parts.header.request = NumberOf(command);
    parts.header.flags = wire::HasData | wire::HasCmdIn | wire::HasCmdOut;
    parts.header.dataSize = static_cast<uint32_t>(value.size());
    std::strcpy(parts.record.switchName, "s");
    std::strcpy(parts.record.portId, "p");
    std::strcpy(parts.record.propName,
                command == Command::UplinkDataSet || command == Command::UplinkDataGet ? "1" : "name");
    std::strcpy(parts.record.cmd, "ports s");
    parts.record.status = HYP_FAILURE;
    parts.record.dataLen = value.empty() ? 32768 : static_cast<uint32_t>(value.size());
    parts.record.cmdOutLen = 32768;
    parts.value = value;
    return parts;
}

class HostileClients : public testing::Test {
protected:
    HostileClients() { Populate(); }

    void Populate() {
        (void)DVSHYP_SwitchAdd("s", "vswitch", 0, 110);
        (void)AddPort("s", "p", {{"name", "value"}});
        (void)DVSHYP_GlobalPropSet("s", "name", "value", 5, 16);
    }
    LiveEmulator emulator_;
};

TEST_F(HostileClients, RandomAndMutatedRequestsDoNoHarm) {
    const unsigned count = CountFromEnvironment("DVS_TEST_HOSTILE_REQUESTS", 2000);
    std::mt19937 random(20240501);
    const auto below = [&](uint32_t limit) { return static_cast<uint32_t>(random() % limit); };
    for (unsigned i = 0; i < count; i++) {
        std::string value;
        if (below(2)) value = PortData({{"a", std::string(below(100), 'v')}}, below(6));
        Parts parts = ValidRequest(Command{static_cast<int>(below(34))}, value);
        if (below(3) == 0) parts.record.dataLen = static_cast<uint32_t>(random());
        if (below(3) == 0) parts.header.flags = static_cast<uint32_t>(random());
        std::string bytes = parts.Bytes();
        // Changes bytes anywhere, also at the ends of text fields; sometimes changes a range or truncates.
        for (uint32_t change = below(8); change > 0; change--)
            bytes[below(static_cast<uint32_t>(bytes.size()))] = static_cast<char>(random());
        if (below(4) == 0) {
            const uint32_t at = below(static_cast<uint32_t>(bytes.size()));
            bytes.replace(at, 200, std::min<std::size_t>(200, bytes.size() - at), 'A');
        }
        if (below(8) == 0) bytes.resize(below(static_cast<uint32_t>(bytes.size())));
        if (below(16) == 0) bytes.insert(0, std::string(1 + below(50), static_cast<char>(random())));
        RawClient client(emulator_.Socket());
        client.Send(bytes);
        if (below(4)) (void)client.Answered(1);
        if (i % 50 == 0) {
            Populate();
            // An in-flight request may be a valid removal, so either result is fine: this client is served.
            const HYP_ReturnStatus status = Fetch(DVSHYP_GlobalPropGet, "s", "name").status;
            ASSERT_TRUE(status == HYP_OK || status == HYP_NOT_FOUND) << i;
            ASSERT_EQ(Exec("fault clear").status, HYP_OK) << i;
        }
    }
    EXPECT_EQ(emulator_.Process().Stop(SIGTERM), 0);
}

TEST_F(HostileClients, FieldsWithoutNulAreBadParameters) {
    const struct { std::size_t offset, size; } fields[] = {{0, 64}, {64, 48}, {112, 128}, {272, 128}};
    for (const auto &field : fields) {
        Parts parts = ValidRequest(Command::PortFind);
        std::memset(reinterpret_cast<char *>(&parts.record) + field.offset, 'x', field.size);
        const int fd = embedded::ConnectEmulator(emulator_.Socket().c_str());
        std::string bytes = parts.Bytes();
        iovec part{bytes.data(), bytes.size()};
        ASSERT_TRUE(embedded::SendWhole(fd, &part, 1));
        wire::ReplyHeader reply{};
        ASSERT_TRUE(embedded::ReceiveReply(fd, &reply, nullptr, 0));
        EXPECT_EQ(reply.status, HYP_BAD_PARAM) << field.offset;
        EXPECT_EQ(reply.error, EINVAL);
        close(fd);
    }
}

TEST_F(HostileClients, InvalidRequestClosesTheConnection) {
    Parts wrong[4] = {ValidRequest(Command::PortFind), ValidRequest(Command::PortFind),
                      ValidRequest(Command::PortFind), ValidRequest(Command::StateInit)};
    wrong[0].header.magic++;
    wrong[1].header.version++;
    wrong[2].header.kind = 7;
    wrong[3].header.dataSize = (256U << 20) + 1;
    for (const Parts &parts : wrong) {
        RawClient client(emulator_.Socket());
        client.Send(parts.Bytes());
        bool ended = false;
        EXPECT_TRUE(client.Answered(5000, &ended));
        EXPECT_TRUE(ended);
    }
}

TEST_F(HostileClients, MemoryGrowsWithReceivedBytesNotAnnouncedSize) {
    Parts parts = ValidRequest(Command::StateInit);
    parts.header.dataSize = parts.record.dataLen = 256U << 20;
    std::vector<std::unique_ptr<RawClient>> clients;
    for (int i = 0; i < 100; i++) {
        clients.push_back(std::make_unique<RawClient>(emulator_.Socket()));
        clients.back()->Send(parts.Bytes());
    }
    EXPECT_EQ(Fetch(DVSHYP_GlobalPropGet, "s", "name").text, "value");
}

/// The minor page faults of a process: a measure of the memory it touched, copies of buffers included.
uint64_t TouchedPages(pid_t pid) {
    std::ifstream file("/proc/" + std::to_string(pid) + "/stat");
    std::string word;
    for (int field = 1; field <= 10; field++) // no field contains a space: the program's name has none
        file >> word;
    return std::stoull(word);
}

TEST_F(HostileClients, LargeRequestIsNotCopiedWithEachPiece) {
    // A buffer that grows with each receive is copied each time; a state of this size then takes minutes.
    const std::string value(32 << 20, 'v');
    const uint64_t pages = value.size() / 4096;
    const uint64_t before = TouchedPages(emulator_.Process().Pid());
    EXPECT_EQ(DVSHYP_StateInit(value.data(), static_cast<uint32_t>(value.size())), HYP_BAD_PARAM);
    // Allows for doubling buffers and for a sanitizer's redzones.
    EXPECT_LT(TouchedPages(emulator_.Process().Pid()) - before, 8 * pages);
}

TEST_F(HostileClients, TruncatedRequestIsNotExecuted) {
    const std::string whole = ValidRequest(Command::SwitchRemove).Bytes();
    for (const std::size_t size : {std::size_t{1}, std::size_t{24}, whole.size() - 1}) {
        RawClient client(emulator_.Socket());
        client.Send(whole.substr(0, size));
    }
    EXPECT_EQ(DVSHYP_PortFind("s", "p"), HYP_OK);
    RawClient client(emulator_.Socket());
    client.Send(whole);
    EXPECT_TRUE(client.Answered(5000));
    EXPECT_EQ(DVSHYP_PortFind("s", "p"), HYP_NOT_FOUND);
}

TEST_F(HostileClients, RequestMayArriveByteByByte) {
    RawClient client(emulator_.Socket());
    for (const char byte : ValidRequest(Command::SwitchRemove).Bytes())
        client.Send(std::string(1, byte));
    EXPECT_TRUE(client.Answered(5000));
    EXPECT_EQ(DVSHYP_PortFind("s", "p"), HYP_NOT_FOUND);
}

TEST_F(HostileClients, RequestsSentAheadAreAnsweredInOrder) {
    RawClient client(emulator_.Socket());
    std::string bytes;
    for (int i = 0; i < 50; i++)
        bytes += ValidRequest(Command::PortFind).Bytes();
    client.Send(bytes + ValidRequest(Command::SwitchRemove).Bytes());
    for (int i = 0; i < 100 && DVSHYP_PortFind("s", "p") == HYP_OK; i++)
        usleep(10000);
    EXPECT_EQ(DVSHYP_PortFind("s", "p"), HYP_NOT_FOUND);
}

TEST_F(HostileClients, ClientThatReadsNoRepliesBlocksNoOther) {
    const std::string value(8 << 20, 'v');
    ASSERT_EQ(DVSHYP_GlobalPropSet("s", "name", value.data(), static_cast<uint32_t>(value.size()), 16),
              HYP_OK);
    std::vector<std::unique_ptr<RawClient>> clients;
    for (int i = 0; i < 20; i++) {
        clients.push_back(std::make_unique<RawClient>(emulator_.Socket()));
        Parts parts = ValidRequest(Command::GlobalPropGet);
        parts.record.dataLen = 64 << 20;
        clients.back()->Send(parts.Bytes());
    }
    EXPECT_EQ(Fetch(DVSHYP_GlobalPropGet, "s", "name").text, value);
    // Pending replies hold copies: changing the value does not change them.
    EXPECT_EQ(DVSHYP_GlobalPropClear("s", "name"), HYP_OK);
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    EXPECT_TRUE(clients.front()->Received(value)) << "the value at the time of the request";
}

TEST(ClientsTogether, ReceiveAtMostTheirMemoryBudget) {
    int ends[2];
    ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    constexpr uint64_t kBudget = 1 << 20;
    emulator::MemoryBudget budget(kBudget);
    {
        emulator::Connection connection(ends[0], getpid(), &budget);
        Parts parts = ValidRequest(Command::StateInit);
        parts.header.dataSize = parts.record.dataLen = 64U << 20;
        std::string bytes = parts.Bytes() + std::string(32 << 10, 'v');
        std::size_t sent = 0;
        while (sent < kBudget && send(ends[1], bytes.data(), bytes.size(), MSG_NOSIGNAL) > 0) {
            sent += bytes.size();
            bytes.assign(32 << 10, 'v');
            if (!connection.Receive()) break;
        }
        EXPECT_GT(sent, kBudget / 4) << "receives up to the budget";
        EXPECT_LT(sent, kBudget) << "receives no more than the budget";
        EXPECT_FALSE(budget.Take(kBudget));
    }
    EXPECT_TRUE(budget.Take(kBudget)) << "closing the connection returns the budget";
    close(ends[1]);
}

} // namespace
} // namespace dvs::test
