/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_LIST_RECORD_H
#define DVSDATA_LIST_RECORD_H

// What a list's block holds behind the handle that callers see, and the steps that every addition to a list
// and every removal share. For list.cpp and for the reading of buffers, which makes entries of its own; leans
// on the name index.
//
// An entry has a block of its own, or a place in that of the handle:
//
//     | DVSData | NameIndex ... | entry | entry | entry |        | entry |   | entry |
//     ^ the handle               ^ room for those of a buffer    ^ added later
//
// The second form is for lists that the library itself makes of whole buffers, of ports by the thousand, from
// the process heap: there a block an entry costs more than all the rest of reading. Places of entries that
// were removed are not used again. Lists with a caller's allocator never have such room.

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <functional>
#include <string_view>

#include "dvsdata/format.h"
#include "dvsdata/name_index.h"

#if defined(__SANITIZE_ADDRESS__)
#define DVS_ADDRESS_SANITIZER 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define DVS_ADDRESS_SANITIZER 1
#endif
#endif
#ifdef DVS_ADDRESS_SANITIZER
#include <sanitizer/asan_interface.h>
#endif

namespace dvs::data {

/// A list with what the library keeps for itself behind it, in the same block.
struct ListRecord {
    DVSData face;
    NameIndex names;
    std::uint8_t *room, *roomEnd; // places not taken yet, in this block
    std::uint32_t separateNum;    // entries with a block of their own
};
static_assert(offsetof(ListRecord, face) == 0);
// Agents are compiled with the handle: its fields stay where they are.
static_assert(offsetof(DVSData, serialSize) == 0);
static_assert(offsetof(DVSData, head) == 8);
static_assert(offsetof(DVSData, tail) == 16);
static_assert(offsetof(DVSData, allocFn) == 24);
static_assert(offsetof(DVSData, freeFn) == 32);
static_assert(sizeof(ListRecord) % alignof(DVSDataEntry) == 0);

inline ListRecord &RecordOf(DVSData *list) {
    return *reinterpret_cast<ListRecord *>(list);
}

/// Where the list's room begins.
inline std::uint8_t *PlacesOf(DVSData *list) {
    return reinterpret_cast<std::uint8_t *>(&RecordOf(list) + 1);
}

/// DVSData_Alloc with so much room for entries behind the handle.
[[nodiscard]] HYP_ReturnStatus NewList(DVSData **list, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn,
                                       std::uint64_t room);

/// Sanitizers see places as the heap's blocks: with a gap between them, and gone when they are given up.
inline void Forbid([[maybe_unused]] const void *bytes, [[maybe_unused]] std::size_t size) {
#ifdef DVS_ADDRESS_SANITIZER
    __asan_poison_memory_region(bytes, size);
#endif
}
inline void Allow([[maybe_unused]] const void *bytes, [[maybe_unused]] std::size_t size) {
#ifdef DVS_ADDRESS_SANITIZER
    __asan_unpoison_memory_region(bytes, size);
#endif
}

/// What an entry takes of a list's room.
constexpr std::uint64_t PlaceSize(std::uint32_t serialSize) {
#ifdef DVS_ADDRESS_SANITIZER
    constexpr std::uint64_t kGap = 16;
#else
    constexpr std::uint64_t kGap = 0;
#endif
    return (kImageOffset + std::uint64_t{serialSize} + kGap + 7) & ~std::uint64_t{7};
}

/// Memory for an entry; null when there is none.
inline DVSDataEntry *NewEntry(DVSData *list, std::uint32_t serialSize) {
    void *const block = list->allocFn(kImageOffset + std::uint64_t{serialSize});
    RecordOf(list).separateNum += block != nullptr;
    return static_cast<DVSDataEntry *>(block);
}

/// The same from the list's room, as far as that goes.
inline DVSDataEntry *NewPlace(DVSData *list, std::uint32_t serialSize) {
    ListRecord &record = RecordOf(list);
    const std::uint64_t size = PlaceSize(serialSize);
    if (size > static_cast<std::uint64_t>(record.roomEnd - record.room)) return NewEntry(list, serialSize);
    std::uint8_t *const place = record.room;
    record.room += size;
    Allow(place, kImageOffset + serialSize);
    return reinterpret_cast<DVSDataEntry *>(place);
}

/// Releases an entry that is in no list any more.
inline void FreeEntry(DVSData *list, DVSDataEntry *entry) {
    ListRecord &record = RecordOf(list);
    const std::less<const void *> before;
    if (!before(entry, PlacesOf(list)) && before(entry, record.roomEnd)) {
        Forbid(entry, kImageOffset + entry->serialSize);
        return;
    }
    --record.separateNum;
    list->freeFn(entry);
}

/// The padding lies in the last 5 bytes of the block; this runs into the value, or the fields before an empty
/// one, which are written next.
inline void ClearPadding(DVSDataEntry *entry, std::uint32_t serialSize) {
    std::memset(reinterpret_cast<std::uint8_t *>(entry) + kImageOffset + serialSize - 8, 0, 8);
}

/// Puts a finished entry behind the tail. `name` is its name, uncut.
inline void Link(DVSData *list, DVSDataEntry *entry, std::uint32_t serialSize, std::string_view name) {
    entry->next = nullptr;
    (list->tail ? list->tail->next : list->head) = entry;
    list->tail = entry;
    list->serialSize += serialSize;
    RecordOf(list).names.Added(list, entry, name);
}

} // namespace dvs::data

#endif
