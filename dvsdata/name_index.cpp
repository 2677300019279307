/* SPDX-License-Identifier: Apache-2.0 */
// The name index of property lists (name_index.h).

#include "dvsdata/name_index.h"

#include <algorithm>
#include <bit>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

#include "base/hash.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {
namespace {

constexpr std::uint32_t kNone = UINT32_MAX;

std::string_view NameOf(const DVSDataEntry *entry) {
    return {entry->name, ::strnlen(entry->name, kMaxNameLen)};
}

std::uint32_t Hash(std::string_view name) {
    return static_cast<std::uint32_t>(base::HashText(name));
}

} // namespace

/// A hash table in one block: this record, `size` nodes, `size` buckets. A bucket is a chain of nodes in list
/// order that closes on itself: the bucket holds its last node, which links to its first.
struct alignas(8) NameIndex::Table {
    struct Node {
        DVSDataEntry *entry;
        std::uint32_t hash;
        std::uint32_t next; // in the chain or in the free list
    };
    static constexpr std::uint64_t kMaxSize = std::uint64_t{1} << 31;

    std::uint32_t size; // a power of two
    std::uint32_t used; // nodes ever allocated
    std::uint32_t free; // head of the free list
    bool inListOrder;   // nodes are in list order: none was ever freed

    static std::uint64_t BlockSize(std::uint64_t size) {
        return sizeof(Table) + size * (sizeof(Node) + sizeof(std::uint32_t));
    }
    [[nodiscard]] const Node *Nodes() const { return reinterpret_cast<const Node *>(this + 1); }
    [[nodiscard]] bool HasNewNode() const { return used < size; }
    [[nodiscard]] bool IsFull() const { return used == size && free == kNone; }

    /// A node for each entry. Nodes of the smaller table are copied, so that their names need not be read
    /// again.
    void Fill(DVSData *list, std::uint32_t newSize, const Table *smaller) {
        size = newSize;
        used = 0;
        free = kNone;
        inListOrder = true;
        std::memset(static_cast<void *>(Lasts()), 0xff, size * sizeof(std::uint32_t)); // kNone everywhere
        const DVSDataEntry *last = nullptr;
        if (smaller && smaller->inListOrder) {
            while (used < smaller->used)
                AddNew(smaller->Nodes()[used].entry, smaller->Nodes()[used].hash);
            if (used) last = Nodes()[used - 1].entry;
        }
        for (DVSDataEntry *entry = last ? last->next : list->head; entry; entry = entry->next)
            AddNew(entry, Hash(NameOf(entry)));
    }

    /// Requires a node that was never used.
    void AddNew(DVSDataEntry *entry, std::uint32_t hash) { Append(entry, hash, used++); }

    /// Requires a node in the free list.
    void AddAgain(DVSDataEntry *entry, std::uint32_t hash) {
        const std::uint32_t index = free;
        free = Nodes()[index].next;
        Append(entry, hash, index);
    }

    void Remove(const DVSDataEntry *entry, std::uint32_t hash) {
        std::uint32_t &last = LastOf(hash);
        if (last == kNone) return;
        std::uint32_t previous = last, index = Nodes()[last].next;
        while (Nodes()[index].entry != entry) {
            if (index == last) return;
            previous = index;
            index = Nodes()[index].next;
        }
        Nodes()[previous].next = Nodes()[index].next;
        if (index == last) last = previous == index ? kNone : previous;
        Nodes()[index].next = free;
        free = index;
        inListOrder = false;
    }

    DVSDataEntry *Find(std::string_view name) {
        const std::uint32_t hash = Hash(name), last = LastOf(hash);
        if (last == kNone) return nullptr;
        for (std::uint32_t index = Nodes()[last].next;; index = Nodes()[index].next) {
            const Node &node = Nodes()[index];
            if (node.hash == hash && NameMatches(node.entry->name, name)) return node.entry;
            if (index == last) return nullptr;
        }
    }

private:
    Node *Nodes() { return reinterpret_cast<Node *>(this + 1); }
    std::uint32_t *Lasts() { return reinterpret_cast<std::uint32_t *>(Nodes() + size); }
    std::uint32_t &LastOf(std::uint32_t hash) { return Lasts()[hash & (size - 1)]; }

    /// Fills the node and appends it to its chain. In an empty chain the node is its own predecessor. This is
    /// computed without a branch, because it is unpredictable.
    void Append(DVSDataEntry *entry, std::uint32_t hash, std::uint32_t index) {
        std::uint32_t &last = LastOf(hash);
        Nodes()[index] = {entry, hash, index};
        const std::uint32_t isEmpty = -std::uint32_t{last == kNone};
        Node &before = Nodes()[(last & ~isEmpty) | (index & isEmpty)];
        const std::uint32_t first = before.next;
        before.next = index;
        Nodes()[index].next = first;
        last = index;
    }
};

DVSDataEntry *NameIndex::Find(const DVSData *list, std::string_view name) const {
    if (name.size() > kMaxNameLen) return nullptr; // Stored names are shorter.
    if (mode_ == Mode::Hashed) return table_->Find(name);
    if (mode_ == Mode::Walk) {
        DVSDataEntry *entry = list->head;
        while (entry && !NameMatches(entry->name, name))
            entry = entry->next;
        return entry;
    }
    for (std::uint32_t left = Candidates(Print(name)); left; left &= left - 1) {
        DVSDataEntry *const entry = At(static_cast<std::uint32_t>(std::countr_zero(left)));
        if (NameMatches(entry->name, name)) return entry;
    }
    return nullptr;
}

DVSDataEntry *NameIndex::At(std::uint32_t position) const {
    DVSDataEntry *entry = anchors_[position / kStride];
    for (std::uint32_t steps = position % kStride; steps; --steps)
        entry = entry->next;
    return entry;
}

/// One bit for each entry whose name has this fingerprint byte.
std::uint32_t NameIndex::Candidates(std::uint8_t print) const {
    std::uint32_t bits = 0;
#if defined(__SSE2__)
    const __m128i wanted = _mm_set1_epi8(static_cast<char>(print));
    const auto *const prints = reinterpret_cast<const __m128i *>(prints_.data());
    const int low = _mm_movemask_epi8(_mm_cmpeq_epi8(_mm_loadu_si128(prints), wanted));
    const int high = _mm_movemask_epi8(_mm_cmpeq_epi8(_mm_loadu_si128(prints + 1), wanted));
    bits = static_cast<std::uint32_t>(low) | static_cast<std::uint32_t>(high) << 16;
#else
    for (std::uint32_t i = 0; i < kShortMax; ++i)
        bits |= std::uint32_t{prints_[i] == print} << i;
#endif
    return count_ == kShortMax ? bits : bits & ((1u << count_) - 1);
}

void NameIndex::RemoveShort(const DVSDataEntry *entry) {
    std::uint32_t left = Candidates(Print(NameOf(entry)));
    while (left && At(static_cast<std::uint32_t>(std::countr_zero(left))) != entry)
        left &= left - 1;
    if (!left) return;
    const auto position = static_cast<std::uint32_t>(std::countr_zero(left));
    --count_;
    std::memmove(&prints_[position], &prints_[position] + 1, count_ - position);
    // Each anchor from here on moves to the next entry.
    for (std::uint32_t i = (position + kStride - 1) / kStride; i <= count_ / kStride; ++i)
        anchors_[i] = anchors_[i]->next;
}

void NameIndex::AddedLong(DVSData *list, DVSDataEntry *entry, std::string_view name) {
    if (mode_ != Mode::Hashed || !table_->HasNewNode()) [[unlikely]]
        return AddedFull(list, entry, name);
    ++count_;
    table_->AddNew(entry, Hash(name));
}

void NameIndex::AddedFull(DVSData *list, DVSDataEntry *entry, std::string_view name) {
    ++count_;
    if (mode_ == Mode::Hashed && !table_->IsFull())
        table_->AddAgain(entry, Hash(name));
    else if (mode_ != Mode::Walk || std::has_single_bit(count_)) // Retry after a failed allocation.
        BuildTable(list);
}

void NameIndex::Removing(DVSData *list, DVSDataEntry *entry) {
    if (mode_ == Mode::Short) {
        RemoveShort(entry);
        return;
    }
    --count_;
    if (mode_ == Mode::Hashed) table_->Remove(entry, Hash(NameOf(entry)));
    if (count_ <= kShrinkTo) {
        BuildShort(list);
        RemoveShort(entry); // It is still in the list.
    }
}

void NameIndex::BuildTable(DVSData *list) {
    // Small tables grow fourfold: rebuilding the sizes in between costs more than the unused memory.
    constexpr std::uint64_t kQuickGrowth = 1024;
    std::uint64_t size = std::bit_ceil(std::uint64_t{count_} + 1);
    if (table_ && size < kQuickGrowth) size *= 2;
    auto *const table =
        size > Table::kMaxSize ? nullptr : static_cast<Table *>(list->allocFn(Table::BlockSize(size)));
    if (table) table->Fill(list, static_cast<std::uint32_t>(size), table_);
    Drop(list);
    table_ = table;
    mode_ = table ? Mode::Hashed : Mode::Walk;
}

void NameIndex::BuildShort(DVSData *list) {
    Drop(list);
    mode_ = Mode::Short;
    count_ = 0;
    for (DVSDataEntry *entry = list->head; entry; entry = entry->next)
        AddShort(entry, NameOf(entry));
}

void NameIndex::Drop(DVSData *list) {
    if (table_) list->freeFn(table_);
    table_ = nullptr;
}

} // namespace dvs::data
