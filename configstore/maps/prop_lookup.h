/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_LOOKUP_H
#define CONFIGSTORE_MAPS_PROP_LOOKUP_H

// From a property key to its mapping row. Used by the frame alone.

#include "dvs/configstore.h"

namespace dvs::config {

/// The first row of `table` with exactly this key; where a row of type `defaultType` comes before it, that
/// row. Null where the table ends (null key) before either.
const DVSProp2ConfigEntry *FindRow(const DVSProp2ConfigEntry *table, const char *key, uint32_t defaultType);

} // namespace dvs::config

#endif
