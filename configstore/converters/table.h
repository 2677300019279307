/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_TABLE_H
#define CONFIGSTORE_CONVERTERS_TABLE_H

// The one table of converters, indexed by the type column of the mapping rows. A new converter is one row in
// table.cpp.

#include "configstore/converters/converter.h"
#include "configstore/layouts/converter_type.h"

namespace dvs::convert {

/// The pair of functions of a type; null for a type that no converter has, or a number that is no type.
const Converter *ConverterFor(ConverterType type);

} // namespace dvs::convert

#endif
