/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_POOLS_H
#define CONFIGSTORE_CONVERTERS_POOLS_H

// Network resource pools of a switch: their shares of the bandwidth, and the list of their keys.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 12: the pools <-> the instances of "traffic_resources".
int32_t SaveTrafficResources(const SaveArgs &args);
int32_t LoadTrafficResources(const LoadArgs &args);

/// Type 13: the pools' keys <-> a list of texts.
int32_t SavePoolKeys(const SaveArgs &args);
int32_t LoadPoolKeys(const LoadArgs &args);

} // namespace dvs::convert

#endif
