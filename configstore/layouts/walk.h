/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_WALK_H
#define CONFIGSTORE_LAYOUTS_WALK_H

// Reading any value by its record: every field with its place and its text, for annotated hexdumps and raw
// displays, and the first place where bytes and record disagree.

#include <cstdint>
#include <functional>
#include <span>
#include <string>

#include "configstore/layouts/layout.h"

namespace dvs::layout {

/// One field found in a value.
struct Item {
    std::string path; // "sessions[2].key"
    uint32_t offset;  // bytes from the value's start
    std::span<const uint8_t> bytes;
    const Field *field; // null for bytes that belong to no field: behind the record's end
};

struct Fault {
    bool found = false;
    uint32_t offset = 0; // bytes from the value's start
    std::string what;    // "ends inside ranges[3].end"
};

/// Calls `visit` for every field that lies in the value as a whole, in order, then once for bytes left over.
/// Returns the first fault: a field or a counted part that the value does not hold. Bytes left over are none.
Fault Walk(const Record &record, std::span<const uint8_t> value,
           const std::function<void(const Item &)> &visit);

/// Like Walk, and with numbers that have no text in their enumeration as faults, too.
Fault Check(const Record &record, std::span<const uint8_t> value);

/// The item's value for people: the number and its name ("5 LOADBALANCE_LOADBASED"), the bits by name, a text
/// in quotes with everything escaped that is not printable, addresses, hex.
std::string TextOf(const Item &item);

} // namespace dvs::layout

#endif
