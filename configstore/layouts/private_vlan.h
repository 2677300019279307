/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_PRIVATE_VLAN_H
#define CONFIGSTORE_LAYOUTS_PRIVATE_VLAN_H

// The record of a switch's private VLAN map.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"
#include "dvs/configstore.h"

namespace dvs::layout::pvlan {

inline constexpr Domain kPvlanTypes = {"PVLAN_2_CHARS", PVLAN_2_CHARS, 5, {}};

// clang-format off
inline constexpr Field kEntryFields[] = {
    // name         offset width kind             domain        meaning
    {"primary_id",       0,    2, Kind::kUnsigned, nullptr,      "primary VLAN id"},
    {"secondary_id",     2,    2, Kind::kUnsigned, nullptr,      "secondary VLAN id"},
    {"type",             4,    1, Kind::kEnum,     &kPvlanTypes, "whom ports of the secondary VLAN can reach"},
    {"padding",          5,    3, Kind::kReserved, nullptr,      "0"},
};
inline constexpr Record kEntry = {"private VLAN", 8, kEntryFields, {}};
static_assert(IsSound(kEntry));

inline constexpr Part kMapParts[] = {
    {"entries", &kEntry, CountBy::kRest, 0, nullptr, nullptr, 0, "the pairs; bytes behind the last whole one are ignored"},
};
// clang-format on

} // namespace dvs::layout::pvlan

namespace dvs::layout {

inline constexpr Record kPrivateVlanMap = {"private VLAN map", 0, {}, pvlan::kMapParts};
static_assert(IsSound(kPrivateVlanMap));

} // namespace dvs::layout

namespace dvs::layout::pvlan {

// clang-format off
inline constexpr StoreField kEntryMembers[] = {
    // name          form           place                       unit max domain id members meaning
    {"primary_id",   Form::kUint16, In(kEntry, "primary_id"),   "", 0, nullptr,      nullptr, {}, "primary VLAN id", Rule::kVlan, true},
    {"secondary_id", Form::kUint16, In(kEntry, "secondary_id"), "", 0, nullptr,      nullptr, {}, "secondary VLAN id", Rule::kVlan, true},
    {"type",         Form::kText,   In(kEntry, "type"),         "", 0, &kPvlanTypes, nullptr, {}, "whom ports of the secondary VLAN can reach", Rule::kNone, true},
};
// clang-format on

} // namespace dvs::layout::pvlan

namespace dvs::layout {

inline constexpr StoreField kPrivateVlansForm = {
    nullptr, Form::kInstances,     Elements(kPrivateVlanMap, "entries"), "", 0, nullptr,
    nullptr, pvlan::kEntryMembers, "one instance a pair of VLANs"};

} // namespace dvs::layout

#endif
