/* SPDX-License-Identifier: Apache-2.0 */
// Stores and transactions of the client interface (platform/configstore.h), on the rows of store.h.

#include "platform/embedded/configstore/store.h"

#include <cstdlib>
#include <cstring>
#include <vector>

#include "platform/embedded/configstore/log.h"

namespace configstore {

namespace {

/// Owns the trees of a listing until it is complete.
using Trees = std::vector<std::unique_ptr<Tree>>;

int32_t HandOut(Trees *trees, Object ***objects, int32_t *count) {
    if (trees->size() > INT32_MAX) return FAILED;
    Object **array = nullptr;
    if (!trees->empty()) {
        array = static_cast<Object **>(std::malloc(trees->size() * sizeof(Object *)));
        if (!array) return NO_MEMORY;
        for (std::size_t i = 0; i < trees->size(); i++)
            array[i] = &(*trees)[i].release()->root;
    }
    *objects = array;
    *count = static_cast<int32_t>(trees->size());
    return OK;
}

/// An object of a listing by one who means to write: mostly to replace its content, hence as little of it as
/// will do, and its text for when it is fetched. Null for a document that is read in the ordinary way.
std::unique_ptr<Tree> ReadForRewrite(Store *store, const FilterSpec &address, int64_t document,
                                     std::string_view text) {
    auto tree = std::make_unique<Tree>(address.key, address.group, address.component, address.instance);
    const auto kept = std::make_shared<Buffer>();
    kept->Put(text);
    Outline outline;
    if (!ReadOutline(kept, tree.get(), &outline)) return nullptr;
    if (outline.field) store->readBefore[document] = {kept, outline};
    return tree;
}

int32_t List(Store *store, const char *layer, const FilterSpec &spec, Object ***objects, int32_t *count) {
    // The primary key has this order already.
    Statement statement(
        store, "SELECT instance, text, o.document FROM object_row o JOIN document d ON d.id = o.document "
               "WHERE layer = ? AND key = ? AND grp = ? AND component = ? AND (?5 = '' OR instance = ?5) "
               "ORDER BY instance");
    statement.Bind(layer).Bind(spec.key).Bind(spec.group).Bind(spec.component).Bind(spec.instance);
    Trees trees;
    while (statement.Step()) {
        const FilterSpec address{spec.key, spec.group, spec.component, std::string(statement.Text(0))};
        std::unique_ptr<Tree> tree =
            store->inTransaction ? ReadForRewrite(store, address, statement.Integer(2), statement.Text(1))
                                 : nullptr;
        if (!tree) {
            const int32_t status = LoadTree(store, address, statement.Text(1), &tree);
            if (status != OK) return status;
        }
        trees.push_back(std::move(tree));
    }
    return statement.Status() == OK ? HandOut(&trees, objects, count) : statement.Status();
}

/// The object from what the transaction remembers of it. Whatever goes wrong is for the ordinary way to find.
bool FetchAgain(Store *store, const FilterSpec &address, Object **object) {
    if (store->readBefore.empty()) return false;
    std::optional<Row> row;
    if (FindRow(store, kCurrentLayer, address, &row) != OK || !row) return false;
    const auto known = store->readBefore.find(row->document);
    if (known == store->readBefore.end()) return false;
    auto tree = std::make_unique<Tree>(address.key, address.group, address.component, address.instance);
    if (!ReadAgain(known->second.text, known->second.outline, tree.get())) return false;
    *object = &tree.release()->root;
    return true;
}

int32_t RefuseReadOnly(const Store *store) {
    Log("config store %s: the file cannot be written to", store->path.c_str());
    return IO_ERROR;
}

int32_t EndTransaction(Store *store, const char *sql) {
    const int32_t status = Execute(store, sql);
    if (status != OK) return status;
    store->readBefore.clear();
    store->inTransaction = false;
    store->revision = 0;
    return OK;
}

} // namespace

int32_t GetStore(Store **store) {
    if (!store) return BAD_PARAMETER;
    return Guarded([&] {
        std::unique_ptr<Store> opened;
        const int32_t status = OpenStore(StorePath(), Access::ReadWrite, &opened);
        if (status == OK) *store = opened.release();
        return status;
    });
}

void DestroyStore(Store *store) {
    delete store;
}

int32_t BeginTransaction(Store *store) {
    if (!store || store->inTransaction) return BAD_PARAMETER;
    return Guarded([&]() -> int32_t {
        // A caller whose begin fails leaves its lock held. So a begin always succeeds, and what kept it from
        // doing so is the answer of every call until the caller cancels, which it then does in its ordinary
        // way.
        store->refusal = store->readOnly ? RefuseReadOnly(store) : Execute(store, "BEGIN IMMEDIATE");
        store->inTransaction = true;
        store->revision = 0;
        return OK;
    });
}

int32_t CommitTransaction(Store *store) {
    if (!store || !store->inTransaction) return BAD_PARAMETER;
    if (store->refusal != OK) return store->refusal;
    return Guarded([&] { return EndTransaction(store, "COMMIT"); });
}

int32_t CancelTransaction(Store *store) {
    if (!store || !store->inTransaction) return BAD_PARAMETER;
    return Guarded([&] {
        store->refusal = OK;
        if (!sqlite3_get_autocommit(store->db.get())) return EndTransaction(store, "ROLLBACK");
        store->readBefore.clear();
        store->inTransaction = false;
        store->revision = 0;
        return static_cast<int32_t>(OK);
    });
}

int32_t GetInstances(Store *store, const FilterSpec *spec, Object ***objects, int32_t *count) {
    if (!spec || !objects || !count) return BAD_PARAMETER;
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] { return List(store, kCurrentLayer, *spec, objects, count); });
}

int32_t GetDesiredUserConfigInstances(Store *store, const char *key, const char *group, const char *component,
                                      Object ***objects, int32_t *count) {
    if (!key || !group || !component || !objects || !count) return BAD_PARAMETER;
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] { return List(store, kDesiredLayer, {key, group, component, {}}, objects, count); });
}

int32_t Get(Store *store, const char *key, const char *group, const char *component, const char *instanceId,
            Object **object) {
    if (!key || !group || !component || !object) return BAD_PARAMETER;
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&]() -> int32_t {
        const FilterSpec address{key, group, component, instanceId ? instanceId : ""};
        if (FetchAgain(store, address, object)) return OK;
        Statement statement(store,
                            "SELECT text FROM object_row o JOIN document d ON d.id = o.document "
                            "WHERE layer = ? AND key = ? AND grp = ? AND component = ? AND instance = ?");
        statement.Bind(kCurrentLayer)
            .Bind(address.key)
            .Bind(address.group)
            .Bind(address.component)
            .Bind(address.instance);
        if (!statement.Step())
            return statement.Status() == OK ? static_cast<int32_t>(NOT_FOUND) : statement.Status();
        std::unique_ptr<Tree> tree;
        const int32_t status = LoadTree(store, address, statement.Text(0), &tree);
        if (status == OK) *object = &tree.release()->root;
        return status;
    });
}

int32_t Set(Store *store, Object *object, const char *source) {
    if (!object || !object->isRoot || object->kind != Kind::Object || !source) return BAD_PARAMETER;
    const char *const layer = std::strcmp(source, "EXTERNAL") == 0 ? kCurrentLayer
                              : std::strcmp(source, "USER") == 0   ? kDesiredLayer
                                                                   : nullptr;
    if (!layer) return BAD_PARAMETER;
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] { return SaveTree(store, layer, TreeOf(object)); });
}

int32_t Delete(Store *store, const char *key, const char *group, const char *component,
               const char *instanceId) {
    if (!key || !group || !component) return BAD_PARAMETER;
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        OwnTransaction transaction(store);
        int32_t status = transaction.Status();
        if (status == OK)
            status = DeleteRow(store, kCurrentLayer, {key, group, component, instanceId ? instanceId : ""});
        return status == OK ? transaction.Commit() : status;
    });
}

} // namespace configstore
