/* SPDX-License-Identifier: Apache-2.0 */
// The table of converters. It includes every family's header and nothing includes it but the build.

#include "configstore/converters/table.h"

#include <array>

#include "configstore/converters/common.h"
#include "configstore/converters/scalars.h"
#include "configstore/converters/switch_settings.h"
#include "configstore/converters/switch_version.h"
#include "configstore/converters/unmapped.h"
#include "configstore/converters/uplink_lists.h"

namespace dvs::convert {
namespace {

int32_t NotBuiltYetSave(const SaveArgs &args) {
    config::LogError("Converter of %s is not built yet\n", args.key);
    return kFailed;
}

// Nothing to load stays nothing to load; content that would get lost is the failure.
int32_t NotBuiltYetLoad(const LoadArgs &args) {
    configstore::Object *leaf = nullptr;
    if (configstore::GetSubObject(args.parent, args.leaf, "", &leaf) == configstore::NOT_FOUND) return 0;
    config::LogError("Converter of %s is not built yet\n", args.key);
    return kFailed;
}
constexpr Converter kNotBuiltYet = {NotBuiltYetSave, NotBuiltYetLoad};

// clang-format off
constexpr std::array<Converter, kLastType + 1> kConverters = {{
    // save                    load                     type, what it carries
    {SaveUint32,               LoadUint32},             //  0 unsigned number
    {SaveText,                 LoadText},               //  1 text
    {SaveBeaconTimeout,        LoadBeaconTimeout},      //  2 beacon timeout
    {SaveBoolByte,             LoadBoolByte},           //  3 one-byte boolean
    {SaveBoolText,             LoadBoolText},           //  4 "true"/"false"
    {SaveSwitchAddress,        LoadSwitchAddress},      //  5 switch address
    kNotBuiltYet,                                       //  6 etherswitch private VLAN map
    kNotBuiltYet,                                       //  7 vswitch private VLAN map
    kNotBuiltYet,                                       //  8 link discovery
    kNotBuiltYet,                                       //  9 mirror sessions
    kNotBuiltYet,                                       // 10 IPFIX
    kNotBuiltYet,                                       // 11 health checks
    kNotBuiltYet,                                       // 12 traffic resource pools
    kNotBuiltYet,                                       // 13 resource pool keys
    {SaveUplinkKeys,           LoadUplinkKeys},         // 14 host uplink port keys
    {SaveSwitchVersion,        LoadSwitchVersion},      // 15 switch version
    kNotBuiltYet,                                       // 16 LACP groups
    kNotBuiltYet,                                       // 17 etherswitch teaming
    kNotBuiltYet,                                       // 18 vswitch teaming
    {SaveBoolText,             LoadOverlayFlag},        // 19 overlay flag
    {SaveUplinkNames,          LoadUplinkNames},        // 20 uplink port names
    {SaveUint32,               LoadMtu},                // 21 MTU
    {SaveUnmappedSwitchProp,   LoadUnmappedSwitchProps},// 22 DEFAULT of switch and host
    kNotBuiltYet,                                       // 23 transmit uplink
    kNotBuiltYet,                                       // 24 etherswitch port VLAN
    kNotBuiltYet,                                       // 25 vswitch port VLAN
    kNotBuiltYet,                                       // 26 traffic shaping
    kNotBuiltYet,                                       // 27 etherswitch MAC security
    kNotBuiltYet,                                       // 28 vswitch MAC security
    kNotBuiltYet,                                       // 29 traffic filters
    {nullptr,                  nullptr},                // 30 never given out
    {SaveBoolText,             LoadBoolText},           // 31 port blocked
    {SavePassthrough,          LoadPassthrough},        // 32 passthrough allowed
    {SaveUnmappedPortProp,     LoadUnmappedPortProps},  // 33 DEFAULT of ports
    {SavePortIpfix,            LoadPortIpfix},          // 34 port IPFIX enabled
    kNotBuiltYet,                                       // 35 port LACP
    kNotBuiltYet,                                       // 36 port resource pools
}};
// clang-format on

} // namespace

const Converter *ConverterFor(uint32_t type) {
    if (type >= kConverters.size() || !kConverters[type].save) return nullptr;
    return &kConverters[type];
}

} // namespace dvs::convert
