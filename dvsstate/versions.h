/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_VERSIONS_H
#define DVSSTATE_VERSIONS_H

// The switch version numbers at which behaviour changes. Switches have the versions 4 to 12, 100, and 107 to
// 112; the last range is 7 to 12 with the overlay flag set.

#include <cstdint>

namespace dvs::state {

/// From this version on the port records of mirror sessions are wide.
inline constexpr uint32_t kFirstWideVersion = 100;

/// First of the overlay versions. From it on the private VLAN map has the vswitch key for every class, and
/// the platform owns more names.
inline constexpr uint32_t kFirstOverlayVersion = 107;

[[nodiscard]] constexpr bool HasWidePortRecords(uint32_t version) {
    return version >= kFirstWideVersion;
}

[[nodiscard]] constexpr bool IsOverlayVersion(uint32_t version) {
    return version >= kFirstOverlayVersion;
}

} // namespace dvs::state

#endif
