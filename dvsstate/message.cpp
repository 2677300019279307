/* SPDX-License-Identifier: Apache-2.0 */
// Message output of the switch state, on top of dvsdata/log.h. Used by every file of this folder.

#include "dvsstate/message.h"

#include <cstdarg>
#include <cstdio>

#include "dvs/state.h"
#include "dvsdata/log.h"
#include "platform/status_text.h"

int32_t dvs_debug = -1;

namespace dvs::state {

void Message(int level, const char *format, ...) {
    if (!Prints(level)) return;
    va_list args;
    va_start(args, format);
    log::ToStream(stdout, level, format, args);
    va_end(args);
}

void MessageUnguarded(const char *format, ...) {
    va_list args;
    va_start(args, format);
    log::ToStream(stderr, log::kUnguarded, format, args);
    va_end(args);
}

const char *Text(HYP_ReturnStatus status) {
    return HYP_ReturnStatusToString(status);
}

} // namespace dvs::state
