/* SPDX-License-Identifier: Apache-2.0 */
// The database's tables and versions (sqlite_tables.h). Each step brings a database from one user_version to
// the next. A released step never changes; a new version gets a new step.

#include "platform/embedded/configstore/backend/sqlite_tables.h"

#include <algorithm>
#include <iterator>

#include "platform/configstore.h"

namespace configstore {

namespace {

constexpr int kSchemaVersion = 1;          // user_version of the databases that this code writes
constexpr int kApplicationId = 0x44565343; // "DVSC"
constexpr const char *kPageSize = "PRAGMA page_size=32768"; // of new databases; others keep theirs

struct Definition {
    const char *name;
    const char *sql; // exactly as the database keeps it
};

// What a database of the present version holds, in the order in which it is made.
constexpr Definition kDefinitions[] = {
    {"revision", "CREATE TABLE revision (revision INTEGER PRIMARY KEY, saved_ms INTEGER NOT NULL)"},
    {"document", "CREATE TABLE document (id INTEGER PRIMARY KEY, text TEXT NOT NULL)"},
    {"object_row", "CREATE TABLE object_row (layer TEXT NOT NULL, key TEXT NOT NULL, grp TEXT NOT NULL, "
                   "component TEXT NOT NULL, "
                   "instance TEXT NOT NULL, revision INTEGER NOT NULL, document INTEGER NOT NULL, "
                   "PRIMARY KEY (layer, key, grp, component, instance)) WITHOUT ROWID"},
    {"history_row",
     "CREATE TABLE history_row (id INTEGER PRIMARY KEY, layer TEXT NOT NULL, key TEXT NOT NULL, grp TEXT NOT "
     "NULL, "
     "component TEXT NOT NULL, instance TEXT NOT NULL, revision INTEGER NOT NULL, ended INTEGER NOT NULL, "
     "deleted INTEGER NOT NULL, document INTEGER NOT NULL)"},
    {"history_by_address",
     "CREATE INDEX history_by_address ON history_row (layer, key, grp, component, instance, ended)"},
    {"object", "CREATE VIEW object AS SELECT layer, key, grp, component, instance, o.revision AS revision, "
               "datetime(saved_ms / 1000, 'unixepoch') AS saved, d.text AS document FROM object_row o "
               "JOIN document d ON d.id = o.document JOIN revision r ON r.revision = o.revision"},
    {"history", "CREATE VIEW history AS SELECT layer, key, grp, component, instance, h.revision AS revision, "
                "ended, deleted, "
                "datetime(saved_ms / 1000, 'unixepoch') AS ended_at, d.text AS document FROM history_row h "
                "JOIN document d ON d.id = h.document JOIN revision r ON r.revision = h.ended"},
};

// What ANALYZE adds.
constexpr Definition kStatistics[] = {
    {"sqlite_stat1", "CREATE TABLE sqlite_stat1(tbl,idx,stat)"},
    {"sqlite_stat4", "CREATE TABLE sqlite_stat4(tbl,idx,neq,nlt,ndlt,sample)"},
};

int32_t ReadNumber(const Connection &connection, const char *sql, int64_t *value) {
    Statement statement(connection, sql);
    if (statement.Step()) *value = statement.Integer(0);
    return statement.Status();
}

struct Identity {
    int64_t version = 0;
    int64_t application = 0;
    int64_t definitions = 0;
};

int32_t ReadIdentity(const Connection &connection, Identity *identity) {
    int32_t status = ReadNumber(connection, "PRAGMA user_version", &identity->version);
    if (status == OK) status = ReadNumber(connection, "PRAGMA application_id", &identity->application);
    if (status == OK)
        status = ReadNumber(connection, "SELECT count(*) FROM sqlite_schema", &identity->definitions);
    return status;
}

int32_t CreateTables(const Connection &connection) {
    for (const Definition &definition : kDefinitions) {
        const int32_t status = Execute(connection, definition.sql);
        if (status != OK) return status;
    }
    const std::string marks = "PRAGMA application_id=" + std::to_string(kApplicationId);
    const std::string version = "PRAGMA user_version=" + std::to_string(kSchemaVersion);
    const int32_t status = Execute(connection, marks.c_str());
    return status == OK ? Execute(connection, version.c_str()) : status;
}

/// Two processes may find the same empty file: the second one finds the tables made once it has its turn.
int32_t MakeStore(const Connection &connection) {
    int32_t status = Execute(connection, "BEGIN IMMEDIATE");
    if (status != OK) return status;
    Identity identity;
    status = ReadIdentity(connection, &identity);
    if (status == OK && identity.definitions == 0) status = CreateTables(connection);
    if (status == OK) return Execute(connection, "COMMIT");
    (void)Execute(connection, "ROLLBACK");
    return status;
}

/// Whether the database has exactly the tables, views and indexes that this code makes. Others could turn a plain
/// statement into something else, or make every save fail. SQLite's own statistics are harmless.
int32_t CheckDefinitions(const Connection &connection) {
    Statement statement(connection, "SELECT name, sql FROM sqlite_schema WHERE sql IS NOT NULL");
    std::size_t known = 0;
    bool hasOthers = false;
    while (statement.Step()) {
        const std::string_view name = statement.Text(0);
        const std::string_view sql = statement.Text(1);
        const auto is = [&](const Definition &definition) {
            return name == definition.name && sql == definition.sql;
        };
        if (std::any_of(std::begin(kDefinitions), std::end(kDefinitions), is))
            known++;
        else
            hasOthers |= std::none_of(std::begin(kStatistics), std::end(kStatistics), is);
    }
    if (statement.Status() != OK) return statement.Status();
    if (known == std::size(kDefinitions) && !hasOthers) return OK;
    return connection.failures->Fail(CORRUPT, "its tables are not those of a config store");
}

int32_t UseWal(const Connection &connection) {
    Statement statement(connection, "PRAGMA journal_mode=WAL");
    const bool wal = statement.Step() && statement.Text(0) == "wal";
    if (statement.Status() != OK) return statement.Status();
    if (wal || connection.isReadOnly) return OK;
    return connection.failures->Fail(IO_ERROR, "the file system cannot hold a write-ahead log");
}

} // namespace

int32_t Migrate(const Connection &connection) {
    static_assert(kSchemaVersion == 1, "a database of version 1 needs a step to the present one");
    Identity identity;
    int32_t status = ReadIdentity(connection, &identity);
    if (status != OK) return status;
    const bool fresh = identity.version == 0 && identity.application == 0 && identity.definitions == 0;
    if (!fresh && identity.application != kApplicationId)
        return connection.failures->Fail(
            CORRUPT, "this SQLite database is not a config store; it has been left as it is");
    if (identity.version > kSchemaVersion)
        return connection.failures->Fail(FAILED,
                                         "written by a newer release (version " +
                                             std::to_string(identity.version) + ", this one knows up to " +
                                             std::to_string(kSchemaVersion) + "); it has been left as it is");
    if (fresh && connection.isReadOnly)
        return connection.failures->Fail(IO_ERROR, "there is no store in it, and it cannot be written to");
    // Documents run to megabytes: large pages write and read them in fewer calls.
    if (fresh) status = Execute(connection, kPageSize);
    if (status == OK) status = UseWal(connection);
    if (status == OK) status = Execute(connection, "PRAGMA synchronous=FULL");
    if (status == OK && fresh) status = MakeStore(connection);
    if (status == OK) status = CheckDefinitions(connection);
    return status;
}

} // namespace configstore
