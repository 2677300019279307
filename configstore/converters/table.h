/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_TABLE_H
#define CONFIGSTORE_CONVERTERS_TABLE_H

// The one table of converters, indexed by the type column of the mapping rows. A new converter is one row in
// table.cpp.

#include <cstdint>

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Last assigned type, and the one that was never given out.
inline constexpr uint32_t kLastType = 36;
inline constexpr uint32_t kUnassignedType = 30;

/// The types the frame itself has to know: the rows that take every key no other row wants, and the switch's
/// traffic resources, which every port carries too.
inline constexpr uint32_t kTypeSwitchDefault = 22;
inline constexpr uint32_t kTypePortDefault = 33;
inline constexpr uint32_t kTypeTrafficResources = 12;

/// The pair of functions of a type; null for a type that no converter has.
const Converter *ConverterFor(uint32_t type);

} // namespace dvs::convert

#endif
