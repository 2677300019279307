/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_EMIT_H
#define DVSDATA_EMIT_H

// The one way out for messages of the property lists. They print when dvsdata_debug is at or above their
// level.

#include "dvs/data.h"

namespace dvs::data {

enum MessageLevel : int {
    kError = 0,  // prints at level 0 or above
    kTrace = 1,  // above 0
    kDetail = 2, // above 1
    kEntry = 3   // above 2: one line an entry read
};

/// For loops over entries, which ask once and keep the formatting out of the way.
inline bool Emits(MessageLevel level) {
    return dvsdata_debug >= level;
}

/// Prints to standard output, or to the sink when one is set, if the level asks for it.
void Emit(MessageLevel level, const char *format, ...) __attribute__((format(printf, 2, 3)));

} // namespace dvs::data

#endif
