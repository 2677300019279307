/* SPDX-License-Identifier: Apache-2.0 */
// The index of a switch's ports (port_index.h), between the records of switch_record.h and the port table.

#include "dvsstate/port_index.h"

#include <algorithm>
#include <cstring>

#include "dvsstate/switch_record.h"

namespace dvs::state {

namespace {

constexpr uint32_t kFirstBucketNum = 2 * kWalkedSlots;

uint32_t HashOf(std::string_view id) {
    // Eight bytes a step; an odd multiplier and a shift spread them. Ids made to collide cost what a walk
    // costs.
    constexpr uint64_t kMultiplier = 0x9e3779b97f4a7c15;
    uint64_t hash = id.size();
    while (!id.empty()) {
        uint64_t word = 0;
        const std::size_t size = std::min(id.size(), sizeof word);
        std::memcpy(&word, id.data(), size);
        hash = (hash ^ word) * kMultiplier;
        hash ^= hash >> 32;
        id.remove_prefix(size);
    }
    return static_cast<uint32_t>(hash);
}

uint32_t &BucketFor(DVSwitch *sw, uint32_t hash) {
    return BucketsOf(sw)[hash & (FrontOf(sw).bucketNum - 1)];
}

/// The port that a link names; none at a bucket's end.
DVSPort *Follow(DVSwitch *sw, uint32_t link) {
    return link == 0 ? nullptr : sw->ports[link - 1];
}

/// Links a port into its bucket, in slot order. Ports mostly come in slot order, so the bucket's last one is
/// tried first.
void Link(DVSwitch *sw, DVSPort *port) {
    PortFront &front = FrontOf(port);
    const uint32_t link = front.slot + 1;
    uint32_t &bucket = BucketFor(sw, front.hash);
    front.next = 0;
    DVSPort *head = Follow(sw, bucket);
    if (!head) {
        front.tail = bucket = link;
        return;
    }
    PortFront &headFront = FrontOf(head);
    if (link < bucket) {
        front.next = bucket;
        front.tail = headFront.tail;
        bucket = link;
        return;
    }
    if (link > headFront.tail) {
        FrontOf(Follow(sw, headFront.tail)).next = link;
        headFront.tail = link;
        return;
    }
    PortFront *before = &headFront;
    while (before->next < link)
        before = &FrontOf(Follow(sw, before->next));
    front.next = before->next;
    before->next = link;
}

/// Empties the buckets, now `bucketNum` of them, and links every port anew.
void Rebuild(DVSwitch *sw, uint32_t bucketNum) {
    SwitchFront &front = FrontOf(sw);
    front.bucketNum = std::min(bucketNum, front.bucketCapacity);
    front.portNum = 0;
    std::memset(BucketsOf(sw), 0, front.bucketNum * sizeof(uint32_t));
    for (uint32_t slot = 0; slot < front.usedSlots; slot++) {
        DVSPort *port = sw->ports[slot];
        if (!port) continue;
        Link(sw, port);
        front.portNum++;
    }
}

} // namespace

bool HasIndex(DVSwitch *sw) {
    return FrontOf(sw).bucketNum != 0;
}

DVSPort *IndexFind(DVSwitch *sw, std::string_view portId, uint32_t kind) {
    const uint32_t hash = HashOf(portId);
    DVSPort *port = Follow(sw, BucketFor(sw, hash));
    while (port) {
        const PortFront &front = FrontOf(port);
        if (front.hash == hash && port->portType == kind && portId == port->portId) return port;
        port = Follow(sw, front.next);
    }
    return nullptr;
}

void IndexAdd(DVSwitch *sw, DVSPort *port, uint32_t slot) {
    SwitchFront &front = FrontOf(sw);
    PortFront &portFront = FrontOf(port);
    portFront.slot = slot;
    portFront.hash = HashOf(port->portId);
    if (!HasIndex(sw)) {
        if (front.usedSlots > kWalkedSlots) Rebuild(sw, kFirstBucketNum);
        return;
    }
    if (front.portNum >= front.bucketNum && front.bucketNum < front.bucketCapacity) {
        Rebuild(sw, front.bucketNum * 2); // the port stands in its slot already
        return;
    }
    Link(sw, port);
    front.portNum++;
}

void IndexRemove(DVSwitch *sw, DVSPort *port) {
    const PortFront &front = FrontOf(port);
    const uint32_t link = front.slot + 1;
    uint32_t &bucket = BucketFor(sw, front.hash);
    FrontOf(sw).portNum--;
    if (bucket == link) {
        if (DVSPort *next = Follow(sw, front.next)) FrontOf(next).tail = front.tail;
        bucket = front.next;
        return;
    }
    PortFront &head = FrontOf(Follow(sw, bucket));
    PortFront *before = &head;
    while (before->next != link)
        before = &FrontOf(Follow(sw, before->next));
    before->next = front.next;
    if (head.tail == link) head.tail = before->slot + 1;
}

} // namespace dvs::state
