/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_HUGE_PAGES_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_HUGE_PAGES_H

// Large blocks straight from the system, for what is used once and then thrown away: trees and documents of
// thousands of ports. In pages of the usual size their faults cost more than the work itself, and in the heap
// they leave holes.

#include <cstddef>

#include "base/huge_page.h"

namespace configstore {

using dvs::base::kHugePage;

/// A block of at least *size bytes, which is rounded up to whole huge pages. Nothing is promised of what it
/// holds. Null when there is no memory.
[[nodiscard]] char *MapHugePages(std::size_t *size);
/// Gives such a block back; `size` as MapHugePages has left it.
void UnmapHugePages(void *block, std::size_t size);

} // namespace configstore

#endif
