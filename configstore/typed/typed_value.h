/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_TYPED_TYPED_VALUE_H
#define CONFIGSTORE_TYPED_TYPED_VALUE_H

// Property values that people can read and write. The bytes of a known property become a small tree of named,
// typed fields, and such a tree becomes bytes again. Both ways go through the property's own converter, over
// an object that is in no store: a tree has the fields and names of the config store's document
// (layouts/store_form.h), and what is written here is what a load of that document would bring.
//
// For tools. Uses the store client's objects (no database, no transaction) and, while it runs, the
// converters' process-wide values: call it under the rules of a save or load. Nothing is printed meanwhile.

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace dvs::typed {

/// One value of a tree.
struct Node {
    enum class Kind : uint8_t { kNull, kBool, kNumber, kText, kList, kObject };

    Kind kind = Kind::kNull;
    std::string name; // of a member of an object; empty for elements of lists and for the root
    bool flag = false;
    int64_t number = 0;
    std::string text;
    std::vector<Node> items; // elements of a list, members of an object in their order
    const char *unit = "";   // of a number, for display: "bit/s", "seconds", … ; never null
    const char *note = "";   // meaning of the field, one line; never null

    [[nodiscard]] const Node *Find(std::string_view member) const;
};

/// The switch that the property belongs to, as far as its values depend on it.
struct Context {
    uint32_t version = 0; // its version number: above 99 the port records of mirror sessions are wide
};

enum class State : uint8_t {
    kTyped,    // the tree says what the value means
    kUnmapped, // no converter of its own: opaque, vendor or extra configuration; show it as it is
    kDamaged,  // a known property whose value does not fit it: show the bytes, and the reason
};

/// How much is wanted of a call; looking again at what has been made takes longer than making it.
enum class Ask : uint8_t {
    kResult,  // what the value says, or the bytes
    kChecked, // and whether the way back gives the same
};

struct View {
    State state = State::kUnmapped;
    std::string reason;  // of kDamaged, with the offset where it is known
    Node tree;           // of kTyped; its root has no name
    std::string summary; // of kTyped: one line for people
    // Where asked for, whether Build of this tree gives the same bytes again. Where it does not,
    // `differences` names the fields of the record that change, and the bytes must be kept beside the tree
    // for it to be lossless.
    bool exact = false;
    std::vector<std::string> differences;
};

/// Describes the bytes of a property. propClass is a DVS_PROP_CLASS_*.
View Describe(uint32_t propClass, std::string_view key, std::span<const uint8_t> value,
              const Context &context = {}, Ask ask = Ask::kChecked);

struct Built {
    bool ok = false;
    std::vector<uint8_t> bytes; // of ok
    std::string field;  // of a failure: the field at fault ("trunk_vlan_ids[1].start"); empty for the whole
    std::string reason; // of a failure: what is wrong and what would be right
    // Of ok, where asked for: fields that read back otherwise than they were given (Describe of the bytes
    // against the tree).
    std::vector<std::string> differences;
};

/// Makes a property's bytes out of a tree. Absent members are as absent as in a document. Unknown members,
/// other types, numbers and texts that do not fit, and texts that an enumeration lacks are refused by field.
/// The property's type word is 16, as for everything that comes out of the store.
Built Build(uint32_t propClass, std::string_view key, const Node &tree, const Context &context = {},
            Ask ask = Ask::kChecked);

} // namespace dvs::typed

#endif
