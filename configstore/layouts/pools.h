/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_POOLS_H
#define CONFIGSTORE_LAYOUTS_POOLS_H

// The records of network resource pools: their configuration, and the list of their keys.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

namespace dvs::layout::pools {

// clang-format off
inline constexpr Field kPoolFields[] = {
    // name         offset width kind             domain   meaning
    {"key",              0,  128, Kind::kText,     nullptr, "key of the pool"},
    {"unused_1",       128,    1, Kind::kReserved, nullptr, "0"},
    {"reservation",    129,    4, Kind::kUnsigned, nullptr, "bandwidth kept for the pool"},
    {"unused_2",       133,   67, Kind::kReserved, nullptr, "0"},
    {"shares",         200,    4, Kind::kUnsigned, nullptr, "weight against the other pools"},
    {"limit",          204,    4, Kind::kSigned,   nullptr, "most bandwidth the pool gets; -1: no limit"},
    {"unused_3",       208,    4, Kind::kReserved, nullptr, "0"},
};
inline constexpr Record kPool = {"resource pool", 212, kPoolFields, {}};
static_assert(IsSound(kPool));

inline constexpr Field kKeyFields[] = {
    // name   offset width kind             domain   meaning
    {"key",        0,  128, Kind::kText,     nullptr, "key of the pool"},
    {"unused",   128,   72, Kind::kReserved, nullptr, "0"},
};
inline constexpr Record kPoolKey = {"resource pool key", 200, kKeyFields, {}};
static_assert(IsSound(kPoolKey));

inline constexpr Field kCountFields[] = {
    // name  offset width kind          domain   meaning
    {"count",     0,    4, Kind::kCount, nullptr, "number of pools"},
};
inline constexpr Part kPoolParts[] = {
    {"pools", &kPool, CountBy::kField, 0, "count", nullptr, 0, "the pools"},
};
inline constexpr Part kKeyParts[] = {
    {"pools", &kPoolKey, CountBy::kField, 0, "count", nullptr, 0, "the pools' keys"},
};
// clang-format on

} // namespace dvs::layout::pools

namespace dvs::layout {

inline constexpr Record kPoolConfig = {"resource pool configuration", 4, pools::kCountFields,
                                       pools::kPoolParts};
inline constexpr Record kPoolList = {"resource pool list", 4, pools::kCountFields, pools::kKeyParts};
static_assert(IsSound(kPoolConfig) && IsSound(kPoolList));

} // namespace dvs::layout

namespace dvs::layout::pools {

// clang-format off
inline constexpr StoreField kSharesMembers[] = {
    // name    form           place                unit max domain id members meaning
    {"shares", Form::kUint32, In(kPool, "shares"), "", 0, nullptr, nullptr, {}, "weight against the other pools"},
};
inline constexpr StoreField kAllocationMembers[] = {
    {"reservation", Form::kUint32, In(kPool, "reservation"), "", 0, nullptr, nullptr, {}, "bandwidth kept for the pool"},
    {"limit",       Form::kInt,    In(kPool, "limit"),       "", 0, nullptr, nullptr, {}, "most bandwidth the pool gets; -1: no limit"},
    {"shares",      Form::kObject, {},                           "", 0, nullptr, nullptr, kSharesMembers, "weight against the other pools"},
};
inline constexpr StoreField kPoolMembers[] = {
    {"key",        Form::kText,   In(kPool, "key"), "", 127, nullptr, nullptr, {}, "key of the pool"},
    {"allocation", Form::kObject, {},                   "", 0,   nullptr, nullptr, kAllocationMembers, "its part of the bandwidth"},
};
// clang-format on

} // namespace dvs::layout::pools

namespace dvs::layout {

inline constexpr StoreField kPoolsForm = {
    nullptr, Form::kInstances,    Elements(kPoolConfig, "pools"), "", 0, nullptr,
    "key",   pools::kPoolMembers, "one instance a pool"};
inline constexpr StoreField kPoolKeysForm = {nullptr, Form::kTexts, Elements(kPoolList, "pools", "key"),
                                             "",      127,          nullptr,
                                             nullptr, {},           "keys of pools"};

} // namespace dvs::layout

#endif
