/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_BUFFER_VIEW_H
#define DVSDATA_BUFFER_VIEW_H

// A read-only cursor over the bytes of a serialized list, for displays, verification, export and fuzzing. It
// allocates nothing, prints nothing, skips no type and applies no host limits. It finds exactly the faults
// for which DVSData_DeserializeWithPropType rejects a buffer, and reports the first one with its offset.
//
//     BufferView view(bytes);
//     EntryView entry;
//     while (view.Next(&entry)) { ... }
//     if (!view.Ok()) report(view.FirstFault());
//
// A value may be a buffer itself: BufferView(entry.value, entry.ValueOffset()) walks it, with offsets that
// still count from the start of the outermost bytes.

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "dvsdata/buffer_fault.h"
#include "dvsdata/format.h"

namespace dvs::data {

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
    /// The checksum of the bytes; 0 if the lengths are faulty.
    [[nodiscard]] std::uint32_t ComputedChecksum() const { return computedChecksum_; }

    /// Returns the next entry; false at the end marker, at a fault, and after either.
    bool Next(EntryView *entry);
    /// Returns to the first entry.
    void Rewind();

    /// True if no fault has been found so far.
    [[nodiscard]] bool Ok() const { return !fault_; }
    /// True if the end marker was reached without a fault.
    [[nodiscard]] bool AtEnd() const { return atEnd_; }
    [[nodiscard]] const Fault &FirstFault() const { return fault_; }
    /// Bytes up to and including the end marker; later bytes are not checked. Valid only if AtEnd().
    [[nodiscard]] std::size_t UsedSize() const { return offset_ + kMarkerSize; }

    /// Allows walking the entries of a buffer with a wrong version or checksum, to display damaged data.
    /// Returns false if the header has another fault. The header's fault stays the first one.
    bool WalkAnyway();

private:
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
