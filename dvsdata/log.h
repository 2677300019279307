/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_LOG_H
#define DVSDATA_LOG_H

// The way out for every message of the library. Each family of functions has one small emitter of its own on top of
// these, which checks its debug level; nothing else in the library writes to a stream.
//
// `level` is the lowest debug level at which the message prints: 0 for errors, 1 for what prints "above 0", 2 for
// what prints "above 1", and kUnguarded for what no level guards. The sink gets it beside the text.

#include <cstdarg>
#include <cstdio>

namespace dvs::log {

inline constexpr int kUnguarded = -1;

/// Formats the message and gives it to the sink. False, with nothing done, when there is none.
bool ToSink(int level, const char *format, va_list args) __attribute__((format(printf, 2, 0)));

/// Formats the message and gives it to the sink, or prints it to `stream` when there is none.
void ToStream(std::FILE *stream, int level, const char *format, va_list args) __attribute__((format(printf, 3, 0)));

} // namespace dvs::log

#endif
