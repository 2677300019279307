/* SPDX-License-Identifier: Apache-2.0 */
#ifndef BASE_HUGE_PAGE_H
#define BASE_HUGE_PAGE_H

// Huge pages for large blocks of memory. The page faults of a fresh block in small pages cost more than
// filling the block.

#include <cstddef>
#include <cstdint>

#include <sys/mman.h>

namespace dvs::base {

inline constexpr std::size_t kHugePage = std::size_t{1} << 21; // bytes

/// Asks the system for huge pages. Covers only whole pages inside the block, because memory around it may
/// belong to the heap. Best effort: errors are ignored.
inline void AdviseHugePages(void *block, std::size_t size) {
    const auto address = reinterpret_cast<std::uintptr_t>(block);
    const std::uintptr_t start = (address + kHugePage - 1) & ~(kHugePage - 1);
    const std::uintptr_t end = (address + size) & ~(kHugePage - 1);
    if (start < end) (void)madvise(reinterpret_cast<void *>(start), end - start, MADV_HUGEPAGE);
}

} // namespace dvs::base

#endif
