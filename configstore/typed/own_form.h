/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_TYPED_OWN_FORM_H
#define CONFIGSTORE_TYPED_OWN_FORM_H

// Types whose road through the store loses something by design: a save that leaves fields out, a load that
// looks for them elsewhere or puts one record over another. Their trees are completed from the bytes, and
// their bytes are made from the tree, so that what people read and write is all there. Used by
// typed_value.cpp alone.

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "configstore/layouts/converter_type.h"
#include "configstore/layouts/layout.h"
#include "configstore/typed/tree.h"

namespace dvs::typed {

struct OwnForm {
    ConverterType type;

    // Adds what a save leaves out to the tree of a value that has been saved, so that its records are whole.
    // May be null.
    void (*complete)(const layout::Record &record, std::span<const uint8_t> value,
                     const layout::StoreField &form, Node *tree);

    // Corrects `value`, which is what a load brought (nothing, where that was no property), to what the tree
    // says. The tree is normalized and has been written to an object, so its names, types and texts are
    // right.
    Flaw (*encode)(const layout::Record &record, const Node &tree, std::vector<uint8_t> *value);
};

/// Null for a type that its converter loads as it was written.
const OwnForm *OwnFormOf(ConverterType type);

/// Mirror sessions (mirror_form.cpp).
void CompleteSessions(const layout::Record &record, std::span<const uint8_t> value,
                      const layout::StoreField &form, Node *tree);
Flaw EncodeSessions(const layout::Record &record, const Node &tree, std::vector<uint8_t> *value);

/// Puts a member of a tree into the field of its name, if the record has one: numbers, truth values, texts,
/// and texts of an enumeration. `bytes` starts at the record.
Flaw PutField(const layout::Record &record, const Node &member, const std::string &path,
              std::span<uint8_t> bytes);

/// Puts a number that fits into a field there is.
void SetNumber(const layout::Record &record, std::string_view field, uint64_t number,
               std::span<uint8_t> bytes);

} // namespace dvs::typed

#endif
