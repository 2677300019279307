/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_BUFFER_FAULT_H
#define DVSDATA_BUFFER_FAULT_H

// What can be wrong with a serialized list, as a record. buffer_check.h finds faults; the readers turn them into the
// library's messages and statuses, the views hand them out.

#include <cstddef>
#include <cstdint>
#include <span>

#include "dvs/status.h"

namespace dvs::data {

enum class FaultKind : std::uint8_t {
    None,
    TooShort,       // fewer bytes than an empty list has; at the end of the bytes
    LengthTooSmall, // the header's total length is less than an empty list's; at that field
    LengthTooLarge, // the header's total length is more than there are bytes; at that field
    Version,        // another format version; at that field
    Checksum,       // at that field
    EntryTooLarge,  // an entry's size runs past the buffer's end; at the entry
    EntryLengths,   // an entry's size has no room for its fixed part and value; at the entry
    NoMarker        // no room for an end marker behind the last entry; where it should start
};

struct Fault {
    FaultKind kind = FaultKind::None;
    std::size_t offset = 0;     // of the byte, from the start of the outermost bytes
    std::uint32_t found = 0;    // the number that is wrong: a length, version, checksum, size
    std::uint32_t expected = 0; // the number or bound that it is compared with

    explicit operator bool() const { return kind != FaultKind::None; }
    /// What is wrong, in a few words; static.
    [[nodiscard]] const char *Text() const;
    /// The status that the deserializer returns for it; HYP_OK for None.
    [[nodiscard]] HYP_ReturnStatus Status() const;
    /// Writes "<text> (found ..., expected ...)" into `out`, cut to its size and ended by NUL; false when cut.
    bool Describe(std::span<char> out) const;
};

} // namespace dvs::data

#endif
