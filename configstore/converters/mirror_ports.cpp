/* SPDX-License-Identifier: Apache-2.0 */
// The ports of mirror sessions (mirror_ports.h), whose records layouts/mirror.h describes. What a group's
// records are, and where they go, depends on the session's type and on the direction of the group.

#include "configstore/converters/mirror_ports.h"

#include "configstore/converters/address.h"
#include "configstore/converters/common.h"
#include "configstore/layouts/mirror.h"

namespace dvs::convert {
namespace {

using layout::AreaOf;
using layout::At;
using layout::Slot;
using layout::mirror::kEncapsulatedSource;
using layout::mirror::kMixedDest;
using layout::mirror::kNarrowPort;
using layout::mirror::kRemoteDest;
using layout::mirror::kRemoteSource;
using layout::mirror::kSession;
using layout::mirror::kWidePort;

constexpr auto kSessionType = At<uint32_t>(kSession, "session_type");
constexpr auto kDestinationCount = At<uint32_t>(kSession, "destination_count");
constexpr auto kReceiveCount = At<uint32_t>(kSession, "receive_count");
constexpr auto kTransmitCount = At<uint32_t>(kSession, "transmit_count");
constexpr auto kFirstRecord = At<uint32_t>(kSession, "first_record");
constexpr auto kPortKind = At<uint32_t>(kNarrowPort, "kind");
constexpr auto kPortName = AreaOf(kWidePort, "name");
static_assert(AreaOf(kNarrowPort, "name").offset == kPortName.offset);
// The same bytes, where the session's type makes them a VLAN id or an address.
constexpr auto kPortVlanId = At<uint16_t>(layout::mirror::kNarrowVlan, "vlan_id");
constexpr Slot<uint8_t> kPortIsIpv6 = {AreaOf(layout::mirror::kNarrowAddress, "address").offset};
constexpr uint32_t kPortAddress = kPortIsIpv6.offset + 4;

enum PortKind : uint32_t { kPortKey = 0, kUplinkName = 1 };

// --- Save ---

// The records from a group's first one to the value's end, of which `count` are the group's.
struct PortGroup {
    std::span<const uint8_t> bytes;
    uint32_t count;
    std::size_t recordSize;
    std::span<const uint8_t> operator[](std::size_t i) const { return bytes.subspan(i * recordSize); }
};

int32_t AppendNames(configstore::Object *ports, const char *list, const PortGroup &group) {
    int32_t status = 0;
    for (std::size_t i = 0; i < group.count && !status; ++i) {
        status = AppendText(ports, list, group[i].subspan(kPortName.offset));
    }
    return status;
}

int32_t SaveUplinks(configstore::Object *ports, const PortGroup &group) {
    const int32_t status = configstore::SetValueEmptyList(ports, "uplink_port_names");
    return status ? status : AppendNames(ports, "uplink_port_names", group);
}

int32_t SaveVlans(configstore::Object *ports, const PortGroup &group) {
    int32_t status = configstore::SetValueEmptyList(ports, "vlans");
    for (std::size_t i = 0; i < group.count && !status; ++i) {
        status = configstore::AppendValueInt(ports, "vlans", Get(group[i], kPortVlanId));
    }
    return status;
}

int32_t SaveAddresses(configstore::Object *ports, const PortGroup &group) {
    int32_t status = 0;
    for (std::size_t i = 0; i < group.count && !status; ++i) {
        const auto address = group[i].subspan(kPortAddress).first<16>();
        const AddressText text = FormatAddress(address, Get(group[i], kPortIsIpv6) != 0);
        // Emptied each time: of several destinations the last one stays, which is what there always was.
        status = configstore::SetValueEmptyList(ports, "addresses");
        if (!status) status = configstore::AppendValueString(ports, "addresses", text.text);
    }
    return status;
}

int32_t SaveMixed(configstore::Object *ports, const PortGroup &group) {
    int32_t status = configstore::SetValueEmptyList(ports, "uplink_port_names");
    if (!status) status = configstore::SetValueEmptyList(ports, "port_keys");
    for (std::size_t i = 0; i < group.count && !status; ++i) {
        const auto name = group[i].subspan(kPortName.offset);
        const uint32_t kind = Get(group[i], kPortKind);
        if (kind == kUplinkName) status = AppendText(ports, "uplink_port_names", name);
        if (kind == kPortKey) status = AppendText(ports, "port_keys", name);
    }
    return status;
}

int32_t SaveGroup(configstore::Object *ports, const PortGroup &group, uint32_t sessionType,
                  bool isDestination) {
    if (isDestination && sessionType == kRemoteSource) return SaveUplinks(ports, group);
    if (!isDestination && sessionType == kRemoteDest) return SaveVlans(ports, group);
    if (isDestination && sessionType == kEncapsulatedSource) return SaveAddresses(ports, group);
    if (isDestination && sessionType == kMixedDest) return SaveMixed(ports, group);
    return AppendNames(ports, "port_keys", group);
}

// --- Load ---

// Number of instances, or elements of lists, of that name in or below the object.
std::size_t CountOf(configstore::Object *object, const char *name) {
    Instances found;
    (void)found.Read(object, name); // none is none
    return found.items().size();
}

// The names of one port object in the order of their records.
struct PortNames {
    StoreTexts keys, uplinks;
    PortNames(configstore::Object *ports, bool isDestination) {
        if (!ports) return;
        (void)keys.Read(ports, "port_keys"); // a list that cannot be read is no list
        if (isDestination) (void)uplinks.Read(ports, "uplink_port_names");
    }
    [[nodiscard]] std::size_t count() const { return keys.items().size() + uplinks.items().size(); }
};

void Write(const PortArea &area, std::size_t index, PortKind kind, const char *name) {
    const std::size_t at = index * area.recordSize;
    if (area.bytes.size() < at + area.recordSize) return; // a list that could not be read when it was counted
    Put(area.bytes.subspan(at), kPortKind, kind);
    CopyUnbounded(area.bytes, at + kPortName.offset, name);
}

// Writes a group's records and its count. The count goes into the destinations' field whatever the group is,
// and the next group starts behind what the group's own field says: the transmit sources take the receive
// sources' place.
void LoadGroup(configstore::Object *ports, std::span<uint8_t> session, Slot<uint32_t> ownCount,
               PortArea *area) {
    const PortNames names(ports, ownCount.offset == kDestinationCount.offset);
    std::size_t index = area->next;
    for (const char *key : names.keys.items())
        Write(*area, index++, kPortKey, key);
    for (const char *uplink : names.uplinks.items())
        Write(*area, index++, kUplinkName, uplink);
    Put(session, kDestinationCount, static_cast<uint32_t>(names.count()));
    area->next += Get(session, ownCount);
}

} // namespace

std::size_t PortRecordSize(bool wide) {
    return wide ? kWidePort.size : kNarrowPort.size;
}

uint64_t AnnouncedPorts(std::span<const uint8_t> session) {
    return uint64_t{Get(session, kDestinationCount)} + Get(session, kReceiveCount) +
           Get(session, kTransmitCount);
}

SessionPorts SessionPorts::Of(configstore::Object *vspan) {
    SessionPorts ports = {};
    (void)configstore::GetSubObject(vspan, "destination_port", nullptr, &ports.destination);
    (void)configstore::GetSubObject(vspan, "source_recv_port", nullptr, &ports.receive);
    (void)configstore::GetSubObject(vspan, "source_transmit_port", nullptr, &ports.transmit);
    return ports;
}

int32_t SaveSessionPorts(const SessionPorts &ports, std::span<const uint8_t> session, PortRecords *records) {
    const struct {
        configstore::Object *object;
        Slot<uint32_t> count;
        bool isDestination;
    } groups[] = {{ports.destination, kDestinationCount, true},
                  {ports.receive, kReceiveCount, false},
                  {ports.transmit, kTransmitCount, false}};
    int32_t status = 0;
    for (const auto &group : groups) {
        if (status) return status;
        const uint32_t count = Get(session, group.count);
        status = SaveGroup(group.object, {records->bytes, count, records->recordSize},
                           Get(session, kSessionType), group.isDestination);
        records->bytes = records->bytes.subspan(count * records->recordSize);
    }
    return status;
}

uint64_t CountedPorts(configstore::Object *vspan) {
    uint64_t count = 0;
    for (const char *name : {"source_transmit_port", "source_recv_port", "destination_port"}) {
        configstore::Object *ports = nullptr;
        (void)configstore::GetSubObject(vspan, name, nullptr, &ports);
        count += CountOf(vspan, "port_keys");
    }
    return count + CountOf(vspan, "uplink_port_names");
}

uint64_t PortsToLoad(configstore::Object *vspan) {
    const SessionPorts ports = SessionPorts::Of(vspan);
    return PortNames(ports.destination, true).count() + PortNames(ports.receive, false).count() +
           PortNames(ports.transmit, false).count();
}

void LoadSessionPorts(const SessionPorts &ports, std::span<uint8_t> session, PortArea *area) {
    Put(session, kFirstRecord, static_cast<uint32_t>(area->next));
    LoadGroup(ports.destination, session, kDestinationCount, area);
    LoadGroup(ports.receive, session, kReceiveCount, area);
    LoadGroup(ports.transmit, session, kTransmitCount, area);
}

} // namespace dvs::convert
