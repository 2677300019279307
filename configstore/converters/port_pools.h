/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_PORT_POOLS_H
#define CONFIGSTORE_CONVERTERS_PORT_POOLS_H

// The resource pools a port carries: always the switch's own.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 36: saves nothing and loads nothing from its own row. LoadProps gives the pools to the ports that get
/// them, through the converter of the switch's traffic resources (pools.h).
int32_t SavePortPools(const SaveArgs &args);
int32_t LoadPortPools(const LoadArgs &args);

} // namespace dvs::convert

#endif
