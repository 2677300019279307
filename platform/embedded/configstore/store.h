/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_STORE_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_STORE_H

// What the client interface and the operators' functions share: changes of rows with their history, in a
// transaction.

#include <optional>
#include <string_view>

#include "platform/embedded/configstore/database.h"
#include "platform/embedded/configstore/node.h"

namespace configstore {

struct Row {
    int64_t revision;
    int64_t document;
};

/// A transaction of this call's own where the caller has none open; rolled back unless committed.
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

/// What a call answers before it does anything: a transaction that could not begin, or is lost.
[[nodiscard]] inline int32_t Ready(const Store *store) {
    return store ? store->refusal : BAD_PARAMETER;
}

[[nodiscard]] int32_t FindRow(Store *store, const char *layer, const FilterSpec &address,
                              std::optional<Row> *row);
/// Adds a document text.
[[nodiscard]] int32_t AddDocument(Store *store, std::string_view text, int64_t *id);
/// Makes `document` the object's; what it had goes into history. Within a transaction.
[[nodiscard]] int32_t PutRow(Store *store, const char *layer, const FilterSpec &address, int64_t document);
/// Deletes the object; its document goes into history. NOT_FOUND where there is none. Within a transaction.
[[nodiscard]] int32_t DeleteRow(Store *store, const char *layer, const FilterSpec &address);
/// A tree from a document's text; CORRUPT, with a message, when it is not one.
[[nodiscard]] int32_t LoadTree(const Store *store, const FilterSpec &address, std::string_view text,
                               std::unique_ptr<Tree> *tree);
/// Writes the tree's document as the object's. SCHEMA_VIOLATION, with the field's path, when it is not
/// allowed.
[[nodiscard]] int32_t SaveTree(Store *store, const char *layer, Tree *tree);

} // namespace configstore

#endif
