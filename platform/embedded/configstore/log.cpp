/* SPDX-License-Identifier: Apache-2.0 */
// Messages of the config store, in the host's log.

#include "platform/embedded/configstore/log.h"

#include <cstdarg>
#include <cstdint>

#include "platform/runtime.h"

namespace configstore {

namespace {

constexpr uint32_t kLogLevel = 0; // of failures, on the host's scale

} // namespace

void Log(const char *format, ...) {
    va_list args;
    va_start(args, format);
    LogV(kLogLevel, format, args);
    va_end(args);
}

} // namespace configstore
