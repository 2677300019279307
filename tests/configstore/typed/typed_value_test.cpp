/* SPDX-License-Identifier: Apache-2.0 */
// Property values as trees: what people are shown, what they may write, and how they are told that something
// is wrong.

#include "configstore/typed/typed_value.h"

#include "configstore/converters/converter_fixture.h"

using namespace converter_test;
using dvs::typed::Build;
using dvs::typed::Built;
using dvs::typed::Describe;
using dvs::typed::Node;
using dvs::typed::State;
using dvs::typed::View;

namespace {

Node Text(const char *text, const char *name = "") {
    Node node;
    node.kind = Node::Kind::kText;
    node.text = text;
    node.name = name;
    return node;
}
Node Number(int64_t number, const char *name = "") {
    Node node;
    node.kind = Node::Kind::kNumber;
    node.number = number;
    node.name = name;
    return node;
}
Node Bool(bool flag, const char *name = "") {
    Node node;
    node.kind = Node::Kind::kBool;
    node.flag = flag;
    node.name = name;
    return node;
}
Node Group(Node::Kind kind, std::vector<Node> items, const char *name = "") {
    Node node;
    node.kind = kind;
    node.items = std::move(items);
    node.name = name;
    return node;
}
Node List(std::vector<Node> items, const char *name = "") {
    return Group(Node::Kind::kList, std::move(items), name);
}
Node Object(std::vector<Node> items, const char *name = "") {
    return Group(Node::Kind::kObject, std::move(items), name);
}

constexpr const char *kVlan = "com.orbeno.etherswitch.port.vlan";
constexpr const char *kTeaming = "com.orbeno.etherswitch.port.teaming";

Bytes Teaming(uint32_t policy) {
    Bytes value;
    value.U32(policy).U32(0x220).Zeros(4).U32(0x20).U32(2).U32(1).Text("up1", 81).Text("up2", 81).Text("up3",
                                                                                                       81);
    return value.Zeros(2616 - value.size());
}

struct Typed : ConverterTest {};

TEST_F(Typed, SummarizesWhatPeopleLookFor) {
    const struct {
        uint32_t propClass;
        const char *key;
        Bytes value;
        const char *summary;
    } rows[] = {
        {kPort, kVlan, Bytes().U16(0).U16(100).U32(0), "VLAN 100"},
        {kPort, kVlan, Bytes().U16(2).U16(7).U32(0), "private VLAN 7"},
        {kPort, kVlan, Bytes().U16(1).U32(0).U16(3).U16(1).U16(10).U16(20).U16(30).U16(40).U16(40),
         "trunk 1-10,20-30,40"},
        {kPort, "com.orbeno.vswitch.port.vlan", Bytes().U16(0).U16(5).U32(0), "VLAN 5"},
        {kPort, kTeaming, Teaming(3), "LOADBALANCE_SRCID, active up1, up2, standby up3"},
        {kPort, "com.orbeno.common.port.shaper.input", Bytes().U64(1000000).U64(2000000).U64(100),
         "average 8 Mbit/s, peak 16 Mbit/s, burst 800 bit"},
        {kPort, "com.orbeno.etherswitch.port.security", Bytes().U32(5),
         "rejects promiscuous mode, forged transmits"},
        {kPort, "com.orbeno.vswitch.port.security", Bytes().U32(0), "rejects nothing"},
        {kPort, "com.orbeno.common.port.alias", Bytes().Text("web", 4), "web"},
        {kPort, "com.orbeno.common.port.block", Bytes().Text("true", 5).U8('f'), "true"},
        {kGlobal, "com.orbeno.etherswitch.mtu", Bytes().U32(9000), "9000"},
        {kGlobal, "com.orbeno.common.version", Bytes().U32(109), "7.0.3"},
        {kGlobal, "com.orbeno.etherswitch.ipv4addr", Bytes().U8(10).U8(0).U8(0).U8(1), "10.0.0.1"},
        {kGlobal, "com.orbeno.etherswitch.cdp", Bytes().U8(1).U8(3), "protocol LLDP, operation BOTH"},
        {kGlobal, "com.orbeno.vswitch.pvlanMap", Bytes().U16(10).U16(11).U8(2).Zeros(3), "10/11 ISOLATED"},
        {kGlobal, "com.orbeno.common.uplinkPorts", Bytes().U32(2).Text("a", 81).Text("b", 81), "a, b"},
        {kHost, "com.orbeno.common.host.uplinkPorts", Bytes().U32(1).Text("p1", 48), "p1"},
        {kGlobal, "com.orbeno.etherswitch.lacp", Bytes().U32(0), "none"},
        {kPort, "com.orbeno.common.port.respools.cfg",
         Bytes().U32(1).Text("vm", 128).Zeros(1).U32(50).Zeros(67).U32(100).U32(0xffffffff).Zeros(4),
         "(key vm, allocation (reservation 50, limit -1, shares (shares 100)))"},
    };
    for (const auto &row : rows) {
        const View view = Describe(row.propClass, row.key, row.value);
        EXPECT_EQ(State::kTyped, view.state) << row.key << view.reason;
        EXPECT_EQ(row.summary, view.summary) << row.key;
    }
    EXPECT_EQ("", messages);
}

TEST_F(Typed, ExactValuesBuildTheSameBytes) {
    const struct {
        uint32_t propClass;
        const char *key;
        Bytes value;
    } rows[] = {
        {kPort, kVlan, Bytes().U16(0).U16(100).U32(0)},
        {kPort, kVlan, Bytes().U16(1).U32(0).U16(2).U16(1).U16(10).U16(20).U16(30)},
        {kPort, kTeaming, Teaming(4)}, // shown by the kernel's own name, which a load understands
        {kPort, kTeaming, Teaming(5)},
        {kPort, "com.orbeno.vswitch.port.teaming.policy", Teaming(5)},
        {kPort, "com.orbeno.common.port.shaper.output", Bytes().U64(1).U64(2).U64(3)},
        {kGlobal, "com.orbeno.common.version", Bytes().U32(109)},
        {kGlobal, "com.orbeno.common.version", Bytes().U32(9)},
        {kGlobal, "com.orbeno.common.version", Bytes().U32(100)},
        {kGlobal, "com.orbeno.vswitch.pvlanMap", Bytes().U16(10).U16(11).U8(2).Zeros(3)},
        {kGlobal, "com.orbeno.etherswitch.pvlanMap", Bytes().U16(10).U16(11).U8(1).Zeros(3)},
        {kGlobal, "com.orbeno.common.teamcheck.deploy", Bytes().U8(1).U32(30)},
        {kGlobal, "com.orbeno.vswitch.mtu", Bytes().U32(1500)},
        {kGlobal, "com.orbeno.vswitch.multicastFilter", Bytes().Text("snooping", 9)},
    };
    for (const auto &row : rows) {
        const dvs::typed::Context context{row.value.size() == 4 ? row.value[0] : 0u};
        const View view = Describe(row.propClass, row.key, row.value, context);
        ASSERT_EQ(State::kTyped, view.state) << row.key << view.reason;
        EXPECT_TRUE(view.exact) << row.key << (view.differences.empty() ? "" : view.differences[0]);
        const Built built = Build(row.propClass, row.key, view.tree, context);
        EXPECT_TRUE(built.ok) << row.key << built.reason;
        EXPECT_EQ(row.value, built.bytes) << row.key;
        EXPECT_TRUE(built.differences.empty()) << row.key << built.differences[0];
    }
}

TEST_F(Typed, NamesTheFieldsThatATreeDoesNotKeep) {
    Bytes policy = Teaming(3);
    policy[5] = 0; // without the mark of a load
    View view = Describe(kPort, kTeaming, policy);
    EXPECT_FALSE(view.exact);
    ASSERT_EQ(1u, view.differences.size());
    EXPECT_EQ("failure_flags: 0x20 check_beacon becomes 0x220 check_beacon from_store", view.differences[0]);

    view = Describe(kPort, kVlan, Bytes().U16(0).U16(100).U32(0).U8(9));
    EXPECT_EQ("(behind the record): 09 becomes absent", view.differences.at(0));

    view = Describe(kPort, "com.orbeno.etherswitch.port.ipfix", Bytes().Text("disabled", 9));
    EXPECT_EQ("loads as no property", view.differences.at(0));

    view = Describe(kPort, "com.orbeno.common.port.alias", Bytes().Text("a", 5));
    EXPECT_EQ("length: 5 becomes 2", view.differences.at(0));

    view = Describe(kPort, "com.orbeno.etherswitch.port.lacp", Bytes().U8(1).U8(9).U16(0).U32(1));
    EXPECT_EQ("padding: 09 00 00 becomes 00 00 00", view.differences.at(0));

    view =
        Describe(kGlobal, "com.orbeno.common.uplinkPorts", Bytes().U32(1).Text(std::string("a\0z", 3), 81));
    EXPECT_EQ("bytes behind the end of a text", view.differences.at(0));
}

TEST_F(Typed, SaysWhereAValueIsDamaged) {
    const struct {
        uint32_t propClass;
        const char *key;
        Bytes value;
        const char *reason;
    } rows[] = {
        {kPort, kVlan, Bytes().U8(0), "at byte 1: ends inside flags"},
        {kPort, kVlan, Bytes().U16(1).U32(0).U16(2).U32(0),
         "at byte 12: ranges is said to have 2 elements, 4 bytes are left for them"},
        {kGlobal, "com.orbeno.etherswitch.cdp", Bytes().U8(0).U8(9),
         "at byte 1: operation is 9, which has no name"},
        {kPort, "com.orbeno.common.port.dvfilter",
         Bytes().U32(1).U32(1).Text(std::string(40, 'a'), 40).U32(0x101).U32(1).Zeros(260 * 257),
         "network_filters[0].agent_name has no end inside its field"},
        {kGlobal, "com.orbeno.common.uplinkPorts",
         Bytes().U32(2).Text("u", 81).Text(std::string(81, 'u'), 81), "[1] has no end inside its field"},
        {kGlobal, "com.orbeno.common.version", Bytes().U32(13), "its converter refuses it with status -1"},
        {kPort, "com.orbeno.common.port.dvfilter", Bytes().U32(1),
         "at byte 4: filters is said to have 1 elements, 0 bytes are left for them"},
    };
    for (const auto &row : rows) {
        const View view = Describe(row.propClass, row.key, row.value);
        EXPECT_EQ(State::kDamaged, view.state) << row.key;
        EXPECT_EQ(row.reason, view.reason) << row.key;
    }
}

TEST_F(Typed, LeavesUnmappedPropertiesAlone) {
    for (const char *key : {"com.acme.other", "DEFAULT", "", "com.orbeno.common.port.vlan"}) {
        EXPECT_EQ(State::kUnmapped, Describe(kPort, key, Bytes().U8(1)).state) << key;
        const Built built = Build(kPort, key, Text("x"));
        EXPECT_FALSE(built.ok);
        EXPECT_EQ("the property has no typed form: its meaning is not known", built.reason);
    }
    EXPECT_EQ(State::kUnmapped, Describe(7, kVlan, Bytes().U8(1)).state);
}

TEST_F(Typed, BuildsFromWhatPeopleWrite) {
    EXPECT_EQ(Bytes().U16(0).U16(100).U32(0), Build(kPort, kVlan, Object({Number(100, "vlan_id")})).bytes);
    EXPECT_EQ(Bytes().Text("web", 4), Build(kPort, "com.orbeno.common.port.alias", Text("web")).bytes);
    EXPECT_EQ(Bytes().Text("true", 5).U8('f'),
              Build(kPort, "com.orbeno.common.port.block", Bool(true)).bytes);
    EXPECT_EQ(Bytes().U32(2), Build(kPort, "com.orbeno.common.port.ptAllowed", Bool(true)).bytes);
    EXPECT_EQ(Bytes().U8(10).U8(0).U8(0).U8(1),
              Build(kGlobal, "com.orbeno.etherswitch.ipv4addr", Text("10.0.0.1")).bytes);
    EXPECT_EQ(Bytes().U32(112), Build(kGlobal, "com.orbeno.common.version", Text("8.0.3"), {112}).bytes);
    EXPECT_EQ(Bytes().U32(12), Build(kGlobal, "com.orbeno.common.version", Text("8.0.3"), {12}).bytes);
    EXPECT_EQ(Bytes().U8(1).U32(5), Build(kGlobal, "com.orbeno.common.teamcheck.deploy",
                                          Object({Bool(true, "enabled"), Number(5, "interval")}))
                                        .bytes);
}

TEST_F(Typed, UnitsAreForDisplayOnly) {
    const Built built = Build(kPort, "com.orbeno.common.port.shaper.input",
                              Object({Bool(true, "enabled"), Number(8000, "average_bandwidth")}));
    EXPECT_EQ(Bytes().U64(1000).U64(0).U64(0), built.bytes);
    EXPECT_TRUE(built.differences.empty());
}

TEST_F(Typed, TakesInstancesAsListOrById) {
    const Node list = Object({List({Object({Number(1, "start"), Number(10, "end")})}, "trunk_vlan_ids")});
    const Node byId =
        Object({Object({Object({Number(1, "start"), Number(10, "end")}, "some-id")}, "trunk_vlan_ids")});
    const Bytes expected = Bytes().U16(1).U32(0).U16(1).U16(1).U16(10);
    EXPECT_EQ(expected, Build(kPort, kVlan, list).bytes);
    const Built built = Build(kPort, kVlan, byId);
    EXPECT_EQ(expected, built.bytes) << built.reason;
    EXPECT_TRUE(built.differences.empty());

    const Node group =
        Object({Object({Text("n", "name"), Text("ACTIVE", "mode"), Number(2, "uplink_num")}, "lag1")});
    EXPECT_EQ(Bytes().U32(1).Text("n", 65).Text("lag1", 16).U32(1).U32(0).U32(2),
              Build(kGlobal, "com.orbeno.etherswitch.lacp", group).bytes);
}

TEST_F(Typed, RefusesAnEntryThatContradictsItsName) {
    const Node group = Object({Object({Text("other", "key"), Number(2, "uplink_num")}, "lag1")});
    const Built built = Build(kGlobal, "com.orbeno.etherswitch.lacp", group);
    EXPECT_FALSE(built.ok);
    EXPECT_EQ("[0].key", built.field);
    EXPECT_EQ("is \"other\", but the entry is named \"lag1\"", built.reason);
    const Node same = Object({Object({Text("lag1", "key"), Number(2, "uplink_num")}, "lag1")});
    EXPECT_TRUE(Build(kGlobal, "com.orbeno.etherswitch.lacp", same).ok);
    // As the store names it.
    const Node filters =
        Object({Object({Object({Text("4294967295", "slot_number")}, "-1")}, "network_filters")});
    EXPECT_TRUE(Build(kPort, "com.orbeno.common.port.dvfilter", filters).ok);
}

TEST_F(Typed, NamesTheFieldAtFault) {
    const std::string longName(81, 'x');
    const Node uplinks = Object(
        {Object({List({Text("a"), Text(longName.c_str())}, "active_uplink_ports")}, "uplink_port_order")});
    const struct {
        uint32_t propClass;
        const char *key;
        Node tree;
        const char *field, *reason;
    } rows[] = {
        {kPort, kVlan, Object({Number(1, "vlanid")}), "vlanid",
         "is no field of this value; there are vlan_id, pvlan_id, trunk_vlan_ids"},
        {kPort, kVlan, Object({Number(70000, "vlan_id")}), "vlan_id",
         "70000 is no VLAN id, expected 0 to 4095"},
        {kPort, kVlan, Object({Number(-1, "vlan_id")}), "vlan_id", "-1 is no VLAN id, expected 0 to 4095"},
        {kPort, kVlan, Object({Text("100", "vlan_id")}), "vlan_id", "is a text, expected a number"},
        {kPort, kVlan, Number(100), "", "is a number, expected an object"},
        {kPort, kVlan, Object({List({Object({Bool(true, "start")})}, "trunk_vlan_ids")}),
         "trunk_vlan_ids[0].start", "is a truth value, expected a number"},
        {kPort, kVlan, Object({List({Number(3)}, "trunk_vlan_ids")}), "trunk_vlan_ids[0]",
         "is a number, expected an object"},
        {kPort, kVlan, Object({Text("1-10", "trunk_vlan_ids")}), "trunk_vlan_ids",
         "is a text, expected a list"},
        {kPort, kTeaming, uplinks, "uplink_port_order.active_uplink_ports[1]",
         "is 81 bytes long, at most 80 fit"},
        {kPort, kTeaming, Object({Text("NONE", "policy")}), "policy",
         "\"NONE\" is not known; expected one of LOADBALANCE_IP, LOADBALANCE_SRCMAC, LOADBALANCE_SRCID, "
         "FAILOVER_EXPLICIT, "
         "LOADBALANCE_LOADBASED"},
        {kPort, "com.orbeno.common.port.block", Text("true"), "", "is a text, expected a truth value"},
        {kGlobal, "com.orbeno.etherswitch.lacp", List({Object({Text("n", "name")})}), "[0].key",
         "is missing; it tells the entries apart"},
        {kGlobal, "com.orbeno.etherswitch.lacp", List({Object({Text("lag1", "key")})}), "[0].uplink_num",
         "is missing; the value needs it"},
        {kGlobal, "com.orbeno.etherswitch.cdp", Object({Text("LLDP", "protocol")}), "operation",
         "is missing; the value needs it"},
        {kGlobal, "com.orbeno.common.respools.cfg",
         List({Object({Text("p", "key")}), Object({Text("p", "key")})}), "[1].key", "\"p\" is there twice"},
        {kGlobal, "com.orbeno.etherswitch.ipv4addr", Text("10.0.0.300"), "",
         "\"10.0.0.300\" is no IPv4 address, expected one as 192.0.2.1"},
        {kGlobal, "com.orbeno.etherswitch.beaconTimeout", Number(1LL << 40), "",
         "1099511627776 is out of range, expected -2147483648 to 2147483647"},
        {kGlobal, "com.orbeno.common.uplinkPorts", List({}), "",
         "is what there is without the property; leave the property out"},
        {kPort, "com.orbeno.etherswitch.port.ipfix", Bool(false), "",
         "is what there is without the property; leave the property out"},
    };
    for (const auto &row : rows) {
        const Built built = Build(row.propClass, row.key, row.tree);
        EXPECT_FALSE(built.ok) << row.key;
        EXPECT_EQ(row.field, built.field) << row.reason;
        EXPECT_EQ(row.reason, built.reason);
    }
    Node nul = Text("");
    nul.text = std::string("a\0b", 3);
    EXPECT_EQ("contains a NUL", Build(kPort, "com.orbeno.common.port.alias", nul).reason);
    EXPECT_EQ("", messages);
}

// A load looks for them beside their object.
TEST_F(Typed, FailureCriteriaAreWrittenAsTheyAreGiven) {
    const Node criteria = Object({Number(10, "percentage"), Bool(true, "full_duplex"), Number(100, "speed"),
                                  Bool(true, "check_beacon")},
                                 "failure_criteria");
    const Built built = Build(kPort, kTeaming, Object({criteria}));
    ASSERT_TRUE(built.ok) << built.reason;
    EXPECT_TRUE(built.differences.empty()) << built.differences[0];
    const View view = Describe(kPort, kTeaming, built.bytes);
    EXPECT_TRUE(view.exact);
    EXPECT_EQ(10, view.tree.Find("failure_criteria")->Find("percentage")->number);
}

TEST_F(Typed, TellsWhatReadsBackOtherwise) {
    const Node filters = Object({List({Object({Text("01", "slot_number")})}, "network_filters")});
    const Built built = Build(kPort, "com.orbeno.common.port.dvfilter", filters);
    ASSERT_EQ(1u, built.differences.size());
    EXPECT_EQ("network_filters[0].slot_number: 01 reads back as 1", built.differences[0]);
}

TEST_F(Typed, LeavesTheConvertersValuesAsTheyWere) {
    BecomeSwitch("cswitch", "OVL 1.0");
    (void)Describe(kPort, kVlan, Bytes().U16(0).U16(100).U32(0));
    (void)Build(kPort, kVlan, Object({Number(100, "vlan_id")}));
    EXPECT_EQ(2u, dvsSwitchClass);
    EXPECT_TRUE(dvsWidePortRecords);
    EXPECT_EQ(10, dvsconfigstore_debug);
}

TEST_F(Typed, TheOverlayFlagIsItselfWhateverTheVersion) {
    for (const uint32_t version : {8u, 100u, 110u}) {
        for (const bool flag : {true, false}) {
            const Built built =
                Build(DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.portset.ovl", Bool(flag), {version});
            EXPECT_TRUE(built.ok) << built.reason;
            EXPECT_TRUE(built.differences.empty()) << version << flag;
        }
    }
}

// A store that fails is a store without memory: there is an answer, with a reason, and nothing is leaked.
TEST_F(Typed, AnswersWhateverTheStoreDoes) {
    const Node tree = Object({Bool(true, "reverse_policy"), Text("LOADBALANCE_IP", "policy"),
                              Object({List({Text("u")}, "active_uplink_ports")}, "uplink_port_order")});
    const Node trunk = Object({List({Object({Number(1, "start")})}, "trunk_vlan_ids")});
    const std::pair<const char *, const Node &> builds[] = {{kTeaming, tree}, {kVlan, trunk}};
    for (const auto &[key, node] : builds) {
        for (int call = 1;; ++call) {
            fake_store::FailCall(call, configstore::NO_MEMORY);
            const Built built = Build(kPort, key, node);
            if (!fake_store::Failed()) break;
            EXPECT_EQ(built.ok, built.reason.empty()) << call;
        }
        fake_store::FailCall(0);
    }
    const std::pair<const char *, Bytes> views[] = {
        {kTeaming, Teaming(4)},
        {kVlan, Bytes().U16(1).U32(0).U16(1).U16(3).U16(4)},
        {"com.orbeno.etherswitch.port.lacp", Bytes().U32(1).U32(1)},
        {"com.orbeno.common.port.alias", Bytes().Text("a", 2)}};
    for (const auto &[key, value] : views) {
        for (int call = 1;; ++call) {
            fake_store::FailCall(call, configstore::NO_MEMORY);
            const View view = Describe(kPort, key, value);
            if (!fake_store::Failed()) break;
            EXPECT_EQ(view.state == State::kDamaged, !view.reason.empty()) << call;
            EXPECT_TRUE(view.state == State::kDamaged || view.exact || !view.differences.empty())
                << key << call;
        }
        fake_store::FailCall(0);
    }
}

} // namespace
