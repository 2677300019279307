/* SPDX-License-Identifier: Apache-2.0 */
// The small policies of a port: transmit uplink, VLAN, shaping, MAC security, LACP, resource pools.

#include "configstore/converters/converter_fixture.h"
#include "configstore/converters/shaping.h"

using namespace converter_test;

namespace {

struct PortPolicy : ConverterTest {};

constexpr const char *kVlan[] = {"com.orbeno.etherswitch.port.vlan", "com.orbeno.vswitch.port.vlan"};
constexpr const char *kSecurity[] = {"com.orbeno.etherswitch.port.security",
                                     "com.orbeno.vswitch.port.security"};
constexpr const char *kTxUplink[] = {"com.orbeno.etherswitch.port.txUplink",
                                     "com.orbeno.vswitch.port.txUplink"};
constexpr const char *kClasses[] = {"etherswitch", "vswitch", "cswitch"};

// Returns which of a pair of keys belongs to a class.
int FamilyOf(const char *className) {
    return std::string(className) == "etherswitch" ? 0 : 1;
}

TEST_F(PortPolicy, AccessPortSavesItsVlanAndAnEmptyTrunkList) {
    ASSERT_EQ(0, Save(kPort, kVlan[0], Bytes().U16(0).U16(100).U16(0).U16(0)));
    EXPECT_EQ(
        "/settings {}\n/settings/vlan {}\n/settings/vlan/trunk_vlan_ids = []\n/settings/vlan/vlan_id = 100\n",
        Dump());
    EXPECT_EQ(Bytes().U16(0).U16(100).U16(0).U16(0), LoadOne(kPort, kVlan[0]));
}

TEST_F(PortPolicy, TrunkLoadsBackWithItsRanges) {
    const Bytes value = Bytes().U16(1).U16(0).U16(0).U16(2).U16(1).U16(10).U16(20).U16(30);
    ASSERT_EQ(0, Save(kPort, kVlan[0], value));
    const auto loaded = LoadOne(kPort, kVlan[0]);
    ASSERT_TRUE(loaded);
    EXPECT_EQ(16u, loaded->size());
    EXPECT_EQ(value, loaded);
}

TEST_F(PortPolicy, PrivateVlanLoadsBackWithFlagsTwo) {
    ASSERT_EQ(0, Save(kPort, kVlan[0], Bytes().U16(0xfffe).U16(5).U16(0xabcd).U16(9)));
    EXPECT_EQ(
        "/settings {}\n/settings/vlan {}\n/settings/vlan/trunk_vlan_ids = []\n/settings/vlan/pvlan_id = 5\n",
        Dump());
    EXPECT_EQ(Bytes().U16(2).U16(5).U16(0).U16(0), LoadOne(kPort, kVlan[0]));
}

TEST_F(PortPolicy, VlanOfEachFamilyLoadsOnItsSwitchesOnly) {
    const Bytes value = Bytes().U16(1).U16(0).U16(0).U16(1).U16(1).U16(4094);
    for (const char *className : kClasses) {
        (void)configstore::DeleteSubObject(object, "settings", "");
        BecomeSwitch(className);
        const int family = FamilyOf(className);
        ASSERT_EQ(0, Save(kPort, kVlan[family], value));
        const Properties loaded = Load(kPort);
        EXPECT_EQ(value, loaded.at(kVlan[family])) << className;
        EXPECT_FALSE(loaded.contains(kVlan[1 - family])) << className;
    }
}

TEST_F(PortPolicy, EtherswitchSavesNoVswitchVlanButAVswitchSavesBoth) {
    const Bytes value = Bytes().U16(0).U16(7).U32(0);
    EXPECT_EQ(0, Save(kPort, kVlan[1], value));
    EXPECT_EQ(0, Save(kPort, kVlan[1], {}));
    EXPECT_EQ("/settings {}\n", Dump());
    BecomeSwitch("vswitch");
    EXPECT_EQ(0, Save(kPort, kVlan[0], value));
    EXPECT_EQ(value, LoadOne(kPort, kVlan[1]));
}

TEST_F(PortPolicy, EmptyTrunkWritesOnlyTheEmptyList) {
    ASSERT_EQ(0, Save(kPort, kVlan[0], Bytes().U16(1).U16(9).U16(0).U16(0)));
    EXPECT_EQ("/settings {}\n/settings/vlan {}\n/settings/vlan/trunk_vlan_ids = []\n", Dump());
    EXPECT_EQ(Bytes().Zeros(8), LoadOne(kPort, kVlan[0]));
}

TEST_F(PortPolicy, SaveClearsAnEarlierTrunk) {
    ASSERT_EQ(0, Save(kPort, kVlan[0], Bytes().U16(1).U16(0).U16(0).U16(1).U16(1).U16(10)));
    ASSERT_EQ(0, Save(kPort, kVlan[0], Bytes().U16(0).U16(3).U16(0).U16(0)));
    EXPECT_EQ(Bytes().U16(0).U16(3).U16(0).U16(0), LoadOne(kPort, kVlan[0]));
}

TEST_F(PortPolicy, OnlyTheEtherswitchVlanReportsAFailedWriteOfTheId) {
    const Bytes value = Bytes().U16(0).U16(7).U32(0);
    fake_store::FailFunction("SetValueUint16", configstore::IO_ERROR);
    EXPECT_EQ(configstore::IO_ERROR, Save(kPort, kVlan[0], value));
    BecomeSwitch("vswitch");
    EXPECT_EQ(0, Save(kPort, kVlan[1], value));
    fake_store::FailFunction(nullptr);
}

TEST_F(PortPolicy, VlanRejectsValuesThatAreTooShort) {
    EXPECT_EQ(-1, Save(kPort, kVlan[0], Bytes().U16(0).U8(1)));
    EXPECT_EQ(0, Save(kPort, kVlan[0], Bytes().U16(0).U16(1)));
    EXPECT_EQ(-1, Save(kPort, kVlan[0], Bytes().U16(1).U16(1).U16(0).U8(0)));
    EXPECT_EQ(-1, Save(kPort, kVlan[0], Bytes().U16(1).U16(1).U16(0).U16(2).U32(0).U16(0).U8(0)));
    EXPECT_EQ(-1, Save(kPort, kVlan[0], Bytes().U16(1).U16(1).U16(0).U16(0xffff).U32(0)));
}

TEST_F(PortPolicy, UnreadableVlanFieldsAreZero) {
    configstore::Object *range = Sub("settings/vlan/trunk_vlan_ids[a]");
    ASSERT_EQ(0, configstore::SetValueUint16(range, "start", 5));
    EXPECT_EQ(Bytes().U16(1).U16(0).U16(0).U16(1).U16(5).U16(0), LoadOne(kPort, kVlan[0]));
    fake_store::FailFunction("CreateFilterSpecObject", configstore::NO_MEMORY);
    (void)Load(kPort);
    EXPECT_EQ(configstore::NO_MEMORY, loadStatus);
    fake_store::FailFunction(nullptr);
    const int before = fake_store::Calls();
    (void)Load(kPort);
    int listing = 1;
    while (fake_store::CallName(before + listing) != "GetSubObjectInstances")
        ++listing;
    fake_store::FailCall(listing, configstore::IO_ERROR);
    EXPECT_EQ(Bytes().Zeros(8), LoadOne(kPort, kVlan[0]));
    EXPECT_EQ(0, loadStatus);
}

TEST_F(PortPolicy, PriorityAloneLoadsVlanZeroToo) {
    ASSERT_EQ(0, Save(kPort, "com.orbeno.vswitch.port.priority", Bytes().U32(3)));
    const Properties loaded = Load(kPort);
    EXPECT_EQ(Bytes().U32(3), loaded.at("com.orbeno.vswitch.port.priority"));
    EXPECT_EQ(Bytes().Zeros(8), loaded.at(kVlan[0])) << "the priority is stored inside the VLAN policy";
}

TEST_F(PortPolicy, TransmitUplinkLoadsUnderTheFamilysKey) {
    const struct {
        Bytes value;
        const char *text;
    } rows[] = {{Bytes().Text("always", 7), "always"},
                {Bytes().Text("normal", 7), "normal"},
                {Bytes().Text("always", 6), "normal"},
                {Bytes().Text("alwaysX", 8), "normal"},
                {Bytes().Text("always", 9), "always"},
                {Bytes().Text("Always", 7), "normal"},
                {Bytes(), "normal"}};
    for (const char *className : kClasses) {
        BecomeSwitch(className);
        const int family = FamilyOf(className);
        for (const auto &row : rows) {
            ASSERT_EQ(0, Save(kPort, kTxUplink[1 - family], row.value)) << "both keys save";
            const Properties loaded = Load(kPort);
            EXPECT_EQ(Bytes().Text(row.text, 7), loaded.at(kTxUplink[family])) << className;
            EXPECT_FALSE(loaded.contains(kTxUplink[1 - family])) << className;
        }
    }
    ASSERT_EQ(0, configstore::SetValueInt(Sub("settings"), "tx_uplink", 1));
    (void)Load(kPort);
    EXPECT_EQ(configstore::SCHEMA_VIOLATION, loadStatus);
}

TEST_F(PortPolicy, ShapingIsBytesInTheRecordAndBitsInTheStore) {
    for (const char *leaf : {"in", "out"}) {
        const std::string key = std::string("com.orbeno.common.port.shaper.") + leaf + "put";
        const std::string base = std::string("/settings/") + leaf + "_shaping_policy";
        const Bytes value = Bytes().U64(1000000).U64(2000000).U64(300);
        (void)configstore::DeleteSubObject(object, "settings", "");
        ASSERT_EQ(0, Save(kPort, key, value));
        EXPECT_EQ("/settings {}\n" + base + " {}\n" + base + "/enabled = true\n" + base +
                      "/average_bandwidth = 8000000\n" + base + "/peak_bandwidth = 16000000\n" + base +
                      "/burst_size = 2400\n",
                  Dump());
        const Properties loaded = Load(kPort);
        EXPECT_EQ(1u, loaded.size());
        EXPECT_EQ(value, loaded.at(key));
    }
}

TEST_F(PortPolicy, ShapingDividesSignedAndReadsBadLimitsAsZero) {
    configstore::Object *policy = Sub("settings/in_shaping_policy");
    ASSERT_EQ(0, configstore::SetValueLong(policy, "average_bandwidth", -15));
    ASSERT_EQ(0, configstore::SetValueStr(policy, "peak_bandwidth", "8"));
    ASSERT_EQ(0, configstore::SetValueBool(policy, "enabled", false));
    EXPECT_EQ(Bytes().U64(static_cast<uint64_t>(-1)).U64(0).U64(0),
              LoadOne(kPort, "com.orbeno.common.port.shaper.input"));
    // A value that is too large loses its upper bits.
    ASSERT_EQ(0, Save(kPort, "com.orbeno.common.port.shaper.input",
                      Bytes().U64(1ULL << 62).U64(1ULL << 60).U64(1ULL << 59)));
    const auto loaded = LoadOne(kPort, "com.orbeno.common.port.shaper.input");
    EXPECT_EQ(Bytes().U64(0).U64(static_cast<uint64_t>(INT64_MIN / 8)).U64(1ULL << 59), loaded);
    EXPECT_EQ(-1, Save(kPort, "com.orbeno.common.port.shaper.input", Bytes().Zeros(23)));
}

TEST_F(PortPolicy, ShapingLoadsADirectionFromItsOwnLeafOnly) {
    ASSERT_EQ(0, Save(kPort, "com.orbeno.common.port.shaper.output", Bytes().U64(1).U64(2).U64(3)));
    const char *input = "com.orbeno.common.port.shaper.input";
    const dvs::convert::Context context;
    for (const char *key : {input, "other"})
        EXPECT_EQ(0, dvs::convert::LoadShaping({context, object, Sub("settings"), nullptr,
                                                "out_shaping_policy", key, 16, kPort}));
}

TEST_F(PortPolicy, SecuritySavesAllowedFlags) {
    constexpr const char *kNames[] = {"allow_promiscuous", "allow_mac_change", "allow_forged_transmit"};
    for (uint32_t reject = 0; reject < 8; ++reject) {
        for (const char *className : kClasses) {
            BecomeSwitch(className);
            const int family = FamilyOf(className);
            ASSERT_EQ(0, Save(kPort, kSecurity[1 - family], Bytes().U32(reject | 0xfffffff8)))
                << "a save does not check the class";
            for (uint32_t i = 0; i < 3; ++i) {
                bool allowed = false;
                ASSERT_EQ(
                    0, configstore::GetValueBool(Sub("settings/mac_management_policy"), kNames[i], &allowed));
                EXPECT_EQ(!(reject & (1u << i)), allowed);
            }
            const Properties loaded = Load(kPort);
            EXPECT_EQ(Bytes().U32(reject), loaded.at(kSecurity[family]));
            EXPECT_FALSE(loaded.contains(kSecurity[1 - family]));
        }
    }
    EXPECT_EQ(-1, Save(kPort, kSecurity[0], Bytes().Zeros(3)));
}

TEST_F(PortPolicy, UnreadableSecurityFlagsAreAllowed) {
    configstore::Object *policy = Sub("settings/mac_management_policy");
    ASSERT_EQ(0, configstore::SetValueBool(policy, "allow_mac_change", false));
    ASSERT_EQ(0, configstore::SetValueInt(policy, "allow_promiscuous", 0));
    EXPECT_EQ(Bytes().U32(2), LoadOne(kPort, kSecurity[0]));
}

TEST_F(PortPolicy, EtherswitchLoadsNoVswitchRow) {
    ASSERT_EQ(0, Save(kPort, kVlan[0], Bytes().U16(0).U16(1).U32(0)));
    ASSERT_EQ(0, Save(kPort, kSecurity[0], Bytes().U32(1)));
    ASSERT_EQ(0, Save(kPort, kTxUplink[0], Bytes().Text("always", 7)));
    for (const auto &[key, value] : Load(kPort))
        EXPECT_EQ(std::string::npos, key.find("vswitch.")) << key;
    EXPECT_EQ(3u, Load(kPort).size());
}

TEST_F(PortPolicy, LacpNeedsBothFieldsOnLoad) {
    const char *key = "com.orbeno.etherswitch.port.lacp";
    const char *modes[] = {"NONE", "ACTIVE", "PASSIVE"};
    for (uint32_t mode = 0; mode < 3; ++mode) {
        ASSERT_EQ(0, Save(kPort, key, Bytes().U8(7).Zeros(3).U32(mode)));
        EXPECT_EQ(std::string("/settings {}\n/settings/lacp_policy {}\n/settings/lacp_policy/enabled = true\n"
                              "/settings/lacp_policy/mode = \"") +
                      modes[mode] + "\"\n",
                  Dump());
        EXPECT_EQ(Bytes().U8(1).Zeros(3).U32(mode), LoadOne(kPort, key));
    }
    EXPECT_EQ(configstore::BAD_PARAMETER, Save(kPort, key, Bytes().U8(0).Zeros(3).U32(3)));
    EXPECT_EQ(configstore::BAD_PARAMETER, Save(kPort, key, Bytes().U8(0).Zeros(3).U32(0xffffffff)));
    EXPECT_EQ(-1, Save(kPort, key, Bytes().Zeros(7)));

    configstore::Object *policy = Sub("settings/lacp_policy");
    ASSERT_EQ(0, configstore::SetValueStr(policy, "mode", "active"));
    EXPECT_EQ(Bytes().U32(0).U32(0xffffffff), LoadOne(kPort, key));
    EXPECT_NE(std::string::npos, messages.find("Unknown lacp mode active\n"));
    ASSERT_EQ(0, configstore::RemoveValue(policy, "mode"));
    (void)Load(kPort);
    EXPECT_EQ(configstore::NOT_FOUND, loadStatus);
    ASSERT_EQ(0, configstore::RemoveValue(policy, "enabled"));
    (void)Load(kPort);
    EXPECT_EQ(configstore::NOT_FOUND, loadStatus);
}

TEST_F(PortPolicy, EveryPortLoadsTheSwitchsPools) {
    const char *key = "com.orbeno.common.port.respools.cfg";
    const Bytes pools =
        Bytes().U32(1).Text("vm", 128).Zeros(1).U32(50).Zeros(67).U32(100).U32(0xffffffff).Zeros(4);
    EXPECT_EQ(0, Save(kPort, key, pools)) << "a save writes nothing";
    EXPECT_EQ(0, Save(kPort, key, {}));
    EXPECT_EQ("/settings {}\n", Dump());
    ASSERT_EQ(0, Save(kGlobal, "com.orbeno.common.respools.cfg", pools));
    EXPECT_FALSE(Load(kPort).contains(key)) << "without the switch's resources, a port has no pools";
    const Properties loaded = Load(kPort, Sub("resource_management"));
    EXPECT_EQ(pools, loaded.at(key));
}

TEST_F(PortPolicy, PoliciesOfOtherTypesInTheStoreAreSkippedOrFailed) {
    const struct {
        const char *leaf;
        int32_t expected;
    } rows[] = {{"vlan", configstore::SCHEMA_VIOLATION}, // the path of the priority's row leads through it
                {"in_shaping_policy", 0},
                {"mac_management_policy", 0},
                {"lacp_policy", 0},
                {"filter_policy", configstore::SCHEMA_VIOLATION}};
    for (const auto &row : rows) {
        (void)configstore::DeleteSubObject(object, "settings", "");
        ASSERT_EQ(0, configstore::SetValueBool(Sub("settings"), row.leaf, true));
        EXPECT_TRUE(Load(kPort).empty()) << row.leaf;
        EXPECT_EQ(row.expected, loadStatus) << row.leaf;
    }
}

} // namespace
