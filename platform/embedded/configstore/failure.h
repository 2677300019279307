/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_FAILURE_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_FAILURE_H

// Why a call on a store failed, as a record made where it happened. Stores that programs open with GetStore
// also write each record to the host's log; stores that tools open (admin.h) leave that to the tool.

#include <cstdint>
#include <optional>
#include <string>
#include <utility>

#include "platform/embedded/configstore/address.h"

namespace configstore {

struct Failure {
    Failure() = default;
    Failure(int32_t newStatus, std::string newWhat) : status(newStatus), what(std::move(newWhat)) {}

    int32_t status = 0;             // of platform/configstore.h
    std::string path;               // the store's file
    std::optional<Address> address; // the object, if the failure is about one
    std::string field;              // the path of the field in it: "settings/max_mtu"
    int sqliteCode = 0;             // SQLite's extended result code, if SQLite failed
    std::string what;               // in words; object and field are included
};

/// The record as one line: "config store PATH: WHAT".
[[nodiscard]] std::string Text(const Failure &failure);

/// Keeps the record of a store's last call.
class FailureKeeper {
public:
    enum class Log { Yes, No };
    FailureKeeper(std::string path, Log log) : path_(std::move(path)), log_(log) {}

    /// Keeps the record, completed with the store's path, and returns its status. If there is no memory for the
    /// record, only the status is left.
    int32_t Fail(Failure failure) noexcept;
    int32_t Fail(int32_t status, std::string what) { return Fail(Failure(status, std::move(what))); }
    void Clear() noexcept { last_.reset(); }
    /// Null when the last call succeeded, or its status says it all.
    [[nodiscard]] const Failure *Last() const { return last_ ? &*last_ : nullptr; }
    [[nodiscard]] const std::string &Path() const { return path_; }

private:
    std::string path_;
    Log log_;
    std::optional<Failure> last_;
};

} // namespace configstore

#endif
