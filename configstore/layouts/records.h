/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_RECORDS_H
#define CONFIGSTORE_LAYOUTS_RECORDS_H

// The binary records there are. A record of a converter family is defined at the head of the family's own
// file, where the code that reads and writes it stands; the single values share layouts/scalars.cpp.
// layouts/registry.h says which property has which.

#include "configstore/layouts/layout.h"

namespace dvs::layout {

// Single values and plain lists (layouts/scalars.cpp).
extern const Record kNumber, kSignedNumber, kTextValue, kBoolByte, kBoolText, kPassthrough, kEnabledText,
    kIpv4Value, kUplinkKeys, kUplinkNames, kOpaqueValue, kSwitchVersion;

// Families, each in configstore/converters/<family>.cpp.
extern const Record kTeamingPolicy;
extern const Record kTxUplink;
extern const Record kPortVlan;
extern const Record kShapingPolicy;
extern const Record kMacSecurity;
extern const Record kFilterConfig;
extern const Record kPortLacp;
extern const Record kPrivateVlanMap;
extern const Record kMirrorTableNarrow, kMirrorTableWide;
extern const Record kLacpTable;
extern const Record kLinkDiscovery;
extern const Record kIpfix;
extern const Record kHealthCheck;
extern const Record kPoolConfig;
extern const Record kPoolList;

// Enumerations that more than one family reads.
extern const Domain kLacpModes;

/// The slots of an enumeration table, as they are now: the tables are exported data.
inline std::span<const char *const> Texts(const Domain &domain) {
    return {domain.texts, domain.textCount};
}

} // namespace dvs::layout

#endif
