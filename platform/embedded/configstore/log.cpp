/* SPDX-License-Identifier: Apache-2.0 */
// Messages of the config store, on top of the host's log.

#include "platform/embedded/configstore/log.h"

#include <cstdint>
#include <cstdio>
#include <new>

#include "platform/runtime.h"

namespace configstore {

namespace {

constexpr uint32_t kLogLevel = 0; // the host's measure: these are failures
constexpr std::size_t kMostText = 4096;

thread_local MessageCollector *t_collector = nullptr;

} // namespace

MessageCollector::MessageCollector() : outer_(t_collector) {
    t_collector = this;
}

MessageCollector::~MessageCollector() {
    t_collector = outer_;
}

void MessageCollector::Append(const char *format, va_list args) {
    char line[1024];
    if (std::vsnprintf(line, sizeof line, format, args) < 0) return;
    try {
        if (text_.size() > kMostText) return;
        if (!text_.empty()) text_ += "; ";
        text_ += line;
    } catch (const std::bad_alloc &) {
        // Without memory the status alone has to do.
    }
}

void Log(const char *format, ...) {
    va_list args;
    va_start(args, format);
    if (t_collector)
        t_collector->Append(format, args);
    else
        LogV(kLogLevel, format, args);
    va_end(args);
}

} // namespace configstore
