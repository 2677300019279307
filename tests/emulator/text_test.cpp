/* SPDX-License-Identifier: Apache-2.0 */
// Text commands and injected faults.

#include <algorithm>
#include <cerrno>
#include <chrono>

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include "dvs/dvs.h"
#include "emulator/emulator_process.h"
#include "emulator/faults.h"
#include "emulator/hyp_support.h"
#include "platform/device.h"

namespace dvs::test {
namespace {

/// A line of `stats`.
std::string CountOf(Command command, unsigned count) {
    return "command " + std::to_string(NumberOf(command)) + ' ' + std::to_string(count) + '\n';
}

class TextCommands : public testing::Test {
protected:
    TextCommands() { EXPECT_EQ(DVSHYP_SwitchAdd(kSwitch, "vswitch", 0, 110), HYP_OK); }

    uint32_t ConnectionId(const char *port) {
        DVSHYPPortList *list = nullptr;
        EXPECT_EQ(DVSHYP_SwitchPortList(kSwitch, &list, 1), HYP_OK);
        uint32_t id = 0xffffffff;
        for (uint32_t i = 0; list && i < list->numEntries; i++) {
            if (std::string(list->entries[i].portId) == port) id = list->entries[i].connectionId;
        }
        DVSHYP_DataFree(list);
        return id;
    }

    // Ids of this form contain spaces.
    static constexpr const char *kSwitch = "00 01 02 03 04 05 06 07-08 09 0a 0b 0c 0d 0e 0f";
    LiveEmulator emulator_;
};

TEST_F(TextCommands, HelpListsAllCommands) {
    const std::string help = Exec("help").text;
    for (const char *name : {"help ", "stats ", "ports ", "event ", "save ", "fault "})
        EXPECT_TRUE(help.find(name) == 0 || help.find(std::string("\n") + name) != std::string::npos) << name;
}

TEST_F(TextCommands, UnknownCommandsReturnNotSupported) {
    for (const char *text : {"", "   ", "helpme", "HELP"})
        EXPECT_EQ(Exec(text).status, HYP_NOT_SUPPORTED) << text;
}

TEST_F(TextCommands, StatsCountRequests) {
    (void)Fetch(DVSHYP_GlobalPropGet, kSwitch, "none");
    const std::string stats = Exec("stats").text;
    const std::string fixed[] = {"switches 1\n", "ports 0\n", "port-limit 65536\n", "refused 1\n"};
    for (const std::string &line : fixed)
        EXPECT_NE(stats.find(line), std::string::npos) << line << stats;
    for (const std::string &line :
         {CountOf(Command::SwitchAdd, 1), CountOf(Command::GlobalPropGet, 1), CountOf(Command::CmdExec, 1)})
        EXPECT_NE(stats.find(line), std::string::npos) << line << stats;
}

TEST_F(TextCommands, PortsAreListedByArgumentOrByTheRecordsSwitch) {
    ASSERT_EQ(AddPort(kSwitch, "p1"), HYP_OK);
    ASSERT_EQ(AddPort(kSwitch, "p\"2\n", {}, 2), HYP_OK);
    const std::string expected = "port \"p1\" kind active connection 0 link down\n"
                                 "port \"p\\x222\\x0a\" kind shadow connection 0 link down\n";
    EXPECT_EQ(Exec(std::string("ports ") + kSwitch).text, expected);
    EXPECT_EQ(Exec(std::string("ports \"") + kSwitch + "\"").text, expected);
    EXPECT_EQ(Exec("ports", kSwitch).text, expected);
    EXPECT_EQ(Exec("ports none").status, HYP_NOT_FOUND);
    EXPECT_EQ(Exec("ports").status, HYP_NOT_FOUND);
}

TEST_F(TextCommands, LinkUpAssignsAUniqueConnectionId) {
    ASSERT_EQ(AddPort(kSwitch, "p1"), HYP_OK);
    ASSERT_EQ(AddPort(kSwitch, "p2"), HYP_OK);
    EXPECT_EQ(ConnectionId("p1"), 0U);
    EXPECT_EQ(Exec(std::string("event ") + kSwitch + " p1 up").status, HYP_OK);
    EXPECT_EQ(Exec("event p2 up", kSwitch).status, HYP_OK);
    EXPECT_NE(ConnectionId("p1"), 0U);
    EXPECT_NE(ConnectionId("p2"), 0U);
    EXPECT_NE(ConnectionId("p1"), ConnectionId("p2"));
    EXPECT_NE(Exec("ports", kSwitch).text.find("link up"), std::string::npos);
    EXPECT_EQ(Exec("event p1 down", kSwitch).status, HYP_OK);
    EXPECT_EQ(ConnectionId("p1"), 0U);
}

TEST_F(TextCommands, KeepsAConnectionIdSetByTheAgent) {
    ASSERT_EQ(AddPort(kSwitch, "p1"), HYP_OK);
    const uint32_t own = 4711;
    ASSERT_EQ(DVSHYP_PortDataSet(kSwitch, "p1", "com.orbeno.common.port.connectid", &own, sizeof own, 16),
              HYP_OK);
    EXPECT_EQ(Exec("event p1 up", kSwitch).status, HYP_OK);
    EXPECT_EQ(ConnectionId("p1"), 4711U);
    EXPECT_EQ(Exec("event p1 down", kSwitch).status, HYP_OK);
    EXPECT_EQ(ConnectionId("p1"), 4711U);
}

TEST_F(TextCommands, DoesNotReuseAConnectionIdOfAPort) {
    // A restored state contains the ids of a module that also counted from 1.
    uint32_t own = 1;
    for (const char *port : {"p1", "p2"}) {
        ASSERT_EQ(AddPort(kSwitch, port), HYP_OK);
        ASSERT_EQ(DVSHYP_PortDataSet(kSwitch, port, "com.orbeno.common.port.connectid", &own, sizeof own, 16),
                  HYP_OK);
        own++;
    }
    ASSERT_EQ(AddPort(kSwitch, "p3"), HYP_OK);
    EXPECT_EQ(Exec("event p3 up", kSwitch).status, HYP_OK);
    EXPECT_EQ(ConnectionId("p3"), 3U);
}

TEST_F(TextCommands, RejectsEventsThatDoNotApply) {
    EXPECT_EQ(Exec("event p1 up", kSwitch).status, HYP_NOT_FOUND);
    EXPECT_EQ(Exec("event p1 sideways", kSwitch).status, HYP_BAD_PARAM);
    EXPECT_EQ(Exec("event up", kSwitch).status, HYP_BAD_PARAM);
    EXPECT_EQ(Exec("event", kSwitch).status, HYP_BAD_PARAM);
}

TEST_F(TextCommands, LongReplyGrowsTheBuffer) {
    for (int i = 0; i < 1000; i++)
        ASSERT_EQ(AddPort(kSwitch, "port-" + std::to_string(i)), HYP_OK);
    const std::string ports = Exec("ports", kSwitch).text;
    EXPECT_GT(ports.size(), 40000U);
    EXPECT_EQ(std::count(ports.begin(), ports.end(), '\n'), 1000);
}

class InjectedFaults : public TextCommands {
protected:
    HYP_ReturnStatus Find() { return DVSHYP_PortFind(kSwitch, "none"); }
};

TEST_F(InjectedFaults, HitTheNthMatchingCommandOnce) {
    ASSERT_EQ(Exec("fault " + FaultOf(Command::PortFind, "nth=3,status=0x0bad0014")).status, HYP_OK);
    EXPECT_EQ(Exec("fault list").text, FaultOf(Command::PortFind, "nth=3,status=0x0bad0014 seen 0\n"));
    EXPECT_EQ(Find(), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_SwitchAssociate(kSwitch), HYP_OK);
    EXPECT_EQ(Find(), HYP_NOT_FOUND);
    EXPECT_EQ(Find(), HYP_NO_MEMORY);
    EXPECT_EQ(Find(), HYP_NOT_FOUND);
    EXPECT_EQ(Exec("fault list").text, "");
}

TEST_F(InjectedFaults, WithoutANumberHitUntilCleared) {
    ASSERT_EQ(Exec("fault status=2").status, HYP_OK);
    EXPECT_EQ(Find(), 2U);
    EXPECT_EQ(Find(), 2U);
    EXPECT_EQ(Exec("stats").status, 2U);
    EXPECT_EQ(Exec("fault clear").status, HYP_OK);
    EXPECT_EQ(Find(), HYP_NOT_FOUND);
}

TEST_F(InjectedFaults, SetOnlyTheErrno) {
    ASSERT_EQ(Exec("fault " + FaultOf(Command::PortFind, "errno=EBUSY")).status, HYP_OK);
    const int fd = HostDevice_Open("/pelo/devices/char/hypdriver/dvsdev");
    DVSHYPRequest request{};
    request.status = HYP_FAILURE;
    EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(Command::PortFind), &request), -1);
    EXPECT_EQ(errno, EBUSY);
    EXPECT_EQ(request.status, HYP_FAILURE);
    HostDevice_Close(fd);
}

TEST_F(InjectedFaults, DelayOneClientOnly) {
    using namespace std::chrono;
    ASSERT_EQ(Exec("fault " + FaultOf(Command::PortFind, "nth=1,delay=300")).status, HYP_OK);
    ASSERT_EQ(DVSHYP_StateSanitize(), HYP_OK); // opens the connection of the plain calls
    const auto start = steady_clock::now();
    const pid_t child = fork();
    if (child == 0)
        _exit(Find() == HYP_NOT_FOUND && steady_clock::now() - start >= milliseconds(300) ? 0 : 1);
    // The first of the two is delayed; fetches continue meanwhile.
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_OK);
    EXPECT_LT(steady_clock::now() - start, milliseconds(300));
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
}

TEST_F(InjectedFaults, DroppedRequestsAreNotExecuted) {
    ASSERT_EQ(Exec("fault " + FaultOf(Command::SwitchAdd, "nth=1,drop")).status, HYP_OK);
    EXPECT_EQ(DVSHYP_SwitchAdd("new", "vswitch", 0, 110), HYP_FAILURE);
    EXPECT_EQ(DVSHYP_SwitchAssociate("new"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_SwitchAdd("new", "vswitch", 0, 110), HYP_OK);
}

TEST_F(InjectedFaults, DroppedRepliesFailAndAreNotResent) {
    ASSERT_EQ(Exec("fault " + FaultOf(Command::SwitchAdd, "nth=1,drop=after")).status, HYP_OK);
    EXPECT_EQ(DVSHYP_SwitchAdd("new", "vswitch", 0, 110), HYP_FAILURE);
    EXPECT_EQ(DVSHYP_SwitchAssociate("new"), HYP_OK);
    EXPECT_NE(Exec("stats").text.find(CountOf(Command::SwitchAdd, 2)), std::string::npos);
}

TEST_F(InjectedFaults, HitTextCommandsExceptTheirOwn) {
    ASSERT_EQ(Exec("fault " + FaultOf(Command::CmdExec, "errno=EIO,status=0x0bad0001")).status, HYP_OK);
    EXPECT_EQ(Exec("help").status, HYP_FAILURE);
    EXPECT_EQ(Exec("fault clear").status, HYP_OK);
    EXPECT_EQ(Exec("help").status, HYP_OK);
}

TEST_F(InjectedFaults, CanBeSetAtStartup) {
    EmulatorProcess process;
    const std::string socket = emulator_.Directory() / "second";
    ASSERT_TRUE(
        process.Start(socket, {"--fault", "command=3,nth=1,status=0x0bad0014", "--fault", "command=1,drop"}));
    setenv("DVS_EMULATOR", socket.c_str(), 1);
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_NO_MEMORY);
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_OK);
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
}

TEST(FaultSpecifications, AcceptsGoodSpecifications) {
    for (const char *text :
         {"status=1", "errno=5", "errno=ENOSPC", "delay=10", "delay=10ms", "delay=2s", "drop", "drop=after",
          "command=0,nth=1,status=0x0bad0014", "nth=4294967295,drop,delay=1", "status=4294967295"}) {
        emulator::Faults faults;
        std::string why;
        EXPECT_TRUE(faults.Add(text, &why)) << text << ": " << why;
    }
}

TEST(FaultSpecifications, RejectsBadSpecificationsWithTheReason) {
    for (const char *text :
         {"", "command=19", "nth=3", "status=", "status=x", "status=0", "status=4294967296", "errno=0",
          "errno=9999", "errno=EWHAT", "delay=-1", "delay=1h", "delay=99999999999", "drop=maybe",
          "nth=0,drop", "command=-1,drop", "colour=red", "status=1,,drop", "status=1 ,drop"}) {
        emulator::Faults faults;
        std::string why;
        EXPECT_FALSE(faults.Add(text, &why)) << text;
        EXPECT_NE(why, "") << text;
    }
}

} // namespace
} // namespace dvs::test
