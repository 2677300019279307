/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_MESSAGE_H
#define DVSSTATE_MESSAGE_H

// The emitter of the switch state: every message of this folder goes out here, guarded by dvs_debug.

#include "dvs/state.h"

namespace dvs::state {

// The lowest value of dvs_debug at which a message prints.
inline constexpr int kError = 0;
inline constexpr int kTrace = 1;
inline constexpr int kDetail = 2;

/// True when messages of this level print: worth asking before work that only a message needs.
[[nodiscard]] inline bool Prints(int level) {
    return dvs_debug >= level;
}

/// Prints to standard output (or the sink) when dvs_debug is at `level` or above.
void Message(int level, const char *format, ...) __attribute__((format(printf, 2, 3)));

/// Prints to standard error (or the sink), whatever dvs_debug says.
void MessageUnguarded(const char *format, ...) __attribute__((format(printf, 1, 2)));

/// The text of a status, for messages.
[[nodiscard]] const char *Text(HYP_ReturnStatus status);

} // namespace dvs::state

#endif
