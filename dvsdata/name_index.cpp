/* SPDX-License-Identifier: Apache-2.0 */
// The name index of property lists (name_index.h).

#include "dvsdata/name_index.h"

#include <algorithm>
#include <bit>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

#include "dvsdata/list_internal.h"

namespace dvs::data {
namespace {

constexpr std::uint32_t kNone = UINT32_MAX;

std::string_view NameOf(const DVSDataEntry *entry) {
    return {entry->name, ::strnlen(entry->name, kMaxNameLen)};
}

/// Eight bytes per step; the last step may overlap the previous one. A multiplication spreads them, so that
/// every bit of a name affects the bits that are used.
std::uint32_t Hash(std::string_view name) {
    constexpr std::uint64_t kSpread = 0x9e3779b97f4a7c15u;
    std::uint64_t hash = name.size() * kSpread;
    const auto mix = [&hash](const char *at, std::size_t size) {
        std::uint64_t word = 0;
        std::memcpy(&word, at, size);
        hash = (hash ^ word) * kSpread;
        hash ^= hash >> 29;
    };
    constexpr std::size_t kStep = sizeof hash;
    if (name.size() < kStep) {
        mix(name.data(), name.size());
    } else {
        for (std::size_t at = 0; at + kStep < name.size(); at += kStep)
            mix(name.data() + at, kStep);
        mix(name.data() + name.size() - kStep, kStep);
    }
    return static_cast<std::uint32_t>(hash >> 32);
}

} // namespace

/// Chains of nodes, all in one block: the table, `size` buckets, `size` nodes.
struct alignas(8) NameIndex::Table {
    struct Bucket {
        std::uint32_t first, last;
    };
    struct Node {
        DVSDataEntry *entry;
        std::uint32_t hash;
        std::uint32_t next; // in the chain or in the free list
    };

    std::uint32_t size; // a power of two
    std::uint32_t used; // nodes ever allocated
    std::uint32_t free; // head of the free list
    bool inListOrder;   // nodes are in list order: none was ever freed

    static std::uint64_t BlockSize(std::uint32_t size) {
        return sizeof(Table) + std::uint64_t{size} * (sizeof(Bucket) + sizeof(Node));
    }
    Bucket &BucketOf(std::uint32_t hash) { return Buckets()[hash & (size - 1)]; }
    Node *Nodes() { return reinterpret_cast<Node *>(Buckets() + size); }
    [[nodiscard]] const Node *Nodes() const { return const_cast<Table *>(this)->Nodes(); }
    [[nodiscard]] bool IsFull() const { return used == size && free == kNone; }

    void Clear(std::uint32_t newSize) {
        size = newSize;
        used = 0;
        free = kNone;
        inListOrder = true;
        std::memset(static_cast<void *>(Buckets()), 0xff, size * sizeof(Bucket)); // kNone everywhere
    }

    /// Adds a node for each entry. Reuses the hashes of the smaller table without reading the names again.
    void Fill(DVSData *list, std::uint32_t newSize, const Table *smaller) {
        Clear(newSize);
        const DVSDataEntry *last = nullptr;
        if (smaller && smaller->inListOrder) {
            for (std::uint32_t i = 0; i < smaller->used; ++i)
                Add(smaller->Nodes()[i].entry, smaller->Nodes()[i].hash);
            if (smaller->used) last = smaller->Nodes()[smaller->used - 1].entry;
        }
        for (DVSDataEntry *entry = last ? last->next : list->head; entry; entry = entry->next)
            Add(entry, Hash(NameOf(entry)));
    }

    void Add(DVSDataEntry *entry, std::uint32_t hash) {
        std::uint32_t index = free;
        if (index != kNone)
            free = Nodes()[index].next;
        else
            index = used++;
        Nodes()[index] = {entry, hash, kNone};
        Bucket &bucket = BucketOf(hash);
        if (bucket.first == kNone)
            bucket.first = index;
        else
            Nodes()[bucket.last].next = index;
        bucket.last = index;
    }

    void Remove(const DVSDataEntry *entry, std::uint32_t hash) {
        Bucket &bucket = BucketOf(hash);
        std::uint32_t previous = kNone, index = bucket.first;
        while (index != kNone && Nodes()[index].entry != entry) {
            previous = index;
            index = Nodes()[index].next;
        }
        if (index == kNone) return;
        Node &node = Nodes()[index];
        (previous == kNone ? bucket.first : Nodes()[previous].next) = node.next;
        if (bucket.last == index) bucket.last = previous;
        node.next = free;
        free = index;
        inListOrder = false;
    }

    DVSDataEntry *Find(std::string_view name) {
        const std::uint32_t hash = Hash(name);
        for (std::uint32_t index = BucketOf(hash).first; index != kNone;) {
            const Node &node = Nodes()[index];
            if (node.hash == hash && NameMatches(node.entry->name, name)) return node.entry;
            index = node.next;
        }
        return nullptr;
    }

private:
    Bucket *Buckets() { return reinterpret_cast<Bucket *>(this + 1); }
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
    ++count_;
    if (mode_ == Mode::Hashed && !table_->IsFull())
        table_->Add(entry, Hash(name));
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
    const std::uint64_t size = std::bit_ceil(std::uint64_t{count_} + 1);
    auto *const table =
        size > UINT32_MAX
            ? nullptr
            : static_cast<Table *>(list->allocFn(Table::BlockSize(static_cast<std::uint32_t>(size))));
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
