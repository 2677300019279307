/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_CONFIGSTORE_H
#define PLATFORM_CONFIGSTORE_H

#include <cstdint>

namespace configstore {

struct Store; struct Object; struct FilterSpec;
enum Status : int32_t { OK = 0, FAILED = 1, BUSY = 2, BAD_PARAMETER = 3, SCHEMA_VIOLATION = 4, EXISTS = 5, NOT_FOUND = 6, CORRUPT = 7, IO_ERROR = 8, NO_MEMORY = 9 };
int32_t GetStore(Store **store);                       void DestroyStore(Store *store);
int32_t BeginTransaction(Store *);  int32_t CommitTransaction(Store *);  int32_t CancelTransaction(Store *);
int32_t CreateFilterSpecObject(const char *key, const char *group, const char *component, const char *instanceId, FilterSpec **spec);
void    DestroyFilterSpecObject(FilterSpec *spec);
int32_t GetInstances(Store *, const FilterSpec *, Object ***objects, int32_t *count);          /* ascending instance id */
int32_t GetDesiredUserConfigInstances(Store *, const char *key, const char *group, const char *component, Object ***objects, int32_t *count);
int32_t Get(Store *, const char *key, const char *group, const char *component, const char *instanceId, Object **object);
int32_t Set(Store *, Object *object, const char *source);      /* "EXTERNAL": current configuration; "USER": desired user configuration */
int32_t Delete(Store *, const char *key, const char *group, const char *component, const char *instanceId);
int32_t CreateObject(const char *key, const char *group, const char *component, const char *instanceId, const char *json, Object **object);
void    DestroyObject(Object *object);                 void DestroyObjects(Object **objects, int32_t count);
/* sub-objects: handles into their root object's tree, valid until the root is destroyed or the node is deleted; nothing to release */
int32_t GetSubObject(Object *parent, const char *name, const char *instanceId, Object **out);
int32_t CreateSubObject(Object *parent, const char *name, const char *instanceId, Object **out);
int32_t DeleteSubObject(Object *parent, const char *name, const char *instanceId);
int32_t GetSubObjectInstances(Object *parent, const FilterSpec *, Object ***objects, int32_t *count);   /* insertion order; array released with FreeSubObjectArray */
int32_t DeleteSubObjectInstances(Object *parent, const FilterSpec *);
void    FreeSubObjectArray(Object **objects);
int32_t GenerateInstanceId(char **id);                 void FreeString(char *text);
int32_t SetValueBool(Object *object, const char *name, bool value);
int32_t SetValueUint16(Object *object, const char *name, uint16_t value);
int32_t SetValueUint32(Object *object, const char *name, uint32_t value);
int32_t SetValueInt(Object *object, const char *name, int32_t value);
int32_t SetValueLong(Object *object, const char *name, int64_t value);
int32_t SetValueStr(Object *object, const char *name, const char *value);
int32_t SetValueBinary(Object *, const char *name, const void *data, uint32_t len);
int32_t SetValueEmptyList(Object *, const char *name);  /* also empties a list of instances */
int32_t AppendValueString(Object *, const char *name, const char *text);   int32_t AppendValueInt(Object *, const char *name, int32_t value);
int32_t GetValueBool(Object *object, const char *name, bool *value);
int32_t GetValueUint16(Object *object, const char *name, uint16_t *value);
int32_t GetValueUint32(Object *object, const char *name, uint32_t *value);
int32_t GetValueInt(Object *object, const char *name, int32_t *value);
int32_t GetValueLong(Object *object, const char *name, int64_t *value);
int32_t GetValueStr(Object *object, const char *name, char **value);
int32_t GetValueBinary(Object *, const char *name, void **data, uint32_t *len);   void FreeBinary(void *data);
int32_t GetValueStringArray(Object *, const char *name, char ***strings, int32_t *count);   void FreeStringArray(char **strings, int32_t count);
int32_t GetValueIntArray(Object *, const char *name, int32_t **values, int32_t *count);              void FreeIntArray(int32_t *values);
int32_t RemoveValue(Object *, const char *name);

} // namespace configstore

#endif
