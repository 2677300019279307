/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_LIST_RECORD_H
#define DVSDATA_LIST_RECORD_H

// The private data after the list handle in its block, and the steps shared by all additions and removals.
// Used by list.cpp and by the reader of buffers, which creates entries itself.
//
// An entry has its own block or a place in the handle's block:
//
//     | DVSData | NameIndex ... | entry | entry | entry |        | entry |   | entry |
//     ^ the handle               ^ room for a buffer's entries   ^ added later
//
// The library uses the second form for lists that it builds from whole buffers, such as thousands of ports,
// on the process heap: one block per entry would cost more than the rest of reading. Places of removed
// entries are not reused. Lists with a caller's allocator never have such room.

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

/// A list followed by the library's private data, in one block.
struct ListRecord {
    DVSData face;
    NameIndex names;
    std::uint8_t *room, *roomEnd; // unused places in this block
    std::uint32_t separateNum;    // entries with their own block
};
static_assert(offsetof(ListRecord, face) == 0);
// Agents are compiled with the handle: its fields must not move.
static_assert(offsetof(DVSData, serialSize) == 0);
static_assert(offsetof(DVSData, head) == 8);
static_assert(offsetof(DVSData, tail) == 16);
static_assert(offsetof(DVSData, allocFn) == 24);
static_assert(offsetof(DVSData, freeFn) == 32);
static_assert(sizeof(ListRecord) % alignof(DVSDataEntry) == 0);

inline ListRecord &RecordOf(DVSData *list) {
    return *reinterpret_cast<ListRecord *>(list);
}

/// Start of the list's room.
inline std::uint8_t *PlacesOf(DVSData *list) {
    return reinterpret_cast<std::uint8_t *>(&RecordOf(list) + 1);
}

/// DVSData_Alloc with `room` bytes for entries after the handle.
[[nodiscard]] HYP_ReturnStatus NewList(DVSData **list, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn,
                                       std::uint64_t room);

/// Makes sanitizers treat places like heap blocks: with a gap between them, and inaccessible once freed.
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

/// Bytes that an entry takes from a list's room.
constexpr std::uint64_t PlaceSize(std::uint32_t serialSize) {
#ifdef DVS_ADDRESS_SANITIZER
    constexpr std::uint64_t kGap = 16;
#else
    constexpr std::uint64_t kGap = 0;
#endif
    return (kImageOffset + std::uint64_t{serialSize} + kGap + 7) & ~std::uint64_t{7};
}

/// Allocates an entry; null if out of memory.
inline DVSDataEntry *NewEntry(DVSData *list, std::uint32_t serialSize) {
    void *const block = list->allocFn(kImageOffset + std::uint64_t{serialSize});
    RecordOf(list).separateNum += block != nullptr;
    return static_cast<DVSDataEntry *>(block);
}

/// Allocates an entry from the list's room; falls back to NewEntry if the room is used up.
inline DVSDataEntry *NewPlace(DVSData *list, std::uint32_t serialSize) {
    ListRecord &record = RecordOf(list);
    const std::uint64_t size = PlaceSize(serialSize);
    if (size > static_cast<std::uint64_t>(record.roomEnd - record.room)) return NewEntry(list, serialSize);
    std::uint8_t *const place = record.room;
    record.room += size;
    Allow(place, kImageOffset + serialSize);
    return reinterpret_cast<DVSDataEntry *>(place);
}

/// Frees an entry that is in no list.
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

/// Clears the padding, which is in the last 5 bytes of the block. This also clears part of the value, or of
/// the fields before an empty one; both are written next.
inline void ClearPadding(DVSDataEntry *entry, std::uint32_t serialSize) {
    std::memset(reinterpret_cast<std::uint8_t *>(entry) + kImageOffset + serialSize - 8, 0, 8);
}

/// Appends a finished entry. `name` is its full name, not truncated.
inline void Link(DVSData *list, DVSDataEntry *entry, std::uint32_t serialSize, std::string_view name) {
    entry->next = nullptr;
    (list->tail ? list->tail->next : list->head) = entry;
    list->tail = entry;
    list->serialSize += serialSize;
    RecordOf(list).names.Added(list, entry, name);
}

} // namespace dvs::data

#endif
