/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LOG_H
#define CONFIGSTORE_LOG_H

// The one way out for the messages of everything under configstore/: to standard output (or the log sink) as
// far as dvsconfigstore_debug lets them, and to syslog for the few lines that the host's log keeps. Stands on
// dvsdata/log.h.

#include "dvs/configstore.h"

namespace dvs::config {

/// Prints when dvsconfigstore_debug is 0 or above. A line printed without a format ends in "\n" as well.
void LogError(const char *format, ...) __attribute__((format(printf, 1, 2)));

/// While there is one, LogError prints nothing: for work that is done once more and has been reported.
class AlreadyReported {
public:
    AlreadyReported();
    ~AlreadyReported();
    AlreadyReported(const AlreadyReported &) = delete;
    AlreadyReported &operator=(const AlreadyReported &) = delete;
};

/// Prints when dvsconfigstore_debug is above 0.
void LogTrace(const char *format, ...) __attribute__((format(printf, 1, 2)));

/// True when LogTrace would print: spares a loop the call where every property would make one.
inline bool Tracing() {
    return dvsconfigstore_debug > 0;
}

/// One line to syslog at `priority` (LOG_DEBUG, LOG_INFO); a sink, when set, gets the text as well, at level
/// -1.
void LogSystem(int priority, const char *format, ...) __attribute__((format(printf, 2, 3)));

} // namespace dvs::config

#endif
