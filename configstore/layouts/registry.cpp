/* SPDX-License-Identifier: Apache-2.0 */
// The registry of converter types and properties (registry.h).

#include "configstore/layouts/registry.h"

namespace dvs::layout {
namespace {

// clang-format off
constexpr TypeInfo kTypes[] = {
    // type, what it carries, record, wide record, store form, quirks
    {ConverterType::kNumber,                  "number",                       &kNumber,            &kNumber,          &kNumberForm,        ""},
    {ConverterType::kText,                    "text",                         &kTextValue,             &kTextValue,           &kTextForm,          "Of the two multicast filter keys a load fills the one of the switch's family."},
    {ConverterType::kBeaconTimeout,           "beacon timeout",               &kSignedNumber,      &kSignedNumber,    &kSignedNumberForm,        ""},
    {ConverterType::kBoolByte,                "one-byte boolean",             &kBoolByte,          &kBoolByte,        &kBoolByteForm,          ""},
    {ConverterType::kBoolText,                "boolean as text",              &kBoolText,          &kBoolText,        &kBoolTextForm,          "Loads as 6 bytes for true (\"true\", NUL, 'f') and as 5 without NUL for false."},
    {ConverterType::kSwitchAddress,           "switch address",               &kIpv4Value,         &kIpv4Value,       &kIpv4Form,       "A text that is no address fails the load without a message."},
    {ConverterType::kEtherswitchPrivateVlans, "private VLAN map",             &kPrivateVlanMap,    &kPrivateVlanMap,  &kPrivateVlansForm,        "Loads unless the class is \"cswitch\" or the version is above 106; bytes behind the last whole entry are ignored."},
    {ConverterType::kVswitchPrivateVlans,     "private VLAN map",             &kPrivateVlanMap,    &kPrivateVlanMap,  &kPrivateVlansForm,        "Loads only for the class \"cswitch\" or a version above 106; bytes behind the last whole entry are ignored."},
    {ConverterType::kLinkDiscovery,           "link discovery",               &kLinkDiscovery,     &kLinkDiscovery,   &kLinkDiscoveryForm, "An unknown protocol loads as 2, an unknown operation as 4."},
    {ConverterType::kMirrorSessions,          "mirror sessions",              &kMirrorTableNarrow, &kMirrorTableWide, &kMirrorForm,        "The packet length is saved only when it is not set. Legacy mode loads inverted, \"normal traffic not allowed\" as 0x03. Of several addresses the last is saved; VLANs and addresses do not load. All groups store their count as the destinations', and transmit sources take the receive sources' place. Any wildcard text sets 0x4. Of the two keys a load fills the one of the switch's family."},
    {ConverterType::kIpfix,                   "IPFIX settings",               &kIpfix,             &kIpfix,           &kIpfixForm,         "IPv6 is saved as eight full groups. A text that is no address loads as none."},
    {ConverterType::kHealthCheck,             "health check",                 &kHealthCheck,       &kHealthCheck,     &kHealthCheckForm,   "A save writes \"enable\", a load reads \"enabled\"."},
    {ConverterType::kTrafficResources,        "resource pools",               &kPoolConfig,        &kPoolConfig,      &kPoolsForm,         "A count of 0 saves nothing."},
    {ConverterType::kPoolKeys,                "resource pool keys",           &kPoolList,          &kPoolList,        &kPoolKeysForm,      "A count of 0 saves nothing: an earlier list stays."},
    {ConverterType::kUplinkKeys,              "uplink port keys",             &kUplinkKeys,        &kUplinkKeys,      &kUplinkKeysForm,    "A count of 0 is saved as an empty list and loads as no property."},
    {ConverterType::kSwitchVersion,           "switch version",               &kSwitchVersion,     &kSwitchVersion,   &kVersionForm,       "107 to 112 are saved as 7 to 12; the overlay flag makes the difference on load."},
    {ConverterType::kLacpGroups,              "LACP groups",                  &kLacpTable,         &kLacpTable,       &kLacpGroupsForm,    "Unknown texts load as 0xFFFFFFFF; a count of 0 saves nothing."},
    {ConverterType::kEtherswitchTeaming,      "etherswitch teaming policy",   &kTeamingPolicy,     &kTeamingPolicy,   &kTeamingForm,       "The two explicit policies 4 and 5 come back swapped. Percentage, full duplex and speed are looked for beside the failure criteria, so they come back as 0; of the speed only the low byte is read. Failure criteria come back with 0x200 set. Loads on a switch that is neither vswitch nor cswitch."},
    {ConverterType::kVswitchTeaming,          "vswitch teaming policy",       &kTeamingPolicy,     &kTeamingPolicy,   &kTeamingForm,       "The two explicit policies 4 and 5 come back swapped. Percentage, full duplex and speed are looked for beside the failure criteria, so they come back as 0; of the speed only the low byte is read. Failure criteria come back with 0x200 set. A switch that is neither vswitch nor cswitch saves and loads nothing."},
    {ConverterType::kOverlayFlag,             "overlay flag",                 &kBoolText,          &kBoolText,        &kOverlayForm,          "Loads as 5 bytes, with NUL for true and without for false."},
    {ConverterType::kUplinkNames,             "uplink port names",            &kUplinkNames,       &kUplinkNames,     &kUplinkNamesForm,   "A count of 0 saves nothing: an earlier list stays."},
    {ConverterType::kMtu,                     "MTU",                          &kNumber,            &kNumber,          &kNumberForm,        "Three keys share one field: the last saved wins. A load fills the common key and the one of the switch's family; a cswitch gets the common key alone."},
    {ConverterType::kSwitchDefault,           "unmapped property",            &kOpaqueValue,       &kOpaqueValue,     &kUnmappedForm,      "Takes every key without a row of its own."},
    {ConverterType::kTxUplink,                "transmit-uplink mode",         &kTxUplink,          &kTxUplink,        &kTxUplinkForm,          "Anything but \"always\" is saved as false. Of the two keys a load fills the one of the switch's family."},
    {ConverterType::kEtherswitchPortVlan,     "etherswitch port VLAN",        &kPortVlan,          &kPortVlan,        &kVlanForm,          "A load without memory skips the property. Loads on a switch that is neither vswitch nor cswitch."},
    {ConverterType::kVswitchPortVlan,         "vswitch port VLAN",            &kPortVlan,          &kPortVlan,        &kVlanForm,          "Whether the id could be written is not told; a load without memory fails. A switch that is neither vswitch nor cswitch saves and loads nothing."},
    {ConverterType::kShaping,                 "traffic shaping",              &kShapingPolicy,     &kShapingPolicy,   &kShapingForm,       "The store holds bits where the record holds bytes. \"enabled\" is always written true and never read."},
    {ConverterType::kEtherswitchMacSecurity,  "etherswitch MAC security",     &kMacSecurity,       &kMacSecurity,     &kSecurityForm,      "Fields that cannot be read count as allowed. Loads on a switch that is neither vswitch nor cswitch."},
    {ConverterType::kVswitchMacSecurity,      "vswitch MAC security",         &kMacSecurity,       &kMacSecurity,     &kSecurityForm,      "Fields that cannot be read count as allowed. Loads on vswitches and cswitches only."},
    {ConverterType::kFilters,                 "traffic filters",              &kFilterConfig,      &kFilterConfig,    &kFiltersForm,       "A load places each filter behind the fixed part of the one before, over its parameters, and numbers parameters from 0. The instance id is the slot as signed, \"slot_number\" as unsigned decimal."},
    {ConverterType::kPortBlocked,             "port blocked",                 &kBoolText,          &kBoolText,        &kBoolTextForm,          "Loads as 6 bytes for true (\"true\", NUL, 'f') and as 5 without NUL for false."},
    {ConverterType::kPassthrough,             "passthrough allowed",          &kPassthrough,       &kPassthrough,     &kPassthroughForm,          "Any number but 2 is saved as false and comes back as 0."},
    {ConverterType::kPortDefault,             "unmapped port property",       &kOpaqueValue,       &kOpaqueValue,     &kUnmappedForm,      "Takes every key without a row of its own; what goes to \"other_data\" does not come back."},
    {ConverterType::kPortIpfix,               "port IPFIX enabled",           &kEnabledText,       &kEnabledText,     &kEnabledForm,          "False loads as no property."},
    {ConverterType::kPortLacp,                "port LACP policy",             &kPortLacp,          &kPortLacp,        &kPortLacpForm,      "A load needs both fields. An unknown mode loads as 0xFFFFFFFF."},
    {ConverterType::kPortPools,               "port resource pools",          &kPoolConfig,        &kPoolConfig,      &kPoolsForm,         "Saved nowhere. A load gives every uplink port the switch's own resource pools."},
};

struct Meaning {
    uint32_t propClass;
    const char *key;
    const char *text;
};
constexpr Meaning kMeanings[] = {
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.alias",                "Name that people gave the switch."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.version",              "Version of the switch, which decides about record forms and keys."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.portset.mtu",          "Largest frame the switch carries."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.vswitch.mtu",                 "Largest frame a vswitch carries."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.mtu",             "Largest frame an etherswitch carries."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.opaqueDvs",            "Whether the switch is managed by somebody else than the host's own management."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.uplinkPorts",          "Names of the switch's uplinks."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.lacp",            "Link aggregation groups."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.ipv4addr",        "Address by which the switch names itself to collectors."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.beaconTimeout",   "Timeout of beacon probing."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.pvlanMap",        "Private VLANs of an etherswitch."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.vswitch.pvlanMap",            "Private VLANs of a vswitch or overlay switch."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.cdp",             "Link discovery."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.mirrorSessions",  "Mirror sessions of an etherswitch."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.vswitch.mirrorSessions",      "Mirror sessions of a vswitch."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.portset.ovl",          "Whether overlay networks are enabled."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.ipfix",           "Flow export."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.etherswitch.multicastFilter", "How an etherswitch filters multicast traffic."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.vswitch.multicastFilter",     "How a vswitch filters multicast traffic."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.vlanmtucheck.deploy",  "Check of VLANs and MTU against the physical switches."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.teamcheck.deploy",     "Check of teaming against the physical switches."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.respools.cfg",         "Bandwidth of each resource pool."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.respools.list",        "Keys of the resource pools."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.respools.sched",       "Whether resource control is enabled."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.respools.version",     "Version of resource control."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.resv.threshold",       "Part of a physical adapter's capacity that may be reserved."},
    {DVS_PROP_CLASS_GLOBAL, "com.orbeno.vswitch.teaming",             "Teaming policy of a vswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.alias",           "Name that people gave the port."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.connectid",       "Cookie of the connection to the port."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.block",           "Whether the port is blocked."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.ptAllowed",       "Whether the port's adapter may be passed through."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.etherswitch.port.txUplink",   "Whether a port of an etherswitch transmits over every uplink."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.vswitch.port.txUplink",       "Whether a port of a vswitch transmits over every uplink."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.portgroupid",     "Port group the port belongs to."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.etherswitch.port.teaming",    "Teaming policy of a port of an etherswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.vswitch.port.teaming.policy", "Teaming policy of a port of a vswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.etherswitch.port.vlan",       "VLAN of a port of an etherswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.vswitch.port.vlan",           "VLAN of a port of a vswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.etherswitch.port.ipfix",      "Whether the port's flows are exported."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.shaper.input",    "Shaping of what enters the switch at the port."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.shaper.output",   "Shaping of what leaves the switch at the port."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.etherswitch.port.security",   "MAC security of a port of an etherswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.vswitch.port.security",       "MAC security of a port of a vswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.dvfilter",        "Filters in the port's path."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.respools.cfg",    "Resource pools of an uplink port: the switch's own."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.common.port.backingType",     "What kind of network backs the port."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.vswitch.port.priority",       "VLAN priority of the port's frames."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.vswitch.port.mirrorSessions", "Mirror sessions of a port of a vswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.etherswitch.port.mirrorSessions", "Mirror sessions of a port of an etherswitch."},
    {DVS_PROP_CLASS_PORT,   "com.orbeno.etherswitch.port.lacp",       "Link aggregation of an uplink port."},
    {DVS_PROP_CLASS_HOST,   "com.orbeno.common.host.portset",         "Name under which this host knows the switch."},
    {DVS_PROP_CLASS_HOST,   "com.orbeno.common.host.uplinkPorts",     "Keys of this host's uplink ports."},
};
// clang-format on

constexpr std::string_view kDefaultKey = "DEFAULT";

} // namespace

const TypeInfo *FindType(ConverterType type) {
    for (const TypeInfo &info : kTypes) {
        if (info.type == type) return &info;
    }
    return nullptr;
}

const DVSProp2ConfigEntry *FindProperty(uint32_t propClass, std::string_view key) {
    if (propClass > DVS_PROP_CLASS_PORT || key == kDefaultKey) return nullptr;
    for (const DVSProp2ConfigEntry *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
        if (key == row->key) return row;
    }
    return nullptr;
}

const char *MeaningOf(uint32_t propClass, std::string_view key) {
    for (const Meaning &meaning : kMeanings) {
        if (meaning.propClass == propClass && key == meaning.key) return meaning.text;
    }
    return nullptr;
}

const Record *RecordOf(uint32_t propClass, std::string_view key, bool wide) {
    const DVSProp2ConfigEntry *row = FindProperty(propClass, key);
    const TypeInfo *info = row ? FindType(ConverterTypeOf(*row)) : nullptr;
    if (!info) return nullptr;
    return wide ? info->wide : info->record;
}

} // namespace dvs::layout
