/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_NAMES_H
#define DVSSTATE_NAMES_H

// The property names and type words that the switch state itself interprets. All other names pass through it
// untouched. Written and read in this folder only.

#include <cstdint>
#include <string_view>

namespace dvs::state {

// Global properties.
inline constexpr char kSwitchAlias[] = "com.orbeno.common.alias";
inline constexpr char kNoPersist[] =
    "com.orbeno.common.volatile.nopersist"; // set when its first byte is not zero

// Port data.
inline constexpr char kPortAlias[] = "com.orbeno.common.port.alias";
inline constexpr char kPortKind[] = "com.orbeno.common.port.volatile.type"; // u32 kind; serialized state only

// Fixed entries of a switch in the serialized state; every other entry there is a port.
inline constexpr char kSwitchVersion[] = "switchVersion";
inline constexpr char kClassName[] = "className";
inline constexpr char kMaxPorts[] = "maxPorts";
inline constexpr char kGlobalPropList[] = "globalPropList";
inline constexpr char kHostPropList[] = "hostPropList";
inline constexpr std::string_view kFixedEntries[] = {kSwitchVersion, kClassName, kMaxPorts, kGlobalPropList,
                                                     kHostPropList};

// The type word of everything the switch state writes itself: its fields, nested lists and port kinds.
inline constexpr uint32_t kStatePropType = 0x10;

// A switch of this version leaves entries with any of these type bits out of its serialized property lists.
inline constexpr uint32_t kFilteredVersion = 99;
inline constexpr uint32_t kFilteredTypes = 0x80000064;

// The version argument with which a whole state is serialized, whatever versions its switches have.
inline constexpr uint32_t kStateVersion = 9;

inline constexpr char kUnknown[] = "unknown"; // in place of an alias that is not there

} // namespace dvs::state

#endif
