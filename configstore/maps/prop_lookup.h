/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_LOOKUP_H
#define CONFIGSTORE_MAPS_PROP_LOOKUP_H

// From a property key to its mapping row: one key by walking the table, many by an index of it.

#include <array>
#include <cstdint>

#include "configstore/layouts/converter_type.h"
#include "dvs/configstore.h"

namespace dvs::config {

/// The first row of `table` with exactly this key; where a row of type `defaultType` comes before it, that
/// row. Null where the table ends (null key) before either.
const DVSProp2ConfigEntry *FindRow(const DVSProp2ConfigEntry *table, const char *key,
                                   ConverterType defaultType);

/// FindRow for many keys of one table, as the table is when the index is built. The tables are writable, so an
/// index lives no longer than one save.
class RowIndex {
public:
    /// The route of a row that does not lead through one sub-object to a name in it.
    static constexpr uint8_t kOtherRoute = 0xff;

    struct Found {
        const DVSProp2ConfigEntry *row; // null where there is none
        uint8_t route;                    // the same for rows through the same sub-object, or kOtherRoute
    };

    RowIndex(const DVSProp2ConfigEntry *table, ConverterType defaultType);
    /// Remembers which row followed which: the properties of most ports come in the same order.
    [[nodiscard]] Found Find(const char *key);

private:
    static constexpr uint32_t kMaxRows = 48;
    static constexpr uint32_t kSlotNum = 128;

    [[nodiscard]] uint8_t RouteOf(uint32_t row) const;
    void Insert(uint32_t row);
    [[nodiscard]] uint32_t Search(const char *key) const;

    const DVSProp2ConfigEntry *table_;
    ConverterType defaultType_;
    uint32_t rowNum_ = 0;     // rows that can be found, the DEFAULT row included
    bool hasDefault_ = false; // the last of them is it
    bool usable_ = false;     // a table that is too large for the index is walked
    uint32_t last_ = 0;       // found last
    std::array<uint8_t, kMaxRows> routes_{};
    std::array<uint8_t, kMaxRows> behind_{}; // row + 1 that came behind a row; 0 is none yet
    std::array<uint8_t, kSlotNum> slots_{};  // row + 1, by the key's hash; 0 is empty
};

} // namespace dvs::config

#endif
