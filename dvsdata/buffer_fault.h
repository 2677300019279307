/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_BUFFER_FAULT_H
#define DVSDATA_BUFFER_FAULT_H

// A fault in a serialized list, as a record. buffer_check.h finds faults; the readers convert them to the
// library's messages and statuses; the views return them.

#include <cstddef>
#include <cstdint>
#include <span>

#include "dvs/status.h"

namespace dvs::data {

enum class FaultKind : std::uint8_t {
    None,
    TooShort,       // fewer bytes than an empty list; at the end of the bytes
    LengthTooSmall, // the header's total length is smaller than an empty list's; at that field
    LengthTooLarge, // the header's total length exceeds the bytes; at that field
    Version,        // another format version; at that field
    Checksum,       // at that field
    EntryTooLarge,  // an entry's size runs past the buffer's end; at the entry
    EntryLengths,   // an entry's size has no room for its fixed part and value; at the entry
    NoMarker        // no room for an end marker after the last entry; where it should start
};

struct Fault {
    FaultKind kind = FaultKind::None;
    std::size_t offset = 0;     // of the byte, from the start of the outermost bytes
    std::uint32_t found = 0;    // the wrong number: a length, version, checksum or size
    std::uint32_t expected = 0; // the expected number or bound

    explicit operator bool() const { return kind != FaultKind::None; }
    /// A short description of the fault; static.
    [[nodiscard]] const char *Text() const;
    /// The status of the deserializer for this fault; HYP_OK for None.
    [[nodiscard]] HYP_ReturnStatus Status() const;
    /// Writes "<text> (found ..., expected ...)" into `out`, truncated and NUL-terminated; false if
    /// truncated.
    bool Describe(std::span<char> out) const;
};

} // namespace dvs::data

#endif
