/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_TX_UPLINK_H
#define CONFIGSTORE_LAYOUTS_TX_UPLINK_H

// The record of a port's transmit-uplink mode.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

namespace dvs::layout {

inline constexpr const char *kTxUplinkTexts[] = {"always", "normal"};
inline constexpr Domain kTxUplinkModes = {"transmit-uplink modes", kTxUplinkTexts, 2, {}};

// clang-format off
inline constexpr Field kTxUplinkFields[] = {
    // name offset width kind           domain   meaning
    {"mode",     0,    7, Kind::kLiteral, &kTxUplinkModes, "\"always\" or \"normal\", with its NUL"},
};
// clang-format on

inline constexpr Record kTxUplink = {"transmit-uplink mode", 7, kTxUplinkFields, {}};
static_assert(IsSound(kTxUplink));

} // namespace dvs::layout

namespace dvs::layout {

// clang-format off
inline constexpr StoreField kTxUplinkForm = {nullptr, Form::kBool, Literal(kTxUplink, {"always", 7}, {"normal", 7}), "", 0, nullptr, nullptr, {}, "the flag"};
// clang-format on

} // namespace dvs::layout

#endif
