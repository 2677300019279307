/* SPDX-License-Identifier: Apache-2.0 */
// Fails each allocation of saves, loads and upgrades in turn. Each must return a status (a load: no buffer),
// commit nothing, leak nothing and hold no lock. The store double's own allocations do not fail.

#include <filesystem>

#include <unistd.h>

#include "configstore/store_fixture.h"
#include "configstore/upgrade.h"
#include "dvs/file.h"
#include "fault/sweep.h"

using namespace state_builder;

namespace {

Switch Full(const std::string &id) {
    Switch sw;
    sw.id = id;
    sw.global = {Alias("name"),
                 Version(),
                 {"com.orbeno.common.uplinkPorts", U32(1) + Slot("u1", 81)},
                 {"no end", Raw(std::string(100, 'x'))},
                 {"opaque", Bytes{1}, 0x18}};
    sw.host = {{"com.orbeno.common.host.portset", Text("ps")},
               {"com.orbeno.common.host.uplinkPorts", U32(1) + Slot("p1", 48)}};
    sw.ports = {{"p1", {{"com.orbeno.common.port.alias", Text("x")}, {"x.ruleset", Bytes(9)}}}};
    return sw;
}

struct StoreMemory : testing::Test {
    StoreMemory() {
        dvsconfigstore_debug = -1;
        options.warmUp = true; // the lock is created and the host's limit is read once
        options.conclude = [](fault::Child &child) {
            if (fake_store::OpenHandles() != 0) child.Note("handles ");
            if (StoreTest::SwitchesInTable() != 0) child.Note("table ");
            static MXUserRecLock *lock = nullptr;
            child.CheckLock([] { lock = DVSwitchHandleLock(); }, [] { DVSwitchHandleUnlock(lock); });
        };
    }
    static void ExpectClean(uint64_t k, const fault::Report &report) {
        SCOPED_TRACE(k);
        EXPECT_EQ("", report.notes);
        EXPECT_EQ(0, report.leakedBlocks);
        EXPECT_FALSE(report.lockHeld);
        EXPECT_FALSE(report.crashed);
    }
    // Runs `work` on a store of one switch; "changed" where it failed and changed it.
    template <typename Work> uint32_t OnStore(fault::Child &child, const Work &work) {
        // One capture each: what Unfaulted is given must not allocate on its way there.
        struct Run {
            fault::Child &child;
            std::string before;
            int32_t status;
        } run{child, {}, 0};
        child.Unfaulted([&run] {
            fake_store::Reset();
            StoreTest::Save({Full("a")});
            run.before = fake_store::Dump();
        });
        const int32_t status = work();
        run.status = status;
        child.Unfaulted([&run] {
            if (run.status != 0 && fake_store::Dump() != run.before) run.child.Note("changed ");
            fake_store::Reset();
            run.before = std::string();
        });
        return static_cast<uint32_t>(status);
    }
    fault::Options options;
};

TEST_F(StoreMemory, FailingCheckedSaveChangesNothing) {
    const Bytes state = State({Full("a"), Full("b"), Full("c"), Full("d")});
    const auto save = [&] {
        return DVSState_SaveBufToConfigStoreChecked(state.data(), static_cast<uint32_t>(state.size()),
                                                    nullptr);
    };
    int failures = 0;
    const uint64_t rounds = fault::Sweep(
        "alloc:%", [&](fault::Child &child) { return OnStore(child, save); },
        [&](uint64_t k, const fault::Report &report) {
            failures += report.status != 0;
            ExpectClean(k, report);
        },
        options);
    EXPECT_GT(rounds, 30u);
    EXPECT_GT(failures, 30);
}

TEST_F(StoreMemory, FailingLoadReturnsNoBuffer) {
    const auto load = [] {
        void *buf = nullptr;
        uint32_t len = 0;
        const int32_t status = DVSState_LoadFromConfigStoreAsBuf(&buf, &len, false);
        std::free(buf);
        return status == 0 && !buf ? -1 : status;
    };
    for (const int level : {-1, 1}) {
        dvsconfigstore_debug = level;
        const uint64_t rounds = fault::Sweep(
            "alloc:%", [&](fault::Child &child) { return OnStore(child, load); }, ExpectClean, options);
        EXPECT_GE(rounds, 5u); // the image, two values, and its last block; then a load that succeeds
    }
}

TEST_F(StoreMemory, FailingUpgradeChangesNothing) {
    char directory[] = "/tmp/dvs-memory-XXXXXX";
    ASSERT_NE(nullptr, mkdtemp(directory));
    const std::string path = std::string(directory) + "/state";
    const Bytes state = State({Full("a"), Full("b"), Full("c")});
    ASSERT_EQ(HYP_OK, DVSFile_Write(path.c_str(), state.data(), static_cast<uint32_t>(state.size())));
    const auto upgrade = [&] { return RetrieveUpgradeInfoFrom(path.c_str()); };
    const uint64_t rounds = fault::Sweep(
        "alloc:%", [&](fault::Child &child) { return OnStore(child, upgrade); }, ExpectClean, options);
    EXPECT_GT(rounds, 20u);
    std::filesystem::remove_all(directory);
}

} // namespace
