/* SPDX-License-Identifier: Apache-2.0 */
// Reads serialized lists: checks the header, walks the entries, builds lists, and reads lists in place.
// Buffers are untrusted: nothing outside the length in the header is read, and that length is first checked
// against the given one. Used by deserialize.cpp and the state's deserialization.

#include <cstring>
#include <memory>

#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"
#include "dvsdata/list_record.h"
#include "dvsdata/name_field.h"

namespace dvs::data {
namespace {

/// An entry with checked sizes.
struct Place {
    const std::uint8_t *at;
    std::uint32_t size, dataLen;
};

std::string_view StoredName(const std::uint8_t *at) {
    const std::uint8_t *const field = at + kNameOffset;
    return {reinterpret_cast<const char *>(field), NameField(field).Len()};
}

bool IsAligned(std::size_t value) {
    return value % 4 == 0;
}

[[gnu::cold]] HYP_ReturnStatus BadLengths(std::uint32_t dataLen, std::uint32_t size) {
    Emit(kError, "bad data: data block not serialized correctly %u/%u\n", dataLen, size);
    return HYP_BAD_PARAM;
}

/// Reads the entry at `offset`, which must not be past the buffer's end. HYP_NOT_FOUND at the end marker.
inline HYP_ReturnStatus PlaceAt(Bytes buf, std::uint32_t offset, Place *place) {
    const std::uint32_t remaining = static_cast<std::uint32_t>(buf.size()) - offset;
    if (remaining < kMarkerSize) [[unlikely]]
        return NoMarker();
    const std::uint8_t *const at = buf.data() + offset;
    const std::uint32_t size = Load32(at + kEntrySizeOffset);
    if (size == 0) return HYP_NOT_FOUND;
    if (size > remaining) [[unlikely]]
        return BlockTooLarge(size);
    // The room check rejects every size below 143, so also an entry without a whole fixed part.
    const std::uint32_t dataLen = remaining >= kEntryFixedSize ? Load32(at + kDataLenOffset) : 0;
    if (dataLen > size || size - dataLen < kMinEntryRoom) [[unlikely]]
        return BadLengths(dataLen, size);
    *place = {at, size, dataLen};
    return HYP_OK;
}

void EmitReading(Place place) {
    const std::string_view name = StoredName(place.at);
    Emit(kEntry, "deserializing %.*s: %u/%u data/serial bytes %d flag\n", static_cast<int>(name.size()),
         name.data(), place.dataLen, place.size, Load32(place.at + kPropTypeOffset));
}

HYP_ReturnStatus CheckVersion(Bytes buf) {
    const std::uint16_t version = Load16(buf.data() + kVersionOffset);
    if (version == kFormatVersion) return HYP_OK;
    Emit(kError, "Bad data: expected header version %d, actual %d\n", kFormatVersion, version);
    return HYP_BAD_PARAM;
}

/// True if the known sum, over `given` bytes, covers exactly this buffer.
bool IsSumOf(Bytes buf, KnownSum known, std::size_t given) {
    return known.known && buf.size() == given && IsAligned(buf.size()) && buf.size() > kUnsummedSize;
}

struct FreeList {
    void operator()(DVSData *list) const { DVSData_Free(list); }
};

/// Up to this value length, an entry's size cannot wrap.
constexpr std::uint32_t kMaxPlainLen = UINT32_MAX / 2;

/// Appends an entry whose image can be copied as is: one copy, plus zeros for the bytes the format leaves
/// open.
inline HYP_ReturnStatus AppendImage(DVSData *list, Place place) {
    const NameField field(place.at + kNameOffset);
    const std::string_view name(reinterpret_cast<const char *>(place.at + kNameOffset), field.Len());
    if (place.dataLen > kMaxPlainLen || Emits(kDetail)) [[unlikely]]
        return Append(list, name, place.at + kEntryFixedSize, place.dataLen,
                      Load32(place.at + kPropTypeOffset));
    const std::uint32_t serialSize = EntrySize(place.dataLen);
    DVSDataEntry *const entry = NewPlace(list, serialSize);
    if (!entry) [[unlikely]]
        return HYP_NO_MEMORY;
    ClearPadding(entry, serialSize);
    std::memcpy(reinterpret_cast<std::uint8_t *>(entry) + kImageOffset, place.at,
                std::size_t{kEntryFixedSize} + place.dataLen);
    if (!field.IsPlain()) [[unlikely]]
        std::memset(entry->name + name.size(), 0, kNameSize - name.size());
    entry->serialSize = serialSize; // may differ from the image
    Link(list, entry, serialSize, name);
    return HYP_OK;
}

/// The room that the entries of a valid buffer need in a list's own block. Returns 0, so that each entry gets
/// its own block, for a faulty buffer (its faults are then reported as usual) and if messages print for each
/// entry.
std::uint64_t RoomFor(Bytes buf, std::uint32_t typeMask) {
    if (Emits(kDetail)) return 0;
    std::uint64_t room = 0;
    for (std::size_t offset = kHeaderSize, size = 0; buf.size() - offset >= kEntryFixedSize; offset += size) {
        const std::uint8_t *const at = buf.data() + offset;
        size = Load32(at + kEntrySizeOffset);
        const std::uint32_t dataLen = Load32(at + kDataLenOffset);
        if (size == 0) return room;
        if (size > buf.size() - offset || dataLen > size || size - dataLen < kMinEntryRoom) return 0;
        if (Load32(at + kPropTypeOffset) & typeMask) room += PlaceSize(EntrySize(dataLen));
    }
    return room;
}

HYP_ReturnStatus AppendAll(DVSData *list, Bytes buf, std::uint32_t typeMask) {
    Place place{};
    HYP_ReturnStatus status;
    // The offset never passes the end: each entry's size was checked against the remaining bytes.
    for (std::uint32_t offset = kHeaderSize; (status = PlaceAt(buf, offset, &place)) == HYP_OK;
         offset += place.size) {
        if (Emits(kEntry)) [[unlikely]]
            EmitReading(place);
        if ((Load32(place.at + kPropTypeOffset) & typeMask) == 0) continue;
        status = AppendImage(list, place);
        if (status != HYP_OK) [[unlikely]]
            return status;
    }
    return status == HYP_NOT_FOUND ? static_cast<HYP_ReturnStatus>(HYP_OK) : status;
}

} // namespace

HYP_ReturnStatus CheckLengths(Bytes *buf) {
    const auto bufLen = static_cast<std::uint32_t>(buf->size());
    if (Emits(kDetail)) [[unlikely]]
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
    if (const HYP_ReturnStatus status = CheckVersion(buf_); status != HYP_OK) return status;
    offset_ = kHeaderSize;
    if (IsSumOf(buf_, known, buf.size()))
        return CheckChecksum(buf_, known.sum - Sum(buf_.first(kUnsummedSize)));
    return CheckChecksum(buf_, parts == PartSums::Yes ? SumParts() : Checksum(buf_));
}

// Assumes the entries are valid before they are checked, and sums each value separately. If that fails, it
// sums the rest as one piece; the total is the checksum in both cases.
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
    offset_ += size_;
    size_ = 0;
    Place place{};
    if (const HYP_ReturnStatus status = PlaceAt(buf_, offset_, &place); status != HYP_OK) return status;
    size_ = place.size;
    *entry = {offset_,
              place.size,
              StoredName(place.at),
              Load32(place.at + kPropTypeOffset),
              Bytes(place.at + kEntryFixedSize, place.dataLen),
              {}};
    if (index_ < numParts_) entry->sum = {true, parts_[index_]};
    ++index_;
    if (Emits(kEntry) && !quiet_) [[unlikely]]
        EmitReading(place);
    return HYP_OK;
}

HYP_ReturnStatus InPlaceList::Open(Bytes buf, std::uint32_t typeMask, KnownSum known, PartSums parts) {
    typeMask_ = typeMask;
    if (const HYP_ReturnStatus status = start_.Open(buf, known, parts); status != HYP_OK) return status;
    reader_ = start_;
    start_.Quiet();

    // Print the messages of building a list, as readers of the log expect.
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
    // Open checked everything, so the only possible failure is the end.
    while (reader_.Next(entry) == HYP_OK)
        if (entry->propType & typeMask_) return true;
    return false;
}

HYP_ReturnStatus ReadList(DVSData **list, Bytes buf, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn,
                          std::uint32_t typeMask, KnownSum known, EntryBlocks blocks) {
    const std::size_t given = buf.size();
    if (const HYP_ReturnStatus status = CheckLengths(&buf); status != HYP_OK) return status;
    if (const HYP_ReturnStatus status = CheckVersion(buf); status != HYP_OK) return status;
    const std::uint32_t checksum =
        IsSumOf(buf, known, given) ? known.sum - Sum(buf.first(kUnsummedSize)) : Checksum(buf);
    if (const HYP_ReturnStatus status = CheckChecksum(buf, checksum); status != HYP_OK) return status;
    DVSData *handle = nullptr;
    const std::uint64_t room = blocks == EntryBlocks::Shared ? RoomFor(buf, typeMask) : 0;
    if (NewList(&handle, allocFn, freeFn, room) != HYP_OK) return HYP_NO_MEMORY;
    std::unique_ptr<DVSData, FreeList> owner(handle);
    if (const HYP_ReturnStatus status = AppendAll(handle, buf, typeMask); status != HYP_OK) return status;
    if (Emits(kDetail)) [[unlikely]]
        Emit(kDetail, "Deserialize data done, serializeSize = %d\n", handle->serialSize);
    *list = owner.release();
    return HYP_OK;
}

} // namespace dvs::data
