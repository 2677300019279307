/* SPDX-License-Identifier: Apache-2.0 */
// The config store family's emitter on top of dvsdata/log.h.

#include "configstore/log.h"

#include <cstdarg>
#include <cstdio>

#include <syslog.h>

#include "dvsdata/log.h"

int32_t dvsconfigstore_debug = 10;

namespace dvs::config {

void Messages::Error(const char *format, ...) const {
    if (level_ < 0) return;
    va_list args;
    va_start(args, format);
    log::ToStream(stdout, 0, format, args);
    va_end(args);
}

void Messages::Trace(const char *format, ...) const {
    if (!Traces()) return;
    va_list args;
    va_start(args, format);
    log::ToStream(stdout, 1, format, args);
    va_end(args);
}

void LogSystem(int priority, const char *format, ...) {
    va_list args;
    va_start(args, format);
    va_list again;
    va_copy(again, args);
    vsyslog(priority, format, args);
    (void)log::ToSink(log::kUnguarded, format, again); // without a sink syslog alone has it
    va_end(again);
    va_end(args);
}

} // namespace dvs::config
