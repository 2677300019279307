/* SPDX-License-Identifier: Apache-2.0 */
// A hostile module: each receiving function gets many kinds of invalid reply. The library must not read or
// write outside a buffer, must not leak, must leave the table empty, and must return no data on failure.

#include <cerrno>
#include <cstring>
#include <functional>
#include <random>
#include <set>

#include <gtest/gtest.h>

#include "emulator/emulator_process.h"
#include "kernel/fake_device.h"
#include "kernel/state_support.h"

namespace dvs::test {
namespace {

struct Receiver {
    const char *name;
    Command command; // the first command sent to the module
    std::function<HYP_ReturnStatus(void **)> call;
    bool givesList;
};

uint32_t g_size = 0;

std::vector<Receiver> Receivers() {
    const auto list = [](void **out) { return reinterpret_cast<DVSData **>(out); };
    return {
        {"StateGet", Command::StateGet, [](void **out) { return DVSHYP_StateGet(out, &g_size); }, false},
        {"GlobalPropGet", Command::GlobalPropGet,
         [](void **out) { return DVSHYP_GlobalPropGet("s", "k", out, &g_size); }, false},
        {"HostPropGet", Command::HostPropGet,
         [](void **out) { return DVSHYP_HostPropGet("s", "k", out, &g_size); }, false},
        {"PortDataGet", Command::PortDataGet,
         [](void **out) { return DVSHYP_PortDataGet("s", "p", "k", out, &g_size); }, false},
        {"PortStateGet", Command::PortStateGet,
         [](void **out) { return DVSHYP_PortStateGet("s", "p", out, &g_size); }, false},
        {"UplinkDataGet", Command::UplinkDataGet,
         [](void **out) { return DVSHYP_UplinkDataGet("s", "p", 1, out, &g_size); }, false},
        {"CmdExec", Command::CmdExec,
         [](void **out) { return DVSHYP_CmdExec("s", "c", nullptr, 0, out, &g_size); }, false},
        {"SmartNICGlobal", Command::SmartNICGlobalPropGet,
         [](void **out) { return DVSHYP_SmartNICGlobalPropGet("s", "k", out, &g_size); }, false},
        {"SmartNICHost", Command::SmartNICHostPropGet,
         [](void **out) { return DVSHYP_SmartNICHostPropGet("s", "k", out, &g_size); }, false},
        {"SmartNICPort", Command::SmartNICPortDataGet,
         [](void **out) { return DVSHYP_SmartNICPortDataGet("s", "p", "k", out, &g_size); }, false},
        {"ExternalId", Command::StateGet,
         [](void **out) {
             return DVSHYP_PortGetByExternalId("s", "i", reinterpret_cast<DVSHYPExternalIdResult **>(out));
         },
         false},
        {"PersistentState", Command::StateGet,
         [](void **out) { return DVSHYP_PersistentStateGet(out, &g_size); }, false},
        {"PersistentPort", Command::PortStateGet,
         [](void **out) { return DVSHYP_PersistentPortStateGet("s", "p", 9, out, &g_size); }, false},
        {"VendorGlobal", Command::StateGet,
         [=](void **out) { return DVSHYP_VendorGlobalPropList("s", list(out), 16); }, true},
        {"VendorHost", Command::StateGet,
         [=](void **out) { return DVSHYP_VendorHostPropList("s", list(out), 16); }, true},
        {"VendorPort", Command::PortStateGet,
         [=](void **out) { return DVSHYP_VendorPortPropList("s", "p", list(out), 16); }, true},
        {"ExtraConfig", Command::StateGet,
         [=](void **out) { return DVSHYP_ExtraConfigPropList("s", list(out), 16); }, true},
        {"ExtraConfigPort", Command::PortStateGet,
         [=](void **out) { return DVSHYP_ExtraConfigPortPropList("s", "p", list(out), 16); }, true},
        {"Overlay", Command::StateGet,
         [=](void **out) { return DVSHYP_OvlPropList("s", 16, true, list(out)); }, true},
        {"PortList", Command::StateGet,
         [](void **out) { return DVSHYP_SwitchPortList("s", reinterpret_cast<DVSHYPPortList **>(out), 1); },
         false},
    };
}

/// A call without output data: the module may only return a status; any data it writes is rejected.
struct Sender {
    const char *name;
    Command command;
    std::function<HYP_ReturnStatus()> call;
};

// Not constant, and as large as its stated length: a hostile module may write to it.
char g_value[64];

std::vector<Sender> Senders() {
    const auto *value = g_value;
    const uint32_t size = sizeof g_value;
    return {
        {"StateInit", Command::StateInit, [=] { return DVSHYP_StateInit(value, size); }},
        {"StateCleanup", Command::StateCleanup, [] { return DVSHYP_StateCleanup(); }},
        {"StateSanitize", Command::StateSanitize, [] { return DVSHYP_StateSanitize(); }},
        {"SwitchAdd", Command::SwitchAdd, [] { return DVSHYP_SwitchAdd("s", "c", 8, 9); }},
        {"SwitchRemove", Command::SwitchRemove, [] { return DVSHYP_SwitchRemove("s"); }},
        {"SwitchAssociate", Command::SwitchAssociate, [] { return DVSHYP_SwitchAssociate("s"); }},
        {"SwitchDissociate", Command::SwitchDissociate, [] { return DVSHYP_SwitchDissociate("s"); }},
        {"GlobalPropSet", Command::GlobalPropSet,
         [=] { return DVSHYP_GlobalPropSet("s", "k", value, size, 16); }},
        {"GlobalPropClear", Command::GlobalPropClear, [] { return DVSHYP_GlobalPropClear("s", "k"); }},
        {"HostPropSet", Command::HostPropSet, [=] { return DVSHYP_HostPropSet("s", "k", value, size, 16); }},
        {"HostPropClear", Command::HostPropClear, [] { return DVSHYP_HostPropClear("s", "k"); }},
        {"PortAdd", Command::PortAdd, [=] { return DVSHYP_PortAdd("s", "p", value, size); }},
        {"PortRemove", Command::PortRemove, [] { return DVSHYP_PortRemove("s", "p"); }},
        {"PortDataSet", Command::PortDataSet,
         [=] { return DVSHYP_PortDataSet("s", "p", "k", value, size, 16); }},
        {"PortDataClear", Command::PortDataClear, [] { return DVSHYP_PortDataClear("s", "p", "k"); }},
        {"PortFind", Command::PortFind, [] { return DVSHYP_PortFind("s", "p"); }},
        {"SwitchSetMaxPorts", Command::SwitchSetMaxPorts, [] { return DVSHYP_SwitchSetMaxPorts("s", 8); }},
        {"SwitchSetVersion", Command::SwitchSetVersion, [] { return DVSHYP_SwitchSetVersion("s", 9); }},
        {"UplinkDataSet", Command::UplinkDataSet,
         [=] { return DVSHYP_UplinkDataSet("s", "p", 1, value, size, 16); }},
    };
}

struct Answer {
    const char *name;
    std::deque<Step> steps;
};

std::string GoodState() {
    StateBuilder state;
    state.Switch("s").Global("s", "com.vendor.a", "v").Host("s", "com.orbeno.common.portset.opaque", "true");
    state.Port("s", "p", {{"com.orbeno.port.extraConfig.vnic.external.id", "i"}}).Port("s", "1000");
    return state.Serialize();
}

std::string WrongIds() {
    StateBuilder state;
    state.Switch("other").Port("other", "");
    std::string serialized = state.Serialize();
    return serialized;
}

std::string WithoutNul(std::string state) {
    // A switch id that fills its whole field. The checksum excludes only the first 16 bytes of the name.
    std::memset(state.data() + 16, 'n', 16);
    return state;
}

std::deque<Step> Growing() {
    std::deque<Step> steps;
    for (int64_t size = 32769; size < 32769 + 200; size++)
        steps.push_back({ENOSPC, HYP_LIMIT_EXCEEDED, size, {}});
    steps.push_back({EIO, HYP_BAD_PARAM, -1, {}});
    return steps;
}

std::vector<Answer> Answers() {
    const std::string state = GoodState();
    const std::string port = PortData({{"com.vendor.a", "v"}, {"b.volatile.c", "v"}});
    const auto size = [](const std::string &text) { return static_cast<int64_t>(text.size()); };
    std::string flipped = state;
    flipped[flipped.size() / 2] ^= 0x40;
    std::string longer = state;
    longer[0] = static_cast<char>(longer[0] + 4);
    return {
        {"nothing", {{0, -1, 0, {}}}},
        {"one byte", {{0, -1, 1, "x"}}},
        {"three bytes", {{0, -1, 3, "xyz"}}},
        {"fifteen bytes", {{0, -1, 15, state}}},
        {"claims one more than the buffer", {{0, -1, 32769, state}}},
        {"claims all there is", {{0, -1, 0xFFFFFFFF, state}}},
        {"claims less than it wrote", {{0, -1, 20, state}}},
        {"claims the whole buffer", {{0, -1, 32768, std::string(32768, '\x55')}}},
        {"grows for ever, then fails", Growing()},
        {"unchanged with limit exceeded",
         {{ENOSPC, HYP_LIMIT_EXCEEDED, -1, {}}, {EIO, HYP_NOT_FOUND, -1, {}}}},
        {"shrinks with limit exceeded", {{ENOSPC, HYP_LIMIT_EXCEEDED, 3, {}}, {EIO, HYP_NOT_FOUND, -1, {}}}},
        {"fails with success", {{EIO, HYP_OK, -1, state}}},
        {"fails with success of nothing", {{EIO, HYP_OK, 0, {}}}},
        {"fails without a status", {{EIO, -1, -1, {}}}},
        {"succeeds with a failure", {{0, HYP_NOT_FOUND, size(state), state}}},
        {"one bit off", {{0, -1, size(state), flipped}}},
        {"longer than it is", {{0, -1, size(state), longer}}},
        {"wrong ids", {{0, -1, size(WrongIds()), WrongIds()}}},
        {"no NUL", {{0, -1, size(state), WithoutNul(state)}}},
        {"a port where a state is asked for", {{0, -1, size(port), port}}},
        {"a state where a port is asked for", {{0, -1, size(state), state}}},
        {"zeroes", {{0, -1, 4096, std::string(4096, '\0')}}},
        {"a status nobody knows", {{EIO, 0xDEADBEEF, 0x7FFFFFFF, {}}}},
    };
}

class HostileModule : public testing::Test, protected FakeDeviceTest {
protected:
    void Try(const Receiver &receiver, const std::deque<Step> &steps, const std::string &what) {
        device.Reset();
        device.script = steps;
        // Any other request, such as one for the version, gets an invalid reply too.
        for (const Command command :
             {Command::StateGet, Command::GlobalPropGet, Command::PortStateGet, Command::CmdExec})
            device.always[command] = {EIO, HYP_BAD_PARAM, 0, {}};
        void *out = nullptr;
        const HYP_ReturnStatus status = receiver.call(&out);
        EXPECT_EQ(out != nullptr, status == HYP_OK) << receiver.name << ": " << what;
        if (receiver.givesList)
            DVSData_Free(static_cast<DVSData *>(out));
        else
            DVSHYP_DataFree(out);
        EXPECT_TRUE(TableIsEmpty()) << receiver.name << ": " << what;
    }
};

TEST_F(HostileModule, EveryReceiverSurvivesEveryKindOfAnswer) {
    const std::vector<Answer> answers = Answers();
    EXPECT_GE(answers.size(), 20U);
    for (const Receiver &receiver : Receivers()) {
        for (const Answer &answer : answers)
            Try(receiver, answer.steps, answer.name);
    }
    EXPECT_LE(device.open.size(), 1U);
}

TEST_F(HostileModule, EverySenderSurvivesEveryKindOfAnswer) {
    for (const Sender &sender : Senders()) {
        for (const Answer &answer : Answers()) {
            device.Reset();
            device.script = answer.steps;
            const Step &first = answer.steps.front();
            const uint32_t refusal =
                first.status == -1 ? uint32_t{HYP_FAILURE} : static_cast<uint32_t>(first.status);
            EXPECT_EQ(sender.call(), first.error == 0 ? uint32_t{HYP_OK} : refusal)
                << sender.name << ": " << answer.name;
            EXPECT_EQ(device.calls.size(), 1U) << sender.name << ": a change must be sent only once";
            EXPECT_TRUE(TableIsEmpty()) << sender.name << ": " << answer.name;
        }
    }
    EXPECT_LE(device.open.size(), 1U);
}

TEST_F(HostileModule, EveryCommandIsAReceiverOrASender) {
    std::set<Command> expected, asked;
    for (const device::CommandRow &row : device::kCommands)
        expected.insert(row.command);
    const auto note = [&](const char *name, Command command, const auto &call) {
        device.Reset();
        device.always[command] = {EIO, HYP_BAD_PARAM, 0, {}};
        call();
        ASSERT_FALSE(device.calls.empty()) << name;
        EXPECT_EQ(device.calls.front().request, NumberOf(command)) << name;
        asked.insert(command);
    };
    for (const Sender &sender : Senders())
        note(sender.name, sender.command, sender.call);
    for (const Receiver &receiver : Receivers())
        note(receiver.name, receiver.command, [&] {
            void *out = nullptr;
            EXPECT_NE(receiver.call(&out), uint32_t{HYP_OK}) << receiver.name;
        });
    EXPECT_EQ(asked, expected);
}

TEST_F(HostileModule, PlainCallsReturnTheModulesStatus) {
    for (const uint32_t status : {0U, 1U, 0x0bad0006U, 0xDEADBEEFU}) {
        device.script = {{EIO, status, 0xFFFFFFFF, {}}};
        EXPECT_EQ(DVSHYP_PortFind("s", "p"), status);
    }
}

TEST_F(HostileModule, MutatedStatesAndPortsAreLoadedOrRejected) {
    const unsigned count = CountFromEnvironment("DVS_TEST_HOSTILE_REPLIES", 3000);
    const std::string sources[] = {GoodState(), PortData({{"com.vendor.a", "v"}, {"b.volatile.c", "v"}})};
    std::mt19937 random(4711);
    const std::vector<Receiver> receivers = Receivers();
    for (unsigned i = 0; i < count; i++) {
        const Receiver &receiver = receivers[random() % receivers.size()];
        std::string reply = sources[receiver.command == Command::PortStateGet ? 1 : 0];
        for (unsigned change = 1 + random() % 4; change > 0; change--)
            reply[random() % reply.size()] = static_cast<char>(random());
        if (random() % 4 == 0) reply.resize(random() % reply.size());
        // Half of them get a valid checksum, so that the code after the checksum test is reached.
        uint32_t sum = 0;
        for (std::size_t at = 32; at + 4 <= reply.size(); at += 4) {
            uint32_t word = 0;
            std::memcpy(&word, reply.data() + at, sizeof word);
            sum += word;
        }
        if (random() % 2 && reply.size() >= 8) std::memcpy(reply.data() + 4, &sum, sizeof sum);
        Try(receiver, {{0, -1, static_cast<int64_t>(reply.size()), reply}}, "mutation " + std::to_string(i));
    }
}

} // namespace
} // namespace dvs::test
