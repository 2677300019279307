/* SPDX-License-Identifier: Apache-2.0 */
// Reading serialized lists: the header's checks, the walk over the entries, and lists read where they lie.
// Every number in a buffer is distrusted: nothing is read outside the length that the header says, which is
// checked against the length given first. Leans on format.h; deserialize.cpp and the state's deserialization
// stand on it.

#include <algorithm>

#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {
namespace {

std::string_view StoredName(const std::uint8_t *field) {
    const auto *const text = reinterpret_cast<const char *>(field);
    return {text, ::strnlen(text, kMaxNameLen)};
}

bool IsAligned(std::size_t value) {
    return value % 4 == 0;
}

} // namespace

HYP_ReturnStatus CheckLengths(Bytes *buf) {
    const auto bufLen = static_cast<std::uint32_t>(buf->size());
    Emit(kDetail, "Deserialize data, length = %d\n", bufLen);
    if (bufLen < kMinBufferSize) {
        Emit(kError, "bad data: buffer size %d smaller than minimum header size\n", bufLen);
        return HYP_BAD_PARAM;
    }
    const std::uint32_t total = Load32(buf->data() + kTotalLengthOffset);
    if (total < kMinBufferSize) {
        Emit(kError, "bad data: data size %d in header smaller than minimum header size\n", total);
        return HYP_BAD_PARAM;
    }
    if (total > bufLen) {
        Emit(kError, "bad data: buffer size %d smaller than size %d in header\n", bufLen, total);
        return HYP_BAD_PARAM;
    }
    *buf = buf->first(total);
    return HYP_OK;
}

HYP_ReturnStatus CheckChecksum(Bytes buf, std::uint32_t computed) {
    const std::uint32_t stored = Load32(buf.data() + kChecksumOffset);
    if (computed == stored) return HYP_OK;
    Emit(kError, "bad chksum: expected 0x%x, actual 0x%x\n", stored, computed);
    return HYP_BAD_CHECKSUM;
}

HYP_ReturnStatus BlockTooLarge(std::uint32_t size) {
    Emit(kError, "bad data: data length smaller than data block size %d\n", size);
    return HYP_BAD_PARAM;
}

HYP_ReturnStatus NoMarker() {
    Emit(kError, "bad data: not end with 4 (zero) marker bytes\n");
    return HYP_BAD_PARAM;
}

HYP_ReturnStatus BufferReader::Open(Bytes buf, KnownSum known, PartSums parts) {
    *this = {};
    buf_ = buf;
    if (const HYP_ReturnStatus status = CheckLengths(&buf_); status != HYP_OK) return status;
    const std::uint16_t version = Load16(buf_.data() + kVersionOffset);
    if (version != kFormatVersion) {
        Emit(kError, "Bad data: expected header version %d, actual %d\n", kFormatVersion, version);
        return HYP_BAD_PARAM;
    }
    offset_ = kHeaderSize;
    // A known sum is that of all bytes given, so they must be the buffer and nothing else.
    if (known.known && buf_.size() == buf.size() && IsAligned(buf_.size()) && buf_.size() > kUnsummedSize)
        return CheckChecksum(buf_, known.sum - Sum(buf_.first(kUnsummedSize)));
    return CheckChecksum(buf_, parts == PartSums::Yes ? SumParts() : Checksum(buf_));
}

// Guesses the entries before they are checked, and sums each value by itself on the way. Where the guess
// fails the rest is summed as one piece: the result is the checksum in any case.
std::uint32_t BufferReader::SumParts() {
    numParts_ = 0;
    if (buf_.size() <= kUnsummedSize) return 0;
    std::uint32_t sum = 0;
    std::size_t summedTo = kUnsummedSize;
    for (std::size_t offset = kHeaderSize;
         numParts_ < kMaxParts && buf_.size() - offset >= kEntryFixedSize;) {
        const std::uint32_t size = Load32(&buf_[offset]);
        const std::uint32_t dataLen = Load32(&buf_[offset + kDataLenOffset]);
        const bool plain = size >= kEntryFixedSize && size <= buf_.size() - offset &&
                           dataLen <= size - kEntryFixedSize && IsAligned(size) && IsAligned(dataLen);
        if (!plain) break;
        const std::size_t value = offset + kEntryFixedSize;
        const std::uint32_t part = Sum(buf_.subspan(value, dataLen));
        sum += Sum(buf_.subspan(summedTo, value - summedTo)) + part;
        summedTo = value + dataLen;
        parts_[numParts_++] = part;
        offset += size;
    }
    return sum + Sum(buf_.subspan(summedTo));
}

HYP_ReturnStatus BufferReader::Next(EntryRef *entry) {
    // `offset_` never passes the end: each entry's size was checked against what remains.
    offset_ += size_;
    size_ = 0;
    const std::uint32_t remaining = static_cast<std::uint32_t>(buf_.size()) - offset_;
    if (remaining < kMarkerSize) return NoMarker();
    const std::uint8_t *const at = buf_.data() + offset_;
    const std::uint32_t size = Load32(at + kEntrySizeOffset);
    if (size == 0) return HYP_NOT_FOUND;
    if (size > remaining) return BlockTooLarge(size);
    // The room check refuses every size below 143, hence also an entry without a whole fixed part.
    const std::uint32_t dataLen = remaining >= kEntryFixedSize ? Load32(at + kDataLenOffset) : 0;
    if (dataLen > size || size - dataLen < kMinEntryRoom) {
        Emit(kError, "bad data: data block not serialized correctly %u/%u\n", dataLen, size);
        return HYP_BAD_PARAM;
    }
    size_ = size;
    *entry = {offset_,
              size,
              StoredName(at + kNameOffset),
              Load32(at + kPropTypeOffset),
              Bytes(at + kEntryFixedSize, dataLen),
              {}};
    if (index_ < numParts_) entry->sum = {true, parts_[index_]};
    ++index_;
    if (Emits(kEntry) && !quiet_) [[unlikely]]
        Emit(kEntry, "deserializing %.*s: %u/%u data/serial bytes %d flag\n",
             static_cast<int>(entry->name.size()), entry->name.data(), dataLen, size, entry->propType);
    return HYP_OK;
}

HYP_ReturnStatus InPlaceList::Open(Bytes buf, std::uint32_t typeMask, KnownSum known, PartSums parts) {
    typeMask_ = typeMask;
    if (const HYP_ReturnStatus status = start_.Open(buf, known, parts); status != HYP_OK) return status;
    reader_ = start_;
    start_.Quiet();

    // The messages are those of a list being built, which whoever reads them expects to see.
    EmitAllocating();
    std::uint32_t serialSize = kMinBufferSize;
    EmitAllocated(serialSize);
    EntryRef entry;
    HYP_ReturnStatus status;
    while ((status = reader_.Next(&entry)) == HYP_OK) {
        if ((entry.propType & typeMask_) == 0) continue;
        const auto dataLen = static_cast<std::uint32_t>(entry.value.size());
        EmitAdding(entry.name, dataLen, serialSize);
        serialSize += EntrySize(dataLen);
        EmitAdded(entry.name, serialSize);
    }
    if (status != HYP_NOT_FOUND) return status;
    Emit(kDetail, "Deserialize data done, serializeSize = %d\n", serialSize);
    Rewind();
    return HYP_OK;
}

bool InPlaceList::Next(EntryRef *entry) {
    // Everything was checked when the buffer was opened, so the only failure left is the end.
    while (reader_.Next(entry) == HYP_OK)
        if (entry->propType & typeMask_) return true;
    return false;
}

} // namespace dvs::data
