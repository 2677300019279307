/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_DATABASE_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_DATABASE_H

// The SQLite database below the store: opening it with the precautions a hostile file calls for, its tables,
// its errors as store statuses. store.cpp and the operators' functions (admin.h) stand on this.
//
//   object_row       one row per object and layer: address, revision, the document it holds
//   history_row      one row for every document that was replaced or deleted: the same, and the revision
//                    that ended it
//   document         the documents' texts; a row is written once and never changed, so that ending an
//                    object's document moves a number and not megabytes, and bringing one back copies nothing
//   revision         one row per transaction that changed something
//   object, history  views for people: one row per object and layer, with the document
//
// A transaction takes one revision for all that it changes, at its first change.

#include <cstdint>
#include <map>
#include <memory>
#include <sqlite3.h>
#include <string>
#include <string_view>

#include "platform/configstore.h"
#include "platform/embedded/configstore/document.h"

namespace configstore {

inline constexpr int kSchemaVersion = 1;          // user_version of the databases this code writes
inline constexpr int kApplicationId = 0x44565343; // "DVSC"
inline constexpr int kBusyTimeoutMs = 5000;
inline constexpr const char *kDefaultPath = "/var/lib/dvs/configstore.db";
inline constexpr const char *kMemoryPath = ":memory:";
inline constexpr const char *kCurrentLayer = "current";
inline constexpr const char *kDesiredLayer = "desired";

struct DatabaseCloser {
    void operator()(sqlite3 *db) const { sqlite3_close_v2(db); }
};
using Database = std::unique_ptr<sqlite3, DatabaseCloser>;

/// A document that this transaction has read.
struct ReadBefore {
    std::shared_ptr<const Buffer> text;
    Outline outline;
};

struct Store {
    std::string path;
    Database db;
    int64_t revision = 0; // of the open transaction, once it has changed something
    int32_t refusal = 0;  // what every call of this transaction answers: it could not begin, or is lost
    bool inTransaction = false;
    /// By id. A save lists all objects and then fetches each, mostly to replace what is in it.
    std::map<int64_t, ReadBefore> readBefore;
    bool readOnly = false;
};

/// A prepared statement; errors surface at Step.
class Statement {
public:
    Statement(Store *store, const char *sql);
    ~Statement() { sqlite3_finalize(statement_); }
    Statement(const Statement &) = delete;
    Statement &operator=(const Statement &) = delete;

    Statement &Bind(std::string_view text); // the next parameter; the text must outlive the statement
    Statement &Bind(int64_t value);
    /// True for a row; false at the end and on failure, told apart by Status.
    bool Step();
    [[nodiscard]] int32_t Status() const { return status_; }
    /// For statements that give no rows.
    [[nodiscard]] int32_t Run() { return Step(), status_; }
    void Reset();
    [[nodiscard]] int64_t Integer(int column) { return sqlite3_column_int64(statement_, column); }
    [[nodiscard]] std::string_view Text(int column);

private:
    void Note(int rc);

    Store *store_;
    sqlite3_stmt *statement_ = nullptr;
    int parameter_ = 0;
    int32_t status_ = OK;
};

enum class Access { ReadWrite, ReadOnly };

/// The path that GetStore opens: DVS_CONFIGSTORE or the default.
[[nodiscard]] std::string StorePath();
/// Opens a database, making it if there is none (ReadWrite only).
[[nodiscard]] int32_t OpenStore(const std::string &path, Access access, std::unique_ptr<Store> *out);

/// Runs one statement without parameters and rows.
[[nodiscard]] int32_t Execute(Store *store, const char *sql);
/// A status for SQLite's result code.
[[nodiscard]] int32_t StatusOf(int rc);
/// Whether a statement gave up because memory ran out, the disk is full or the like, and took the transaction
/// along.
void NoteLostTransaction(Store *store, int32_t status);

} // namespace configstore

#endif
