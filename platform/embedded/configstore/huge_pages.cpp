/* SPDX-License-Identifier: Apache-2.0 */
// Large blocks from the system (huge_pages.h). A few blocks of one page stay with the process for the next
// tree or text: clearing a fresh page of that size takes the system as long as filling it takes a reader of
// documents.

#include "platform/embedded/configstore/huge_pages.h"

#include <array>
#include <atomic>
#include <cstdint>
#include <sys/mman.h>

namespace configstore {

namespace {

constexpr std::size_t kMostKept = 4; // what a save of a switch of some four thousand ports takes

std::array<std::atomic<char *>, kMostKept> g_kept{};

char *TakeKept() {
    for (auto &slot : g_kept) {
        if (!slot.load(std::memory_order_relaxed)) continue;
        if (char *const block = slot.exchange(nullptr, std::memory_order_acquire)) return block;
    }
    return nullptr;
}

bool Keep(char *block) {
    for (auto &slot : g_kept) {
        char *nothing = nullptr;
        if (slot.compare_exchange_strong(nothing, block, std::memory_order_release,
                                         std::memory_order_relaxed))
            return true;
    }
    return false;
}

char *MapPages(std::size_t size) {
    void *const block = mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    return block == MAP_FAILED ? nullptr : static_cast<char *>(block);
}

std::size_t PastHugePage(const char *block) {
    return reinterpret_cast<uintptr_t>(block) % kHugePage;
}

} // namespace

char *MapHugePages(std::size_t *size) {
    if (*size > SIZE_MAX - 2 * kHugePage) return nullptr;
    *size = (*size + kHugePage - 1) / kHugePage * kHugePage;
    if (*size == kHugePage) {
        if (char *const kept = TakeKept()) return kept;
    }
    char *block = MapPages(*size);
    if (block && PastHugePage(block) != 0) { // rare, as the system puts mappings side by side
        (void)munmap(block, *size);
        block = MapPages(*size + kHugePage);
        if (!block) return nullptr;
        const std::size_t before = (kHugePage - PastHugePage(block)) % kHugePage;
        if (before > 0) (void)munmap(block, before);
        (void)munmap(block + before + *size, kHugePage - before);
        block += before;
    }
    if (block) dvs::base::AdviseHugePages(block, *size);
    return block;
}

void UnmapHugePages(void *block, std::size_t size) {
    if (size == kHugePage && Keep(static_cast<char *>(block))) return;
    (void)munmap(block, size);
}

} // namespace configstore
