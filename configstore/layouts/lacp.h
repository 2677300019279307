/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_LACP_H
#define CONFIGSTORE_LAYOUTS_LACP_H

// The records of link aggregation: a switch's groups, and the policy of a port.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"
#include "dvs/configstore.h"

namespace dvs::layout::lacp {

inline constexpr Domain kModes = {"LACP_MODE_2_CAHRS", LACP_MODE_2_CAHRS, 4, {}};
inline constexpr Domain kAlgorithms = {"LACP_LB_POLICY_SCHEMA", LACP_LB_POLICY_SCHEMA, 22, {}};

// clang-format off
inline constexpr Field kGroupFields[] = {
    // name                   offset width kind             domain        meaning
    {"name",                       0,   65, Kind::kText,     nullptr,      "name of the group"},
    {"key",                       65,   16, Kind::kText,     nullptr,      "key of the group"},
    {"mode",                      81,    4, Kind::kEnum,     &kModes,      "whether the group speaks first, answers only, or neither"},
    {"load_balance_algorithm",    85,    4, Kind::kEnum,     &kAlgorithms, "what decides over which uplink a frame goes"},
    {"uplink_num",                89,    4, Kind::kUnsigned, nullptr,      "number of uplinks"},
};
inline constexpr Record kGroup = {"LACP group", 93, kGroupFields, {}};
static_assert(IsSound(kGroup));

inline constexpr Field kTableFields[] = {
    // name  offset width kind          domain   meaning
    {"count",     0,    4, Kind::kCount, nullptr, "number of groups"},
};
inline constexpr Part kTableParts[] = {
    {"groups", &kGroup, CountBy::kField, 0, "count", nullptr, 0, "the groups"},
};

inline constexpr Field kPortLacpFields[] = {
    // name    offset width kind             domain       meaning
    {"enabled",     0,    1, Kind::kBool,     nullptr,     "whether the port takes part in link aggregation"},
    {"padding",     1,    3, Kind::kReserved, nullptr,     "0"},
    {"mode",        4,    4, Kind::kEnum,     &kModes,     "whether it speaks first, answers only, or neither"},
};
// clang-format on

} // namespace dvs::layout::lacp

namespace dvs::layout {

inline constexpr Record kLacpTable = {"LACP group table", 4, lacp::kTableFields, lacp::kTableParts};
inline constexpr Record kPortLacp = {"port LACP policy", 8, lacp::kPortLacpFields, {}};
static_assert(IsSound(kLacpTable) && IsSound(kPortLacp));

} // namespace dvs::layout

namespace dvs::layout::lacp {

// clang-format off
inline constexpr StoreField kGroupMembers[] = {
    // name                    form           place                                  unit max domain id members meaning
    {"key",                    Form::kText,   In(kGroup, "key"),                     "", 15, nullptr,      nullptr, {}, "key of the group"},
    {"name",                   Form::kText,   In(kGroup, "name"),                    "", 64, nullptr,      nullptr, {}, "name of the group"},
    {"mode",                   Form::kText,   In(kGroup, "mode"),                    "", 0,  &kModes,      nullptr, {}, "whether the group speaks first, answers only, or neither"},
    {"load_balance_algorithm", Form::kText,   In(kGroup, "load_balance_algorithm"),  "", 0,  &kAlgorithms, nullptr, {}, "what decides over which uplink a frame goes"},
    {"uplink_num",             Form::kUint32, In(kGroup, "uplink_num"),              "", 0,  nullptr,      nullptr, {}, "number of uplinks", Rule::kNone, true},
};
inline constexpr StoreField kPortMembers[] = {
    {"enabled", Form::kBool, In(kPortLacp, "enabled"), "", 0, nullptr, nullptr, {}, "whether the port takes part in link aggregation", Rule::kNone, true},
    {"mode",    Form::kText, In(kPortLacp, "mode"),    "", 0, &kModes, nullptr, {}, "whether it speaks first, answers only, or neither", Rule::kNone, true},
};
// clang-format on

} // namespace dvs::layout::lacp

namespace dvs::layout {

inline constexpr StoreField kLacpGroupsForm = {
    nullptr, Form::kInstances,    Elements(kLacpTable, "groups"), "", 0, nullptr,
    "key",   lacp::kGroupMembers, "one instance a group"};
inline constexpr StoreField kPortLacpForm = {
    nullptr, Form::kObject, {}, "", 0, nullptr, nullptr, lacp::kPortMembers, "link aggregation of the port"};

} // namespace dvs::layout

#endif
