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

const DVSProp2ConfigEntry *FindRow(const DVSProp2ConfigEntry *table, const char *key, uint32_t defaultType) {
    for (const auto *row = table; row->key; ++row) {
        if (row->converterType == defaultType || std::strcmp(row->key, key) == 0) return row;
    }
    return nullptr;
}

void RowIndex::Refresh(const DVSProp2ConfigEntry *table, uint32_t defaultType) {
    if (table == table_ && defaultType == defaultType_ && IsCurrent()) return;
    table_ = table;
    defaultType_ = defaultType;
    Build();
}

// By content: a key may have been rewritten where it stands.
bool RowIndex::IsCurrent() const {
    if (!usable_) return false;
    for (uint32_t i = 0; i < rowNum_; ++i) {
        const auto &row = table_[i];
        if (!row.key || row.converterType != known_[i].type || std::strcmp(row.key, known_[i].key) != 0)
            return false;
    }
    return hasDefault_ || !table_[rowNum_].key;
}

void RowIndex::Build() {
    slots_ = {};
    rowNum_ = 0;
    hasDefault_ = false;
    usable_ = false;
    for (const auto *row = table_; row->key && !hasDefault_; ++row) {
        const std::size_t length = strnlen(row->key, kMaxKeySize);
        if (rowNum_ == kMaxRows || length == kMaxKeySize) return;
        std::memcpy(known_[rowNum_].key, row->key, length + 1);
        known_[rowNum_].type = row->converterType;
        hasDefault_ = row->converterType == defaultType_;
        if (!hasDefault_) Insert(rowNum_);
        ++rowNum_;
    }
    usable_ = true;
}

// The first row of a key stays the one that is found.
void RowIndex::Insert(uint32_t row) {
    const char *key = known_[row].key;
    for (uint32_t slot = HashOf(key, std::strlen(key));; slot = (slot + 1) % kSlotNum) {
        if (slots_[slot] == 0) {
            slots_[slot] = static_cast<uint8_t>(row + 1);
            return;
        }
        if (std::strcmp(known_[slots_[slot] - 1U].key, key) == 0) return;
    }
}

const DVSProp2ConfigEntry *RowIndex::Find(const char *key) const {
    if (!usable_) return FindRow(table_, key, defaultType_);
    for (uint32_t slot = HashOf(key, std::strlen(key)); slots_[slot] != 0; slot = (slot + 1) % kSlotNum) {
        const uint32_t row = slots_[slot] - 1U;
        if (std::strcmp(known_[row].key, key) == 0) return &table_[row];
    }
    return hasDefault_ ? &table_[rowNum_ - 1] : nullptr;
}

} // namespace dvs::config
