/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_UPLINK_LISTS_H
#define CONFIGSTORE_CONVERTERS_UPLINK_LISTS_H

// Converters of the two uplink lists: a u32 count and that many fixed slots of NUL-terminated text <-> a list
// of strings.
//
//   offset  size          field
//   0       4             count, little-endian
//   4       count x slot  texts; a slot is 48 bytes for port keys, 81 for port names

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 14: the host's uplink port keys. No keys are saved as an empty list.
int32_t SaveUplinkKeys(const SaveArgs &args);
int32_t LoadUplinkKeys(const LoadArgs &args);

/// Type 20: the switch's uplink port names. No names leave the stored list as it was.
int32_t SaveUplinkNames(const SaveArgs &args);
int32_t LoadUplinkNames(const LoadArgs &args);

} // namespace dvs::convert

#endif
