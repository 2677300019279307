/* SPDX-License-Identifier: Apache-2.0 */
// The operators' functions (admin.h) about the past: history, restoring, and the check of everything stored.

#include "platform/embedded/configstore/admin.h"

#include <set>

#include "platform/embedded/configstore/store.h"

namespace configstore::admin {

namespace {

/// NOT_FOUND for a revision that is still to come.
int32_t CheckRevision(Store *store, int64_t revision) {
    int64_t latest = 0;
    const int32_t status = store->backend->LatestRevision(&latest);
    if (status != OK) return status;
    return revision >= 0 && revision <= latest ? OK : NOT_FOUND;
}

/// The row of an object as of a revision. NOT_FOUND if it had none then, or the revision is still to come.
int32_t FindAsOf(Store *store, const Address &address, int64_t revision, Row *row) {
    int32_t status = CheckRevision(store, revision);
    std::optional<Row> found;
    if (status == OK) status = store->backend->FindAsOf(address, revision, &found);
    if (status == OK && !found) return NOT_FOUND;
    if (status == OK) *row = std::move(*found);
    return status;
}

int32_t ReadAddresses(Store *store, std::set<Address> *addresses) {
    std::vector<Entry> rows;
    int32_t status = store->backend->List(&rows);
    if (status == OK) status = store->backend->History(&rows);
    for (Entry &row : rows)
        addresses->insert(std::move(row.address));
    return status;
}

int32_t RestoreOne(Store *store, const Address &address, int64_t revision, std::vector<Change> *changes) {
    std::optional<Row> then;
    std::optional<Row> now;
    int32_t status = store->backend->FindAsOf(address, revision, &then);
    if (status == OK) status = store->backend->Find(address, &now);
    if (status != OK || (!then && !now) || (then && now && then->document == now->document)) return status;
    changes->push_back({!now ? Change::Added : !then ? Change::Deleted : Change::Replaced, address});
    return then ? store->backend->PutBack(address, then->document) : store->backend->Delete(address);
}

void CheckText(const Address &address, const std::string &where, std::string_view text,
               std::vector<Problem> *problems) {
    Tree tree(address);
    std::string why;
    if (!configstore::ReadDocument(text, Reading::Tolerant, &tree, &why))
        problems->push_back({where, why});
    else if (const Object *const bad = FindViolation(&tree))
        problems->push_back({where + ": " + PathOf(bad), Describe(bad)});
}

int32_t CheckStorage(Store *store, std::vector<Problem> *problems) {
    std::vector<std::string> found;
    const int32_t status = store->backend->CheckStorage(&found);
    for (std::string &problem : found)
        problems->push_back({store->failures.Path(), std::move(problem)});
    return status;
}

int32_t CheckDocuments(Store *store, std::vector<Problem> *problems) {
    return store->backend->VisitEverything([&](const Row &row, std::optional<std::string_view> text) {
        const std::string where = std::string(LayerName(row.address.layer)) + ' ' + AddressText(row.address) +
                                  " of revision " + std::to_string(row.revision);
        if (text)
            CheckText(row.address, where, *text, problems);
        else
            problems->push_back({where, "the document is missing"});
        return OK;
    });
}

} // namespace

int32_t LatestRevision(Store *store, int64_t *revision) {
    return Call(store, [&] { return store->backend->LatestRevision(revision); });
}

int32_t History(Store *store, std::vector<Entry> *entries) {
    return Call(store, [&] {
        std::vector<Entry> found;
        const int32_t status = store->backend->History(&found);
        if (status == OK) *entries = std::move(found);
        return status;
    });
}

int32_t ExportAsOf(Store *store, const Address &address, int64_t revision, std::string *json) {
    return Call(store, [&] {
        Row row;
        const int32_t status = FindAsOf(store, address, revision, &row);
        return status == OK ? store->backend->ReadDocument(row.document, json) : status;
    });
}

int32_t RestoreObject(Store *store, const Address &address, int64_t revision) {
    return Call(store, [&] {
        OwnTransaction transaction(store);
        int32_t status = transaction.Status();
        Row row;
        if (status == OK) status = FindAsOf(store, address, revision, &row);
        std::vector<Change> changes;
        if (status == OK) status = RestoreOne(store, address, revision, &changes);
        return status == OK ? transaction.Commit() : status;
    });
}

int32_t RestoreStore(Store *store, int64_t revision, std::vector<Change> *changes) {
    return Call(store, [&] {
        OwnTransaction transaction(store);
        int32_t status = transaction.Status();
        if (status == OK) status = CheckRevision(store, revision);
        std::set<Address> addresses;
        if (status == OK) status = ReadAddresses(store, &addresses);
        std::vector<Change> made;
        for (auto at = addresses.begin(); status == OK && at != addresses.end(); ++at)
            status = RestoreOne(store, *at, revision, &made);
        if (status == OK) status = transaction.Commit();
        if (status == OK) *changes = std::move(made);
        return status;
    });
}

int32_t Check(Store *store, std::vector<Problem> *problems) {
    return Call(store, [&] {
        const int32_t status = CheckStorage(store, problems);
        return status == OK ? CheckDocuments(store, problems) : status;
    });
}

} // namespace configstore::admin
