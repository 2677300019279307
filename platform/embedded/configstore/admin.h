/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_ADMIN_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_ADMIN_H

// What operators do with a store beyond the client interface: list, import, export, restore, back up, check.
// A library of its own (dvs::store_admin), internal to this repository; dvsctl uses it.
//
// Results are the statuses of platform/configstore.h. A store opened here does not write to the host's log:
// LastFailure says why a call failed. Outputs are written on success only, except lists of problems.
//
// Every change is part of the transaction that the caller has begun on the store (BeginTransaction), or of one
// of its own if there is none. So several changes can become one, and a planned change can be shown: begin,
// change, look, cancel.

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "platform/configstore.h"
#include "platform/embedded/configstore/address.h"
#include "platform/embedded/configstore/backend/backend.h"
#include "platform/embedded/configstore/failure.h"

namespace configstore::admin {

using configstore::Address;
using configstore::Layer;
using configstore::LayerName;
/// A document of an object, present or past, without its text.
using Entry = configstore::RowInfo;

struct Problem {
    std::string where; // the object and the field's path
    std::string what;
};

struct Change {
    enum What { Added, Replaced, Deleted } what;
    Address address;
};

/// A short text for a store status.
const char *StatusText(int32_t status);

/// Opens the store at `path`, or the one that GetStore would open if it is empty. A read-only store is never
/// made or changed. Released with DestroyStore. `failure`, unless null, receives the record of a failure.
int32_t Open(const std::string &path, bool readOnly, Store **store, Failure *failure = nullptr);
/// A new, empty store in memory, which ends with the handle.
int32_t OpenInMemory(Store **store);
/// The path that GetStore would open now.
std::string DefaultPath();
/// How long calls wait for another writer before they answer BUSY.
void SetBusyTimeout(Store *store, int milliseconds);
/// The record of the last call's failure; null if the call succeeded, or has nothing to add to its status.
/// Valid until the next call on the store. CancelTransaction leaves it as it is.
const Failure *LastFailure(const Store *store);

/// The objects of both layers, by address.
int32_t List(Store *store, std::vector<Entry> *entries);
/// An object's document, as it is stored. NOT_FOUND if there is none.
int32_t Export(Store *store, const Address &address, std::string *json);
/// Checks a document against everything in the schema, enumerations, patterns and counts included. Also
/// refused are unknown members, names that occur twice, and more than 32 levels. BAD_PARAMETER for a text that
/// is no document and for a key and group without a schema, SCHEMA_VIOLATION for a document that breaks the
/// schema; `problems` says where.
int32_t CheckDocument(const std::string &key, const std::string &group, std::string_view json,
                      std::vector<Problem> *problems);
/// CheckDocument, then stores it as the object's.
int32_t Import(Store *store, const Address &address, std::string_view json, std::vector<Problem> *problems);
/// Deletes an object of either layer. NOT_FOUND if there is none.
int32_t Delete(Store *store, const Address &address);
/// Copies the present documents of one store into another as they are, unchecked.
int32_t CopyPresent(Store *from, Store *to);

/// The number of the latest revision, 0 for a new store.
int32_t LatestRevision(Store *store, int64_t *revision);
/// All past documents, the latest ended first.
int32_t History(Store *store, std::vector<Entry> *entries);
/// The object's document as of a revision. NOT_FOUND if it had none then, or the revision is still to come.
int32_t ExportAsOf(Store *store, const Address &address, int64_t revision, std::string *json);
/// Makes the document that the object had as of a revision its present one. NOT_FOUND as above.
int32_t RestoreObject(Store *store, const Address &address, int64_t revision);
/// Makes the whole store what it was as of a revision, 0 being the empty store. Later documents go into
/// history.
int32_t RestoreStore(Store *store, int64_t revision, std::vector<Change> *changes);

/// Copies the store into a new file (0600), consistently while others write. EXISTS if there is a file
/// already; an incomplete copy is removed.
int32_t Backup(Store *store, const std::string &path);
/// Checks the database and every document, past ones included, against the schema. OK with problems listed
/// means that the check itself could be carried out.
int32_t Check(Store *store, std::vector<Problem> *problems);

/// The schema file's text for a key and group; empty if there is none.
std::string_view Schema(std::string_view key, std::string_view group);

} // namespace configstore::admin

#endif
