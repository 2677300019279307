/* SPDX-License-Identifier: Apache-2.0 */
// The operators' functions (admin.h) about the past: history, restoring, and the check of everything stored.

#include "platform/embedded/configstore/admin.h"

#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/log.h"
#include "platform/embedded/configstore/store.h"

namespace configstore::admin {

namespace {

Address ReadAddress(Statement &statement) {
    return {statement.Text(0) == kDesiredLayer ? Layer::Desired : Layer::Current,
            std::string(statement.Text(1)), std::string(statement.Text(2)), std::string(statement.Text(3)),
            std::string(statement.Text(4))};
}

FilterSpec SpecOf(const Address &address) {
    return {address.key, address.group, address.component, address.instance};
}

/// The row that the object had as of a revision: its present one if that is old enough, or a past one.
int32_t FindRowAsOf(Store *store, const Address &address, int64_t revision, std::optional<Row> *row) {
    int32_t status = FindRow(store, LayerName(address.layer), SpecOf(address), row);
    if (status != OK || (*row && (*row)->revision <= revision)) return status;
    row->reset();
    Statement statement(
        store, "SELECT revision, document FROM history_row WHERE layer = ? AND key = ? AND grp = ? AND "
               "component = ? AND instance = ? AND revision <= ? AND ended > ?6 LIMIT 1");
    statement.Bind(LayerName(address.layer)).Bind(address.key).Bind(address.group);
    statement.Bind(address.component).Bind(address.instance).Bind(revision);
    if (statement.Step()) *row = Row{statement.Integer(0), statement.Integer(1)};
    return statement.Status();
}

/// A revision that is still to come says nothing about what was.
int32_t CheckRevision(Store *store, int64_t revision) {
    int64_t latest = 0;
    const int32_t status = LatestRevision(store, &latest);
    if (status != OK) return status;
    return revision >= 0 && revision <= latest ? OK : NOT_FOUND;
}

int32_t ReadAddresses(Store *store, std::vector<Address> *addresses) {
    Statement statement(store, "SELECT layer, key, grp, component, instance FROM object_row UNION "
                               "SELECT layer, key, grp, component, instance FROM history_row");
    while (statement.Step())
        addresses->push_back(ReadAddress(statement));
    return statement.Status();
}

int32_t RestoreOne(Store *store, const Address &address, int64_t revision, std::vector<Change> *changes) {
    std::optional<Row> then;
    std::optional<Row> now;
    int32_t status = FindRowAsOf(store, address, revision, &then);
    if (status == OK) status = FindRow(store, LayerName(address.layer), SpecOf(address), &now);
    if (status != OK || (!then && !now) || (then && now && then->document == now->document)) return status;
    changes->push_back({!now ? Change::Added : !then ? Change::Deleted : Change::Replaced, address});
    if (!then) return DeleteRow(store, LayerName(address.layer), SpecOf(address));
    return PutRow(store, LayerName(address.layer), SpecOf(address), then->document);
}

void CheckText(const Address &address, const std::string &where, std::string_view text,
               std::vector<Problem> *problems) {
    Tree tree(address.key, address.group, address.component, address.instance);
    std::string why;
    if (!ReadDocument(text, Reading::Tolerant, &tree, &why))
        problems->push_back({where, why});
    else if (const Object *const bad = FindViolation(&tree))
        problems->push_back({where + ": " + PathOf(bad), Describe(bad)});
}

int32_t CheckDocuments(Store *store, const char *sql, std::vector<Problem> *problems) {
    Statement statement(store, sql);
    while (statement.Step()) {
        const Address address = ReadAddress(statement);
        const std::string where = std::string(LayerName(address.layer)) + ' ' + address.key + '/' +
                                  address.group + '/' + address.component + '[' + address.instance +
                                  "] of revision " + std::to_string(statement.Integer(5));
        if (statement.Text(7) == "null")
            problems->push_back({where, "the document is missing"});
        else
            CheckText(address, where, statement.Text(6), problems);
    }
    return statement.Status();
}

int32_t CheckDatabase(Store *store, std::vector<Problem> *problems) {
    Statement statement(store, "PRAGMA integrity_check");
    while (statement.Step()) {
        if (statement.Text(0) != "ok") problems->push_back({store->path, std::string(statement.Text(0))});
    }
    return statement.Status();
}

} // namespace

int32_t LatestRevision(Store *store, int64_t *revision) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        Statement statement(store, "SELECT coalesce(max(revision), 0) FROM revision");
        if (statement.Step()) *revision = statement.Integer(0);
        return statement.Status();
    });
}

int32_t History(Store *store, std::vector<PastEntry> *entries) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        Statement statement(store,
                            "SELECT layer, key, grp, component, instance, h.revision, w.saved_ms, h.ended, "
                            "e.saved_ms, deleted, length(CAST(d.text AS BLOB)) FROM history_row h "
                            "JOIN document d ON d.id = h.document JOIN revision w ON w.revision = h.revision "
                            "JOIN revision e ON e.revision = h.ended "
                            "ORDER BY h.ended DESC, layer, key, grp, component, instance");
        std::vector<PastEntry> found;
        while (statement.Step()) {
            PastEntry past{};
            past.entry.address = ReadAddress(statement);
            past.entry.revision = statement.Integer(5);
            past.entry.savedMs = statement.Integer(6);
            past.entry.bytes = static_cast<uint64_t>(statement.Integer(10));
            past.ended = statement.Integer(7);
            past.endedMs = statement.Integer(8);
            past.deleted = statement.Integer(9) != 0;
            found.push_back(std::move(past));
        }
        if (statement.Status() == OK) *entries = std::move(found);
        return statement.Status();
    });
}

int32_t ExportAsOf(Store *store, const Address &address, int64_t revision, std::string *json) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        int32_t status = CheckRevision(store, revision);
        std::optional<Row> row;
        if (status == OK) status = FindRowAsOf(store, address, revision, &row);
        if (status != OK || !row) return status == OK ? static_cast<int32_t>(NOT_FOUND) : status;
        Statement statement(store, "SELECT text FROM document WHERE id = ?");
        statement.Bind(row->document);
        if (!statement.Step())
            return statement.Status() == OK ? static_cast<int32_t>(CORRUPT) : statement.Status();
        *json = statement.Text(0);
        return static_cast<int32_t>(OK);
    });
}

int32_t RestoreObject(Store *store, const Address &address, int64_t revision) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        OwnTransaction transaction(store);
        int32_t status = transaction.Status();
        if (status == OK) status = CheckRevision(store, revision);
        std::optional<Row> row;
        if (status == OK) status = FindRowAsOf(store, address, revision, &row);
        if (status == OK && !row) status = NOT_FOUND;
        std::vector<Change> changes;
        if (status == OK) status = RestoreOne(store, address, revision, &changes);
        return status == OK ? transaction.Commit() : status;
    });
}

int32_t RestoreStore(Store *store, int64_t revision, std::vector<Change> *changes) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        OwnTransaction transaction(store);
        int32_t status = transaction.Status();
        if (status == OK) status = CheckRevision(store, revision);
        std::vector<Address> addresses;
        std::vector<Change> made;
        if (status == OK) status = ReadAddresses(store, &addresses);
        for (std::size_t i = 0; status == OK && i < addresses.size(); i++)
            status = RestoreOne(store, addresses[i], revision, &made);
        if (status == OK) status = transaction.Commit();
        if (status == OK) *changes = std::move(made);
        return status;
    });
}

int32_t Check(Store *store, std::vector<Problem> *problems) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        int32_t status = CheckDatabase(store, problems);
        if (status == OK)
            status = CheckDocuments(
                store,
                "SELECT layer, key, grp, component, instance, revision, d.text, typeof(d.text) "
                "FROM object_row o LEFT JOIN document d ON d.id = o.document",
                problems);
        if (status == OK)
            status = CheckDocuments(
                store,
                "SELECT layer, key, grp, component, instance, revision, d.text, typeof(d.text) "
                "FROM history_row h LEFT JOIN document d ON d.id = h.document",
                problems);
        return status;
    });
}

} // namespace configstore::admin
