/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_SWITCH_VERSION_H
#define CONFIGSTORE_CONVERTERS_SWITCH_VERSION_H

// The switch's version: a text in the store ("product"/"version", with "ovl_enabled" beside it), a number
// everywhere else. The load above and the converters whose values depend on the version read it here.

#include <cstdint>

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Reads the version of the switch whose root object is `switchObject`. Returns 0 with *version set, the
/// store's status for a missing "product" or "version", or -1 for a text that names no version; the last two
/// after a message.
[[nodiscard]] int32_t ReadSwitchVersion(const config::Messages &messages, configstore::Object *switchObject,
                                        SwitchVersion *version);

/// The trace that a reading without the overlay flag prints.
void TraceNoOverlayFlag(const config::Messages &messages);

/// Type 15: a version number <-> "version". Only the numbers that have a text can be saved.
int32_t SaveSwitchVersion(const SaveArgs &args);
int32_t LoadSwitchVersion(const LoadArgs &args);

} // namespace dvs::convert

#endif
