/* SPDX-License-Identifier: Apache-2.0 */
// The lock "dvshyp", which serializes the uses of the switch table as scratch. Its rank is one below that of
// the switch-state lock, because it is taken first.

#include <atomic>

#include "dvs/hyp.h"
#include "platform/runtime.h"

namespace {

constexpr uint32_t kLockRank = 0xFEFFFFFE;

/// Set once by the runtime, which makes concurrent creation safe.
constinit MXUserRecLock *g_lock = nullptr;

} // namespace

extern "C" MXUserRecLock *DVSwitchHYPLock(void) {
    MXUserRecLock *lock = std::atomic_ref(g_lock).load(std::memory_order_acquire);
    if (!lock) lock = MXUser_CreateSingletonRecLockInt(&g_lock, "dvshyp", kLockRank);
    MXUser_AcquireRecLock(lock);
    return lock;
}

extern "C" void DVSwitchHYPUnlock(MXUserRecLock *lock) {
    if (lock) MXUser_ReleaseRecLock(lock);
}
