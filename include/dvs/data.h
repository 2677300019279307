/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_DATA_H
#define DVS_DATA_H

#include <stdbool.h>
#include <stdint.h>

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Property lists: ordered lists of named, typed values of any length, and their serialized form.
 *
 * Names     NUL-terminated; compared byte by byte over at most 128 characters. A list keeps the first 127
 *           characters of a longer name, so a lookup by the full name does not find it. Duplicates are
 *           allowed; lookups return the first.
 * Values    `dataLen` counts bytes; the data pointer may be NULL only when it is 0. Values are copied in.
 * Types     the property type word: bits 2 to 7 (mask 0xfc) are the kind, the other bits are flags. 0x20 is
 *           the default, 0x10 marks the switch state's own fields, 0x08 an opaque value.
 * Memory    the handle, each entry (one block each) and every buffer serialized from a list are allocated
 *           and freed with the two functions given at creation. A list of more than a few dozen entries also
 *           allocates an index of its names; if that allocation fails, no index is kept and lookups scan the
 *           list. An entry pointer, and its value, is valid until the entry is removed, updated with another
 *           length, or the list is freed.
 * Outputs   are written on success and untouched on failure unless a comment says otherwise. Pointer
 *           arguments must not be NULL unless their comment allows it.
 * Locking   none. Concurrent reads of a list are safe; a write needs exclusive access. To guard lists of the
 *           switch table, the caller takes DVSwitchHandleLock.
 * Messages  go to standard output, or to the sink of dvs/log.h, if the level dvsdata_debug enables them.
 */

/* Allocates `size` bytes aligned as malloc does, or returns NULL. */
typedef void *(*DVSDataAllocFn)(uint64_t size);
/* Frees a block from the allocate function. */
typedef void (*DVSDataFreeFn)(void *block);

/* One property. From serialSize on, the bytes are those of the serialized entry. Read-only; prefer the
 * accessors. Changing a field makes the list inconsistent. */
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wpedantic"
typedef struct DVSDataEntry {
    struct DVSDataEntry *next; /* following entry; NULL at the tail */
    uint32_t serialSize;       /* bytes of the serialized entry: (dataLen + 146) rounded down to a multiple of 4 */
    char name[128];            /* NUL-terminated, the rest 0 */
    uint32_t propType;         /* property type word */
    uint32_t dataLen;          /* bytes of value */
    uint8_t data[];            /* the value, then zeros up to serialSize */
} DVSDataEntry;
#pragma GCC diagnostic pop

/* A list. Create it with DVSData_Alloc only: the library keeps private data behind the last field. */
typedef struct DVSData {
    uint32_t serialSize; /* size of the whole serialized list: 16 plus the serialSize of every entry */
    DVSDataEntry *head;  /* first entry, or NULL */
    DVSDataEntry *tail;  /* last entry, or NULL */
    DVSDataAllocFn allocFn;
    DVSDataFreeFn freeFn;
} DVSData;

/* Called for each entry with its name, value, type word and the caller's `arg`; true stops the walk. The
 * callback may remove the entry it was given. */
typedef bool (*DVSDataForEachFn)(const char *name, const void *data, uint32_t dataLen, uint32_t propType,
                                 void *arg);

/* Debug level of the family: -1 (the default) prints nothing, 0 errors, 1 traces, 2 details, 3 a line for
 * each entry read. */
extern int32_t dvsdata_debug;

/*
 * Creates an empty list.
 *
 * list     receives the handle; freed with DVSData_Free.
 * allocFn  used for every later allocation of the list; freeFn frees them.
 *
 * HYP_NO_MEMORY: allocFn returned NULL.
 */
HYP_ReturnStatus DVSData_Alloc(DVSData **list, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn);

/* Frees the list's entries from head to tail, then the list. NULL is a no-op. Buffers serialized from the
 * list stay valid. */
void DVSData_Free(DVSData *list);

/*
 * Adds a property at the tail, even if the name already exists.
 *
 * name, data, propType  copied in; type 0 is kept as 0.
 *
 * HYP_BAD_PARAM: the entry's size does not fit in 32 bits. HYP_NO_MEMORY. The list is unchanged after either.
 */
HYP_ReturnStatus DVSData_Append(DVSData *list, const char *name, const void *data, uint32_t dataLen,
                                uint32_t propType);

/*
 * Sets a property. If the length is the same, the value is overwritten in place and its type set to
 * `propType`, or to 0x20 if that is 0. If the length differs, the property is removed and added at the tail,
 * with `propType`, or its old type if that is 0. A new name is added with `propType`, or 0x20 if that is 0.
 *
 * name, data  may point into the list itself, the old value and name included.
 *
 * HYP_BAD_PARAM, HYP_NO_MEMORY: as DVSData_Append. If the length changed, the property has been removed.
 */
HYP_ReturnStatus DVSData_Update(DVSData *list, const char *name, const void *data, uint32_t dataLen,
                                uint32_t propType);

/* DVSData_Update with a propType of 0. */
HYP_ReturnStatus DVSData_UpdateProp(DVSData *list, const char *name, const void *data, uint32_t dataLen);

/*
 * Removes the first property with this name and frees it.
 *
 * propType  receives its type word, or 0x20 if the name does not exist. May be NULL.
 *
 * HYP_NOT_FOUND: no such name.
 */
HYP_ReturnStatus DVSDataRemove(DVSData *list, const char *name, uint32_t *propType);

/* DVSDataRemove without the type. */
HYP_ReturnStatus DVSData_Remove(DVSData *list, const char *name);

/* Looks up the first entry with this name; the list keeps ownership. HYP_NOT_FOUND: no such name. */
HYP_ReturnStatus DVSData_Lookup(DVSData *list, const char *name, DVSDataEntry **entry);

/*
 * Returns the entry after `current`, or the first one if `current` is NULL; the list keeps ownership. `next`
 * may be the address of `current`.
 *
 * HYP_NOT_FOUND: no more entries; every complete walk ends with it.
 */
HYP_ReturnStatus DVSData_Next(DVSData *list, DVSDataEntry *current, DVSDataEntry **next);

/* Calls `callback` on each entry in order until it returns true. */
void DVSData_ForEach(DVSData *list, DVSDataForEachFn callback, void *arg);

/* The entry's name; valid as long as the entry. */
const char *DVSData_Name(const DVSDataEntry *entry);

/* The entry's property type word. */
uint32_t DVSData_PropType(const DVSDataEntry *entry);

/* Sets `data` to the value's address, valid as long as the entry; returns its length in bytes. */
uint32_t DVSData_Data(DVSDataEntry *entry, void **data);

/* Whether the entry's kind, its type word AND 0xfc, equals `kind` exactly. */
bool DVSData_IsSamePropType(const DVSDataEntry *entry, uint32_t kind);

/* Frees a block of the list's allocator, such as a serialized buffer. */
void DVSData_FreeAssocData(DVSData *list, void *block);

/* Returns the list's free function, for buffers that outlive the list. */
void DVSData_GetMemFreeFn(DVSData *list, DVSDataFreeFn *freeFn);

/*
 * Serialization. docs/buffer-format.md describes the format.
 *
 * buf     if `*buf` is NULL, it receives a new buffer from the list's allocator, owned by the caller
 *         (freed with DVSData_FreeAssocData); otherwise it is the caller's buffer.
 * bufLen  on entry the capacity of a caller's buffer in bytes; on success the bytes written, header included.
 *
 * HYP_LIMIT_EXCEEDED: the caller's buffer is too small, or the list's size does not match its entries; in the
 * latter case a new buffer is freed and `*buf` is NULL. HYP_NO_MEMORY: no buffer was allocated.
 */

/* Bytes that DVSData_Serialize writes. `version` is not used. */
uint32_t DVSData_SerializedSize(DVSData *list, uint32_t version);

/* Bytes that DVSData_SerializeExNamedProp writes with the same `exName`, which may be NULL. `version` is not
 * used. */
uint32_t DVSData_SerializedSizeExNamedProp(DVSData *list, uint32_t version, const char *exName);

/* Serializes the whole list. `version` is the switch version; a version below 4 only causes a message.
 */
HYP_ReturnStatus DVSData_Serialize(DVSData *list, void **buf, uint32_t *bufLen, uint32_t version);

/*
 * Serializes all entries except those whose name contains `exName`. Names that contain
 * "com.orbeno.common.port.volatile.persist" are never excluded. If `exName` is NULL, nothing is excluded.
 */
HYP_ReturnStatus DVSData_SerializeExNamedProp(DVSData *list, void **buf, uint32_t *bufLen, uint32_t version,
                                              const char *exName);

/* Serializes all entries except those whose type word has any bit of `typeMask`. */
HYP_ReturnStatus DVSData_SerializeExTypeProp(DVSData *list, void **buf, uint32_t *bufLen, uint32_t typeMask);

/*
 * Serializes the first entry whose whole name equals `name`. Only the allocating form works: `*bufLen` is
 * set to 0 on entry, so a caller's buffer is always too small.
 *
 * HYP_NOT_FOUND: no such name. HYP_LIMIT_EXCEEDED: a caller's buffer. HYP_NO_MEMORY. `*bufLen` is 0 after
 * each.
 */
HYP_ReturnStatus DVSData_SerializeEntry(DVSData *list, const char *name, void **buf, uint32_t *bufLen);

/*
 * Creates a list from a serialized buffer. Rejects any malformed input.
 *
 * list     receives a new list that uses the two functions; freed with DVSData_Free.
 * buf      read only during the call; any alignment. NULL is treated as an empty buffer.
 * bufLen   size of `buf` in bytes. The header may give a smaller size. Bytes after that size, or after the
 *          end marker, are ignored.
 * typeMask entries whose type word has none of these bits are skipped.
 *
 * HYP_BAD_PARAM: malformed, or of another format version. HYP_BAD_CHECKSUM. HYP_NO_MEMORY. No list is
 * created after any of them.
 * after any of them.
 */
HYP_ReturnStatus DVSData_DeserializeWithPropType(DVSData **list, const void *buf, uint32_t bufLen,
                                                 DVSDataAllocFn allocFn, DVSDataFreeFn freeFn,
                                                 uint32_t typeMask);

/* DVSData_DeserializeWithPropType with type mask 0x800000fc: all entries of any kind, or with bit 31. */
HYP_ReturnStatus DVSData_Deserialize(DVSData **list, const void *buf, uint32_t bufLen, DVSDataAllocFn allocFn,
                                     DVSDataFreeFn freeFn);

/*
 * Copies the value of the first property with this name, of any type, out of a serialized buffer. Creates no
 * list and allocates nothing.
 *
 * buf, name, propVal  NULL returns HYP_BAD_PARAM.
 * propVal             receives the value; bytes after it are unchanged. The length is not returned.
 * propValSize         capacity of `propVal` in bytes.
 *
 * HYP_NOT_FOUND: no such name. HYP_LIMIT_EXCEEDED: the value is larger than propValSize. HYP_BAD_PARAM:
 * malformed, of another format version, or an entry or value runs past the buffer's end. HYP_BAD_CHECKSUM:
 * this call checks it before the format version.
 */
HYP_ReturnStatus DVSData_DeserializeGetPropVal(const void *buf, uint32_t bufLen, const char *name,
                                               void *propVal, uint32_t propValSize);

#ifdef __cplusplus
}
#endif

#endif
