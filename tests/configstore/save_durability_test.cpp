/* SPDX-License-Identifier: Apache-2.0 */
// Whole saves into a real database: killed at random moments, with failing system calls, and two at once with
// a reader. A load must always return exactly one save. DVS_KILL_ROUNDS and DVS_RACE_SAVES set the counts;
// DVS_FAULT_STEP=1 fails every call.

#include <chrono>
#include <csignal>
#include <filesystem>
#include <random>
#include <set>
#include <sqlite3.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "configstore/lock_count.h"
#include "configstore/state_builder.h"
#include "dvs/configstore.h"
#include "dvs/state.h"
#include "fault/sweep.h"

using namespace state_builder;

namespace {

constexpr int32_t kBusy = 2;

// Tags every port with its save.
Bytes Tagged(int ports, const std::string &tag) {
    Switch sw;
    sw.id = "sw";
    sw.global = {Alias(tag), Version()};
    for (int i = 0; i < ports; ++i)
        sw.ports.push_back({"port-" + std::to_string(i), {{"com.orbeno.common.port.alias", Text(tag)}}});
    return State({sw});
}

int32_t SaveBytes(const Bytes &state) {
    return DVSState_SaveBufToConfigStore(state.data(), static_cast<uint32_t>(state.size()));
}

// The tag of the store's content; "none" if the load fails, "mixed" for a mixture of saves.
std::string LoadTag(std::size_t ports) {
    void *buf = nullptr;
    uint32_t len = 0;
    if (DVSState_LoadFromConfigStoreAsBuf(&buf, &len, false) != 0 || !buf) return "none";
    const auto *bytes = static_cast<const uint8_t *>(buf);
    const auto switches = Parse({bytes, bytes + len});
    std::free(buf);
    if (switches.size() != 1 || switches[0].ports.size() != ports) return "mixed";
    const Bytes tag = Find(switches[0].global, "com.orbeno.common.alias").value;
    for (const auto &port : switches[0].ports)
        if (Find(port.props, "com.orbeno.common.port.alias").value != tag) return "mixed";
    return reinterpret_cast<const char *>(tag.data());
}

std::string IntegrityOf(const std::string &path) {
    sqlite3 *db = nullptr;
    sqlite3_stmt *statement = nullptr;
    std::string result = "cannot be opened";
    if (sqlite3_open(path.c_str(), &db) == SQLITE_OK &&
        sqlite3_prepare_v2(db, "PRAGMA integrity_check", -1, &statement, nullptr) == SQLITE_OK &&
        sqlite3_step(statement) == SQLITE_ROW)
        result = reinterpret_cast<const char *>(sqlite3_column_text(statement, 0));
    sqlite3_finalize(statement);
    sqlite3_close(db);
    return result;
}

struct SaveDurability : testing::Test {
    SaveDurability() {
        char name[] = "/tmp/dvs-durability-XXXXXX";
        directory = mkdtemp(name);
        path = directory + "/store.db";
        setenv("DVS_CONFIGSTORE", path.c_str(), 1);
        dvsconfigstore_debug = -1;
    }
    ~SaveDurability() override { std::filesystem::remove_all(directory); }
    std::string directory, path;
};

TEST_F(SaveDurability, KilledAtARandomMomentLeavesTheOldContentOrTheNew) {
    constexpr int kPorts = 1024;
    const auto rounds = fault::FromEnvironment("DVS_KILL_ROUNDS", 8);
    std::mt19937 random(20250711);
    std::string held = "first";
    const auto start = std::chrono::steady_clock::now();
    ASSERT_EQ(0, SaveBytes(Tagged(kPorts, held)));
    const auto whole = std::chrono::steady_clock::now() - start;
    const auto longest = std::chrono::duration_cast<std::chrono::microseconds>(whole).count();
    for (uint64_t round = 0; round < rounds; ++round) {
        const std::string tag = "save-" + std::to_string(round);
        const Bytes state = Tagged(kPorts, tag);
        const pid_t child = fork();
        ASSERT_GE(child, 0);
        if (child == 0) _exit(SaveBytes(state) == 0 ? 0 : 1);
        usleep(static_cast<useconds_t>(random() % static_cast<unsigned long>(longest + 1)));
        kill(child, SIGKILL);
        int ended = 0;
        ASSERT_EQ(child, waitpid(child, &ended, 0));
        const std::string now = LoadTag(kPorts);
        EXPECT_TRUE(now == held || now == tag) << "round " << round << ": " << now;
        if (WIFEXITED(ended) && WEXITSTATUS(ended) == 0) {
            EXPECT_EQ(tag, now) << "a completed save must be stored";
        }
        EXPECT_EQ("ok", IntegrityOf(path));
        held = now;
    }
}

TEST_F(SaveDurability, TwoSaversAtOnceAndAReaderSeeWholeSavesOnly) {
    constexpr int kPorts = 64;
    const auto saves = static_cast<int>(fault::FromEnvironment("DVS_RACE_SAVES", 20));
    ASSERT_EQ(0, SaveBytes(Tagged(kPorts, "first")));
    pid_t children[2];
    for (int writer = 0; writer < 2; ++writer) {
        children[writer] = fork();
        ASSERT_GE(children[writer], 0);
        if (children[writer] != 0) continue;
        const Bytes state = Tagged(kPorts, "writer-" + std::to_string(writer));
        for (int i = 0; i < saves; ++i) {
            const int32_t status = SaveBytes(state);
            if (status != 0 && status != kBusy) _exit(1);
            if (lock_count::Held() != 0) _exit(2);
        }
        _exit(0);
    }
    const std::set<std::string> whole = {"first", "writer-0", "writer-1"};
    for (int running = 2; running > 0;) {
        EXPECT_TRUE(whole.contains(LoadTag(kPorts)));
        int ended = 0;
        const pid_t child = waitpid(-1, &ended, WNOHANG);
        if (child <= 0) continue;
        EXPECT_TRUE(WIFEXITED(ended));
        EXPECT_EQ(0, WEXITSTATUS(ended)) << "1: neither 0 nor BUSY, 2: a lock left held";
        --running;
    }
    EXPECT_TRUE(whole.contains(LoadTag(kPorts)));
    EXPECT_EQ("ok", IntegrityOf(path));
}

TEST_F(SaveDurability, FailingWriteSyncOrTruncateLeavesTheOldOrTheNew) {
    constexpr int kPorts = 64;
    const Bytes before = Tagged(kPorts, "before");
    const Bytes after = Tagged(kPorts, "after");
    ASSERT_EQ(0, SaveBytes(before));
    fault::Options options;
    options.step = fault::FromEnvironment("DVS_FAULT_STEP", 5);
    options.conclude = [](fault::Child &child) {
        if (DVSState_ConfigReset() != HYP_OK) child.Note("reset");
        // The lock stays held only if the store cannot be opened or the transaction cannot begin, as
        // documented.
    };
    for (const char *kind : {"write", "fsync", "truncate"}) {
        const std::string plan = std::string(kind) + ":%:EIO:path=" + path;
        fault::Sweep(
            plan, [&](fault::Child &) { return static_cast<uint32_t>(SaveBytes(after)); },
            [&](uint64_t k, const fault::Report &report) {
                SCOPED_TRACE(plan + " " + std::to_string(k));
                EXPECT_FALSE(report.crashed);
                const std::string now = LoadTag(kPorts);
                EXPECT_TRUE(now == "after" || now == "before") << now;
                EXPECT_TRUE(report.status != 0 || now == "after");
                EXPECT_EQ("ok", IntegrityOf(path));
                ASSERT_EQ(0, SaveBytes(before));
            },
            options);
    }
}

} // namespace
