/* SPDX-License-Identifier: Apache-2.0 */
// Types that lose data in a round trip through the store by design: their typed form is complete.

#include <gtest/gtest.h>

#include <map>

#include "configstore/layouts/registry.h"
#include "configstore/layouts/walk.h"
#include "dvs/configstore.h"
#include "form/json/parse.h"
#include "form/json/typed.h"

namespace {

using namespace dvs::form;
using dvs::typed::Built;

constexpr const char *kSessions = "com.orbeno.etherswitch.mirrorSessions";
constexpr const char *kFilters = "com.orbeno.common.port.dvfilter";

std::uint32_t ClassOf(const char *key) {
    return key == kFilters ? DVS_PROP_CLASS_PORT : DVS_PROP_CLASS_GLOBAL;
}

Built Build(const char *key, const char *text, std::uint32_t version = 8) {
    NodeFlaw flaw;
    const auto node = NodeFromJson(ParseJson(text), flaw);
    return dvs::typed::Build(ClassOf(key), key, *node, {version});
}

// The fields of the value's record by their paths.
std::map<std::string, std::string> Fields(const char *key, const Built &built, std::uint32_t version = 8) {
    std::map<std::string, std::string> fields;
    const auto *record = dvs::layout::RecordOf(ClassOf(key), key, version > 99);
    const auto fault = dvs::layout::Walk(*record, built.bytes, [&](const dvs::layout::Item &item) {
        fields[item.path] = dvs::layout::TextOf(item);
    });
    EXPECT_FALSE(fault.found) << fault.what;
    return fields;
}

// A written value reads back unchanged and builds the same bytes.
void ExpectWhole(const char *key, const char *text, std::uint32_t version = 8) {
    const Built built = Build(key, text, version);
    ASSERT_TRUE(built.ok) << built.field << " " << built.reason;
    EXPECT_TRUE(built.differences.empty()) << built.differences[0];
    const auto view = dvs::typed::Describe(ClassOf(key), key, built.bytes, {version});
    EXPECT_TRUE(view.exact) << text << (view.differences.empty() ? "" : view.differences[0]);
}

TEST(TypedSessions, DestinationsAndBothKindsOfSourcesAreSeparate) {
    const char *text = R"([
        {"key": "a", "session_type": "MIXED_DEST_MIRROR",
         "destination_port": {"port_keys": ["d1"], "uplink_port_names": ["uplink1"]},
         "source_recv_port": {"port_keys": ["r1", "r2"]}, "source_transmit_port": {"port_keys": ["t1"]}},
        {"key": "b", "session_type": "DVPORT_MIRROR",
         "destination_port": {"port_keys": ["d2"]}, "source_recv_port": {"port_keys": ["r3"]}}])";
    for (const std::uint32_t version : {8u, 110u}) {
        ExpectWhole(kSessions, text, version);
        auto fields = Fields(kSessions, Build(kSessions, text, version), version);
        EXPECT_EQ(fields["port_count"], "7");
        EXPECT_EQ(fields["sessions[0].destination_count"], "2");
        EXPECT_EQ(fields["sessions[0].receive_count"], "2");
        EXPECT_EQ(fields["sessions[0].transmit_count"], "1");
        EXPECT_EQ(fields["sessions[1].first_record"], "5");
        EXPECT_EQ(fields["ports[0].kind"], "0 port key");
        EXPECT_EQ(fields["ports[1].kind"], "1 uplink port name");
        EXPECT_EQ(fields["ports[1].name"], "\"uplink1\"");
        EXPECT_EQ(fields["ports[3].name"], "\"r2\"");
        EXPECT_EQ(fields["ports[4].name"], "\"t1\"");
        EXPECT_EQ(fields["ports[6].name"], "\"r3\"");
    }
}

TEST(TypedSessions, VlansOfARemoteDestinationAreNumbers) {
    const char *text = R"([{"key": "a", "session_type": "REMOTE_MIRROR_DEST",
        "destination_port": {"port_keys": ["d"]}, "source_recv_port": {"vlans": [5, 4094]}}])";
    ExpectWhole(kSessions, text);
    ExpectWhole(kSessions, text, 100);
    auto fields = Fields(kSessions, Build(kSessions, text));
    EXPECT_EQ(fields["ports[1].vlan_id"], "5");
    EXPECT_EQ(fields["ports[2].vlan_id"], "4094");
}

TEST(TypedSessions, AddressesOfAnEncapsulatedSourceAreAddresses) {
    const char *text = R"([{"key": "a", "session_type": "ENCAPSULATED_REMOTE_MIRROR_SOURCE",
        "encap_type": "ERSPAN3", "erspan_id": 7, "erspan_COS": 3, "erspan_gra_nanosec": true,
        "destination_port": {"addresses": ["192.0.2.9", "2001:db8::", "2001:0db8:0000:0000:0000:0000:0000:0001"]},
        "source_transmit_port": {"port_keys": ["t"]}}])";
    ExpectWhole(kSessions, text);
    ExpectWhole(kSessions, text, 112);
    const Built built = Build(kSessions, text);
    auto fields = Fields(kSessions, built);
    EXPECT_EQ(fields["ports[0].address"], "192.0.2.9");
    EXPECT_EQ(fields["ports[1].address"], "2001:db8::");
    EXPECT_EQ(fields["ports[2].address"], "2001:db8::1");
    EXPECT_EQ(fields["ports[3].name"], "\"t\"");
    EXPECT_EQ(fields["sessions[0].encap_type"], "2 ERSPAN3");
    const auto view = dvs::typed::Describe(ClassOf(kSessions), kSessions, built.bytes);
    const auto *addresses = view.tree.items[0].Find("destination_port")->Find("addresses");
    ASSERT_EQ(addresses->items.size(), 3U);
    EXPECT_EQ(addresses->items[0].text, "192.0.2.9");
}

TEST(TypedSessions, FlagsLengthsAndKindsAreWrittenUnchanged) {
    const char *text = R"([
        {"key": "a", "name": "one", "session_type": "DVPORT_MIRROR", "enabled": false, "strip_original_vlan": true,
         "normal_traffic_allowed": false, "legacy_mode": false, "mirrored_packet_length": 128,
         "encapsulation_vlan_id": 900, "sampling_rate": 10,
         "source_recv_port": {"wildcard_port_connectee_types": ["VM_VNIC", "HOST_HYP_VNIC"]}},
        {"key": "b", "session_type": "REMOTE_MIRROR_SOURCE", "legacy_mode": true, "strip_original_vlan": false,
         "destination_port": {"uplink_port_names": ["uplink2"]},
         "source_transmit_port": {"wildcard_port_connectee_types": ["PNIC"]}}])";
    ExpectWhole(kSessions, text);
    auto fields = Fields(kSessions, Build(kSessions, text));
    EXPECT_EQ(fields["sessions[0].flags"],
              "0x2b normal_traffic_not_allowed from_store encapsulation_vlan disabled");
    EXPECT_EQ(fields["sessions[0].mirrored_packet_length"], "128");
    EXPECT_EQ(fields["sessions[0].receive_connectee_types"], "0xd VM_VNIC from_store HOST_HYP_VNIC");
    EXPECT_EQ(fields["sessions[1].flags"], "0x14 keep_original_vlan legacy_mode");
    EXPECT_EQ(fields["sessions[1].mirrored_packet_length"], "4294967295");
    EXPECT_EQ(fields["sessions[1].transmit_connectee_types"], "0x6 PNIC from_store");
}

TEST(TypedSessions, OmittedMembersAreNotSet) {
    ExpectWhole(kSessions, R"([{"key": "a"}])");
    auto fields = Fields(kSessions, Build(kSessions, R"([{"key": "a"}])"));
    EXPECT_EQ(fields["sessions[0].flags"], "0x0");
    ExpectWhole(kSessions, "[]");
    EXPECT_EQ(Build(kSessions, "[]").bytes.size(), 20U);
}

TEST(TypedSessions, NamesMembersThatDoNotBelongInASession) {
    const struct {
        const char *text, *field, *reason;
    } rows[] = {
        {R"([{"key": "a", "session_type": "DVPORT_MIRROR", "source_recv_port": {"vlans": [5]}}])",
         "[0].source_recv_port.vlans",
         "has no place in a session of type DVPORT_MIRROR, which takes port_keys here"},
        {R"([{"key": "a", "destination_port": {"addresses": ["192.0.2.1"]}}])",
         "[0].destination_port.addresses",
         "has no place in a session of type MIXED_DEST_MIRROR, which takes port_keys and uplink_port_names "
         "here"},
        {R"([{"key": "a", "session_type": "ENCAPSULATED_REMOTE_MIRROR_SOURCE",
              "destination_port": {"addresses": ["192.0.2.1", "192.0.2.256"]}}])",
         "[0].destination_port.addresses[1]",
         "\"192.0.2.256\" is no IP address, expected one as 192.0.2.1 or 2001:db8::1"},
        {R"([{"key": "a", "destination_port": {"port_keys": ["0123456789012345678901234567890x"]}}])",
         "[0].destination_port.port_keys[0]", "is 32 bytes long, at most 31 fit"},
        {R"([{"key": "a", "encapsulation_vlan_id": 70000}])", "[0].encapsulation_vlan_id",
         "70000 is no VLAN id, expected 0 to 4095"},
        {R"([{"key": "a", "source_recv_port": {"vlans": [65536]}}])", "[0].source_recv_port.vlans[0]",
         "65536 is no VLAN id, expected 0 to 4095"},
    };
    for (const auto &row : rows) {
        const Built built = Build(kSessions, row.text);
        EXPECT_FALSE(built.ok) << row.text;
        EXPECT_EQ(built.field, row.field) << built.reason;
        EXPECT_EQ(built.reason, row.reason);
    }
    EXPECT_TRUE(Build(kSessions, R"([{"key": "a", "destination_port":
                                      {"port_keys": ["0123456789012345678901234567890x"]}}])",
                      100)
                    .ok);
}

TEST(TypedFilters, EachKeepsItsParameters) {
    const char *text = R"({"network_filters": [
        {"slot_number": "2", "agent_name": "inspector", "on_failure": "FAIL_OPEN", "parameters": ["a", "b"]},
        {"slot_number": "4294967295", "agent_name": "meter", "on_failure": "FAIL_CLOSED", "parameters": ["c"]}]})";
    ExpectWhole(kFilters, text);
    auto fields = Fields(kFilters, Build(kFilters, text));
    EXPECT_EQ(fields["filters[0].parameters[1].text"], "\"b\"");
    EXPECT_EQ(fields["filters[0].parameters[1].ordinal"], "1");
    EXPECT_EQ(fields["filters[1].slot_number"], "4294967295");
    EXPECT_EQ(fields["filters[1].parameters[0].text"], "\"c\"");
    ExpectWhole(kFilters, R"({"network_filters": []})");
}

} // namespace
