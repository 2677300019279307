/* SPDX-License-Identifier: Apache-2.0 */
// The store form of every converter type (store_form.h), looked up through the registry.

#include "configstore/layouts/store_form.h"

#include <iterator>

#include "configstore/layouts/forms.h"
#include "configstore/layouts/records.h"
#include "dvs/configstore.h"

namespace dvs::layout {
namespace {

constexpr const char *kOnFailureTexts[] = {"FAIL_OPEN", "FAIL_CLOSED"};
constexpr Domain kOnFailure = {"on failure", kOnFailureTexts, 2, {}};
constexpr const char *kConnecteeTexts[] = {"VM_VNIC", "PNIC", "HOST_HYP_VNIC"};
constexpr Domain kConnectees = {"connectee types", kConnecteeTexts, 3, {}};
constexpr const char *kVersionTexts[] = {"6.0.0", "6.5.0", "6.6.0", "7.0.0", "7.0.2",
                                         "7.0.3", "8.0.0", "8.0.2", "8.0.3", "OVL 1.0"};
constexpr Domain kVersions = {"switch versions", kVersionTexts, std::size(kVersionTexts), {}};

constexpr uint32_t kUplinkNameMax = 80;
constexpr uint32_t kPortKeyMax = 47;

// clang-format off
// Columns: name, form, unit, longest text, domain, instance id, members, meaning.
constexpr StoreField kFailureCriteria[] = {
    {"check_beacon",  Form::kBool,   "",  0, nullptr, nullptr, {}, "beacon probing decides about a link"},
    {"lc_link_state", Form::kBool,   "",  0, nullptr, nullptr, {}, "the link state alone decides"},
    {"full_duplex",   Form::kBool,   "",  0, nullptr, nullptr, {}, "an uplink that is not full duplex counts as failed; not loaded from a store"},
    {"percentage",    Form::kUint16, "%", 0, nullptr, nullptr, {}, "error percentage of a failed uplink; not loaded from a store"},
    {"speed",         Form::kUint16, "",  0, nullptr, nullptr, {}, "least speed of a sound uplink; not loaded from a store"},
};
constexpr StoreField kUplinkOrder[] = {
    {"active_uplink_ports",  Form::kTexts, "", kUplinkNameMax, nullptr, nullptr, {}, "active uplinks, in order"},
    {"standby_uplink_ports", Form::kTexts, "", kUplinkNameMax, nullptr, nullptr, {}, "standby uplinks, in order"},
};
constexpr StoreField kTeaming[] = {
    {"policy",            Form::kText,   "", 0, &teaming::kPolicies, nullptr, {}, "how traffic is spread over the uplinks"},
    {"reverse_policy",    Form::kBool,   "", 0, nullptr, nullptr, {}, "return traffic follows the policy too"},
    {"rolling_order",     Form::kBool,   "", 0, nullptr, nullptr, {}, "a recovered uplink does not take its traffic back"},
    {"notify_switches",   Form::kBool,   "", 0, nullptr, nullptr, {}, "tell the physical switches about a failover"},
    {"best_effort",       Form::kBool,   "", 0, nullptr, nullptr, {}, "use what uplinks there are"},
    {"shotgun",           Form::kBool,   "", 0, nullptr, nullptr, {}, "send on every uplink"},
    {"failure_criteria",  Form::kObject, "", 0, nullptr, nullptr, kFailureCriteria, "what makes an uplink count as failed"},
    {"uplink_port_order", Form::kObject, "", 0, nullptr, nullptr, kUplinkOrder, "which uplinks are used first"},
};
constexpr StoreField kRange[] = {
    {"start", Form::kUint16, "", 0, nullptr, nullptr, {}, "first VLAN id", Rule::kVlan, true},
    {"end",   Form::kUint16, "", 0, nullptr, nullptr, {}, "last VLAN id", Rule::kVlan, true},
};
constexpr StoreField kVlan[] = {
    {"vlan_id",        Form::kUint16,    "", 0, nullptr, nullptr, {}, "VLAN id of an access port", Rule::kVlan},
    {"pvlan_id",       Form::kUint16,    "", 0, nullptr, nullptr, {}, "private VLAN id", Rule::kVlan},
    {"trunk_vlan_ids", Form::kInstances, "", 0, nullptr, nullptr, kRange, "ranges of a trunk"},
};
constexpr StoreField kShaping[] = {
    {"enabled",           Form::kBool, "",      0, nullptr, nullptr, {}, "always true; may be left out"},
    {"average_bandwidth", Form::kLong, "bit/s", 0, nullptr, nullptr, {}, "bandwidth on average; 8 times the record's number", Rule::kBits},
    {"peak_bandwidth",    Form::kLong, "bit/s", 0, nullptr, nullptr, {}, "bandwidth during a burst; 8 times the record's number", Rule::kBits},
    {"burst_size",        Form::kLong, "bit",   0, nullptr, nullptr, {}, "how much may be sent at peak bandwidth; 8 times the record's number", Rule::kBits},
};
constexpr StoreField kSecurity[] = {
    {"allow_promiscuous",     Form::kBool, "", 0, nullptr, nullptr, {}, "promiscuous mode is accepted"},
    {"allow_mac_change",      Form::kBool, "", 0, nullptr, nullptr, {}, "changes of the MAC address are accepted"},
    {"allow_forged_transmit", Form::kBool, "", 0, nullptr, nullptr, {}, "frames with another source address are accepted"},
};
constexpr StoreField kFilter[] = {
    {"slot_number", Form::kText,  "", 0,   nullptr,     nullptr, {}, "place in the chain of filters, as decimal text", Rule::kSlot},
    {"agent_name",  Form::kText,  "", 39,  nullptr,     nullptr, {}, "agent that filters"},
    {"on_failure",  Form::kText,  "", 0,   &kOnFailure, nullptr, {}, "what becomes of traffic without the agent"},
    {"parameters",  Form::kTexts, "", 255, nullptr,     nullptr, {}, "what the agent is given"},
};
constexpr StoreField kFilterPolicy[] = {
    {"network_filters", Form::kInstances, "", 0, nullptr, "slot_number", kFilter, "the filters"},
};
constexpr StoreField kPortLacpMembers[] = {
    {"enabled", Form::kBool, "", 0, nullptr,         nullptr, {}, "whether the port takes part in link aggregation", Rule::kNone, true},
    {"mode",    Form::kText, "", 0, &lacp::kModes, nullptr, {}, "whether it speaks first, answers only, or neither", Rule::kNone, true},
};
constexpr StoreField kPvlan[] = {
    {"primary_id",   Form::kUint16, "", 0, nullptr,      nullptr, {}, "primary VLAN id", Rule::kVlan, true},
    {"secondary_id", Form::kUint16, "", 0, nullptr,      nullptr, {}, "secondary VLAN id", Rule::kVlan, true},
    {"type",         Form::kText,   "", 0, &pvlan::kPvlanTypes, nullptr, {}, "whom ports of the secondary VLAN can reach", Rule::kNone, true},
};
constexpr StoreField kSourcePort[] = {
    {"wildcard_port_connectee_types", Form::kTexts, "", 0,           &kConnectees, nullptr, {}, "ports that are sources by their kind"},
    {"port_keys",                     Form::kTexts, "", kPortKeyMax, nullptr,      nullptr, {}, "keys of source ports, of all but a REMOTE_MIRROR_DEST"},
    {"vlans",                         Form::kInts,  "", 0,           nullptr,      nullptr, {}, "source VLANs of a REMOTE_MIRROR_DEST; not loaded from a store", Rule::kVlan},
};
constexpr StoreField kDestinationPort[] = {
    {"port_keys",         Form::kTexts, "", kPortKeyMax, nullptr, nullptr, {}, "keys of destination ports, of a MIXED_DEST_MIRROR, DVPORT_MIRROR or REMOTE_MIRROR_DEST"},
    {"uplink_port_names", Form::kTexts, "", kPortKeyMax, nullptr, nullptr, {}, "names of destination uplinks, of a REMOTE_MIRROR_SOURCE or MIXED_DEST_MIRROR"},
    {"addresses",         Form::kTexts, "", 0,           nullptr, nullptr, {}, "addresses that an ENCAPSULATED_REMOTE_MIRROR_SOURCE sends to; a store keeps the last one, and loads none", Rule::kAddress},
};
constexpr StoreField kVspan[] = {
    {"key",                    Form::kText,   "",      31, nullptr, nullptr, {}, "session key"},
    {"name",                   Form::kText,   "",      80, nullptr, nullptr, {}, "session name"},
    {"session_type",           Form::kText,   "",      0, &mirror::kSessionTypes, nullptr, {}, "what is mirrored, and where to"},
    {"enabled",                Form::kBool,   "",      0, nullptr, nullptr, {}, "the session is switched on"},
    {"strip_original_vlan",    Form::kBool,   "",      0, nullptr, nullptr, {}, "the original VLAN tag is stripped"},
    {"normal_traffic_allowed", Form::kBool,   "",      0, nullptr, nullptr, {}, "the destination carries other traffic too"},
    {"legacy_mode",            Form::kBool,   "",      0, nullptr, nullptr, {}, "legacy mode; a store loads it inverted"},
    {"mirrored_packet_length", Form::kUint32, "bytes", 0, nullptr, nullptr, {}, "bytes mirrored of a frame; 4294967295 or left out: not set; a store keeps no other length", Rule::kUnset},
    {"encapsulation_vlan_id",  Form::kUint32, "",      0, nullptr, nullptr, {}, "VLAN of the mirrored frames", Rule::kVlan},
    {"sampling_rate",          Form::kUint32, "",      0, nullptr, nullptr, {}, "one frame in so many is mirrored"},
    {"encap_type",             Form::kText,   "",      0, &mirror::kEncapTypes, nullptr, {}, "how mirrored frames are wrapped"},
    {"erspan_id",              Form::kUint16, "",      0, nullptr, nullptr, {}, "ERSPAN session id"},
    {"erspan_COS",             Form::kUint16, "",      0, nullptr, nullptr, {}, "ERSPAN class of service"},
    {"erspan_gra_nanosec",     Form::kBool,   "",      0, nullptr, nullptr, {}, "ERSPAN time stamps in nanoseconds"},
    {"destination_port",       Form::kObject, "",      0, nullptr, nullptr, kDestinationPort, "where mirrored frames go"},
    {"source_recv_port",       Form::kObject, "",      0, nullptr, nullptr, kSourcePort, "whose received frames are mirrored"},
    {"source_transmit_port",   Form::kObject, "",      0, nullptr, nullptr, kSourcePort, "whose transmitted frames are mirrored"},
};
constexpr StoreField kLacpGroup[] = {
    {"key",                    Form::kText,   "", 15, nullptr,         nullptr, {}, "key of the group"},
    {"name",                   Form::kText,   "", 64, nullptr,         nullptr, {}, "name of the group"},
    {"mode",                   Form::kText,   "", 0,  &lacp::kModes, nullptr, {}, "whether the group speaks first, answers only, or neither"},
    {"load_balance_algorithm", Form::kText,   "", 0,  &lacp::kAlgorithms,    nullptr, {}, "what decides over which uplink a frame goes"},
    {"uplink_num",             Form::kUint32, "", 0,  nullptr,         nullptr, {}, "number of uplinks", Rule::kNone, true},
};
constexpr StoreField kLinkDiscoveryMembers[] = {
    {"protocol",  Form::kText, "", 0, &kCdpModes,      nullptr, {}, "protocol spoken", Rule::kNone, true},
    {"operation", Form::kText, "", 0, &kCdpOperations, nullptr, {}, "whether the switch listens, speaks, or both", Rule::kNone, true},
};
constexpr StoreField kIpfixMembers[] = {
    {"idle_flow_timeout",     Form::kUint32, "seconds", 0, nullptr, nullptr, {}, "until a flow without traffic is reported"},
    {"active_flow_timeout",   Form::kUint32, "seconds", 0, nullptr, nullptr, {}, "until a flow with traffic is reported"},
    {"collector_address",     Form::kText,   "",        0, nullptr, nullptr, {}, "whom flows are reported to, IPv4 or IPv6", Rule::kAddress},
    {"collector_port",        Form::kUint16, "",        0, nullptr, nullptr, {}, "UDP port of the collector"},
    {"sampling_rate",         Form::kUint32, "",        0, nullptr, nullptr, {}, "one frame in so many is looked at; 0: all"},
    {"internal_flows_only",   Form::kBool,   "",        0, nullptr, nullptr, {}, "only flows between ports of this host"},
    {"observation_domain_id", Form::kUint32, "",        0, nullptr, nullptr, {}, "what the collector knows the switch by"},
};
constexpr StoreField kHealthCheckMembers[] = {
    {"enabled",  Form::kBool,   "", 0, nullptr, nullptr, {}, "whether the check is made; a save to a store calls it \"enable\", a load looks for \"enabled\""},
    {"interval", Form::kUint32, "", 0, nullptr, nullptr, {}, "time between two checks"},
};
constexpr StoreField kShares[] = {
    {"shares", Form::kUint32, "", 0, nullptr, nullptr, {}, "weight against the other pools"},
};
constexpr StoreField kAllocation[] = {
    {"reservation", Form::kUint32, "", 0, nullptr, nullptr, {}, "bandwidth kept for the pool"},
    {"limit",       Form::kInt,    "", 0, nullptr, nullptr, {}, "most bandwidth the pool gets; -1: no limit"},
    {"shares",      Form::kObject, "", 0, nullptr, nullptr, kShares, "weight against the other pools"},
};
constexpr StoreField kPool[] = {
    {"key",        Form::kText,   "", 127, nullptr, nullptr, {}, "key of the pool"},
    {"allocation", Form::kObject, "", 0,   nullptr, nullptr, kAllocation, "its part of the bandwidth"},
};
// clang-format on

} // namespace

// clang-format off
// Leaves, in the order of the converter types that first use them.
constexpr StoreField kFormUint32         = {nullptr, Form::kUint32,    "", 0, nullptr, nullptr, {}, "the number"};
constexpr StoreField kFormText           = {nullptr, Form::kText,      "", 0, nullptr, nullptr, {}, "the text"};
constexpr StoreField kFormBeacon         = {nullptr, Form::kInt,       "", 0, nullptr, nullptr, {}, "the number"};
constexpr StoreField kFormBool           = {nullptr, Form::kBool,      "", 0, nullptr, nullptr, {}, "the flag"};
constexpr StoreField kFormAddress        = {nullptr, Form::kText,      "", 0, nullptr, nullptr, {}, "dotted IPv4 address", Rule::kIpv4};
constexpr StoreField kFormPvlans         = {nullptr, Form::kInstances, "", 0, nullptr, nullptr, kPvlan, "one instance a pair of VLANs"};
constexpr StoreField kFormLinkDiscovery  = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kLinkDiscoveryMembers, "protocol and operation"};
constexpr StoreField kFormVspans         = {nullptr, Form::kInstances, "", 0, nullptr, "key", kVspan, "one instance a session"};
constexpr StoreField kFormIpfix          = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kIpfixMembers, "flow export"};
constexpr StoreField kFormHealthCheck    = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kHealthCheckMembers, "one check"};
constexpr StoreField kFormPools          = {nullptr, Form::kInstances, "", 0, nullptr, "key", kPool, "one instance a pool"};
constexpr StoreField kFormPoolKeys       = {nullptr, Form::kTexts,     "", 127, nullptr, nullptr, {}, "keys of pools"};
constexpr StoreField kFormUplinkKeys     = {nullptr, Form::kTexts,     "", kPortKeyMax, nullptr, nullptr, {}, "keys of uplink ports"};
constexpr StoreField kFormVersion        = {nullptr, Form::kText,      "", 0, &kVersions, nullptr, {}, "version of the switch; 107 to 112 have the texts of 7 to 12"};
constexpr StoreField kFormLacpGroups     = {nullptr, Form::kInstances, "", 0, nullptr, "key", kLacpGroup, "one instance a group"};
constexpr StoreField kFormTeaming        = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kTeaming, "teaming policy"};
constexpr StoreField kFormUplinkNames    = {nullptr, Form::kTexts,     "", kUplinkNameMax, nullptr, nullptr, {}, "names of uplink ports"};
constexpr StoreField kFormUnmapped       = {nullptr, Form::kNone,      "", 0, nullptr, nullptr, {}, "lists below \"data\", by kind of property"};
constexpr StoreField kFormVlan           = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kVlan, "VLAN, trunk or private VLAN"};
constexpr StoreField kFormShaping        = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kShaping, "limits of one direction"};
constexpr StoreField kFormSecurity       = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kSecurity, "what is allowed"};
constexpr StoreField kFormFilters        = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kFilterPolicy, "filters of the port"};
constexpr StoreField kFormPortLacp       = {nullptr, Form::kObject,    "", 0, nullptr, nullptr, kPortLacpMembers, "link aggregation of the port"};
// clang-format on

} // namespace dvs::layout
