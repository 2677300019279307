/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_NAME_INDEX_H
#define DVSDATA_NAME_INDEX_H

// Finds an entry by name without walking the list. Kept by whatever changes a list and never by a lookup, so
// that readers without a lock stay readers; lists hold one in their record (list_record.h).
//
// A short list has it in its handle: one byte drawn from each name, compared all at once, and the address of
// every fourth entry. Nothing is allocated for that. A longer list has a hash table from the list's own
// allocator. Each chain is in list order, so the first match is the list's first match, and adding goes to
// the chain's end without comparing anything, however many namesakes there are. Without memory for the table
// the list is walked.

#include <array>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "dvs/data.h"
#include "dvsdata/format.h"

namespace dvs::data {

class NameIndex {
public:
    /// Up to here the handle's own bytes do.
    static constexpr std::uint32_t kShortMax = 32;
    /// A list that shrinks to this has no use for its table any more.
    static constexpr std::uint32_t kShrinkTo = 16;

    /// The first entry of that name, or null.
    [[nodiscard]] DVSDataEntry *Find(const DVSData *list, std::string_view name) const;

    /// After `entry` was linked at the tail.
    void Added(DVSData *list, DVSDataEntry *entry, std::string_view name) {
        name = name.substr(0, kMaxNameLen);
        if (mode_ == Mode::Short && count_ < kShortMax) [[likely]]
            AddShort(entry, name);
        else
            AddedLong(list, entry, name);
    }
    /// Before `entry` is unlinked.
    void Removing(DVSData *list, DVSDataEntry *entry);
    /// Gives the table back. The index is of no use afterwards unless the list is empty.
    void Drop(DVSData *list);

private:
    static constexpr std::uint32_t kStride = 4;

    struct Table;
    enum class Mode : std::uint8_t { Short, Hashed, Walk };

    [[nodiscard]] DVSDataEntry *At(std::uint32_t position) const;
    [[nodiscard]] std::uint32_t Candidates(std::uint8_t print) const;
    /// One byte of a name, drawn from its end, where names differ.
    static std::uint8_t Print(std::string_view name) {
        std::uint32_t word = 0;
        if (name.size() >= sizeof word) [[likely]]
            word = Load32(name.data() + name.size() - sizeof word);
        else
            std::memcpy(&word, name.data(), name.size());
        return static_cast<std::uint8_t>(((word + static_cast<std::uint32_t>(name.size())) * 0x9e3779b1u) >>
                                         24);
    }
    void AddShort(DVSDataEntry *entry, std::string_view name) {
        prints_[count_] = Print(name);
        if (count_ % kStride == 0) anchors_[count_ / kStride] = entry;
        ++count_;
    }
    void AddedLong(DVSData *list, DVSDataEntry *entry, std::string_view name);
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
