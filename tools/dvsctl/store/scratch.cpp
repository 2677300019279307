/* SPDX-License-Identifier: Apache-2.0 */
// Filling and reading the copy (scratch.h).

#include "tools/dvsctl/store/scratch.h"

#include "tools/dvsctl/sources/files.h"

namespace dvs::ctl {

ScratchStore::ScratchStore(Context &context, const std::string &path) : path_(path) {
    Require(admin::OpenInMemory(&store_));
    if (!FileExists(path)) return;
    try {
        const OpenStore real(context, path, true);
        real.Require(admin::CopyPresent(real.get(), store_), "cannot read the config store");
    } catch (...) {
        configstore::DestroyStore(store_);
        throw;
    }
}

void ScratchStore::Require(std::int32_t status) const {
    if (status != configstore::OK)
        throw Error(StoreError(status, "cannot look at what would change", path_,
                               store_ ? admin::LastFailure(store_) : nullptr));
}

std::vector<ScratchStore::Object> ScratchStore::Objects() const {
    std::vector<admin::Entry> entries;
    std::vector<Object> objects;
    Require(admin::List(store_, &entries));
    for (const admin::Entry &entry : entries) {
        Object &object = objects.emplace_back(Object{entry.address, {}});
        Require(admin::Export(store_, entry.address, &object.document));
    }
    return objects;
}

} // namespace dvs::ctl
