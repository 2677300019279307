/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_LINK_DISCOVERY_H
#define CONFIGSTORE_CONVERTERS_LINK_DISCOVERY_H

// How a switch makes itself known to its neighbours.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 8: two bytes <-> two texts. Texts that are unknown load as the value behind the last one.
int32_t SaveLinkDiscovery(const SaveArgs &args);
int32_t LoadLinkDiscovery(const LoadArgs &args);

} // namespace dvs::convert

#endif
