/* SPDX-License-Identifier: Apache-2.0 */
// Stores, transactions and objects of the client interface (platform/configstore.h), on a backend.

#include "platform/embedded/configstore/store.h"

#include <cstdlib>
#include <cstring>
#include <vector>

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

/// An object of a listing in a transaction. The caller mostly replaces its content, so as little of it as
/// possible is read, and its text is kept for when it is fetched. Null for a document that has to be read in
/// the ordinary way.
std::unique_ptr<Tree> ReadForRewrite(Store *store, const Row &row, std::string_view text) {
    auto tree = std::make_unique<Tree>(row.address);
    const auto kept = std::make_shared<Buffer>();
    kept->Put(text);
    Outline outline;
    if (!ReadOutline(kept, tree.get(), &outline)) return nullptr;
    if (outline.field) store->readBefore[row.document] = {kept, outline};
    return tree;
}

int32_t List(Store *store, const Address &address, Object ***objects, int32_t *count) {
    Trees trees;
    const int32_t status = store->backend->Visit(
        address, Select::Instances, [&](const Row &row, std::optional<std::string_view> text) {
            std::unique_ptr<Tree> tree;
            if (store->inTransaction) tree = ReadForRewrite(store, row, *text);
            const int32_t loaded =
                tree ? static_cast<int32_t>(OK) : LoadTree(store, row.address, *text, &tree);
            if (loaded == OK) trees.push_back(std::move(tree));
            return loaded;
        });
    return status == OK ? HandOut(&trees, objects, count) : status;
}

/// The object from what the transaction remembers of it. On any failure, the ordinary way finds it again.
bool FetchAgain(Store *store, const Address &address, std::unique_ptr<Tree> *tree) {
    if (store->readBefore.empty()) return false;
    std::optional<Row> row;
    if (store->backend->Find(address, &row) != OK || !row) return false;
    const auto known = store->readBefore.find(row->document);
    if (known == store->readBefore.end()) return false;
    auto again = std::make_unique<Tree>(address);
    if (!ReadAgain(known->second.text, known->second.outline, again.get())) return false;
    *tree = std::move(again);
    return true;
}

int32_t Fetch(Store *store, const Address &address, std::unique_ptr<Tree> *tree) {
    if (FetchAgain(store, address, tree)) return OK;
    const int32_t status =
        store->backend->Visit(address, Select::One, [&](const Row &, std::optional<std::string_view> text) {
            return LoadTree(store, address, *text, tree);
        });
    return status == OK && !*tree ? static_cast<int32_t>(NOT_FOUND) : status;
}

void EndTransaction(Store *store) {
    store->readBefore.clear();
    store->inTransaction = false;
    store->refusal = OK;
}

} // namespace

int32_t GetStore(Store **store) {
    if (!store) return BAD_PARAMETER;
    return Guarded(
        [&] { return OpenStore(StorePath(), Access::ReadWrite, FailureKeeper::Log::Yes, store, nullptr); });
}

void DestroyStore(Store *store) {
    delete store;
}

int32_t BeginTransaction(Store *store) {
    if (!store || store->inTransaction) return BAD_PARAMETER;
    return Guarded([&]() -> int32_t {
        // Callers whose begin fails leave their lock held. So a begin always succeeds, and the reason why it
        // could not is the result of every call until the caller cancels in its ordinary way.
        store->failures.Clear();
        store->refusal = store->backend->IsReadOnly()
                             ? store->failures.Fail(IO_ERROR, "the file cannot be written to")
                             : store->backend->Begin();
        store->inTransaction = true;
        return OK;
    });
}

int32_t CommitTransaction(Store *store) {
    if (!store || !store->inTransaction) return BAD_PARAMETER;
    return Call(store, [&] {
        const int32_t status = store->backend->Commit();
        if (status == OK) EndTransaction(store);
        return status;
    });
}

int32_t CancelTransaction(Store *store) {
    if (!store || !store->inTransaction) return BAD_PARAMETER;
    return Guarded([&] {
        store->refusal = OK;
        const int32_t status = store->backend->Cancel();
        if (status == OK) EndTransaction(store);
        return status;
    });
}

int32_t GetInstances(Store *store, const FilterSpec *spec, Object ***objects, int32_t *count) {
    if (!spec || !objects || !count) return BAD_PARAMETER;
    return Call(store, [&] {
        return List(store, {Layer::Current, spec->key, spec->group, spec->component, spec->instance}, objects,
                    count);
    });
}

int32_t GetDesiredUserConfigInstances(Store *store, const char *key, const char *group, const char *component,
                                      Object ***objects, int32_t *count) {
    if (!key || !group || !component || !objects || !count) return BAD_PARAMETER;
    return Call(store, [&] {
        return List(store, {Layer::Desired, key, group, component, {}}, objects, count);
    });
}

int32_t Get(Store *store, const char *key, const char *group, const char *component, const char *instanceId,
            Object **object) {
    if (!key || !group || !component || !object) return BAD_PARAMETER;
    return Call(store, [&] {
        std::unique_ptr<Tree> tree;
        const Address address{Layer::Current, key, group, component, instanceId ? instanceId : ""};
        const int32_t status = Fetch(store, address, &tree);
        if (status == OK) *object = &tree.release()->root;
        return status;
    });
}

int32_t Set(Store *store, Object *object, const char *source) {
    if (!object || !object->isRoot || object->kind != Kind::Object || !source) return BAD_PARAMETER;
    const bool isCurrent = std::strcmp(source, "EXTERNAL") == 0;
    if (!isCurrent && std::strcmp(source, "USER") != 0) return BAD_PARAMETER;
    return Call(store,
                [&] { return SaveTree(store, isCurrent ? Layer::Current : Layer::Desired, TreeOf(object)); });
}

int32_t Delete(Store *store, const char *key, const char *group, const char *component,
               const char *instanceId) {
    if (!key || !group || !component) return BAD_PARAMETER;
    return Call(store, [&] {
        OwnTransaction transaction(store);
        int32_t status = transaction.Status();
        if (status == OK)
            status =
                store->backend->Delete({Layer::Current, key, group, component, instanceId ? instanceId : ""});
        return status == OK ? transaction.Commit() : status;
    });
}

} // namespace configstore
