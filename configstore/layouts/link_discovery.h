/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_LINK_DISCOVERY_H
#define CONFIGSTORE_LAYOUTS_LINK_DISCOVERY_H

// The record of link discovery.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"
#include "dvs/configstore.h"

namespace dvs::layout {

inline constexpr Domain kCdpModes = {"CDP_MODE_2_CHARS", CDP_MODE_2_CHARS, 3, {}};
inline constexpr Domain kCdpOperations = {"CDP_OPERATION_2_CHARS", CDP_OPERATION_2_CHARS, 5, {}};

// clang-format off
inline constexpr Field kLinkDiscoveryFields[] = {
    // name      offset width kind         domain        meaning
    {"protocol",      0,    1, Kind::kEnum, &kCdpModes,      "protocol spoken"},
    {"operation",     1,    1, Kind::kEnum, &kCdpOperations, "whether the switch listens, speaks, or both"},
};
// clang-format on

inline constexpr Record kLinkDiscovery = {"link discovery", 2, kLinkDiscoveryFields, {}};
static_assert(IsSound(kLinkDiscovery));

} // namespace dvs::layout

namespace dvs::layout {

// clang-format off
inline constexpr StoreField kLinkDiscoveryMembers[] = {
    // name       form         place                            unit max domain id members meaning
    {"protocol",  Form::kText, In(kLinkDiscovery, "protocol"),  "", 0, &kCdpModes,      nullptr, {}, "protocol spoken", Rule::kNone, true},
    {"operation", Form::kText, In(kLinkDiscovery, "operation"), "", 0, &kCdpOperations, nullptr, {}, "whether the switch listens, speaks, or both", Rule::kNone, true},
};
inline constexpr StoreField kLinkDiscoveryForm = {nullptr, Form::kObject, {}, "", 0, nullptr, nullptr, kLinkDiscoveryMembers, "protocol and operation"};
// clang-format on

} // namespace dvs::layout

#endif
