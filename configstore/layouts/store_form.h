/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_STORE_FORM_H
#define CONFIGSTORE_LAYOUTS_STORE_FORM_H

// The other side of every converter, as data: the typed fields that a property has in the config store, below
// the leaf of its row. From it come the typed display and input of values and the tables of
// docs/properties.md.

#include <cstdint>
#include <span>

#include "configstore/layouts/layout.h"

namespace dvs::layout {

enum class Form : uint8_t {
    kNone, // nothing a tree can show: the rows that take every unmapped key
    kBool,
    kUint16,
    kUint32,
    kInt,
    kLong,
    kText,
    kTexts,     // list of texts
    kInts,      // list of numbers
    kObject,    // singleton sub-object with members
    kInstances, // list of instances with members
};

// What a text or number has to be beyond its form, for people who write it; the store does not ask.
enum class Rule : uint8_t {
    kNone,
    kIpv4,    // an IPv4 address
    kAddress, // an IPv4 or IPv6 address
    kVlan,    // a VLAN id, 0 to 4095
    kSlot,    // a uint32 as decimal text
    kBits,    // a multiple of 8, not negative: the record has bytes
    kUnset,   // any uint32, the largest of which says the same as leaving it out
};

struct StoreField {
    const char *name; // of a member; of a leaf the row's last path name stands in its place, and this is null
    Form form;
    const char *unit;     // of a number; may be empty
    uint32_t maxText;     // longest text in bytes that survives a load whole; 0: no limit
    const Domain *domain; // texts that are known; null: any
    const char *id;       // of instances: the member that is the instance id; null: ids mean nothing
    std::span<const StoreField> members; // of objects and of instances
    const char *meaning;
    Rule rule = Rule::kNone; // of a list: of its elements
    bool isNeeded = false;   // where its object is written, this member must be
};

} // namespace dvs::layout

#endif
