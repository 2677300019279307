/* SPDX-License-Identifier: Apache-2.0 */
// A store in a SQLite database (backend.h). sqlite_tables.cpp has the tables:
//
//   object_row       one row per object and layer: address, revision, the document it has
//   history_row      one row per document that was replaced or deleted: the same, and the revision that ended it
//   document         the documents' texts. A row is written once and never changed, so that ending an object's
//                    document moves a number and not megabytes, and bringing one back copies nothing
//   revision         one row per transaction that changed something
//   object, history  views for people: one row per object and layer, with the document

#include <cerrno>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <unistd.h>

#include "platform/embedded/configstore/backend/backend.h"
#include "platform/embedded/configstore/backend/sqlite.h"

namespace configstore {

namespace {

Layer LayerOf(std::string_view name) {
    return name == LayerName(Layer::Desired) ? Layer::Desired : Layer::Current;
}

Statement &BindAddress(Statement &statement, const Address &address) {
    return statement.Bind(LayerName(address.layer))
        .Bind(address.key)
        .Bind(address.group)
        .Bind(address.component)
        .Bind(address.instance);
}

Address ReadAddress(Statement &statement) {
    return {LayerOf(statement.Text(0)), std::string(statement.Text(1)), std::string(statement.Text(2)),
            std::string(statement.Text(3)), std::string(statement.Text(4))};
}

class SqliteBackend final : public Backend {
public:
    explicit SqliteBackend(Connection connection) : connection_(std::move(connection)) {}

    [[nodiscard]] bool IsReadOnly() const override { return connection_.isReadOnly; }
    void SetBusyTimeout(int milliseconds) override { sqlite3_busy_timeout(Db(), milliseconds); }

    int32_t Begin() override {
        revision_ = 0;
        return Run("BEGIN IMMEDIATE");
    }
    int32_t Commit() override { return Run("COMMIT"); }
    int32_t Cancel() override { return InTransaction() ? Run("ROLLBACK") : static_cast<int32_t>(OK); }
    [[nodiscard]] bool InTransaction() const override { return !sqlite3_get_autocommit(Db()); }

    int32_t Visit(const Address &address, Select select, const RowVisitor &visit) override {
        // The primary key has this order already.
        Statement statement(connection_, "SELECT instance, o.revision, o.document, d.text FROM object_row o "
                                         "JOIN document d ON d.id = o.document "
                                         "WHERE layer = ?1 AND key = ?2 AND grp = ?3 AND component = ?4 AND "
                                         "(instance = ?5 OR ?6) ORDER BY instance");
        BindAddress(statement, address);
        statement.Bind(int64_t{select == Select::Instances && address.instance.empty()});
        Row row{address, 0, 0};
        while (statement.Step()) {
            row.address.instance = statement.Text(0);
            row.revision = statement.Integer(1);
            row.document = statement.Integer(2);
            const int32_t status = visit(row, statement.Text(3));
            if (status != OK) return status;
        }
        return statement.Status();
    }
    int32_t Find(const Address &address, std::optional<Row> *row) override {
        Statement statement(connection_,
                            "SELECT revision, document FROM object_row "
                            "WHERE layer = ? AND key = ? AND grp = ? AND component = ? AND instance = ?");
        BindAddress(statement, address);
        return ReadRow(statement, address, row);
    }
    int32_t List(std::vector<RowInfo> *rows) override {
        Statement statement(connection_,
                            "SELECT layer, key, grp, component, instance, o.revision, o.document, saved_ms, "
                            "length(CAST(d.text AS BLOB)), 0, 0, 0 FROM object_row o "
                            "JOIN document d ON d.id = o.document JOIN revision r ON r.revision = o.revision "
                            "ORDER BY layer, key, grp, component, instance");
        return ReadInfos(statement, rows);
    }

    int32_t Put(const Address &address, std::string_view text, int64_t *document) override {
        Statement statement(connection_, "INSERT INTO document (text) VALUES (?)");
        const int32_t status = statement.Bind(text).Run();
        if (status != OK) return status;
        *document = sqlite3_last_insert_rowid(Db());
        return PutBack(address, *document);
    }
    int32_t PutBack(const Address &address, int64_t document) override {
        int32_t status = TakeRevision();
        std::optional<Row> row;
        if (status == OK) status = Find(address, &row);
        if (status == OK && row) status = End(*row, false);
        if (status != OK) return status;
        Statement statement(
            connection_, "REPLACE INTO object_row (layer, key, grp, component, instance, revision, document) "
                         "VALUES (?, ?, ?, ?, ?, ?, ?)");
        return BindAddress(statement, address).Bind(revision_).Bind(document).Run();
    }
    int32_t Delete(const Address &address) override {
        std::optional<Row> row;
        int32_t status = Find(address, &row);
        if (status != OK) return status;
        if (!row) return NOT_FOUND;
        status = TakeRevision();
        if (status == OK) status = End(*row, true);
        if (status != OK) return status;
        Statement statement(connection_,
                            "DELETE FROM object_row "
                            "WHERE layer = ? AND key = ? AND grp = ? AND component = ? AND instance = ?");
        return BindAddress(statement, address).Run();
    }

    int32_t LatestRevision(int64_t *revision) override {
        Statement statement(connection_, "SELECT coalesce(max(revision), 0) FROM revision");
        if (statement.Step()) *revision = statement.Integer(0);
        return statement.Status();
    }
    int32_t FindAsOf(const Address &address, int64_t revision, std::optional<Row> *row) override {
        const int32_t status = Find(address, row);
        if (status != OK || (*row && (*row)->revision <= revision)) return status;
        Statement statement(
            connection_,
            "SELECT revision, document FROM history_row WHERE layer = ? AND key = ? AND "
            "grp = ? AND component = ? AND instance = ? AND revision <= ? AND ended > ?6 LIMIT 1");
        BindAddress(statement, address).Bind(revision);
        return ReadRow(statement, address, row);
    }
    int32_t History(std::vector<RowInfo> *rows) override {
        Statement statement(
            connection_, "SELECT layer, key, grp, component, instance, h.revision, h.document, w.saved_ms, "
                         "length(CAST(d.text AS BLOB)), h.ended, e.saved_ms, deleted FROM history_row h "
                         "JOIN document d ON d.id = h.document JOIN revision w ON w.revision = h.revision "
                         "JOIN revision e ON e.revision = h.ended "
                         "ORDER BY h.ended DESC, layer, key, grp, component, instance");
        return ReadInfos(statement, rows);
    }
    int32_t ReadDocument(int64_t document, std::string *text) override {
        Statement statement(connection_, "SELECT text FROM document WHERE id = ?");
        statement.Bind(document);
        if (statement.Step()) {
            *text = statement.Text(0);
            return OK;
        }
        if (statement.Status() != OK) return statement.Status();
        return connection_.failures->Fail(CORRUPT, "document " + std::to_string(document) + " is missing");
    }

    int32_t VisitEverything(const RowVisitor &visit) override {
        Statement statement(connection_,
                            "SELECT layer, key, grp, component, instance, revision, document, d.text "
                            "FROM object_row o LEFT JOIN document d ON d.id = o.document UNION ALL "
                            "SELECT layer, key, grp, component, instance, revision, document, d.text "
                            "FROM history_row h LEFT JOIN document d ON d.id = h.document");
        while (statement.Step()) {
            const Row row{ReadAddress(statement), statement.Integer(5), statement.Integer(6)};
            const bool isMissing = statement.IsNull(7);
            const int32_t status = visit(row, isMissing ? std::nullopt : std::optional(statement.Text(7)));
            if (status != OK) return status;
        }
        return statement.Status();
    }
    int32_t CheckStorage(std::vector<std::string> *problems) override {
        Statement statement(connection_, "PRAGMA integrity_check");
        while (statement.Step()) {
            if (statement.Text(0) != "ok") problems->emplace_back(statement.Text(0));
        }
        return statement.Status();
    }
    int32_t Backup(const std::string &path) override {
        const int fd = open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
        if (fd < 0) {
            const int error = errno;
            return connection_.failures->Fail(error == EEXIST ? EXISTS : IO_ERROR,
                                              "backup to " + path + ": " + std::strerror(error));
        }
        close(fd);
        int32_t status = CopyInto(path);
        if (status == OK) status = SyncFile(path);
        if (status != OK) {
            (void)unlink(path.c_str());
            (void)unlink((path + "-journal").c_str());
        }
        return status;
    }

private:
    [[nodiscard]] sqlite3 *Db() const { return connection_.db.get(); }
    [[nodiscard]] int32_t Run(const char *sql) { return Execute(connection_, sql); }

    /// Columns: revision, document.
    static int32_t ReadRow(Statement &statement, const Address &address, std::optional<Row> *row) {
        row->reset();
        if (statement.Step()) *row = Row{address, statement.Integer(0), statement.Integer(1)};
        return statement.Status();
    }
    static int32_t ReadInfos(Statement &statement, std::vector<RowInfo> *rows) {
        while (statement.Step())
            rows->push_back({{ReadAddress(statement), statement.Integer(5), statement.Integer(6)},
                             statement.Integer(7),
                             static_cast<uint64_t>(statement.Integer(8)),
                             statement.Integer(9),
                             statement.Integer(10),
                             statement.Integer(11) != 0});
        return statement.Status();
    }

    /// The transaction's revision, taken at its first change.
    int32_t TakeRevision() {
        if (revision_ != 0) return OK;
        // Past the largest number, SQLite would pick any free one, and later would come before earlier.
        int64_t latest = 0;
        if (const int32_t read = LatestRevision(&latest); read != OK) return read;
        if (latest < 0 || latest == INT64_MAX)
            return connection_.failures->Fail(CORRUPT,
                                              "there is no revision after " + std::to_string(latest));
        timespec now{};
        clock_gettime(CLOCK_REALTIME, &now);
        Statement statement(connection_, "INSERT INTO revision (saved_ms) VALUES (?)");
        const int32_t status = statement.Bind(int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000).Run();
        if (status == OK) revision_ = sqlite3_last_insert_rowid(Db());
        return status;
    }
    /// Moves a present row's document to history. One that came in this very transaction was never visible and
    /// leaves nothing behind.
    int32_t End(const Row &row, bool deleted) {
        if (row.revision == revision_) return DropDocument(row.document);
        Statement statement(connection_,
                            "INSERT INTO history_row (layer, key, grp, component, instance, revision, ended, "
                            "deleted, document) VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?)");
        return BindAddress(statement, row.address)
            .Bind(row.revision)
            .Bind(revision_)
            .Bind(int64_t{deleted})
            .Bind(row.document)
            .Run();
    }
    /// A document that was brought back from history stays: its past row needs it.
    int32_t DropDocument(int64_t document) {
        Statement statement(connection_, "DELETE FROM document WHERE id = ?1 AND "
                                         "NOT EXISTS (SELECT 1 FROM history_row WHERE document = ?1) AND "
                                         "(SELECT count(*) FROM object_row WHERE document = ?1) = 1");
        return statement.Bind(document).Run();
    }

    /// Copies all pages in one step: it takes a read transaction, so that writers do not disturb it.
    int32_t CopyInto(const std::string &path) {
        const std::string name = path.front() == '/' ? path : "./" + path; // never a URI
        sqlite3 *raw = nullptr;
        const int opened = sqlite3_open_v2(name.c_str(), &raw, SQLITE_OPEN_READWRITE, nullptr);
        const Database target(raw);
        if (opened != SQLITE_OK) return FailBackup(path, raw, opened);
        sqlite3_backup *const backup = sqlite3_backup_init(raw, "main", Db(), "main");
        if (!backup) return FailBackup(path, raw, sqlite3_errcode(raw));
        const int stepped = sqlite3_backup_step(backup, -1);
        const int finished = sqlite3_backup_finish(backup);
        if (finished != SQLITE_OK || stepped != SQLITE_DONE)
            return FailBackup(path, raw, finished != SQLITE_OK ? finished : stepped);
        return OK;
    }
    int32_t FailBackup(const std::string &path, sqlite3 *target, int rc) {
        Failure failure(StatusOf(rc),
                        "backup to " + path + ": " + (target ? sqlite3_errmsg(target) : "no memory"));
        failure.sqliteCode = rc;
        return connection_.failures->Fail(std::move(failure));
    }
    int32_t SyncFile(const std::string &path) {
        const int fd = open(path.c_str(), O_RDONLY | O_CLOEXEC);
        const bool isSynced = fd >= 0 && fsync(fd) == 0;
        const int error = errno;
        if (fd >= 0) close(fd);
        if (isSynced) return OK;
        return connection_.failures->Fail(IO_ERROR, "backup to " + path + ": " + std::strerror(error));
    }

    Connection connection_;
    int64_t revision_ = 0; // of the open transaction, from its first change on
};

} // namespace

int32_t OpenSqlite(Access access, FailureKeeper *failures, std::unique_ptr<Backend> *out) {
    Connection connection;
    connection.failures = failures;
    const int32_t status = OpenDatabase(access, &connection);
    if (status == OK) *out = std::make_unique<SqliteBackend>(std::move(connection));
    return status;
}

} // namespace configstore
