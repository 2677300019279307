/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_TEAMING_H
#define CONFIGSTORE_LAYOUTS_TEAMING_H

// The record of a teaming policy.

#include "configstore/layouts/layout.h"
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

#endif
