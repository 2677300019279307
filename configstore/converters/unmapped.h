/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_UNMAPPED_H
#define CONFIGSTORE_CONVERTERS_UNMAPPED_H

// Converters of the DEFAULT rows: properties that no other row names are kept in lists of instances under
// "data", in the list that their type word or key asks for.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 22: a switch's global and host properties.
int32_t SaveUnmappedSwitchProp(const SaveArgs &args);
int32_t LoadUnmappedSwitchProps(const LoadArgs &args);

/// Type 33: a port's properties. What "other_data" holds is not loaded.
int32_t SaveUnmappedPortProp(const SaveArgs &args);
int32_t LoadUnmappedPortProps(const LoadArgs &args);

} // namespace dvs::convert

#endif
