/* SPDX-License-Identifier: Apache-2.0 */
// The whole road: the example agent against an emulator, its save into a store, the store loaded back, and
// that state in a second emulator.

#include <csignal>
#include <cstdlib>

#include <gtest/gtest.h>
#include <unistd.h>

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

TEST_F(Agent, WithoutAnEmulatorFailsAndSaysSo) {
    emulator_.Process().Stop(SIGTERM);
    const Finished saved = RunProgram({kAgent, "save"});
    EXPECT_EQ(saved.status, 1);
    EXPECT_NE(saved.err.find("failed to open dvsdev device"), std::string::npos) << saved.err;
}

TEST_F(Agent, WhatItSavedComesBackInASecondEmulator) {
    ASSERT_EQ(RunProgram({kAgent, "setup", kSwitch, "20"}).status, 0);
    ASSERT_EQ(AddPort(kSwitch, "shadow", {}, 2), HYP_OK); // not persistent
    ASSERT_EQ(DVSHYP_GlobalPropSet(kSwitch, "com.orbeno.x.volatile.y", "v", 1, 16), HYP_OK);
    const Finished saved = RunProgram({kAgent, "save", kSwitch});
    ASSERT_EQ(saved.status, 0) << saved.out << saved.err;
    const std::string live = Fetch(DVSHYP_PersistentStateGet).text;

    void *buf = nullptr;
    uint32_t len = 0;
    ASSERT_EQ(DVSState_LoadFromConfigStoreAsBuf(&buf, &len, false), 0);
    ASSERT_NE(buf, nullptr);
    EmulatorProcess second;
    const std::string socket = emulator_.Directory() / "second";
    ASSERT_TRUE(second.Start(socket));
    setenv("DVS_EMULATOR", socket.c_str(), 1);
    ASSERT_EQ(DVSHYP_StateInit(buf, len), HYP_OK);
    std::free(buf);

    struct Seen {
        std::vector<std::string> switches, ports;
        std::string className, alias, portAlias;
        uint32_t version, maxPorts;
        bool operator==(const Seen &) const = default;
    };
    const auto look = [](const std::string &state) {
        const LoadedState loaded(state);
        EXPECT_EQ(loaded.status, HYP_OK);
        DVSwitch *sw = DVSState_SwitchFind(kSwitch);
        EXPECT_NE(sw, nullptr);
        if (!sw) return Seen{};
        return Seen{loaded.Switches(),
                    loaded.Ports(kSwitch),
                    DVS_ClassName(sw),
                    DVS_SwitchName(sw),
                    DVS_PortAlias(DVSState_PortFind(kSwitch, "7")),
                    DVS_Version(sw),
                    DVS_GetMaxPorts(sw)};
    };
    const Seen expected = look(live);
    EXPECT_EQ(expected.ports.size(), 20U);
    EXPECT_EQ(expected.portAlias, "port 7 of the example");
    EXPECT_EQ(look(Fetch(DVSHYP_StateGet).text), expected);
}

} // namespace
} // namespace dvs::test
