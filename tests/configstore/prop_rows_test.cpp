/* SPDX-License-Identifier: Apache-2.0 */
// Every row of the mapping tables: programs outside this tree read the rows by position.

#include <string>

#include <gtest/gtest.h>

#include "dvs/configstore.h"

namespace {

struct Expected {
    const char *key;
    const char *path;
    uint32_t type;
};

std::string PathOf(const DVSProp2ConfigEntry &row) {
    std::string path;
    for (uint32_t level = 0; level < row.depth; ++level)
        path += (level ? "/" : "") + std::string(row.path[level]);
    return path;
}

void Compare(const Expected *expected, std::size_t count, const DVSProp2ConfigEntry *table) {
    for (std::size_t i = 0; i < count; ++i) {
        SCOPED_TRACE(i);
        ASSERT_NE(nullptr, table[i].key);
        EXPECT_STREQ(expected[i].key, table[i].key);
        EXPECT_EQ(expected[i].path, PathOf(table[i]));
        EXPECT_EQ(expected[i].type, table[i].converterType);
    }
    EXPECT_EQ(nullptr, table[count].key);
}

// clang-format off
constexpr Expected kGlobalRows[] = {
    {"com.orbeno.common.alias",                "name",                                                     1},
    {"com.orbeno.common.version",              "product/version",                                         15},
    {"com.orbeno.common.portset.mtu",          "settings/max_mtu",                                        21},
    {"com.orbeno.vswitch.mtu",                 "settings/max_mtu",                                        21},
    {"com.orbeno.etherswitch.mtu",             "settings/max_mtu",                                        21},
    {"com.orbeno.common.opaqueDvs",            "is_opaque",                                                4},
    {"com.orbeno.common.uplinkPorts",          "uplink_port_names",                                       20},
    {"com.orbeno.etherswitch.lacp",            "settings/lacp_groups",                                    16},
    {"com.orbeno.etherswitch.ipv4addr",        "switch_address",                                           5},
    {"com.orbeno.etherswitch.beaconTimeout",   "settings/beacon",                                          2},
    {"com.orbeno.etherswitch.pvlanMap",        "settings/pvlans",                                          6},
    {"com.orbeno.vswitch.pvlanMap",            "settings/pvlans",                                          7},
    {"com.orbeno.etherswitch.cdp",             "settings/link_discovery_protocol",                         8},
    {"com.orbeno.etherswitch.mirrorSessions",  "settings/vspans",                                          9},
    {"com.orbeno.vswitch.mirrorSessions",      "settings/vspans",                                          9},
    {"com.orbeno.common.portset.ovl",          "ovl_enabled",                                             19},
    {"com.orbeno.etherswitch.ipfix",           "settings/ipfix",                                          10},
    {"com.orbeno.etherswitch.multicastFilter", "settings/multicast_filtering_mode",                        1},
    {"com.orbeno.vswitch.multicastFilter",     "settings/multicast_filtering_mode",                        1},
    {"com.orbeno.etherswitch.multicastFilter", "settings/multicast_filtering_mode",                        1},
    {"com.orbeno.common.vlanmtucheck.deploy",  "health_checks",                                           11},
    {"com.orbeno.common.teamcheck.deploy",     "health_checks",                                           11},
    {"com.orbeno.common.respools.cfg",         "resource_management/traffic_resources",                   12},
    {"com.orbeno.common.respools.list",        "resource_management/network_resource_pool_keys",          13},
    {"com.orbeno.common.respools.sched",       "resource_management/enable",                               3},
    {"com.orbeno.common.respools.version",     "resource_management/network_resource_control_version",     1},
    {"com.orbeno.common.resv.threshold",       "resource_management/pnic_capacity_ratio_for_reservation",  0},
    {"com.orbeno.vswitch.teaming",             "settings/uplink_teaming_policy",                          18},
    {"DEFAULT",                                "data",                                                    22},
};

constexpr Expected kPortRows[] = {
    {"com.orbeno.common.port.alias",               "name",                                  1},
    {"com.orbeno.common.port.connectid",           "connection_cookie",                     0},
    {"com.orbeno.common.port.block",               "settings/blocked",                     31},
    {"com.orbeno.common.port.ptAllowed",           "settings/vm_direct_path_gen2_allowed", 32},
    {"com.orbeno.etherswitch.port.txUplink",       "settings/tx_uplink",                   23},
    {"com.orbeno.vswitch.port.txUplink",           "settings/tx_uplink",                   23},
    {"com.orbeno.common.port.portgroupid",         "port_group_key",                        1},
    {"com.orbeno.etherswitch.port.teaming",        "settings/uplink_teaming_policy",       17},
    {"com.orbeno.vswitch.port.teaming.policy",     "settings/uplink_teaming_policy",       18},
    {"com.orbeno.etherswitch.port.vlan",           "settings/vlan",                        24},
    {"com.orbeno.vswitch.port.vlan",               "settings/vlan",                        25},
    {"com.orbeno.etherswitch.port.ipfix",          "settings/ipfix_enabled",               34},
    {"com.orbeno.common.port.shaper.input",        "settings/in_shaping_policy",           26},
    {"com.orbeno.common.port.shaper.output",       "settings/out_shaping_policy",          26},
    {"com.orbeno.etherswitch.port.security",       "settings/mac_management_policy",       27},
    {"com.orbeno.vswitch.port.security",           "settings/mac_management_policy",       28},
    {"com.orbeno.common.port.dvfilter",            "settings/filter_policy",               29},
    {"com.orbeno.common.port.respools.cfg",        "settings/network_resource_pools",      36},
    {"com.orbeno.common.port.backingType",         "settings/backing_type",                 1},
    {"com.orbeno.vswitch.port.priority",           "settings/vlan/priority",                0},
    {"com.orbeno.vswitch.port.mirrorSessions",     "vspans",                                9},
    {"com.orbeno.etherswitch.port.mirrorSessions", "vspans",                                9},
    {"com.orbeno.etherswitch.port.lacp",           "settings/lacp_policy",                 35},
    {"DEFAULT",                                    "data",                                 33},
};

constexpr Expected kHostRows[] = {
    {"com.orbeno.common.host.portset",     "portset_name",      1},
    {"com.orbeno.common.host.uplinkPorts", "uplink_port_keys", 14},
    {"DEFAULT",                            "data",             22},
};

// clang-format on

TEST(PropRows, Global) {
    Compare(kGlobalRows, std::size(kGlobalRows), dvsGlobalProp2Config);
}

TEST(PropRows, Port) {
    Compare(kPortRows, std::size(kPortRows), dvsPortProp2Config);
}

TEST(PropRows, Host) {
    Compare(kHostRows, std::size(kHostRows), dvsHostProp2Config);
}

} // namespace
