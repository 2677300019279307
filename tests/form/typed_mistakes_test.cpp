/* SPDX-License-Identifier: Apache-2.0 */
// Common mistakes in typed values: each is rejected with its full path and the reason.

#include <gtest/gtest.h>

#include "form/error.h"
#include "form/json/codec.h"

namespace {

using namespace dvs::form;

// In the port's list; the path of every error begins with it.
constexpr std::string_view kPlace = "$.switches[0].ports[0].properties[0].typed";

void ExpectRefusal(const std::string &name, const std::string &typed, const std::string &place,
                   const std::string &why) {
    const std::string document =
        R"({"switches": [{"id": "s", "version": 8, "class": "etherswitch", "ports": [{"id": "7", "properties": [
            {"name": "com.orbeno.)" +
        name + "\", \"typed\": " + typed + "}]}]}]}";
    try {
        (void)StateFromJsonText(document);
        ADD_FAILURE() << "taken: " << typed;
    } catch (const Error &error) {
        EXPECT_EQ(error.kind, ErrorKind::Malformed);
        EXPECT_EQ(error.path, std::string(kPlace) + place) << error.why;
        EXPECT_EQ(error.why, why);
    }
}

constexpr const char *kVlan = "etherswitch.port.vlan";
constexpr const char *kTeaming = "etherswitch.port.teaming";
constexpr const char *kSessions = "etherswitch.port.mirrorSessions";

TEST(TypedMistakes, WrongType) {
    ExpectRefusal(kVlan, R"({"vlan_id": "100"})", ".vlan_id", "is a text, expected a number");
    ExpectRefusal(kVlan, R"({"trunk_vlan_ids": [5]})", ".trunk_vlan_ids[0]",
                  "is a number, expected an object");
    ExpectRefusal(kVlan, R"({"vlan_id": 1.5})", ".vlan_id", "it is no whole number");
    ExpectRefusal(kVlan, "null", "", "is null, expected an object");
    ExpectRefusal("common.port.dvfilter", R"({"network_filters": [{"slot_number": 3}]})",
                  ".network_filters[0].slot_number", "is a number, expected a text");
}

TEST(TypedMistakes, UnknownMember) {
    ExpectRefusal(kVlan, R"({"vlanid": 100})", ".vlanid",
                  "is no field of this value; there are vlan_id, pvlan_id, trunk_vlan_ids");
    ExpectRefusal(
        kTeaming, R"({"failure_criteria": {"beacon": true}})", ".failure_criteria.beacon",
        "is no field of this value; there are check_beacon, lc_link_state, full_duplex, percentage, speed");
}

TEST(TypedMistakes, VlanOutOfRange) {
    ExpectRefusal(kVlan, R"({"vlan_id": 5000})", ".vlan_id", "5000 is no VLAN id, expected 0 to 4095");
    ExpectRefusal(kVlan, R"({"trunk_vlan_ids": [{"start": 1, "end": 2}, {"start": 9, "end": 4096}]})",
                  ".trunk_vlan_ids[1].end", "4096 is no VLAN id, expected 0 to 4095");
}

TEST(TypedMistakes, UnknownWord) {
    ExpectRefusal(kTeaming, R"({"policy": "ROUNDROBIN"})", ".policy",
                  "\"ROUNDROBIN\" is not known; expected one of LOADBALANCE_IP, LOADBALANCE_SRCMAC, "
                  "LOADBALANCE_SRCID, FAILOVER_EXPLICIT, LOADBALANCE_LOADBASED");
}

TEST(TypedMistakes, InvalidAddress) {
    ExpectRefusal(kSessions,
                  R"([{"key": "a", "session_type": "ENCAPSULATED_REMOTE_MIRROR_SOURCE",
                      "destination_port": {"addresses": ["2001:db8:::1"]}}])",
                  "[0].destination_port.addresses[0]",
                  "\"2001:db8:::1\" is no IP address, expected one as 192.0.2.1 or 2001:db8::1");
}

TEST(TypedMistakes, MissingMember) {
    ExpectRefusal("etherswitch.port.lacp", R"({"enabled": true})", ".mode", "is missing; the value needs it");
    ExpectRefusal(kVlan, R"({"trunk_vlan_ids": [{"start": 1}]})", ".trunk_vlan_ids[0].end",
                  "is missing; the value needs it");
    ExpectRefusal("common.port.dvfilter", R"({"network_filters": [{"agent_name": "x"}]})",
                  ".network_filters[0].slot_number", "is missing; it tells the entries apart");
    ExpectRefusal(kSessions, R"([{"key": ""}])", "[0].key", "is empty; it tells the entries apart");
}

TEST(TypedMistakes, TooManyElements) {
    std::string names;
    for (int i = 0; i < 33; ++i)
        names += (i ? ",\"u" : "\"u") + std::to_string(i) + "\"";
    ExpectRefusal(kTeaming, R"({"uplink_port_order": {"active_uplink_ports": [)" + names + "]}}",
                  ".uplink_port_order", "names 33 uplinks, at most 32 fit");
}

TEST(TypedMistakes, TextThatIsTooLong) {
    ExpectRefusal(kTeaming,
                  R"({"uplink_port_order": {"standby_uplink_ports": [")" + std::string(81, 'x') + "\"]}}",
                  ".uplink_port_order.standby_uplink_ports[0]", "is 81 bytes long, at most 80 fit");
}

TEST(TypedMistakes, DuplicateMember) {
    ExpectRefusal(kVlan, R"({"vlan_id": 1, "vlan_id": 2})", ".vlan_id, line 2, column 90",
                  "the key stands there twice");
    ExpectRefusal(kSessions, R"([{"key": "a"}, {"key": "a"}])", "[1].key", "\"a\" is there twice");
}

TEST(TypedMistakes, ContradictingBytes) {
    ExpectRefusal(kVlan, R"({"vlan_id": 1}, "value": {"hex": "0000020000000000"})", "",
                  "\"value\" says something else; leave out the one that is not meant");
}

TEST(TypedMistakes, ConflictingMembers) {
    ExpectRefusal(kVlan, R"({"vlan_id": 1, "pvlan_id": 2})", ".pvlan_id",
                  "excludes vlan_id: a port has one of vlan_id, pvlan_id and trunk_vlan_ids");
}

TEST(TypedMistakes, NumberThatIsNotKeptWhole) {
    ExpectRefusal("common.port.shaper.input", R"({"average_bandwidth": 100})", ".average_bandwidth",
                  "100 is no multiple of 8, and only whole bytes are kept");
    ExpectRefusal("common.port.shaper.input", R"({"burst_size": -8})", ".burst_size", "-8 is negative");
    ExpectRefusal("common.port.dvfilter", R"({"network_filters": [{"slot_number": "01"}]})",
                  ".network_filters[0].slot_number",
                  "the property cannot hold it as it is given: 01 reads back as 1");
}

TEST(TypedMistakes, NullValue) {
    ExpectRefusal("etherswitch.port.ipfix", "false", "",
                  "is what there is without the property; leave the property out");
    ExpectRefusal("site.colour", "5", "", "the property has no typed form: its meaning is not known");
}

} // namespace
