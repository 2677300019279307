/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_LOOKUP_H
#define CONFIGSTORE_MAPS_PROP_LOOKUP_H

// From a property key to its mapping row: one key by walking the table, many by an index of it. The tables
// are writable, so the index compares itself with its table before it is used. For the frame alone.

#include <array>
#include <cstdint>

#include "dvs/configstore.h"

namespace dvs::config {

/// The first row of `table` with exactly this key; where a row of type `defaultType` comes before it, that
/// row. Null where the table ends (null key) before either.
const DVSProp2ConfigEntry *FindRow(const DVSProp2ConfigEntry *table, const char *key, uint32_t defaultType);

/// FindRow for many keys of one table.
class RowIndex {
public:
    /// Makes sure that the index says what the table says now. Call before a run of Find.
    void Refresh(const DVSProp2ConfigEntry *table, uint32_t defaultType);
    [[nodiscard]] const DVSProp2ConfigEntry *Find(const char *key) const;

private:
    static constexpr uint32_t kMaxRows = 48;
    static constexpr uint32_t kMaxKeySize = 64; // with the terminator
    static constexpr uint32_t kSlotNum = 128;

    struct Known {
        char key[kMaxKeySize];
        uint32_t type;
    };

    [[nodiscard]] bool IsCurrent() const;
    void Build();
    void Insert(uint32_t row);

    const DVSProp2ConfigEntry *table_ = nullptr;
    uint32_t defaultType_ = 0;
    uint32_t rowNum_ = 0;     // rows that can be found, the DEFAULT row included
    bool hasDefault_ = false; // the last of them is it
    bool usable_ = false;     // a table that is too large for the index is walked
    std::array<Known, kMaxRows> known_{};
    std::array<uint8_t, kSlotNum> slots_{}; // row + 1, by the key's hash; 0 is empty
};

} // namespace dvs::config

#endif
