/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_MIRROR_H
#define CONFIGSTORE_LAYOUTS_MIRROR_H

// The binary record of mirror sessions: a head, the sessions, and the port records of all sessions one behind
// the other. For each session in order come its destinations, its receive sources and its transmit sources.
// Switches of a version above 99 have wide port records.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"
#include "dvs/configstore.h"

namespace dvs::layout::mirror {

inline constexpr Domain kSessionTypes = {
    "SESSION_TYPE_LOCAL_ENUM_2_SCHEMA", SESSION_TYPE_LOCAL_ENUM_2_SCHEMA, VSPAN_SESSION_TYPE_NUM, {}};
inline constexpr Domain kEncapTypes = {
    "ENCAP_TYPE_LOCAL_ENUM_2SCHEMA", ENCAP_TYPE_LOCAL_ENUM_2SCHEMA, VSPAN_ENCAP_TYPE_NUM, {}};

// clang-format off
inline constexpr Flag kSessionBits[] = {
    {0x01, "normal_traffic_not_allowed", "the destination carries mirrored traffic only"},
    {0x02, "from_store",                 "set by a load together with 0x01"},
    {0x04, "keep_original_vlan",         "the original VLAN tag is not stripped"},
    {0x08, "encapsulation_vlan",         "an encapsulation VLAN id is set"},
    {0x10, "legacy_mode",                "legacy mode; a save also names the switch's promiscuous-mode session by it"},
    {0x20, "disabled",                   "the session is switched off"},
};
inline constexpr Flag kConnecteeBits[] = {
    {0x1, "VM_VNIC",       "adapters of virtual machines"},
    {0x2, "PNIC",          "physical adapters"},
    {0x4, "from_store",    "set by a load for a list that has any text"},
    {0x8, "HOST_HYP_VNIC", "adapters of the host itself"},
};
inline constexpr const char *kPortKindTexts[] = {"port key", "uplink port name"};

inline constexpr Domain kSessionFlags = {"session flags", nullptr, 0, kSessionBits};
inline constexpr Domain kConnecteeTypes = {"connectee types", nullptr, 0, kConnecteeBits};
inline constexpr Domain kPortKinds = {"port record kinds", kPortKindTexts, 2, {}};

inline constexpr Field kSessionFields[] = {
    // name                    offset width kind             domain            meaning
    {"key",                         0,   32, Kind::kText,     nullptr,          "session key"},
    {"name",                       32,   81, Kind::kText,     nullptr,          "session name"},
    {"unused_1",                  113,    3, Kind::kReserved, nullptr,          "0"},
    {"session_type",              116,    4, Kind::kEnum,     &kSessionTypes,   "what is mirrored, and where to"},
    {"mirrored_packet_length",    120,    4, Kind::kUnsigned, nullptr,          "bytes mirrored of a frame; 0xFFFFFFFF: not set"},
    {"flags",                     124,    4, Kind::kFlags,    &kSessionFlags,   "how the session works"},
    {"encapsulation_vlan_id",     128,    2, Kind::kUnsigned, nullptr,          "VLAN of the mirrored frames"},
    {"receive_connectee_types",   130,    2, Kind::kFlags,    &kConnecteeTypes, "ports that are receive sources by their kind"},
    {"transmit_connectee_types",  132,    2, Kind::kFlags,    &kConnecteeTypes, "ports that are transmit sources by their kind"},
    {"unused_2",                  134,    2, Kind::kReserved, nullptr,          "0"},
    {"sampling_rate",             136,    4, Kind::kUnsigned, nullptr,          "one frame in so many is mirrored"},
    {"encap_type",                140,    4, Kind::kEnum,     &kEncapTypes,     "how mirrored frames are wrapped"},
    {"erspan_id",                 144,    2, Kind::kUnsigned, nullptr,          "ERSPAN session id"},
    {"erspan_COS",                146,    1, Kind::kUnsigned, nullptr,          "ERSPAN class of service"},
    {"erspan_gra_nanosec",        147,    1, Kind::kBool,     nullptr,          "ERSPAN time stamps in nanoseconds"},
    {"unused_3",                  148,   68, Kind::kReserved, nullptr,          "0"},
    {"destination_count",         216,    4, Kind::kShare,    nullptr,          "number of destination records"},
    {"receive_count",             220,    4, Kind::kShare,    nullptr,          "number of receive-source records"},
    {"transmit_count",            224,    4, Kind::kShare,    nullptr,          "number of transmit-source records"},
    {"first_record",              228,    4, Kind::kUnsigned, nullptr,          "index of the session's first port record; set by a load"},
};
inline constexpr Record kSession = {"mirror session", 232, kSessionFields, {}};
static_assert(IsSound(kSession));

inline constexpr Field kNarrowPortFields[] = {
    // name  offset width kind         domain       meaning
    {"kind",      0,    4, Kind::kEnum, &kPortKinds, "what the name is"},
    {"name",      4,   32, Kind::kText, nullptr,     "port key or uplink name"},
};
inline constexpr Field kWidePortFields[] = {
    // name  offset width kind         domain       meaning
    {"kind",      0,    4, Kind::kEnum, &kPortKinds, "as in the narrow record"},
    {"name",      4,   48, Kind::kText, nullptr,     "as in the narrow record"},
};
inline constexpr Field kNarrowVlanFields[] = {
    // name     offset width kind             domain       meaning
    {"kind",         0,    4, Kind::kEnum,     &kPortKinds, "not looked at here"},
    {"vlan_id",      4,    2, Kind::kUnsigned, nullptr,     "VLAN whose frames are mirrored"},
    {"unused",       6,   30, Kind::kReserved, nullptr,     "0"},
};
inline constexpr Field kWideVlanFields[] = {
    // name     offset width kind             domain       meaning
    {"kind",         0,    4, Kind::kEnum,     &kPortKinds, "as in the narrow record"},
    {"vlan_id",      4,    2, Kind::kUnsigned, nullptr,     "as in the narrow record"},
    {"unused",       6,   46, Kind::kReserved, nullptr,     "0"},
};
inline constexpr Field kNarrowAddressFields[] = {
    // name     offset width kind             domain       meaning
    {"kind",         0,    4, Kind::kEnum,     &kPortKinds, "not looked at here"},
    {"address",      4,   20, Kind::kTagged,   nullptr,     "where mirrored frames are sent: 1 byte not 0 for IPv6, 3 unused, then 4 "
                                                            "or 16 bytes of address"},
    {"unused",      24,   12, Kind::kReserved, nullptr,     "0"},
};
inline constexpr Field kWideAddressFields[] = {
    // name     offset width kind             domain       meaning
    {"kind",         0,    4, Kind::kEnum,     &kPortKinds, "as in the narrow record"},
    {"address",      4,   20, Kind::kTagged,   nullptr,     "as in the narrow record"},
    {"unused",      24,   28, Kind::kReserved, nullptr,     "0"},
};
inline constexpr Record kNarrowPort = {"narrow port record", 36, kNarrowPortFields, {}};
inline constexpr Record kNarrowVlan = {"narrow VLAN record", 36, kNarrowVlanFields, {}};
inline constexpr Record kNarrowAddress = {"narrow address record", 36, kNarrowAddressFields, {}};
inline constexpr Record kWidePort = {"wide port record", 52, kWidePortFields, {}};
inline constexpr Record kWideVlan = {"wide VLAN record", 52, kWideVlanFields, {}};
inline constexpr Record kWideAddress = {"wide address record", 52, kWideAddressFields, {}};
static_assert(IsSound(kNarrowPort) && IsSound(kNarrowVlan) && IsSound(kNarrowAddress));
static_assert(IsSound(kWidePort) && IsSound(kWideVlan) && IsSound(kWideAddress));

enum SessionType : uint32_t { kMixedDest = 0, kDvport = 1, kRemoteSource = 2, kRemoteDest = 3, kEncapsulatedSource = 4 };

inline constexpr Variant kNarrowVariants[] = {
    {"receive_count",     "session_type", kRemoteDest,         &kNarrowVlan},
    {"transmit_count",    "session_type", kRemoteDest,         &kNarrowVlan},
    {"destination_count", "session_type", kEncapsulatedSource, &kNarrowAddress},
};
inline constexpr Variant kWideVariants[] = {
    {"receive_count",     "session_type", kRemoteDest,         &kWideVlan},
    {"transmit_count",    "session_type", kRemoteDest,         &kWideVlan},
    {"destination_count", "session_type", kEncapsulatedSource, &kWideAddress},
};

inline constexpr Field kHeadFields[] = {
    // name         offset width kind             domain   meaning
    {"magic",            0,    4, Kind::kMagic,    nullptr, "0xFACEBEEF"},
    {"version",          4,    4, Kind::kUnsigned, nullptr, "version of the format, 1"},
    {"session_count",    8,    4, Kind::kCount,    nullptr, "number of sessions"},
    {"port_count",      12,    4, Kind::kUnsigned, nullptr, "number of port records; set by a load, not read by a save"},
    {"reserved",        16,    4, Kind::kReserved, nullptr, "0"},
};
inline constexpr Part kNarrowParts[] = {
    {"sessions", &kSession,    CountBy::kField, 0, "session_count", nullptr, 0, "the sessions"},
    {"ports",    &kNarrowPort, CountBy::kShare, 0, nullptr,         nullptr, 0, "the sessions' ports", kNarrowVariants},
};
inline constexpr Part kWideParts[] = {
    {"sessions", &kSession,  CountBy::kField, 0, "session_count", nullptr, 0, "the sessions"},
    {"ports",    &kWidePort, CountBy::kShare, 0, nullptr,         nullptr, 0, "the sessions' ports", kWideVariants},
};
// clang-format on

inline constexpr uint32_t kHeadSize = 20;

} // namespace dvs::layout::mirror

namespace dvs::layout {

inline constexpr Record kMirrorTableNarrow = {"mirror session table", mirror::kHeadSize, mirror::kHeadFields,
                                              mirror::kNarrowParts};
inline constexpr Record kMirrorTableWide = {"mirror session table, wide port records", mirror::kHeadSize,
                                            mirror::kHeadFields, mirror::kWideParts};
static_assert(IsSound(kMirrorTableNarrow) && IsSound(kMirrorTableWide));

} // namespace dvs::layout

namespace dvs::layout::mirror {

inline constexpr const char *kConnecteeTexts[] = {"VM_VNIC", "PNIC", "HOST_HYP_VNIC"};
inline constexpr Domain kConnectees = {"connectee types", kConnecteeTexts, 3, {}};
inline constexpr uint32_t kPortKeyMax = 47; // of the wide records

consteval Place Ports(std::string_view count, std::string_view connectees = "") {
    return {.keep = Keep::kPorts,
            .field = connectees.empty() ? nullptr : FieldOf(kSession, connectees),
            .count = FieldOf(kSession, count)};
}

// clang-format off
// The lists of a group of ports have their places in the port records behind the sessions.
inline constexpr StoreField kSourceMembers[] = {
    // name                           form          place unit max          domain        id members meaning
    {"wildcard_port_connectee_types", Form::kTexts, {}, "", 0,           &kConnectees, nullptr, {}, "ports that are sources by their kind"},
    {"port_keys",                     Form::kTexts, {}, "", kPortKeyMax, nullptr,      nullptr, {}, "keys of source ports, of all but a REMOTE_MIRROR_DEST"},
    {"vlans",                         Form::kInts,  {}, "", 0,           nullptr,      nullptr, {}, "source VLANs of a REMOTE_MIRROR_DEST; not loaded from a store", Rule::kVlan},
};
inline constexpr StoreField kDestinationMembers[] = {
    {"port_keys",         Form::kTexts, {}, "", kPortKeyMax, nullptr, nullptr, {}, "keys of destination ports, of a MIXED_DEST_MIRROR, DVPORT_MIRROR or REMOTE_MIRROR_DEST"},
    {"uplink_port_names", Form::kTexts, {}, "", kPortKeyMax, nullptr, nullptr, {}, "names of destination uplinks, of a REMOTE_MIRROR_SOURCE or MIXED_DEST_MIRROR"},
    {"addresses",         Form::kTexts, {}, "", 0,           nullptr, nullptr, {}, "addresses that an ENCAPSULATED_REMOTE_MIRROR_SOURCE sends to; a store keeps the last one, and loads none", Rule::kAddress},
};
inline constexpr StoreField kSessionMembers[] = {
    // name                    form           place                                                          unit max domain       id members meaning
    {"key",                    Form::kText,   In(kSession, "key"),                                              "",      31, nullptr,        nullptr, {}, "session key"},
    {"name",                   Form::kText,   In(kSession, "name"),                                             "",      80, nullptr,        nullptr, {}, "session name"},
    {"session_type",           Form::kText,   In(kSession, "session_type"),                                     "",      0,  &kSessionTypes, nullptr, {}, "what is mirrored, and where to"},
    {"enabled",                Form::kBool,   NotBits(kSession, "flags", "disabled"),                           "",      0,  nullptr,        nullptr, {}, "the session is switched on"},
    {"strip_original_vlan",    Form::kBool,   NotBits(kSession, "flags", "keep_original_vlan"),                 "",      0,  nullptr,        nullptr, {}, "the original VLAN tag is stripped"},
    {"normal_traffic_allowed", Form::kBool,   NotBits(kSession, "flags", "normal_traffic_not_allowed", 0x03),   "",      0,  nullptr,        nullptr, {}, "the destination carries other traffic too"},
    {"legacy_mode",            Form::kBool,   Bits(kSession, "flags", "legacy_mode"),                           "",      0,  nullptr,        nullptr, {}, "legacy mode; a store loads it inverted"},
    {"mirrored_packet_length", Form::kUint32, In(kSession, "mirrored_packet_length"),                           "bytes", 0,  nullptr,        nullptr, {}, "bytes mirrored of a frame; 4294967295 or left out: not set; a store keeps no other length", Rule::kUnset},
    {"encapsulation_vlan_id",  Form::kUint32, In(kSession, "encapsulation_vlan_id"),                            "",      0,  nullptr,        nullptr, {}, "VLAN of the mirrored frames", Rule::kVlan},
    {"sampling_rate",          Form::kUint32, In(kSession, "sampling_rate"),                                    "",      0,  nullptr,        nullptr, {}, "one frame in so many is mirrored"},
    {"encap_type",             Form::kText,   In(kSession, "encap_type"),                                       "",      0,  &kEncapTypes,   nullptr, {}, "how mirrored frames are wrapped"},
    {"erspan_id",              Form::kUint16, In(kSession, "erspan_id"),                                        "",      0,  nullptr,        nullptr, {}, "ERSPAN session id"},
    {"erspan_COS",             Form::kUint16, In(kSession, "erspan_COS"),                                       "",      0,  nullptr,        nullptr, {}, "ERSPAN class of service"},
    {"erspan_gra_nanosec",     Form::kBool,   In(kSession, "erspan_gra_nanosec"),                               "",      0,  nullptr,        nullptr, {}, "ERSPAN time stamps in nanoseconds"},
    {"destination_port",       Form::kObject, Ports("destination_count"),                                           "",      0,  nullptr,        nullptr, kDestinationMembers, "where mirrored frames go"},
    {"source_recv_port",       Form::kObject, Ports("receive_count", "receive_connectee_types"),                    "",      0,  nullptr,        nullptr, kSourceMembers, "whose received frames are mirrored"},
    {"source_transmit_port",   Form::kObject, Ports("transmit_count", "transmit_connectee_types"),                  "",      0,  nullptr,        nullptr, kSourceMembers, "whose transmitted frames are mirrored"},
};
// clang-format on

} // namespace dvs::layout::mirror

namespace dvs::layout {

inline constexpr StoreField kMirrorForm = {
    nullptr, Form::kInstances, {}, "", 0, nullptr, "key", mirror::kSessionMembers, "one instance a session"};

} // namespace dvs::layout

#endif
