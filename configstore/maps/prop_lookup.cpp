/* SPDX-License-Identifier: Apache-2.0 */
// The key lookup of the frame (prop_lookup.h).

#include "configstore/maps/prop_lookup.h"

#include <cstring>

namespace dvs::config {

const DVSProp2ConfigEntry *FindRow(const DVSProp2ConfigEntry *table, const char *key, uint32_t defaultType) {
    for (const auto *row = table; row->key; ++row) {
        if (row->converterType == defaultType || std::strcmp(row->key, key) == 0) return row;
    }
    return nullptr;
}

} // namespace dvs::config
