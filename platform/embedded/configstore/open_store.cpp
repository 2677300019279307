/* SPDX-License-Identifier: Apache-2.0 */
// Opening stores (store.h): which one the host's is, and the backend for a path.

#include <cstdlib>

#include "platform/embedded/configstore/store.h"

namespace configstore {

namespace {

constexpr const char *kDefaultPath = "/var/lib/dvs/configstore.db";
constexpr const char *kMemoryPath = ":memory:";

/// The database in memory that GetStore opens, kept for the process.
std::shared_ptr<MemoryDatabase> ProcessMemory() {
    static const std::shared_ptr<MemoryDatabase> database = NewMemoryDatabase();
    return database;
}

} // namespace

std::string StorePath() {
    // A program that runs with more rights than its caller ignores the caller's environment.
    const char *const path = secure_getenv("DVS_CONFIGSTORE");
    return path && *path ? path : kDefaultPath;
}

int32_t OpenStore(const std::string &path, Access access, FailureKeeper::Log log, Store **out,
                  Failure *failure) {
    return Guarded([&] {
        auto store = std::make_unique<Store>(path, log);
        int32_t status = OK;
        if (path == kMemoryPath)
            store->backend = OpenMemory(ProcessMemory(), &store->failures);
        else
            status = OpenSqlite(access, &store->failures, &store->backend);
        if (status == OK)
            *out = store.release();
        else if (failure && store->failures.Last())
            *failure = *store->failures.Last();
        return status;
    });
}

} // namespace configstore
