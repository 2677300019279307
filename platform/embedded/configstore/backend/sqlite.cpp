/* SPDX-License-Identifier: Apache-2.0 */
// Statements and errors of a SQLite connection (sqlite.h).

#include "platform/embedded/configstore/backend/sqlite.h"

#include "platform/configstore.h"

namespace configstore {

int32_t StatusOf(int rc) {
    switch (rc & 0xff) {
    case SQLITE_OK:
    case SQLITE_ROW:
    case SQLITE_DONE:
        return OK;
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
        return BUSY;
    case SQLITE_NOMEM:
        return NO_MEMORY;
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
        return CORRUPT;
    case SQLITE_FULL:
    case SQLITE_IOERR:
    case SQLITE_CANTOPEN:
    case SQLITE_READONLY:
    case SQLITE_PERM:
        return IO_ERROR;
    case SQLITE_TOOBIG:
        return BAD_PARAMETER;
    default:
        return FAILED;
    }
}

int32_t Connection::Fail(int rc) const {
    const char *const hint =
        (rc & 0xff) == SQLITE_FULL ? " (make room; nothing of this transaction has been saved)" : "";
    Failure failure(StatusOf(rc),
                    std::string(sqlite3_errmsg(db.get())) + " (result " + std::to_string(rc) + ')' + hint);
    failure.sqliteCode = rc;
    return failures->Fail(std::move(failure));
}

Statement::Statement(const Connection &connection, const char *sql) : connection_(connection) {
    Check(sqlite3_prepare_v2(connection.db.get(), sql, -1, &statement_, nullptr));
}

void Statement::Check(int rc) {
    if (rc != SQLITE_OK && rc != SQLITE_ROW && rc != SQLITE_DONE) status_ = connection_.Fail(rc);
}

Statement &Statement::Bind(std::string_view text) {
    parameter_++;
    const char *const data = text.data() ? text.data() : "";
    if (status_ == OK)
        Check(sqlite3_bind_text64(statement_, parameter_, data, text.size(), SQLITE_STATIC, SQLITE_UTF8));
    return *this;
}

Statement &Statement::Bind(int64_t value) {
    parameter_++;
    if (status_ == OK) Check(sqlite3_bind_int64(statement_, parameter_, value));
    return *this;
}

bool Statement::Step() {
    if (status_ != OK) return false;
    const int rc = sqlite3_step(statement_);
    Check(rc);
    return rc == SQLITE_ROW;
}

std::string_view Statement::Text(int column) {
    const auto *const text = reinterpret_cast<const char *>(sqlite3_column_text(statement_, column));
    const int size = sqlite3_column_bytes(statement_, column);
    return text ? std::string_view(text, static_cast<std::size_t>(size)) : std::string_view();
}

int32_t Execute(const Connection &connection, const char *sql) {
    Statement statement(connection, sql);
    while (statement.Step()) {
    }
    return statement.Status();
}

} // namespace configstore
