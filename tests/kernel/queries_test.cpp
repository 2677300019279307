/* SPDX-License-Identifier: Apache-2.0 */
// The property list queries and the list of a switch's ports.

#include <cerrno>
#include <cstring>
#include <functional>

#include <gtest/gtest.h>

#include "kernel/fake_device.h"
#include "kernel/state_support.h"

namespace dvs::test {
namespace {

using Strings = std::vector<std::string>;

std::string Word(uint32_t value) {
    return {reinterpret_cast<const char *>(&value), sizeof value};
}

class Queries : public testing::Test, protected FakeDeviceTest {
protected:
    ~Queries() override { EXPECT_TRUE(TableIsEmpty()); }

    using Query = std::function<HYP_ReturnStatus(DVSData **)>;

    /// The names in the list that a query returns, or its status as the only element.
    Strings Names(const Query &query) {
        DVSData *list = nullptr;
        const HYP_ReturnStatus status = query(&list);
        EXPECT_TRUE(TableIsEmpty());
        if (status != HYP_OK) {
            EXPECT_EQ(list, nullptr);
            return {"status " + std::to_string(status)};
        }
        const Strings names = EntryNames(list);
        DVSData_Free(list);
        return names;
    }
    Strings VendorGlobal(uint32_t type = 32) {
        return Names([&](DVSData **out) { return DVSHYP_VendorGlobalPropList("s", out, type); });
    }
    Strings VendorHost(uint32_t type = 32) {
        return Names([&](DVSData **out) { return DVSHYP_VendorHostPropList("s", out, type); });
    }
    Strings VendorPort(uint32_t type = 32) {
        return Names([&](DVSData **out) { return DVSHYP_VendorPortPropList("s", "p", out, type); });
    }
    Strings Overlay(uint32_t type, bool global) {
        return Names([&](DVSData **out) { return DVSHYP_OvlPropList("s", type, global, out); });
    }
    void ServeVendorNames(uint32_t type = 32) {
        StateBuilder state;
        state.Switch("s");
        for (const char *name : kVendorNames)
            state.Global("s", name, "v", type).Host("s", name, "v", type);
        device.replies[Command::StateGet] = state.Serialize();
    }

    static constexpr const char *kVendorNames[] = {
        "com.orbeno.common.alias",        "x.com.orbeno.common.y",
        "com.orbeno.etherswitch.mtu",     "com.orbeno.common",
        "com.orbeno.vswitch.disabled",    "com.orbeno.vswitch.teaming",
        "com.orbeno.vswitch.other",       "dvfilter-generic-1",
        "com.orbeno.ovlData.x",           "com.orbeno.extraconfig.y",
        "com.orbeno.ovl.vdr.dvptracking", "com.vendor.own",
    };
};

TEST_F(Queries, VendorListsOfASwitchOmitPlatformEntries) {
    ServeVendorNames();
    device.always[Command::GlobalPropGet] = {ENOENT, HYP_NOT_FOUND, -1, {}};
    EXPECT_EQ(VendorGlobal(), (Strings{"com.orbeno.common", "com.orbeno.vswitch.disabled",
                                       "com.orbeno.ovl.vdr.dvptracking", "com.vendor.own"}));
    EXPECT_EQ(VendorHost(),
              (Strings{"com.orbeno.common", "com.orbeno.vswitch.disabled", "com.orbeno.extraconfig.y",
                       "com.orbeno.ovl.vdr.dvptracking", "com.vendor.own"}));
}

TEST_F(Queries, VendorListsQueryTheModulesVersion) {
    ServeVendorNames();
    device.replies[Command::GlobalPropGet] = Word(110);
    (void)VendorGlobal();
    ASSERT_EQ(device.calls.size(), 2U);
    EXPECT_EQ(device.calls[1].request, NumberOf(Command::GlobalPropGet));
    EXPECT_STREQ(device.calls[1].record.data(), "s");
    EXPECT_STREQ(device.calls[1].record.data() + 112, "com.orbeno.common.version");
}

TEST_F(Queries, NamesOmittedAboveVersion106StayAt106) {
    // Two names are omitted above 106. An earlier filter already removes teaming: of the names below
    // "com.orbeno.vswitch.", it keeps only the exact name of the exception.
    StateBuilder state;
    state.Switch("s");
    for (const char *name :
         {"com.orbeno.vswitch.teaming", "x.com.orbeno.ovl.vdr.dvptracking.y", "com.vendor.own"})
        state.Global("s", name, "v", 32).Host("s", name, "v", 32);
    device.replies[Command::StateGet] = state.Serialize();
    for (const uint32_t version : {0u, 106u}) {
        device.replies[Command::GlobalPropGet] = Word(version);
        EXPECT_EQ(VendorGlobal(), (Strings{"x.com.orbeno.ovl.vdr.dvptracking.y", "com.vendor.own"}));
        EXPECT_EQ(VendorHost(), (Strings{"x.com.orbeno.ovl.vdr.dvptracking.y", "com.vendor.own"}));
    }
    for (const uint32_t version : {107u, 0xffffffffu}) {
        device.replies[Command::GlobalPropGet] = Word(version);
        EXPECT_EQ(VendorGlobal(), Strings{"com.vendor.own"});
        EXPECT_EQ(VendorHost(), Strings{"com.vendor.own"});
    }
}

TEST_F(Queries, ShortVersionReplyIsAFailedQuery) {
    ServeVendorNames();
    for (const std::string &reply : {std::string("\xff\xff\xff", 3), std::string()}) {
        device.replies[Command::GlobalPropGet] = reply;
        EXPECT_EQ(VendorGlobal().size(), 4U);
    }
    device.replies[Command::GlobalPropGet] = Word(200) + "more";
    EXPECT_EQ(VendorGlobal().size(), 3U);
}

TEST_F(Queries, DisabledSurvivesTheVendorFilterOfItsType) {
    StateBuilder state;
    state.Switch("s").Global("s", "com.orbeno.vswitch.disabled", "v", 32);
    state.Global("s", "com.orbeno.vswitch.disabled.more", "v", 32);
    device.replies[Command::StateGet] = state.Serialize();
    EXPECT_EQ(VendorGlobal(32), Strings{"com.orbeno.vswitch.disabled"});
    EXPECT_EQ(VendorGlobal(16), Strings{});
}

TEST_F(Queries, VendorListsOmitEntriesOfOtherTypes) {
    StateBuilder state;
    state.Switch("s").Global("s", "com.vendor.a", "v", 16).Global("s", "com.vendor.b", "v", 32);
    state.Host("s", "com.vendor.a", "v", 16).Host("s", "com.vendor.b", "v", 32);
    device.replies[Command::StateGet] = state.Serialize();
    EXPECT_EQ(VendorGlobal(16), Strings{"com.vendor.a"});
    EXPECT_EQ(VendorGlobal(32), Strings{"com.vendor.b"});
    EXPECT_EQ(VendorHost(16), Strings{"com.vendor.a"});
    EXPECT_EQ(VendorGlobal(64), Strings{});
}

TEST_F(Queries, VendorListOfAPort) {
    const Pairs pairs{{"com.orbeno.common.port.alias", "v"},
                      {"com.orbeno.etherswitch.x", "v"},
                      {"com.orbeno.vswitch.disabled", "v"},
                      {"com.orbeno.port.extraConfig.x", "v"},
                      {"com.orbeno.port.opaque.network.id", "v"},
                      {"dvfilter-generic-1", "v"},
                      {"com.orbeno.net.x", "v"},
                      {"com.vendor.own", "v"}};
    device.replies[Command::PortStateGet] = PortData(pairs);
    EXPECT_EQ(VendorPort(16), (Strings{"com.orbeno.net.x", "com.vendor.own"}));
    EXPECT_EQ(VendorPort(32), Strings{});
    EXPECT_EQ(device.calls.at(0).request, NumberOf(Command::PortStateGet));
}

TEST_F(Queries, VendorListOfADefaultTypePortOmitsNetToo) {
    DVSData *list = nullptr;
    ASSERT_EQ(DVSData_Alloc(&list, HeapAlloc, std::free), HYP_OK);
    for (const char *name : {"com.orbeno.net.x", "com.vendor.own"})
        ASSERT_EQ(DVSData_Append(list, name, "v", 1, 32), HYP_OK);
    void *data = nullptr;
    uint32_t size = 0;
    ASSERT_EQ(DVSData_Serialize(list, &data, &size, 9), HYP_OK);
    device.replies[Command::PortStateGet].assign(static_cast<const char *>(data), size);
    DVSData_FreeAssocData(list, data);
    DVSData_Free(list);
    EXPECT_EQ(VendorPort(32), Strings{"com.vendor.own"});
}

TEST_F(Queries, ExtraConfigurationOfASwitchIsFromTheGlobalList) {
    StateBuilder state;
    state.Switch("s")
        .Global("s", "com.orbeno.extraconfig.a", "v", 16)
        .Global("s", "com.orbeno.extraconfig.b", "v", 32);
    state.Global("s", "other", "v", 16).Host("s", "com.orbeno.extraconfig.c", "v", 16);
    device.replies[Command::StateGet] = state.Serialize();
    EXPECT_EQ(Names([](DVSData **out) { return DVSHYP_ExtraConfigPropList("s", out, 16); }),
              Strings{"com.orbeno.extraconfig.a"});
}

TEST_F(Queries, ExtraConfigurationOfAPort) {
    device.replies[Command::PortStateGet] =
        PortData({{"com.orbeno.port.extraConfig.a", "v"}, {"com.orbeno.port.alias", "v"}});
    EXPECT_EQ(Names([](DVSData **out) { return DVSHYP_ExtraConfigPortPropList("s", "p", out, 16); }),
              Strings{"com.orbeno.port.extraConfig.a"});
    EXPECT_EQ(Names([](DVSData **out) { return DVSHYP_ExtraConfigPortPropList("s", "p", out, 32); }),
              Strings{});
}

TEST_F(Queries, OverlayNamesBeginWithAPrefixOfTheTable) {
    for (const char *name :
         {"com.orbeno.ovlData.x", "com.orbeno.vswitch.teaming", "com.orbeno.vswitch.teamingpolicy",
          "com.orbeno.ovl.x", "com.orbeno.common.opaqueDvs.x", "com.orbeno.host.feature.containers",
          "com.orbeno.extraconfig.opaqueDvs.x", "com.orbeno.vswitch.disabled", "com.orbeno.net.portset.fc.x",
          "com.orbeno.extraConfig.sddcaas.x"})
        EXPECT_TRUE(IsOvlProp(name)) << name;
    for (const char *name : {"", "com.orbeno.ovl", "com.orbeno.ovlData", "com.orbeno.vswitch.team",
                             "x.com.orbeno.ovl.", "com.orbeno.extraconfig.sddcaas.x", "COM.ORBENO.OVL.X"})
        EXPECT_FALSE(IsOvlProp(name)) << name;
}

TEST_F(Queries, PortsetEntriesOfAnyTypeAreInTheOverlayListOfType16) {
    StateBuilder state;
    state.Switch("s")
        .Global("s", "com.orbeno.net.portset.fc.x", "v", 32)
        .Global("s", "com.orbeno.ovl.a", "v", 32);
    state.Global("s", "com.orbeno.ovl.b", "v", 16).Global("s", "com.orbeno.net.portset.fc.y", "v", 16);
    state.Global("s", "com.vendor.own", "v", 16).Host("s", "com.orbeno.ovl.host", "v", 16);
    device.replies[Command::StateGet] = state.Serialize();
    EXPECT_EQ(Overlay(16, true),
              (Strings{"com.orbeno.net.portset.fc.x", "com.orbeno.ovl.b", "com.orbeno.net.portset.fc.y"}));
    EXPECT_EQ(Overlay(32, true), (Strings{"com.orbeno.net.portset.fc.x", "com.orbeno.ovl.a"}));
    EXPECT_EQ(Overlay(16, false), Strings{"com.orbeno.ovl.host"});
    EXPECT_EQ(Overlay(64, true), Strings{});
}

TEST_F(Queries, ReturnsAnEmptyListForASwitchWithoutOne) {
    StateBuilder state;
    state.Switch("s");
    DVSwitch *sw = DVSState_SwitchFind("s");
    DVSData_Free(sw->globalPropList);
    DVSData_Free(sw->hostPropList);
    sw->globalPropList = sw->hostPropList = nullptr;
    device.replies[Command::StateGet] = state.Serialize();
    EXPECT_EQ(VendorGlobal(), Strings{});
    EXPECT_EQ(VendorHost(), Strings{});
    EXPECT_EQ(Overlay(16, true), Strings{});
    EXPECT_EQ(Names([](DVSData **out) { return DVSHYP_ExtraConfigPropList("s", out, 16); }), Strings{});
}

class PortLists : public Queries {
protected:
    struct Freed {
        void operator()(DVSHYPPortList *list) const { DVSHYP_DataFree(list); }
    };
    using PortList = std::unique_ptr<DVSHYPPortList, Freed>;
    PortList Ports(uint32_t type, const char *sw = "s", HYP_ReturnStatus expected = HYP_OK) {
        DVSHYPPortList *list = nullptr;
        EXPECT_EQ(DVSHYP_SwitchPortList(sw, &list, type), expected);
        EXPECT_TRUE(TableIsEmpty());
        return PortList(list);
    }
};

TEST_F(PortLists, ReturnCountZeroForASwitchWithoutPorts) {
    device.replies[Command::StateGet] = StateBuilder().Switch("s").Serialize();
    const PortList list = Ports(1);
    EXPECT_EQ(list->numEntries, 0U);
    EXPECT_EQ(list->portType, 1U);
    EXPECT_EQ(std::memcmp(list.get(), "\0\0\0\0\1\0\0\0", 8), 0);
}

TEST_F(PortLists, PortsOfTheTypeInSlotOrderWithTheirConnectionIds) {
    constexpr const char *kId = "com.orbeno.common.port.connectid";
    StateBuilder state;
    state.Switch("s").Port("s", "p1", {{kId, Word(11)}}).Port("s", "shadow", {{kId, Word(12)}}, 2);
    state.Port("s", std::string(47, 'p'), {{kId, Word(13) + "more"}}).Port("s", "short", {{kId, "abc"}});
    state.Port("s", "none").Port("s", "empty", {{kId, ""}});
    device.replies[Command::StateGet] = state.Serialize();
    const PortList list = Ports(1);
    ASSERT_EQ(list->numEntries, 5U);
    const std::pair<std::string, uint32_t> expected[] = {
        {"p1", 11}, {std::string(47, 'p'), 13}, {"short", 0}, {"none", 0}, {"empty", 0}};
    for (uint32_t i = 0; i < list->numEntries; i++) {
        EXPECT_EQ(list->entries[i].portId, expected[i].first);
        EXPECT_EQ(list->entries[i].connectionId, expected[i].second);
    }
    EXPECT_EQ(Ports(2)->numEntries, 1U);
    EXPECT_EQ(Ports(3)->numEntries, 0U);
    EXPECT_EQ(Ports(77)->portType, 77U);
}

TEST_F(PortLists, ReturnNotFoundForAnUnknownSwitch) {
    device.replies[Command::StateGet] = StateBuilder().Switch("s").Serialize();
    EXPECT_EQ(Ports(1, "t", HYP_NOT_FOUND), nullptr);
}

TEST_F(Queries, UnknownSwitchesAndFailuresReturnNoData) {
    const Query queries[] = {
        [](DVSData **out) { return DVSHYP_VendorGlobalPropList("t", out, 16); },
        [](DVSData **out) { return DVSHYP_VendorHostPropList("t", out, 16); },
        [](DVSData **out) { return DVSHYP_ExtraConfigPropList("t", out, 16); },
        [](DVSData **out) { return DVSHYP_OvlPropList("t", 16, true, out); },
        [](DVSData **out) { return DVSHYP_VendorPortPropList("t", "p", out, 16); },
        [](DVSData **out) { return DVSHYP_ExtraConfigPortPropList("t", "p", out, 16); },
    };
    device.replies[Command::StateGet] = StateBuilder().Switch("s").Serialize();
    device.always[Command::PortStateGet] = {ENOENT, HYP_NOT_FOUND, -1, {}};
    for (const Query &query : queries)
        EXPECT_EQ(Names(query), Strings{"status " + std::to_string(HYP_NOT_FOUND)});
    device.replies[Command::StateGet] = device.replies[Command::PortStateGet] = std::string(64, '\x7f');
    for (const Query &query : queries)
        EXPECT_EQ(Names(query), Strings{"status " + std::to_string(HYP_BAD_PARAM)});
}

} // namespace
} // namespace dvs::test
