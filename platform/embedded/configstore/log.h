/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_LOG_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_LOG_H

// The store's one way out for messages: the host's log (LogV of platform/runtime.h). Statuses are numbers;
// what was wrong, in which file and at which field, is told here, once per failure. Tools that want the text
// of the failure they just met, rather than a line in a log, collect it with MessageCollector.

#include <cstdarg>
#include <string>

namespace configstore {

void Log(const char *format, ...) __attribute__((format(printf, 1, 2)));

/// While one lives, messages of this thread go into its text instead of the log, the first ones of them kept.
class MessageCollector {
public:
    MessageCollector();
    ~MessageCollector();
    MessageCollector(const MessageCollector &) = delete;
    MessageCollector &operator=(const MessageCollector &) = delete;
    [[nodiscard]] const std::string &Text() const { return text_; }
    void Append(const char *format, va_list args) __attribute__((format(printf, 2, 0)));

private:
    MessageCollector *outer_;
    std::string text_;
};

} // namespace configstore

#endif
