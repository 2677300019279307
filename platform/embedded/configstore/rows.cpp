/* SPDX-License-Identifier: Apache-2.0 */
// Rows and their history (store.h). A row's present document is never overwritten: it is given an end, in the
// transaction that gives the object another one.

#include <ctime>

#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/log.h"
#include "platform/embedded/configstore/store.h"

namespace configstore {

namespace {

Statement &BindAddress(Statement &statement, const char *layer, const FilterSpec &address) {
    return statement.Bind(layer)
        .Bind(address.key)
        .Bind(address.group)
        .Bind(address.component)
        .Bind(address.instance);
}

/// The transaction's revision, taken at its first change.
int32_t TakeRevision(Store *store) {
    if (store->revision != 0) return OK;
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    Statement statement(store, "INSERT INTO revision (saved_ms) VALUES (?)");
    statement.Bind(int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000);
    const int32_t status = statement.Run();
    if (status == OK) store->revision = sqlite3_last_insert_rowid(store->db.get());
    return status;
}

/// Deletes a document of this transaction's own; one that was brought back from history belongs there too.
int32_t DropDocument(Store *store, int64_t document) {
    Statement statement(store, "DELETE FROM document WHERE id = ?1 AND "
                               "NOT EXISTS (SELECT 1 FROM history_row WHERE document = ?1) AND "
                               "(SELECT count(*) FROM object_row WHERE document = ?1) = 1");
    return statement.Bind(document).Run();
}

/// Puts the row's document into history, unless it has come and gone within one transaction and was never to
/// be seen.
int32_t EndRow(Store *store, const char *layer, const FilterSpec &address, const Row &row, bool deleted) {
    if (row.revision == store->revision) return DropDocument(store, row.document);
    Statement statement(
        store, "INSERT INTO history_row (layer, key, grp, component, instance, revision, ended, deleted, "
               "document) VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?)");
    BindAddress(statement, layer, address)
        .Bind(row.revision)
        .Bind(store->revision)
        .Bind(int64_t{deleted})
        .Bind(row.document);
    return statement.Run();
}

} // namespace

OwnTransaction::OwnTransaction(Store *store) : store_(store), own_(!store->inTransaction), status_(OK) {
    if (own_) {
        store_->revision = 0;
        status_ = Execute(store_, "BEGIN IMMEDIATE");
        if (status_ != OK) own_ = false;
    }
}

OwnTransaction::~OwnTransaction() {
    if (own_ && !sqlite3_get_autocommit(store_->db.get())) (void)Execute(store_, "ROLLBACK");
    if (own_) store_->revision = 0;
}

int32_t OwnTransaction::Commit() {
    return own_ ? Execute(store_, "COMMIT") : static_cast<int32_t>(OK);
}

int32_t FindRow(Store *store, const char *layer, const FilterSpec &address, std::optional<Row> *row) {
    Statement statement(store, "SELECT revision, document FROM object_row "
                               "WHERE layer = ? AND key = ? AND grp = ? AND component = ? AND instance = ?");
    BindAddress(statement, layer, address);
    row->reset();
    if (statement.Step()) *row = Row{statement.Integer(0), statement.Integer(1)};
    return statement.Status();
}

int32_t AddDocument(Store *store, std::string_view text, int64_t *id) {
    Statement statement(store, "INSERT INTO document (text) VALUES (?)");
    const int32_t status = statement.Bind(text).Run();
    if (status == OK) {
        *id = sqlite3_last_insert_rowid(store->db.get());
        store->readBefore.erase(*id); // deleted since, and the number given out again
    }
    return status;
}

int32_t PutRow(Store *store, const char *layer, const FilterSpec &address, int64_t document) {
    int32_t status = TakeRevision(store);
    std::optional<Row> row;
    if (status == OK) status = FindRow(store, layer, address, &row);
    if (status == OK && row) status = EndRow(store, layer, address, *row, false);
    if (status != OK) return status;
    Statement statement(store,
                        "REPLACE INTO object_row (layer, key, grp, component, instance, revision, document) "
                        "VALUES (?, ?, ?, ?, ?, ?, ?)");
    return BindAddress(statement, layer, address).Bind(store->revision).Bind(document).Run();
}

int32_t DeleteRow(Store *store, const char *layer, const FilterSpec &address) {
    std::optional<Row> row;
    int32_t status = FindRow(store, layer, address, &row);
    if (status != OK) return status;
    if (!row) return NOT_FOUND;
    status = TakeRevision(store);
    if (status == OK) status = EndRow(store, layer, address, *row, true);
    if (status != OK) return status;
    Statement statement(store, "DELETE FROM object_row "
                               "WHERE layer = ? AND key = ? AND grp = ? AND component = ? AND instance = ?");
    return BindAddress(statement, layer, address).Run();
}

int32_t LoadTree(const Store *store, const FilterSpec &address, std::string_view text,
                 std::unique_ptr<Tree> *tree) {
    auto loaded = std::make_unique<Tree>(address.key, address.group, address.component, address.instance);
    std::string why;
    if (!ReadDocument(text, Reading::Tolerant, loaded.get(), &why)) {
        Log("config store %s: the document of %s/%s/%s[%s] is damaged: %s", store->path.c_str(),
            address.key.c_str(), address.group.c_str(), address.component.c_str(), address.instance.c_str(),
            why.c_str());
        return CORRUPT;
    }
    *tree = std::move(loaded);
    return OK;
}

int32_t SaveTree(Store *store, const char *layer, Tree *tree) {
    if (const Object *const bad = FindViolation(tree)) {
        Log("config store %s: %s/%s/%s[%s]: %s: %s", store->path.c_str(), tree->key.c_str(),
            tree->group.c_str(), tree->component.c_str(), tree->instance.c_str(), PathOf(bad).c_str(),
            Describe(bad).c_str());
        return SCHEMA_VIOLATION;
    }
    for (Object *member = tree->root.members.first; member; member = member->next) {
        if (member->kind == Kind::Later) (void)Expand(tree, member); // a document is written in one form
    }
    Buffer text;
    WriteDocument(*tree, &text);
    OwnTransaction transaction(store);
    int32_t status = transaction.Status();
    int64_t document = 0;
    if (status == OK) status = AddDocument(store, text.View(), &document);
    if (status == OK)
        status = PutRow(store, layer, {tree->key, tree->group, tree->component, tree->instance}, document);
    return status == OK ? transaction.Commit() : status;
}

} // namespace configstore
