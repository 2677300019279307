/* SPDX-License-Identifier: Apache-2.0 */
// The persistent state: which parts of the module's live state are kept, with and without a state file.

#include <cerrno>
#include <cstring>
#include <thread>

#include <gtest/gtest.h>

#include "emulator/emulator_process.h"
#include "kernel/fake_device.h"
#include "kernel/state_support.h"

namespace dvs::test {
namespace {

using Strings = std::vector<std::string>;

constexpr const char *kNoPersist = "com.orbeno.common.volatile.nopersist";
constexpr const char *kOpaque = "com.orbeno.common.portset.opaque";
constexpr const char *kPersist = "com.orbeno.common.port.volatile.persist";

class Retrieval : public testing::Test, protected FakeDeviceTest {
protected:
    ~Retrieval() override { EXPECT_TRUE(TableIsEmpty()); }

    /// The persistent state of the state that the module serves.
    std::string Persist(const char *stateFile = nullptr, HYP_ReturnStatus expected = HYP_OK) {
        void *out = nullptr;
        uint32_t outLen = 0;
        EXPECT_EQ(DVSHYP_PersistentStateGetWithFile(&out, &outLen, stateFile), expected);
        EXPECT_TRUE(TableIsEmpty());
        if (!out) return {};
        std::string state(static_cast<const char *>(out), outLen);
        DVSHYP_DataFree(out);
        return state;
    }

    Strings OpaquePorts(const std::string &flag) {
        StateBuilder state;
        state.Switch("s").Host("s", kOpaque, flag);
        for (const char *id :
             {"1000", "01000", "999", "01000x", "", "0", "000999", "2147483648000", "x1000", "+1000"})
            state.Port("s", id);
        device.replies[Command::StateGet] = state.Serialize();
        const LoadedState kept(Persist());
        return kept.Ports("s");
    }

    TempDir directory_;
};

TEST_F(Retrieval, DynamicPortsOfAnOpaquePortSetAreDropped) {
    EXPECT_EQ(OpaquePorts("true"), (Strings{"999", "01000x", "", "0", "000999", "x1000", "+1000"}));
}

TEST_F(Retrieval, OnlyFourBytesOfTheOpaqueFlagAreCompared) {
    EXPECT_EQ(OpaquePorts("trueish").size(), 7U);
    EXPECT_EQ(OpaquePorts(std::string("true\0", 5)).size(), 7U);
    EXPECT_EQ(OpaquePorts("tru").size(), 10U);
    EXPECT_EQ(OpaquePorts("false").size(), 10U);
    EXPECT_EQ(OpaquePorts("True").size(), 10U);
}

TEST_F(Retrieval, OnlyActivePortsArePersistent) {
    StateBuilder state;
    state.Switch("s").Port("s", "active").Port("s", "shadow", {}, 2).Port("s", "zombie", {}, 3);
    state.Port("s", "cache", {}, 4).Port("s", "same", {}, 3).Port("s", "same", {}, 3).Port("s", "same");
    device.replies[Command::StateGet] = state.Serialize();
    const LoadedState kept(Persist());
    EXPECT_EQ(kept.Ports("s"), (Strings{"active", "same"}));
}

TEST_F(Retrieval, OmitsMarkedPortsAndVolatileEntriesOfOthers) {
    StateBuilder state;
    state.Switch("s").Port("s", "marked", {{kPersist, "x"}});
    state.Port("s", "kept", {{"a", "1"}, {"com.orbeno.port.volatile.b", "2"}, {"c.volatile", "3"}});
    device.replies[Command::StateGet] = state.Serialize();
    const LoadedState kept(Persist());
    EXPECT_EQ(kept.Ports("s"), Strings{"kept"});
    EXPECT_EQ(kept.PortDataNames("s", "kept"), (Strings{"a", "c.volatile"}));
}

TEST_F(Retrieval, VolatilePropertiesOfSwitchesAreRemoved) {
    StateBuilder state;
    state.Switch("s").Global("s", "a.volatile.b", "1").Global("s", "a", "2");
    state.Host("s", "h", "3").Host("s", "h.volatile.i", "4");
    device.replies[Command::StateGet] = state.Serialize();
    const LoadedState kept(Persist());
    EXPECT_EQ(kept.GlobalNames("s"), Strings{"a"});
    EXPECT_EQ(kept.HostNames("s"), Strings{"h"});
}

TEST_F(Retrieval, WithoutAFileUnpersistedSwitchesAreAbsent) {
    StateBuilder state;
    state.Switch("s1").Switch("s2").Switch("s3").Switch("s4");
    state.Global("s2", kNoPersist, std::string(1, '\1')).Global("s3", kNoPersist, std::string(4, '\0'));
    state.Global("s4", kNoPersist, "");
    device.replies[Command::StateGet] = state.Serialize();
    const LoadedState kept(Persist());
    EXPECT_EQ(kept.Switches(), (Strings{"s1", "s3", "s4"}));
}

TEST_F(Retrieval, PersistentStateGetIsTheSameWithoutAFile) {
    device.replies[Command::StateGet] = StateBuilder().Switch("s1").Port("s1", "p", {{"a", "1"}}).Serialize();
    EXPECT_EQ(Fetch(DVSHYP_PersistentStateGet).text, Persist());
}

class RetrievalWithFile : public Retrieval {
protected:
    std::string File(const std::string &contents) {
        const std::string path = directory_ / "state";
        EXPECT_EQ(DVSFile_Write(path.c_str(), contents.data(), static_cast<uint32_t>(contents.size())),
                  HYP_OK);
        return path;
    }
    void ServeUnpersisted() {
        StateBuilder state;
        state.Switch("live1").Global("live1", "from", "module").Switch("tmp");
        state.Global("tmp", "from", "module").Global("tmp", kNoPersist, std::string(1, '\1')).Switch("live2");
        device.replies[Command::StateGet] = state.Serialize();
    }
};

TEST_F(RetrievalWithFile, UnpersistedSwitchesComeFromTheFile) {
    StateBuilder file;
    file.Switch("other").Switch("tmp").Global("tmp", "from", "file").Global("tmp", "x.volatile.y", "1");
    const std::string path = File(file.Switch("live1").Global("live1", "from", "file").Serialize());
    ServeUnpersisted();
    const LoadedState kept(Persist(path.c_str()));
    EXPECT_EQ(kept.Switches(), (Strings{"live1", "tmp", "live2"}));
    EXPECT_EQ(Entries(DVSState_SwitchFind("tmp")->globalPropList),
              (std::vector<Entry>{{"from", "file", 16}}));
    EXPECT_EQ(Entries(DVSState_SwitchFind("live1")->globalPropList),
              (std::vector<Entry>{{"from", "module", 16}}));
}

TEST_F(RetrievalWithFile, SwitchMissingFromTheFileIsAbsent) {
    const std::string path = File(StateBuilder().Switch("other").Serialize());
    ServeUnpersisted();
    const LoadedState kept(Persist(path.c_str()));
    EXPECT_EQ(kept.Switches(), (Strings{"live1", "live2"}));
}

TEST_F(RetrievalWithFile, WithoutUnpersistedSwitchesTheFileIsNotRead) {
    device.replies[Command::StateGet] = StateBuilder().Switch("s").Serialize();
    const LoadedState kept(Persist((directory_ / "absent").c_str()));
    EXPECT_EQ(kept.Switches(), Strings{"s"});
}

TEST_F(RetrievalWithFile, UnreadableFileFailsWithItsStatus) {
    ServeUnpersisted();
    EXPECT_EQ(Persist((directory_ / "absent").c_str(), HYP_NOT_FOUND), "");
    EXPECT_TRUE(log.lines.empty() || log.lines[0].find("ConfigDeserialize") == std::string::npos);
}

TEST_F(Retrieval, FailuresOfFetchAndLoadKeepTheOutputs) {
    for (int round = 0; round < 2; round++) {
        int marker = 0;
        void *out = &marker;
        uint32_t outLen = 77;
        if (round == 0)
            device.always[Command::StateGet] = {EPERM, 0x0bad0042, -1, {}};
        else
            device.replies[Command::StateGet] = std::string(40, '\1');
        EXPECT_NE(DVSHYP_PersistentStateGet(&out, &outLen), HYP_OK);
        EXPECT_EQ(out, &marker);
        EXPECT_EQ(outLen, 77U);
        EXPECT_NE(DVSHYP_PersistentPortStateGet("s", "p", 9, &out, &outLen), HYP_OK);
        EXPECT_EQ(out, &marker);
        EXPECT_EQ(outLen, 77U);
    }
}

TEST_F(Retrieval, CallersBufferIsFilledOrRejected) {
    device.replies[Command::StateGet] = StateBuilder().Switch("s").Serialize();
    const std::string expected = Persist();
    std::string buffer(expected.size(), 'x');
    void *out = buffer.data();
    auto outLen = static_cast<uint32_t>(buffer.size());
    EXPECT_EQ(DVSHYP_PersistentStateGet(&out, &outLen), HYP_OK);
    EXPECT_EQ(out, buffer.data());
    EXPECT_EQ(buffer, expected);
    outLen = static_cast<uint32_t>(buffer.size()) - 1;
    EXPECT_EQ(DVSHYP_PersistentStateGet(&out, &outLen), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(out, buffer.data());
    EXPECT_EQ(outLen, expected.size() - 1);
}

TEST_F(Retrieval, SwitchThatFailsToLoadLeavesTheTableEmpty) {
    StateBuilder state;
    state.Switch("s1").Switch("s2").Port("s2", "p");
    std::string serialized = state.Serialize();
    // Without its version the second switch fails, after the first one was added.
    serialized.replace(serialized.find("switchVersion", serialized.find("s2")), 6, "SWITCH");
    uint32_t sum = 0;
    for (std::size_t at = 32; at + 4 <= serialized.size(); at += 4) {
        uint32_t word = 0;
        std::memcpy(&word, serialized.data() + at, 4);
        sum += word;
    }
    std::memcpy(serialized.data() + 4, &sum, 4);
    device.replies[Command::StateGet] = serialized;
    void *out = nullptr;
    uint32_t outLen = 0;
    EXPECT_NE(DVSHYP_PersistentStateGet(&out, &outLen), HYP_OK);
    EXPECT_EQ(out, nullptr);
}

TEST_F(Retrieval, PersistentPortStateOmitsVolatileEntriesOnly) {
    device.replies[Command::PortStateGet] = PortData({{"a", "1"}, {"b.volatile.c", "2"}, {kPersist, "3"}});
    EXPECT_EQ(Fetch(DVSHYP_PersistentPortStateGet, "s", "p", uint32_t{9}).text, PortData({{"a", "1"}}));
    EXPECT_EQ(device.calls.at(0).request, NumberOf(Command::PortStateGet));
    device.replies[Command::PortStateGet] = "no list, but long enough for a header";
    EXPECT_EQ(Fetch(DVSHYP_PersistentPortStateGet, "s", "p", uint32_t{9}).status, HYP_BAD_PARAM);
}

TEST_F(Retrieval, ReleasesTheLock) {
    device.replies[Command::StateGet] = StateBuilder().Switch("s").Serialize();
    (void)Persist();
    device.replies[Command::StateGet] = "damaged state of more than sixteen bytes";
    (void)Persist(nullptr, HYP_BAD_PARAM);
    std::thread([] { DVSwitchHYPUnlock(DVSwitchHYPLock()); }).join();
}

} // namespace
} // namespace dvs::test
