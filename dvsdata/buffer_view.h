/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_BUFFER_VIEW_H
#define DVSDATA_BUFFER_VIEW_H

// A read-only cursor over the bytes of a serialized list, for display, verification, export and fuzzing. It
// allocates nothing, prints nothing, skips no type and ignores host limits. It finds exactly the faults for
// which DVSData_DeserializeWithPropType rejects a buffer, the first one first, with their location.
//
//     BufferView view(bytes);
//     EntryView entry;
//     while (view.Next(&entry)) { ... }
//     if (!view.Ok()) report(view.FirstFault());
//
// A value may itself be a buffer: BufferView(entry.value, entry.ValueOffset()) reads it, with offsets that
// still count from the start of the outermost bytes.

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

#include "dvsdata/format.h"

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

    /// A short description of the fault; static.
    [[nodiscard]] const char *Text() const;
    /// The status of the deserializer for this fault; HYP_OK for None.
    [[nodiscard]] HYP_ReturnStatus Status() const;
    /// Writes "<text> (found ..., expected ...)" into `out`, truncated to its size and NUL-terminated; false
    /// if truncated.
    bool Describe(std::span<char> out) const;
};

struct EntryView {
    std::size_t offset = 0; // of the entry, from the start of the outermost bytes
    std::uint32_t size = 0; // as stored in the entry
    std::uint32_t propType = 0;
    Bytes nameField; // all 128 bytes
    Bytes value;
    Bytes padding; // after the value, up to the entry's size

    /// The name up to its NUL, at most 127 characters, as a list would store it.
    [[nodiscard]] std::string_view Name() const;
    [[nodiscard]] std::uint32_t DataLen() const { return static_cast<std::uint32_t>(value.size()); }
    [[nodiscard]] std::size_t ValueOffset() const { return offset + kEntryFixedSize; }
    /// True if the size is the one a list would write.
    [[nodiscard]] bool IsUsualSize() const { return size == EntrySize(DataLen()); }
};

/// The header's fields as stored; 0 if bytes are missing.
struct HeaderView {
    std::uint32_t totalLength = 0;
    std::uint32_t checksum = 0;
    std::uint16_t version = 0;
    std::uint16_t reserved = 0;
};

class BufferView {
public:
    BufferView() = default;
    /// `bytes` must outlive the view and its entries. `baseOffset` is their position in the outermost bytes.
    explicit BufferView(Bytes bytes, std::size_t baseOffset = 0);

    [[nodiscard]] const HeaderView &Header() const { return header_; }
    [[nodiscard]] std::size_t BaseOffset() const { return base_; }
    /// The computed checksum; 0 if the lengths are faulty.
    [[nodiscard]] std::uint32_t ComputedChecksum() const { return computedChecksum_; }

    /// Returns the next entry; false at the end marker or a fault, and after either.
    bool Next(EntryView *entry);
    /// Returns to the first entry.
    void Rewind();

    /// True if no fault has been found so far.
    [[nodiscard]] bool Ok() const { return fault_.kind == FaultKind::None; }
    /// True if the end marker was reached without a fault.
    [[nodiscard]] bool AtEnd() const { return atEnd_; }
    [[nodiscard]] const Fault &FirstFault() const { return fault_; }
    /// Bytes up to and including the end marker; later bytes are ignored. Meaningful only if AtEnd().
    [[nodiscard]] std::size_t UsedSize() const { return offset_ + kMarkerSize; }

    /// Walks the entries of a buffer with a wrong version or checksum, to display damaged data. Returns false
    /// for any other fault. The fault stays the same unless the walk finds one before it.
    bool WalkAnyway();

private:
    bool Stop(FaultKind kind, std::size_t offset, std::uint32_t found, std::uint32_t expected);

    Bytes bytes_;
    std::size_t base_ = 0;
    HeaderView header_;
    std::uint32_t computedChecksum_ = 0;
    Fault headerFault_, fault_;
    std::size_t offset_ = kHeaderSize;
    bool walking_ = false, atEnd_ = false;
};

/// Walks the whole buffer, one level. Returns kind None if it is valid.
[[nodiscard]] Fault VerifyBuffer(Bytes bytes, std::size_t baseOffset = 0);

} // namespace dvs::data

#endif
