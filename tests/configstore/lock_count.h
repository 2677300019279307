/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_LOCK_COUNT_H
#define TESTS_CONFIGSTORE_LOCK_COUNT_H

// How many times this process holds recursive locks of the host runtime. Programs that link lock_count have
// the two functions wrapped at link time.

namespace lock_count {

int Held();

} // namespace lock_count

#endif
