/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_REGISTRY_H
#define CONFIGSTORE_LAYOUTS_REGISTRY_H

// What there is to know of every property: its row in the mapping tables, its record, its form in the store,
// what it is for and what is odd about it. Tools and docs/properties.md read it; the converters do not.

#include <cstdint>
#include <string_view>

#include "configstore/layouts/converter_type.h"
#include "configstore/layouts/records.h"
#include "configstore/layouts/store_form.h"
#include "dvs/configstore.h"

namespace dvs::layout {

/// One converter type.
struct TypeInfo {
    ConverterType type;
    const char *name;     // what it carries
    const Record *record; // the value's layout
    const Record *wide;   // the same for switches of a version above 99; mostly the same record
    const StoreField *form;
    const char *quirks; // what surprises, sentences; may be empty
};

/// Null for a type that no converter has.
const TypeInfo *FindType(ConverterType type);

/// The row of a mapping table that belongs to this very key; null where only a DEFAULT row would take it.
const DVSProp2ConfigEntry *FindProperty(uint32_t propClass, std::string_view key);

/// One sentence on what the property is for; null for a key that has no row.
const char *MeaningOf(uint32_t propClass, std::string_view key);

/// The layout of a key's value; null for a key that has no row of its own.
const Record *RecordOf(uint32_t propClass, std::string_view key, bool wide);

} // namespace dvs::layout

#endif
