/* SPDX-License-Identifier: Apache-2.0 */
// Nested buffers of sizes that are not known beforehand (growing_image.h). A buffer's sizes are filled in when
// it ends, before the buffer around it sums them.
//
// An entry that an update replaces is only marked as removed; the buffer is compacted once, when it ends.

#include "dvsdata/growing_image.h"

#include <algorithm>
#include <cassert>
#include <cstdlib>
#include <cstring>

#include "base/huge_page.h"
#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {
namespace {

/// Buffers of up to so many entries are searched from their start.
constexpr std::uint32_t kMostWalked = 64;

/// Most values are a few bytes; a call to copy those takes longer than the copy.
inline void CopyValue(std::uint8_t *to, Bytes value) {
    const std::uint8_t *const from = value.data();
    const std::size_t size = value.size();
    if (size > 16) {
        std::memcpy(to, from, size);
    } else if (size >= 8) {
        std::memcpy(to, from, 8);
        std::memcpy(to + size - 8, from + size - 8, 8);
    } else if (size >= 4) {
        std::memcpy(to, from, 4);
        std::memcpy(to + size - 4, from + size - 4, 4);
    } else {
        for (std::size_t i = 0; i < size; ++i)
            to[i] = from[i];
    }
}

const char *NameFieldOf(const std::uint8_t *entry) {
    return reinterpret_cast<const char *>(entry + kNameOffset);
}

} // namespace

GrowingImage::~GrowingImage() {
    std::free(begin_);
}

// Doubles the room, or without memory for that makes just enough of it.
bool GrowingImage::Grow(std::size_t size) {
    constexpr std::size_t kFirst = std::size_t{1} << 16;
    if (size > kMaxSize - at_) return false;
    const std::size_t doubled = std::min(std::max(kFirst, (capacity_ + size) * 2), kMaxSize);
    return Resize(doubled) || Resize(at_ + size);
}

bool GrowingImage::Resize(std::size_t capacity) {
    const bool isLarge = capacity >= 2 * base::kHugePage;
    void *const block = isLarge ? std::malloc(capacity) : std::realloc(begin_, capacity);
    if (!block) return false;
    if (isLarge) { // not by realloc, which copies before huge pages can be asked for
        base::AdviseHugePages(block, capacity);
        if (at_ > 0) std::memcpy(block, begin_, at_);
        std::free(begin_);
    }
    begin_ = static_cast<std::uint8_t *>(block);
    capacity_ = capacity;
    return true;
}

void GrowingImage::Expect(std::size_t size) {
    if (size > capacity_ - at_ && size < kMaxSize / 4) (void)Grow(size / 2);
}

// ---- Buffers ----

HYP_ReturnStatus GrowingImage::BeginBuffer() {
    assert(depth_ == 0);
    EmitAllocating();
    return Open();
}

HYP_ReturnStatus GrowingImage::BeginNested(std::string_view name, std::uint32_t propType) {
    assert(depth_ > 0);
    EmitAllocating();
    Level &outer = *level_;
    const std::size_t entry = at_;
    std::uint8_t *const fixed = Claim(kEntryFixedSize);
    if (!fixed) return HYP_NO_MEMORY;
    StoreName(fixed + kNameOffset, name);
    Store32(fixed + kPropTypeOffset, propType);
    outer.entry = entry;
    outer.name = name;
    outer.propType = propType;
    const HYP_ReturnStatus status = Open();
    if (status != HYP_OK) at_ = entry;
    return status;
}

HYP_ReturnStatus GrowingImage::Open() {
    assert(depth_ < kMaxDepth);
    const std::size_t start = at_;
    std::uint8_t *const header = Claim(kHeaderSize);
    if (!header) return HYP_NO_MEMORY;
    std::memset(header, 0, kHeaderSize);
    level_ = &levels_[depth_++];
    level_->buffer = OpenBufferAt(start);
    level_->count = level_->removed = 0;
    level_->marks = 0;
    level_->index.Clear();
    EmitAllocated(kMinBufferSize);
    return HYP_OK;
}

HYP_ReturnStatus GrowingImage::EndBuffer(std::uint32_t version) {
    assert(depth_ == 1);
    const HYP_ReturnStatus status = Close(version);
    if (status != HYP_OK) return status;
    FinishBuffer(begin_, at_, level_->buffer, nullptr);
    depth_ = 0;
    level_ = nullptr;
    return HYP_OK;
}

HYP_ReturnStatus GrowingImage::EndNested(std::uint32_t version, Adding adding) {
    assert(depth_ > 1);
    if (const HYP_ReturnStatus status = Close(version); status != HYP_OK) {
        DropNested();
        return status;
    }
    const OpenBuffer inner = level_->buffer;
    level_ = &levels_[--depth_ - 1];
    // The entry's sizes come first: the buffer around sums them too.
    const auto size = static_cast<std::uint32_t>(at_ - inner.start);
    std::uint8_t *const entry = begin_ + level_->entry;
    Store32(entry + kEntrySizeOffset, EntrySize(size));
    Store32(entry + kDataLenOffset, size);
    FinishBuffer(begin_, at_, inner, &level_->buffer);
    return AddNested(adding);
}

// The end of a buffer's entries.
HYP_ReturnStatus GrowingImage::Close(std::uint32_t version) {
    if (level_->removed) Compact();
    EmitOldVersion(version);
    if (Emits(kDetail)) [[unlikely]]
        EmitEntries(*level_);
    std::uint8_t *const marker = Claim(kMarkerSize);
    if (!marker) return HYP_NO_MEMORY;
    Store32(marker, 0);
    return HYP_OK;
}

void GrowingImage::DropNested() {
    assert(depth_ > 1);
    level_ = &levels_[--depth_ - 1];
    at_ = level_->entry;
}

HYP_ReturnStatus GrowingImage::AddNested(Adding adding) {
    Level &level = *level_;
    const std::size_t at = level.entry;
    const auto size = static_cast<std::uint32_t>(at_ - at - kEntryFixedSize);
    const std::uint64_t mark = MarkOf(level.name);
    if (adding == Adding::kUpdate && level.marks & mark) {
        const std::size_t found = Find(level.name, at);
        if (found != ImageIndex::kNone && Load32(begin_ + found + kDataLenOffset) == size) {
            std::memcpy(begin_ + found + kEntryFixedSize, begin_ + at + kEntryFixedSize, size);
            Store32(begin_ + found + kPropTypeOffset, level.propType);
            at_ = at;
            level.buffer = OpenBufferAt(level.buffer.start); // what is summed has changed
            EmitUpdated(level.name, size, SizeOf(level, at));
            return HYP_OK;
        }
        if (found != ImageIndex::kNone) Remove(found, at);
    }
    EmitAdding(level.name, size, SizeOf(level, at));
    const std::size_t padding = at + EntrySize(size) - at_;
    std::uint8_t *const to = Claim(padding);
    if (!to) {
        at_ = at;
        level.buffer = OpenBufferAt(level.buffer.start);
        return HYP_NO_MEMORY;
    }
    std::memset(to, 0, padding);
    level.marks |= mark;
    ++level.count;
    EmitAdded(level.name, SizeOf(level, at_));
    return HYP_OK;
}

// As a serialization writes them one by one.
void GrowingImage::EmitEntries(const Level &level) const {
    EmitBufferSize(SizeOf(level, at_));
    std::size_t at = level.buffer.start + kHeaderSize;
    while (at < at_) {
        const std::uint8_t *const entry = begin_ + at;
        const std::uint32_t size = Load32(entry + kEntrySizeOffset);
        EmitWriting(NameFieldOf(entry), Load32(entry + kDataLenOffset), size);
        at += size;
    }
}

// ---- Entries ----

HYP_ReturnStatus GrowingImage::Append(std::string_view name, Bytes value, std::uint32_t propType) {
    return Put(name, MarkOf(name), value, propType);
}

HYP_ReturnStatus GrowingImage::Update(std::string_view name, Bytes value, std::uint32_t propType) {
    assert(depth_ > 0);
    const std::uint64_t mark = MarkOf(name);
    if (level_->marks & mark) {
        const std::size_t found = Find(name, at_);
        if (found != ImageIndex::kNone) return Replace(found, name, value, propType);
    }
    return Put(name, mark, value, propType ? propType : kDefaultPropType);
}

HYP_ReturnStatus GrowingImage::Put(std::string_view name, std::uint64_t mark, Bytes value,
                                   std::uint32_t propType) {
    assert(depth_ > 0);
    if (value.size() > UINT32_MAX) return HYP_BAD_PARAM;
    std::uint32_t size = 0;
    const auto dataLen = static_cast<std::uint32_t>(value.size());
    if (const HYP_ReturnStatus status = CheckedEntrySize(name, dataLen, &size); status != HYP_OK) return status;
    if (Emits(kDetail)) [[unlikely]]
        EmitAdding(name, dataLen, SizeOf(*level_, at_));
    std::uint8_t *const entry = Claim(size);
    if (!entry) return HYP_NO_MEMORY;
    std::memset(entry + size - 8, 0, 8); // the padding, and fields or value that are written next
    Store32(entry + kEntrySizeOffset, size);
    StoreName(entry + kNameOffset, name);
    Store32(entry + kPropTypeOffset, propType);
    Store32(entry + kDataLenOffset, dataLen);
    CopyValue(entry + kEntryFixedSize, value);
    level_->marks |= mark;
    ++level_->count;
    if (Emits(kDetail)) [[unlikely]]
        EmitAdded(name, SizeOf(*level_, at_));
    return HYP_OK;
}

HYP_ReturnStatus GrowingImage::Replace(std::size_t at, std::string_view name, Bytes value,
                                       std::uint32_t propType) {
    std::uint8_t *const entry = begin_ + at;
    const std::uint32_t type = propType ? propType : kDefaultPropType;
    if (Load32(entry + kDataLenOffset) == value.size()) {
        CopyValue(entry + kEntryFixedSize, value);
        Store32(entry + kPropTypeOffset, type);
        level_->buffer = OpenBufferAt(level_->buffer.start); // what is summed may have changed
        EmitUpdated(name, static_cast<std::uint32_t>(value.size()), SizeOf(*level_, at_));
        return HYP_OK;
    }
    // Type 0 resets the type above and keeps it here: lists do so too.
    const std::uint32_t kept = Load32(entry + kPropTypeOffset);
    Remove(at, at_);
    return Put(name, MarkOf(name), value, propType ? propType : kept);
}

// The first entry of that name among those that end at `end`.
std::size_t GrowingImage::Find(std::string_view name, std::size_t end) {
    if (name.size() > kMaxNameLen) return ImageIndex::kNone; // stored names are shorter
    Level &level = *level_;
    std::size_t at = level.buffer.start + kHeaderSize;
    if (level.count > kMostWalked && level.index.CatchUp(begin_, at, end))
        return level.index.Find(begin_, name);
    for (; at < end; at += Load32(begin_ + at + kEntrySizeOffset)) {
        if (NameMatches(NameFieldOf(begin_ + at), name) && !IsRemoved(begin_ + at)) return at;
    }
    return ImageIndex::kNone;
}

void GrowingImage::Remove(std::size_t at, std::size_t end) {
    std::uint8_t *const entry = begin_ + at;
    const std::uint32_t dataLen = Load32(entry + kDataLenOffset);
    Store32(entry + kDataLenOffset, kRemovedLen);
    level_->removed += Load32(entry + kEntrySizeOffset);
    EmitRemoved(NameFieldOf(entry), dataLen, Load32(entry + kPropTypeOffset), SizeOf(*level_, end));
}

// Closes the gaps of removed entries.
void GrowingImage::Compact() {
    Level &level = *level_;
    std::size_t to = level.buffer.start + kHeaderSize;
    for (std::size_t at = to, size = 0; at < at_; at += size) {
        size = Load32(begin_ + at + kEntrySizeOffset);
        if (IsRemoved(begin_ + at)) continue;
        std::memmove(begin_ + to, begin_ + at, size);
        to += size;
    }
    at_ = to;
    level.removed = 0;
    level.buffer = OpenBufferAt(level.buffer.start);
}

void GrowingImage::HandOver(void **buf, std::uint32_t *len) {
    assert(depth_ == 0);
    // A block that is not much too large is handed out whole: the heap keeps such blocks, and shrinking a
    // mapped one would make each load map its pages anew. Very large blocks are mapped in any case.
    constexpr std::size_t kMostWhole = std::size_t{16} << 20;
    const bool isWhole = capacity_ <= kMostWhole && at_ >= capacity_ / 4 * 3;
    void *const fitting = isWhole ? nullptr : std::realloc(begin_, at_);
    *buf = fitting ? fitting : begin_;
    *len = static_cast<std::uint32_t>(at_);
    begin_ = nullptr;
    at_ = capacity_ = 0;
}

} // namespace dvs::data
