/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_STORE_SCRATCH_H
#define DVSCTL_STORE_SCRATCH_H

// A copy of a store's present objects in memory, for --dry-run: the library's own save runs on it, so that
// what is shown is what would happen, refusals included. The real store is only read.

#include <string>
#include <vector>

#include "tools/dvsctl/store/access.h"

namespace dvs::ctl {

class ScratchStore {
public:
    /// Copies what the store at `path` holds now; nothing if there is none. Throws Error.
    ScratchStore(Context &context, const std::string &path);
    ~ScratchStore() { configstore::DestroyStore(store_); }
    ScratchStore(const ScratchStore &) = delete;
    ScratchStore &operator=(const ScratchStore &) = delete;

    [[nodiscard]] configstore::Store *get() const { return store_; }

    struct Object {
        admin::Address address;
        std::string document;
    };
    /// What the copy holds now.
    [[nodiscard]] std::vector<Object> Objects() const;

private:
    void Require(std::int32_t status) const;

    std::string path_;
    configstore::Store *store_ = nullptr;
};

} // namespace dvs::ctl

#endif
