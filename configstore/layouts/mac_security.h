/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_MAC_SECURITY_H
#define CONFIGSTORE_LAYOUTS_MAC_SECURITY_H

// The record of a port's MAC security.

#include "configstore/layouts/layout.h"

namespace dvs::layout {

// clang-format off
inline constexpr Flag kRejectBits[] = {
    {0x1, "promiscuous",     "promiscuous mode is rejected"},
    {0x2, "mac_change",      "changes of the MAC address are rejected"},
    {0x4, "forged_transmit", "frames with another source address are rejected"},
};
inline constexpr Domain kRejectFlags = {"reject flags", nullptr, 0, kRejectBits};

inline constexpr Field kSecurityFields[] = {
    // name   offset width kind          domain         meaning
    {"reject",     0,    4, Kind::kFlags, &kRejectFlags, "what the port rejects"},
};
// clang-format on

inline constexpr Record kMacSecurity = {"MAC security", 4, kSecurityFields, {}};
static_assert(IsSound(kMacSecurity));

} // namespace dvs::layout

#endif
