/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_MAC_SECURITY_H
#define CONFIGSTORE_CONVERTERS_MAC_SECURITY_H

// What a port rejects of other stations' addresses.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Types 27 and 28 save alike; each loads for its own family of switches only.
int32_t SaveMacSecurity(const SaveArgs &args);
int32_t LoadEtherswitchMacSecurity(const LoadArgs &args);
int32_t LoadVswitchMacSecurity(const LoadArgs &args);

} // namespace dvs::convert

#endif
