/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_LOCK_COUNT_H
#define TESTS_CONFIGSTORE_LOCK_COUNT_H

// Counts how often this process holds recursive locks of the host runtime. Linking lock_count wraps the two
// lock functions.

namespace lock_count {

int Held();

} // namespace lock_count

#endif
