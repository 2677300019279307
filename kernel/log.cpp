/* SPDX-License-Identifier: Apache-2.0 */
// Message output of the kernel interface, on top of the library's message delivery.

#include "kernel/log.h"

#include <cstdarg>
#include <cstdio>

#include "dvsdata/log.h"

namespace dvs::hyp {

void Print(const char *format, ...) {
    va_list args;
    va_start(args, format);
    dvs::log::ToStream(stderr, dvs::log::kUnguarded, format, args);
    va_end(args);
}

} // namespace dvs::hyp
