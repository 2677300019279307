/* SPDX-License-Identifier: Apache-2.0 */
// The operators' functions (admin.h): opening, listing, documents in and out, backup.

#include "platform/embedded/configstore/admin.h"

#include "platform/embedded/configstore/oracle.h"
#include "platform/embedded/configstore/store.h"

namespace configstore::admin {

namespace {

/// The compiled check is cheap and comes first, so that the general validator sees sound documents only.
int32_t CheckCompiled(const std::string &key, const std::string &group, std::string_view json,
                      std::vector<Problem> *problems) {
    Tree tree({Layer::Current, key, group, {}, {}});
    if (!tree.shape) {
        problems->push_back({key + '/' + group, "there is no schema for such objects"});
        return BAD_PARAMETER;
    }
    std::string why, where;
    if (!configstore::ReadDocument(json, Reading::Strict, &tree, &why, &where)) {
        problems->push_back({where, why});
        return BAD_PARAMETER;
    }
    const Object *const bad = FindViolation(&tree);
    if (bad) problems->push_back({PathOf(bad), Describe(bad)});
    return bad ? SCHEMA_VIOLATION : OK;
}

/// The record of a refused import has the first problem.
int32_t FailImport(Store *store, const Address &address, int32_t status,
                   const std::vector<Problem> &problems) {
    if (problems.empty()) return status;
    const Problem &first = problems.front();
    Failure failure(status, std::string("import of ") + LayerName(address.layer) + ' ' +
                                AddressText(address) + ": " + first.where +
                                (first.where.empty() ? "" : ": ") + first.what);
    failure.address = address;
    failure.field = first.where;
    return store->failures.Fail(std::move(failure));
}

} // namespace

const char *StatusText(int32_t status) {
    switch (status) {
    case OK:
        return "done";
    case BUSY:
        return "another process is writing to the config store";
    case BAD_PARAMETER:
        return "not something the config store can take";
    case SCHEMA_VIOLATION:
        return "the schema does not allow it";
    case EXISTS:
        return "it exists already";
    case NOT_FOUND:
        return "not there";
    case CORRUPT:
        return "the config store is damaged";
    case IO_ERROR:
        return "the config store cannot be read or written";
    case NO_MEMORY:
        return "out of memory";
    default:
        return "the config store failed";
    }
}

int32_t Open(const std::string &path, bool readOnly, Store **store, Failure *failure) {
    if (!store) return BAD_PARAMETER;
    return Guarded([&] {
        return OpenStore(path.empty() ? StorePath() : path, readOnly ? Access::ReadOnly : Access::ReadWrite,
                         FailureKeeper::Log::No, store, failure);
    });
}

int32_t OpenInMemory(Store **store) {
    if (!store) return BAD_PARAMETER;
    return Guarded([&] {
        auto opened = std::make_unique<Store>(":memory:", FailureKeeper::Log::No);
        opened->backend = OpenMemory(NewMemoryDatabase(), &opened->failures);
        *store = opened.release();
        return OK;
    });
}

std::string DefaultPath() {
    return StorePath();
}

void SetBusyTimeout(Store *store, int milliseconds) {
    store->backend->SetBusyTimeout(milliseconds);
}

const Failure *LastFailure(const Store *store) {
    return store->failures.Last();
}

int32_t List(Store *store, std::vector<Entry> *entries) {
    return Call(store, [&] {
        std::vector<Entry> found;
        const int32_t status = store->backend->List(&found);
        if (status == OK) *entries = std::move(found);
        return status;
    });
}

int32_t Export(Store *store, const Address &address, std::string *json) {
    return Call(store, [&] {
        bool isThere = false;
        const int32_t status = store->backend->Visit(address, Select::One,
                                                     [&](const Row &, std::optional<std::string_view> text) {
                                                         isThere = true;
                                                         *json = *text;
                                                         return OK;
                                                     });
        return status == OK && !isThere ? static_cast<int32_t>(NOT_FOUND) : status;
    });
}

int32_t CheckDocument(const std::string &key, const std::string &group, std::string_view json,
                      std::vector<Problem> *problems) {
    return Guarded([&]() -> int32_t {
        const int32_t status = CheckCompiled(key, group, json, problems);
        if (status != OK) return status;
        static const Oracle oracle(SchemaText(key, group), Strictness::Import);
        std::vector<Finding> findings;
        if (oracle.Accepts(json, &findings)) return OK;
        for (Finding &finding : findings)
            problems->push_back({std::move(finding.path), std::move(finding.what)});
        return SCHEMA_VIOLATION;
    });
}

int32_t Import(Store *store, const Address &address, std::string_view json, std::vector<Problem> *problems) {
    return Call(store, [&] {
        const int32_t checked = CheckDocument(address.key, address.group, json, problems);
        if (checked != OK) return FailImport(store, address, checked, *problems);
        std::unique_ptr<Tree> tree;
        const int32_t status = LoadTree(store, address, json, &tree);
        return status == OK ? SaveTree(store, address.layer, tree.get()) : status;
    });
}

int32_t Delete(Store *store, const Address &address) {
    return Call(store, [&] {
        OwnTransaction transaction(store);
        int32_t status = transaction.Status();
        if (status == OK) status = store->backend->Delete(address);
        return status == OK ? transaction.Commit() : status;
    });
}

int32_t CopyPresent(Store *from, Store *to) {
    std::vector<Entry> entries;
    if (const int32_t status = List(from, &entries); status != OK) return status;
    return Call(to, [&] {
        OwnTransaction transaction(to);
        int32_t status = transaction.Status();
        for (std::size_t i = 0; status == OK && i < entries.size(); i++) {
            std::string text;
            int64_t document = 0;
            status = Export(from, entries[i].address, &text);
            if (status == OK) status = to->backend->Put(entries[i].address, text, &document);
        }
        return status == OK ? transaction.Commit() : status;
    });
}

int32_t Backup(Store *store, const std::string &path) {
    return Call(store, [&] { return store->backend->Backup(path); });
}

std::string_view Schema(std::string_view key, std::string_view group) {
    return SchemaText(key, group);
}

} // namespace configstore::admin
