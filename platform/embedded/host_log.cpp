/* SPDX-License-Identifier: Apache-2.0 */
// The host's log of the embedded runtime (platform/runtime.h): stamped lines on standard error. Each leaves
// in one write, so that lines of several threads and processes do not run into each other.

#include "platform/runtime.h"

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <unistd.h>

namespace {

constexpr std::size_t kStampSize = 80;

std::size_t FormatStamp(char (&stamp)[kStampSize], uint32_t level) {
    // Not gmtime_r and strftime: those read the time zone's file, which a log line may well be about.
    using namespace std::chrono;
    const auto now = floor<milliseconds>(system_clock::now());
    const auto today = floor<days>(now);
    const year_month_day date(today);
    const hh_mm_ss time(now - today);
    const int length =
        std::snprintf(stamp, sizeof stamp, "%04d-%02u-%02uT%02ld:%02ld:%02ld.%03ldZ dvs[%ld] level %u: ",
                      static_cast<int>(date.year()), static_cast<unsigned>(date.month()),
                      static_cast<unsigned>(date.day()), static_cast<long>(time.hours().count()),
                      static_cast<long>(time.minutes().count()), static_cast<long>(time.seconds().count()),
                      static_cast<long>(time.subseconds().count()), static_cast<long>(getpid()), level);
    return length > 0 ? static_cast<std::size_t>(length) : 0;
}

void WriteOut(const char *text, std::size_t length) {
    // The log has nobody to report its own failure to: what standard error does not take is dropped.
    while (length > 0) {
        const ssize_t written = write(STDERR_FILENO, text, length);
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) return;
        text += written;
        length -= static_cast<std::size_t>(written);
    }
}

/// Appends the message to the `used` bytes of `line`, cut to fit, with a line end.
void FinishLine(char *line, std::size_t size, std::size_t used, const char *format, va_list args) {
    const std::size_t room = size - used - 1; // one byte stays for the line end
    const int needed = std::vsnprintf(line + used, room, format, args);
    if (needed < 0) return;
    const auto length = static_cast<std::size_t>(needed);
    used += length < room ? length : room - 1;
    if (line[used - 1] != '\n') line[used++] = '\n';
    WriteOut(line, used);
}

} // namespace

extern "C" void LogV(uint32_t level, const char *format, va_list args) {
    const int savedErrno = errno;
    char stamp[kStampSize];
    const std::size_t stampLen = FormatStamp(stamp, level);
    va_list again;
    va_copy(again, args);
    const int needed = std::vsnprintf(nullptr, 0, format, again);
    va_end(again);
    // Most messages are short. A long one costs an allocation, and is cut when there is no memory.
    char shortLine[1024];
    const std::size_t size = stampLen + (needed > 0 ? static_cast<std::size_t>(needed) : 0) + 2;
    std::unique_ptr<char, decltype(&std::free)> longLine(nullptr, &std::free);
    if (size > sizeof shortLine) longLine.reset(static_cast<char *>(std::malloc(size)));
    char *line = longLine ? longLine.get() : shortLine;
    for (std::size_t i = 0; i < stampLen; i++)
        line[i] = stamp[i];
    FinishLine(line, longLine ? size : sizeof shortLine, stampLen, format, args);
    errno = savedErrno;
}
