/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_LOG_H
#define DVSDATA_LOG_H

// Output of every message of the library. Each family of functions has a small emitter on top of these
// functions, which checks its debug level; no other code in the library writes to a stream.
//
// `level` is the lowest debug level at which the message prints: 0 for errors, 1 for "above 0", 2 for "above
// 1", and kUnguarded for messages that no level guards. The sink receives it with the text.

#include <cstdarg>
#include <cstdio>

namespace dvs::log {

inline constexpr int kUnguarded = -1;

/// Formats the message and passes it to the sink. If there is none, does nothing and returns false.
bool ToSink(int level, const char *format, va_list args) __attribute__((format(printf, 2, 0)));

/// Formats the message and passes it to the sink, or prints it to `stream` if there is none.
void ToStream(std::FILE *stream, int level, const char *format, va_list args) __attribute__((format(printf, 3, 0)));

} // namespace dvs::log

#endif
