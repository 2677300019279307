/* SPDX-License-Identifier: Apache-2.0 */
// Converters of single values in both directions, byte for byte, for each class of switch.

#include "configstore/frame_fixture.h"

using namespace state_builder;

namespace {

constexpr uint32_t kGlobal = DVS_PROP_CLASS_GLOBAL;
constexpr uint32_t kHost = DVS_PROP_CLASS_HOST;
constexpr uint32_t kPort = DVS_PROP_CLASS_PORT;

// Saved value, its line in the store, and the loaded value; empty for no property.
struct Case {
    const char *key;
    uint32_t propClass;
    Bytes saved;
    const char *stored;
    Bytes loaded;
};

struct Scalars : FrameTest, testing::WithParamInterface<uint32_t> {
    Scalars() { dvsSwitchClass = GetParam(); }
    void RoundTrip(const Case &row) {
        SCOPED_TRACE(row.key);
        ASSERT_EQ(0, Save(row.key, row.saved, row.propClass));
        EXPECT_NE(std::string::npos, Content().find(row.stored)) << Content();
        if (row.propClass == kGlobal) MakeSwitch();
        const Props props = Load(row.propClass);
        ASSERT_EQ(0, status) << messages;
        if (row.loaded.empty()) {
            EXPECT_FALSE(Has(props, row.key));
        } else {
            EXPECT_EQ(row.loaded, Find(props, row.key).value);
            EXPECT_EQ(0x10u, Find(props, row.key).type);
        }
    }
};

INSTANTIATE_TEST_SUITE_P(EveryClass, Scalars, testing::Values(0u, 1u, 2u));

TEST_P(Scalars, UnsignedNumber) {
    RoundTrip({"com.orbeno.common.resv.threshold", kGlobal, U32(0xfffffffe),
               "/resource_management/pnic_capacity_ratio_for_reservation = 4294967294\n", U32(0xfffffffe)});
    RoundTrip({"com.orbeno.common.port.connectid", kPort, U32(7) + Raw("rest"), "/connection_cookie = 7\n",
               U32(7)});
    RoundTrip({"com.orbeno.vswitch.port.priority", kPort, U32(3), "/settings/vlan/priority = 3\n", U32(3)});
}

TEST_P(Scalars, Text) {
    RoundTrip({"com.orbeno.common.alias", kGlobal, Text("a name"), "/name = \"a name\"\n", Text("a name")});
    RoundTrip({"com.orbeno.common.port.alias", kPort, Text(""), "/name = \"\"\n", Text("")});
    RoundTrip(
        {"com.orbeno.common.port.portgroupid", kPort, Text("pg"), "/port_group_key = \"pg\"\n", Text("pg")});
    RoundTrip({"com.orbeno.common.port.backingType", kPort, Text("nsx"), "/settings/backing_type = \"nsx\"\n",
               Text("nsx")});
    RoundTrip({"com.orbeno.common.respools.version", kGlobal, Text("v3"),
               "/resource_management/network_resource_control_version = \"v3\"\n", Text("v3")});
    RoundTrip(
        {"com.orbeno.common.host.portset", kHost, Text("ps0"), "/portset_name = \"ps0\"\n", Text("ps0")});
}

TEST_P(Scalars, TextEndsAtItsNulOrWithItsValue) {
    RoundTrip(
        {"com.orbeno.common.alias", kGlobal, Text("cut") + Raw("here"), "/name = \"cut\"\n", Text("cut")});
    RoundTrip({"com.orbeno.common.alias", kGlobal, Raw("no end"), "/name = \"no end\"\n", Text("no end")});
    RoundTrip({"com.orbeno.common.alias", kGlobal, {}, "/name = \"\"\n", Text("")});
    const std::string longer(500, 'x');
    RoundTrip({"com.orbeno.common.alias", kGlobal, Raw(longer), longer.c_str(), Text(longer)});
}

TEST_P(Scalars, BooleanByte) {
    RoundTrip(
        {"com.orbeno.common.respools.sched", kGlobal, {1}, "/resource_management/enable = true\n", {1}});
    RoundTrip(
        {"com.orbeno.common.respools.sched", kGlobal, {0}, "/resource_management/enable = false\n", {0}});
    RoundTrip(
        {"com.orbeno.common.respools.sched", kGlobal, {9, 9}, "/resource_management/enable = true\n", {1}});
}

TEST_P(Scalars, TrueTextLoadsWithSixBytesAndFalseWithFive) {
    const Bytes trueBytes = {'t', 'r', 'u', 'e', 0, 'f'};
    RoundTrip({"com.orbeno.common.opaqueDvs", kGlobal, Text("true"), "/is_opaque = true\n", trueBytes});
    RoundTrip({"com.orbeno.common.opaqueDvs", kGlobal, Text("false"), "/is_opaque = false\n", Raw("false")});
    RoundTrip({"com.orbeno.common.port.block", kPort, Text("true"), "/settings/blocked = true\n", trueBytes});
    RoundTrip(
        {"com.orbeno.common.port.block", kPort, Text("no"), "/settings/blocked = false\n", Raw("false")});
}

TEST_P(Scalars, OnlyTheExactTrueTextIsTrue) {
    for (const auto &value : {Raw("true"), Text("True"), Text("truex"), Raw("tru"), Bytes{}, Text("1")})
        RoundTrip({"com.orbeno.common.opaqueDvs", kGlobal, value, "/is_opaque = false\n", Raw("false")});
    RoundTrip({"com.orbeno.common.opaqueDvs", kGlobal, Text("true") + Raw("x"), "/is_opaque = true\n",
               Text("true") + Raw("f")});
}

TEST_P(Scalars, OverlayFlagLoadsWithFiveBytesEitherWay) {
    RoundTrip(
        {"com.orbeno.common.portset.ovl", kGlobal, Text("true"), "/ovl_enabled = true\n", Text("true")});
    RoundTrip({"com.orbeno.common.portset.ovl", kGlobal, Text("x"), "/ovl_enabled = false\n", Raw("false")});
}

TEST_P(Scalars, OnlyTwoAllowsPassthrough) {
    const char *key = "com.orbeno.common.port.ptAllowed";
    RoundTrip({key, kPort, U32(2), "/settings/vm_direct_path_gen2_allowed = true\n", U32(2)});
    RoundTrip({key, kPort, U32(0), "/settings/vm_direct_path_gen2_allowed = false\n", U32(0)});
    RoundTrip({key, kPort, U32(1), "/settings/vm_direct_path_gen2_allowed = false\n", U32(0)});
}

TEST_P(Scalars, PortIpfixSavedAsFalseReadsBackAsNoProperty) {
    const char *key = "com.orbeno.etherswitch.port.ipfix";
    RoundTrip({key, kPort, Text("enabled"), "/settings/ipfix_enabled = true\n", Text("enabled")});
    RoundTrip({key, kPort, Text("disabled"), "/settings/ipfix_enabled = false\n", {}});
    RoundTrip({key, kPort, Raw("enabled"), "/settings/ipfix_enabled = false\n", {}});
}

TEST_P(Scalars, MtuLoadsUnderTheKeysOfItsClass) {
    ASSERT_EQ(0, Save("com.orbeno.common.portset.mtu", U32(1500)));
    ASSERT_EQ(0, Save("com.orbeno.vswitch.mtu", U32(1600)));
    ASSERT_EQ(0, Save("com.orbeno.etherswitch.mtu", U32(9000)));
    EXPECT_EQ(" {}\n/settings {}\n/settings/max_mtu = 9000\n", Content()) << "the last value wins";
    MakeSwitch();
    const Props props = Load();
    EXPECT_EQ(U32(9000), Find(props, "com.orbeno.common.portset.mtu").value);
    EXPECT_EQ(GetParam() == 1, Has(props, "com.orbeno.vswitch.mtu"));
    EXPECT_EQ(GetParam() == 0, Has(props, "com.orbeno.etherswitch.mtu"));
}

TEST_P(Scalars, MulticastFilterLoadsUnderOneFamilysKey) {
    ASSERT_EQ(0, Save("com.orbeno.vswitch.multicastFilter", Text("legacy")));
    MakeSwitch();
    const Props props = Load();
    EXPECT_EQ(GetParam() != 0, Has(props, "com.orbeno.vswitch.multicastFilter"));
    EXPECT_EQ(GetParam() == 0, Has(props, "com.orbeno.etherswitch.multicastFilter"));
}

struct ScalarFaults : FrameTest {};

TEST_F(ScalarFaults, RejectValuesShorterThanTheirField) {
    const std::pair<const char *, uint32_t> keys[] = {{"com.orbeno.common.resv.threshold", kGlobal},
                                                      {"com.orbeno.common.portset.mtu", kGlobal},
                                                      {"com.orbeno.etherswitch.beaconTimeout", kGlobal},
                                                      {"com.orbeno.etherswitch.ipv4addr", kGlobal},
                                                      {"com.orbeno.common.version", kGlobal},
                                                      {"com.orbeno.common.port.ptAllowed", kPort}};
    for (const auto &[key, propClass] : keys) {
        for (std::size_t size = 0; size < 4; ++size)
            EXPECT_EQ(-1, Save(key, Bytes(size, 1), propClass)) << key << " " << size;
    }
    EXPECT_EQ(-1, Save("com.orbeno.common.respools.sched", {}));
    EXPECT_EQ(std::string::npos, Content().find('=')) << "nothing may be written: " << Content();
}

TEST_F(ScalarFaults, AbsentFieldsLoadNoProperty) {
    EXPECT_EQ(Props{}, Load(kGlobal));
    EXPECT_EQ(Props{}, Load(kHost));
    EXPECT_EQ(Props{}, Load(kPort));
    EXPECT_EQ("", errors);
}

TEST_F(ScalarFaults, FieldsOfAnotherTypeFailTheLoad) {
    // A list is not a valid value of any scalar.
    for (const char *path : {"name", "is_opaque", "switch_address", "ovl_enabled"}) {
        ASSERT_EQ(0, configstore::SetValueEmptyList(object, path));
        (void)Load();
        EXPECT_EQ(4, status) << path;
        ASSERT_EQ(0, configstore::RemoveValue(object, path));
    }
    configstore::Object *settings = Sub(object, "settings");
    for (const char *path : {"blocked", "vm_direct_path_gen2_allowed", "ipfix_enabled"}) {
        ASSERT_EQ(0, configstore::SetValueEmptyList(settings, path));
        (void)Load(kPort);
        EXPECT_EQ(4, status) << path;
        ASSERT_EQ(0, configstore::RemoveValue(settings, path));
    }
    ASSERT_EQ(0, configstore::SetValueStr(object, "connection_cookie", "1"));
    (void)Load(kPort);
    EXPECT_EQ(4, status);
}

} // namespace
