/* SPDX-License-Identifier: Apache-2.0 */
// The registry of converter types and properties (registry.h).

#include "configstore/layouts/registry.h"

#include <cstring>

#include "configstore/layouts/forms.h"

namespace dvs::layout {
namespace {

// clang-format off
constexpr TypeInfo kTypes[] = {
    // type, what it carries, record, wide record, store form, quirks
    {0,  "number",                       &kNumber,            &kNumber,          &kFormUint32,        ""},
    {1,  "text",                         &kTextValue,             &kTextValue,           &kFormText,          "Of the two multicast filter keys a load fills the one of the switch's family."},
    {2,  "beacon timeout",               &kSignedNumber,      &kSignedNumber,    &kFormBeacon,        ""},
    {3,  "one-byte boolean",             &kBoolByte,          &kBoolByte,        &kFormBool,          ""},
    {4,  "boolean as text",              &kBoolText,          &kBoolText,        &kFormBool,          "Loads as 6 bytes for true (\"true\", NUL, 'f') and as 5 without NUL for false."},
    {5,  "switch address",               &kIpv4Value,         &kIpv4Value,       &kFormAddress,       "A text that is no address fails the load without a message."},
    {6,  "private VLAN map",             &kPrivateVlanMap,    &kPrivateVlanMap,  &kFormPvlans,        "Loads unless the class is \"cswitch\" or the version is above 106; bytes behind the last whole entry are ignored."},
    {7,  "private VLAN map",             &kPrivateVlanMap,    &kPrivateVlanMap,  &kFormPvlans,        "Loads only for the class \"cswitch\" or a version above 106; bytes behind the last whole entry are ignored."},
    {8,  "link discovery",               &kLinkDiscovery,     &kLinkDiscovery,   &kFormLinkDiscovery, "An unknown protocol loads as 2, an unknown operation as 4."},
    {9,  "mirror sessions",              &kMirrorTableNarrow, &kMirrorTableWide, &kFormVspans,        "The packet length is saved only when it is not set. Legacy mode loads inverted, \"normal traffic not allowed\" as 0x03. Of several addresses the last is saved; VLANs and addresses do not load. All groups store their count as the destinations', and transmit sources take the receive sources' place. Any wildcard text sets 0x4. Of the two keys a load fills the one of the switch's family."},
    {10, "IPFIX settings",               &kIpfix,             &kIpfix,           &kFormIpfix,         "IPv6 is saved as eight full groups. A text that is no address loads as none."},
    {11, "health check",                 &kHealthCheck,       &kHealthCheck,     &kFormHealthCheck,   "A save writes \"enable\", a load reads \"enabled\"."},
    {12, "resource pools",               &kPoolConfig,        &kPoolConfig,      &kFormPools,         "A count of 0 saves nothing."},
    {13, "resource pool keys",           &kPoolList,          &kPoolList,        &kFormPoolKeys,      "A count of 0 saves nothing: an earlier list stays."},
    {14, "uplink port keys",             &kUplinkKeys,        &kUplinkKeys,      &kFormUplinkKeys,    "A count of 0 is saved as an empty list and loads as no property."},
    {15, "switch version",               &kSwitchVersion,     &kSwitchVersion,   &kFormVersion,       "107 to 112 are saved as 7 to 12; the overlay flag makes the difference on load."},
    {16, "LACP groups",                  &kLacpTable,         &kLacpTable,       &kFormLacpGroups,    "Unknown texts load as 0xFFFFFFFF; a count of 0 saves nothing."},
    {17, "etherswitch teaming policy",   &kTeamingPolicy,     &kTeamingPolicy,   &kFormTeaming,       "The two explicit policies 4 and 5 come back swapped. Percentage, full duplex and speed are looked for beside the failure criteria, so they come back as 0; of the speed only the low byte is read. Failure criteria come back with 0x200 set. Loads on a switch that is neither vswitch nor cswitch."},
    {18, "vswitch teaming policy",       &kTeamingPolicy,     &kTeamingPolicy,   &kFormTeaming,       "The two explicit policies 4 and 5 come back swapped. Percentage, full duplex and speed are looked for beside the failure criteria, so they come back as 0; of the speed only the low byte is read. Failure criteria come back with 0x200 set. A switch that is neither vswitch nor cswitch saves and loads nothing."},
    {19, "overlay flag",                 &kBoolText,          &kBoolText,        &kFormBool,          "Loads as 5 bytes, with NUL for true and without for false."},
    {20, "uplink port names",            &kUplinkNames,       &kUplinkNames,     &kFormUplinkNames,   "A count of 0 saves nothing: an earlier list stays."},
    {21, "MTU",                          &kNumber,            &kNumber,          &kFormUint32,        "Three keys share one field: the last saved wins. A load fills the common key and the one of the switch's family; a cswitch gets the common key alone."},
    {22, "unmapped property",            &kOpaqueValue,       &kOpaqueValue,     &kFormUnmapped,      "Takes every key without a row of its own."},
    {23, "transmit-uplink mode",         &kTxUplink,          &kTxUplink,        &kFormBool,          "Anything but \"always\" is saved as false. Of the two keys a load fills the one of the switch's family."},
    {24, "etherswitch port VLAN",        &kPortVlan,          &kPortVlan,        &kFormVlan,          "A load without memory skips the property. Loads on a switch that is neither vswitch nor cswitch."},
    {25, "vswitch port VLAN",            &kPortVlan,          &kPortVlan,        &kFormVlan,          "Whether the id could be written is not told; a load without memory fails. A switch that is neither vswitch nor cswitch saves and loads nothing."},
    {26, "traffic shaping",              &kShapingPolicy,     &kShapingPolicy,   &kFormShaping,       "The store holds bits where the record holds bytes. \"enabled\" is always written true and never read."},
    {27, "etherswitch MAC security",     &kMacSecurity,       &kMacSecurity,     &kFormSecurity,      "Fields that cannot be read count as allowed. Loads on a switch that is neither vswitch nor cswitch."},
    {28, "vswitch MAC security",         &kMacSecurity,       &kMacSecurity,     &kFormSecurity,      "Fields that cannot be read count as allowed. Loads on vswitches and cswitches only."},
    {29, "traffic filters",              &kFilterConfig,      &kFilterConfig,    &kFormFilters,       "A load places each filter behind the fixed part of the one before, over its parameters, and numbers parameters from 0. The instance id is the slot as signed, \"slot_number\" as unsigned decimal."},
    {31, "port blocked",                 &kBoolText,          &kBoolText,        &kFormBool,          "Loads as 6 bytes for true (\"true\", NUL, 'f') and as 5 without NUL for false."},
    {32, "passthrough allowed",          &kPassthrough,       &kPassthrough,     &kFormBool,          "Any number but 2 is saved as false and comes back as 0."},
    {33, "unmapped port property",       &kOpaqueValue,       &kOpaqueValue,     &kFormUnmapped,      "Takes every key without a row of its own; what goes to \"other_data\" does not come back."},
    {34, "port IPFIX enabled",           &kEnabledText,       &kEnabledText,     &kFormBool,          "False loads as no property."},
    {35, "port LACP policy",             &kPortLacp,          &kPortLacp,        &kFormPortLacp,      "A load needs both fields. An unknown mode loads as 0xFFFFFFFF."},
    {36, "port resource pools",          &kPoolConfig,        &kPoolConfig,      &kFormPools,         "Saved nowhere. A load gives every uplink port the switch's own resource pools."},
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

const TypeInfo *FindType(uint32_t type) {
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
    const TypeInfo *info = row ? FindType(row->converterType) : nullptr;
    if (!info) return nullptr;
    return wide ? info->wide : info->record;
}

} // namespace dvs::layout
