/* SPDX-License-Identifier: Apache-2.0 */
// The property list: an ordered chain of entries, each holding the image of its serialized form. Other layers
// use it through dvs/data.h.

#include "dvsdata/list_internal.h"

#include <algorithm>
#include <cstring>
#include <functional>
#include <new>

#include "dvsdata/emit.h"
#include "dvsdata/list_record.h"

namespace dvs::data {
namespace {

int PrintLen(std::string_view name) {
    return static_cast<int>(std::min<std::size_t>(name.size(), INT32_MAX));
}

DVSDataEntry *Find(const DVSData *list, std::string_view name) {
    return reinterpret_cast<const ListRecord *>(list)->names.Find(list, name);
}

DVSDataEntry *Previous(const DVSData *list, const DVSDataEntry *entry) {
    DVSDataEntry *previous = nullptr;
    for (DVSDataEntry *at = list->head; at != entry; at = at->next)
        previous = at;
    return previous;
}

/// Removes the entry from the chain and from the list's size, with a message. The caller frees it.
void Unlink(DVSData *list, DVSDataEntry *previous, DVSDataEntry *entry) {
    RecordOf(list).names.Removing(list, entry);
    (previous ? previous->next : list->head) = entry->next;
    if (list->tail == entry) list->tail = previous;
    list->serialSize -= entry->serialSize;
    if (Emits(kDetail)) [[unlikely]]
        EmitRemoved(entry->name, entry->dataLen, entry->propType, list->serialSize);
}

/// Writes everything except the value. Bytes that the format leaves open are zero, so images are reproducible
/// and contain no heap contents.
void FillEntry(DVSDataEntry *entry, std::uint32_t serialSize, std::string_view name, std::uint32_t dataLen,
               std::uint32_t propType) {
    ClearPadding(entry, serialSize);
    entry->serialSize = serialSize;
    StoreName(entry->name, name);
    entry->propType = propType;
    entry->dataLen = dataLen;
}

bool Overlaps(const void *bytes, std::size_t size, const DVSDataEntry *entry) {
    const auto *const begin = static_cast<const std::uint8_t *>(bytes);
    const auto *const block = reinterpret_cast<const std::uint8_t *>(entry);
    const std::less<const std::uint8_t *> before;
    return before(begin, block + kImageOffset + entry->serialSize) && before(block, begin + size);
}

HYP_ReturnStatus Replace(DVSData *list, DVSDataEntry *old, std::string_view name, const void *data,
                         std::uint32_t dataLen, std::uint32_t propType) {
    const std::uint32_t newType = propType ? propType : old->propType;
    // Name and value may belong to the old entry, which must then outlive the append.
    const bool ownBytes = Overlaps(data, dataLen, old) || Overlaps(name.data(), name.size() + 1, old);
    Unlink(list, Previous(list, old), old);
    if (!ownBytes) FreeEntry(list, old);
    const HYP_ReturnStatus status = Append(list, name, data, dataLen, newType);
    if (ownBytes) FreeEntry(list, old);
    return status;
}

HYP_ReturnStatus Update(DVSData *list, std::string_view name, const void *data, std::uint32_t dataLen,
                        std::uint32_t propType) {
    const std::uint32_t effectiveType = propType ? propType : kDefaultPropType;
    DVSDataEntry *const entry = Find(list, name);
    if (!entry) return Append(list, name, data, dataLen, effectiveType);
    if (entry->dataLen != dataLen) return Replace(list, entry, name, data, dataLen, propType);

    // Type 0 resets the type here but keeps it in Replace; callers rely on both.
    if (dataLen) std::memmove(entry->data, data, dataLen);
    entry->propType = effectiveType;
    EmitUpdated(name, dataLen, list->serialSize);
    return HYP_OK;
}

} // namespace

HYP_ReturnStatus EntryTooLarge(std::string_view name, std::uint32_t dataLen, std::uint32_t serialSize) {
    if (dataLen > serialSize)
        Emit(kDetail, "Datalen %u, serial size %u for prop %.*s will cause unsigned operation warp\n",
             dataLen, serialSize, PrintLen(name), name.data());
    else
        Emit(kDetail, "Serial size %u for prop %.*s will cause unsigned operation warp\n", serialSize,
             PrintLen(name), name.data());
    return HYP_BAD_PARAM;
}

/// Append(), as part of the exported function: the call costs as much as the checks.
[[gnu::always_inline]] inline HYP_ReturnStatus AppendHere(DVSData *list, std::string_view name,
                                                          const void *data, std::uint32_t dataLen,
                                                          std::uint32_t propType) {
    std::uint32_t serialSize = 0;
    if (const HYP_ReturnStatus status = CheckedEntrySize(name, dataLen, &serialSize); status != HYP_OK)
        return status;
    if (Emits(kDetail)) [[unlikely]]
        EmitAdding(name, dataLen, list->serialSize);

    DVSDataEntry *const entry = NewEntry(list, serialSize);
    if (!entry) return HYP_NO_MEMORY;
    FillEntry(entry, serialSize, name, dataLen, propType);
    if (dataLen) std::memcpy(entry->data, data, dataLen);
    Link(list, entry, serialSize, name);

    if (Emits(kDetail)) [[unlikely]]
        EmitAdded(name, list->serialSize);
    return HYP_OK;
}

HYP_ReturnStatus Append(DVSData *list, std::string_view name, const void *data, std::uint32_t dataLen,
                        std::uint32_t propType) {
    return AppendHere(list, name, data, dataLen, propType);
}

void RemoveAfter(DVSData *list, DVSDataEntry *previous) {
    DVSDataEntry *const entry = previous ? previous->next : list->head;
    Unlink(list, previous, entry);
    FreeEntry(list, entry);
}

HYP_ReturnStatus NewList(DVSData **list, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn, std::uint64_t room) {
    EmitAllocating();
    void *const block = allocFn(sizeof(ListRecord) + room);
    if (!block) return HYP_NO_MEMORY;
    auto *const places = static_cast<std::uint8_t *>(block) + sizeof(ListRecord);
    auto *const record = new (block)
        ListRecord{{kMinBufferSize, nullptr, nullptr, allocFn, freeFn}, {}, places, places + room, 0};
    Forbid(places, room);
    DVSData *const handle = &record->face;
    *list = handle;
    EmitAllocated(handle->serialSize);
    return HYP_OK;
}

} // namespace dvs::data

using namespace dvs::data;

HYP_ReturnStatus DVSData_Alloc(DVSData **list, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn) {
    return NewList(list, allocFn, freeFn, 0);
}

void DVSData_Free(DVSData *list) {
    if (!list) return;
    ListRecord &record = RecordOf(list);
    // Before the entries: freed after them, its block would make the heap return memory to the system a second time.
    record.names.Drop(list);
    std::uint8_t *const places = PlacesOf(list);
    const auto placesSize = static_cast<std::size_t>(record.roomEnd - places);
    if (placesSize == 0) {
        while (DVSDataEntry *const entry = list->head) {
            list->head = entry->next;
            list->freeFn(entry);
        }
    }
    // Entries without their own block are freed with the handle.
    for (DVSDataEntry *entry; record.separateNum && (entry = list->head);) {
        list->head = entry->next;
        FreeEntry(list, entry);
    }
    Allow(places, placesSize);
    list->freeFn(list);
}

HYP_ReturnStatus DVSData_Append(DVSData *list, const char *name, const void *data, uint32_t dataLen,
                                uint32_t propType) {
    return AppendHere(list, name, data, dataLen, propType);
}

HYP_ReturnStatus DVSData_Update(DVSData *list, const char *name, const void *data, uint32_t dataLen,
                                uint32_t propType) {
    return Update(list, name, data, dataLen, propType);
}

HYP_ReturnStatus DVSData_UpdateProp(DVSData *list, const char *name, const void *data, uint32_t dataLen) {
    return Update(list, name, data, dataLen, 0);
}

HYP_ReturnStatus DVSDataRemove(DVSData *list, const char *name, uint32_t *propType) {
    const DVSDataEntry *const entry = Find(list, name);
    if (propType) *propType = entry ? entry->propType : kDefaultPropType;
    if (!entry) return HYP_NOT_FOUND;
    RemoveAfter(list, Previous(list, entry));
    return HYP_OK;
}

HYP_ReturnStatus DVSData_Remove(DVSData *list, const char *name) {
    return DVSDataRemove(list, name, nullptr);
}

HYP_ReturnStatus DVSData_Lookup(DVSData *list, const char *name, DVSDataEntry **entry) {
    DVSDataEntry *const found = Find(list, name);
    if (!found) return HYP_NOT_FOUND;
    *entry = found;
    return HYP_OK;
}

HYP_ReturnStatus DVSData_Next(DVSData *list, DVSDataEntry *current, DVSDataEntry **next) {
    DVSDataEntry *const entry = current ? current->next : list->head;
    if (!entry) return HYP_NOT_FOUND;
    *next = entry;
    return HYP_OK;
}

void DVSData_ForEach(DVSData *list, DVSDataForEachFn callback, void *arg) {
    // The callback may remove its entry, so fetch the successor first.
    for (DVSDataEntry *entry = list->head, *next; entry; entry = next) {
        next = entry->next;
        if (callback(entry->name, entry->data, entry->dataLen, entry->propType, arg)) return;
    }
}

const char *DVSData_Name(const DVSDataEntry *entry) {
    return entry->name;
}

uint32_t DVSData_PropType(const DVSDataEntry *entry) {
    return entry->propType;
}

uint32_t DVSData_Data(DVSDataEntry *entry, void **data) {
    *data = entry->data;
    return entry->dataLen;
}

bool DVSData_IsSamePropType(const DVSDataEntry *entry, uint32_t kind) {
    return (entry->propType & kPropKindMask) == kind;
}

void DVSData_FreeAssocData(DVSData *list, void *block) {
    list->freeFn(block);
}

void DVSData_GetMemFreeFn(DVSData *list, DVSDataFreeFn *freeFn) {
    *freeFn = list->freeFn;
}
