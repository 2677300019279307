/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_TEAMING_H
#define CONFIGSTORE_LAYOUTS_TEAMING_H

// The record of a teaming policy.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"
#include "dvs/configstore.h"

namespace dvs::layout::teaming {

inline constexpr Domain kPolicies = {
    "NIC_TEAMING_POLICY_MODE_2_CHARS", NIC_TEAMING_POLICY_MODE_2_CHARS, 6, {}};

// clang-format off
inline constexpr Flag kFailureBits[] = {
    {0x20,  "check_beacon",  "beacon probing decides about a link"},
    {0x80,  "lc_link_state", "the link state alone decides"},
    {0x200, "from_store",    "set by every load that finds failure criteria"},
};
inline constexpr Flag kBehaviourBits[] = {
    {0x02, "reverse_policy",  "return traffic follows the policy too"},
    {0x04, "best_effort",     "use what uplinks there are"},
    {0x08, "rolling_order",   "a recovered uplink does not take its traffic back"},
    {0x10, "shotgun",         "send on every uplink"},
    {0x20, "notify_switches", "tell the physical switches about a failover"},
};
// clang-format on
inline constexpr Domain kFailureFlags = {"failure flags", nullptr, 0, kFailureBits};
inline constexpr Domain kBehaviourFlags = {"behaviour flags", nullptr, 0, kBehaviourBits};

inline constexpr uint32_t kNameSlots = 32;

// clang-format off
inline constexpr Field kNameFields[] = {
    // name  offset width  kind         domain   meaning
    {"name",      0,   81, Kind::kText, nullptr, "uplink name"},
};
inline constexpr Record kName = {"uplink name", 81, kNameFields, {}};
static_assert(IsSound(kName));

inline constexpr Field kTeamingFields[] = {
    // name            offset width kind             domain            meaning
    {"policy",              0,    4, Kind::kEnum,     &kPolicies,       "how traffic is spread over the uplinks"},
    {"failure_flags",       4,    4, Kind::kFlags,    &kFailureFlags,   "what makes an uplink count as failed"},
    {"percentage",          8,    1, Kind::kUnsigned, nullptr,          "error percentage at which an uplink counts as failed"},
    {"full_duplex",         9,    1, Kind::kBool,     nullptr,          "an uplink that is not full duplex counts as failed"},
    {"speed",              10,    2, Kind::kUnsigned, nullptr,          "an uplink below this speed counts as failed"},
    {"behaviour_flags",    12,    4, Kind::kFlags,    &kBehaviourFlags, "how a failover is done"},
    {"active_count",       16,    4, Kind::kCount,    nullptr,          "how many of the names, from the first on, are active uplinks"},
    {"standby_count",      20,    4, Kind::kCount,    nullptr,          "how many of the names behind those are standby uplinks"},
};
inline constexpr Part kTeamingParts[] = {
    {"names", &kName, CountBy::kFixed, kNameSlots, nullptr, nullptr, 0, "the active uplinks' names, then the standby uplinks'"},
};
// clang-format on
inline constexpr uint32_t kHeadSize = 24;

} // namespace dvs::layout::teaming

namespace dvs::layout {

inline constexpr Record kTeamingPolicy = {"teaming policy", teaming::kHeadSize, teaming::kTeamingFields,
                                          teaming::kTeamingParts};
static_assert(IsSound(kTeamingPolicy) &&
              teaming::kHeadSize + teaming::kNameSlots * teaming::kName.size == 2616);

} // namespace dvs::layout

namespace dvs::layout::teaming {

// clang-format off
inline constexpr uint32_t kNameMax = 80;
inline constexpr StoreField kCriteriaMembers[] = {
    // name            form           place                                                      unit max domain id members meaning
    {"check_beacon",  Form::kBool,   Bits(kTeamingPolicy, "failure_flags", "check_beacon"),  "",  0, nullptr, nullptr, {}, "beacon probing decides about a link"},
    {"lc_link_state", Form::kBool,   Bits(kTeamingPolicy, "failure_flags", "lc_link_state"), "",  0, nullptr, nullptr, {}, "the link state alone decides"},
    {"full_duplex",   Form::kBool,   In(kTeamingPolicy, "full_duplex"),                      "",  0, nullptr, nullptr, {}, "an uplink that is not full duplex counts as failed; not loaded from a store"},
    {"percentage",    Form::kUint16, In(kTeamingPolicy, "percentage"),                       "%", 0, nullptr, nullptr, {}, "error percentage of a failed uplink; not loaded from a store"},
    {"speed",         Form::kUint16, In(kTeamingPolicy, "speed"),                            "",  0, nullptr, nullptr, {}, "least speed of a sound uplink; not loaded from a store"},
};
inline constexpr StoreField kOrderMembers[] = {
    {"active_uplink_ports",  Form::kTexts, Slots(kTeamingPolicy, "names", "name", "active_count"),                  "", kNameMax, nullptr, nullptr, {}, "active uplinks, in order"},
    {"standby_uplink_ports", Form::kTexts, Slots(kTeamingPolicy, "names", "name", "standby_count", "active_count"), "", kNameMax, nullptr, nullptr, {}, "standby uplinks, in order"},
};
inline constexpr StoreField kMembers[] = {
    {"policy",            Form::kText,   In(kTeamingPolicy, "policy", Unnamed::kAbsent),                "", 0, &kPolicies, nullptr, {}, "how traffic is spread over the uplinks"},
    {"reverse_policy",    Form::kBool,   Bits(kTeamingPolicy, "behaviour_flags", "reverse_policy"),  "", 0, nullptr, nullptr, {}, "return traffic follows the policy too"},
    {"rolling_order",     Form::kBool,   Bits(kTeamingPolicy, "behaviour_flags", "rolling_order"),   "", 0, nullptr, nullptr, {}, "a recovered uplink does not take its traffic back"},
    {"notify_switches",   Form::kBool,   Bits(kTeamingPolicy, "behaviour_flags", "notify_switches"), "", 0, nullptr, nullptr, {}, "tell the physical switches about a failover"},
    {"best_effort",       Form::kBool,   Bits(kTeamingPolicy, "behaviour_flags", "best_effort"),     "", 0, nullptr, nullptr, {}, "use what uplinks there are"},
    {"shotgun",           Form::kBool,   Bits(kTeamingPolicy, "behaviour_flags", "shotgun"),         "", 0, nullptr, nullptr, {}, "send on every uplink"},
    {"failure_criteria",  Form::kObject, GroupIn(kTeamingPolicy, "failure_flags", "from_store"),     "", 0, nullptr, nullptr, kCriteriaMembers, "what makes an uplink count as failed"},
    {"uplink_port_order", Form::kObject, {},                                                         "", 0, nullptr, nullptr, kOrderMembers, "which uplinks are used first"},
};
// clang-format on

} // namespace dvs::layout::teaming

namespace dvs::layout {

inline constexpr StoreField kTeamingForm = {nullptr,           Form::kObject,   {}, "", 0, nullptr, nullptr,
                                            teaming::kMembers, "teaming policy"};

} // namespace dvs::layout

#endif
