/* SPDX-License-Identifier: Apache-2.0 */
// The index of a switch's ports (port_index.h).

#include "dvsstate/port_index.h"

#include <algorithm>

#include "base/hash.h"
#include "dvsstate/switch_record.h"

namespace dvs::state {

namespace {

constexpr uint32_t kFirstBucketNum = 2 * kWalkedSlots;

DVSPort *&BucketFor(DVSwitch *sw, uint32_t hash) {
    return BucketsOf(sw)[hash & (FrontOf(sw).bucketNum - 1)];
}

/// The port after which a port of this slot belongs in the bucket. The bucket's first port is before that
/// slot.
DVSPort *Before(DVSPort *head, uint32_t slot) {
    DVSPort *port = head;
    while (FrontOf(port).next && FrontOf(FrontOf(port).next).slot < slot)
        port = FrontOf(port).next;
    return port;
}

/// Links a port into its bucket, in slot order. Ports mostly come in slot order, so it tries the bucket's
/// last port first.
void Link(DVSwitch *sw, DVSPort *port) {
    PortFront &front = FrontOf(port);
    DVSPort *&bucket = BucketFor(sw, front.hash);
    DVSPort *head = bucket;
    if (!head || front.slot < FrontOf(head).slot) {
        front.next = head;
        front.tail = head ? FrontOf(head).tail : port;
        bucket = port;
        return;
    }
    PortFront &headFront = FrontOf(head);
    DVSPort *before = front.slot > FrontOf(headFront.tail).slot ? headFront.tail : Before(head, front.slot);
    front.next = FrontOf(before).next;
    FrontOf(before).next = port;
    if (before == headFront.tail) headFront.tail = port;
}

/// Clears the buckets, sets their number to `bucketNum`, and links every port again.
void Rebuild(DVSwitch *sw, uint32_t bucketNum) {
    SwitchFront &front = FrontOf(sw);
    front.bucketNum = std::min(bucketNum, front.bucketCapacity);
    front.portNum = 0;
    std::fill_n(BucketsOf(sw), front.bucketNum, nullptr);
    for (uint32_t slot = 0; slot < front.usedSlots; slot++) {
        DVSPort *port = sw->ports[slot];
        if (!port) continue;
        Link(sw, port);
        front.portNum++;
    }
}

} // namespace

PortKey::PortKey(std::string_view portId) : id(portId), hash(static_cast<uint32_t>(base::HashText(portId))) {}

DVSPort *IndexFind(DVSwitch *sw, const PortKey &key, uint32_t kind) {
    DVSPort *port = BucketFor(sw, key.hash);
    while (port && !(FrontOf(port).hash == key.hash && port->portType == kind && key.id == port->portId))
        port = FrontOf(port).next;
    return port;
}

void IndexAdd(DVSwitch *sw, DVSPort *port, const PortKey &key, uint32_t slot) {
    SwitchFront &front = FrontOf(sw);
    PortFront &portFront = FrontOf(port);
    portFront.slot = slot;
    portFront.hash = key.hash;
    if (!HasIndex(sw)) {
        if (front.usedSlots > kWalkedSlots) Rebuild(sw, kFirstBucketNum);
        return;
    }
    if (front.portNum >= front.bucketNum && front.bucketNum < front.bucketCapacity) {
        Rebuild(sw, front.bucketNum * 2); // the port is already in its slot
        return;
    }
    Link(sw, port);
    front.portNum++;
}

void IndexRemove(DVSwitch *sw, DVSPort *port) {
    const PortFront &front = FrontOf(port);
    DVSPort *&bucket = BucketFor(sw, front.hash);
    FrontOf(sw).portNum--;
    if (bucket == port) {
        if (front.next) FrontOf(front.next).tail = front.tail;
        bucket = front.next;
        return;
    }
    DVSPort *before = Before(bucket, front.slot);
    FrontOf(before).next = front.next;
    if (FrontOf(bucket).tail == port) FrontOf(bucket).tail = before;
}

} // namespace dvs::state
