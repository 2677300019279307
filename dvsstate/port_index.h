/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_PORT_INDEX_H
#define DVSSTATE_PORT_INDEX_H

// The index of a switch's ports by id: a hash table whose buckets stand in front of the switch record and
// whose links stand in front of the port records, so that it needs no memory of its own and cannot fail.
//
// A bucket links its ports in slot order, so the first match in it is the first match of a walk over the
// slots, also among zombies of one id. Kinds are no part of it: they are compared on the record, where
// callers may change them. The index is built once a switch has more than kWalkedSlots slots in use; only the
// port table changes it, so that readers without a lock stay readers.

#include <cstdint>
#include <string_view>

#include "dvs/state.h"
#include "dvsstate/switch_record.h"

namespace dvs::state {

/// True when the switch has an index; the functions below need one, but for IndexAdd.
[[nodiscard]] inline bool HasIndex(DVSwitch *sw) {
    return FrontOf(sw).bucketNum != 0;
}

/// A port's id and what the index makes of it, worked out once for all that is done with the port.
struct PortKey {
    explicit PortKey(std::string_view portId);

    std::string_view id;
    uint32_t hash;
};

/// The first port in slot order of this id and kind; none when there is none.
[[nodiscard]] DVSPort *IndexFind(DVSwitch *sw, const PortKey &key, uint32_t kind);

/// Takes note of the port of this key, which was put into a slot, and builds the index when the switch has
/// become large enough.
void IndexAdd(DVSwitch *sw, DVSPort *port, const PortKey &key, uint32_t slot);

/// Forgets a port that is about to leave its slot.
void IndexRemove(DVSwitch *sw, DVSPort *port);

} // namespace dvs::state

#endif
