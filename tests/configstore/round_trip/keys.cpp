/* SPDX-License-Identifier: Apache-2.0 */
// The mapped keys (keys.h).

#include "configstore/round_trip/keys.h"

namespace round_trip {
namespace {

using enum LoadsOn;

// clang-format off
constexpr Key kGlobalKeys[] = {
    // name                                   type place          loads on
    {"com.orbeno.common.alias",                 1, "name",        kAll},
    {"com.orbeno.common.version",              15, "version",     kAll},
    {"com.orbeno.common.portset.mtu",          21, "mtu",         kAll},
    {"com.orbeno.vswitch.mtu",                 21, "mtu",         kVswitch},
    {"com.orbeno.etherswitch.mtu",             21, "mtu",         kEtherswitch},
    {"com.orbeno.common.opaqueDvs",             4, "opaque",      kAll},
    {"com.orbeno.common.uplinkPorts",          20, "uplinks",     kAll},
    {"com.orbeno.etherswitch.lacp",            16, "groups",      kAll},
    {"com.orbeno.etherswitch.ipv4addr",         5, "address",     kAll},
    {"com.orbeno.etherswitch.beaconTimeout",    2, "beacon",      kAll},
    {"com.orbeno.etherswitch.pvlanMap",         6, "pvlans",      kPrivateVlanOwner},
    {"com.orbeno.vswitch.pvlanMap",             7, "pvlans",      kPrivateVlanOther},
    {"com.orbeno.etherswitch.cdp",              8, "discovery",   kAll},
    {"com.orbeno.etherswitch.mirrorSessions",   9, "sessions",    kEtherswitch},
    {"com.orbeno.vswitch.mirrorSessions",       9, "sessions",    kVswitches},
    {"com.orbeno.common.portset.ovl",          19, "overlay",     kAll},
    {"com.orbeno.etherswitch.ipfix",           10, "ipfix",       kAll},
    {"com.orbeno.etherswitch.multicastFilter",  1, "multicast",   kEtherswitch},
    {"com.orbeno.vswitch.multicastFilter",      1, "multicast",   kVswitches},
    {"com.orbeno.common.vlanmtucheck.deploy",  11, "vlan check",  kAll},
    {"com.orbeno.common.teamcheck.deploy",     11, "team check",  kAll},
    {"com.orbeno.common.respools.cfg",         12, "pools",       kAll},
    {"com.orbeno.common.respools.list",        13, "pool keys",   kAll},
    {"com.orbeno.common.respools.sched",        3, "scheduler",   kAll},
    {"com.orbeno.common.respools.version",      1, "control",     kAll},
    {"com.orbeno.common.resv.threshold",        0, "reservation", kAll},
    {"com.orbeno.vswitch.teaming",             18, "teaming",     kVswitches},
};
constexpr Key kHostKeys[] = {
    {"com.orbeno.common.host.portset",          1, "portset",     kAll},
    {"com.orbeno.common.host.uplinkPorts",     14, "uplink keys", kAll},
};
constexpr Key kPortKeys[] = {
    {"com.orbeno.common.port.alias",            1, "name",        kAll},
    {"com.orbeno.common.port.connectid",        0, "connection",  kAll},
    {"com.orbeno.common.port.block",           31, "blocked",     kAll},
    {"com.orbeno.common.port.ptAllowed",       32, "passthrough", kAll},
    {"com.orbeno.etherswitch.port.txUplink",   23, "tx uplink",   kEtherswitch},
    {"com.orbeno.vswitch.port.txUplink",       23, "tx uplink",   kVswitches},
    {"com.orbeno.common.port.portgroupid",      1, "group",       kAll},
    {"com.orbeno.etherswitch.port.teaming",    17, "teaming",     kEtherswitch},
    {"com.orbeno.vswitch.port.teaming.policy", 18, "teaming",     kVswitches},
    {"com.orbeno.etherswitch.port.vlan",       24, "vlan",        kEtherswitch},
    {"com.orbeno.vswitch.port.vlan",           25, "vlan",        kVswitches},
    {"com.orbeno.etherswitch.port.ipfix",      34, "ipfix",       kAll},
    {"com.orbeno.common.port.shaper.input",    26, "input",       kAll},
    {"com.orbeno.common.port.shaper.output",   26, "output",      kAll},
    {"com.orbeno.etherswitch.port.security",   27, "security",    kEtherswitch},
    {"com.orbeno.vswitch.port.security",       28, "security",    kVswitches},
    {"com.orbeno.common.port.dvfilter",        29, "filters",     kAll},
    {"com.orbeno.common.port.respools.cfg",    36, "pools",       kUplinkPorts},
    {"com.orbeno.common.port.backingType",      1, "backing",     kAll},
    {"com.orbeno.vswitch.port.priority",        0, "priority",    kAll},
    {"com.orbeno.vswitch.port.mirrorSessions",  9, "sessions",    kVswitches},
    {"com.orbeno.etherswitch.port.mirrorSessions", 9, "sessions", kEtherswitch},
    {"com.orbeno.etherswitch.port.lacp",       35, "lacp",        kAll},
};
// clang-format on

} // namespace

std::span<const Key> KeysOf(uint32_t propClass) {
    if (propClass == 0) return kGlobalKeys;
    return propClass == 1 ? std::span<const Key>(kHostKeys) : kPortKeys;
}

} // namespace round_trip
