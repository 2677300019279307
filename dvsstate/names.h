/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_NAMES_H
#define DVSSTATE_NAMES_H

// The property names and type words that the switch state itself interprets. It passes all other names
// through. Used in this folder only.

#include <cstdint>
#include <string_view>

namespace dvs::state {

// Global properties.
inline constexpr char kSwitchAlias[] = "com.orbeno.common.alias";
inline constexpr char kNoPersist[] =
    "com.orbeno.common.volatile.nopersist"; // set if its first byte is not zero

// Port data.
inline constexpr char kPortAlias[] = "com.orbeno.common.port.alias";
inline constexpr char kPortKind[] = "com.orbeno.common.port.volatile.type"; // u32 kind; serialized state only

// Fixed entries of a switch in the serialized state; all other entries are ports.
inline constexpr char kSwitchVersion[] = "switchVersion";
inline constexpr char kClassName[] = "className";
inline constexpr char kMaxPorts[] = "maxPorts";
inline constexpr char kGlobalPropList[] = "globalPropList";
inline constexpr char kHostPropList[] = "hostPropList";
inline constexpr std::string_view kFixedEntries[] = {kSwitchVersion, kClassName, kMaxPorts, kGlobalPropList,
                                                     kHostPropList};

// The type word of entries that the switch state writes itself: its fields, nested lists and port kinds.
inline constexpr uint32_t kStatePropType = 0x10;

// A switch of this version excludes entries with any of these type bits from its serialized property lists.
inline constexpr uint32_t kFilteredVersion = 99;
inline constexpr uint32_t kFilteredTypes = 0x80000064;

// The version argument for serializing a whole state, regardless of its switches' versions.
inline constexpr uint32_t kStateVersion = 9;

inline constexpr char kUnknown[] = "unknown"; // replaces a missing alias

} // namespace dvs::state

#endif
