/* SPDX-License-Identifier: Apache-2.0 */
// Trees from and to a backend (store.h).

#include "platform/embedded/configstore/store.h"

namespace configstore {

OwnTransaction::OwnTransaction(Store *store) : store_(store), own_(!store->inTransaction), status_(OK) {
    if (!own_) return;
    status_ = store_->backend->Begin();
    if (status_ != OK) own_ = false;
}

OwnTransaction::~OwnTransaction() {
    if (own_) (void)store_->backend->Cancel();
}

int32_t OwnTransaction::Commit() {
    return own_ ? store_->backend->Commit() : static_cast<int32_t>(OK);
}

int32_t LoadTree(Store *store, const Address &address, std::string_view text, std::unique_ptr<Tree> *tree) {
    auto loaded = std::make_unique<Tree>(address);
    std::string why;
    std::string field;
    if (!ReadDocument(text, Reading::Tolerant, loaded.get(), &why, &field)) {
        Failure failure(CORRUPT, "the document of " + AddressText(address) + " is damaged: " + why);
        failure.address = address;
        failure.field = std::move(field);
        return store->failures.Fail(std::move(failure));
    }
    *tree = std::move(loaded);
    return OK;
}

int32_t SaveTree(Store *store, Layer layer, Tree *tree) {
    tree->address.layer = layer;
    if (const Object *const bad = FindViolation(tree)) {
        Failure failure(SCHEMA_VIOLATION,
                        AddressText(tree->address) + ": " + PathOf(bad) + ": " + Describe(bad));
        failure.address = tree->address;
        failure.field = PathOf(bad);
        return store->failures.Fail(std::move(failure));
    }
    for (Object *member = tree->root.members.first; member; member = member->next) {
        if (member->kind == Kind::Later) (void)Expand(tree, member); // a document is written in one form
    }
    Buffer text;
    WriteDocument(*tree, &text);
    OwnTransaction transaction(store);
    int32_t status = transaction.Status();
    int64_t document = 0;
    if (status == OK) status = store->backend->Put(tree->address, text.View(), &document);
    if (status == OK) store->readBefore.erase(document); // a deleted document's number may be in use again
    return status == OK ? transaction.Commit() : status;
}

} // namespace configstore
