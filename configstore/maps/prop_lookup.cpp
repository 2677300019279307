/* SPDX-License-Identifier: Apache-2.0 */
// The key lookups of the frame (prop_lookup.h).

#include "configstore/maps/prop_lookup.h"

#include <cstring>

namespace dvs::config {
namespace {

// Keys differ at their ends; nearly all begin alike.
uint32_t HashOf(const char *key, std::size_t length) {
    uint64_t tail = 0;
    const std::size_t size = length < sizeof tail ? length : sizeof tail;
    if (size > 0) std::memcpy(&tail, key + length - size, size);
    return static_cast<uint32_t>(((tail + length) * 0x9e3779b97f4a7c15U) >> 57);
}

} // namespace

const DVSProp2ConfigEntry *FindRow(const DVSProp2ConfigEntry *table, const char *key,
                                   ConverterType defaultType) {
    for (const auto *row = table; row->key; ++row) {
        if (ConverterTypeOf(*row) == defaultType || std::strcmp(row->key, key) == 0) return row;
    }
    return nullptr;
}

RowIndex::RowIndex(const DVSProp2ConfigEntry *table, ConverterType defaultType)
    : table_(table), defaultType_(defaultType) {
    for (const auto *row = table; row->key && !hasDefault_; ++row) {
        if (rowNum_ == kMaxRows) return;
        hasDefault_ = ConverterTypeOf(*row) == defaultType_;
        routes_[rowNum_] = RouteOf(rowNum_);
        if (!hasDefault_) Insert(rowNum_);
        ++rowNum_;
    }
    usable_ = true;
}

uint8_t RowIndex::RouteOf(uint32_t row) const {
    constexpr uint32_t kDepth = 2;
    if (table_[row].depth != kDepth) return kOtherRoute;
    for (uint32_t i = 0; i < row; ++i) {
        if (table_[i].depth == kDepth && std::strcmp(table_[i].path[0], table_[row].path[0]) == 0)
            return routes_[i];
    }
    return static_cast<uint8_t>(row);
}

// The first row of a key stays the one that is found.
void RowIndex::Insert(uint32_t row) {
    const char *key = table_[row].key;
    for (uint32_t slot = HashOf(key, std::strlen(key));; slot = (slot + 1) % kSlotNum) {
        if (slots_[slot] == 0) {
            slots_[slot] = static_cast<uint8_t>(row + 1);
            return;
        }
        if (std::strcmp(table_[slots_[slot] - 1U].key, key) == 0) return;
    }
}

// The row's number, or rowNum_.
uint32_t RowIndex::Search(const char *key) const {
    for (uint32_t slot = HashOf(key, std::strlen(key)); slots_[slot] != 0; slot = (slot + 1) % kSlotNum) {
        const uint32_t row = slots_[slot] - 1U;
        if (std::strcmp(table_[row].key, key) == 0) return row;
    }
    return hasDefault_ ? rowNum_ - 1 : rowNum_;
}

RowIndex::Found RowIndex::Find(const char *key) {
    if (!usable_) return {FindRow(table_, key, defaultType_), kOtherRoute};
    uint8_t &guess = behind_[last_];
    // A key that only the DEFAULT row takes may be anything: that row is never guessed.
    if (guess == 0 || std::strcmp(table_[guess - 1U].key, key) != 0) {
        const uint32_t row = Search(key);
        if (row == rowNum_) return {nullptr, kOtherRoute};
        last_ = row;
        if (hasDefault_ && row == rowNum_ - 1) return {&table_[row], routes_[row]};
        guess = static_cast<uint8_t>(row + 1);
        return {&table_[row], routes_[row]};
    }
    last_ = guess - 1U;
    return {&table_[last_], routes_[last_]};
}

} // namespace dvs::config
