/* SPDX-License-Identifier: Apache-2.0 */
// Reads serialized lists: checks the header, walks the entries, builds lists, and reads lists in place.
// Buffers are untrusted: nothing outside the length in the header is read, and that length is first checked
// against the given one. Used by deserialize.cpp and the state's deserialization.

#include <cstring>
#include <memory>

#include "dvsdata/buffer_check.h"
#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"
#include "dvsdata/list_record.h"
#include "dvsdata/name_field.h"

namespace dvs::data {
namespace {

std::string_view StoredName(const std::uint8_t *at) {
    const std::uint8_t *const field = at + kNameOffset;
    return {reinterpret_cast<const char *>(field), NameField(field).Len()};
}

bool IsAligned(std::size_t value) {
    return value % 4 == 0;
}

/// Reads the entry at `offset`, which must not be past the buffer's end. HYP_NOT_FOUND at the end marker.
inline HYP_ReturnStatus EntryAt(Bytes buf, std::uint32_t offset, CheckedEntry *entry) {
    Fault fault;
    const Step step = CheckEntry(buf, offset, entry, &fault);
    if (step == Step::Entry) [[likely]]
        return HYP_OK;
    return step == Step::End ? static_cast<HYP_ReturnStatus>(HYP_NOT_FOUND) : Refuse(fault);
}

void EmitReading(CheckedEntry entry) {
    const std::string_view name = StoredName(entry.at);
    Emit(kEntry, "deserializing %.*s: %u/%u data/serial bytes %d flag\n", static_cast<int>(name.size()),
         name.data(), entry.dataLen, entry.size, Load32(entry.at + kPropTypeOffset));
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

/// Append() of an entry in its serialized form: one copy, and zeros for what the format leaves open.
inline HYP_ReturnStatus AppendImage(DVSData *list, CheckedEntry image) {
    const NameField field(image.at + kNameOffset);
    const std::string_view name(reinterpret_cast<const char *>(image.at + kNameOffset), field.Len());
    if (image.dataLen > kMaxPlainLen || Emits(kDetail)) [[unlikely]]
        return Append(list, name, image.at + kEntryFixedSize, image.dataLen,
                      Load32(image.at + kPropTypeOffset));
    const std::uint32_t serialSize = EntrySize(image.dataLen);
    DVSDataEntry *const entry = NewPlace(list, serialSize);
    if (!entry) [[unlikely]]
        return HYP_NO_MEMORY;
    ClearPadding(entry, serialSize);
    std::memcpy(reinterpret_cast<std::uint8_t *>(entry) + kImageOffset, image.at,
                std::size_t{kEntryFixedSize} + image.dataLen);
    if (!field.IsPlain()) [[unlikely]]
        std::memset(entry->name + name.size(), 0, kNameSize - name.size());
    entry->serialSize = serialSize; // may differ from the image
    Link(list, entry, serialSize, name);
    return HYP_OK;
}

/// The room that the entries of a valid buffer need in the list's own block. Returns 0 for a faulty buffer,
/// whose entries get their own blocks until the fault is reached, and if messages print for every entry.
std::uint64_t RoomFor(Bytes buf, std::uint32_t typeMask) {
    if (Emits(kDetail)) return 0;
    std::uint64_t room = 0;
    CheckedEntry entry{};
    Fault fault;
    for (std::size_t offset = kHeaderSize;; offset += entry.size) {
        const Step step = CheckEntry(buf, offset, &entry, &fault);
        if (step != Step::Entry) return step == Step::End ? room : 0;
        if (Load32(entry.at + kPropTypeOffset) & typeMask) room += PlaceSize(EntrySize(entry.dataLen));
    }
}

HYP_ReturnStatus AppendAll(DVSData *list, Bytes buf, std::uint32_t typeMask) {
    CheckedEntry entry{};
    HYP_ReturnStatus status;
    for (std::uint32_t offset = kHeaderSize; (status = EntryAt(buf, offset, &entry)) == HYP_OK;
         offset += entry.size) {
        if (Emits(kEntry)) [[unlikely]]
            EmitReading(entry);
        if ((Load32(entry.at + kPropTypeOffset) & typeMask) == 0) continue;
        status = AppendImage(list, entry);
        if (status != HYP_OK) [[unlikely]]
            return status;
    }
    return status == HYP_NOT_FOUND ? static_cast<HYP_ReturnStatus>(HYP_OK) : status;
}

} // namespace

HYP_ReturnStatus Refuse(const Fault &fault) {
    switch (fault.kind) {
    case FaultKind::None:
        break;
    case FaultKind::TooShort:
        Emit(kError, "bad data: buffer size %d smaller than minimum header size\n", fault.found);
        break;
    case FaultKind::LengthTooSmall:
        Emit(kError, "bad data: data size %d in header smaller than minimum header size\n", fault.found);
        break;
    case FaultKind::LengthTooLarge:
        Emit(kError, "bad data: buffer size %d smaller than size %d in header\n", fault.expected,
             fault.found);
        break;
    case FaultKind::Version:
        Emit(kError, "Bad data: expected header version %d, actual %d\n", fault.expected, fault.found);
        break;
    case FaultKind::Checksum:
        Emit(kError, "bad chksum: expected 0x%x, actual 0x%x\n", fault.found, fault.expected);
        break;
    case FaultKind::EntryTooLarge:
        Emit(kError, "bad data: data length smaller than data block size %d\n", fault.found);
        break;
    case FaultKind::EntryLengths:
        Emit(kError, "bad data: data block not serialized correctly %u/%u\n", fault.found, fault.expected);
        break;
    case FaultKind::NoMarker:
        Emit(kError, "bad data: not end with 4 (zero) marker bytes\n");
        break;
    }
    return fault.Status();
}

HYP_ReturnStatus CutToLength(Bytes *buf) {
    if (Emits(kDetail)) [[unlikely]]
        Emit(kDetail, "Deserialize data, length = %d\n", static_cast<std::uint32_t>(buf->size()));
    if (const Fault fault = CheckLengths(*buf)) [[unlikely]]
        return Refuse(fault);
    *buf = buf->first(Load32(buf->data() + kTotalLengthOffset));
    return HYP_OK;
}

HYP_ReturnStatus BufferReader::Open(Bytes buf, KnownSum known, PartSums parts) {
    *this = {};
    buf_ = buf;
    if (const HYP_ReturnStatus status = CutToLength(&buf_); status != HYP_OK) return status;
    if (const Fault fault = CheckVersion(buf_)) return Refuse(fault);
    offset_ = kHeaderSize;
    const std::uint32_t computed = IsSumOf(buf_, known, buf.size())
                                       ? known.sum - Sum(buf_.first(kUnsummedSize))
                                   : parts == PartSums::Yes ? SumParts()
                                                            : Checksum(buf_);
    const Fault fault = CheckChecksum(buf_, computed);
    return fault ? Refuse(fault) : static_cast<HYP_ReturnStatus>(HYP_OK);
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
    CheckedEntry checked{};
    if (const HYP_ReturnStatus status = EntryAt(buf_, offset_, &checked); status != HYP_OK) return status;
    size_ = checked.size;
    *entry = {offset_,
              checked.size,
              StoredName(checked.at),
              Load32(checked.at + kPropTypeOffset),
              Bytes(checked.at + kEntryFixedSize, checked.dataLen),
              {}};
    if (index_ < numParts_) entry->sum = {true, parts_[index_]};
    ++index_;
    if (Emits(kEntry) && !quiet_) [[unlikely]]
        EmitReading(checked);
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
    if (const HYP_ReturnStatus status = CutToLength(&buf); status != HYP_OK) return status;
    if (const Fault fault = CheckVersion(buf)) return Refuse(fault);
    const std::uint32_t checksum =
        IsSumOf(buf, known, given) ? known.sum - Sum(buf.first(kUnsummedSize)) : Checksum(buf);
    if (const Fault fault = CheckChecksum(buf, checksum)) return Refuse(fault);
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
