/* SPDX-License-Identifier: Apache-2.0 */
// Mirror sessions: one table (mirror_record.h) <-> the instances of "vspans", keyed by the session key.
// Called through the converter table for the rows of switches and of ports.

#include "configstore/converters/mirror.h"

#include <algorithm>

#include "configstore/converters/address.h"
#include "configstore/converters/common.h"
#include "configstore/converters/mirror_record.h"
#include "configstore/converters/switch_version.h"

const char *SESSION_TYPE_LOCAL_ENUM_2_SCHEMA[VSPAN_SESSION_TYPE_NUM] = {
    "MIXED_DEST_MIRROR",
    "DVPORT_MIRROR",
    "REMOTE_MIRROR_SOURCE",
    "REMOTE_MIRROR_DEST",
    "ENCAPSULATED_REMOTE_MIRROR_SOURCE",
    nullptr,
};
const char *ENCAP_TYPE_LOCAL_ENUM_2SCHEMA[VSPAN_ENCAP_TYPE_NUM] = {"GRE", "ERSPAN2", "ERSPAN3"};

namespace dvs::layout {

constexpr Record kMirrorTableNarrow = {"mirror session table", mirror::kHeadSize, mirror::kHeadFields,
                                       mirror::kNarrowParts};
constexpr Record kMirrorTableWide = {"mirror session table, wide port records", mirror::kHeadSize,
                                     mirror::kHeadFields, mirror::kWideParts};
static_assert(IsSound(kMirrorTableNarrow) && IsSound(kMirrorTableWide));

} // namespace dvs::layout

namespace dvs::convert {
namespace {

using layout::AreaOf;
using layout::At;
using layout::kMirrorTableNarrow;
using layout::Slot;
using layout::mirror::kEncapsulatedSource;
using layout::mirror::kMixedDest;
using layout::mirror::kNarrowPort;
using layout::mirror::kRemoteDest;
using layout::mirror::kRemoteSource;
using layout::mirror::kSession;
using layout::mirror::kWidePort;

constexpr auto kMagic = At<uint32_t>(kMirrorTableNarrow, "magic");
constexpr auto kVersion = At<uint32_t>(kMirrorTableNarrow, "version");
constexpr auto kSessionCount = At<uint32_t>(kMirrorTableNarrow, "session_count");
constexpr auto kPortCount = At<uint32_t>(kMirrorTableNarrow, "port_count");
constexpr auto kKey = AreaOf(kSession, "key");
constexpr auto kName = AreaOf(kSession, "name");
constexpr auto kSessionType = At<uint32_t>(kSession, "session_type");
constexpr auto kPacketLength = At<uint32_t>(kSession, "mirrored_packet_length");
constexpr auto kFlags = At<uint32_t>(kSession, "flags");
constexpr auto kEncapVlan = At<uint16_t>(kSession, "encapsulation_vlan_id");
constexpr auto kReceiveTypes = At<uint16_t>(kSession, "receive_connectee_types");
constexpr auto kTransmitTypes = At<uint16_t>(kSession, "transmit_connectee_types");
constexpr auto kSamplingRate = At<uint32_t>(kSession, "sampling_rate");
constexpr auto kEncapType = At<uint32_t>(kSession, "encap_type");
constexpr auto kErspanId = At<uint16_t>(kSession, "erspan_id");
constexpr auto kErspanCos = At<uint8_t>(kSession, "erspan_COS");
constexpr auto kErspanNanosec = At<uint8_t>(kSession, "erspan_gra_nanosec");
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

constexpr std::size_t kHeadSize = layout::mirror::kHeadSize;
constexpr uint32_t kMagicValue = 0xFACEBEEF;
constexpr uint32_t kFormatVersion = 1;
constexpr uint32_t kNotSet = 0xFFFFFFFF;

constexpr uint32_t kNormalTrafficNotAllowed = 0x01;
constexpr uint32_t kNormalTrafficNotAllowedOnLoad = 0x03;
constexpr uint32_t kKeepOriginalVlan = 0x04;
constexpr uint32_t kHasEncapVlan = 0x08;
constexpr uint32_t kLegacyMode = 0x10;
constexpr uint32_t kDisabled = 0x20;

enum PortKind : uint32_t { kPortKey = 0, kUplinkName = 1 };

struct ConnecteeType {
    uint16_t bit;
    const char *text;
};
constexpr ConnecteeType kConnecteeTypes[] = {{0x1, "VM_VNIC"}, {0x2, "PNIC"}, {0x8, "HOST_HYP_VNIC"}};
constexpr uint16_t kAnyConnecteeType = 0x4;
constexpr const char *kConnecteeList = "wildcard_port_connectee_types";

// --- Save ---

// Port records from the group's first one to the value's end: a text that lacks its NUL ends there.
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

int32_t SaveConnecteeTypes(configstore::Object *ports, uint16_t bits) {
    int32_t status = configstore::SetValueEmptyList(ports, kConnecteeList);
    for (const ConnecteeType &type : kConnecteeTypes) {
        if (status) return status;
        if (bits & type.bit) status = configstore::AppendValueString(ports, kConnecteeList, type.text);
    }
    return status;
}

int32_t SaveIdentity(const SaveArgs &args, configstore::Object *vspan, std::span<const uint8_t> session,
                     const char *key) {
    int32_t status = configstore::SetValueStr(vspan, "key", key);
    if (status) return status;
    status = SetText(vspan, "name", session.subspan(kName.offset));
    if (status) return status;
    if (Get(session, kPacketLength) == kNotSet) {
        // Every other length is left out, and so comes back as "not set".
        status = configstore::SetValueUint32(vspan, "mirrored_packet_length", kNotSet);
        if (status) return status;
    }
    const char *type = EnumText(SESSION_TYPE_LOCAL_ENUM_2_SCHEMA, Get(session, kSessionType));
    status = configstore::SetValueStr(vspan, "session_type", type);
    if (status) return status;
    const uint32_t flags = Get(session, kFlags);
    status = configstore::SetValueBool(vspan, "enabled", !(flags & kDisabled));
    if (status) return status;
    status = configstore::SetValueBool(vspan, "strip_original_vlan", !(flags & kKeepOriginalVlan));
    if (status) return status;
    // Whether these two are written has never decided about the session.
    (void)configstore::SetValueBool(vspan, "normal_traffic_allowed", !(flags & kNormalTrafficNotAllowed));
    (void)configstore::SetValueBool(vspan, "legacy_mode", flags & kLegacyMode);
    if (!(flags & kLegacyMode)) return 0;
    configstore::Object *settings = nullptr;
    status = GetOrCreateSubObject(true, args.root, "settings", nullptr, &settings);
    return status ? status : configstore::SetValueStr(settings, "promiscuous_mode_vspan_session", key);
}

int32_t SaveEncapsulation(configstore::Object *vspan, std::span<const uint8_t> session) {
    (void)configstore::SetValueUint32(vspan, "sampling_rate", Get(session, kSamplingRate)); // as above
    const char *type = EnumText(ENCAP_TYPE_LOCAL_ENUM_2SCHEMA, Get(session, kEncapType));
    int32_t status = configstore::SetValueStr(vspan, "encap_type", type);
    if (status) return status;
    status = configstore::SetValueUint16(vspan, "erspan_id", Get(session, kErspanId));
    if (status) return status;
    status = configstore::SetValueUint16(vspan, "erspan_COS", Get(session, kErspanCos));
    if (status) return status;
    return configstore::SetValueBool(vspan, "erspan_gra_nanosec", Get(session, kErspanNanosec) != 0);
}

// `session` runs from the session to the value's end. `ports` starts at its first port record and is moved
// behind its last one.
int32_t SaveSession(const SaveArgs &args, std::span<const uint8_t> session, PortGroup *ports) {
    const Text key(session.subspan(kKey.offset));
    if (!key.get()) return kFailed;
    configstore::Object *vspan = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, key.get(), &vspan);
    if (status) return status;
    status = SaveIdentity(args, vspan, session, key.get());
    if (status) return status;

    configstore::Object *transmit = nullptr;
    status = GetOrCreateSubObject(true, vspan, "source_transmit_port", nullptr, &transmit);
    if (status) return status;
    configstore::Object *receive = nullptr;
    status = GetOrCreateSubObject(true, vspan, "source_recv_port", nullptr, &receive);
    if (status) return status;
    status = configstore::SetValueUint32(vspan, "encapsulation_vlan_id", Get(session, kEncapVlan));
    if (status) return status;
    status = SaveConnecteeTypes(receive, Get(session, kReceiveTypes));
    if (status) return status;
    status = SaveConnecteeTypes(transmit, Get(session, kTransmitTypes));
    if (status) return status;
    status = SaveEncapsulation(vspan, session);
    if (status) return status;

    configstore::Object *destination = nullptr;
    status = GetOrCreateSubObject(true, vspan, "destination_port", nullptr, &destination);
    const struct {
        configstore::Object *object;
        Slot<uint32_t> count;
        bool isDestination;
    } groups[] = {{destination, kDestinationCount, true},
                  {receive, kReceiveCount, false},
                  {transmit, kTransmitCount, false}};
    for (const auto &group : groups) {
        if (status) return status;
        ports->count = Get(session, group.count);
        status = SaveGroup(group.object, *ports, Get(session, kSessionType), group.isDestination);
        ports->bytes = ports->bytes.subspan(ports->count * ports->recordSize);
    }
    return status;
}

// Whether the value holds all sessions it announces and all port records that those announce.
bool IsWhole(std::span<const uint8_t> value, uint32_t sessions, std::size_t recordSize) {
    if (!HoldsRecords(value, kHeadSize, sessions, kSession.size)) return false;
    uint64_t ports = 0;
    for (std::size_t i = 0; i < sessions; ++i) {
        const auto session = value.subspan(kHeadSize + i * kSession.size, kSession.size);
        ports += uint64_t{Get(session, kDestinationCount)} + Get(session, kReceiveCount) +
                 Get(session, kTransmitCount);
    }
    return HoldsRecords(value, kHeadSize + std::size_t{sessions} * kSession.size, ports, recordSize);
}

// --- Load ---

// Number of instances, or elements of lists, of that name in or below the object.
std::size_t CountOf(configstore::Object *object, const char *name) {
    Instances found;
    (void)found.Read(object, name); // none is none
    return found.items().size();
}

// What the port area is sized by. Each of the three port objects counts the port keys of the whole session,
// so that the sum is larger than what is written; it stands in the head and decides about the value's length.
uint64_t CountPorts(configstore::Object *session) {
    uint64_t count = 0;
    for (const char *name : {"source_transmit_port", "source_recv_port", "destination_port"}) {
        configstore::Object *ports = nullptr;
        (void)configstore::GetSubObject(session, name, nullptr, &ports);
        count += CountOf(session, "port_keys");
    }
    return count + CountOf(session, "uplink_port_names");
}

// A session's three objects; null where it lacks one.
struct SessionPorts {
    configstore::Object *destination = nullptr, *receive = nullptr, *transmit = nullptr;
    explicit SessionPorts(configstore::Object *session) {
        (void)configstore::GetSubObject(session, "destination_port", nullptr, &destination);
        (void)configstore::GetSubObject(session, "source_recv_port", nullptr, &receive);
        (void)configstore::GetSubObject(session, "source_transmit_port", nullptr, &transmit);
    }
};

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

uint64_t CountRecords(configstore::Object *session) {
    const SessionPorts ports(session);
    return PortNames(ports.destination, true).count() + PortNames(ports.receive, false).count() +
           PortNames(ports.transmit, false).count();
}

struct LoadedFlag {
    const char *name;
    uint32_t whenFalse;
};
// "legacy_mode" is read the other way round than it is written: a session in legacy mode does not come back
// as one.
constexpr LoadedFlag kLoadedFlags[] = {
    {"enabled", kDisabled},
    {"strip_original_vlan", kKeepOriginalVlan},
    {"normal_traffic_allowed", kNormalTrafficNotAllowedOnLoad},
    {"legacy_mode", kLegacyMode},
};

// `previous` is the bool read last: an absent field takes it over.
int32_t LoadFlags(configstore::Object *vspan, std::span<uint8_t> session, bool *previous) {
    uint32_t flags = Get(session, kEncapVlan) ? kHasEncapVlan : 0;
    for (const LoadedFlag &field : kLoadedFlags) {
        bool flag = false;
        const int32_t status = configstore::GetValueBool(vspan, field.name, &flag);
        if (status && status != configstore::NOT_FOUND) return status;
        if (!status) *previous = flag;
        if (!*previous) flags |= field.whenFalse;
    }
    Put(session, kFlags, flags);
    return 0;
}

uint16_t LoadConnecteeTypes(configstore::Object *ports) {
    StoreTexts texts;
    if (!ports || texts.Read(ports, kConnecteeList)) return 0;
    uint16_t bits = texts.items().empty() ? 0 : kAnyConnecteeType;
    for (const char *text : texts.items()) {
        for (const ConnecteeType &type : kConnecteeTypes) {
            if (std::strcmp(text, type.text) == 0) bits |= type.bit;
        }
    }
    return bits;
}

void LoadNumber(configstore::Object *vspan, const char *name, std::span<uint8_t> session,
                Slot<uint32_t> slot) {
    uint32_t number = 0;
    if (configstore::GetValueUint32(vspan, name, &number) == 0) Put(session, slot, number);
}

// A text that cannot be read leaves 0, one that the table lacks stores kNotSet after `message`.
void LoadEnum(configstore::Object *vspan, const char *name, std::span<const char *const> table,
              const char *message, std::span<uint8_t> session, Slot<uint32_t> slot) {
    StoreText text;
    if (text.Read(vspan, name)) return;
    const auto index = EnumIndex(table, text.get());
    if (!index) config::LogError("%s: %s\n", message, text.get());
    Put(session, slot, index.value_or(kNotSet));
}

int32_t LoadSession(configstore::Object *vspan, std::span<uint8_t> session, bool *previous) {
    StoreText text;
    if (text.Read(vspan, "key") == 0) CopyBounded(session.subspan(kKey.offset, kKey.size), text.get());
    if (text.Read(vspan, "name") == 0) CopyBounded(session.subspan(kName.offset, kName.size), text.get());
    Put(session, kPacketLength, kNotSet);
    LoadNumber(vspan, "mirrored_packet_length", session, kPacketLength);
    uint32_t number = 0;
    if (configstore::GetValueUint32(vspan, "encapsulation_vlan_id", &number) == 0) {
        Put(session, kEncapVlan, static_cast<uint16_t>(number));
    }
    const int32_t status = LoadFlags(vspan, session, previous);
    if (status) return status;
    const SessionPorts ports(vspan);
    Put(session, kReceiveTypes, LoadConnecteeTypes(ports.receive));
    Put(session, kTransmitTypes, LoadConnecteeTypes(ports.transmit));
    LoadEnum(vspan, "session_type", SESSION_TYPE_LOCAL_ENUM_2_SCHEMA, "Unknown vspan session type in schema",
             session, kSessionType);
    LoadEnum(vspan, "encap_type", ENCAP_TYPE_LOCAL_ENUM_2SCHEMA, "Unknown vspan encap type in schema",
             session, kEncapType);
    LoadNumber(vspan, "sampling_rate", session, kSamplingRate);
    uint16_t small = 0;
    if (configstore::GetValueUint16(vspan, "erspan_id", &small) == 0) Put(session, kErspanId, small);
    if (configstore::GetValueUint16(vspan, "erspan_COS", &small) == 0)
        Put(session, kErspanCos, static_cast<uint8_t>(small));
    bool nanosec = false;
    if (configstore::GetValueBool(vspan, "erspan_gra_nanosec", &nanosec) == 0)
        Put(session, kErspanNanosec, nanosec);
    return 0;
}

// The port area of the value, and the index of the next record in it.
struct PortArea {
    std::span<uint8_t> bytes;
    std::size_t recordSize;
    std::size_t next = 0;

    void Write(std::size_t index, PortKind kind, const char *name) const {
        const std::size_t at = index * recordSize;
        if (bytes.size() < at + recordSize) return; // a list that could not be read when it was counted
        Put(bytes.subspan(at), kPortKind, kind);
        CopyUnbounded(bytes, at + kPortName.offset, name);
    }
};

// Writes a group's records and its count. The count goes into the destinations' field whatever the group is,
// and the next group starts behind what the group's own field says: the transmit sources take the receive
// sources' place.
void LoadGroup(configstore::Object *ports, std::span<uint8_t> session, Slot<uint32_t> ownCount,
               PortArea *area) {
    const PortNames names(ports, ownCount.offset == kDestinationCount.offset);
    std::size_t index = area->next;
    for (const char *key : names.keys.items())
        area->Write(index++, kPortKey, key);
    for (const char *uplink : names.uplinks.items())
        area->Write(index++, kUplinkName, uplink);
    Put(session, kDestinationCount, static_cast<uint32_t>(names.count()));
    area->next += Get(session, ownCount);
}

int32_t LoadTable(std::span<configstore::Object *const> vspans, std::span<uint8_t> value,
                  std::size_t recordSize) {
    PortArea area{value.subspan(kHeadSize + vspans.size() * kSession.size), recordSize};
    bool previous = false;
    std::size_t at = kHeadSize;
    for (configstore::Object *vspan : vspans) {
        const auto session = value.subspan(at, kSession.size);
        const int32_t status = LoadSession(vspan, session, &previous);
        if (status) return status;
        Put(session, kFirstRecord, static_cast<uint32_t>(area.next));
        const SessionPorts ports(vspan);
        LoadGroup(ports.destination, session, kDestinationCount, &area);
        LoadGroup(ports.receive, session, kReceiveCount, &area);
        LoadGroup(ports.transmit, session, kTransmitCount, &area);
        at += kSession.size;
    }
    return 0;
}

// Whether this switch has wide port records. A port's own object knows nothing of the switch: the switch that
// is being loaded does, and where none is, the flag that a whole save or load sets.
int32_t HasWideRecords(const LoadArgs &args, bool *wide) {
    configstore::Object *owner = args.propClass == DVS_PROP_CLASS_PORT ? dvsLoadedSwitch : args.root;
    if (!owner) {
        *wide = dvsWidePortRecords;
        return 0;
    }
    uint32_t version = 0;
    const int32_t status = ReadSwitchVersion(owner, &version);
    *wide = version > kLastNarrowPortVersion;
    return status;
}

bool IsKeyOfThisClass(const char *key) {
    const bool isVswitchKey = std::strcmp(key, "com.orbeno.vswitch.mirrorSessions") == 0 ||
                              std::strcmp(key, "com.orbeno.vswitch.port.mirrorSessions") == 0;
    const bool isEtherswitchKey = std::strcmp(key, "com.orbeno.etherswitch.mirrorSessions") == 0 ||
                                  std::strcmp(key, "com.orbeno.etherswitch.port.mirrorSessions") == 0;
    return dvsSwitchClass ? isVswitchKey : isEtherswitchKey;
}

std::size_t RecordSize(bool wide) {
    return wide ? kWidePort.size : kNarrowPort.size;
}

} // namespace

int32_t SaveMirrorSessions(const SaveArgs &args) {
    if (args.value.size() < kSessionCount.End()) return kFailed;
    const uint32_t count = Get(args.value, kSessionCount);
    if (count == 0) return 0;
    const std::size_t recordSize = RecordSize(dvsWidePortRecords);
    if (!IsWhole(args.value, count, recordSize)) return kFailed;
    PortGroup ports{args.value.subspan(kHeadSize + std::size_t{count} * kSession.size), 0, recordSize};
    int32_t status = 0;
    for (std::size_t i = 0; i < count && !status; ++i) {
        status = SaveSession(args, args.value.subspan(kHeadSize + i * kSession.size), &ports);
    }
    return status;
}

int32_t LoadMirrorSessions(const LoadArgs &args) {
    if (!IsKeyOfThisClass(args.key)) return 0;
    Instances vspans;
    const int32_t found = vspans.Read(args.parent, args.leaf);
    // A switch that is being loaded has had its version read before any of its ports: most have no sessions,
    // and those need not ask again.
    const bool known = args.propClass == DVS_PROP_CLASS_PORT && args.image;
    if (known && found == configstore::NOT_FOUND) return 0;
    bool wide = false;
    int32_t status = HasWideRecords(args, &wide);
    if (status) return status;
    if (found) return found == configstore::NOT_FOUND ? 0 : found;
    if (vspans.items().empty()) return 0;

    uint64_t ports = 0;
    uint64_t records = 0;
    for (configstore::Object *vspan : vspans.items()) {
        ports += CountPorts(vspan);
        records += CountRecords(vspan);
    }
    const std::size_t recordSize = RecordSize(wide);
    Block block;
    if (!block.Allocate(kHeadSize + vspans.items().size() * kSession.size +
                        std::max(ports, records) * recordSize)) {
        config::LogError("Failed to alloc memory for DVMirrorSessionTable\n");
        return kFailed;
    }
    const auto value = block.bytes();
    Put(value, kMagic, kMagicValue);
    Put(value, kVersion, kFormatVersion);
    Put(value, kSessionCount, static_cast<uint32_t>(vspans.items().size()));
    Put(value, kPortCount, static_cast<uint32_t>(ports));
    status = LoadTable(vspans.items(), value, recordSize);
    return status ? status : Store(args, value);
}

} // namespace dvs::convert
