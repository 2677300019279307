/* SPDX-License-Identifier: Apache-2.0 */
// Runs every command through the library against a real emulator process: its effect on the state and its
// errors.

#include <cstring>
#include <functional>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include "dvs/dvs.h"
#include "emulator/emulator_process.h"
#include "emulator/hyp_support.h"

namespace dvs::test {
namespace {

class EmulatorCommands : public testing::Test {
protected:
    EmulatorCommands() {
        EXPECT_EQ(DVSHYP_SwitchAdd("s1", "vswitch", 0, 110), HYP_OK);
        EXPECT_EQ(AddPort("s1", "p1"), HYP_OK);
    }
    LiveEmulator emulator_;
};

TEST_F(EmulatorCommands, StartsWithoutSwitches) {
    ASSERT_TRUE(emulator_.Restart());
    const Bytes state = Fetch(DVSHYP_StateGet);
    EXPECT_EQ(state.status, HYP_OK);
    EXPECT_EQ(state.text.size(), 16U);
}

TEST_F(EmulatorCommands, PrintsItsSocketInOneLine) {
    EXPECT_EQ(emulator_.Process().ReadyLine(), "dvs-emulator ready on " + emulator_.Socket());
}

TEST_F(EmulatorCommands, StateInitReplacesTheWholeState) {
    const Bytes before = Fetch(DVSHYP_StateGet);
    ASSERT_EQ(DVSHYP_SwitchAdd("s2", "etherswitch", 0, 9), HYP_OK);
    ASSERT_EQ(DVSHYP_StateInit(before.text.data(), before.Size()), HYP_OK);
    EXPECT_EQ(Fetch(DVSHYP_StateGet).text, before.text);
}

TEST_F(EmulatorCommands, StateInitRejectsDamageAndKeepsTheState) {
    const Bytes before = Fetch(DVSHYP_StateGet);
    std::string damaged = before.text;
    damaged.back() = 1;
    damaged[damaged.size() / 2] ^= 1;
    EXPECT_EQ(DVSHYP_StateInit(damaged.data(), static_cast<uint32_t>(damaged.size())), HYP_BAD_CHECKSUM);
    EXPECT_EQ(DVSHYP_StateInit(damaged.data(), 10), HYP_BAD_PARAM);
    EXPECT_EQ(Fetch(DVSHYP_StateGet).text, before.text);
}

TEST_F(EmulatorCommands, StateCleanupEmptiesIt) {
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    EXPECT_EQ(Fetch(DVSHYP_StateGet).text.size(), 16U);
}

TEST_F(EmulatorCommands, StateSanitizeRemovesZombiesAndCachedPorts) {
    for (const uint32_t kind : {2U, 3U, 3U, 4U})
        ASSERT_EQ(AddPort("s1", "k" + std::to_string(kind), {}, kind), HYP_OK);
    EXPECT_EQ(DVSHYP_StateSanitize(), HYP_OK);
    const std::string listing = Exec("ports s1").text;
    EXPECT_NE(listing.find("\"p1\" kind active"), std::string::npos) << listing;
    EXPECT_NE(listing.find("\"k2\" kind shadow"), std::string::npos) << listing;
    EXPECT_EQ(listing.find("zombie"), std::string::npos) << listing;
    EXPECT_EQ(listing.find("local-cache"), std::string::npos) << listing;
}

TEST_F(EmulatorCommands, SwitchAddAndRemoveFailLikeTheTable) {
    EXPECT_EQ(DVSHYP_SwitchAdd("s1", "vswitch", 0, 110), HYP_EXISTS);
    EXPECT_EQ(DVSHYP_SwitchAdd("big", "custom", 70000, 110), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(DVSHYP_SwitchRemove("s2"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_SwitchRemove("s1"), HYP_OK);
    EXPECT_EQ(DVSHYP_PortFind("s1", "p1"), HYP_NOT_FOUND);
}

TEST_F(EmulatorCommands, AssociationShowsInStats) {
    EXPECT_EQ(DVSHYP_SwitchAssociate("none"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_SwitchDissociate("none"), HYP_NOT_FOUND);
    EXPECT_NE(Exec("stats").text.find("ports 1 dissociated\n"), std::string::npos);
    EXPECT_EQ(DVSHYP_SwitchAssociate("s1"), HYP_OK);
    EXPECT_NE(Exec("stats").text.find("ports 1 associated\n"), std::string::npos);
    EXPECT_EQ(DVSHYP_SwitchDissociate("s1"), HYP_OK);
    EXPECT_NE(Exec("stats").text.find("ports 1 dissociated\n"), std::string::npos);
}

TEST_F(EmulatorCommands, GlobalAndHostPropertiesAreSeparate) {
    EXPECT_EQ(DVSHYP_GlobalPropSet("s1", "n", "global", 6, 16), HYP_OK);
    EXPECT_EQ(DVSHYP_HostPropSet("s1", "n", "host", 4, 16), HYP_OK);
    EXPECT_EQ(Fetch(DVSHYP_GlobalPropGet, "s1", "n").text, "global");
    EXPECT_EQ(Fetch(DVSHYP_HostPropGet, "s1", "n").text, "host");
    EXPECT_EQ(Fetch(DVSHYP_SmartNICGlobalPropGet, "s1", "n").text, "global");
    EXPECT_EQ(Fetch(DVSHYP_SmartNICHostPropGet, "s1", "n").text, "host");
    EXPECT_EQ(DVSHYP_GlobalPropClear("s1", "n"), HYP_OK);
    EXPECT_EQ(DVSHYP_GlobalPropClear("s1", "n"), HYP_NOT_FOUND);
    EXPECT_EQ(Fetch(DVSHYP_GlobalPropGet, "s1", "n").status, HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_HostPropClear("s1", "n"), HYP_OK);
    EXPECT_EQ(Fetch(DVSHYP_HostPropGet, "s1", "n").status, HYP_NOT_FOUND);
}

TEST_F(EmulatorCommands, PropertyCommandsRejectUnknownSwitchesAndEmptyValues) {
    EXPECT_EQ(DVSHYP_GlobalPropSet("none", "n", "v", 1, 16), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_HostPropSet("none", "n", "v", 1, 16), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_HostPropClear("none", "n"), HYP_NOT_FOUND);
    EXPECT_EQ(Fetch(DVSHYP_HostPropGet, "none", "n").status, HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_GlobalPropSet("s1", "n", "v", 0, 16), HYP_FAILURE);
    EXPECT_EQ(DVSHYP_GlobalPropSet("s1", "n", nullptr, 0, 16), HYP_FAILURE);
}

TEST_F(EmulatorCommands, TheVersionReadsAsAGlobalProperty) {
    EXPECT_EQ(FetchWord(DVSHYP_GlobalPropGet, "s1", "com.orbeno.common.version"), 110U);
    EXPECT_EQ(DVSHYP_SwitchSetVersion("s1", 7), HYP_OK);
    EXPECT_EQ(FetchWord(DVSHYP_GlobalPropGet, "s1", "com.orbeno.common.version"), 7U);
    const uint32_t version = 106;
    EXPECT_EQ(DVSHYP_GlobalPropSet("s1", "com.orbeno.common.version", &version, 4, 16), HYP_OK);
    EXPECT_EQ(FetchWord(DVSHYP_GlobalPropGet, "s1", "com.orbeno.common.version"), 106U);
    EXPECT_EQ(DVSHYP_SwitchSetVersion("s1", 112), HYP_OK);
    EXPECT_EQ(FetchWord(DVSHYP_GlobalPropGet, "s1", "com.orbeno.common.version"), 112U);
}

TEST_F(EmulatorCommands, SettingTheVersionKeepsItsPropertysType) {
    const uint32_t version = 106;
    ASSERT_EQ(DVSHYP_GlobalPropSet("s1", "com.orbeno.common.version", &version, sizeof version, 16), HYP_OK);
    ASSERT_EQ(DVSHYP_SwitchSetVersion("s1", 112), HYP_OK);
    const Bytes state = Fetch(DVSHYP_StateGet);
    ASSERT_EQ(DVSState_ConfigDeserialize(state.text.data(), state.Size()), HYP_OK);
    DVSDataEntry *entry = nullptr;
    ASSERT_EQ(DVSState_GlobalPropLookup("s1", "com.orbeno.common.version", &entry), HYP_OK);
    EXPECT_EQ(DVSData_PropType(entry), 16U);
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
}

TEST_F(EmulatorCommands, UnsupportedVersionsAreRefused) {
    EXPECT_EQ(DVSHYP_SwitchSetVersion("s1", 13), HYP_NOT_SUPPORTED);
    EXPECT_EQ(DVSHYP_SwitchSetVersion("none", 12), HYP_NOT_FOUND);
}

TEST_F(EmulatorCommands, MaxPortsAreSetAndEnforced) {
    ASSERT_EQ(DVSHYP_SwitchAdd("c1", "custom", 2, 110), HYP_OK);
    ASSERT_EQ(AddPort("c1", "a"), HYP_OK);
    ASSERT_EQ(AddPort("c1", "b"), HYP_OK);
    EXPECT_EQ(AddPort("c1", "c"), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(DVSHYP_SwitchSetMaxPorts("c1", 3), HYP_OK);
    EXPECT_EQ(AddPort("c1", "c"), HYP_OK);
    EXPECT_EQ(DVSHYP_SwitchSetMaxPorts("c1", 2), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(DVSHYP_SwitchSetMaxPorts("c1", 65537), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(DVSHYP_SwitchSetMaxPorts("none", 2), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_SwitchSetMaxPorts("s1", 20), HYP_OK);
    EXPECT_NE(Exec("stats").text.find("max-ports 20 "), std::string::npos);
}

TEST_F(EmulatorCommands, RejectsALimitBelowAUsedSlot) {
    ASSERT_EQ(DVSHYP_SwitchAdd("c1", "custom", 3, 110), HYP_OK);
    for (const char *port : {"a", "b", "c"})
        ASSERT_EQ(AddPort("c1", port), HYP_OK);
    ASSERT_EQ(DVSHYP_PortRemove("c1", "a"), HYP_OK);
    EXPECT_EQ(DVSHYP_SwitchSetMaxPorts("c1", 2), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(DVSHYP_PortFind("c1", "c"), HYP_OK);
}

TEST_F(EmulatorCommands, PortsAreAddedAndRemoved) {
    EXPECT_EQ(DVSHYP_PortFind("s1", "p1"), HYP_OK);
    EXPECT_EQ(DVSHYP_PortFind("s1", "p2"), HYP_NOT_FOUND);
    EXPECT_EQ(AddPort("s1", "p1"), HYP_EXISTS);
    EXPECT_EQ(AddPort("none", "p1"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_PortAdd("s1", "p2", "not a property list", 19), HYP_BAD_PARAM);
    EXPECT_EQ(DVSHYP_PortRemove("s1", "p1"), HYP_OK);
    EXPECT_EQ(DVSHYP_PortRemove("s1", "p1"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_PortFind("s1", "p1"), HYP_NOT_FOUND);
}

TEST_F(EmulatorCommands, PortStateReadsBackAsItWasAdded) {
    const std::string data = PortData({{"a", "one"}, {"b", "two"}});
    ASSERT_EQ(DVSHYP_PortAdd("s1", "p2", data.data(), static_cast<uint32_t>(data.size())), HYP_OK);
    EXPECT_EQ(Fetch(DVSHYP_PortStateGet, "s1", "p2").text, data);
    EXPECT_EQ(Fetch(DVSHYP_PortStateGet, "s1", "none").status, HYP_NOT_FOUND);
}

TEST_F(EmulatorCommands, PortDataIsSetReadAndCleared) {
    EXPECT_EQ(DVSHYP_PortDataSet("s1", "p1", "n", "value", 5, 16), HYP_OK);
    EXPECT_EQ(Fetch(DVSHYP_PortDataGet, "s1", "p1", "n").text, "value");
    EXPECT_EQ(Fetch(DVSHYP_SmartNICPortDataGet, "s1", "p1", "n").text, "value");
    EXPECT_EQ(DVSHYP_PortDataClear("s1", "p1", "n"), HYP_OK);
    EXPECT_EQ(DVSHYP_PortDataClear("s1", "p1", "n"), HYP_NOT_FOUND);
    EXPECT_EQ(Fetch(DVSHYP_PortDataGet, "s1", "p1", "n").status, HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_PortDataSet("s1", "none", "n", "value", 5, 16), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_PortDataClear("s1", "none", "n"), HYP_NOT_FOUND);
    EXPECT_EQ(Fetch(DVSHYP_PortDataGet, "s1", "none", "n").status, HYP_NOT_FOUND);
}

TEST_F(EmulatorCommands, UplinkDataIsKeptPerPortAndUplink) {
    ASSERT_EQ(AddPort("s1", "p2"), HYP_OK);
    EXPECT_EQ(DVSHYP_UplinkDataSet("s1", "p1", 0, "zero", 4, 16), HYP_OK);
    EXPECT_EQ(DVSHYP_UplinkDataSet("s1", "p1", -1, "minus", 5, 16), HYP_OK);
    EXPECT_EQ(DVSHYP_UplinkDataSet("s1", "p2", 0, "other", 5, 16), HYP_OK);
    EXPECT_EQ(FetchUplink("s1", "p1", 0).text, "zero");
    EXPECT_EQ(FetchUplink("s1", "p1", -1).text, "minus");
    EXPECT_EQ(FetchUplink("s1", "p2", 0).text, "other");
    EXPECT_EQ(FetchUplink("s1", "p2", 7).status, HYP_NOT_FOUND);
    EXPECT_EQ(FetchUplink("s1", "none", 0).status, HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_UplinkDataSet("s1", "none", 0, "v", 1, 16), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYP_UplinkDataSet("s1", "p1", 0, "", 0, 16), HYP_FAILURE);
    EXPECT_EQ(DVSHYP_PortRemove("s1", "p1"), HYP_OK);
    ASSERT_EQ(AddPort("s1", "p1"), HYP_OK);
    EXPECT_EQ(FetchUplink("s1", "p1", 0).status, HYP_NOT_FOUND);
}

TEST_F(EmulatorCommands, RemovingASwitchRemovesItsDataOutsideTheState) {
    const Bytes state = Fetch(DVSHYP_StateGet);
    const auto init = [&] { ASSERT_EQ(DVSHYP_StateInit(state.text.data(), state.Size()), HYP_OK); };
    const std::function<void()> renewals[] = {
        init,
        [&] {
            ASSERT_EQ(DVSHYP_StateCleanup(), HYP_OK);
            init();
        },
        [] {
            ASSERT_EQ(DVSHYP_SwitchRemove("s1"), HYP_OK);
            ASSERT_EQ(DVSHYP_SwitchAdd("s1", "vswitch", 0, 110), HYP_OK);
            ASSERT_EQ(AddPort("s1", "p1"), HYP_OK);
        },
    };
    for (const auto &renew : renewals) {
        ASSERT_EQ(DVSHYP_SwitchAssociate("s1"), HYP_OK);
        ASSERT_EQ(DVSHYP_UplinkDataSet("s1", "p1", 0, "v", 1, 16), HYP_OK);
        ASSERT_EQ(Exec("event s1 p1 up").status, HYP_OK);
        renew();
        EXPECT_NE(Exec("stats").text.find("dissociated\n"), std::string::npos);
        EXPECT_EQ(FetchUplink("s1", "p1", 0).status, HYP_NOT_FOUND);
        EXPECT_EQ(Exec("ports s1").text, "port \"p1\" kind active connection 0 link down\n");
    }
}

TEST_F(EmulatorCommands, FailedFetchDoesNotReturnAStaleState) {
    // A state that did not fit is cached for the retry with a larger buffer, until it changes.
    const auto change = [](const char *name) { return DVSHYP_HostPropSet("s1", name, "v", 1, 16); };
    const auto refuse = [] {
        DVSHYPRequest request{};
        char small[4];
        request.data = reinterpret_cast<uintptr_t>(small);
        request.dataLen = sizeof small;
        return DVSHYP_Ioctl(NumberOf(Command::StateGet), &request);
    };
    const auto shows = [](const char *text) {
        return Fetch(DVSHYP_StateGet).text.find(text) != std::string::npos;
    };
    testing::internal::CaptureStderr();
    ASSERT_EQ(refuse(), HYP_LIMIT_EXCEEDED);
    EXPECT_FALSE(shows("changed.by.command"));
    ASSERT_EQ(refuse(), HYP_LIMIT_EXCEEDED);
    ASSERT_EQ(change("changed.by.command"), HYP_OK);
    EXPECT_TRUE(shows("changed.by.command"));
    ASSERT_EQ(refuse(), HYP_LIMIT_EXCEEDED);
    ASSERT_EQ(Exec("event s1 p1 up").status, HYP_OK);
    EXPECT_TRUE(shows("com.orbeno.common.port.connectid"));
    testing::internal::GetCapturedStderr();
}

TEST_F(EmulatorCommands, LargeValuesArriveWhole) {
    std::string value(1 << 20, 'v');
    value[12345] = '\0';
    ASSERT_EQ(DVSHYP_GlobalPropSet("s1", "large", value.data(), static_cast<uint32_t>(value.size()), 16),
              HYP_OK);
    EXPECT_EQ(Fetch(DVSHYP_GlobalPropGet, "s1", "large").text, value);
}

TEST_F(EmulatorCommands, LargestValueIsSixteenMebibytes) {
    const std::string value((16 << 20) + 1, 'v');
    EXPECT_EQ(DVSHYP_GlobalPropSet("s1", "n", value.data(), 16 << 20, 16), HYP_OK);
    EXPECT_EQ(DVSHYP_GlobalPropSet("s1", "n", value.data(), (16 << 20) + 1, 16), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(Fetch(DVSHYP_GlobalPropGet, "s1", "n").text.size(), 16U << 20);
}

TEST_F(EmulatorCommands, UplinkDataCountsTowardsTheStatesLimit) {
    const std::string value(16 << 20, 'v');
    ASSERT_EQ(DVSHYP_UplinkDataSet("s1", "p1", 1, value.data(), 16 << 20, 16), HYP_OK);
    HYP_ReturnStatus status = HYP_OK;
    int set = 0;
    for (; status == HYP_OK && set < 20; set++)
        status = DVSHYP_HostPropSet("s1", ("n" + std::to_string(set)).c_str(), value.data(), 16 << 20, 16);
    EXPECT_EQ(status, HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(set, 15); // one less than without uplink data
}

TEST_F(EmulatorCommands, PortWithTheLargestValuesRoundTrips) {
    const std::string value(16 << 20, 'v');
    const std::string data = PortData({{"a", value}, {"b", value}});
    ASSERT_EQ(DVSHYP_PortAdd("s1", "large", data.data(), static_cast<uint32_t>(data.size())), HYP_OK);
    const Bytes fetched = Fetch(DVSHYP_PortStateGet, "s1", "large");
    EXPECT_TRUE(fetched.text == data);
    EXPECT_EQ(DVSHYP_PortAdd("s1", "again", fetched.text.data(), fetched.Size()), HYP_OK);
    EXPECT_EQ(Fetch(DVSHYP_PortDataGet, "s1", "again", "b").text.size(), value.size());
}

TEST_F(EmulatorCommands, StateSizeIsLimited) {
    const std::string value(16 << 20, 'v');
    HYP_ReturnStatus status = HYP_OK;
    int set = 0;
    for (; status == HYP_OK && set < 20; set++)
        status = DVSHYP_HostPropSet("s1", ("n" + std::to_string(set)).c_str(), value.data(), 16 << 20, 16);
    EXPECT_EQ(status, HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(set, 16); // fifteen more fit, the sixteenth does not
    // Replacing a value takes no more room.
    for (int i = 0; i < 3; i++)
        EXPECT_EQ(DVSHYP_HostPropSet("s1", "n0", "small", 5, 16), HYP_OK);
}

TEST_F(EmulatorCommands, UnknownCommandsAreNotSupported) {
    for (int32_t number = -3; number < 1000; number++) {
        if (device::FindCommand(number)) continue;
        DVSHYPRequest request{};
        EXPECT_EQ(DVSHYP_Ioctl(number, &request), HYP_NOT_SUPPORTED) << number;
    }
}

} // namespace
} // namespace dvs::test
