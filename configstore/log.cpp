/* SPDX-License-Identifier: Apache-2.0 */
// The config store family's emitter: checks the family's debug level and hands on to dvsdata/log.h.

#include "configstore/log.h"

#include <cstdarg>
#include <cstdio>

#include <syslog.h>

#include "dvsdata/log.h"

int32_t dvsconfigstore_debug = 10;

namespace dvs::config {
namespace {

thread_local bool isReported = false;

} // namespace

AlreadyReported::AlreadyReported() {
    isReported = true;
}

AlreadyReported::~AlreadyReported() {
    isReported = false;
}

void LogError(const char *format, ...) {
    if (dvsconfigstore_debug < 0 || isReported) return;
    va_list args;
    va_start(args, format);
    log::ToStream(stdout, 0, format, args);
    va_end(args);
}

void LogTrace(const char *format, ...) {
    if (!Tracing()) return;
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
    (void)log::ToSink(log::kUnguarded, format, again); // no sink: syslog alone has it
    va_end(again);
    va_end(args);
}

} // namespace dvs::config
