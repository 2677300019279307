/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_SHAPING_H
#define CONFIGSTORE_LAYOUTS_SHAPING_H

// The record of traffic shaping in one direction.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

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

namespace dvs::layout {

// clang-format off
inline constexpr uint32_t kBitsPerByte = 8;
inline constexpr StoreField kShapingMembers[] = {
    // name               form         place                                                          unit     max domain id members meaning
    {"enabled",           Form::kBool, {.keep = Keep::kTrue},                                             "",      0, nullptr, nullptr, {}, "always true; may be left out"},
    {"average_bandwidth", Form::kLong, Scaled(kShapingPolicy, "average_bandwidth", kBitsPerByte), "bit/s", 0, nullptr, nullptr, {}, "bandwidth on average; 8 times the record's number", Rule::kBits},
    {"peak_bandwidth",    Form::kLong, Scaled(kShapingPolicy, "peak_bandwidth", kBitsPerByte),    "bit/s", 0, nullptr, nullptr, {}, "bandwidth during a burst; 8 times the record's number", Rule::kBits},
    {"burst_size",        Form::kLong, Scaled(kShapingPolicy, "burst_size", kBitsPerByte),        "bit",   0, nullptr, nullptr, {}, "how much may be sent at peak bandwidth; 8 times the record's number", Rule::kBits},
};
inline constexpr StoreField kShapingForm = {nullptr, Form::kObject, {}, "", 0, nullptr, nullptr, kShapingMembers, "limits of one direction"};
// clang-format on

} // namespace dvs::layout

#endif
