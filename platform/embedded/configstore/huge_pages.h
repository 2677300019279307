/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_HUGE_PAGES_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_HUGE_PAGES_H

// Large blocks straight from the system, for what is used once and then thrown away: trees and documents of
// thousands of ports. In pages of the usual size their faults cost more than the work itself, and in the heap
// they leave holes.

#include <cstddef>
#include <cstdint>
#include <sys/mman.h>

namespace configstore {

inline constexpr std::size_t kHugePage = std::size_t{1} << 21;

[[nodiscard]] inline char *MapPages(std::size_t size) {
    void *const block = mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    return block == MAP_FAILED ? nullptr : static_cast<char *>(block);
}

/// A zeroed block of at least *size bytes, which is rounded up to whole huge pages. Null when there is no
/// memory.
[[nodiscard]] inline char *MapHugePages(std::size_t *size) {
    const auto past = [](const char *block) { return reinterpret_cast<uintptr_t>(block) % kHugePage; };
    if (*size > SIZE_MAX - 2 * kHugePage) return nullptr;
    *size = (*size + kHugePage - 1) / kHugePage * kHugePage;
    char *block = MapPages(*size);
    if (block && past(block) != 0) { // rare, as the system puts mappings side by side
        (void)munmap(block, *size);
        block = MapPages(*size + kHugePage);
        if (!block) return nullptr;
        const std::size_t before = (kHugePage - past(block)) % kHugePage;
        if (before > 0) (void)munmap(block, before);
        (void)munmap(block + before + *size, kHugePage - before);
        block += before;
    }
    if (block) (void)madvise(block, *size, MADV_HUGEPAGE);
    return block;
}

inline void UnmapHugePages(void *block, std::size_t size) {
    (void)munmap(block, size);
}

} // namespace configstore

#endif
