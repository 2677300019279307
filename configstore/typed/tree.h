/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_TYPED_TREE_H
#define CONFIGSTORE_TYPED_TREE_H

// Trees in and out of store objects, led by the store forms. Used by typed_value.cpp alone.

#include <string>
#include <vector>

#include "configstore/layouts/converter_type.h"
#include "configstore/layouts/store_form.h"
#include "configstore/typed/typed_value.h"
#include "platform/configstore.h"

namespace dvs::typed {

/// A leaf of a store document: the member `name` of `parent`, for an instance of a list with its id.
struct Place {
    configstore::Object *parent;
    const char *name;
    const char *id; // null but for an instance
};

/// What is wrong with a tree, and where. No field and no reason means nothing is.
struct Flaw {
    std::string field, reason;
    [[nodiscard]] explicit operator bool() const { return !reason.empty(); }
};

/// The tree at a place. Members that are absent there are absent in the tree; an absent list is an empty one
/// at the root.
Node ReadTree(const layout::StoreField &form, const Place &place);

/// Takes out the numbers of an object that mean the same as none.
void DropUnset(const layout::StoreField &form, Node *object);

/// Brings instances that are given as an object (id: members) into the form of a list, and addresses into the
/// one in which they read back.
Node Normalized(const layout::StoreField &form, const Node &node);

/// Writes a normalized tree to a place. At the first flaw it stops.
Flaw WriteTree(const layout::StoreField &form, const Place &place, const Node &node);

/// The first text that is longer than its field, which no sound value has: its NUL is missing.
Flaw FindLongText(const layout::StoreField &form, const Node &node);

/// The first text or number that a tree's field may not be given, although bytes can hold it.
Flaw FindBrokenRule(const layout::StoreField &form, const Node &node);

/// What `given` has that `found` has not, or has otherwise: one line a value.
std::vector<std::string> Compare(const Node &given, const Node &found);

/// The value on one line.
std::string ToLine(const Node &node);

/// One line for people, by the converter type.
std::string Summarize(ConverterType type, const Node &tree);

} // namespace dvs::typed

#endif
