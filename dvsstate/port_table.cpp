/* SPDX-License-Identifier: Apache-2.0 */
// The ports of a switch: adds and removes them within the limits of switch and host. Uses the switch record
// and the port index; used by port_find.cpp and state deserialization.

#include "dvsstate/port_table.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "dvsstate/message.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/port_index.h"
#include "dvsstate/switch_record.h"
#include "dvsstate/switch_table.h"

namespace dvs::state {

uint32_t numPortsInUseHostWide = 0;

namespace {

HYP_ReturnStatus CheckLimits(const DVSwitch *sw, const char *portId, std::size_t portIdLen) {
    if (portIdLen >= PortIdSize(sw->version)) {
        Message(kError, "DVSStatePortAdd %s, id length too long\n", portId);
        return HYP_BAD_PARAM;
    }
    if ((sw->classFlags & kUnlimitedClass) == 0 && sw->numPorts == sw->maxPorts) {
        Message(kError, "DVSStatePortAdd %s, switch has already used up max num ports (%d)\n", sw->switchId,
                static_cast<int>(sw->maxPorts));
        return HYP_LIMIT_EXCEEDED;
    }
    if (numPortsInUseHostWide == uwMaxNumActivePortsSystemWide) {
        Message(kError, "DVSStatePortAdd %s, host has already used up max num ports (%d)\n", sw->switchId,
                static_cast<int>(numPortsInUseHostWide));
        return HYP_LIMIT_EXCEEDED;
    }
    if (static_cast<int32_t>(sw->maxPorts) < 1) {
        Message(kError, "DVSStatePortAdd limit exceeded for port %s \n", portId);
        return HYP_LIMIT_EXCEEDED;
    }
    return HYP_OK;
}

bool Is(const DVSPort *port, std::string_view portId, uint32_t kind) {
    return port->portType == kind && portId == port->portId;
}

/// Result of the scan before an add. All slots are below `slotNum`.
struct ScanResult {
    DVSPort *existing; // first port of the same id and kind
    uint32_t existingSlot;
    uint32_t freeSlot; // first empty slot, or kNoSlot
};
constexpr uint32_t kNoSlot = UINT32_MAX;

/// Scans a switch without an index: slots from `usedSlots` on are empty.
ScanResult ScanSlots(DVSwitch *sw, std::string_view portId, uint32_t kind, uint32_t end) {
    ScanResult result{nullptr, kNoSlot, kNoSlot};
    const uint32_t used = std::min(end, FrontOf(sw).usedSlots);
    for (uint32_t slot = 0; slot < used; slot++) {
        DVSPort *port = sw->ports[slot];
        if (!port) {
            result.freeSlot = std::min(result.freeSlot, slot);
        } else if (kind != DVS_PORT_ZOMBIE && Is(port, portId, kind)) {
            result.existing = port;
            result.existingSlot = slot;
            return result;
        }
    }
    if (result.freeSlot == kNoSlot && used < end) result.freeSlot = used;
    return result;
}

/// The same with the index. A port at or after `end` does not conflict, and is returned as the first of its
/// kind only if there is none before it.
ScanResult ScanIndex(DVSwitch *sw, const PortKey &key, uint32_t kind, uint32_t end) {
    ScanResult result{nullptr, kNoSlot, kNoSlot};
    if (kind != DVS_PORT_ZOMBIE) {
        DVSPort *port = IndexFind(sw, key, kind);
        if (port && FrontOf(port).slot < end) {
            result.existing = port;
            result.existingSlot = FrontOf(port).slot;
            return result;
        }
    }
    uint32_t slot = FrontOf(sw).firstFree;
    while (BitVector_NextBit(sw->portBitmap, slot, false, &slot) && slot < end) {
        if (!sw->ports[slot]) {
            result.freeSlot = slot;
            break;
        }
        slot++;
    }
    return result;
}

/// Scans the usable part of the record. The limits may exceed the record's slots.
ScanResult Scan(DVSwitch *sw, const PortKey &key, uint32_t kind) {
    const uint32_t end = std::min(sw->maxPorts, FrontOf(sw).slotNum);
    return HasIndex(sw) ? ScanIndex(sw, key, kind, end) : ScanSlots(sw, key.id, kind, end);
}

DVSPort *PlacePort(DVSwitch *sw, const PortKey &key, DVSData *data, uint32_t kind, uint32_t slot) {
    DVSPort *port = NewPort();
    if (!port) return nullptr;
    std::memcpy(port->portId, key.id.data(), key.id.size()); // the length was checked
    port->owner = sw;
    port->portType = kind;
    port->portData = data;
    sw->ports[slot] = port;
    sw->numPorts++;
    numPortsInUseHostWide++;
    BitVector_SetBit(sw->portBitmap, slot);
    SwitchFront &front = FrontOf(sw);
    front.usedSlots = std::max(front.usedSlots, slot + 1);
    if (front.firstFree == slot) front.firstFree++;
    IndexAdd(sw, port, key, slot);
    return port;
}

void RemoveFromSlot(DVSwitch *sw, DVSPort *port, uint32_t slot) {
    SwitchFront &front = FrontOf(sw);
    if (HasIndex(sw)) IndexRemove(sw, port);
    FreePort(port);
    sw->ports[slot] = nullptr;
    BitVector_ClearBit(sw->portBitmap, slot);
    front.firstFree = std::min(front.firstFree, slot);
    numPortsInUseHostWide--;
    sw->numPorts--;
}

} // namespace

HYP_ReturnStatus DVSStatePortAdd(DVSwitch *sw, const char *portId, DVSData *data, uint32_t kind,
                                 DVSPort **existingPort) {
    if (!sw) {
        Message(kError, "Error: sw is NULL.\n");
        return HYP_NOT_FOUND;
    }
    if (Prints(kTrace)) Message(kTrace, "DVSStatePortAdd %s, %s\n", sw->switchId, portId);
    const PortKey key(portId);
    const HYP_ReturnStatus status = CheckLimits(sw, portId, key.id.size());
    if (status != HYP_OK) return status;
    const ScanResult scan = Scan(sw, key, kind);
    if (scan.existing) {
        // Known quirk, kept: the message prints the slot as the type and the kind as the slot.
        Message(kError, "DVSStatePortAdd port %s type %d[%d] exists.\n", portId,
                static_cast<int>(scan.existingSlot), static_cast<int>(kind));
        if (existingPort) *existingPort = scan.existing;
        return HYP_EXISTS;
    }
    if (scan.freeSlot == kNoSlot) {
        Message(kError, "DVSStatePortAdd limit exceeded for port %s \n", portId);
        return HYP_LIMIT_EXCEEDED;
    }
    if (!data) {
        Message(kError, "DVSStatePortAdd data is NULL when adding port %s \n", portId);
        return HYP_BAD_PARAM;
    }
    DVSPort *port = PlacePort(sw, key, data, kind, scan.freeSlot);
    if (!port) {
        Message(kError, "DVSStatePortAdd: failed to allocate port %s\n", portId);
        return HYP_NO_MEMORY;
    }
    if (existingPort) *existingPort = port;
    return HYP_OK;
}

HYP_ReturnStatus DVSStatePortRemove(DVSwitch *sw, const char *portId, uint32_t kind) {
    if (!sw) {
        Message(kError, "Null DVS handle\n");
        return HYP_NOT_FOUND;
    }
    Message(kTrace, "DVSState_PortRemove %s, %s\n", sw->switchId, portId);
    DVSPort *port = FindPort(sw, portId, kind);
    if (!port) return HYP_NOT_FOUND;
    RemoveFromSlot(sw, port, FrontOf(port).slot);
    return HYP_OK;
}

bool RemoveAllPorts(DVSwitch *sw) {
    FrontOf(sw).bucketNum = 0; // drop the index; updating it on each step would be wasted work
    bool endsHere = false;     // the slot just emptied is still marked: a lookup would not find the next port
    return !WalkSlots(sw, [&](DVSPort *port, uint32_t slot) {
        if (Prints(kTrace)) Message(kTrace, "DVSState_PortRemove %s, %s\n", sw->switchId, port->portId);
        if (endsHere) return true;
        RemoveFromSlot(sw, port, slot);
        endsHere = BitVector_IsSet(sw->portBitmap, slot);
        return false;
    });
}

DVSPort *FindPort(DVSwitch *sw, std::string_view portId, uint32_t kind) {
    if (HasIndex(sw)) {
        DVSPort *port = IndexFind(sw, PortKey(portId), kind);
        // Callers may change the slots. If the port is no longer in its slot, fall back to the walk. (A walk
        // also ends at an emptied slot before the port; the index does not detect that, because checking for
        // it would cost a walk.)
        if (!port || PortAt(sw, FrontOf(port).slot) == port) return port;
    }
    DVSPort *found = nullptr;
    WalkPorts(sw, [&](DVSPort *port) {
        if (Is(port, portId, kind)) found = port;
        return found != nullptr;
    });
    return found;
}

DVSPort *PortAt(DVSwitch *sw, uint32_t slot) {
    return slot < FrontOf(sw).slotNum ? sw->ports[slot] : nullptr;
}

} // namespace dvs::state

using namespace dvs::state;

namespace {

HYP_ReturnStatus AddById(const char *switchId, const char *portId, DVSData *data, uint32_t kind) {
    return DVSStatePortAdd(DVSState_SwitchFind(switchId), portId, data, kind, nullptr);
}

HYP_ReturnStatus RemoveById(const char *switchId, const char *portId, uint32_t kind) {
    return DVSStatePortRemove(DVSState_SwitchFind(switchId), portId, kind);
}

} // namespace

HYP_ReturnStatus DVSState_PortAdd(const char *switchId, const char *portId, DVSData *data) {
    return AddById(switchId, portId, data, DVS_PORT_ACTIVE);
}

HYP_ReturnStatus DVSState_LocalCachePortAdd(const char *switchId, const char *portId, DVSData *data) {
    return AddById(switchId, portId, data, DVS_PORT_LOCAL_CACHE);
}

HYP_ReturnStatus DVSState_PortAddShadow(const char *switchId, const char *portId, const void *buf,
                                        uint32_t len) {
    Message(kTrace, "DVSState_PortAddShadow %s, %s\n", switchId, portId);
    OwnedList data;
    HYP_ReturnStatus status = DeserializeOwned(data, buf, len);
    if (status != HYP_OK) return status;
    status = AddById(switchId, portId, data.get(), DVS_PORT_SHADOW);
    if (status == HYP_OK) (void)data.release(); // the port owns it now
    return status;
}

HYP_ReturnStatus DVSState_PortRemove(const char *switchId, const char *portId) {
    return RemoveById(switchId, portId, DVS_PORT_ACTIVE);
}

HYP_ReturnStatus DVSState_PortRemoveShadow(const char *switchId, const char *portId) {
    return RemoveById(switchId, portId, DVS_PORT_SHADOW);
}

HYP_ReturnStatus DVSState_PortRemoveZombie(const char *switchId, const char *portId) {
    return RemoveById(switchId, portId, DVS_PORT_ZOMBIE);
}

HYP_ReturnStatus DVSState_LocalCachePortRemove(const char *switchId, const char *portId) {
    return RemoveById(switchId, portId, DVS_PORT_LOCAL_CACHE);
}
