/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_CONVERTER_TYPE_H
#define CONFIGSTORE_LAYOUTS_CONVERTER_TYPE_H

// The numbers of the exported mapping tables' column `converterType`, by name. They are part of the interface
// and never change. The exported column stays a uint32_t, because its tables are writable: a number without a
// name there means that no converter has it.

#include <cstdint>

#include "dvs/configstore.h"

namespace dvs {

enum class ConverterType : uint32_t {
    kNumber = 0,
    kText = 1,
    kBeaconTimeout = 2,
    kBoolByte = 3,
    kBoolText = 4,
    kSwitchAddress = 5,
    kEtherswitchPrivateVlans = 6,
    kVswitchPrivateVlans = 7,
    kLinkDiscovery = 8,
    kMirrorSessions = 9,
    kIpfix = 10,
    kHealthCheck = 11,
    kTrafficResources = 12,
    kPoolKeys = 13,
    kUplinkKeys = 14,
    kSwitchVersion = 15,
    kLacpGroups = 16,
    kEtherswitchTeaming = 17,
    kVswitchTeaming = 18,
    kOverlayFlag = 19,
    kUplinkNames = 20,
    kMtu = 21,
    kSwitchDefault = 22, // every key of a switch or host that no other row has
    kTxUplink = 23,
    kEtherswitchPortVlan = 24,
    kVswitchPortVlan = 25,
    kShaping = 26,
    kEtherswitchMacSecurity = 27,
    kVswitchMacSecurity = 28,
    kFilters = 29,
    kUnassigned = 30, // no converter has it
    kPortBlocked = 31,
    kPassthrough = 32,
    kPortDefault = 33, // every key of a port that no other row has
    kPortIpfix = 34,
    kPortLacp = 35,
    kPortPools = 36,
    kEnd = 37, // the row behind the last one of a table
};

/// For loops over all types.
constexpr ConverterType Next(ConverterType type) {
    return ConverterType{static_cast<uint32_t>(type) + 1};
}

/// The type of a row. The tables are writable, so the result may be no type at all.
constexpr ConverterType ConverterTypeOf(const DVSProp2ConfigEntry &row) {
    return ConverterType{row.converterType};
}

} // namespace dvs

#endif
