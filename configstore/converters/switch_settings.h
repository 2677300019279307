/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_SWITCH_SETTINGS_H
#define CONFIGSTORE_CONVERTERS_SWITCH_SETTINGS_H

// Converters of two switch-wide values: the beacon timeout and the switch's own address.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 2: i32 <-> int field.
int32_t SaveBeaconTimeout(const SaveArgs &args);
int32_t LoadBeaconTimeout(const LoadArgs &args);

/// Type 5: IPv4 address, 4 bytes in network order <-> dotted text.
int32_t SaveSwitchAddress(const SaveArgs &args);
int32_t LoadSwitchAddress(const LoadArgs &args);

} // namespace dvs::convert

#endif
