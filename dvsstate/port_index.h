/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_PORT_INDEX_H
#define DVSSTATE_PORT_INDEX_H

// The index of a switch's ports by id: a hash table with its buckets in front of the switch record and its
// links in front of the port records. It allocates nothing of its own and cannot fail.
//
// A bucket links its ports in slot order, so its first match is also the first match of a walk over the
// slots, even among zombies with one id. The index does not contain kinds: they are compared on the record,
// where callers may change them. The index is built when a switch has more than kWalkedSlots slots in use.
// Only the port table changes it, so concurrent reads without a lock are safe.

#include <cstdint>
#include <string_view>

#include "dvs/state.h"
#include "dvsstate/switch_record.h"

namespace dvs::state {

/// True if the switch has an index. All functions below except IndexAdd require one.
[[nodiscard]] inline bool HasIndex(DVSwitch *sw) {
    return FrontOf(sw).bucketNum != 0;
}

/// A port's id and its hash, computed once for all operations on the port.
struct PortKey {
    explicit PortKey(std::string_view portId);

    std::string_view id;
    uint32_t hash;
};

/// Returns the first port in slot order with this id and kind, or null.
[[nodiscard]] DVSPort *IndexFind(DVSwitch *sw, const PortKey &key, uint32_t kind);

/// Indexes a port that was put into a slot. Builds the index when the switch has become large enough.
void IndexAdd(DVSwitch *sw, DVSPort *port, const PortKey &key, uint32_t slot);

/// Removes a port that is about to leave its slot.
void IndexRemove(DVSwitch *sw, DVSPort *port);

} // namespace dvs::state

#endif
