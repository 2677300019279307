/* SPDX-License-Identifier: Apache-2.0 */
// Teaming policies of both families: the fields byte by byte, and their changes in a round trip.

#include "configstore/converters/teaming.h"

#include "configstore/converters/converter_fixture.h"

using namespace converter_test;

namespace {

constexpr const char *kEtherswitchPort = "com.orbeno.etherswitch.port.teaming";
constexpr const char *kVswitchPort = "com.orbeno.vswitch.port.teaming.policy";
constexpr const char *kVswitch = "com.orbeno.vswitch.teaming";
constexpr std::size_t kNameSize = 81;
constexpr std::size_t kSize = 2616;

struct Policy {
    uint32_t policy = 0, failureFlags = 0;
    uint8_t percentage = 0, fullDuplex = 0;
    uint16_t speed = 0;
    uint32_t behaviour = 0;
    std::vector<std::string> active, standby;

    [[nodiscard]] Bytes Value() const {
        Bytes bytes;
        bytes.U32(policy).U32(failureFlags).U8(percentage).U8(fullDuplex).U16(speed).U32(behaviour);
        bytes.U32(static_cast<uint32_t>(active.size())).U32(static_cast<uint32_t>(standby.size()));
        for (const auto &name : active)
            bytes.Text(name, kNameSize);
        for (const auto &name : standby)
            bytes.Text(name, kNameSize);
        return bytes.Zeros(kSize - bytes.size());
    }
};

const Policy kFull = {3, 0x20 | 0x80, 10, 1, 1000, 0x3e, {"up1", "up2", "up3"}, {"up4", "up5"}};

struct Teaming : ConverterTest {};

TEST_F(Teaming, SavesEveryFieldOfAnEtherswitchPort) {
    EXPECT_EQ(0, Save(kPort, kEtherswitchPort, kFull.Value()));
    const std::string base = "/settings/uplink_teaming_policy";
    EXPECT_EQ("/settings {}\n" + base + " {}\n" + base + "/policy = \"LOADBALANCE_SRCID\"\n" + base +
                  "/failure_criteria {}\n" + base + "/failure_criteria/check_beacon = true\n" + base +
                  "/failure_criteria/lc_link_state = true\n" + base + "/failure_criteria/percentage = 10\n" +
                  base + "/failure_criteria/full_duplex = true\n" + base +
                  "/failure_criteria/speed = 1000\n" + base + "/reverse_policy = true\n" + base +
                  "/rolling_order = true\n" + base + "/notify_switches = true\n" + base +
                  "/best_effort = true\n" + base + "/shotgun = true\n" + base + "/uplink_port_order {}\n" +
                  base + "/uplink_port_order/active_uplink_ports[] = \"up1\"\n" + base +
                  "/uplink_port_order/active_uplink_ports[] = \"up2\"\n" + base +
                  "/uplink_port_order/active_uplink_ports[] = \"up3\"\n" + base +
                  "/uplink_port_order/standby_uplink_ports[] = \"up4\"\n" + base +
                  "/uplink_port_order/standby_uplink_ports[] = \"up5\"\n",
              Dump());
}

TEST_F(Teaming, SavesEachBehaviourBitUnderItsName) {
    const std::pair<uint32_t, const char *> bits[] = {{0x02, "reverse_policy"},
                                                      {0x04, "best_effort"},
                                                      {0x08, "rolling_order"},
                                                      {0x10, "shotgun"},
                                                      {0x20, "notify_switches"}};
    for (const auto &[bit, name] : bits) {
        Policy policy;
        policy.behaviour = bit;
        ASSERT_EQ(0, Save(kPort, kEtherswitchPort, policy.Value()));
        for (const auto &[other, otherName] : bits) {
            bool flag = false;
            ASSERT_EQ(0, configstore::GetValueBool(Sub("settings/uplink_teaming_policy"), otherName, &flag));
            EXPECT_EQ(bit == other, flag) << name << " " << otherName;
        }
    }
}

TEST_F(Teaming, ThreeActiveAndTwoStandbyNamesFillTheFirstFiveSlots) {
    ASSERT_EQ(0, Save(kPort, kEtherswitchPort, kFull.Value()));
    Policy expected = kFull;
    // The save writes members into the failure criteria; the load looks for them outside and finds nothing.
    expected.failureFlags |= 0x200;
    expected.percentage = expected.fullDuplex = 0;
    expected.speed = 0;
    EXPECT_EQ(expected.Value(), LoadOne(kPort, kEtherswitchPort));
}

TEST_F(Teaming, ExplicitPoliciesLoadSwapped) {
    const struct {
        uint32_t saved;
        const char *text;
        uint32_t loaded;
    } rows[] = {{0, "", 0},
                {1, "LOADBALANCE_IP", 1},
                {2, "LOADBALANCE_SRCMAC", 2},
                {3, "LOADBALANCE_SRCID", 3},
                {4, "LOADBALANCE_LOADBASED", 5},
                {5, "FAILOVER_EXPLICIT", 4},
                {6, "", 0},
                {7, "", 0},
                {0x80000000, "", 0}};
    for (const auto &row : rows) {
        Policy policy;
        policy.policy = row.saved;
        (void)configstore::DeleteSubObject(object, "settings", "");
        ASSERT_EQ(0, Save(kPort, kEtherswitchPort, policy.Value()));
        char *text = nullptr;
        const int32_t status =
            configstore::GetValueStr(Sub("settings/uplink_teaming_policy"), "policy", &text);
        EXPECT_STREQ(row.text, status ? "" : text) << row.saved;
        configstore::FreeString(text);
        Policy expected;
        expected.policy = row.loaded;
        expected.failureFlags = 0x200;
        EXPECT_EQ(expected.Value(), LoadOne(kPort, kEtherswitchPort)) << row.saved;
    }
}

TEST_F(Teaming, PolicyTextsHaveTheKernelsValues) {
    const std::pair<const char *, int32_t> rows[] = {{"LOADBALANCE_IP", 1},
                                                     {"LOADBALANCE_SRCMAC", 2},
                                                     {"LOADBALANCE_SRCID", 3},
                                                     {"LOADBALANCE_LOADBASED", 5},
                                                     {"FAILOVER_EXPLICIT", 4},
                                                     {"failover_explicit", 0},
                                                     {"", 0}};
    for (const auto &[text, expected] : rows) {
        int32_t value = -7;
        EXPECT_EQ(0, TeamingPolicyFromSchema(text, &value));
        EXPECT_EQ(expected, value) << text;
        if (value) {
            EXPECT_STREQ(text, NIC_TEAMING_POLICY_MODE_2_CHARS[value]);
        }
    }
    int32_t value = -7;
    EXPECT_EQ(0, TeamingPolicyFromSchema(nullptr, &value));
    EXPECT_EQ(0, value);
}

TEST_F(Teaming, SpeedKeepsItsLowByteAndIsReadBesideTheCriteria) {
    configstore::Object *policy = Sub("settings/uplink_teaming_policy");
    ASSERT_EQ(0, configstore::SetValueUint16(policy, "speed", 1000));
    ASSERT_EQ(0, configstore::SetValueUint16(policy, "percentage", 0x1234));
    ASSERT_EQ(0, configstore::SetValueBool(policy, "full_duplex", true));
    Policy expected;
    // Without the criteria object, none of the three is read.
    EXPECT_EQ(expected.Value(), LoadOne(kPort, kEtherswitchPort));
    Sub("settings/uplink_teaming_policy/failure_criteria");
    expected.failureFlags = 0x200;
    expected.speed = 232;
    expected.percentage = 0x34;
    expected.fullDuplex = 1;
    EXPECT_EQ(expected.Value(), LoadOne(kPort, kEtherswitchPort));
}

TEST_F(Teaming, EtherswitchSavesNoVswitchPolicyAndLoadsThePortRowOnly) {
    EXPECT_EQ(0, Save(kGlobal, kVswitch, kFull.Value()));
    EXPECT_EQ(0, Save(kPort, kVswitchPort, kFull.Value()));
    EXPECT_EQ("/settings {}\n", Dump());
    EXPECT_EQ(0, Save(kGlobal, kVswitch, {1, 2, 3})) << "the value is ignored, so it is not rejected";
    ASSERT_EQ(0, Save(kPort, kEtherswitchPort, kFull.Value()));
    const Properties port = Load(kPort);
    EXPECT_TRUE(port.contains(kEtherswitchPort));
    EXPECT_FALSE(port.contains(kVswitchPort));
    EXPECT_FALSE(Load(kGlobal).contains(kVswitch));
}

TEST_F(Teaming, VswitchAndCswitchLoadTheVswitchKeys) {
    for (const char *className : {"vswitch", "cswitch"}) {
        BecomeSwitch(className);
        ASSERT_EQ(0, Save(kGlobal, kVswitch, kFull.Value()));
        Policy expected = kFull;
        expected.failureFlags |= 0x200;
        expected.percentage = expected.fullDuplex = 0;
        expected.speed = 0;
        EXPECT_EQ(expected.Value(), LoadOne(kGlobal, kVswitch));
        const Properties port = Load(kPort);
        EXPECT_FALSE(port.contains(kEtherswitchPort));
        EXPECT_EQ(expected.Value(), port.at(kVswitchPort));
    }
}

TEST_F(Teaming, RejectsCountsBeyondTheValue) {
    Bytes value = kFull.Value();
    for (const uint32_t active : {33u, 0x7fffffffu, 0xffffffffu}) {
        Bytes lying(value);
        lying.erase(lying.begin() + 16, lying.begin() + 20);
        Bytes count;
        count.U32(active);
        lying.insert(lying.begin() + 16, count.begin(), count.end());
        EXPECT_EQ(-1, Save(kPort, kEtherswitchPort, lying)) << active;
    }
    EXPECT_EQ("/settings {}\n", Dump());
    // A save reads up to the last counted name.
    value.resize(24 + 5 * kNameSize);
    EXPECT_EQ(0, Save(kPort, kEtherswitchPort, value));
    value.pop_back();
    EXPECT_EQ(-1, Save(kPort, kEtherswitchPort, value));
}

TEST_F(Teaming, NamesWithoutASlotAreNotCounted) {
    configstore::Object *order = Sub("settings/uplink_teaming_policy/uplink_port_order");
    for (int i = 0; i < 30; ++i)
        ASSERT_EQ(0, configstore::AppendValueString(order, "active_uplink_ports", "a"));
    for (int i = 0; i < 5; ++i)
        ASSERT_EQ(0, configstore::AppendValueString(order, "standby_uplink_ports", "s"));
    Policy expected;
    expected.active.assign(30, "a");
    expected.standby.assign(2, "s");
    EXPECT_EQ(expected.Value(), LoadOne(kPort, kEtherswitchPort));
}

TEST_F(Teaming, LongNamesOverflowIntoTheNextSlotButNotTheEnd) {
    configstore::Object *order = Sub("settings/uplink_teaming_policy/uplink_port_order");
    const std::string longName(100, 'x');
    ASSERT_EQ(0, configstore::AppendValueString(order, "active_uplink_ports", longName.c_str()));
    Policy expected;
    expected.active = {longName.substr(0, kNameSize)};
    Bytes value = expected.Value();
    std::fill(value.begin() + 24 + 81, value.begin() + 24 + 100, 'x');
    EXPECT_EQ(value, LoadOne(kPort, kEtherswitchPort));

    for (int i = 1; i < 32; ++i)
        ASSERT_EQ(0, configstore::AppendValueString(order, "active_uplink_ports", longName.c_str()));
    const auto loaded = LoadOne(kPort, kEtherswitchPort);
    ASSERT_TRUE(loaded);
    ASSERT_EQ(kSize, loaded->size());
    EXPECT_EQ(0, loaded->back());
    EXPECT_EQ('x', (*loaded)[kSize - 2]);
}

TEST_F(Teaming, WrongTypesInTheStoreLeaveTheirFieldsZero) {
    configstore::Object *policy = Sub("settings/uplink_teaming_policy");
    ASSERT_EQ(0, configstore::SetValueInt(policy, "policy", 3));
    ASSERT_EQ(0, configstore::SetValueStr(policy, "shotgun", "true"));
    ASSERT_EQ(0, configstore::SetValueBool(policy, "uplink_port_order", true));
    ASSERT_EQ(0, configstore::SetValueBool(policy, "failure_criteria", true));
    EXPECT_EQ(Policy().Value(), LoadOne(kPort, kEtherswitchPort));
}

TEST_F(Teaming, MissingCriteriaFailTheVswitchOnly) {
    for (const bool isVswitch : {false, true}) {
        BecomeSwitch(isVswitch ? "vswitch" : "etherswitch");
        (void)configstore::DeleteSubObject(object, "settings", "");
        // A value in place of the sub-object.
        ASSERT_EQ(0,
                  configstore::SetValueBool(Sub("settings/uplink_teaming_policy"), "failure_criteria", true));
        const int32_t expected = isVswitch ? configstore::SCHEMA_VIOLATION : 0;
        EXPECT_EQ(expected, Save(kPort, isVswitch ? kVswitchPort : kEtherswitchPort, kFull.Value()));
    }
}

TEST_F(Teaming, EtherswitchSkipsAnAbsentObject) {
    Sub("settings");
    fake_store::FailFunction("CreateSubObject", configstore::NOT_FOUND);
    EXPECT_EQ(0, Save(kPort, kEtherswitchPort, kFull.Value()));
    BecomeSwitch("vswitch");
    EXPECT_EQ(configstore::NOT_FOUND, Save(kPort, kVswitchPort, kFull.Value()));
    fake_store::FailFunction(nullptr);
}

} // namespace
