/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_FILTERS_H
#define CONFIGSTORE_CONVERTERS_FILTERS_H

// The traffic filters in a port's path.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 29: filters of variable size <-> the instances of "network_filters".
int32_t SaveFilters(const SaveArgs &args);
int32_t LoadFilters(const LoadArgs &args);

} // namespace dvs::convert

#endif
