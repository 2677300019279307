/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_HEALTH_CHECK_H
#define CONFIGSTORE_LAYOUTS_HEALTH_CHECK_H

// The record of a health check deployment.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

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

namespace dvs::layout {

// clang-format off
inline constexpr StoreField kHealthCheckMembers[] = {
    // name      form           place                         unit max domain id members meaning
    {"enabled",  Form::kBool,   In(kHealthCheck, "enabled"),  "", 0, nullptr, nullptr, {}, "whether the check is made; a save to a store calls it \"enable\", a load looks for \"enabled\""},
    {"interval", Form::kUint32, In(kHealthCheck, "interval"), "", 0, nullptr, nullptr, {}, "time between two checks"},
};
inline constexpr StoreField kHealthCheckForm = {nullptr, Form::kObject, {}, "", 0, nullptr, nullptr, kHealthCheckMembers, "one check"};
// clang-format on

} // namespace dvs::layout

#endif
