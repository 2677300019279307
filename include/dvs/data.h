/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_DATA_H
#define DVS_DATA_H

#include <stdbool.h>
#include <stdint.h>

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Property lists: see the comment of each function. */
/* TODO(owner): family comment and function comments. */
typedef void *(*DVSDataAllocFn)(uint64_t size);
typedef void (*DVSDataFreeFn)(void *block);
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wpedantic"
typedef struct DVSDataEntry { struct DVSDataEntry *next; uint32_t serialSize; char name[128]; uint32_t propType, dataLen; uint8_t data[]; } DVSDataEntry;
#pragma GCC diagnostic pop
typedef struct DVSData { uint32_t serialSize; DVSDataEntry *head, *tail; DVSDataAllocFn allocFn; DVSDataFreeFn freeFn; } DVSData;
typedef bool (*DVSDataForEachFn)(const char *name, const void *data, uint32_t dataLen, uint32_t propType, void *arg);
extern int32_t dvsdata_debug;
HYP_ReturnStatus DVSData_Alloc(DVSData **list, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn);
void             DVSData_Free(DVSData *list);
HYP_ReturnStatus DVSData_Append(DVSData *list, const char *name, const void *data, uint32_t dataLen, uint32_t propType);
HYP_ReturnStatus DVSData_Update(DVSData *list, const char *name, const void *data, uint32_t dataLen, uint32_t propType);
HYP_ReturnStatus DVSData_UpdateProp(DVSData *list, const char *name, const void *data, uint32_t dataLen);
HYP_ReturnStatus DVSDataRemove(DVSData *list, const char *name, uint32_t *propType);
HYP_ReturnStatus DVSData_Remove(DVSData *list, const char *name);
HYP_ReturnStatus DVSData_Lookup(DVSData *list, const char *name, DVSDataEntry **entry);
HYP_ReturnStatus DVSData_Next(DVSData *list, DVSDataEntry *current, DVSDataEntry **next);
void             DVSData_ForEach(DVSData *list, DVSDataForEachFn callback, void *arg);
const char      *DVSData_Name(const DVSDataEntry *entry);
uint32_t         DVSData_PropType(const DVSDataEntry *entry);
uint32_t         DVSData_Data(DVSDataEntry *entry, void **data);
bool             DVSData_IsSamePropType(const DVSDataEntry *entry, uint32_t kind);
void             DVSData_FreeAssocData(DVSData *list, void *block);
void             DVSData_GetMemFreeFn(DVSData *list, DVSDataFreeFn *freeFn);
uint32_t         DVSData_SerializedSize(DVSData *list, uint32_t version);
uint32_t         DVSData_SerializedSizeExNamedProp(DVSData *list, uint32_t version, const char *exName);
HYP_ReturnStatus DVSData_Serialize(DVSData *list, void **buf, uint32_t *bufLen, uint32_t version);
HYP_ReturnStatus DVSData_SerializeExNamedProp(DVSData *list, void **buf, uint32_t *bufLen, uint32_t version, const char *exName);
HYP_ReturnStatus DVSData_SerializeExTypeProp(DVSData *list, void **buf, uint32_t *bufLen, uint32_t typeMask);
HYP_ReturnStatus DVSData_SerializeEntry(DVSData *list, const char *name, void **buf, uint32_t *bufLen);
HYP_ReturnStatus DVSData_DeserializeWithPropType(DVSData **list, const void *buf, uint32_t bufLen, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn, uint32_t typeMask);
HYP_ReturnStatus DVSData_Deserialize(DVSData **list, const void *buf, uint32_t bufLen, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn);
HYP_ReturnStatus DVSData_DeserializeGetPropVal(const void *buf, uint32_t bufLen, const char *name, void *propVal, uint32_t propValSize);

#ifdef __cplusplus
}
#endif

#endif
