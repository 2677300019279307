/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_NAME_INDEX_H
#define DVSDATA_NAME_INDEX_H

// Finds an entry by name without walking the list. Only functions that change a list update the index, never
// a lookup, so concurrent reads without a lock are safe. Each list holds one in its record (list_record.h).
//
// A short list's index is part of its handle: one byte of each name, all compared at once, and the address of
// every fourth entry. It allocates nothing. A longer list has a hash table from the list's own allocator.
// Each chain is in list order, so its first match is the list's first match. Adding appends to a chain
// without any comparison, however many duplicates there are. If allocating the table fails, lookups walk the
// list.

#include <array>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "dvs/data.h"
#include "dvsdata/format.h"

namespace dvs::data {

class NameIndex {
public:
    /// The maximum length of a list that is indexed in the handle.
    static constexpr std::uint32_t kShortMax = 32;
    /// A list that shrinks to this length drops its table.
    static constexpr std::uint32_t kShrinkTo = 16;

    /// Returns the first entry with this name, or null.
    [[nodiscard]] DVSDataEntry *Find(const DVSData *list, std::string_view name) const;

    /// Call after `entry` was linked at the tail.
    void Added(DVSData *list, DVSDataEntry *entry, std::string_view name) {
        name = name.substr(0, kMaxNameLen);
        if (mode_ == Mode::Short && count_ < kShortMax) [[likely]]
            AddShort(entry, name);
        else
            AddedLong(list, entry, name);
    }
    /// Call before `entry` is unlinked.
    void Removing(DVSData *list, DVSDataEntry *entry);
    /// Frees the table. The index is unusable afterwards unless the list is empty.
    void Drop(DVSData *list);

private:
    static constexpr std::uint32_t kStride = 4;

    struct Table;
    enum class Mode : std::uint8_t { Short, Hashed, Walk };

    [[nodiscard]] DVSDataEntry *At(std::uint32_t position) const;
    [[nodiscard]] std::uint32_t Candidates(std::uint8_t print) const;
    /// One byte derived from the end of a name, where names differ most.
    static std::uint8_t Print(std::string_view name) {
        std::uint32_t word = 0;
        if (name.size() >= sizeof word) [[likely]] {
            word = Load32(name.data() + name.size() - sizeof word);
        } else {
            for (const char c : name)
                word = word << 8 | static_cast<std::uint8_t>(c);
        }
        return static_cast<std::uint8_t>(((word + static_cast<std::uint32_t>(name.size())) * 0x9e3779b1u) >>
                                         24);
    }
    void AddShort(DVSDataEntry *entry, std::string_view name) {
        prints_[count_] = Print(name);
        if (count_ % kStride == 0) anchors_[count_ / kStride] = entry;
        ++count_;
    }
    void AddedLong(DVSData *list, DVSDataEntry *entry, std::string_view name);
    void AddedFull(DVSData *list, DVSDataEntry *entry, std::string_view name);
    void RemoveShort(const DVSDataEntry *entry);
    void BuildTable(DVSData *list);
    void BuildShort(DVSData *list);

    Table *table_ = nullptr;
    std::uint32_t count_ = 0;
    Mode mode_ = Mode::Short;
    alignas(16) std::array<std::uint8_t, kShortMax> prints_{};
    std::array<DVSDataEntry *, kShortMax / kStride> anchors_{}; // entries 0, 4, 8 ...
};

} // namespace dvs::data

#endif
