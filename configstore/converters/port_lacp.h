/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_PORT_LACP_H
#define CONFIGSTORE_CONVERTERS_PORT_LACP_H

// Whether a port takes part in link aggregation.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 35. A load needs both of its fields.
int32_t SavePortLacp(const SaveArgs &args);
int32_t LoadPortLacp(const LoadArgs &args);

} // namespace dvs::convert

#endif
