/* SPDX-License-Identifier: Apache-2.0 */
// The database's tables and versions (migrations.h). Each step brings a database from one user_version to the
// next and is never changed once released; a new version is a new step.

#include "platform/embedded/configstore/migrations.h"

#include "platform/embedded/configstore/log.h"

namespace configstore {

namespace {

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

int32_t ReadNumber(Store *store, const char *sql, int64_t *value) {
    Statement statement(store, sql);
    if (statement.Step()) *value = statement.Integer(0);
    return statement.Status();
}

struct Identity {
    int64_t version = 0;
    int64_t application = 0;
    int64_t definitions = 0;
};

int32_t ReadIdentity(Store *store, Identity *identity) {
    int32_t status = ReadNumber(store, "PRAGMA user_version", &identity->version);
    if (status == OK) status = ReadNumber(store, "PRAGMA application_id", &identity->application);
    if (status == OK)
        status = ReadNumber(store, "SELECT count(*) FROM sqlite_schema", &identity->definitions);
    return status;
}

int32_t CreateTables(Store *store) {
    for (const Definition &definition : kDefinitions) {
        const int32_t status = Execute(store, definition.sql);
        if (status != OK) return status;
    }
    const std::string marks = "PRAGMA application_id=" + std::to_string(kApplicationId);
    const std::string version = "PRAGMA user_version=" + std::to_string(kSchemaVersion);
    const int32_t status = Execute(store, marks.c_str());
    return status == OK ? Execute(store, version.c_str()) : status;
}

/// Two processes may find the same empty file: the second one finds the tables made once it has its turn.
int32_t MakeStore(Store *store) {
    int32_t status = Execute(store, "BEGIN IMMEDIATE");
    if (status != OK) return status;
    Identity identity;
    status = ReadIdentity(store, &identity);
    if (status == OK && identity.definitions == 0) status = CreateTables(store);
    if (status == OK) return Execute(store, "COMMIT");
    (void)Execute(store, "ROLLBACK");
    return status;
}

/// Whether the tables are the ones that this code made. Others could turn a plain statement into something
/// else.
int32_t CheckDefinitions(Store *store) {
    Statement statement(store, "SELECT name, sql FROM sqlite_schema WHERE sql IS NOT NULL");
    std::size_t known = 0;
    while (statement.Step()) {
        const std::string_view name = statement.Text(0);
        const std::string_view sql = statement.Text(1);
        for (const Definition &definition : kDefinitions)
            known += name == definition.name && sql == definition.sql;
        if (sql.starts_with("CREATE TRIGGER")) known = SIZE_MAX / 2;
    }
    if (statement.Status() != OK) return statement.Status();
    if (known == std::size(kDefinitions)) return OK;
    Log("config store %s: its tables are not those of a config store", store->path.c_str());
    return CORRUPT;
}

int32_t UseWal(Store *store) {
    Statement statement(store, "PRAGMA journal_mode=WAL");
    const bool wal = statement.Step() && statement.Text(0) == "wal";
    if (statement.Status() != OK) return statement.Status();
    if (wal || store->readOnly || store->path == kMemoryPath) return OK;
    Log("config store %s: the file system cannot hold a write-ahead log", store->path.c_str());
    return IO_ERROR;
}

} // namespace

int32_t Migrate(Store *store) {
    static_assert(kSchemaVersion == 1, "a database of version 1 needs a step to the present one");
    Identity identity;
    int32_t status = ReadIdentity(store, &identity);
    if (status != OK) return status;
    const bool fresh = identity.version == 0 && identity.application == 0 && identity.definitions == 0;
    if (!fresh && identity.application != kApplicationId) {
        Log("config store %s: this SQLite database is not a config store; it has been left as it is",
            store->path.c_str());
        return CORRUPT;
    }
    if (identity.version > kSchemaVersion) {
        Log("config store %s: written by a newer release (version %lld, this one knows up to %d); it has "
            "been left as "
            "it is",
            store->path.c_str(), static_cast<long long>(identity.version), kSchemaVersion);
        return FAILED;
    }
    if (fresh && store->readOnly) {
        Log("config store %s: there is no store in it, and it cannot be written to", store->path.c_str());
        return IO_ERROR;
    }
    // Documents run to megabytes: large pages write and read them in fewer calls.
    if (fresh) status = Execute(store, kPageSize);
    if (status == OK) status = UseWal(store);
    if (status == OK) status = Execute(store, "PRAGMA synchronous=FULL");
    if (status == OK && fresh) status = MakeStore(store);
    if (status == OK) status = CheckDefinitions(store);
    return status;
}

} // namespace configstore
