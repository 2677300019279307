/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_SHAPING_H
#define CONFIGSTORE_CONVERTERS_SHAPING_H

// Limits on a port's bandwidth.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 26: bytes in the record, bits in the store.
int32_t SaveShaping(const SaveArgs &args);
int32_t LoadShaping(const LoadArgs &args);

} // namespace dvs::convert

#endif
