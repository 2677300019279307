/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_SWITCH_RECORD_H
#define DVSSTATE_SWITCH_RECORD_H

// The allocation of switch and port records. Callers see exactly the fields of DVSwitch and DVSPort; private
// fields are in front of the record in the same block:
//
//     | buckets[bucketCapacity] | SwitchFront | DVSwitch … ports[slotNum] |     | PortFront | DVSPort |
//                                             ^ the address that callers get                ^ the same
//
// Used by the switch table (creation, removal), the port table (slots) and the port index (buckets, links).

#include <cstddef>
#include <cstdint>

#include "dvs/state.h"

namespace dvs::state {

// Agents are compiled with these records: moving a field breaks all of them.
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
    uint32_t slotNum;        // allocated slots of ports[]: the host-wide limit at creation
    uint32_t usedSlots;      // one past the highest slot that ever held a port
    uint32_t firstFree;      // every slot below holds a port
    uint32_t portNum;        // ports in the index
    uint32_t bucketNum;      // buckets in use, a power of two; 0 without an index
    uint32_t bucketCapacity; // buckets in front of these fields; 0 for a record with few slots
};

/// Private fields of a port: its links in the switch's index. Meaningless if the switch has no index.
struct PortFront {
    DVSPort *next; // in the bucket, in slot order; null at its end
    DVSPort *tail; // in a bucket's first port: the bucket's last port
    uint32_t hash; // of the id
    uint32_t slot; // the port's slot
};

// A switch with few slots in use is walked; an index would cost more than it saves.
inline constexpr uint32_t kWalkedSlots = 64;

[[nodiscard]] inline SwitchFront &FrontOf(DVSwitch *sw) {
    return *(reinterpret_cast<SwitchFront *>(sw) - 1);
}
[[nodiscard]] inline PortFront &FrontOf(DVSPort *port) {
    return *(reinterpret_cast<PortFront *>(port) - 1);
}
[[nodiscard]] DVSPort **BucketsOf(DVSwitch *sw);

/// Creates a record with `slotNum` empty slots, its bit vector and two empty property lists. HYP_NO_MEMORY if
/// any allocation fails; nothing stays allocated then.
[[nodiscard]] HYP_ReturnStatus NewSwitch(uint32_t slotNum, DVSwitch **out);

/// Frees the record, its bit vector and property lists, but not its ports. Null is a no-op.
void FreeSwitch(DVSwitch *sw);

/// Returns a zeroed record; null if out of memory.
[[nodiscard]] DVSPort *NewPort();

/// Frees the record and its port data. Null is a no-op.
void FreePort(DVSPort *port);

} // namespace dvs::state

#endif
