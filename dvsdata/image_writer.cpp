/* SPDX-License-Identifier: Apache-2.0 */
// Writes nested buffers into one block, and filters entries of a serialization. Used by serialize.cpp and the
// state's serialization.

#include <cassert>
#include <cstring>

#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {
namespace {

/// Marks data that no named filter excludes.
constexpr const char *kPersistName = "com.orbeno.common.port.volatile.persist";

/// The entries' part of the list's serialized form, end marker included, according to the list's own size.
std::uint32_t EntriesSize(const DVSData *list) {
    return list->serialSize - kHeaderSize;
}

HYP_ReturnStatus LengthChanged(std::uint32_t bufSize, std::uint32_t remaining, const char *name,
                               std::uint32_t size) {
    Emit(kError,
         "DVSData length changed during serialization, buflen = %u, lenRemaining = %u, name %s, size %u\n",
         bufSize, remaining, name, size);
    return HYP_LIMIT_EXCEEDED;
}

} // namespace

bool Filter::Keeps(const DVSDataEntry *entry) const {
    switch (kind_) {
    case Kind::None:
        return true;
    case Kind::Name:
        Emit(kTrace, "Entry %s, length %u exName %s\n", entry->name, entry->dataLen, needle_);
        return !std::strstr(entry->name, needle_) || std::strstr(entry->name, kPersistName);
    case Kind::Type:
        Emit(kTrace, "Property type entry %s, length %u flag %x/%x\n", entry->name, entry->dataLen,
             entry->propType, mask_);
        return (entry->propType & mask_) == 0;
    }
    return true;
}

std::uint32_t SerializedSize(const DVSData *list, const Filter &filter) {
    if (filter.IsNone()) return list->serialSize;
    std::uint32_t size = kMinBufferSize;
    std::uint32_t remaining = EntriesSize(list);
    for (const DVSDataEntry *entry = list->head; entry && entry->serialSize < remaining;
         entry = entry->next) {
        if (filter.Keeps(entry)) size += entry->serialSize;
        remaining -= entry->serialSize;
    }
    return size;
}

std::uint8_t *ImageWriter::Claim(std::size_t size) {
    if (failed_ || size > size_ - at_) {
        failed_ = true;
        return nullptr;
    }
    std::uint8_t *const at = begin_ + at_;
    at_ += size;
    return at;
}

void ImageWriter::Put(const void *bytes, std::size_t size) {
    if (std::uint8_t *const to = Claim(size); to && size) std::memcpy(to, bytes, size);
}

void ImageWriter::Zero(std::size_t size) {
    if (std::uint8_t *const to = Claim(size); to && size) std::memset(to, 0, size);
}

void ImageWriter::BeginBuffer() {
    assert(depth_ < kMaxDepth);
    levels_[depth_++] = {OpenBufferAt(at_), 0};
    Zero(kHeaderSize);
}

void ImageWriter::EndBuffer() {
    assert(depth_ > 0);
    const Level level = levels_[--depth_];
    Zero(kMarkerSize);
    if (!failed_) FinishBuffer(begin_, at_, level.buffer, depth_ ? &levels_[depth_ - 1].buffer : nullptr);
}

void ImageWriter::BeginEntry(std::string_view name, std::uint32_t propType, std::uint32_t dataLen) {
    assert(depth_ > 0);
    Level &level = levels_[depth_ - 1];
    level.entryEnd = at_ + EntrySize(dataLen);
    std::uint8_t *const fixed = Claim(kEntryFixedSize);
    if (!fixed) return;
    Store32(fixed + kEntrySizeOffset, EntrySize(dataLen));
    StoreName(fixed + kNameOffset, name);
    Store32(fixed + kPropTypeOffset, propType);
    Store32(fixed + kDataLenOffset, dataLen);
}

void ImageWriter::EndEntry() {
    assert(depth_ > 0 && (failed_ || at_ <= levels_[depth_ - 1].entryEnd));
    const std::size_t end = levels_[depth_ - 1].entryEnd;
    if (end < at_)
        failed_ = true; // The value is longer than BeginEntry stated.
    else
        Zero(end - at_);
}

void ImageWriter::Entry(std::string_view name, std::uint32_t propType, Bytes value) {
    BeginEntry(name, propType, static_cast<std::uint32_t>(value.size()));
    Put(value.data(), value.size());
    EndEntry();
}

HYP_ReturnStatus ImageWriter::List(const DVSData *list, const Filter &filter, std::uint32_t bufSize,
                                   const Extra *extra) {
    BeginBuffer();
    std::uint32_t remaining = EntriesSize(list);
    for (const DVSDataEntry *entry = list->head; entry; entry = entry->next) {
        const std::uint32_t size = entry->serialSize;
        if (size >= remaining) [[unlikely]]
            return Refuse(LengthChanged(bufSize, remaining, entry->name, size));
        remaining -= size;
        if (!filter.IsNone() && !filter.Keeps(entry)) continue;
        if (Emits(kDetail)) [[unlikely]]
            EmitWriting(entry->name, entry->dataLen, size);
        Image(entry);
    }
    if (remaining != kMarkerSize) return Refuse(LengthChanged(bufSize, remaining, "NULL", 0));
    if (extra) {
        const auto dataLen = static_cast<std::uint32_t>(extra->value.size());
        EmitWriting(extra->name, dataLen, EntrySize(dataLen));
        Entry(extra->name, extra->propType, extra->value);
    }
    EndBuffer();
    return HYP_OK;
}

HYP_ReturnStatus ImageWriter::Refuse(HYP_ReturnStatus status) {
    --depth_;
    failed_ = true;
    return status;
}

} // namespace dvs::data
