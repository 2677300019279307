/* SPDX-License-Identifier: Apache-2.0 */
// C++'s allocation operators, for sanitizer builds only: a sanitizer's operators do not call malloc. These
// wrap them, so that the sanitizer still sees which operator allocated and which freed a block.

#include <cstddef>
#include <new>

#include "fault/plan.h"
#include "fault/real.h"

namespace {

using fault::Real;

constinit Real<void *(std::size_t)> g_new("_Znwm");
constinit Real<void *(std::size_t)> g_newArray("_Znam");
constinit Real<void *(std::size_t, std::align_val_t)> g_newAligned("_ZnwmSt11align_val_t");
constinit Real<void *(std::size_t, std::align_val_t)> g_newArrayAligned("_ZnamSt11align_val_t");
constinit Real<void(void *)> g_delete("_ZdlPv");
constinit Real<void(void *)> g_deleteArray("_ZdaPv");
constinit Real<void(void *, std::size_t)> g_deleteSized("_ZdlPvm");
constinit Real<void(void *, std::size_t)> g_deleteArraySized("_ZdaPvm");
constinit Real<void(void *, std::align_val_t)> g_deleteAligned("_ZdlPvSt11align_val_t");
constinit Real<void(void *, std::align_val_t)> g_deleteArrayAligned("_ZdaPvSt11align_val_t");
constinit Real<void(void *, std::size_t, std::align_val_t)> g_deleteSizedAligned("_ZdlPvmSt11align_val_t");
constinit Real<void(void *, std::size_t, std::align_val_t)>
    g_deleteArraySizedAligned("_ZdaPvmSt11align_val_t");

template <typename Function, typename... Args> void *Make(Real<Function> *real, Args... args) {
    if (fault::Fails(fault::Kind::kAlloc, {})) return nullptr;
    const fault::Quiet quiet;
    void *block = (*real)(args...);
    fault::NoteBlock(1);
    return block;
}

template <typename Function, typename... Args> void *MakeOrThrow(Real<Function> *real, Args... args) {
    void *block = Make(real, args...);
    if (!block) throw std::bad_alloc();
    return block;
}

template <typename Function, typename... Args> void Release(Real<Function> *real, void *block, Args... args) {
    if (!block) return;
    fault::NoteBlock(-1);
    (*real)(block, args...);
}

} // namespace

void *operator new(std::size_t size) {
    return MakeOrThrow(&g_new, size);
}
void *operator new[](std::size_t size) {
    return MakeOrThrow(&g_newArray, size);
}
void *operator new(std::size_t size, const std::nothrow_t &) noexcept {
    return Make(&g_new, size);
}
void *operator new[](std::size_t size, const std::nothrow_t &) noexcept {
    return Make(&g_newArray, size);
}
void *operator new(std::size_t size, std::align_val_t align) {
    return MakeOrThrow(&g_newAligned, size, align);
}
void *operator new[](std::size_t size, std::align_val_t align) {
    return MakeOrThrow(&g_newArrayAligned, size, align);
}

void operator delete(void *block) noexcept {
    Release(&g_delete, block);
}
void operator delete[](void *block) noexcept {
    Release(&g_deleteArray, block);
}
void operator delete(void *block, const std::nothrow_t &) noexcept {
    Release(&g_delete, block);
}
void operator delete[](void *block, const std::nothrow_t &) noexcept {
    Release(&g_deleteArray, block);
}
void operator delete(void *block, std::size_t size) noexcept {
    Release(&g_deleteSized, block, size);
}
void operator delete[](void *block, std::size_t size) noexcept {
    Release(&g_deleteArraySized, block, size);
}
void operator delete(void *block, std::align_val_t align) noexcept {
    Release(&g_deleteAligned, block, align);
}
void operator delete[](void *block, std::align_val_t align) noexcept {
    Release(&g_deleteArrayAligned, block, align);
}
void operator delete(void *block, std::size_t size, std::align_val_t align) noexcept {
    Release(&g_deleteSizedAligned, block, size, align);
}
void operator delete[](void *block, std::size_t size, std::align_val_t align) noexcept {
    Release(&g_deleteArraySizedAligned, block, size, align);
}
