/* SPDX-License-Identifier: Apache-2.0 */
// Recursive locks: one per storage regardless of the creator, recursion, exclusion, and debug-build checks.

#include "platform/runtime.h"

#include <gtest/gtest.h>

#include <atomic>
#include <set>
#include <thread>
#include <vector>

namespace {

constexpr uint32_t kOuterRank = 0xfefffffe;
constexpr uint32_t kInnerRank = 0xfeffffff;

MXUserRecLock *g_outer;
MXUserRecLock *g_inner;
MXUserRecLock *g_raced;

MXUserRecLock *Outer() {
    return MXUser_CreateSingletonRecLockInt(&g_outer, "dvshyp", kOuterRank);
}
MXUserRecLock *Inner() {
    return MXUser_CreateSingletonRecLockInt(&g_inner, "dvsstate", kInnerRank);
}

TEST(RecLock, IsMadeOncePerStorage) {
    EXPECT_NE(Outer(), nullptr);
    EXPECT_EQ(Outer(), Outer());
    EXPECT_EQ(g_outer, Outer());
    EXPECT_NE(Outer(), Inner());
}

TEST(RecLock, RacingCreatorsGetTheSameLock) {
    constexpr int kThreads = 8;
    std::atomic<int> waiting{kThreads};
    std::vector<MXUserRecLock *> seen(kThreads);
    std::vector<std::thread> threads;
    for (auto &slot : seen) {
        threads.emplace_back([&slot, &waiting] {
            waiting--;
            while (waiting > 0)
                std::this_thread::yield();
            slot = MXUser_CreateSingletonRecLockInt(&g_raced, "raced", 1);
        });
    }
    for (auto &thread : threads)
        thread.join();
    EXPECT_EQ(std::set<MXUserRecLock *>(seen.begin(), seen.end()).size(), 1u);
    EXPECT_EQ(seen[0], g_raced);
}

TEST(RecLock, IsRecursive) {
    MXUser_AcquireRecLock(Inner());
    MXUser_AcquireRecLock(Inner());
    MXUser_AcquireRecLock(Inner());
    MXUser_ReleaseRecLock(Inner());
    MXUser_ReleaseRecLock(Inner());
    std::atomic<bool> taken{false};
    std::thread other([&taken] {
        MXUser_AcquireRecLock(Inner());
        taken = true;
        MXUser_ReleaseRecLock(Inner());
    });
    for (int i = 0; i < 1000; i++)
        std::this_thread::yield();
    EXPECT_FALSE(taken) << "released before its last release call";
    MXUser_ReleaseRecLock(Inner());
    other.join();
    EXPECT_TRUE(taken);
}

TEST(RecLock, ExcludesOtherThreads) {
    int counter = 0;
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; t++) {
        threads.emplace_back([&counter] {
            for (int i = 0; i < 5000; i++) {
                MXUser_AcquireRecLock(Outer());
                MXUser_AcquireRecLock(Inner());
                counter++;
                MXUser_ReleaseRecLock(Inner());
                MXUser_ReleaseRecLock(Outer());
            }
        });
    }
    for (auto &thread : threads)
        thread.join();
    EXPECT_EQ(counter, 20000);
}

TEST(RecLock, MayBeReleasedInAnyOrder) {
    MXUser_AcquireRecLock(Outer());
    MXUser_AcquireRecLock(Inner());
    MXUser_ReleaseRecLock(Outer());
    MXUser_ReleaseRecLock(Inner());
    MXUser_AcquireRecLock(Outer());
    MXUser_ReleaseRecLock(Outer());
}

TEST(RecLock, HeldLockMayBeTakenAgainUnderALaterOne) {
    MXUser_AcquireRecLock(Outer());
    MXUser_AcquireRecLock(Inner());
    MXUser_AcquireRecLock(Outer());
    MXUser_ReleaseRecLock(Outer());
    MXUser_ReleaseRecLock(Inner());
    MXUser_ReleaseRecLock(Outer());
}

TEST(RecLock, CreatingOneBeyondThePoolIsFatal) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    static MXUserRecLock *storage[40];
    EXPECT_DEATH(
        {
            for (auto &slot : storage)
                MXUser_CreateSingletonRecLockInt(&slot, "many", 5);
        },
        "no room for lock \"many\"");
}

#ifndef NDEBUG

TEST(RecLockDeath, TakingTheOuterLockSecondIsFatal) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_DEATH(
        {
            MXUser_AcquireRecLock(Inner());
            MXUser_AcquireRecLock(Outer());
        },
        "lock order violated: \"dvshyp\" .rank 0xfefffffe. is waited for while \"dvsstate\" .rank "
        "0xfeffffff. is held");
}

TEST(RecLockDeath, ReleasingAnotherThreadsLockIsFatal) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_DEATH(
        {
            std::thread([] { MXUser_AcquireRecLock(Inner()); }).join();
            MXUser_ReleaseRecLock(Inner());
        },
        "lock \"dvsstate\" is released by a thread that does not hold it");
}

TEST(RecLockDeath, ReleasingOnceTooOftenIsFatal) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_DEATH(
        {
            MXUser_AcquireRecLock(Inner());
            MXUser_ReleaseRecLock(Inner());
            MXUser_ReleaseRecLock(Inner());
        },
        "does not hold it");
}

#endif

} // namespace
