/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LOG_H
#define CONFIGSTORE_LOG_H

// The emitter of everything under configstore/: messages go to standard output (or the log sink) as far as
// dvsconfigstore_debug lets them, and to syslog for the few lines that the host's log keeps.

#include "dvs/configstore.h"

namespace dvs::config {

/// Prints at the debug level that the family has when this is made: an operation makes one at its entry and
/// hands it on.
class Messages {
public:
    Messages() : level_(dvsconfigstore_debug) {}
    /// Prints at level 0 or above. A line printed without a format ends in "\n" as well.
    void Error(const char *format, ...) const __attribute__((format(printf, 2, 3)));
    /// Prints above level 0.
    void Trace(const char *format, ...) const __attribute__((format(printf, 2, 3)));
    /// True when Trace prints: spares a loop the calls.
    [[nodiscard]] bool Traces() const { return level_ > 0; }

private:
    int32_t level_;
};

/// One line to syslog at `priority` (LOG_DEBUG, LOG_INFO); a sink, when set, gets the text as well, at level
/// -1.
void LogSystem(int priority, const char *format, ...) __attribute__((format(printf, 2, 3)));

} // namespace dvs::config

#endif
