/* SPDX-License-Identifier: Apache-2.0 */
// Resource pools of a port. The record is that of the switch's traffic resources (pools.cpp). Called through
// the converter table.

#include "configstore/converters/port_pools.h"

namespace dvs::convert {

// What a port carries is the switch's own configuration, which the switch saves.
int32_t SavePortPools(const SaveArgs &) {
    return 0;
}

int32_t LoadPortPools(const LoadArgs &) {
    return 0;
}

} // namespace dvs::convert
