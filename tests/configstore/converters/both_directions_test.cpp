/* SPDX-License-Identifier: Apache-2.0 */
// Every converter in both directions, byte for byte, on a switch of each class. One row per key: a value, the
// stored form after a save, and the loaded value. Special cases are in the tests of the families; this test
// checks that every key and every converter is covered.

#include <set>
#include <sstream>

#include "configstore/converters/converter_fixture.h"

using namespace converter_test;

namespace {

constexpr const char *kClasses[] = {"etherswitch", "vswitch", "cswitch"};

// The loaded value on a switch of each class.
struct Loaded {
    Properties on[3];
};
Loaded Everywhere(const char *key, const Bytes &value) {
    return {{{{key, value}}, {{key, value}}, {{key, value}}}};
}
Loaded ByFamily(const char *etherswitchKey, const char *vswitchKey, const Bytes &value) {
    return {{{{etherswitchKey, value}}, {{vswitchKey, value}}, {{vswitchKey, value}}}};
}
Loaded OnVswitches(const char *key, const Bytes &value) {
    return {{{}, {{key, value}}, {{key, value}}}};
}
Loaded operator+(Loaded loaded, const Loaded &more) {
    for (int i = 0; i < 3; ++i)
        loaded.on[i].insert(more.on[i].begin(), more.on[i].end());
    return loaded;
}
Loaded Mtu(uint32_t mtu) {
    Loaded loaded = Everywhere("com.orbeno.common.portset.mtu", Bytes().U32(mtu));
    loaded.on[0]["com.orbeno.etherswitch.mtu"] = Bytes().U32(mtu);
    loaded.on[1]["com.orbeno.vswitch.mtu"] = Bytes().U32(mtu);
    return loaded;
}
// At this version, only cswitches have the vswitch key.
Loaded PrivateVlans(const Bytes &value) {
    const char *key = "com.orbeno.etherswitch.pvlanMap";
    return {{{{key, value}}, {{key, value}}, {{"com.orbeno.vswitch.pvlanMap", value}}}};
}

const Bytes kPool = Bytes().U32(1).Text("vm", 129).U32(500).Zeros(67).U32(100).U32(0xffffffff).Zeros(4);

Bytes Uplinks(Bytes head) {
    head.U32(1).U32(1).Text("up1", 81).Text("up2", 81);
    return head.Zeros(2616 - head.size());
}
Bytes Teaming(uint32_t policy) {
    return Uplinks(Bytes().U32(policy).U32(0xa0).U8(10).U8(1).U16(1000).U32(0x2a));
}
Bytes LoadedTeaming(uint32_t policy) {
    return Uplinks(Bytes().U32(policy).U32(0x2a0).U32(0).U32(0x2a));
}

// One session from port 10 to port 12 and in reverse; the loaded head and ports.
Bytes Session(uint32_t length, uint32_t flags, uint16_t receive, uint16_t transmit) {
    return Bytes()
        .Text("key", 32)
        .Text("name", 84)
        .U32(1)
        .U32(length)
        .U32(flags)
        .U16(900)
        .U16(receive)
        .U16(transmit)
        .Zeros(2)
        .U32(64)
        .U32(1)
        .U16(17)
        .U8(3)
        .U8(1)
        .Zeros(68);
}
Bytes MirrorTable() {
    const Bytes session = Session(256, 0x25, 0x3, 0x8).U32(1).U32(1).U32(1).U32(0);
    Bytes table = Bytes().U32(0xfacebeef).U32(1).U32(1).U32(3).U32(0).Add(session);
    for (const char *port : {"10", "11", "12"})
        table.U32(0).Text(port, 32);
    return table;
}
Bytes LoadedMirrorTable() {
    const Bytes session = Session(0xffffffff, 0x3f, 0x7, 0xc).U32(1).Zeros(12);
    Bytes table = Bytes().U32(0xfacebeef).U32(1).U32(1).U32(9).U32(0).Add(session);
    for (const char *port : {"10", "12"})
        table.U32(0).Text(port, 32);
    return table.Zeros(7 * 36);
}

// The lines that both saves leave in the store; the rows contain the rest.
const std::string kSession =
    "~[key] {}\n"
    "~[key]/key = \"key\"\n"
    "~[key]/name = \"name\"\n"
    "~[key]/session_type = \"DVPORT_MIRROR\"\n"
    "~[key]/enabled = false\n"
    "~[key]/strip_original_vlan = false\n"
    "~[key]/normal_traffic_allowed = false\n"
    "~[key]/legacy_mode = false\n"
    "~[key]/source_transmit_port {}\n"
    "~[key]/source_transmit_port/wildcard_port_connectee_types[] = \"HOST_HYP_VNIC\"\n"
    "~[key]/source_transmit_port/port_keys[] = \"12\"\n"
    "~[key]/source_recv_port {}\n"
    "~[key]/source_recv_port/wildcard_port_connectee_types[] = \"VM_VNIC\"\n"
    "~[key]/source_recv_port/wildcard_port_connectee_types[] = \"PNIC\"\n"
    "~[key]/source_recv_port/port_keys[] = \"11\"\n"
    "~[key]/encapsulation_vlan_id = 900\n"
    "~[key]/sampling_rate = 64\n"
    "~[key]/encap_type = \"ERSPAN2\"\n"
    "~[key]/erspan_id = 17\n"
    "~[key]/erspan_COS = 3\n"
    "~[key]/erspan_gra_nanosec = true\n"
    "~[key]/destination_port {}\n"
    "~[key]/destination_port/port_keys[] = \"10\"\n";
std::string TeamingContent(const std::string &policy) {
    return "~ {}\n~/policy = \"" + policy +
           "\"\n"
           "~/failure_criteria {}\n"
           "~/failure_criteria/check_beacon = true\n"
           "~/failure_criteria/lc_link_state = true\n"
           "~/failure_criteria/percentage = 10\n"
           "~/failure_criteria/full_duplex = true\n"
           "~/failure_criteria/speed = 1000\n"
           "~/reverse_policy = true\n"
           "~/rolling_order = true\n"
           "~/notify_switches = true\n"
           "~/best_effort = false\n"
           "~/shotgun = false\n"
           "~/uplink_port_order {}\n"
           "~/uplink_port_order/active_uplink_ports[] = \"up1\"\n"
           "~/uplink_port_order/standby_uplink_ports[] = \"up2\"\n";
}

struct Row {
    uint32_t type, propClass;
    const char *key;
    Bytes value;
    const char *place;   // the place of the saved object; replaces `~` in its lines
    std::string content; // the store's lines after the save
    Loaded loaded;
    bool isForVswitchesOnly = false; // etherswitches save nothing
};

const std::vector<Row> kRows = {
    // clang-format off
    {0, kGlobal, "com.orbeno.common.resv.threshold", Bytes().U32(75), "/resource_management/pnic_capacity_ratio_for_reservation",
     "~ = 75\n",
     Everywhere("com.orbeno.common.resv.threshold", Bytes().U32(75))},
    {0, kPort, "com.orbeno.common.port.connectid", Bytes().U32(0xfffffffe), "/connection_cookie",
     "~ = 4294967294\n",
     Everywhere("com.orbeno.common.port.connectid", Bytes().U32(0xfffffffe))},
    {0, kPort, "com.orbeno.vswitch.port.priority", Bytes().U32(5), "/settings/vlan/priority",
     "~ = 5\n",
     Everywhere("com.orbeno.vswitch.port.priority", Bytes().U32(5)) + ByFamily("com.orbeno.etherswitch.port.vlan", "com.orbeno.vswitch.port.vlan", Bytes().Zeros(8))},
    {1, kGlobal, "com.orbeno.common.alias", Bytes().Text("a text", 7), "/name",
     "~ = \"a text\"\n",
     Everywhere("com.orbeno.common.alias", Bytes().Text("a text", 7))},
    {1, kGlobal, "com.orbeno.common.respools.version", Bytes().Text("a text", 7), "/resource_management/network_resource_control_version",
     "~ = \"a text\"\n",
     Everywhere("com.orbeno.common.respools.version", Bytes().Text("a text", 7))},
    {1, kHost, "com.orbeno.common.host.portset", Bytes().Text("a text", 7), "/portset_name",
     "~ = \"a text\"\n",
     Everywhere("com.orbeno.common.host.portset", Bytes().Text("a text", 7))},
    {1, kPort, "com.orbeno.common.port.alias", Bytes().Text("a text", 7), "/name",
     "~ = \"a text\"\n",
     Everywhere("com.orbeno.common.port.alias", Bytes().Text("a text", 7))},
    {1, kPort, "com.orbeno.common.port.portgroupid", Bytes().Text("a text", 7), "/port_group_key",
     "~ = \"a text\"\n",
     Everywhere("com.orbeno.common.port.portgroupid", Bytes().Text("a text", 7))},
    {1, kPort, "com.orbeno.common.port.backingType", Bytes().Text("a text", 7), "/settings/backing_type",
     "~ = \"a text\"\n",
     Everywhere("com.orbeno.common.port.backingType", Bytes().Text("a text", 7))},
    {1, kGlobal, "com.orbeno.etherswitch.multicastFilter", Bytes().Text("snooping", 9), "/settings/multicast_filtering_mode",
     "~ = \"snooping\"\n",
     ByFamily("com.orbeno.etherswitch.multicastFilter", "com.orbeno.vswitch.multicastFilter", Bytes().Text("snooping", 9))},
    {1, kGlobal, "com.orbeno.vswitch.multicastFilter", Bytes().Text("snooping", 9), "/settings/multicast_filtering_mode",
     "~ = \"snooping\"\n",
     ByFamily("com.orbeno.etherswitch.multicastFilter", "com.orbeno.vswitch.multicastFilter", Bytes().Text("snooping", 9))},
    {2, kGlobal, "com.orbeno.etherswitch.beaconTimeout", Bytes().U32(0xfffffff6), "/settings/beacon",
     "~ = -10\n",
     Everywhere("com.orbeno.etherswitch.beaconTimeout", Bytes().U32(0xfffffff6))},
    {3, kGlobal, "com.orbeno.common.respools.sched", Bytes().U8(1), "/resource_management/enable",
     "~ = true\n",
     Everywhere("com.orbeno.common.respools.sched", Bytes().U8(1))},
    {4, kGlobal, "com.orbeno.common.opaqueDvs", Bytes().Text("true", 5), "/is_opaque",
     "~ = true\n",
     Everywhere("com.orbeno.common.opaqueDvs", Bytes().Text("true", 5).U8('f'))},
    {5, kGlobal, "com.orbeno.etherswitch.ipv4addr", Bytes().U8(192).U8(0).U8(2).U8(1), "/switch_address",
     "~ = \"192.0.2.1\"\n",
     Everywhere("com.orbeno.etherswitch.ipv4addr", Bytes().U8(192).U8(0).U8(2).U8(1))},
    {6, kGlobal, "com.orbeno.etherswitch.pvlanMap", Bytes().U16(10).U16(11).U8(2).Zeros(3), "/settings/pvlans",
     "~[generated-1] {}\n"
     "~[generated-1]/primary_id = 10\n"
     "~[generated-1]/secondary_id = 11\n"
     "~[generated-1]/type = \"ISOLATED\"\n",
     PrivateVlans(Bytes().U16(10).U16(11).U8(2).Zeros(3))},
    {7, kGlobal, "com.orbeno.vswitch.pvlanMap", Bytes().U16(10).U16(11).U8(2).Zeros(3), "/settings/pvlans",
     "~[generated-1] {}\n"
     "~[generated-1]/primary_id = 10\n"
     "~[generated-1]/secondary_id = 11\n"
     "~[generated-1]/type = \"ISOLATED\"\n",
     PrivateVlans(Bytes().U16(10).U16(11).U8(2).Zeros(3))},
    {8, kGlobal, "com.orbeno.etherswitch.cdp", Bytes().U8(1).U8(3), "/settings/link_discovery_protocol",
     "~ {}\n"
     "~/protocol = \"LLDP\"\n"
     "~/operation = \"BOTH\"\n",
     Everywhere("com.orbeno.etherswitch.cdp", Bytes().U8(1).U8(3))},
    {9, kGlobal, "com.orbeno.etherswitch.mirrorSessions", MirrorTable(), "/settings/vspans",
     kSession,
     ByFamily("com.orbeno.etherswitch.mirrorSessions", "com.orbeno.vswitch.mirrorSessions", LoadedMirrorTable())},
    {9, kGlobal, "com.orbeno.vswitch.mirrorSessions", MirrorTable(), "/settings/vspans",
     kSession,
     ByFamily("com.orbeno.etherswitch.mirrorSessions", "com.orbeno.vswitch.mirrorSessions", LoadedMirrorTable())},
    {9, kPort, "com.orbeno.vswitch.port.mirrorSessions", MirrorTable(), "/vspans",
     kSession,
     ByFamily("com.orbeno.etherswitch.port.mirrorSessions", "com.orbeno.vswitch.port.mirrorSessions", LoadedMirrorTable())},
    {9, kPort, "com.orbeno.etherswitch.port.mirrorSessions", MirrorTable(), "/vspans",
     kSession,
     ByFamily("com.orbeno.etherswitch.port.mirrorSessions", "com.orbeno.vswitch.port.mirrorSessions", LoadedMirrorTable())},
    {10, kGlobal, "com.orbeno.etherswitch.ipfix", Bytes().U32(15).U32(60).U8(198).U8(51).U8(100).U8(7).Zeros(12).U16(4739).U32(100).U8(1).U8(0).U32(12), "/settings/ipfix",
     "~ {}\n"
     "~/idle_flow_timeout = 15\n"
     "~/active_flow_timeout = 60\n"
     "~/collector_address = \"198.51.100.7\"\n"
     "~/collector_port = 4739\n"
     "~/sampling_rate = 100\n"
     "~/internal_flows_only = true\n"
     "~/observation_domain_id = 12\n",
     Everywhere("com.orbeno.etherswitch.ipfix", Bytes().U32(15).U32(60).U8(198).U8(51).U8(100).U8(7).Zeros(12).U16(4739).U32(100).U8(1).U8(0).U32(12))},
    {11, kGlobal, "com.orbeno.common.vlanmtucheck.deploy", Bytes().U8(1).U32(60), "/health_checks",
     "~[VLAN_MTU] {}\n"
     "~[VLAN_MTU]/enable = true\n"
     "~[VLAN_MTU]/interval = 60\n",
     Everywhere("com.orbeno.common.vlanmtucheck.deploy", Bytes().U8(0).U32(60))},
    {11, kGlobal, "com.orbeno.common.teamcheck.deploy", Bytes().U8(1).U32(60), "/health_checks",
     "~[TEAMING] {}\n"
     "~[TEAMING]/enable = true\n"
     "~[TEAMING]/interval = 60\n",
     Everywhere("com.orbeno.common.teamcheck.deploy", Bytes().U8(0).U32(60))},
    {12, kGlobal, "com.orbeno.common.respools.cfg", kPool, "/resource_management/traffic_resources",
     "~[vm] {}\n"
     "~[vm]/allocation {}\n"
     "~[vm]/allocation/reservation = 500\n"
     "~[vm]/allocation/shares {}\n"
     "~[vm]/allocation/shares/shares = 100\n"
     "~[vm]/allocation/limit = -1\n",
     Everywhere("com.orbeno.common.respools.cfg", kPool)},
    {13, kGlobal, "com.orbeno.common.respools.list", Bytes().U32(2).Text("vm", 200).Text("nfs", 200), "/resource_management/network_resource_pool_keys",
     "~[] = \"vm\"\n"
     "~[] = \"nfs\"\n",
     Everywhere("com.orbeno.common.respools.list", Bytes().U32(2).Text("vm", 200).Text("nfs", 200))},
    {14, kHost, "com.orbeno.common.host.uplinkPorts", Bytes().U32(2).Text("1", 48).Text("2", 48), "/uplink_port_keys",
     "~[] = \"1\"\n"
     "~[] = \"2\"\n",
     Everywhere("com.orbeno.common.host.uplinkPorts", Bytes().U32(2).Text("1", 48).Text("2", 48))},
    {15, kGlobal, "com.orbeno.common.version", Bytes().U32(8), "/product/version",
     "~ = \"7.0.2\"\n",
     Everywhere("com.orbeno.common.version", Bytes().U32(8))},
    {16, kGlobal, "com.orbeno.etherswitch.lacp", Bytes().U32(1).Text("lag", 65).Text("key", 16).U32(1).U32(20).U32(2), "/settings/lacp_groups",
     "~[key] {}\n"
     "~[key]/name = \"lag\"\n"
     "~[key]/mode = \"ACTIVE\"\n"
     "~[key]/load_balance_algorithm = \"SRCID\"\n"
     "~[key]/uplink_num = 2\n",
     Everywhere("com.orbeno.etherswitch.lacp", Bytes().U32(1).Text("lag", 65).Text("key", 16).U32(1).U32(20).U32(2))},
    {17, kPort, "com.orbeno.etherswitch.port.teaming", Teaming(4), "/settings/uplink_teaming_policy",
     TeamingContent("LOADBALANCE_LOADBASED"),
     ByFamily("com.orbeno.etherswitch.port.teaming", "com.orbeno.vswitch.port.teaming.policy", LoadedTeaming(5))},
    {18, kGlobal, "com.orbeno.vswitch.teaming", Teaming(2), "/settings/uplink_teaming_policy",
     TeamingContent("LOADBALANCE_SRCMAC"),
     OnVswitches("com.orbeno.vswitch.teaming", LoadedTeaming(2)), true},
    {18, kPort, "com.orbeno.vswitch.port.teaming.policy", Teaming(5), "/settings/uplink_teaming_policy",
     TeamingContent("FAILOVER_EXPLICIT"),
     OnVswitches("com.orbeno.vswitch.port.teaming.policy", LoadedTeaming(4)), true},
    {19, kGlobal, "com.orbeno.common.portset.ovl", Bytes().Text("false", 6), "/ovl_enabled",
     "~ = false\n",
     Everywhere("com.orbeno.common.portset.ovl", Bytes().Text("false", 5))},
    {20, kGlobal, "com.orbeno.common.uplinkPorts", Bytes().U32(2).Text("up1", 81).Text("up2", 81), "/uplink_port_names",
     "~[] = \"up1\"\n"
     "~[] = \"up2\"\n",
     Everywhere("com.orbeno.common.uplinkPorts", Bytes().U32(2).Text("up1", 81).Text("up2", 81))},
    {21, kGlobal, "com.orbeno.common.portset.mtu", Bytes().U32(9000), "/settings/max_mtu",
     "~ = 9000\n",
     Mtu(9000)},
    {21, kGlobal, "com.orbeno.vswitch.mtu", Bytes().U32(9000), "/settings/max_mtu",
     "~ = 9000\n",
     Mtu(9000)},
    {21, kGlobal, "com.orbeno.etherswitch.mtu", Bytes().U32(9000), "/settings/max_mtu",
     "~ = 9000\n",
     Mtu(9000)},
    {23, kPort, "com.orbeno.etherswitch.port.txUplink", Bytes().Text("always", 7), "/settings/tx_uplink",
     "~ = true\n",
     ByFamily("com.orbeno.etherswitch.port.txUplink", "com.orbeno.vswitch.port.txUplink", Bytes().Text("always", 7))},
    {23, kPort, "com.orbeno.vswitch.port.txUplink", Bytes().Text("always", 7), "/settings/tx_uplink",
     "~ = true\n",
     ByFamily("com.orbeno.etherswitch.port.txUplink", "com.orbeno.vswitch.port.txUplink", Bytes().Text("always", 7))},
    {24, kPort, "com.orbeno.etherswitch.port.vlan", Bytes().U16(1).U32(0).U16(2).U16(1).U16(10).U16(20).U16(30), "/settings/vlan",
     "~ {}\n"
     "~/trunk_vlan_ids[generated-1] {}\n"
     "~/trunk_vlan_ids[generated-1]/start = 1\n"
     "~/trunk_vlan_ids[generated-1]/end = 10\n"
     "~/trunk_vlan_ids[generated-2] {}\n"
     "~/trunk_vlan_ids[generated-2]/start = 20\n"
     "~/trunk_vlan_ids[generated-2]/end = 30\n",
     ByFamily("com.orbeno.etherswitch.port.vlan", "com.orbeno.vswitch.port.vlan", Bytes().U16(1).U32(0).U16(2).U16(1).U16(10).U16(20).U16(30))},
    {25, kPort, "com.orbeno.vswitch.port.vlan", Bytes().U16(1).U32(0).U16(2).U16(1).U16(10).U16(20).U16(30), "/settings/vlan",
     "~ {}\n"
     "~/trunk_vlan_ids[generated-1] {}\n"
     "~/trunk_vlan_ids[generated-1]/start = 1\n"
     "~/trunk_vlan_ids[generated-1]/end = 10\n"
     "~/trunk_vlan_ids[generated-2] {}\n"
     "~/trunk_vlan_ids[generated-2]/start = 20\n"
     "~/trunk_vlan_ids[generated-2]/end = 30\n",
     OnVswitches("com.orbeno.vswitch.port.vlan", Bytes().U16(1).U32(0).U16(2).U16(1).U16(10).U16(20).U16(30)), true},
    {26, kPort, "com.orbeno.common.port.shaper.input", Bytes().U64(1000000).U64(2000000).U64(4096), "/settings/in_shaping_policy",
     "~ {}\n"
     "~/enabled = true\n"
     "~/average_bandwidth = 8000000\n"
     "~/peak_bandwidth = 16000000\n"
     "~/burst_size = 32768\n",
     Everywhere("com.orbeno.common.port.shaper.input", Bytes().U64(1000000).U64(2000000).U64(4096))},
    {26, kPort, "com.orbeno.common.port.shaper.output", Bytes().U64(1000000).U64(2000000).U64(4096), "/settings/out_shaping_policy",
     "~ {}\n"
     "~/enabled = true\n"
     "~/average_bandwidth = 8000000\n"
     "~/peak_bandwidth = 16000000\n"
     "~/burst_size = 32768\n",
     Everywhere("com.orbeno.common.port.shaper.output", Bytes().U64(1000000).U64(2000000).U64(4096))},
    {27, kPort, "com.orbeno.etherswitch.port.security", Bytes().U32(5), "/settings/mac_management_policy",
     "~ {}\n"
     "~/allow_promiscuous = false\n"
     "~/allow_mac_change = true\n"
     "~/allow_forged_transmit = false\n",
     ByFamily("com.orbeno.etherswitch.port.security", "com.orbeno.vswitch.port.security", Bytes().U32(5))},
    {28, kPort, "com.orbeno.vswitch.port.security", Bytes().U32(5), "/settings/mac_management_policy",
     "~ {}\n"
     "~/allow_promiscuous = false\n"
     "~/allow_mac_change = true\n"
     "~/allow_forged_transmit = false\n",
     ByFamily("com.orbeno.etherswitch.port.security", "com.orbeno.vswitch.port.security", Bytes().U32(5))},
    {29, kPort, "com.orbeno.common.port.dvfilter", Bytes().U32(1).U32(0xffffffff).Text("agent", 40).U32(1).U32(1).U32(7).Text("mode=watch", 256), "/settings/filter_policy",
     "~ {}\n"
     "~/network_filters[-1] {}\n"
     "~/network_filters[-1]/agent_name = \"agent\"\n"
     "~/network_filters[-1]/slot_number = \"4294967295\"\n"
     "~/network_filters[-1]/on_failure = \"FAIL_OPEN\"\n"
     "~/network_filters[-1]/parameters[] = \"mode=watch\"\n",
     Everywhere("com.orbeno.common.port.dvfilter", Bytes().U32(1).U32(0xffffffff).Text("agent", 40).U32(1).U32(1).U32(0).Text("mode=watch", 256))},
    {31, kPort, "com.orbeno.common.port.block", Bytes().Text("false", 6), "/settings/blocked",
     "~ = false\n",
     Everywhere("com.orbeno.common.port.block", Bytes().Text("false", 5))},
    {32, kPort, "com.orbeno.common.port.ptAllowed", Bytes().U32(2), "/settings/vm_direct_path_gen2_allowed",
     "~ = true\n",
     Everywhere("com.orbeno.common.port.ptAllowed", Bytes().U32(2))},
    {34, kPort, "com.orbeno.etherswitch.port.ipfix", Bytes().Text("enabled", 8), "/settings/ipfix_enabled",
     "~ = true\n",
     Everywhere("com.orbeno.etherswitch.port.ipfix", Bytes().Text("enabled", 8))},
    {35, kPort, "com.orbeno.etherswitch.port.lacp", Bytes().U32(1).U32(2), "/settings/lacp_policy",
     "~ {}\n"
     "~/enabled = true\n"
     "~/mode = \"PASSIVE\"\n",
     Everywhere("com.orbeno.etherswitch.port.lacp", Bytes().U32(1).U32(2))},
    {36, kPort, "com.orbeno.common.port.respools.cfg", kPool, "/settings/network_resource_pools",
     "",
     Loaded()},

    // clang-format on
};

struct BothDirections : ConverterTest {
    // The saved lines, without those of the objects on the path.
    [[nodiscard]] std::string Content(const std::string &place) const {
        std::string lines;
        std::istringstream dump(fake_store::Dump(object));
        for (std::string line; std::getline(dump, line);) {
            const std::string path = line.substr(0, line.find(' '));
            if (path != place && (place.starts_with(path + "/") || !IsSaved(path))) continue;
            lines += (line.starts_with(place) ? "~" + line.substr(place.size()) : line) + "\n";
        }
        return lines;
    }
    // The class, the version and the flag exist before the save, so they load too.
    static bool IsSaved(const std::string &path) {
        return !path.starts_with("/product") && path != "/ovl_enabled";
    }
    static void LeaveOut(const std::string &key, Properties *loaded) {
        for (const char *always : {"com.orbeno.common.version", "com.orbeno.common.portset.ovl"}) {
            if (key != always) loaded->erase(always);
        }
    }
};

TEST_F(BothDirections, OfEveryKeyOnEveryClass) {
    for (const Row &row : kRows) {
        for (int i = 0; i < 3; ++i) {
            SCOPED_TRACE(std::string(row.key) + " on " + kClasses[i]);
            fake_store::Reset();
            configstore::DestroyObject(object);
            ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "id", "{}", &object));
            BecomeSwitch(kClasses[i]);
            ASSERT_EQ(0, Save(row.propClass, row.key, row.value));
            const bool isNothing = row.isForVswitchesOnly && i == 0;
            EXPECT_EQ(isNothing ? "" : row.content, Content(row.place));
            Properties loaded = Load(row.propClass);
            EXPECT_EQ(0, loadStatus);
            LeaveOut(row.key, &loaded);
            EXPECT_EQ(row.loaded.on[i], loaded);
        }
    }
}

TEST_F(BothDirections, HasARowForEveryKeyAndConverter) {
    std::set<std::string> keys;
    std::set<uint32_t> types = {22, 30,
                                33}; // unmapped_test.cpp covers the "DEFAULT" rows; 30 is unassigned
    for (const Row &row : kRows) {
        keys.insert(row.key);
        types.insert(row.type);
    }
    EXPECT_EQ(37u, types.size());
    for (const uint32_t propClass : {kGlobal, kHost, kPort}) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row)
            EXPECT_TRUE(keys.contains(row->key) || std::string(row->key) == "DEFAULT") << row->key;
    }
}

} // namespace
