/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_MESSAGE_H
#define DVSSTATE_MESSAGE_H

// Message output of the switch state. Every message of this folder goes through it; dvs_debug sets the level.

#include "dvs/state.h"

namespace dvs::state {

// The lowest value of dvs_debug at which a message prints.
inline constexpr int kError = 0;
inline constexpr int kTrace = 1;
inline constexpr int kDetail = 2;

/// True if messages of this level print. Check it before work that only a message needs.
[[nodiscard]] inline bool Prints(int level) {
    return dvs_debug >= level;
}

/// Prints to standard output (or the sink) if dvs_debug is at least `level`.
void Message(int level, const char *format, ...) __attribute__((format(printf, 2, 3)));

/// Prints to standard error (or the sink), regardless of dvs_debug.
void MessageUnguarded(const char *format, ...) __attribute__((format(printf, 1, 2)));

/// The text of a status, for messages.
[[nodiscard]] const char *Text(HYP_ReturnStatus status);

} // namespace dvs::state

#endif
