/* SPDX-License-Identifier: Apache-2.0 */
// The wrapped lock functions (lock_count.h).

#include "configstore/lock_count.h"

#include <atomic>

#include "platform/runtime.h"

namespace {
std::atomic<int> g_held{0};
}

extern "C" {
void __real_MXUser_AcquireRecLock(MXUserRecLock *lock);
void __real_MXUser_ReleaseRecLock(MXUserRecLock *lock);
void __wrap_MXUser_AcquireRecLock(MXUserRecLock *lock);
void __wrap_MXUser_ReleaseRecLock(MXUserRecLock *lock);

void __wrap_MXUser_AcquireRecLock(MXUserRecLock *lock) {
    __real_MXUser_AcquireRecLock(lock);
    ++g_held;
}
void __wrap_MXUser_ReleaseRecLock(MXUserRecLock *lock) {
    --g_held;
    __real_MXUser_ReleaseRecLock(lock);
}
}

int lock_count::Held() {
    return g_held;
}
