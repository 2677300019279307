/* SPDX-License-Identifier: Apache-2.0 */
#ifndef KERNEL_LOG_H
#define KERNEL_LOG_H

// Message output of the kernel interface: to standard error, regardless of the debug levels.

namespace dvs::hyp {

void Print(const char *format, ...) __attribute__((format(printf, 1, 2)));

} // namespace dvs::hyp

#endif
