/* SPDX-License-Identifier: Apache-2.0 */
// The mapped keys (keys.h).

#include "configstore/round_trip/keys.h"

namespace round_trip {
namespace {

using enum LoadsOn;
using enum dvs::ConverterType;

// clang-format off
constexpr Key kGlobalKeys[] = {
    // name                                   type place          loads on
    {"com.orbeno.common.alias", kText, "name",        kAll},
    {"com.orbeno.common.version", kSwitchVersion, "version",     kAll},
    {"com.orbeno.common.portset.mtu", kMtu, "mtu",         kAll},
    {"com.orbeno.vswitch.mtu", kMtu, "mtu",         kVswitch},
    {"com.orbeno.etherswitch.mtu", kMtu, "mtu",         kEtherswitch},
    {"com.orbeno.common.opaqueDvs", kBoolText, "opaque",      kAll},
    {"com.orbeno.common.uplinkPorts", kUplinkNames, "uplinks",     kAll},
    {"com.orbeno.etherswitch.lacp", kLacpGroups, "groups",      kAll},
    {"com.orbeno.etherswitch.ipv4addr", kSwitchAddress, "address",     kAll},
    {"com.orbeno.etherswitch.beaconTimeout", kBeaconTimeout, "beacon",      kAll},
    {"com.orbeno.etherswitch.pvlanMap", kEtherswitchPrivateVlans, "pvlans",      kPrivateVlanOwner},
    {"com.orbeno.vswitch.pvlanMap", kVswitchPrivateVlans, "pvlans",      kPrivateVlanOther},
    {"com.orbeno.etherswitch.cdp", kLinkDiscovery, "discovery",   kAll},
    {"com.orbeno.etherswitch.mirrorSessions", kMirrorSessions, "sessions",    kEtherswitch},
    {"com.orbeno.vswitch.mirrorSessions", kMirrorSessions, "sessions",    kVswitches},
    {"com.orbeno.common.portset.ovl", kOverlayFlag, "overlay",     kAll},
    {"com.orbeno.etherswitch.ipfix", kIpfix, "ipfix",       kAll},
    {"com.orbeno.etherswitch.multicastFilter", kText, "multicast",   kEtherswitch},
    {"com.orbeno.vswitch.multicastFilter", kText, "multicast",   kVswitches},
    {"com.orbeno.common.vlanmtucheck.deploy", kHealthCheck, "vlan check",  kAll},
    {"com.orbeno.common.teamcheck.deploy", kHealthCheck, "team check",  kAll},
    {"com.orbeno.common.respools.cfg", kTrafficResources, "pools",       kAll},
    {"com.orbeno.common.respools.list", kPoolKeys, "pool keys",   kAll},
    {"com.orbeno.common.respools.sched", kBoolByte, "scheduler",   kAll},
    {"com.orbeno.common.respools.version", kText, "control",     kAll},
    {"com.orbeno.common.resv.threshold", kNumber, "reservation", kAll},
    {"com.orbeno.vswitch.teaming", kVswitchTeaming, "teaming",     kVswitches},
};
constexpr Key kHostKeys[] = {
    {"com.orbeno.common.host.portset", kText, "portset",     kAll},
    {"com.orbeno.common.host.uplinkPorts", kUplinkKeys, "uplink keys", kAll},
};
constexpr Key kPortKeys[] = {
    {"com.orbeno.common.port.alias", kText, "name",        kAll},
    {"com.orbeno.common.port.connectid", kNumber, "connection",  kAll},
    {"com.orbeno.common.port.block", kPortBlocked, "blocked",     kAll},
    {"com.orbeno.common.port.ptAllowed", kPassthrough, "passthrough", kAll},
    {"com.orbeno.etherswitch.port.txUplink", kTxUplink, "tx uplink",   kEtherswitch},
    {"com.orbeno.vswitch.port.txUplink", kTxUplink, "tx uplink",   kVswitches},
    {"com.orbeno.common.port.portgroupid", kText, "group",       kAll},
    {"com.orbeno.etherswitch.port.teaming", kEtherswitchTeaming, "teaming",     kEtherswitch},
    {"com.orbeno.vswitch.port.teaming.policy", kVswitchTeaming, "teaming",     kVswitches},
    {"com.orbeno.etherswitch.port.vlan", kEtherswitchPortVlan, "vlan",        kEtherswitch},
    {"com.orbeno.vswitch.port.vlan", kVswitchPortVlan, "vlan",        kVswitches},
    {"com.orbeno.etherswitch.port.ipfix", kPortIpfix, "ipfix",       kAll},
    {"com.orbeno.common.port.shaper.input", kShaping, "input",       kAll},
    {"com.orbeno.common.port.shaper.output", kShaping, "output",      kAll},
    {"com.orbeno.etherswitch.port.security", kEtherswitchMacSecurity, "security",    kEtherswitch},
    {"com.orbeno.vswitch.port.security", kVswitchMacSecurity, "security",    kVswitches},
    {"com.orbeno.common.port.dvfilter", kFilters, "filters",     kAll},
    {"com.orbeno.common.port.respools.cfg", kPortPools, "pools",       kUplinkPorts},
    {"com.orbeno.common.port.backingType", kText, "backing",     kAll},
    {"com.orbeno.vswitch.port.priority", kNumber, "priority",    kAll},
    {"com.orbeno.vswitch.port.mirrorSessions", kMirrorSessions, "sessions",    kVswitches},
    {"com.orbeno.etherswitch.port.mirrorSessions", kMirrorSessions, "sessions", kEtherswitch},
    {"com.orbeno.etherswitch.port.lacp", kPortLacp, "lacp",        kAll},
};
// clang-format on

} // namespace

std::span<const Key> KeysOf(uint32_t propClass) {
    if (propClass == 0) return kGlobalKeys;
    return propClass == 1 ? std::span<const Key>(kHostKeys) : kPortKeys;
}

} // namespace round_trip
