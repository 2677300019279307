/* SPDX-License-Identifier: Apache-2.0 */
// Nested buffers of sizes that are not known beforehand (growing_image.h). Sizes are filled in when a buffer
// ends, before the one around it sums them.

#include "dvsdata/growing_image.h"

#include <algorithm>
#include <cassert>
#include <cstdlib>
#include <cstring>
#include <utility>

#include "base/huge_page.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {

GrowingImage::~GrowingImage() {
    std::free(begin_);
}

bool GrowingImage::Grow(std::size_t size) {
    constexpr std::size_t kFirst = std::size_t{1} << 16;
    const std::size_t capacity = std::max(kFirst, (capacity_ + size) * 2);
    const bool isLarge = capacity >= 2 * base::kHugePage;
    void *block = nullptr;
    if (capacity <= kMaxSize) block = isLarge ? std::malloc(capacity) : std::realloc(begin_, capacity);
    if (!block) {
        gaveUp_ = true;
        return false;
    }
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
    if (!gaveUp_ && size > capacity_ - at_ && size < kMaxSize / 4) (void)Grow(size / 2);
}

void GrowingImage::BeginBuffer() {
    assert(depth_ < kMaxDepth);
    level_ = &levels_[depth_++];
    *level_ = {OpenBufferAt(at_), 0, 0, 0};
    if (std::uint8_t *const header = Claim(kHeaderSize)) std::memset(header, 0, kHeaderSize);
}

void GrowingImage::EndBuffer() {
    assert(depth_ > 0);
    const Level level = levels_[--depth_];
    level_ = depth_ > 0 ? &levels_[depth_ - 1] : nullptr;
    std::uint8_t *const marker = Claim(kMarkerSize);
    if (!marker) return;
    Store32(marker, 0);

    if (depth_ == 0) {
        FinishBuffer(begin_, at_, level.buffer, nullptr);
        return;
    }
    // The entry's sizes come first: the buffer around sums them too.
    Level &outer = *level_;
    const auto size = static_cast<std::uint32_t>(at_ - level.buffer.start);
    std::uint8_t *const entry = begin_ + outer.entry;
    Store32(entry + kEntrySizeOffset, EntrySize(size));
    Store32(entry + kDataLenOffset, size);
    FinishBuffer(begin_, at_, level.buffer, &outer.buffer);
}

void GrowingImage::BeginEntry(std::string_view name, std::uint32_t propType) {
    assert(depth_ > 0);
    level_->entry = at_;
    std::uint8_t *const fixed = Claim(kEntryFixedSize);
    if (!fixed) return;
    StoreName(fixed + kNameOffset, name);
    Store32(fixed + kPropTypeOffset, propType);
}

void GrowingImage::EndEntry() {
    assert(depth_ > 0);
    if (gaveUp_) return;
    const std::size_t entry = level_->entry;
    const std::size_t padding = entry + Load32(begin_ + entry + kEntrySizeOffset) - at_;
    if (std::uint8_t *const to = Claim(padding)) std::memset(to, 0, padding);
}

namespace {

/// Most values are a few bytes, which a call would take longer to look at than to copy.
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

} // namespace

inline void GrowingImage::Put(std::string_view name, Bytes value, std::uint32_t propType) {
    if (value.size() > kMaxSize) gaveUp_ = true;
    const std::size_t size = EntrySize(static_cast<std::uint32_t>(value.size()));
    std::uint8_t *const entry = Claim(size);
    if (!entry) return;
    std::memset(entry + size - 8, 0, 8); // the padding, and fields or value that are written next
    Store32(entry + kEntrySizeOffset, static_cast<std::uint32_t>(size));
    StoreName(entry + kNameOffset, name);
    Store32(entry + kPropTypeOffset, propType);
    Store32(entry + kDataLenOffset, static_cast<std::uint32_t>(value.size()));
    CopyValue(entry + kEntryFixedSize, value);
}

void GrowingImage::Append(std::string_view name, Bytes value, std::uint32_t propType) {
    Put(name, value, propType);
}

std::size_t GrowingImage::Find(std::string_view name) const {
    std::size_t at = level_->buffer.start + kHeaderSize;
    const std::size_t last = name.empty() ? 0 : std::min<std::size_t>(name.size(), kNameSize) - 1;
    for (; at < at_; at += Load32(begin_ + at + kEntrySizeOffset)) {
        const auto *const field = reinterpret_cast<const char *>(begin_ + at + kNameOffset);
        if (!name.empty() && field[last] != name[last]) continue; // most names begin alike
        if (NameMatches(field, name)) break;
    }
    return at;
}

void GrowingImage::Update(std::string_view name, Bytes value, std::uint32_t propType) {
    assert(depth_ > 0);
    if (gaveUp_) return;
    const std::uint64_t mark = MarkOf(name);
    if (level_->names & mark) {
        const std::size_t found = Find(name);
        if (found != at_) return UpdateInPlace(found, name, value, propType);
    }
    level_->names |= mark;
    if (++level_->entries > kMaxUpdates) gaveUp_ = true;
    Put(name, value, propType ? propType : kDefaultPropType);
}

void GrowingImage::UpdateInPlace(std::size_t at, std::string_view name, Bytes value, std::uint32_t propType) {
    std::uint8_t *const entry = begin_ + at;
    std::uint32_t type = propType ? propType : kDefaultPropType;
    if (Load32(entry + kDataLenOffset) == value.size()) {
        CopyValue(entry + kEntryFixedSize, value);
        Store32(entry + kPropTypeOffset, type);
        return;
    }
    // Another length: the entry goes and comes back as the last one, with its old type where there is no new.
    if (!propType) type = Load32(entry + kPropTypeOffset);
    const std::size_t size = Load32(entry + kEntrySizeOffset);
    std::memmove(entry, entry + size, at_ - at - size);
    at_ -= size;
    Put(name, value, type);
}

void GrowingImage::HandOver(void **buf, std::uint32_t *len) {
    assert(depth_ == 0 && !gaveUp_);
    // A block that is not much too large is handed out as it is: mapped memory would be mapped anew by each
    // load for the sake of pages that nobody has touched, where the heap keeps a block that it gets back
    // whole. Very large ones are mapped in any case.
    constexpr std::size_t kMostWhole = std::size_t{16} << 20;
    const bool isWhole = capacity_ <= kMostWhole && at_ >= capacity_ / 4 * 3;
    void *const fitting = isWhole ? nullptr : std::realloc(begin_, at_);
    *buf = fitting ? fitting : begin_;
    *len = static_cast<std::uint32_t>(at_);
    begin_ = nullptr;
}

} // namespace dvs::data
