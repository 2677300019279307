/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_SHAPING_H
#define CONFIGSTORE_LAYOUTS_SHAPING_H

// The record of traffic shaping in one direction.

#include "configstore/layouts/layout.h"

namespace dvs::layout {

// clang-format off
inline constexpr Field kShapingFields[] = {
    // name              offset width kind             domain   meaning
    {"average_bandwidth",     0,    8, Kind::kUnsigned, nullptr, "bytes per second"},
    {"peak_bandwidth",        8,    8, Kind::kUnsigned, nullptr, "bytes per second"},
    {"burst_size",           16,    8, Kind::kUnsigned, nullptr, "bytes"},
};
// clang-format on

inline constexpr Record kShapingPolicy = {"shaping policy", 24, kShapingFields, {}};
static_assert(IsSound(kShapingPolicy));

} // namespace dvs::layout

#endif
