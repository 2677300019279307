/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_PORT_VLAN_H
#define CONFIGSTORE_LAYOUTS_PORT_VLAN_H

// The record of a port's VLAN policy: a head and the ranges of a trunk.

#include "configstore/layouts/layout.h"

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

#endif
