/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_IPFIX_H
#define CONFIGSTORE_LAYOUTS_IPFIX_H

// The record of IPFIX flow export.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

namespace dvs::layout {

// clang-format off
inline constexpr Field kIpfixFields[] = {
    // name                  offset width kind             domain   meaning
    {"idle_flow_timeout",         0,    4, Kind::kUnsigned, nullptr, "seconds until a flow without traffic is reported"},
    {"active_flow_timeout",       4,    4, Kind::kUnsigned, nullptr, "seconds until a flow with traffic is reported"},
    {"collector_address",         8,   16, Kind::kAddress,  nullptr, "whom flows are reported to"},
    {"collector_port",           24,    2, Kind::kUnsigned, nullptr, "UDP port of the collector"},
    {"sampling_rate",            26,    4, Kind::kUnsigned, nullptr, "one frame in so many is looked at; 0: all"},
    {"internal_flows_only",      30,    1, Kind::kBool,     nullptr, "only flows between ports of this host"},
    {"is_ipv6",                  31,    1, Kind::kBool,     nullptr, "the address is IPv6"},
    {"observation_domain_id",    32,    4, Kind::kUnsigned, nullptr, "what the collector knows the switch by"},
};
// clang-format on

inline constexpr Record kIpfix = {"IPFIX settings", 36, kIpfixFields, {}};
static_assert(IsSound(kIpfix));

} // namespace dvs::layout

namespace dvs::layout {

// clang-format off
inline constexpr StoreField kIpfixMembers[] = {
    // name                   form           place                                            unit       max domain id members meaning
    {"idle_flow_timeout",     Form::kUint32, In(kIpfix, "idle_flow_timeout"),                     "seconds", 0, nullptr, nullptr, {}, "until a flow without traffic is reported"},
    {"active_flow_timeout",   Form::kUint32, In(kIpfix, "active_flow_timeout"),                   "seconds", 0, nullptr, nullptr, {}, "until a flow with traffic is reported"},
    {"collector_address",     Form::kText,   AddressIn(kIpfix, "collector_address", "is_ipv6"),   "",        0, nullptr, nullptr, {}, "whom flows are reported to, IPv4 or IPv6", Rule::kAddress},
    {"collector_port",        Form::kUint16, In(kIpfix, "collector_port"),                        "",        0, nullptr, nullptr, {}, "UDP port of the collector"},
    {"sampling_rate",         Form::kUint32, In(kIpfix, "sampling_rate"),                         "",        0, nullptr, nullptr, {}, "one frame in so many is looked at; 0: all"},
    {"internal_flows_only",   Form::kBool,   In(kIpfix, "internal_flows_only"),                   "",        0, nullptr, nullptr, {}, "only flows between ports of this host"},
    {"observation_domain_id", Form::kUint32, In(kIpfix, "observation_domain_id"),                 "",        0, nullptr, nullptr, {}, "what the collector knows the switch by"},
};
inline constexpr StoreField kIpfixForm = {nullptr, Form::kObject, {}, "", 0, nullptr, nullptr, kIpfixMembers, "flow export"};
// clang-format on

} // namespace dvs::layout

#endif
