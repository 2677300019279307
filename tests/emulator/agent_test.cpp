/* SPDX-License-Identifier: Apache-2.0 */
// An end-to-end test: the example agent runs against an emulator and saves into a store; the store is loaded
// into a second emulator; the two states are compared property by property by the round-trip rules.

#include <csignal>
#include <cstdlib>

#include <gtest/gtest.h>
#include <unistd.h>

#include "configstore/round_trip/model.h"
#include "configstore/round_trip/random_state.h"
#include "dvs/dvs.h"
#include "emulator/emulator_process.h"
#include "emulator/hyp_support.h"
#include "kernel/state_support.h"

namespace dvs::test {
namespace {

constexpr const char *kAgent = DVS_BINARY_DIR "/bin/agent";
constexpr const char *kSwitch = "50 2d 36 bd 37 ea 3b ab-c1 9a 9a 6f 0a 0b 0c 0d";

class Agent : public testing::Test {
protected:
    Agent() { setenv("DVS_CONFIGSTORE", (emulator_.Directory() / "configstore.db").c_str(), 1); }
    LiveEmulator emulator_;
};

TEST_F(Agent, SetsUpListsAndSaves) {
    EXPECT_EQ(RunProgram({kAgent, "setup", kSwitch, "3"}).status, 0);
    const Finished listed = RunProgram({kAgent, "list", kSwitch});
    EXPECT_EQ(listed.out, "1 0\n2 0\n3 0\n") << listed.err;
    EXPECT_EQ(RunProgram({kAgent, "setup", kSwitch, "3"}).status, 1);
    EXPECT_EQ(RunProgram({kAgent, "list", "none"}).status, 1);
    EXPECT_EQ(RunProgram({kAgent}).status, 2);
    const Finished saved = RunProgram({kAgent, "save"});
    EXPECT_EQ(saved.status, 0) << saved.out << saved.err;
}

TEST_F(Agent, FailsWithAMessageWithoutAnEmulator) {
    emulator_.Process().Stop(SIGTERM);
    const Finished saved = RunProgram({kAgent, "save"});
    EXPECT_EQ(saved.status, 1);
    EXPECT_NE(saved.err.find("failed to open dvsdev device"), std::string::npos) << saved.err;
}

using round_trip::AfterRoundTrip;
using state_builder::Switch;

class AgentRoad : public Agent {
protected:
    AgentRoad() { dvsconfigstore_debug = 0; } // no traces
    /// Saves the live state with the agent, loads it, and starts a second emulator with the result. The
    /// loaded state and the second emulator's state must be what the rules predict for the live state.
    void Travel() {
        const std::string live = Fetch(DVSHYP_PersistentStateGet).text;
        live_ = Parse(live);
        round_trip::Ledger ledger;
        std::vector<Switch> expected = AfterRoundTrip(live_, kHostLimit, &ledger);
        const Finished saved = RunProgram({kAgent, "save"});
        ASSERT_EQ(saved.status, 0) << saved.out << saved.err;

        void *buf = nullptr;
        uint32_t len = 0;
        ASSERT_EQ(DVSState_LoadFromConfigStoreAsBuf(&buf, &len, false), 0);
        ASSERT_NE(buf, nullptr);
        const std::string loaded(static_cast<const char *>(buf), len);
        std::free(buf);
        ExpectSame(expected, Parse(loaded));

        const std::string socket = emulator_.Directory() / "second";
        ASSERT_TRUE(second_.Start(socket));
        setenv("DVS_EMULATOR", socket.c_str(), 1);
        ASSERT_EQ(DVSHYP_StateInit(loaded.data(), static_cast<uint32_t>(loaded.size())), HYP_OK);
        // A state from a switch table has the class in a field of fixed size.
        for (Switch &sw : expected)
            sw.classField = state_builder::Slot(sw.className, 128);
        ExpectSame(expected, Parse(Fetch(DVSHYP_StateGet).text));
    }

    static void ExpectSame(const std::vector<Switch> &expected, const std::vector<Switch> &actual) {
        for (const std::string &line : round_trip::Differences(expected, actual))
            ADD_FAILURE() << line;
    }
    static std::vector<Switch> Parse(const std::string &state) {
        return state_builder::Parse({state.begin(), state.end()});
    }
    static void Init(const std::vector<Switch> &switches) {
        const auto state = state_builder::State(switches);
        ASSERT_EQ(DVSHYP_StateInit(state.data(), static_cast<uint32_t>(state.size())), HYP_OK);
    }

    static constexpr uint32_t kHostLimit = 65536; // the embedded platform's
    std::vector<Switch> live_;

private:
    EmulatorProcess second_;
};

TEST_F(AgentRoad, OfWhatTheAgentSetUp) {
    ASSERT_EQ(RunProgram({kAgent, "setup", kSwitch, "20"}).status, 0);
    ASSERT_EQ(AddPort(kSwitch, "shadow", {}, 2), HYP_OK); // not persistent
    ASSERT_EQ(DVSHYP_GlobalPropSet(kSwitch, "com.orbeno.x.volatile.y", "v", 1, 16), HYP_OK);
    Travel();
    ASSERT_EQ(live_.size(), 1U);
    ASSERT_EQ(live_[0].ports.size(), 20U);
    EXPECT_EQ(live_[0].ports[6].props[0].value, state_builder::Text("port 7 of the example"));
}

TEST_F(AgentRoad, OfTheExampleSite) {
    const Finished copied = RunProgram(
        {DVS_BINARY_DIR "/bin/dvsctl", "copy", "json:" DVS_SOURCE_DIR "/examples/site.json", "kernel:"});
    ASSERT_EQ(copied.status, 0) << copied.err;
    Travel();
    EXPECT_EQ(live_.size(), 2U);
}

TEST_F(AgentRoad, OfRandomSwitchesOfEachClass) {
    value_generator::Generator random(20261121);
    std::vector<Switch> switches;
    for (const char *name :
         {"vswitch", "etherswitch", "cswitch", "ovlvswitch", "stub-vswitch", "acme-switch"})
        switches.push_back(round_trip::RandomSwitch(std::string("of ") + name, name, &random));
    Init(switches);
    Travel();
    EXPECT_EQ(live_.size(), 6U);
}

} // namespace
} // namespace dvs::test
