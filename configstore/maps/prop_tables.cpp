/* SPDX-License-Identifier: Apache-2.0 */
// The mapping tables as data: one row a property key, with its place in the store and its converter. The
// frame (prop_frame.cpp) reads them; nothing in the library changes them. Row order matters: the first row of
// a key is the one a save takes, and a load goes through the rows in order.

#include "dvs/configstore.h"

#include <cstddef>

static_assert(offsetof(DVSProp2ConfigEntry, path) == 8 && offsetof(DVSProp2ConfigEntry, depth) == 648 &&
              offsetof(DVSProp2ConfigEntry, converterType) == 652 &&
              offsetof(DVSProp2ConfigEntry, loadPropType) == 656 &&
              offsetof(DVSProp2ConfigEntry, reserved) == 660);

// clang-format off

// A switch's global properties. The second etherswitch.multicastFilter row is kept: no save reaches it, and a load
// merely reads the same field twice.
DVSProp2ConfigEntry dvsGlobalProp2Config[] = {
    // key                                    path                                                            depth, type, load type, reserved
    {"com.orbeno.common.alias",                {"name"},                                                       1,  1, 16, 0},
    {"com.orbeno.common.version",              {"product", "version"},                                         2, 15, 16, 0},
    {"com.orbeno.common.portset.mtu",          {"settings", "max_mtu"},                                        2, 21, 16, 0},
    {"com.orbeno.vswitch.mtu",                 {"settings", "max_mtu"},                                        2, 21, 16, 0},
    {"com.orbeno.etherswitch.mtu",             {"settings", "max_mtu"},                                        2, 21, 16, 0},
    {"com.orbeno.common.opaqueDvs",            {"is_opaque"},                                                  1,  4, 16, 0},
    {"com.orbeno.common.uplinkPorts",          {"uplink_port_names"},                                          1, 20, 16, 0},
    {"com.orbeno.etherswitch.lacp",            {"settings", "lacp_groups"},                                    2, 16, 16, 0},
    {"com.orbeno.etherswitch.ipv4addr",        {"switch_address"},                                             1,  5, 16, 0},
    {"com.orbeno.etherswitch.beaconTimeout",   {"settings", "beacon"},                                         2,  2, 16, 0},
    {"com.orbeno.etherswitch.pvlanMap",        {"settings", "pvlans"},                                         2,  6, 16, 0},
    {"com.orbeno.vswitch.pvlanMap",            {"settings", "pvlans"},                                         2,  7, 16, 0},
    {"com.orbeno.etherswitch.cdp",             {"settings", "link_discovery_protocol"},                        2,  8, 16, 0},
    {"com.orbeno.etherswitch.mirrorSessions",  {"settings", "vspans"},                                         2,  9, 16, 0},
    {"com.orbeno.vswitch.mirrorSessions",      {"settings", "vspans"},                                         2,  9, 16, 0},
    {"com.orbeno.common.portset.ovl",          {"ovl_enabled"},                                                1, 19, 16, 0},
    {"com.orbeno.etherswitch.ipfix",           {"settings", "ipfix"},                                          2, 10, 16, 0},
    {"com.orbeno.etherswitch.multicastFilter", {"settings", "multicast_filtering_mode"},                       2,  1, 16, 0},
    {"com.orbeno.vswitch.multicastFilter",     {"settings", "multicast_filtering_mode"},                       2,  1, 16, 0},
    {"com.orbeno.etherswitch.multicastFilter", {"settings", "multicast_filtering_mode"},                       2,  1, 16, 0},
    {"com.orbeno.common.vlanmtucheck.deploy",  {"health_checks"},                                              1, 11, 16, 0},
    {"com.orbeno.common.teamcheck.deploy",     {"health_checks"},                                              1, 11, 16, 0},
    {"com.orbeno.common.respools.cfg",         {"resource_management", "traffic_resources"},                   2, 12, 16, 0},
    {"com.orbeno.common.respools.list",        {"resource_management", "network_resource_pool_keys"},          2, 13, 16, 0},
    {"com.orbeno.common.respools.sched",       {"resource_management", "enable"},                              2,  3, 16, 0},
    {"com.orbeno.common.respools.version",     {"resource_management", "network_resource_control_version"},    2,  1, 16, 0},
    {"com.orbeno.common.resv.threshold",       {"resource_management", "pnic_capacity_ratio_for_reservation"}, 2,  0, 16, 0},
    {"com.orbeno.vswitch.teaming",             {"settings", "uplink_teaming_policy"},                          2, 18, 16, 0},
    {"DEFAULT",                                {"data"},                                                       1, 22, 16, 0},
    {nullptr,                                  {},                                                             0, 37,  0, 0},
};

// A port's properties.
DVSProp2ConfigEntry dvsPortProp2Config[] = {
    // key                                        path                                         depth, type, load type, reserved
    {"com.orbeno.common.port.alias",               {"name"},                                    1,  1, 16, 0},
    {"com.orbeno.common.port.connectid",           {"connection_cookie"},                       1,  0, 16, 0},
    {"com.orbeno.common.port.block",               {"settings", "blocked"},                     2, 31, 16, 0},
    {"com.orbeno.common.port.ptAllowed",           {"settings", "vm_direct_path_gen2_allowed"}, 2, 32, 16, 0},
    {"com.orbeno.etherswitch.port.txUplink",       {"settings", "tx_uplink"},                   2, 23, 16, 0},
    {"com.orbeno.vswitch.port.txUplink",           {"settings", "tx_uplink"},                   2, 23, 16, 0},
    {"com.orbeno.common.port.portgroupid",         {"port_group_key"},                          1,  1, 16, 0},
    {"com.orbeno.etherswitch.port.teaming",        {"settings", "uplink_teaming_policy"},       2, 17, 16, 0},
    {"com.orbeno.vswitch.port.teaming.policy",     {"settings", "uplink_teaming_policy"},       2, 18, 16, 0},
    {"com.orbeno.etherswitch.port.vlan",           {"settings", "vlan"},                        2, 24, 16, 0},
    {"com.orbeno.vswitch.port.vlan",               {"settings", "vlan"},                        2, 25, 16, 0},
    {"com.orbeno.etherswitch.port.ipfix",          {"settings", "ipfix_enabled"},               2, 34, 16, 0},
    {"com.orbeno.common.port.shaper.input",        {"settings", "in_shaping_policy"},           2, 26, 16, 0},
    {"com.orbeno.common.port.shaper.output",       {"settings", "out_shaping_policy"},          2, 26, 16, 0},
    {"com.orbeno.etherswitch.port.security",       {"settings", "mac_management_policy"},       2, 27, 16, 0},
    {"com.orbeno.vswitch.port.security",           {"settings", "mac_management_policy"},       2, 28, 16, 0},
    {"com.orbeno.common.port.dvfilter",            {"settings", "filter_policy"},               2, 29, 16, 0},
    {"com.orbeno.common.port.respools.cfg",        {"settings", "network_resource_pools"},      2, 36, 16, 0},
    {"com.orbeno.common.port.backingType",         {"settings", "backing_type"},                2,  1, 16, 0},
    {"com.orbeno.vswitch.port.priority",           {"settings", "vlan", "priority"},            3,  0, 16, 0},
    {"com.orbeno.vswitch.port.mirrorSessions",     {"vspans"},                                  1,  9, 16, 0},
    {"com.orbeno.etherswitch.port.mirrorSessions", {"vspans"},                                  1,  9, 16, 0},
    {"com.orbeno.etherswitch.port.lacp",           {"settings", "lacp_policy"},                 2, 35, 16, 0},
    {"DEFAULT",                                    {"data"},                                    1, 33, 16, 0},
    {nullptr,                                      {},                                          0, 37,  0, 0},
};

// A switch's properties on this host.
DVSProp2ConfigEntry dvsHostProp2Config[] = {
    // key                                path                  depth, type, load type, reserved
    {"com.orbeno.common.host.portset",     {"portset_name"},     1,  1, 16, 0},
    {"com.orbeno.common.host.uplinkPorts", {"uplink_port_keys"}, 1, 14, 16, 0},
    {"DEFAULT",                            {"data"},             1, 22, 16, 0},
    {nullptr,                              {},                   0, 37,  0, 0},
};

// By property class.
DVSProp2ConfigEntry *dvsConfigMaps[] = {dvsGlobalProp2Config, dvsHostProp2Config, dvsPortProp2Config};
// clang-format on

DVSProp2ConfigEntry *GetConfigMap(int kind) {
    return dvsConfigMaps[kind];
}
