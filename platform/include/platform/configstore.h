/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_CONFIGSTORE_H
#define PLATFORM_CONFIGSTORE_H

// The host's configuration store: typed objects in a tree, addressed by key, group, component and instance
// id. The store has two layers (the current configuration and the user's desired one) and changes in
// transactions. A schema checks the objects.
//
// For all functions:
//
// Results are of type Status. Outputs are written on success only. A null for a required argument, an empty
// name, a handle of a deleted node, and an invalid call (a commit without a begin) return BAD_PARAMETER.
// NO_MEMORY leaves the store unchanged, and the tree too, except that it may add an empty list.
//
// Texts are NUL-terminated bytes; invalid UTF-8 is returned byte for byte. Arguments are copied. The caller
// owns returned values and releases them with the named function. A null or empty instance id means a
// singleton.
//
// A store, and a tree with all handles into it, may be used by one thread at a time. Two stores, in one
// process or two, may be used concurrently: readers see whole transactions and do not wait for a writer.
// Handles are invalid after fork().
//
// Embedded implementation: platform/embedded/configstore. docs/config-store.md describes the disk format.

#include <cstdint>

namespace configstore {

struct Store;  // an open store
struct Object; // a node of an object's tree: the object itself, a singleton sub-object, or an instance of a
               // list
struct FilterSpec; // a search filter

enum Status : int32_t {
    OK = 0,
    FAILED = 1,           // any other failure; also a store written by a newer release
    BUSY = 2,             // another process is writing; retry
    BAD_PARAMETER = 3,    //
    SCHEMA_VIOLATION = 4, // the schema does not allow the value, or the value is not of the requested type
    EXISTS = 5,           //
    NOT_FOUND = 6,        // the object, sub-object or value does not exist
    CORRUPT = 7,          // the file or a document in it is damaged, or the file is not a store
    IO_ERROR = 8,         // the file cannot be read or written, or the disk is full
    NO_MEMORY = 9,
};

// ---- Stores and transactions ----

/// Opens the host's store; creates it if it does not exist. Released with DestroyStore.
/// FAILED, CORRUPT and IO_ERROR leave the file unchanged; the host's log names the file and the cause.
/// Embedded: the file named by DVS_CONFIGSTORE, read each time (":memory:" is one store per process), or
/// /var/lib/dvs/configstore.db.
int32_t GetStore(Store **store);

/// Closes the store; cancels an open transaction. Null is allowed.
void DestroyStore(Store *store);

/// Begins a transaction. Until it ends, only this store sees its changes.
/// Embedded: never fails because of the file or another process. If the transaction could not begin (usually
/// BUSY after a wait of five seconds), the next calls on this store return that status, until
/// CancelTransaction.
int32_t BeginTransaction(Store *store);

/// Commits the transaction's changes atomically: after OK they survive a crash and a power cut. After a
/// failure the transaction is still open and must be cancelled.
int32_t CommitTransaction(Store *store);

/// Rolls the transaction back. Also OK for a transaction that could not begin.
int32_t CancelTransaction(Store *store);

// ---- Filter specs ----

/// Creates a filter spec. GetInstances uses key, group and component; functions on an object use only the
/// key. A non-empty instance id selects only that instance. Released with DestroyFilterSpecObject.
int32_t CreateFilterSpecObject(const char *key, const char *group, const char *component,
                               const char *instanceId, FilterSpec **spec);

/// Releases a filter spec. Null is allowed.
void DestroyFilterSpecObject(FilterSpec *spec);

// ---- Objects ----

/// Lists the current objects that the spec selects, in ascending order of their instance ids (as bytes). No
/// match is OK with count 0 and a null array. Objects are copies, released with the array by DestroyObjects.
/// CORRUPT: a document cannot be read; no list is returned.
int32_t GetInstances(Store *store, const FilterSpec *spec, Object ***objects, int32_t *count);

/// The same for the desired user configuration.
int32_t GetDesiredUserConfigInstances(Store *store, const char *key, const char *group, const char *component,
                                      Object ***objects, int32_t *count);

/// Returns a copy of one current object, released with DestroyObject. NOT_FOUND: no such object.
int32_t Get(Store *store, const char *key, const char *group, const char *component, const char *instanceId,
            Object **object);

/// Stores the object at its address, replacing the previous one. `source` is "EXTERNAL" for the current
/// configuration or "USER" for the desired one. The object must be a root; the caller keeps it. Outside a
/// transaction the change is its own transaction. SCHEMA_VIOLATION: a value is not allowed; this call checks
/// all values. The host's log names the field.
int32_t Set(Store *store, Object *object, const char *source);

/// Deletes the current object, not the desired one. NOT_FOUND: no such object.
int32_t Delete(Store *store, const char *key, const char *group, const char *component,
               const char *instanceId);

/// Creates an object from a JSON document ("{}" for an empty one), not yet in any store. Released with
/// DestroyObject. BAD_PARAMETER: not a JSON object in UTF-8, a duplicate name in one object, a NUL in a text,
/// or more than 32 levels. The schema is checked by Set; members unknown to the schema are kept.
int32_t CreateObject(const char *key, const char *group, const char *component, const char *instanceId,
                     const char *json, Object **object);

/// Releases an object with all its sub-objects. Null, or a sub-object's handle, is a no-op.
void DestroyObject(Object *object);

/// Releases a list of objects and the array. A null array is allowed.
void DestroyObjects(Object **objects, int32_t count);

// ---- Sub-objects ----
// Handles into their root object's tree, valid until the root is destroyed or the node is deleted; they need
// no release. Singletons have no instance id. Each instance has one; instances are in order of creation.

/// Finds a sub-object. NOT_FOUND: it does not exist. SCHEMA_VIOLATION: the name is a plain value, or a list
/// of instances where a singleton is requested, or the reverse. An empty list has no instances.
int32_t GetSubObject(Object *parent, const char *name, const char *instanceId, Object **out);

/// Creates a sub-object. An existing one is cleared, and handles into it become invalid. An empty list
/// becomes a list of instances. SCHEMA_VIOLATION as for GetSubObject.
int32_t CreateSubObject(Object *parent, const char *name, const char *instanceId, Object **out);

/// Deletes a sub-object with its contents; deleting the last instance deletes the list. Statuses as for
/// GetSubObject.
int32_t DeleteSubObject(Object *parent, const char *name, const char *instanceId);

/// Finds what a spec selects by its key: the instances of that list in the object, in order of insertion. If
/// the object has a text list of that name, returns one handle per text, usable only for counting. If the
/// object has no such member, returns all of these from its singleton sub-objects, depth first. NOT_FOUND: no
/// match. The array is released with FreeSubObjectArray.
int32_t GetSubObjectInstances(Object *parent, const FilterSpec *spec, Object ***objects, int32_t *count);

/// Deletes everything that GetSubObjectInstances would find. A list that becomes empty is deleted too.
int32_t DeleteSubObjectInstances(Object *parent, const FilterSpec *spec);

/// Releases the array, not the objects. Null is allowed.
void FreeSubObjectArray(Object **objects);

/// Creates an instance id, a random UUID; released with FreeString.
int32_t GenerateInstanceId(char **id);

/// Releases a text returned by this interface. Null is allowed.
void FreeString(char *text);

// ---- Values ----
// A setter replaces the value of that name, or appends the value to the object. It also accepts values that
// the schema does not allow: Set rejects them unless they have been corrected. A setter does not overwrite a
// sub-object or a list with instances (SCHEMA_VIOLATION).

int32_t SetValueBool(Object *object, const char *name, bool value);
int32_t SetValueUint16(Object *object, const char *name, uint16_t value);
int32_t SetValueUint32(Object *object, const char *name, uint32_t value);
int32_t SetValueInt(Object *object, const char *name, int32_t value);
int32_t SetValueLong(Object *object, const char *name, int64_t value);
int32_t SetValueStr(Object *object, const char *name, const char *value);
/// `data` may be null when `len` is 0.
int32_t SetValueBinary(Object *object, const char *name, const void *data, uint32_t len);
/// Sets an empty list. A list of instances is cleared and stays one.
int32_t SetValueEmptyList(Object *object, const char *name);

/// Appends to a list; creates it if it does not exist. SCHEMA_VIOLATION: the name is neither a list of the
/// element's type nor an empty list.
int32_t AppendValueString(Object *object, const char *name, const char *text);
int32_t AppendValueInt(Object *object, const char *name, int32_t value);

// Getters. NOT_FOUND: no value of that name. SCHEMA_VIOLATION: the value has another type, or the number does
// not fit the output. Numbers are stored untyped: the getter's type may differ from the setter's.

int32_t GetValueBool(Object *object, const char *name, bool *value);
int32_t GetValueUint16(Object *object, const char *name, uint16_t *value);
int32_t GetValueUint32(Object *object, const char *name, uint32_t *value);
int32_t GetValueInt(Object *object, const char *name, int32_t *value);
int32_t GetValueLong(Object *object, const char *name, int64_t *value);
/// Returns a copy, released with FreeString. For "key", an instance without such a value returns its instance
/// id.
int32_t GetValueStr(Object *object, const char *name, char **value);
/// Returns a copy, released with FreeBinary; not null even if it is empty.
int32_t GetValueBinary(Object *object, const char *name, void **data, uint32_t *len);
void FreeBinary(void *data);
/// Returns copies, released with FreeStringArray. An empty list of either kind returns count 0.
int32_t GetValueStringArray(Object *object, const char *name, char ***strings, int32_t *count);
void FreeStringArray(char **strings, int32_t count);
/// Returns a copy, released with FreeIntArray.
int32_t GetValueIntArray(Object *object, const char *name, int32_t **values, int32_t *count);
void FreeIntArray(int32_t *values);

/// Removes a value or list. NOT_FOUND: it does not exist. SCHEMA_VIOLATION: a sub-object or instances, unless
/// the schema allows anything under that name.
int32_t RemoveValue(Object *object, const char *name);

} // namespace configstore

#endif
