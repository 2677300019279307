/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_STORE_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_STORE_H

// An open store: a backend, its transaction as the client interface has it, and the record of the last
// failure. Shared by the client interface (store.cpp) and the operators' functions (admin*.cpp).

#include <map>
#include <memory>
#include <string_view>

#include "platform/embedded/configstore/backend/backend.h"
#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/node.h"

namespace configstore {

/// A document that this transaction has read.
struct ReadBefore {
    std::shared_ptr<const Buffer> text;
    Outline outline;
};

struct Store {
    Store(std::string path, FailureKeeper::Log log) : failures(std::move(path), log) {}

    FailureKeeper failures;
    std::unique_ptr<Backend> backend;
    bool inTransaction = false; // as the caller sees it
    int32_t refusal = OK;       // the result of every call in a transaction that could not begin or is lost
    /// By number. A save lists all objects and then fetches each, mostly to replace what is in it.
    std::map<int64_t, ReadBefore> readBefore;
};

/// The path that GetStore opens: DVS_CONFIGSTORE or the default.
[[nodiscard]] std::string StorePath();
/// Opens the store at the path; ":memory:" is one store for the whole process. `failures` receives the record
/// of a failure, unless it is null.
[[nodiscard]] int32_t OpenStore(const std::string &path, Access access, FailureKeeper::Log log, Store **out,
                                Failure *failure);

/// Runs one call on a store. In a refused transaction the call does not run. A failure that ended the backend's
/// transaction makes the rest of it refused: what came later would be saved on its own.
template <typename Work> int32_t Call(Store *store, Work &&work) {
    if (!store) return BAD_PARAMETER;
    if (store->refusal != OK) return store->refusal;
    store->failures.Clear();
    int32_t status = Guarded(work);
    if (store->inTransaction && !store->backend->InTransaction()) {
        const Failure *const failure = store->failures.Last();
        if (status == OK) status = failure ? failure->status : static_cast<int32_t>(FAILED);
        store->refusal = status;
    }
    if (status == OK) store->failures.Clear();
    return status;
}

/// A transaction of one call's own if the caller has none open; cancelled unless committed.
class OwnTransaction {
public:
    explicit OwnTransaction(Store *store);
    ~OwnTransaction();
    OwnTransaction(const OwnTransaction &) = delete;
    OwnTransaction &operator=(const OwnTransaction &) = delete;
    [[nodiscard]] int32_t Status() const { return status_; }
    [[nodiscard]] int32_t Commit();

private:
    Store *store_;
    bool own_;
    int32_t status_;
};

/// A tree from a document's text; CORRUPT, with a record, if it is not a document.
[[nodiscard]] int32_t LoadTree(Store *store, const Address &address, std::string_view text,
                               std::unique_ptr<Tree> *tree);
/// Writes the tree's document as the object's. SCHEMA_VIOLATION, with the field in the record, if the schema
/// does not allow it.
[[nodiscard]] int32_t SaveTree(Store *store, Layer layer, Tree *tree);

} // namespace configstore

#endif
