/* SPDX-License-Identifier: Apache-2.0 */
// Message output of the state file: to the sink, or to the host's log at the fixed level of these messages.

#include "dvsfile/file_internal.h"

#include <cstdarg>

#include "dvsdata/log.h"
#include "platform/runtime.h"

namespace dvs::file {

namespace {

constexpr uint32_t kHostLogLevel = 2;

} // namespace

void Report(const char *format, ...) {
    va_list args;
    va_start(args, format);
    if (!log::ToSink(log::kUnguarded, format, args)) LogV(kHostLogLevel, format, args);
    va_end(args);
}

} // namespace dvs::file
