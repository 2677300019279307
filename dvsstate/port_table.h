/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_PORT_TABLE_H
#define DVSSTATE_PORT_TABLE_H

// The ports of one switch: slots, kinds and limits, for the other files of this folder. These functions take
// no lock: to change one switch from several threads, hold the lock "dvsstate".

#include <cstdint>
#include <string_view>

#include "dvs/state.h"
#include "platform/runtime.h"

namespace dvs::state {

inline constexpr std::size_t kPortIdSize = 48; // terminator included

/// Size of a port id, terminator included, on a switch of this version.
[[nodiscard]] constexpr std::size_t PortIdSize(uint32_t switchVersion) {
    return switchVersion > 6 ? kPortIdSize : 16;
}

/// Ports of all kinds on all switches.
extern uint32_t numPortsInUseHostWide;

/// Adds a port. On success the port owns `data`; on failure the caller keeps it. `existingPort` (may be null)
/// receives the new port on success and the port with the same id and kind on HYP_EXISTS; it is untouched
/// otherwise.
[[nodiscard]] HYP_ReturnStatus DVSStatePortAdd(DVSwitch *sw, const char *portId, DVSData *data, uint32_t kind,
                                               DVSPort **existingPort);

/// Removes the first port with this id and kind and frees its data. HYP_NOT_FOUND: no such port.
[[nodiscard]] HYP_ReturnStatus DVSStatePortRemove(DVSwitch *sw, const char *portId, uint32_t kind);

/// Removes the ports of a switch in slot order, up to a slot that is marked but empty. The result equals
/// removing each port by id and kind. Returns false if a port cannot be removed; it and the ports after it
/// stay. This happens if the host's bit vector did not unmark a slot emptied before: the lookup ends there.
[[nodiscard]] bool RemoveAllPorts(DVSwitch *sw);

/// Returns the first port in slot order with this id and kind, or null.
[[nodiscard]] DVSPort *FindPort(DVSwitch *sw, std::string_view portId, uint32_t kind);

/// Returns the port in a slot; null if the slot is empty or outside the record.
[[nodiscard]] DVSPort *PortAt(DVSwitch *sw, uint32_t slot);

/// Calls visit(port, slot) for the port of each set bit in slot order, until it returns true (and so does
/// WalkSlots). A set bit without a port ends every walk over a switch's ports. A visit may remove its own
/// port.
template <typename Visit> bool WalkSlots(DVSwitch *sw, Visit visit) {
    for (uint32_t slot = 0; BitVector_NextBit(sw->portBitmap, slot, true, &slot); slot++) {
        DVSPort *port = PortAt(sw, slot);
        if (!port) return false;
        if (visit(port, slot)) return true;
    }
    return false;
}

/// The same with visit(port).
template <typename Visit> bool WalkPorts(DVSwitch *sw, Visit visit) {
    return WalkSlots(sw, [&](DVSPort *port, uint32_t) { return visit(port); });
}

} // namespace dvs::state

#endif
