/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_LOOKUP_H
#define CONFIGSTORE_MAPS_PROP_LOOKUP_H

// From a property key to its mapping row: one key by walking the table, many by an index of it. For the frame
// alone.

#include <array>
#include <cstdint>

#include "configstore/layouts/converter_type.h"
#include "dvs/configstore.h"

namespace dvs::config {

/// The first row of `table` with exactly this key; where a row of type `defaultType` comes before it, that
/// row. Null where the table ends (null key) before either.
const DVSProp2ConfigEntry *FindRow(const DVSProp2ConfigEntry *table, const char *key,
                                   ConverterType defaultType);

/// FindRow for many keys of one table, as the table is when the index is built: the tables are writable, so
/// an index is not kept for longer than nobody can have written to them.
class RowIndex {
public:
    /// Number of a row's way, for rows that lead through one sub-object to a name in it.
    static constexpr uint8_t kOtherWay = 0xff;

    struct Found {
        const DVSProp2ConfigEntry *row; // null where there is none
        uint8_t way;                    // rows through the same sub-object have the same, others kOtherWay
    };

    [[nodiscard]] bool IsBuilt() const { return table_ != nullptr; }
    void Build(const DVSProp2ConfigEntry *table, ConverterType defaultType);
    /// Remembers which row came behind which: one property after the other, ports mostly have the same ones.
    [[nodiscard]] Found Find(const char *key);

private:
    static constexpr uint32_t kMaxRows = 48;
    static constexpr uint32_t kSlotNum = 128;

    [[nodiscard]] uint8_t WayOf(uint32_t row) const;
    void Insert(uint32_t row);
    [[nodiscard]] uint32_t Search(const char *key) const;

    const DVSProp2ConfigEntry *table_ = nullptr;
    ConverterType defaultType_ = ConverterType::kEnd;
    uint32_t rowNum_ = 0;     // rows that can be found, the DEFAULT row included
    bool hasDefault_ = false; // the last of them is it
    bool usable_ = false;     // a table that is too large for the index is walked
    uint32_t last_ = 0;       // found last
    std::array<uint8_t, kMaxRows> ways_{};
    std::array<uint8_t, kMaxRows> behind_{}; // row + 1 that came behind a row; 0 is none yet
    std::array<uint8_t, kSlotNum> slots_{};  // row + 1, by the key's hash; 0 is empty
};

} // namespace dvs::config

#endif
