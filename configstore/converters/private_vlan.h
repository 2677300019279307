/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_PRIVATE_VLAN_H
#define CONFIGSTORE_CONVERTERS_PRIVATE_VLAN_H

// A switch's map of private VLANs.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Types 6 and 7 alike. A load takes only the key that the switch's class and version call for.
int32_t SavePrivateVlans(const SaveArgs &args);
int32_t LoadPrivateVlans(const LoadArgs &args);

} // namespace dvs::convert

#endif
