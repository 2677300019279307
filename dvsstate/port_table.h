/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_PORT_TABLE_H
#define DVSSTATE_PORT_TABLE_H

// The ports of one switch: slots, kinds and limits, for the other files of this folder. None of these takes a
// lock: whoever changes one switch from several threads holds the lock "dvsstate" around it.

#include <cstdint>
#include <string_view>

#include "dvs/state.h"
#include "platform/runtime.h"

namespace dvs::state {

inline constexpr std::size_t kPortIdSize = 48; // with the terminator

/// Room for a port id, terminator included, on a switch of this version.
[[nodiscard]] constexpr std::size_t PortIdSize(uint32_t switchVersion) {
    return switchVersion > 6 ? kPortIdSize : 16;
}

/// Ports of all kinds on all switches.
extern uint32_t numPortsInUseHostWide;

/// Adds a port, or says in `existingPort` (may be null) which one is in the way. On success the port owns
/// `data`; on failure the caller keeps it. `existingPort` receives the new port on success, the port of the
/// same id and kind with HYP_EXISTS, and stays untouched otherwise.
[[nodiscard]] HYP_ReturnStatus DVSStatePortAdd(DVSwitch *sw, const char *portId, DVSData *data, uint32_t kind,
                                               DVSPort **existingPort);

/// Removes the first port of this id and kind and frees its data. HYP_NOT_FOUND when there is none.
[[nodiscard]] HYP_ReturnStatus DVSStatePortRemove(DVSwitch *sw, const char *portId, uint32_t kind);

/// Removes the ports of a switch in slot order, up to a slot that is marked and holds none, with what the
/// removal of each by id and kind comes to. False when one cannot be removed, which stays with those behind
/// it: its search ends at a slot emptied before it that the host's bit vector did not unmark.
[[nodiscard]] bool RemoveAllPorts(DVSwitch *sw);

/// The first port in slot order of this id and kind; none when there is none.
[[nodiscard]] DVSPort *FindPort(DVSwitch *sw, std::string_view portId, uint32_t kind);

/// The port in a slot; none when the slot is empty or outside the record.
[[nodiscard]] DVSPort *PortAt(DVSwitch *sw, uint32_t slot);

/// Calls visit(port, slot) for the port of each set bit in slot order, until it returns true (the result
/// then) or a set bit has no port behind it, which ends every walk over a switch's ports. A visit may remove
/// the port it got.
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
