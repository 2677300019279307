/* SPDX-License-Identifier: Apache-2.0 */
// Records of failures (failure.h).

#include "platform/embedded/configstore/failure.h"

#include <new>

#include "platform/embedded/configstore/log.h"

namespace configstore {

std::string Text(const Failure &failure) {
    return "config store " + failure.path + ": " + failure.what;
}

int32_t FailureKeeper::Fail(Failure failure) noexcept {
    const int32_t status = failure.status;
    try {
        failure.path = path_;
        if (log_ == Log::Yes) configstore::Log("%s", Text(failure).c_str());
        last_ = std::move(failure);
    } catch (const std::bad_alloc &) {
        last_.reset();
    }
    return status;
}

} // namespace configstore
