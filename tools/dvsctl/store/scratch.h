/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_STORE_SCRATCH_H
#define DVSCTL_STORE_SCRATCH_H

// A copy of a store's present objects in memory, for --dry-run: the library's own save runs on it, so that
// what is shown is what would happen, refusals included, and the real store is only read.

#include <string>
#include <vector>

#include "tools/dvsctl/store/access.h"

namespace dvs::ctl {

class ScratchStore {
public:
    /// Copies what the store at `path` holds now (nothing, where there is none) and points the library at the
    /// copy until it is destroyed. One at a time. Throws Error.
    ScratchStore(Context &context, const std::string &path);
    ~ScratchStore();
    ScratchStore(const ScratchStore &) = delete;
    ScratchStore &operator=(const ScratchStore &) = delete;

    struct Object {
        admin::Address address;
        std::string document;
    };
    /// What the copy holds now.
    [[nodiscard]] std::vector<Object> Objects() const;

private:
    std::string path_;
    configstore::Store *store_ = nullptr;
};

} // namespace dvs::ctl

#endif
