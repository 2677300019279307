/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_CONFIGSTORE_H
#define PLATFORM_CONFIGSTORE_H

// The host's configuration store: typed objects in a tree, addressed by key, group, component and instance
// id, kept in two layers (the current configuration and the one the user desires), changed in transactions,
// checked by a schema.
//
// What holds for all functions:
//
// Results are of Status. Outputs are written on success only. A null where something is needed, an empty
// name, a handle of a deleted node, and a call that makes no sense (a commit without a begin) are
// BAD_PARAMETER. NO_MEMORY leaves the store, and the tree but for an empty list perhaps, as they were.
//
// Texts are NUL-terminated bytes; what is not UTF-8 comes back byte for byte. Arguments are copied; what is
// handed out is the caller's and released with the function named. A null or empty instance id means a
// singleton.
//
// A store, and a tree with all handles into it, is used by one thread at a time. Two stores, of one process
// or of two, may be used at once: readers see whole transactions and are not held up by a writer. Handles do
// not survive fork().
//
// Embedded: platform/embedded/configstore. docs/config-store.md describes what is on disk.

#include <cstdint>

namespace configstore {

struct Store;  // an open store
struct Object; // a node of an object's tree: the object itself, a singleton sub-object, or an instance of a
               // list
struct FilterSpec; // what to look for

enum Status : int32_t {
    OK = 0,
    FAILED = 1,           // what no other status describes; also a store written by a newer release
    BUSY = 2,             // another process is writing; try again
    BAD_PARAMETER = 3,    //
    SCHEMA_VIOLATION = 4, // the schema does not allow the value, or a value is not of the type asked for
    EXISTS = 5,           //
    NOT_FOUND = 6,        // the object, sub-object or value is not there
    CORRUPT = 7,          // the file or a document in it is damaged, or is not a store's
    IO_ERROR = 8,         // the file cannot be read or written, or the disk is full
    NO_MEMORY = 9,
};

// ---- Stores and transactions ----

/// Opens the host's store, making it if there is none. Released with DestroyStore.
/// FAILED, CORRUPT and IO_ERROR leave the file as it is; the host's log says which file and why.
/// Embedded: the file named by DVS_CONFIGSTORE, read each time (":memory:" is one store per process), or
/// /var/lib/dvs/configstore.db.
int32_t GetStore(Store **store);

/// Closes the store; a transaction that is open is cancelled. Null is allowed.
void DestroyStore(Store *store);

/// Begins a transaction. Until it ends, what is set and deleted through this store is seen through it only.
/// Embedded: does not fail for a reason in the file or another process. What kept it from beginning (BUSY
/// after five seconds of waiting, most of the time) is what the next calls on this store answer, until
/// CancelTransaction.
int32_t BeginTransaction(Store *store);

/// Makes the transaction's changes lasting, all of them at once: after OK they survive a crash and a power
/// cut. After a failure the transaction is still open and has to be cancelled.
int32_t CommitTransaction(Store *store);

/// Takes the transaction's changes back. OK also after a transaction that could not begin.
int32_t CancelTransaction(Store *store);

// ---- Filter specs ----

/// Makes a filter spec. For GetInstances all of key, group and component count; on an object only the key
/// does. An instance id that is not empty selects that instance alone. Released with DestroyFilterSpecObject.
int32_t CreateFilterSpecObject(const char *key, const char *group, const char *component,
                               const char *instanceId, FilterSpec **spec);

/// Releases a filter spec. Null is allowed.
void DestroyFilterSpecObject(FilterSpec *spec);

// ---- Objects ----

/// Lists the current objects that the spec selects, in ascending order of their instance ids (as bytes). None
/// is OK with count 0 and a null array. Objects are copies, released with the array by DestroyObjects.
/// CORRUPT when a document cannot be read; then there is no list.
int32_t GetInstances(Store *store, const FilterSpec *spec, Object ***objects, int32_t *count);

/// The same for the desired user configuration.
int32_t GetDesiredUserConfigInstances(Store *store, const char *key, const char *group, const char *component,
                                      Object ***objects, int32_t *count);

/// A copy of one current object, released with DestroyObject. NOT_FOUND when there is none.
int32_t Get(Store *store, const char *key, const char *group, const char *component, const char *instanceId,
            Object **object);

/// Stores the object in place of what its address held. `source` is "EXTERNAL" for the current configuration
/// or "USER" for the desired one. The object, which must be a root, stays the caller's and usable. Outside a
/// transaction the change is one of its own. SCHEMA_VIOLATION when a value in it is not allowed: this is
/// where the verdict on all values set is given. The host's log names the field.
int32_t Set(Store *store, Object *object, const char *source);

/// Deletes the current object, not the desired one. NOT_FOUND when there is none.
int32_t Delete(Store *store, const char *key, const char *group, const char *component,
               const char *instanceId);

/// Makes an object from a JSON document, "{}" for an empty one. It is in no store yet; released with
/// DestroyObject. BAD_PARAMETER for what is not a JSON object in UTF-8, has a name twice in one object, a NUL
/// in a text, or more than 32 levels. What the schema does not allow is Set's business; members that it does
/// not know are kept.
int32_t CreateObject(const char *key, const char *group, const char *component, const char *instanceId,
                     const char *json, Object **object);

/// Releases an object with all its sub-objects. Null, and the handle of a sub-object, do nothing.
void DestroyObject(Object *object);

/// Releases the objects of a listing and the array. A null array is allowed.
void DestroyObjects(Object **objects, int32_t count);

// ---- Sub-objects ----
// Handles into their root object's tree, valid until the root is destroyed or the node is deleted; nothing to
// release. Singletons have no instance id; instances have one each and are kept in the order in which they
// were made.

/// Finds a sub-object. NOT_FOUND when it is not there; SCHEMA_VIOLATION when the name is that of a plain
/// value, of a list of instances where a singleton is asked for, or the other way round. An empty list has no
/// instances.
int32_t GetSubObject(Object *parent, const char *name, const char *instanceId, Object **out);

/// Makes a sub-object. One that exists is emptied; handles into it end. An empty list becomes a list of
/// instances. SCHEMA_VIOLATION as for GetSubObject.
int32_t CreateSubObject(Object *parent, const char *name, const char *instanceId, Object **out);

/// Deletes a sub-object with all that is in it; the last instance takes its list along. Statuses as
/// GetSubObject's.
int32_t DeleteSubObject(Object *parent, const char *name, const char *instanceId);

/// Finds what a spec selects by its key: the instances of that list in the object, in order of insertion; or,
/// when the object has a text list of that name, one handle per text, good for counting only; where the
/// object has no such member, all of these from its singleton sub-objects, depth first. NOT_FOUND when there
/// is nothing. The array is released with FreeSubObjectArray.
int32_t GetSubObjectInstances(Object *parent, const FilterSpec *spec, Object ***objects, int32_t *count);

/// Deletes what GetSubObjectInstances would find; a list of which nothing is left goes as well.
int32_t DeleteSubObjectInstances(Object *parent, const FilterSpec *spec);

/// Releases the array, not what it points to. Null is allowed.
void FreeSubObjectArray(Object **objects);

/// A new instance id, a random UUID; released with FreeString.
int32_t GenerateInstanceId(char **id);

/// Releases a text handed out by this interface. Null is allowed.
void FreeString(char *text);

// ---- Values ----
// A setter puts a value in place of whatever value the name had, at the end of the object if it had none. It
// takes what the schema does not allow too: Set refuses it, unless it has been mended by then. A sub-object
// or a list with instances is not overwritten (SCHEMA_VIOLATION).

int32_t SetValueBool(Object *object, const char *name, bool value);
int32_t SetValueUint16(Object *object, const char *name, uint16_t value);
int32_t SetValueUint32(Object *object, const char *name, uint32_t value);
int32_t SetValueInt(Object *object, const char *name, int32_t value);
int32_t SetValueLong(Object *object, const char *name, int64_t value);
int32_t SetValueStr(Object *object, const char *name, const char *value);
/// `data` may be null when `len` is 0.
int32_t SetValueBinary(Object *object, const char *name, const void *data, uint32_t len);
/// An empty list; a list of instances is emptied and stays one.
int32_t SetValueEmptyList(Object *object, const char *name);

/// Appends to a list, which is made when there is none. SCHEMA_VIOLATION when the name is that of anything
/// else than a list of the element's type or an empty one.
int32_t AppendValueString(Object *object, const char *name, const char *text);
int32_t AppendValueInt(Object *object, const char *name, int32_t value);

// Getters: NOT_FOUND for a name that has no value, SCHEMA_VIOLATION for a value of another type and for a
// number that does not fit the output. Numbers are kept as numbers: the getter's type need not be the
// setter's.

int32_t GetValueBool(Object *object, const char *name, bool *value);
int32_t GetValueUint16(Object *object, const char *name, uint16_t *value);
int32_t GetValueUint32(Object *object, const char *name, uint32_t *value);
int32_t GetValueInt(Object *object, const char *name, int32_t *value);
int32_t GetValueLong(Object *object, const char *name, int64_t *value);
/// A copy, released with FreeString. For "key" an instance without such a value gives its instance id.
int32_t GetValueStr(Object *object, const char *name, char **value);
/// A copy, released with FreeBinary; not null even when it is empty.
int32_t GetValueBinary(Object *object, const char *name, void **data, uint32_t *len);
void FreeBinary(void *data);
/// Copies, released with FreeStringArray. An empty list of either kind gives count 0.
int32_t GetValueStringArray(Object *object, const char *name, char ***strings, int32_t *count);
void FreeStringArray(char **strings, int32_t count);
/// A copy, released with FreeIntArray.
int32_t GetValueIntArray(Object *object, const char *name, int32_t **values, int32_t *count);
void FreeIntArray(int32_t *values);

/// Removes a value or list. NOT_FOUND when there is none; SCHEMA_VIOLATION for a sub-object or instances,
/// unless the schema allows anything under that name.
int32_t RemoveValue(Object *object, const char *name);

} // namespace configstore

#endif
