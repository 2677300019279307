/* SPDX-License-Identifier: Apache-2.0 */
// Message output of the property lists and their debug level, on top of dvsdata/log.h.

#include "dvsdata/emit.h"

#include <cstdarg>
#include <cstdio>

#include "dvsdata/log.h"

int32_t dvsdata_debug = -1;

namespace dvs::data {

void Emit(MessageLevel level, const char *format, ...) {
    if (!Emits(level)) return;
    va_list args;
    va_start(args, format);
    log::ToStream(stdout, level, format, args);
    va_end(args);
}

} // namespace dvs::data
