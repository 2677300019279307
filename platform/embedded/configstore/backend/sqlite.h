/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_BACKEND_SQLITE_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_BACKEND_SQLITE_H

// A SQLite connection and its statements, with errors as store statuses and records.

#include <cstdint>
#include <memory>
#include <sqlite3.h>
#include <string>
#include <string_view>

#include "platform/embedded/configstore/backend/backend.h"
#include "platform/embedded/configstore/failure.h"

namespace configstore {

struct DatabaseCloser {
    void operator()(sqlite3 *db) const { sqlite3_close_v2(db); }
};
using Database = std::unique_ptr<sqlite3, DatabaseCloser>;

struct Connection {
    Database db;
    FailureKeeper *failures = nullptr;
    bool isReadOnly = false; // the file cannot be written, or is not to be

    /// Keeps a record of SQLite's result code, with SQLite's words, and returns its status.
    int32_t Fail(int rc) const;
};

/// A status for SQLite's result code.
[[nodiscard]] int32_t StatusOf(int rc);

/// A prepared statement; errors surface at Step.
class Statement {
public:
    Statement(const Connection &connection, const char *sql);
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
    [[nodiscard]] int64_t Integer(int column) { return sqlite3_column_int64(statement_, column); }
    [[nodiscard]] std::string_view Text(int column);
    [[nodiscard]] bool IsNull(int column) { return sqlite3_column_type(statement_, column) == SQLITE_NULL; }

private:
    void Check(int rc);

    const Connection &connection_;
    sqlite3_stmt *statement_ = nullptr;
    int parameter_ = 0;
    int32_t status_ = 0;
};

/// Runs one statement without parameters and drops its rows.
[[nodiscard]] int32_t Execute(const Connection &connection, const char *sql);

/// Opens the file at the FailureKeeper's path with the precautions that a hostile file calls for
/// (sqlite_open.cpp), making it if there is none and `access` allows it.
[[nodiscard]] int32_t OpenDatabase(Access access, Connection *connection);

} // namespace configstore

#endif
