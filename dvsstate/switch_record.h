/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_SWITCH_RECORD_H
#define DVSSTATE_SWITCH_RECORD_H

// The allocation of switch and port records. Callers see exactly the fields of DVSwitch and DVSPort; what the
// library keeps for itself stands in front of the record in the same block:
//
//     | buckets[bucketCapacity] | SwitchFront | DVSwitch … ports[slotNum] |     | PortFront | DVSPort |
//                                             ^ the address everyone else knows             ^ likewise
//
// Used by the switch table (creation, removal), the port table (slots) and the port index (buckets, links).

#include <cstddef>
#include <cstdint>

#include "dvs/state.h"

namespace dvs::state {

// Agents are compiled with these records: a field that moves breaks every one of them.
static_assert(sizeof(DVSwitch) == 240);
static_assert(offsetof(DVSwitch, numPorts) == 0);
static_assert(offsetof(DVSwitch, maxPorts) == 4);
static_assert(offsetof(DVSwitch, newMaxPorts) == 8);
static_assert(offsetof(DVSwitch, version) == 12);
static_assert(offsetof(DVSwitch, switchId) == 16);
static_assert(offsetof(DVSwitch, className) == 80);
static_assert(offsetof(DVSwitch, globalPropList) == 208);
static_assert(offsetof(DVSwitch, hostPropList) == 216);
static_assert(offsetof(DVSwitch, classFlags) == 224);
static_assert(offsetof(DVSwitch, portBitmap) == 232);
static_assert(offsetof(DVSwitch, ports) == 240);
static_assert(sizeof(DVSPort) == 72);
static_assert(offsetof(DVSPort, portId) == 0);
static_assert(offsetof(DVSPort, portData) == 48);
static_assert(offsetof(DVSPort, owner) == 56);
static_assert(offsetof(DVSPort, portType) == 64);

/// Private fields of a switch. They are valid as long as the record.
struct SwitchFront {
    uint32_t slotNum;        // slots that ports[] really has: the host-wide limit at creation
    uint32_t usedSlots;      // one past the highest slot that ever held a port
    uint32_t firstFree;      // every slot below holds a port
    uint32_t portNum;        // ports in the index
    uint32_t bucketNum;      // buckets in use, a power of two; 0 while there is no index
    uint32_t bucketCapacity; // buckets in front of these fields; 0 for a record with few slots
};

/// Private fields of a port: its links in the switch's index. Meaningless while the switch has none.
struct PortFront {
    DVSPort *next; // in the bucket, in slot order; null at its end
    DVSPort *tail; // in a bucket's first port: its last one
    uint32_t hash; // of the id
    uint32_t slot; // where the port stands
};

// A switch with few slots in use is walked; an index would cost it more than it saves.
inline constexpr uint32_t kWalkedSlots = 64;

[[nodiscard]] inline SwitchFront &FrontOf(DVSwitch *sw) {
    return *(reinterpret_cast<SwitchFront *>(sw) - 1);
}
[[nodiscard]] inline PortFront &FrontOf(DVSPort *port) {
    return *(reinterpret_cast<PortFront *>(port) - 1);
}
[[nodiscard]] DVSPort **BucketsOf(DVSwitch *sw);

/// A record with `slotNum` empty slots, its bit vector and both property lists empty. HYP_NO_MEMORY when any
/// of its blocks cannot be had; nothing is left behind then.
[[nodiscard]] HYP_ReturnStatus NewSwitch(uint32_t slotNum, DVSwitch **out);

/// Frees the record, its bit vector and property lists; not its ports. None is fine.
void FreeSwitch(DVSwitch *sw);

/// A zeroed record; none when there is no memory.
[[nodiscard]] DVSPort *NewPort();

/// Frees the record and its port data. None is fine.
void FreePort(DVSPort *port);

} // namespace dvs::state

#endif
