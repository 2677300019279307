/* SPDX-License-Identifier: Apache-2.0 */
// The heap: malloc and related functions, with a count of live blocks. In an ordinary build C++'s operators
// call these; under a sanitizer they do not, and interpose_new.cpp replaces them.

#include <array>
#include <atomic>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "fault/plan.h"
#include "fault/real.h"

namespace fault {

namespace {

constinit Real<void *(std::size_t)> g_malloc("malloc");
constinit Real<void *(std::size_t, std::size_t)> g_calloc("calloc");
constinit Real<void *(void *, std::size_t)> g_realloc("realloc");
constinit Real<void(void *)> g_free("free");
constinit Real<int(void **, std::size_t, std::size_t)> g_posixMemalign("posix_memalign");
constinit Real<void *(std::size_t, std::size_t)> g_alignedAlloc("aligned_alloc");
constinit Real<void *(std::size_t, std::size_t)> g_memalign("memalign");

// dlsym may itself allocate. Those few blocks come from this arena and are never reused.
alignas(std::max_align_t) std::array<char, 16384> g_early;
std::atomic<std::size_t> g_earlyUsed{0};
thread_local bool t_lookingUp __attribute__((tls_model("initial-exec"))) = false;

bool IsEarly(const void *block) {
    const auto at = reinterpret_cast<uintptr_t>(block);
    const auto start = reinterpret_cast<uintptr_t>(g_early.data());
    return at >= start && at < start + g_early.size();
}

void *EarlyBlock(std::size_t size) {
    const std::size_t rounded = (size + 15) & ~std::size_t{15};
    const std::size_t at = g_earlyUsed.fetch_add(rounded);
    return at + rounded <= g_early.size() ? g_early.data() + at : nullptr;
}

/// Looks up all functions before the first allocation: a lookup may free the message of an earlier failed
/// dlsym, which must not recurse into this code.
void LookUpAll() {
    t_lookingUp = true;
    (void)g_malloc.Get();
    (void)g_calloc.Get();
    (void)g_realloc.Get();
    (void)g_free.Get();
    (void)g_posixMemalign.Get();
    (void)g_alignedAlloc.Get();
    (void)g_memalign.Get();
    t_lookingUp = false;
}

template <typename Function> Function *LookUp(Real<Function> *real) {
    if (!g_memalign.IsKnown()) LookUpAll();
    return real->Get();
}

void *Counted(void *block) {
    if (block) NoteBlock(1);
    return block;
}

bool AllocFails() {
    return Fails(Kind::kAlloc, {});
}

} // namespace

} // namespace fault

using namespace fault;

extern "C" {

void *malloc(std::size_t size) {
    if (t_lookingUp) return EarlyBlock(size);
    return AllocFails() ? nullptr : Counted(LookUp(&g_malloc)(size));
}

void *calloc(std::size_t num, std::size_t size) {
    if (t_lookingUp) return EarlyBlock(num * size); // static storage: zero
    return AllocFails() ? nullptr : Counted(LookUp(&g_calloc)(num, size));
}

void free(void *block) {
    if (!block || IsEarly(block) || t_lookingUp)
        return; // a lookup frees at most a short error text
    NoteBlock(-1);
    LookUp (&g_free)(block);
}

void *realloc(void *block, std::size_t size) {
    if (t_lookingUp) return block ? nullptr : EarlyBlock(size);
    if (AllocFails()) return nullptr;
    if (IsEarly(block)) { // its size is unknown: copies up to the end of the arena
        void *moved = malloc(size);
        const std::size_t rest =
            g_early.size() - static_cast<std::size_t>(static_cast<char *>(block) - g_early.data());
        if (moved) std::memcpy(moved, block, size < rest ? size : rest);
        return moved;
    }
    void *moved = LookUp(&g_realloc)(block, size);
    if (!block && moved) NoteBlock(1);
    if (block && size == 0 && !moved) NoteBlock(-1);
    return moved;
}

int posix_memalign(void **block, std::size_t alignment, std::size_t size) {
    const Decision decision = Decide(Kind::kAlloc, {});
    if (decision.Fails()) return decision.error;
    const int error = LookUp(&g_posixMemalign)(block, alignment, size);
    if (error == 0) Counted(*block);
    return error;
}

void *aligned_alloc(std::size_t alignment, std::size_t size) {
    return AllocFails() ? nullptr : Counted(LookUp(&g_alignedAlloc)(alignment, size));
}

void *memalign(std::size_t alignment, std::size_t size) {
    return AllocFails() ? nullptr : Counted(LookUp(&g_memalign)(alignment, size));
}

} // extern "C"
