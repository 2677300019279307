/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_HEALTH_CHECK_H
#define CONFIGSTORE_LAYOUTS_HEALTH_CHECK_H

// The record of a health check deployment.

#include "configstore/layouts/layout.h"

namespace dvs::layout {

// clang-format off
inline constexpr Field kHealthCheckFields[] = {
    // name     offset width kind             domain   meaning
    {"enabled",      0,    1, Kind::kBool,     nullptr, "whether the check is made"},
    {"interval",     1,    4, Kind::kUnsigned, nullptr, "time between two checks"},
};
// clang-format on

inline constexpr Record kHealthCheck = {"health check deployment", 5, kHealthCheckFields, {}};
static_assert(IsSound(kHealthCheck));

} // namespace dvs::layout

#endif
