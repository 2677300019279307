/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_BACKEND_BACKEND_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_BACKEND_BACKEND_H

// Where a store keeps its documents and their history: the interface that the store (store.h) and the
// operators' functions (admin.h) use. A backend knows addresses and texts. Trees, the schema and what a
// document means belong to its callers.
//
// A row is one document in the life of one object. It has the revision that brought it and, once it is
// replaced or deleted, the revision that ended it. Nothing else in a row ever changes. A transaction takes one
// revision for all its changes, at the first of them.
//
// Visitors get rows one at a time, so that an object may consist of several: a head, and a row for each part.
//
// Results are of Status. A call that fails leaves a record with the FailureKeeper of its backend. Calls may
// throw std::bad_alloc.

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/configstore.h"
#include "platform/embedded/configstore/address.h"
#include "platform/embedded/configstore/failure.h"

namespace configstore {

inline constexpr int kBusyTimeoutMs = 5000; // unless SetBusyTimeout says otherwise

struct Row {
    Address address;
    int64_t revision = 0; // that brought the document
    int64_t document = 0; // its number. Equal numbers are equal texts, within one transaction
};

/// What is known of a row without its text.
struct RowInfo : Row {
    int64_t savedMs = 0;  // when it came, in milliseconds since 1970 UTC
    uint64_t bytes = 0;   // the document's size
    int64_t ended = 0;    // the revision that ended it; 0 while it is present
    int64_t endedMs = 0;  // and its time
    bool deleted = false; // ended without a successor
};

/// Which rows of an address.
enum class Select {
    One,       // the object with exactly this instance id
    Instances, // all instances if the instance id is empty, else as One
};

/// Receives a row and its text, which is valid until the visitor returns; VisitEverything gives nullopt for a
/// document that is missing. A result other than OK ends the visit and becomes its result.
using RowVisitor = std::function<int32_t(const Row &, std::optional<std::string_view>)>;

class Backend {
public:
    Backend() = default;
    virtual ~Backend() = default; // cancels an open transaction
    Backend(const Backend &) = delete;
    Backend &operator=(const Backend &) = delete;

    [[nodiscard]] virtual bool IsReadOnly() const = 0;
    /// How long calls wait for another writer before they answer BUSY.
    virtual void SetBusyTimeout(int milliseconds) = 0;

    // Transactions. Until Commit, changes are visible through this backend only.

    [[nodiscard]] virtual int32_t Begin() = 0;
    /// Makes the changes durable. After a failure the transaction is still open, unless the failure ended it.
    [[nodiscard]] virtual int32_t Commit() = 0;
    /// OK without a transaction too.
    [[nodiscard]] virtual int32_t Cancel() = 0;
    /// False also once a failure has ended the transaction.
    [[nodiscard]] virtual bool InTransaction() const = 0;

    // Present rows.

    /// Visits the selected rows in ascending order of their instance ids, compared as bytes.
    [[nodiscard]] virtual int32_t Visit(const Address &address, Select select, const RowVisitor &visit) = 0;
    /// The row of the address; nullopt if there is none.
    [[nodiscard]] virtual int32_t Find(const Address &address, std::optional<Row> *row) = 0;
    /// All present rows, by address.
    [[nodiscard]] virtual int32_t List(std::vector<RowInfo> *rows) = 0;

    // Changes, within a transaction.

    /// Gives the object a new document and ends the one it had.
    [[nodiscard]] virtual int32_t Put(const Address &address, std::string_view text, int64_t *document) = 0;
    /// Gives the object a document of the past again.
    [[nodiscard]] virtual int32_t PutBack(const Address &address, int64_t document) = 0;
    /// Ends the object's document. NOT_FOUND if it has none.
    [[nodiscard]] virtual int32_t Delete(const Address &address) = 0;

    // The past.

    /// The number of the latest revision; 0 before the first.
    [[nodiscard]] virtual int32_t LatestRevision(int64_t *revision) = 0;
    /// The row that the object had as of a revision; nullopt if it had none.
    [[nodiscard]] virtual int32_t FindAsOf(const Address &address, int64_t revision,
                                           std::optional<Row> *row) = 0;
    /// All ended rows, the latest ended first.
    [[nodiscard]] virtual int32_t History(std::vector<RowInfo> *rows) = 0;
    /// The text of a document. CORRUPT if it is missing.
    [[nodiscard]] virtual int32_t ReadDocument(int64_t document, std::string *text) = 0;

    // Care.

    /// Visits all rows, present ones first.
    [[nodiscard]] virtual int32_t VisitEverything(const RowVisitor &visit) = 0;
    /// Checks the storage below the documents. `problems` receives a line for each.
    [[nodiscard]] virtual int32_t CheckStorage(std::vector<std::string> *problems) = 0;
    /// Copies everything into a new file (0600). EXISTS if there is a file of that name.
    [[nodiscard]] virtual int32_t Backup(const std::string &path) = 0;
};

enum class Access { ReadWrite, ReadOnly };

/// Opens a SQLite database (sqlite_backend.cpp), making the file if there is none and `access` allows it.
[[nodiscard]] int32_t OpenSqlite(Access access, FailureKeeper *failures, std::unique_ptr<Backend> *out);

/// A database in memory (memory_backend.cpp). It lives as long as a backend or another owner.
class MemoryDatabase;
[[nodiscard]] std::shared_ptr<MemoryDatabase> NewMemoryDatabase();
/// Backends of one database may be used by several threads at once, each backend by one.
[[nodiscard]] std::unique_ptr<Backend> OpenMemory(std::shared_ptr<MemoryDatabase> database,
                                                  FailureKeeper *failures);

} // namespace configstore

#endif
