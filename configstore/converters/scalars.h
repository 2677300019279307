/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_SCALARS_H
#define CONFIGSTORE_CONVERTERS_SCALARS_H

// Converters of single values: numbers, texts, and the several ways a boolean is kept in a property.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Types 0 and 21: u32 <-> uint32 field. The MTU loads only under the keys of the switch's class.
int32_t SaveUint32(const SaveArgs &args);
int32_t LoadUint32(const LoadArgs &args);
int32_t LoadMtu(const LoadArgs &args);

/// Type 1: NUL-terminated text <-> string field. The multicast filter loads under one family's key only.
int32_t SaveText(const SaveArgs &args);
int32_t LoadText(const LoadArgs &args);

/// Type 3: u8 <-> bool field.
int32_t SaveBoolByte(const SaveArgs &args);
int32_t LoadBoolByte(const LoadArgs &args);

/// Types 4 and 31: "true"/"false" <-> bool field; type 19 saves alike and loads other lengths.
int32_t SaveBoolText(const SaveArgs &args);
int32_t LoadBoolText(const LoadArgs &args);
int32_t LoadOverlayFlag(const LoadArgs &args);

/// Type 32: u32, 2 for allowed <-> bool field.
int32_t SavePassthrough(const SaveArgs &args);
int32_t LoadPassthrough(const LoadArgs &args);

/// Type 34: "enabled" <-> bool field; false loads as no property.
int32_t SavePortIpfix(const SaveArgs &args);
int32_t LoadPortIpfix(const LoadArgs &args);

} // namespace dvs::convert

#endif
