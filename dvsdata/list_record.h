/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_LIST_RECORD_H
#define DVSDATA_LIST_RECORD_H

// What a list's block holds behind the handle that callers see, and the last step of every addition to a
// list. For list.cpp and for the reading of buffers, which makes entries of its own; leans on the name index.

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "dvsdata/format.h"
#include "dvsdata/name_index.h"

namespace dvs::data {

/// A list with what the library keeps for itself behind it, in the same block.
struct ListRecord {
    DVSData face;
    NameIndex names;
};
static_assert(offsetof(ListRecord, face) == 0);

inline NameIndex &Names(DVSData *list) {
    return reinterpret_cast<ListRecord *>(list)->names;
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
    Names(list).Added(list, entry, name);
}

} // namespace dvs::data

#endif
