/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_PORT_VLAN_H
#define CONFIGSTORE_LAYOUTS_PORT_VLAN_H

// The record of a port's VLAN policy: a head and the ranges of a trunk.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

namespace dvs::layout::vlan {

// clang-format off
inline constexpr Flag kVlanBits[] = {
    {0x1, "trunk",        "the port carries the VLANs of the ranges"},
    {0x2, "private_vlan", "the id is that of a private VLAN"},
};
inline constexpr Domain kVlanFlags = {"VLAN flags", nullptr, 0, kVlanBits};

inline constexpr Field kRangeFields[] = {
    // name  offset width kind             domain   meaning
    {"start",     0,    2, Kind::kUnsigned, nullptr, "first VLAN id"},
    {"end",       2,    2, Kind::kUnsigned, nullptr, "last VLAN id"},
};
inline constexpr Record kRange = {"VLAN range", 4, kRangeFields, {}};
static_assert(IsSound(kRange));

inline constexpr Field kVlanFields[] = {
    // name        offset width kind             domain       meaning
    {"flags",           0,    2, Kind::kFlags,    &kVlanFlags, "kind of the port"},
    {"vlan_id",         2,    2, Kind::kUnsigned, nullptr,     "VLAN id or private VLAN id; unused for a trunk"},
    {"reserved",        4,    2, Kind::kReserved, nullptr,     "0"},
    {"range_count",     6,    2, Kind::kCount,    nullptr,     "number of ranges of a trunk"},
};
inline constexpr Part kVlanParts[] = {
    {"ranges", &kRange, CountBy::kField, 0, "range_count", "flags", 0x1, "VLANs of the trunk"},
};
// clang-format on

} // namespace dvs::layout::vlan

namespace dvs::layout {

inline constexpr Record kPortVlan = {"port VLAN policy", 8, vlan::kVlanFields, vlan::kVlanParts};
static_assert(IsSound(kPortVlan));

} // namespace dvs::layout

namespace dvs::layout::vlan {

// clang-format off
inline constexpr StoreField kRangeMembers[] = {
    // name   form           place                unit max domain id members meaning
    {"start", Form::kUint16, In(kRange, "start"), "", 0, nullptr, nullptr, {}, "first VLAN id", Rule::kVlan, true},
    {"end",   Form::kUint16, In(kRange, "end"),   "", 0, nullptr, nullptr, {}, "last VLAN id", Rule::kVlan, true},
};
inline constexpr uint32_t kTrunk = 0x1;
inline constexpr uint32_t kPrivate = 0x2;
inline constexpr StoreField kMembers[] = {
    {"vlan_id",        Form::kUint16,    While(In(kPortVlan, "vlan_id"),      kPortVlan, "flags", kTrunk | kPrivate, 0),        "", 0, nullptr, nullptr, {}, "VLAN id of an access port", Rule::kVlan},
    {"pvlan_id",       Form::kUint16,    While(In(kPortVlan, "vlan_id"),      kPortVlan, "flags", kTrunk | kPrivate, kPrivate), "", 0, nullptr, nullptr, {}, "private VLAN id", Rule::kVlan},
    {"trunk_vlan_ids", Form::kInstances, While(Elements(kPortVlan, "ranges"), kPortVlan, "flags", kTrunk, kTrunk),              "", 0, nullptr, nullptr, kRangeMembers, "ranges of a trunk"},
};
// clang-format on

} // namespace dvs::layout::vlan

namespace dvs::layout {

inline constexpr StoreField kVlanForm = {
    nullptr, Form::kObject, {}, "", 0, nullptr, nullptr, vlan::kMembers, "VLAN, trunk or private VLAN"};

} // namespace dvs::layout

#endif
