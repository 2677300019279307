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
 * Names     end in NUL and are compared byte by byte over at most 128 characters. A list keeps the first 127
 *           characters of a longer one, which is then never found by its full text. Duplicates are
 *           possible; whatever looks for a name finds the first.
 * Values    `dataLen` counts bytes; the data pointer may be NULL only when it is 0. Values are copied in.
 * Types     the property type word: bits 2 to 7 (mask 0xfc) are the kind, the others flags. 0x20 is the
 *           default, 0x10 marks the switch state's own fields, 0x08 an opaque value.
 * Memory    the handle, each entry (one block each) and every buffer serialized from a list come from the
 *           two functions given at its creation, and go back through them. A list of more than a few dozen
 *           entries keeps an index of its names in further blocks of the same functions; without memory for
 *           it, it does without. An entry pointer, and the value it leads to, is lent until the entry is
 *           removed, updated with another length, or the list freed.
 * Outputs   are written on success and left alone on failure unless a comment says otherwise. No pointer
 *           argument may be NULL unless its comment says so.
 * Locking   none. A list belongs to one caller at a time; several may read it as long as nobody changes it.
 *           Lists of the switch table are guarded by DVSwitchHandleLock where the caller takes it.
 * Messages  go to standard output, or to the sink of dvs/log.h, when dvsdata_debug asks for them.
 */

/* Allocates `size` bytes aligned as malloc does, or returns NULL. */
typedef void *(*DVSDataAllocFn)(uint64_t size);
/* Releases what the allocate function gave. */
typedef void (*DVSDataFreeFn)(void *block);

/* One property. From serialSize on the bytes are those of the serialized entry. Read only, and through the
 * accessors where possible: a changed field no longer agrees with the list's own books. */
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wpedantic"
typedef struct DVSDataEntry {
    struct DVSDataEntry *next; /* following entry; NULL at the tail */
    uint32_t serialSize;       /* of the serialized entry: (dataLen + 146) rounded down to a multiple of 4 */
    char name[128];            /* NUL-terminated, the rest 0 */
    uint32_t propType;         /* property type word */
    uint32_t dataLen;          /* bytes of value */
    uint8_t data[];            /* the value, then zeros up to serialSize */
} DVSDataEntry;
#pragma GCC diagnostic pop

/* A list. Handles come from DVSData_Alloc only: the library keeps data of its own behind the last field. */
typedef struct DVSData {
    uint32_t serialSize; /* of the whole serialized list: 16 plus that of every entry */
    DVSDataEntry *head;  /* first entry, or NULL */
    DVSDataEntry *tail;  /* last entry, or NULL */
    DVSDataAllocFn allocFn;
    DVSDataFreeFn freeFn;
} DVSData;

/* Called for each entry with its name, value, type word and the caller's `arg`; true ends the walk. It may
 * remove the entry it was given. */
typedef bool (*DVSDataForEachFn)(const char *name, const void *data, uint32_t dataLen, uint32_t propType,
                                 void *arg);

/* Debug level of the family: -1 (the default) prints nothing, 0 errors, 1 traces, 2 details, 3 a line for
 * each entry read. */
extern int32_t dvsdata_debug;

/*
 * Creates an empty list.
 *
 * list     receives the handle; released with DVSData_Free.
 * allocFn  kept for everything that the list allocates from then on; freeFn releases it.
 *
 * HYP_NO_MEMORY: allocFn returned NULL.
 */
HYP_ReturnStatus DVSData_Alloc(DVSData **list, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn);

/* Frees the list's entries from the head on, then the list. NULL is ignored. Buffers serialized from it live
 * on. */
void DVSData_Free(DVSData *list);

/*
 * Adds a property at the tail, whether or not the name is there already.
 *
 * name, data, propType  copied in; type 0 is kept as 0.
 *
 * HYP_BAD_PARAM: the entry's size does not fit in 32 bits. HYP_NO_MEMORY. The list is unchanged after either.
 */
HYP_ReturnStatus DVSData_Append(DVSData *list, const char *name, const void *data, uint32_t dataLen,
                                uint32_t propType);

/*
 * Sets a property. A value of the same length is overwritten in place and its type set to `propType`, or to
 * 0x20 when that is 0. One of another length is removed and added at the tail, with `propType`, or its old
 * type when that is 0. A name that is not there is added, with `propType`, or 0x20 when that is 0.
 *
 * name, data  may point into the list itself, the old value and name included.
 *
 * HYP_BAD_PARAM, HYP_NO_MEMORY: as DVSData_Append. Where the length changed the property is then gone.
 */
HYP_ReturnStatus DVSData_Update(DVSData *list, const char *name, const void *data, uint32_t dataLen,
                                uint32_t propType);

/* DVSData_Update with a propType of 0. */
HYP_ReturnStatus DVSData_UpdateProp(DVSData *list, const char *name, const void *data, uint32_t dataLen);

/*
 * Removes the first property of that name and frees it.
 *
 * propType  receives the type word it had, and 0x20 when there is none; NULL when not wanted.
 *
 * HYP_NOT_FOUND: no such name.
 */
HYP_ReturnStatus DVSDataRemove(DVSData *list, const char *name, uint32_t *propType);

/* DVSDataRemove without the type. */
HYP_ReturnStatus DVSData_Remove(DVSData *list, const char *name);

/* Gives the first entry of that name, lent. HYP_NOT_FOUND: no such name. */
HYP_ReturnStatus DVSData_Lookup(DVSData *list, const char *name, DVSDataEntry **entry);

/*
 * Gives the entry behind `current`, or the first one when that is NULL; lent. `next` may be the address of
 * `current`.
 *
 * HYP_NOT_FOUND: there is none, which is how every walk ends.
 */
HYP_ReturnStatus DVSData_Next(DVSData *list, DVSDataEntry *current, DVSDataEntry **next);

/* Calls `callback` on each entry in order until it returns true. */
void DVSData_ForEach(DVSData *list, DVSDataForEachFn callback, void *arg);

/* The entry's name, lent with the entry. */
const char *DVSData_Name(const DVSDataEntry *entry);

/* The entry's property type word. */
uint32_t DVSData_PropType(const DVSDataEntry *entry);

/* The value's address in `data`, lent with the entry; returns its length in bytes. */
uint32_t DVSData_Data(DVSDataEntry *entry, void **data);

/* Whether the entry's kind, its type word AND 0xfc, equals `kind` exactly. */
bool DVSData_IsSamePropType(const DVSDataEntry *entry, uint32_t kind);

/* Releases a block of the list's allocator, a serialized buffer say. */
void DVSData_FreeAssocData(DVSData *list, void *block);

/* Gives the list's free function, for buffers that outlive it. */
void DVSData_GetMemFreeFn(DVSData *list, DVSDataFreeFn *freeFn);

/*
 * Serialization. docs/buffer-format.md describes the form.
 *
 * buf     where `*buf` is NULL it receives a new buffer of the list's allocator, the caller's from then on
 *         (released with DVSData_FreeAssocData); otherwise it is the caller's buffer.
 * bufLen  on entry the capacity of a caller's buffer in bytes, on success the bytes written, header included.
 *
 * HYP_LIMIT_EXCEEDED: the caller's buffer is too small, or the list's size and its entries do not agree; then
 * a new buffer was released again and `*buf` is NULL. HYP_NO_MEMORY: no new buffer.
 */

/* Bytes that DVSData_Serialize writes. `version` is not used. */
uint32_t DVSData_SerializedSize(DVSData *list, uint32_t version);

/* Bytes that DVSData_SerializeExNamedProp writes with the same `exName`, which may be NULL. `version` is not
 * used. */
uint32_t DVSData_SerializedSizeExNamedProp(DVSData *list, uint32_t version, const char *exName);

/* Serializes the whole list. `version` is the switch version; below 4 it is remarked upon and nothing else.
 */
HYP_ReturnStatus DVSData_Serialize(DVSData *list, void **buf, uint32_t *bufLen, uint32_t version);

/*
 * Serializes all entries but those whose name contains `exName`. Names that contain
 * "com.orbeno.common.port.volatile.persist" are never left out. `exName` may be NULL: nothing is left out.
 */
HYP_ReturnStatus DVSData_SerializeExNamedProp(DVSData *list, void **buf, uint32_t *bufLen, uint32_t version,
                                              const char *exName);

/* Serializes all entries but those whose type word has any bit of `typeMask`. */
HYP_ReturnStatus DVSData_SerializeExTypeProp(DVSData *list, void **buf, uint32_t *bufLen, uint32_t typeMask);

/*
 * Serializes the first entry whose whole name equals `name`. Only the allocating form works: `*bufLen` is
 * cleared on entry, so that a caller's buffer is always too small.
 *
 * HYP_NOT_FOUND: no such name. HYP_LIMIT_EXCEEDED: a caller's buffer. HYP_NO_MEMORY. `*bufLen` is 0 after
 * each.
 */
HYP_ReturnStatus DVSData_SerializeEntry(DVSData *list, const char *name, void **buf, uint32_t *bufLen);

/*
 * Makes a list of a serialized buffer. Bytes that are not such a buffer are refused, whatever they are.
 *
 * list     receives a new list on the two functions; released with DVSData_Free.
 * buf      read only during the call; any alignment. NULL is a buffer of no bytes.
 * bufLen   bytes there are. The header may claim fewer; what lies behind that, or behind the end marker, is
 *          ignored.
 * typeMask entries whose type word has none of these bits are left out.
 *
 * HYP_BAD_PARAM: malformed, or of another format version. HYP_BAD_CHECKSUM. HYP_NO_MEMORY. There is no list
 * after any of them.
 */
HYP_ReturnStatus DVSData_DeserializeWithPropType(DVSData **list, const void *buf, uint32_t bufLen,
                                                 DVSDataAllocFn allocFn, DVSDataFreeFn freeFn,
                                                 uint32_t typeMask);

/* DVSData_DeserializeWithPropType with the type mask 0x800000fc: all entries of any kind, or with bit 31. */
HYP_ReturnStatus DVSData_Deserialize(DVSData **list, const void *buf, uint32_t bufLen, DVSDataAllocFn allocFn,
                                     DVSDataFreeFn freeFn);

/*
 * Copies the value of the first property of that name, of any type, out of a serialized buffer. Makes no list
 * and allocates nothing.
 *
 * buf, name, propVal  NULL is HYP_BAD_PARAM.
 * propVal             receives the value; bytes behind it stay as they were, and its length is not told.
 * propValSize         bytes there is room for.
 *
 * HYP_NOT_FOUND: no such name. HYP_LIMIT_EXCEEDED: the value is larger than propValSize. HYP_BAD_PARAM:
 * malformed, of another format version, or an entry or value runs past the buffer's end. HYP_BAD_CHECKSUM,
 * which here is found before a wrong version.
 */
HYP_ReturnStatus DVSData_DeserializeGetPropVal(const void *buf, uint32_t bufLen, const char *name,
                                               void *propVal, uint32_t propValSize);

#ifdef __cplusplus
}
#endif

#endif
