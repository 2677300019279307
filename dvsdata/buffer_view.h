/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_BUFFER_VIEW_H
#define DVSDATA_BUFFER_VIEW_H

// A read-only cursor over the bytes of a serialized list, for everything that looks without loading:
// displays, verification, export, fuzzing. It allocates nothing, prints nothing, drops no type and knows no
// host's limits. It finds exactly the faults for which DVSData_DeserializeWithPropType refuses a buffer, the
// first one first, and says where it is. Leans on format.h only.
//
//     BufferView view(bytes);
//     EntryView entry;
//     while (view.Next(&entry)) { ... }
//     if (!view.Ok()) report(view.FirstFault());
//
// A value may be a buffer itself: BufferView(entry.value, entry.ValueOffset()) goes on there, with offsets
// that still count from the start of the outermost bytes.

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

#include "dvsdata/format.h"

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
    std::uint32_t expected = 0; // the number or bound it is held against

    /// What is wrong, in a few words; static.
    [[nodiscard]] const char *Text() const;
    /// The status the deserializer refuses with; HYP_OK for None.
    [[nodiscard]] HYP_ReturnStatus Status() const;
    /// Writes "<text> (found ..., expected ...)" into `out`, cut to its size and ended by NUL; false when
    /// cut.
    bool Describe(std::span<char> out) const;
};

struct EntryView {
    std::size_t offset = 0; // of the entry, from the start of the outermost bytes
    std::uint32_t size = 0; // as the entry says
    std::uint32_t propType = 0;
    Bytes nameField; // all 128 bytes
    Bytes value;
    Bytes padding; // behind the value, up to the entry's size

    /// The name up to its NUL, at most 127 characters: what a list would store.
    [[nodiscard]] std::string_view Name() const;
    [[nodiscard]] std::uint32_t DataLen() const { return static_cast<std::uint32_t>(value.size()); }
    [[nodiscard]] std::size_t ValueOffset() const { return offset + kEntryFixedSize; }
    /// Of the size a list would write it with.
    [[nodiscard]] bool IsUsualSize() const { return size == EntrySize(DataLen()); }
};

/// The header's fields as they stand, 0 where bytes are missing.
struct HeaderView {
    std::uint32_t totalLength = 0;
    std::uint32_t checksum = 0;
    std::uint16_t version = 0;
    std::uint16_t reserved = 0;
};

class BufferView {
public:
    BufferView() = default;
    /// `bytes` must outlive the view and its entries. `baseOffset` is where they start in the outermost
    /// bytes.
    explicit BufferView(Bytes bytes, std::size_t baseOffset = 0);

    [[nodiscard]] const HeaderView &Header() const { return header_; }
    [[nodiscard]] std::size_t BaseOffset() const { return base_; }
    /// The checksum the bytes have; 0 when the lengths are faulty.
    [[nodiscard]] std::uint32_t ComputedChecksum() const { return computedChecksum_; }

    /// Gives the next entry; false at the end marker, at a fault, and behind either.
    bool Next(EntryView *entry);
    /// Back to the first entry.
    void Rewind();

    /// Nothing wrong as far as has been looked.
    [[nodiscard]] bool Ok() const { return fault_.kind == FaultKind::None; }
    /// The end marker was reached without a fault.
    [[nodiscard]] bool AtEnd() const { return atEnd_; }
    [[nodiscard]] const Fault &FirstFault() const { return fault_; }
    /// Bytes up to and including the end marker; what lies behind it is never judged. Meaningful AtEnd().
    [[nodiscard]] std::size_t UsedSize() const { return offset_ + kMarkerSize; }

    /// Walks the entries of a buffer whose version or checksum is wrong, as displays of damaged data do.
    /// False when the fault is another one. The fault stays what it is unless the walk finds none before it.
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

/// Walks the whole buffer, one level. Kind None: sound.
[[nodiscard]] Fault VerifyBuffer(Bytes bytes, std::size_t baseOffset = 0);

} // namespace dvs::data

#endif
