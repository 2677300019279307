/* SPDX-License-Identifier: Apache-2.0 */
// Switch-wide settings in tables and small records: LACP groups, link discovery, IPFIX, health checks, pools.

#include "configstore/converters/converter_fixture.h"
#include "configstore/converters/health_check.h"

using namespace converter_test;

namespace {

struct SwitchTable : ConverterTest {};

// --- LACP groups ---

constexpr const char *kLacp = "com.orbeno.etherswitch.lacp";

Bytes Group(const std::string &name, const std::string &key, uint32_t mode, uint32_t algorithm,
            uint32_t uplinks) {
    return Bytes().Text(name, 65).Text(key, 16).U32(mode).U32(algorithm).U32(uplinks);
}

TEST_F(SwitchTable, LacpGroupsRoundTrip) {
    for (const char *className : {"etherswitch", "vswitch", "cswitch"}) {
        BecomeSwitch(className);
        (void)configstore::DeleteSubObject(object, "settings", "");
        const Bytes value =
            Bytes().U32(2).Add(Group("first", "lag-1", 1, 20, 4)).Add(Group("", "lag-2", 2, 0, 0));
        ASSERT_EQ(0, Save(kGlobal, kLacp, value));
        const std::string one = "/settings/lacp_groups[lag-1]";
        const std::string two = "/settings/lacp_groups[lag-2]";
        EXPECT_EQ("/settings {}\n" + one + " {}\n" + one + "/name = \"first\"\n" + one +
                      "/mode = \"ACTIVE\"\n" + one + "/load_balance_algorithm = \"SRCID\"\n" + one +
                      "/uplink_num = 4\n" + two + " {}\n" + two + "/name = \"\"\n" + two +
                      "/mode = \"PASSIVE\"\n" + two + "/load_balance_algorithm = \"NONE\"\n" + two +
                      "/uplink_num = 0\n",
                  Dump());
        EXPECT_EQ(value, LoadOne(kGlobal, kLacp));
    }
}

TEST_F(SwitchTable, EveryLacpAlgorithmHasItsText) {
    for (uint32_t i = 0; i < 21; ++i) {
        const Bytes value = Bytes().U32(1).Add(Group("g", "k", i % 3, i, 1));
        ASSERT_EQ(0, Save(kGlobal, kLacp, value));
        EXPECT_EQ(value, LoadOne(kGlobal, kLacp));
        EXPECT_NE(std::string::npos, Dump().find(std::string("\"") + LACP_LB_POLICY_SCHEMA[i] + "\""));
    }
    EXPECT_EQ(nullptr, LACP_LB_POLICY_SCHEMA[21]);
    EXPECT_EQ(configstore::BAD_PARAMETER,
              Save(kGlobal, kLacp, Bytes().U32(1).Add(Group("g", "k", 0, 21, 1))));
    EXPECT_EQ(configstore::BAD_PARAMETER, Save(kGlobal, kLacp, Bytes().U32(1).Add(Group("g", "k", 3, 0, 1))));
}

TEST_F(SwitchTable, TruncatesALacpNameOfSeventyCharacters) {
    configstore::Object *group = Sub("settings/lacp_groups[k]");
    ASSERT_EQ(0, configstore::SetValueStr(group, "name", std::string(70, 'n').c_str()));
    ASSERT_EQ(0, configstore::SetValueStr(group, "key", std::string(20, 'k').c_str()));
    ASSERT_EQ(0, configstore::SetValueUint32(group, "uplink_num", 1));
    EXPECT_EQ(Bytes().U32(1).Add(Group(std::string(64, 'n'), std::string(15, 'k'), 0, 0, 1)),
              LoadOne(kGlobal, kLacp));
}

TEST_F(SwitchTable, UnknownLacpTextsLoadAsAllOnes) {
    ASSERT_EQ(0, Save(kGlobal, kLacp, Bytes().U32(1).Add(Group("g", "k", 1, 1, 1))));
    configstore::Object *group = Sub("settings/lacp_groups[k]");
    ASSERT_EQ(0, configstore::SetValueStr(group, "mode", "active"));
    ASSERT_EQ(0, configstore::SetValueStr(group, "load_balance_algorithm", "HASH"));
    EXPECT_EQ(Bytes().U32(1).Add(Group("g", "k", 0xffffffff, 0xffffffff, 1)), LoadOne(kGlobal, kLacp));
    EXPECT_NE(std::string::npos, messages.find("Unknown lacp mode active\n"));
    EXPECT_NE(std::string::npos, messages.find("Unknown lacp lb policy HASH\n"));
    ASSERT_EQ(0, configstore::RemoveValue(group, "mode"));
    ASSERT_EQ(0, configstore::RemoveValue(group, "load_balance_algorithm"));
    EXPECT_EQ(Bytes().U32(1).Add(Group("g", "k", 0, 0, 1)), LoadOne(kGlobal, kLacp));
    ASSERT_EQ(0, configstore::RemoveValue(group, "uplink_num"));
    EXPECT_FALSE(LoadOne(kGlobal, kLacp));
    EXPECT_EQ(configstore::NOT_FOUND, loadStatus);
}

TEST_F(SwitchTable, NoLacpGroupsSaveNothing) {
    ASSERT_EQ(0, Save(kGlobal, kLacp, Bytes().U32(0)));
    EXPECT_EQ("/settings {}\n", Dump());
    EXPECT_EQ(-1, Save(kGlobal, kLacp, Bytes().Zeros(3)));
    EXPECT_EQ(-1, Save(kGlobal, kLacp, Bytes().U32(2).Add(Group("g", "k", 1, 1, 1))));
    EXPECT_EQ(-1, Save(kGlobal, kLacp, Bytes().U32(0xffffffff).Add(Group("g", "k", 1, 1, 1))));
}

// --- Link discovery ---

constexpr const char *kCdp = "com.orbeno.etherswitch.cdp";

TEST_F(SwitchTable, LinkDiscoveryRoundTrips) {
    for (uint8_t protocol = 0; protocol < 2; ++protocol) {
        for (uint8_t operation = 0; operation < 4; ++operation) {
            const Bytes value = Bytes().U8(protocol).U8(operation);
            ASSERT_EQ(0, Save(kGlobal, kCdp, value));
            EXPECT_EQ(std::string("/settings {}\n/settings/link_discovery_protocol {}\n"
                                  "/settings/link_discovery_protocol/protocol = \"") +
                          CDP_MODE_2_CHARS[protocol] +
                          "\"\n/settings/link_discovery_protocol/operation = \"" +
                          CDP_OPERATION_2_CHARS[operation] + "\"\n",
                      Dump());
            EXPECT_EQ(value, LoadOne(kGlobal, kCdp));
        }
    }
    EXPECT_EQ(configstore::BAD_PARAMETER, Save(kGlobal, kCdp, Bytes().U8(2).U8(0)));
    EXPECT_EQ(configstore::BAD_PARAMETER, Save(kGlobal, kCdp, Bytes().U8(0).U8(255)));
    EXPECT_EQ(-1, Save(kGlobal, kCdp, Bytes().U8(0)));
}

TEST_F(SwitchTable, UnknownLinkDiscoveryTextsLoadAsTheValueAfterTheLast) {
    configstore::Object *cdp = Sub("settings/link_discovery_protocol");
    ASSERT_EQ(0, configstore::SetValueStr(cdp, "protocol", "cdp"));
    (void)Load(kGlobal);
    EXPECT_EQ(configstore::NOT_FOUND, loadStatus) << "without an operation";
    ASSERT_EQ(0, configstore::SetValueStr(cdp, "operation", "SHOUT"));
    EXPECT_EQ(Bytes().U8(2).U8(4), LoadOne(kGlobal, kCdp));
    ASSERT_EQ(0, configstore::RemoveValue(cdp, "protocol"));
    (void)Load(kGlobal);
    EXPECT_EQ(configstore::NOT_FOUND, loadStatus);
}

TEST_F(SwitchTable, LinkDiscoveryReturnsMinusOneWithoutItsObject) {
    ASSERT_EQ(0, configstore::SetValueBool(Sub("settings"), "link_discovery_protocol", true));
    EXPECT_EQ(-1, Save(kGlobal, kCdp, Bytes().U8(0).U8(0)));
    (void)Load(kGlobal);
    EXPECT_EQ(configstore::SCHEMA_VIOLATION, loadStatus);
}

// --- IPFIX ---

constexpr const char *kIpfix = "com.orbeno.etherswitch.ipfix";

TEST_F(SwitchTable, IpfixRoundTrips) {
    const Bytes ipv4 = Bytes().U8(192).U8(0).U8(2).U8(7).Zeros(12);
    const Bytes value = Bytes().U32(15).U32(60).Add(ipv4).U16(4739).U32(100).U8(1).U8(0).U32(0xfffffffe);
    ASSERT_EQ(36u, value.size());
    ASSERT_EQ(0, Save(kGlobal, kIpfix, value));
    EXPECT_EQ(
        "/settings {}\n/settings/ipfix {}\n/settings/ipfix/idle_flow_timeout = 15\n"
        "/settings/ipfix/active_flow_timeout = 60\n/settings/ipfix/collector_address = \"192.0.2.7\"\n"
        "/settings/ipfix/collector_port = 4739\n/settings/ipfix/sampling_rate = 100\n"
        "/settings/ipfix/internal_flows_only = true\n/settings/ipfix/observation_domain_id = 4294967294\n",
        Dump());
    EXPECT_EQ(value, LoadOne(kGlobal, kIpfix));
    EXPECT_EQ(-1, Save(kGlobal, kIpfix, Bytes().Zeros(35)));
}

TEST_F(SwitchTable, ShortIpv6CollectorIsSavedInFull) {
    configstore::Object *ipfix = Sub("settings/ipfix");
    ASSERT_EQ(0, configstore::SetValueStr(ipfix, "collector_address", "fe80::1"));
    const auto loaded = LoadOne(kGlobal, kIpfix);
    EXPECT_EQ(Bytes().Zeros(8).U8(0xfe).U8(0x80).Zeros(13).U8(1).Zeros(7).U8(1).Zeros(4), loaded);
    ASSERT_EQ(0, Save(kGlobal, kIpfix, *loaded));
    EXPECT_NE(std::string::npos,
              Dump().find("collector_address = \"fe80:0000:0000:0000:0000:0000:0000:0001\"\n"));
    EXPECT_EQ(loaded, LoadOne(kGlobal, kIpfix));
}

TEST_F(SwitchTable, InvalidCollectorLoadsAsNone) {
    configstore::Object *ipfix = Sub("settings/ipfix");
    for (const char *text : {"10.0.0.300", "", "localhost", "fe80::1%eth0"}) {
        ASSERT_EQ(0, configstore::SetValueStr(ipfix, "collector_address", text));
        EXPECT_EQ(Bytes().Zeros(36), LoadOne(kGlobal, kIpfix)) << text;
        EXPECT_EQ("", messages);
    }
}

// --- Health checks ---

constexpr const char *kVlanCheck = "com.orbeno.common.vlanmtucheck.deploy";
constexpr const char *kTeamCheck = "com.orbeno.common.teamcheck.deploy";

TEST_F(SwitchTable, HealthChecksSaveEnableAndLoadEnabled) {
    ASSERT_EQ(0, Save(kGlobal, kVlanCheck, Bytes().U8(1).U32(30)));
    ASSERT_EQ(0, Save(kGlobal, kTeamCheck, Bytes().U8(0).U32(60)));
    EXPECT_EQ("/health_checks[VLAN_MTU] {}\n/health_checks[VLAN_MTU]/enable = "
              "true\n/health_checks[VLAN_MTU]/interval = 30\n"
              "/health_checks[TEAMING] {}\n/health_checks[TEAMING]/enable = "
              "false\n/health_checks[TEAMING]/interval = 60\n",
              Dump());
    Properties loaded = Load(kGlobal);
    EXPECT_EQ(Bytes().U8(0).U32(30), loaded.at(kVlanCheck)) << "the save writes enable, the load reads enabled";
    EXPECT_EQ(Bytes().U8(0).U32(60), loaded.at(kTeamCheck));
    ASSERT_EQ(0, configstore::SetValueBool(Sub("health_checks[TEAMING]"), "enabled", true));
    loaded = Load(kGlobal);
    EXPECT_EQ(Bytes().U8(1).U32(60), loaded.at(kTeamCheck));
}

TEST_F(SwitchTable, UnreadableHealthCheckFieldsAreZero) {
    Sub("health_checks[VLAN_MTU]");
    EXPECT_EQ(Bytes().Zeros(5), LoadOne(kGlobal, kVlanCheck));
    EXPECT_FALSE(Load(kGlobal).contains(kTeamCheck));
    EXPECT_EQ(-1, Save(kGlobal, kVlanCheck, Bytes().Zeros(4)));
}

TEST_F(SwitchTable, OtherKeysAreNotHealthChecks) {
    const uint8_t value[5] = {};
    const dvs::convert::Context context;
    EXPECT_EQ(-1, dvs::convert::SaveHealthCheck(
                      {context, object, object, "health_checks", value, "com.orbeno.other", kGlobal, 16}));
    EXPECT_EQ("Unknown health check type com.orbeno.other\n", messages);
    messages.clear();
    EXPECT_EQ(-1, dvs::convert::LoadHealthCheck(
                      {context, object, object, nullptr, "health_checks", "com.orbeno.other", 16, kGlobal}));
    EXPECT_EQ("", messages);
}

// --- Pools ---

constexpr const char *kPools = "com.orbeno.common.respools.cfg";
constexpr const char *kPoolList = "com.orbeno.common.respools.list";

Bytes Pool(const std::string &key, uint32_t reservation, uint32_t shares, uint32_t limit) {
    return Bytes().Text(key, 128).Zeros(1).U32(reservation).Zeros(67).U32(shares).U32(limit).Zeros(4);
}
Bytes PoolKey(const std::string &key) {
    return Bytes().Text(key, 200);
}

TEST_F(SwitchTable, PoolsRoundTrip) {
    const Bytes value = Bytes().U32(2).Add(Pool("vm", 50, 100, 0xffffffff)).Add(Pool("nfs", 0, 0, 1000));
    ASSERT_EQ(0, Save(kGlobal, kPools, value));
    const std::string base = "/resource_management/traffic_resources";
    EXPECT_EQ("/resource_management {}\n" + base + "[vm] {}\n" + base + "[vm]/allocation {}\n" + base +
                  "[vm]/allocation/reservation = 50\n" + base + "[vm]/allocation/shares {}\n" + base +
                  "[vm]/allocation/shares/shares = 100\n" + base + "[vm]/allocation/limit = -1\n" + base +
                  "[nfs] {}\n" + base + "[nfs]/allocation {}\n" + base +
                  "[nfs]/allocation/reservation = 0\n" + base + "[nfs]/allocation/shares {}\n" + base +
                  "[nfs]/allocation/shares/shares = 0\n" + base + "[nfs]/allocation/limit = 1000\n",
              Dump());
    EXPECT_EQ(value, LoadOne(kGlobal, kPools));
}

TEST_F(SwitchTable, NoPoolsSaveNothing) {
    ASSERT_EQ(0, Save(kGlobal, kPools, Bytes().U32(0)));
    ASSERT_EQ(0, Save(kGlobal, kPoolList, Bytes().U32(0)));
    EXPECT_EQ("/resource_management {}\n", Dump());
    EXPECT_FALSE(LoadOne(kGlobal, kPools));
    ASSERT_EQ(0, Save(kGlobal, kPoolList, Bytes().U32(1).Add(PoolKey("a"))));
    ASSERT_EQ(0, Save(kGlobal, kPoolList, Bytes().U32(0)));
    EXPECT_EQ(Bytes().U32(1).Add(PoolKey("a")), LoadOne(kGlobal, kPoolList)) << "the earlier list is kept";
}

TEST_F(SwitchTable, PoolWithoutSharesKeepsItsOtherFields) {
    ASSERT_EQ(0, Save(kGlobal, kPools, Bytes().U32(1).Add(Pool("vm", 50, 100, 7))));
    ASSERT_EQ(0, configstore::DeleteSubObject(Sub("resource_management/traffic_resources[vm]/allocation"),
                                              "shares", ""));
    EXPECT_EQ(Bytes().U32(1).Add(Pool("vm", 50, 0, 7)), LoadOne(kGlobal, kPools));
    ASSERT_EQ(
        0, configstore::DeleteSubObject(Sub("resource_management/traffic_resources[vm]"), "allocation", ""));
    EXPECT_EQ(Bytes().U32(1).Add(Pool("vm", 0, 0, 0)), LoadOne(kGlobal, kPools));
}

TEST_F(SwitchTable, PoolKeysRoundTripAndLongOnesAreTruncated) {
    const Bytes value = Bytes().U32(2).Add(PoolKey("vm")).Add(PoolKey("nfs"));
    ASSERT_EQ(0, Save(kGlobal, kPoolList, value));
    EXPECT_EQ("/resource_management {}\n/resource_management/network_resource_pool_keys[] = \"vm\"\n"
              "/resource_management/network_resource_pool_keys[] = \"nfs\"\n",
              Dump());
    EXPECT_EQ(value, LoadOne(kGlobal, kPoolList));
    ASSERT_EQ(0, configstore::AppendValueString(Sub("resource_management"), "network_resource_pool_keys",
                                                std::string(300, 'p').c_str()));
    const Bytes cut =
        Bytes().U32(3).Add(PoolKey("vm")).Add(PoolKey("nfs")).Add(PoolKey(std::string(127, 'p')));
    EXPECT_EQ(cut, LoadOne(kGlobal, kPoolList));
}

TEST_F(SwitchTable, RejectsPoolCountsBeyondTheValue) {
    for (const uint32_t count : {2u, 0x7fffffffu, 0xffffffffu}) {
        EXPECT_EQ(-1, Save(kGlobal, kPools, Bytes().U32(count).Add(Pool("vm", 1, 1, 1))));
        EXPECT_EQ(-1, Save(kGlobal, kPoolList, Bytes().U32(count).Add(PoolKey("vm"))));
    }
    EXPECT_EQ(-1, Save(kGlobal, kPools, Bytes().Zeros(3)));
    EXPECT_EQ(-1, Save(kGlobal, kPoolList, Bytes().Zeros(3)));
    EXPECT_EQ("/resource_management {}\n", Dump());
}

TEST_F(SwitchTable, PoolsOfAnotherTypeInTheStoreFailTheList) {
    ASSERT_EQ(0, configstore::SetValueBool(Sub("resource_management"), "network_resource_pool_keys", true));
    (void)Load(kGlobal);
    EXPECT_EQ(configstore::SCHEMA_VIOLATION, loadStatus);
}

} // namespace
