/* SPDX-License-Identifier: Apache-2.0 */
// Filling and reading the copy (scratch.h).

#include "tools/dvsctl/store/scratch.h"

#include "tools/dvsctl/sources/files.h"

namespace dvs::ctl {

namespace {

constexpr const char *kMemory = ":memory:";

std::vector<ScratchStore::Object> ReadAll(configstore::Store *store, std::int32_t *status) {
    std::vector<admin::Entry> entries;
    std::vector<ScratchStore::Object> objects;
    *status = admin::List(store, &entries);
    for (std::size_t i = 0; *status == configstore::OK && i < entries.size(); ++i) {
        std::string document;
        *status = admin::Export(store, entries[i].address, &document);
        objects.push_back({entries[i].address, std::move(document)});
    }
    return objects;
}

// As a save would put it, not as an import: what the store holds may be more than an import takes.
std::int32_t PutObject(configstore::Store *store, const ScratchStore::Object &from) {
    configstore::Object *object = nullptr;
    const admin::Address &at = from.address;
    std::int32_t status = configstore::CreateObject(at.key.c_str(), at.group.c_str(), at.component.c_str(),
                                                    at.instance.c_str(), from.document.c_str(), &object);
    if (status != configstore::OK) return status;
    status = configstore::Set(store, object, at.layer == admin::Layer::Current ? "EXTERNAL" : "USER");
    configstore::DestroyObject(object);
    return status;
}

std::int32_t Fill(configstore::Store *store, const std::vector<ScratchStore::Object> &objects) {
    std::int32_t status = configstore::BeginTransaction(store);
    for (std::size_t i = 0; status == configstore::OK && i < objects.size(); ++i)
        status = PutObject(store, objects[i]);
    return status == configstore::OK ? configstore::CommitTransaction(store) : status;
}

} // namespace

ScratchStore::ScratchStore(Context &context, const std::string &path) : path_(path) {
    std::vector<Object> objects;
    if (FileExists(path)) {
        const OpenStore real(context, path, true);
        std::int32_t status = configstore::OK;
        objects = ReadAll(real.get(), &status);
        real.Require(status, "cannot read the config store");
    }
    const configstore::MessageCollector messages;
    PointLibraryAt(kMemory);
    std::int32_t status = configstore::GetStore(&store_);
    if (status == configstore::OK) status = Fill(store_, objects);
    if (status == configstore::OK) return;
    configstore::DestroyStore(store_);
    PointLibraryAt(path_);
    throw Error(StoreError(status, "cannot look at what would change", path, messages.Text()));
}

ScratchStore::~ScratchStore() {
    configstore::DestroyStore(store_);
    PointLibraryAt(path_);
}

std::vector<ScratchStore::Object> ScratchStore::Objects() const {
    const configstore::MessageCollector messages;
    std::int32_t status = configstore::OK;
    std::vector<Object> objects = ReadAll(store_, &status);
    if (status != configstore::OK)
        throw Error(StoreError(status, "cannot look at what would change", path_, messages.Text()));
    return objects;
}

} // namespace dvs::ctl
