/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_MAC_SECURITY_H
#define CONFIGSTORE_LAYOUTS_MAC_SECURITY_H

// The record of a port's MAC security.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

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

namespace dvs::layout {

// clang-format off
inline constexpr StoreField kSecurityMembers[] = {
    // name                   form         place                                              unit max domain id members meaning
    {"allow_promiscuous",     Form::kBool, NotBits(kMacSecurity, "reject", "promiscuous"),     "", 0, nullptr, nullptr, {}, "promiscuous mode is accepted"},
    {"allow_mac_change",      Form::kBool, NotBits(kMacSecurity, "reject", "mac_change"),      "", 0, nullptr, nullptr, {}, "changes of the MAC address are accepted"},
    {"allow_forged_transmit", Form::kBool, NotBits(kMacSecurity, "reject", "forged_transmit"), "", 0, nullptr, nullptr, {}, "frames with another source address are accepted"},
};
inline constexpr StoreField kSecurityForm = {nullptr, Form::kObject, {}, "", 0, nullptr, nullptr, kSecurityMembers, "what is allowed"};
// clang-format on

} // namespace dvs::layout

#endif
