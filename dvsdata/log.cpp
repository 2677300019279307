/* SPDX-License-Identifier: Apache-2.0 */
// Message delivery. Every family's message output uses it; it uses nothing else of the library.

#include "dvsdata/log.h"

#include <cstdlib>
#include <memory>
#include <mutex>

#include "dvs/log.h"

namespace {

struct Destination {
    DVSLogSink sink = nullptr;
    void *arg = nullptr;
};

std::mutex g_mutex;
Destination g_destination;

Destination Current() {
    const std::lock_guard guard(g_mutex);
    return g_destination;
}

void FormatToSink(const Destination &to, int level, const char *format, va_list args) {
    // Most messages are one short line. A longer one needs an allocation; if that fails, it is truncated.
    char line[512];
    va_list again;
    va_copy(again, args);
    const int length = std::vsnprintf(line, sizeof line, format, args);
    if (length >= static_cast<int>(sizeof line)) {
        const auto size = static_cast<std::size_t>(length) + 1;
        const std::unique_ptr<char, decltype(&std::free)> text(static_cast<char *>(std::malloc(size)), &std::free);
        if (text) {
            std::vsnprintf(text.get(), size, format, again);
            to.sink(level, text.get(), to.arg);
            va_end(again);
            return;
        }
    }
    va_end(again);
    to.sink(level, line, to.arg);
}

} // namespace

namespace dvs::log {

bool ToSink(int level, const char *format, va_list args) {
    const Destination to = Current();
    if (!to.sink) return false;
    FormatToSink(to, level, format, args);
    return true;
}

void ToStream(std::FILE *stream, int level, const char *format, va_list args) {
    const Destination to = Current();
    if (to.sink)
        FormatToSink(to, level, format, args);
    else
        std::vfprintf(stream, format, args);
}

} // namespace dvs::log

extern "C" void DVSLog_SetSink(DVSLogSink sink, void *arg) {
    const std::lock_guard guard(g_mutex);
    g_destination = {sink, arg};
}
