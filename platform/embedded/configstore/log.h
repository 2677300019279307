/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_LOG_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_LOG_H

// The store's way to the host's log (LogV of platform/runtime.h). Failures of calls on a store get there as
// records (failure.h).

namespace configstore {

void Log(const char *format, ...) __attribute__((format(printf, 1, 2)));

} // namespace configstore

#endif
