/* SPDX-License-Identifier: Apache-2.0 */
#ifndef KERNEL_LOG_H
#define KERNEL_LOG_H

// The kernel interface's emitter: its messages go to standard error whatever the debug levels.

namespace dvs::hyp {

void Print(const char *format, ...) __attribute__((format(printf, 1, 2)));

} // namespace dvs::hyp

#endif
