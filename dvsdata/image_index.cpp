/* SPDX-License-Identifier: Apache-2.0 */
// The index of long buffers (image_index.h): linear probing, at most half full. Entries are added in their
// order and slots are never given back, so the first of several entries with one name is found first.

#include "dvsdata/image_index.h"

#include <algorithm>
#include <bit>

#include "base/hash.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {
namespace {

std::string_view NameOf(const std::uint8_t *entry) {
    const auto *const name = reinterpret_cast<const char *>(entry + kNameOffset);
    return {name, ::strnlen(name, kMaxNameLen)};
}

std::uint32_t HashOf(std::string_view name) {
    return static_cast<std::uint32_t>(base::HashText(name));
}

} // namespace

bool ImageIndex::CatchUp(const std::uint8_t *block, std::size_t entries, std::size_t end) {
    if (indexedTo_ == 0) indexedTo_ = entries;
    while (indexedTo_ < end) {
        if (used_ * 2 >= size_ && !Reserve(std::max<std::size_t>(used_, 64))) {
            Clear();
            return false;
        }
        const std::uint8_t *const entry = block + indexedTo_;
        Add(HashOf(NameOf(entry)), indexedTo_);
        indexedTo_ += Load32(entry + kEntrySizeOffset);
    }
    return true;
}

bool ImageIndex::Reserve(std::size_t count) {
    const std::size_t size = std::bit_ceil(count * 4);
    const auto old = std::move(slots_);
    const std::size_t oldSize = size_;
    slots_.reset(static_cast<Slot *>(std::calloc(size, sizeof(Slot))));
    if (!slots_) return false;
    size_ = size;
    used_ = 0;
    if (oldSize == 0) return true;
    // From behind an empty slot on, a run of slots has the entries of each name in their order.
    std::size_t first = 0;
    while (old[first].offset != 0)
        ++first;
    for (std::size_t i = 1; i <= oldSize; ++i) {
        const Slot &slot = old[(first + i) & (oldSize - 1)];
        if (slot.offset != 0) Add(slot.hash, slot.offset);
    }
    return true;
}

void ImageIndex::Add(std::uint32_t hash, std::size_t offset) {
    std::size_t at = hash & (size_ - 1);
    while (slots_[at].offset != 0)
        at = (at + 1) & (size_ - 1);
    slots_[at] = {hash, static_cast<std::uint32_t>(offset)};
    ++used_;
}

std::size_t ImageIndex::Find(const std::uint8_t *block, std::string_view name) const {
    if (size_ == 0) return kNone;
    const std::uint32_t hash = HashOf(name);
    for (std::size_t at = hash & (size_ - 1); slots_[at].offset != 0; at = (at + 1) & (size_ - 1)) {
        if (slots_[at].hash != hash) continue;
        const std::uint8_t *const entry = block + slots_[at].offset;
        if (!IsRemoved(entry) && NameMatches(reinterpret_cast<const char *>(entry + kNameOffset), name))
            return slots_[at].offset;
    }
    return kNone;
}

} // namespace dvs::data
