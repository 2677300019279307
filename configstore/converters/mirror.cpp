/* SPDX-License-Identifier: Apache-2.0 */
// Mirror sessions: one table (layouts/mirror.h) <-> the instances of "vspans", keyed by the session key. The
// port records at the table's end are mirror_ports.cpp's. Called through the converter table for the rows of
// switches and of ports.

#include "configstore/converters/mirror.h"

#include <algorithm>

#include "configstore/converters/common.h"
#include "configstore/converters/mirror_ports.h"
#include "configstore/layouts/mirror.h"
#include "configstore/converters/switch_version.h"
#include "dvsstate/versions.h"

const char *SESSION_TYPE_LOCAL_ENUM_2_SCHEMA[VSPAN_SESSION_TYPE_NUM] = {
    "MIXED_DEST_MIRROR",
    "DVPORT_MIRROR",
    "REMOTE_MIRROR_SOURCE",
    "REMOTE_MIRROR_DEST",
    "ENCAPSULATED_REMOTE_MIRROR_SOURCE",
    nullptr,
};
const char *ENCAP_TYPE_LOCAL_ENUM_2SCHEMA[VSPAN_ENCAP_TYPE_NUM] = {"GRE", "ERSPAN2", "ERSPAN3"};

namespace dvs::convert {
namespace {

using layout::AreaOf;
using layout::At;
using layout::kMirrorTableNarrow;
using layout::Slot;
using layout::mirror::kSession;

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

struct ConnecteeType {
    uint16_t bit;
    const char *text;
};
constexpr ConnecteeType kConnecteeTypes[] = {{0x1, "VM_VNIC"}, {0x2, "PNIC"}, {0x8, "HOST_HYP_VNIC"}};
constexpr uint16_t kAnyConnecteeType = 0x4;
constexpr const char *kConnecteeList = "wildcard_port_connectee_types";

// --- Save ---

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
int32_t SaveSession(const SaveArgs &args, std::span<const uint8_t> session, PortRecords *ports) {
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
    return status ? status : SaveSessionPorts({destination, receive, transmit}, session, ports);
}

// Whether the value holds all sessions it announces and all port records that those announce.
bool IsWhole(std::span<const uint8_t> value, uint32_t sessions, std::size_t recordSize) {
    if (!HoldsRecords(value, kHeadSize, sessions, kSession.size)) return false;
    uint64_t ports = 0;
    for (std::size_t i = 0; i < sessions; ++i) {
        const auto session = value.subspan(kHeadSize + i * kSession.size, kSession.size);
        ports += AnnouncedPorts(session);
    }
    return HoldsRecords(value, kHeadSize + std::size_t{sessions} * kSession.size, ports, recordSize);
}

// --- Load ---

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

// A text that cannot be read leaves 0, one that the table lacks stores kNotSet after `message`.
void LoadEnum(const Context &context, configstore::Object *vspan, const char *name, std::span<const char *const> table,
              const char *message, std::span<uint8_t> session, Slot<uint32_t> slot) {
    StoreText text;
    if (text.Read(vspan, name)) return;
    const auto index = EnumIndex(table, text.get());
    if (!index) context.messages.Error("%s: %s\n", message, text.get());
    Put(session, slot, index.value_or(kNotSet));
}

int32_t LoadSession(const Context &context, configstore::Object *vspan, std::span<uint8_t> session, bool *previous) {
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
    const SessionPorts ports = SessionPorts::Of(vspan);
    Put(session, kReceiveTypes, LoadConnecteeTypes(ports.receive));
    Put(session, kTransmitTypes, LoadConnecteeTypes(ports.transmit));
    LoadEnum(context, vspan, "session_type", SESSION_TYPE_LOCAL_ENUM_2_SCHEMA, "Unknown vspan session type in schema",
             session, kSessionType);
    LoadEnum(context, vspan, "encap_type", ENCAP_TYPE_LOCAL_ENUM_2SCHEMA, "Unknown vspan encap type in schema",
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

int32_t LoadTable(const Context &context, std::span<configstore::Object *const> vspans, std::span<uint8_t> value,
                  std::size_t recordSize) {
    PortArea area{value.subspan(kHeadSize + vspans.size() * kSession.size), recordSize};
    bool previous = false;
    std::size_t at = kHeadSize;
    for (configstore::Object *vspan : vspans) {
        const auto session = value.subspan(at, kSession.size);
        const int32_t status = LoadSession(context, vspan, session, &previous);
        if (status) return status;
        LoadSessionPorts(SessionPorts::Of(vspan), session, &area);
        at += kSession.size;
    }
    return 0;
}

// Whether this switch has wide port records. A port's own object does not tell the switch's version.
int32_t HasWideRecords(const LoadArgs &args, bool *wide) {
    const Context &context = args.context;
    if (args.propClass == DVS_PROP_CLASS_PORT) {
        if (context.loaded && !context.loaded->hasOverlayFlag) TraceNoOverlayFlag(context.messages);
        *wide = context.wideRecords;
        return 0;
    }
    SwitchVersion version = {};
    const int32_t status = ReadSwitchVersion(context.messages, args.root, &version);
    *wide = state::HasWidePortRecords(version.number);
    return status;
}

bool IsKeyOfThisClass(const LoadArgs &args) {
    const std::string_view key = args.key;
    return args.context.switchClass
               ? key == "com.orbeno.vswitch.mirrorSessions" || key == "com.orbeno.vswitch.port.mirrorSessions"
               : key == "com.orbeno.etherswitch.mirrorSessions" ||
                     key == "com.orbeno.etherswitch.port.mirrorSessions";
}

} // namespace

int32_t SaveMirrorSessions(const SaveArgs &args) {
    if (args.value.size() < kSessionCount.End()) return kFailed;
    const uint32_t count = Get(args.value, kSessionCount);
    if (count == 0) return 0;
    const std::size_t recordSize = PortRecordSize(args.context.wideRecords);
    if (!IsWhole(args.value, count, recordSize)) return kFailed;
    PortRecords ports{args.value.subspan(kHeadSize + std::size_t{count} * kSession.size), recordSize};
    int32_t status = 0;
    for (std::size_t i = 0; i < count && !status; ++i) {
        status = SaveSession(args, args.value.subspan(kHeadSize + i * kSession.size), &ports);
    }
    return status;
}

int32_t LoadMirrorSessions(const LoadArgs &args) {
    if (!IsKeyOfThisClass(args)) return 0;
    Instances vspans;
    const int32_t found = vspans.Read(args, args.parent, args.leaf);
    bool wide = false;
    int32_t status = HasWideRecords(args, &wide);
    if (status) return status;
    if (found) return found == configstore::NOT_FOUND ? 0 : found;
    if (vspans.items().empty()) return 0;

    uint64_t ports = 0;
    uint64_t records = 0;
    for (configstore::Object *vspan : vspans.items()) {
        ports += CountedPorts(vspan);
        records += PortsToLoad(vspan);
    }
    const std::size_t recordSize = PortRecordSize(wide);
    Block block;
    if (!block.Allocate(kHeadSize + vspans.items().size() * kSession.size +
                        std::max(ports, records) * recordSize)) {
        args.context.messages.Error("Failed to alloc memory for DVMirrorSessionTable\n");
        return kFailed;
    }
    const auto value = block.bytes();
    Put(value, kMagic, kMagicValue);
    Put(value, kVersion, kFormatVersion);
    Put(value, kSessionCount, static_cast<uint32_t>(vspans.items().size()));
    Put(value, kPortCount, static_cast<uint32_t>(ports));
    status = LoadTable(args.context, vspans.items(), value, recordSize);
    return status ? status : Store(args, value);
}

} // namespace dvs::convert
