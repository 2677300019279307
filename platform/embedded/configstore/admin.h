/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_ADMIN_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_ADMIN_H

// What operators do with a store, beyond the client interface: look, import, export, go back, back up, check.
// dvsctl stands on it. A library of its own (dvs::store_admin), internal to this repository.
//
// Results are the statuses of platform/configstore.h. What was wrong, with file and field path, goes to the
// host's log; a tool that wants the text instead puts a MessageCollector (log.h) around the call. Outputs are
// written on success only, except lists of problems.
//
// Every change is made in the transaction that the caller has begun on the store (BeginTransaction), or in
// one of its own where there is none. So several changes can be made one, and a planned change can be shown:
// begin, change, look, cancel.

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "platform/configstore.h"

namespace configstore::admin {

enum class Layer { Current, Desired };

struct Address {
    Layer layer = Layer::Current;
    std::string key, group, component, instance;
};

struct Entry {
    Address address;
    int64_t revision; // of the transaction that wrote it
    int64_t savedMs;  // its time, milliseconds since 1970 UTC
    uint64_t bytes;   // the document's size
};

/// A document that was replaced or deleted.
struct PastEntry {
    Entry entry;
    int64_t ended; // the revision that ended it
    int64_t endedMs;
    bool deleted; // and not replaced
};

struct Problem {
    std::string where; // the object and the field's path
    std::string what;
};

struct Change {
    enum What { Added, Replaced, Deleted } what;
    Address address;
};

/// "current" and "desired".
const char *LayerName(Layer layer);
/// A short text for a store status.
const char *StatusText(int32_t status);

/// Opens the store at `path`, or the one that GetStore would open when it is empty. A read-only store is
/// never made or changed. Released with DestroyStore.
int32_t Open(const std::string &path, bool readOnly, Store **store);
/// The path that GetStore would open now.
std::string DefaultPath();
/// How long calls wait for another writer before they answer BUSY.
void SetBusyTimeout(Store *store, int milliseconds);

/// The objects of both layers, by address.
int32_t List(Store *store, std::vector<Entry> *entries);
/// An object's document, as it is stored. NOT_FOUND where there is none.
int32_t Export(Store *store, const Address &address, std::string *json);
/// Judges a document by everything that the schema says, enumerations, patterns and counts included; also
/// refused are unknown members, names that occur twice, and more than 32 levels. BAD_PARAMETER for what is no
/// document at all and for a key and group without a schema, SCHEMA_VIOLATION for what breaks the schema;
/// `problems` says where.
int32_t CheckDocument(const std::string &key, const std::string &group, std::string_view json,
                      std::vector<Problem> *problems);
/// CheckDocument, then stores it as the object's.
int32_t Import(Store *store, const Address &address, std::string_view json, std::vector<Problem> *problems);
/// Deletes an object of either layer. NOT_FOUND where there is none.
int32_t Delete(Store *store, const Address &address);

/// The number of the latest revision, 0 for a new store.
int32_t LatestRevision(Store *store, int64_t *revision);
/// All past documents, the latest ended first.
int32_t History(Store *store, std::vector<PastEntry> *entries);
/// The object's document as of a revision. NOT_FOUND when it had none then, or the revision is not there yet.
int32_t ExportAsOf(Store *store, const Address &address, int64_t revision, std::string *json);
/// Makes the document that the object had as of a revision its present one. NOT_FOUND as above.
int32_t RestoreObject(Store *store, const Address &address, int64_t revision);
/// Makes the whole store what it was as of a revision, 0 being the empty store; what came since goes into
/// history.
int32_t RestoreStore(Store *store, int64_t revision, std::vector<Change> *changes);

/// Copies the store into a new file (0600) with SQLite's backup: consistent while others write. EXISTS when
/// there is a file already; an incomplete copy is removed.
int32_t Backup(Store *store, const std::string &path);
/// Checks the database (PRAGMA integrity_check) and every document, past ones included, against the schema.
/// OK with problems listed means that the check itself could be carried out.
int32_t Check(Store *store, std::vector<Problem> *problems);

/// The schema file's text for a key and group; empty when there is none.
std::string_view Schema(std::string_view key, std::string_view group);

} // namespace configstore::admin

#endif
