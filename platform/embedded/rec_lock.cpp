/* SPDX-License-Identifier: Apache-2.0 */
// Recursive locks of the embedded runtime (platform/runtime.h), over pthread mutexes.
//
// Making a lock needs no memory: the library makes its locks on first use, often deep inside an operation
// that can report a failed allocation but not a failed lock. So they come from a pool in static storage.
//
// Builds without NDEBUG keep, per thread, the list of the locks it holds. That list answers both questions
// asked of it (does this thread own the lock, does it hold one of a larger rank) without looking at anything
// shared.

#include "platform/runtime.h"

#include <array>
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <pthread.h>

struct MXUserRecLock {
    pthread_mutex_t mutex;
    uint32_t rank;
    char name[32];
};

namespace {

constexpr std::size_t kMaxLocks = 32;

// Both guarded by g_poolMutex; a lock is never written again once its address has been published.
constinit std::array<MXUserRecLock, kMaxLocks> g_pool{};
constinit std::size_t g_poolUsed = 0;
pthread_mutex_t g_poolMutex = PTHREAD_MUTEX_INITIALIZER;

MXUserRecLock *TakeFromPool(const char *name, uint32_t rank) {
    if (g_poolUsed == g_pool.size()) {
        std::fprintf(stderr, "no room for lock \"%s\": more than %zu singleton locks\n", name, kMaxLocks);
        std::abort();
    }
    MXUserRecLock &lock = g_pool[g_poolUsed++];
    pthread_mutexattr_t attributes;
    pthread_mutexattr_init(&attributes);
    pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_RECURSIVE);
    pthread_mutex_init(&lock.mutex, &attributes);
    pthread_mutexattr_destroy(&attributes);
    lock.rank = rank;
    std::snprintf(lock.name, sizeof lock.name, "%s", name);
    return &lock;
}

#ifndef NDEBUG

struct HeldLock {
    MXUserRecLock *lock;
    uint32_t depth;
};

// A thread holds each lock of the pool at most once here, so the list cannot overflow.
thread_local std::array<HeldLock, kMaxLocks> t_held{};
thread_local std::size_t t_heldNum = 0;

HeldLock *FindHeld(const MXUserRecLock *lock) {
    for (std::size_t i = 0; i < t_heldNum; i++) {
        if (t_held[i].lock == lock) return &t_held[i];
    }
    return nullptr;
}

void CheckOrder(const MXUserRecLock *lock) {
    if (FindHeld(lock)) return;
    for (std::size_t i = 0; i < t_heldNum; i++) {
        const MXUserRecLock *held = t_held[i].lock;
        if (held->rank < lock->rank) continue;
        std::fprintf(
            stderr,
            "lock order violated: \"%s\" (rank 0x%x) is waited for while \"%s\" (rank 0x%x) is held\n",
            lock->name, lock->rank, held->name, held->rank);
        std::abort();
    }
}

void NoteAcquired(MXUserRecLock *lock) {
    if (HeldLock *held = FindHeld(lock))
        held->depth++;
    else
        t_held[t_heldNum++] = {lock, 1};
}

void NoteReleased(const MXUserRecLock *lock) {
    HeldLock *held = FindHeld(lock);
    if (!held) {
        std::fprintf(stderr, "lock \"%s\" is released by a thread that does not hold it\n", lock->name);
        std::abort();
    }
    if (--held->depth == 0) *held = t_held[--t_heldNum];
}

#else

void CheckOrder(const MXUserRecLock *) {}
void NoteAcquired(MXUserRecLock *) {}
void NoteReleased(const MXUserRecLock *) {}

#endif

} // namespace

extern "C" MXUserRecLock *MXUser_CreateSingletonRecLockInt(MXUserRecLock **storage, const char *name,
                                                           uint32_t rank) {
    const std::atomic_ref<MXUserRecLock *> shared(*storage);
    if (MXUserRecLock *lock = shared.load(std::memory_order_acquire)) return lock;
    pthread_mutex_lock(&g_poolMutex);
    MXUserRecLock *lock = shared.load(std::memory_order_relaxed);
    if (!lock) {
        lock = TakeFromPool(name, rank);
        shared.store(lock, std::memory_order_release);
    }
    pthread_mutex_unlock(&g_poolMutex);
    return lock;
}

extern "C" void MXUser_AcquireRecLock(MXUserRecLock *lock) {
    CheckOrder(lock);
    pthread_mutex_lock(&lock->mutex);
    NoteAcquired(lock);
}

extern "C" void MXUser_ReleaseRecLock(MXUserRecLock *lock) {
    NoteReleased(lock);
    pthread_mutex_unlock(&lock->mutex);
}
