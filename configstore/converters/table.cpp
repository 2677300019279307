/* SPDX-License-Identifier: Apache-2.0 */
// The table of converters. It includes every family's header and nothing includes it but the build.

#include "configstore/converters/table.h"

#include <array>

#include "configstore/converters/filters.h"
#include "configstore/converters/health_check.h"
#include "configstore/converters/ipfix.h"
#include "configstore/converters/lacp_groups.h"
#include "configstore/converters/link_discovery.h"
#include "configstore/converters/mac_security.h"
#include "configstore/converters/mirror.h"
#include "configstore/converters/pools.h"
#include "configstore/converters/port_lacp.h"
#include "configstore/converters/port_pools.h"
#include "configstore/converters/port_vlan.h"
#include "configstore/converters/private_vlan.h"
#include "configstore/converters/scalars.h"
#include "configstore/converters/shaping.h"
#include "configstore/converters/switch_settings.h"
#include "configstore/converters/switch_version.h"
#include "configstore/converters/teaming.h"
#include "configstore/converters/tx_uplink.h"
#include "configstore/converters/unmapped.h"
#include "configstore/converters/uplink_lists.h"

namespace dvs::convert {
namespace {

// clang-format off
constexpr std::array<Converter, static_cast<std::size_t>(ConverterType::kEnd)> kConverters = {{
    // save                     load                          // type, what it carries
    {SaveUint32,                LoadUint32},                  //  0 unsigned number
    {SaveText,                  LoadText},                    //  1 text
    {SaveBeaconTimeout,         LoadBeaconTimeout},           //  2 beacon timeout
    {SaveBoolByte,              LoadBoolByte},                //  3 one-byte boolean
    {SaveBoolText,              LoadBoolText},                //  4 "true"/"false"
    {SaveSwitchAddress,         LoadSwitchAddress},           //  5 switch address
    {SavePrivateVlans,          LoadPrivateVlans},            //  6 etherswitch private VLAN map
    {SavePrivateVlans,          LoadPrivateVlans},            //  7 vswitch private VLAN map
    {SaveLinkDiscovery,         LoadLinkDiscovery},           //  8 link discovery
    {SaveMirrorSessions,        LoadMirrorSessions},          //  9 mirror sessions
    {SaveIpfix,                 LoadIpfix},                   // 10 IPFIX
    {SaveHealthCheck,           LoadHealthCheck},             // 11 health checks
    {SaveTrafficResources,      LoadTrafficResources},        // 12 traffic resource pools
    {SavePoolKeys,              LoadPoolKeys},                // 13 resource pool keys
    {SaveUplinkKeys,            LoadUplinkKeys},              // 14 host uplink port keys
    {SaveSwitchVersion,         LoadSwitchVersion},           // 15 switch version
    {SaveLacpGroups,            LoadLacpGroups},              // 16 LACP groups
    {SaveEtherswitchTeaming,    LoadEtherswitchTeaming},      // 17 etherswitch teaming
    {SaveVswitchTeaming,        LoadVswitchTeaming},          // 18 vswitch teaming
    {SaveBoolText,              LoadOverlayFlag},             // 19 overlay flag
    {SaveUplinkNames,           LoadUplinkNames},             // 20 uplink port names
    {SaveUint32,                LoadMtu},                     // 21 MTU
    {SaveUnmappedSwitchProp,    LoadUnmappedSwitchProps},     // 22 DEFAULT of switch and host
    {SaveTxUplink,              LoadTxUplink},                // 23 transmit uplink
    {SaveEtherswitchPortVlan,   LoadEtherswitchPortVlan},     // 24 etherswitch port VLAN
    {SaveVswitchPortVlan,       LoadVswitchPortVlan},         // 25 vswitch port VLAN
    {SaveShaping,               LoadShaping},                 // 26 traffic shaping
    {SaveMacSecurity,           LoadEtherswitchMacSecurity},  // 27 etherswitch MAC security
    {SaveMacSecurity,           LoadVswitchMacSecurity},      // 28 vswitch MAC security
    {SaveFilters,               LoadFilters},                 // 29 traffic filters
    {nullptr,                   nullptr},                     // 30 never given out
    {SaveBoolText,              LoadBoolText},                // 31 port blocked
    {SavePassthrough,           LoadPassthrough},             // 32 passthrough allowed
    {SaveUnmappedPortProp,      LoadUnmappedPortProps},       // 33 DEFAULT of ports
    {SavePortIpfix,             LoadPortIpfix},               // 34 port IPFIX enabled
    {SavePortLacp,              LoadPortLacp},                // 35 port LACP
    {SavePortPools,             LoadPortPools},               // 36 port resource pools
}};
// clang-format on

} // namespace

const Converter *ConverterFor(ConverterType type) {
    const auto index = static_cast<std::size_t>(type);
    if (index >= kConverters.size() || !kConverters[index].save) return nullptr;
    return &kConverters[index];
}

} // namespace dvs::convert
