/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_EMIT_H
#define DVSDATA_EMIT_H

// Message output of the property lists. A message prints if dvsdata_debug is at least its level.

#include "dvs/data.h"

namespace dvs::data {

enum MessageLevel : int {
    kError = 0,  // prints at level 0 or above
    kTrace = 1,  // above 0
    kDetail = 2, // above 1
    kEntry = 3   // above 2: one line per entry read
};

/// True if this level prints. Loops over entries check it once to skip the formatting.
inline bool Emits(MessageLevel level) {
    return dvsdata_debug >= level;
}

/// Prints to standard output, or to the sink if one is set, if the level is enabled.
void Emit(MessageLevel level, const char *format, ...) __attribute__((format(printf, 2, 3)));

} // namespace dvs::data

#endif
