/* SPDX-License-Identifier: Apache-2.0 */
// Saves are atomic when killed, when system calls fail, and under concurrency. The concurrency tests run over
// every backend. STORE_KILL_ROUNDS and STORE_RACE_SAVES set the counts; STORE_FAULT_STEP=1 and
// STORE_MEMORY_STEP=1 fail every call.

#include "platform/configstore/support.h"

#include <chrono>
#include <csignal>
#include <filesystem>
#include <random>
#include <sqlite3.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

#include "fault/fault.h"
#include "fault/sweep.h"

using namespace configstore;
using namespace store_test;

namespace {

/// A document in which every port is tagged with its save.
std::string Tagged(int ports, const std::string &tag) {
    std::string json = R"({"name":")" + tag + R"(","ports":{)";
    for (int port = 0; port < ports; port++)
        json += (port > 0 ? ",\"" : "\"") + std::to_string(port) + R"(":{"name":")" + tag +
                R"(","connection_cookie":7,"settings":{"blocked":false}})";
    return json + "}}";
}

/// The tag of a whole document; empty without one, "mixed" for a mixture of saves.
std::string TagOf(const std::string &json, int ports) {
    if (json.empty()) return {};
    const std::size_t start = json.find("\"name\":\"") + 8;
    const std::string tag = json.substr(start, json.find('"', start) - start);
    return json == Tagged(ports, tag) ? tag : "mixed";
}

/// One save with the library's sequence of calls. Returns the first status that is not OK.
int32_t SaveOnce(const std::string &path, const std::string &json) {
    Store *raw = nullptr;
    int32_t status = admin::Open(path, false, &raw);
    if (status != OK) return status;
    const StorePtr store(raw);
    Object *object = nullptr;
    status = CreateObject(kKey, kGroup, kComponent, "sw1", json.c_str(), &object);
    if (status != OK) return status;
    const ObjectPtr owner(object);
    status = BeginTransaction(raw);
    if (status != OK) return status;
    status = Set(raw, object, "EXTERNAL");
    if (status == OK) status = CommitTransaction(raw);
    if (status != OK) {
        const int32_t cancelled = CancelTransaction(raw);
        return cancelled == OK ? status : 100 + cancelled;
    }
    return OK;
}

class StoreDurability : public StoreTest {
protected:
    std::string StoredTag(int ports) {
        const StorePtr store = Open();
        return store ? TagOf(Stored(store.get()), ports) : "no store";
    }
    void ExpectSound() {
        const StorePtr store = Open();
        std::vector<admin::Problem> problems;
        EXPECT_EQ(admin::Check(store.get(), &problems), OK);
        for (const admin::Problem &problem : problems)
            ADD_FAILURE() << problem.where << ": " << problem.what;
    }
};

TEST_F(StoreDurability, KilledSaveLeavesTheOldOrTheNewWhole) {
    constexpr int kPorts = 1024;
    const uint64_t rounds = fault::FromEnvironment("STORE_KILL_ROUNDS", 12);
    std::mt19937_64 random(20261121);
    std::string before = "start";
    ASSERT_EQ(SaveOnce(path_, Tagged(kPorts, before)), OK);
    uint64_t kept = 0;
    uint64_t changed = 0;
    for (uint64_t round = 0; round < rounds; round++) {
        SCOPED_TRACE(round);
        const std::string json = Tagged(kPorts, "round" + std::to_string(round));
        const pid_t child = fork();
        if (child == 0) _exit(SaveOnce(path_, json) == OK ? 0 : 1);
        usleep(static_cast<useconds_t>(random() % 25000));
        kill(child, SIGKILL);
        int status = 0;
        ASSERT_EQ(waitpid(child, &status, 0), child);
        const std::string after = StoredTag(kPorts);
        const std::string now = "round" + std::to_string(round);
        EXPECT_TRUE(after == before || after == now) << after;
        if (WIFEXITED(status)) {
            EXPECT_EQ(after, now); // the child reported a completed save
        }
        (after == now ? changed : kept)++;
        before = after;
        ExpectSound();
    }
    RecordProperty("old", static_cast<int>(kept));
    RecordProperty("new", static_cast<int>(changed));
}

TEST_F(StoreDurability, KilledAtEachSystemCallOfASave) {
    constexpr int kPorts = 300;
    const std::string old = Tagged(kPorts, "old");
    const std::string json = Tagged(kPorts, "new");
    const int step = static_cast<int>(fault::FromEnvironment("STORE_FAULT_STEP", 4));
    for (const char *kind : {"write", "fsync", "truncate", "unlink"}) {
        for (int at = 1;; at += step) {
            SCOPED_TRACE(std::string(kind) + ' ' + std::to_string(at));
            std::filesystem::remove_all(directory_);
            std::filesystem::create_directory(directory_);
            ASSERT_EQ(SaveOnce(path_, old), OK);
            const pid_t child = fork();
            if (child == 0) {
                fault_arm(
                    (std::string(kind) + ':' + std::to_string(at) + ":kill:path=" + directory_).c_str());
                const int32_t status = SaveOnce(path_, json);
                fault_disarm();
                _exit(status == OK ? 0 : 1);
            }
            int status = 0;
            ASSERT_EQ(waitpid(child, &status, 0), child);
            const std::string after = StoredTag(kPorts);
            EXPECT_TRUE(after == "old" || after == "new") << after;
            ExpectSound();
            if (WIFEXITED(status)) {
                EXPECT_EQ(WEXITSTATUS(status), 0);
                EXPECT_EQ(after, "new");
                break;
            }
            ASSERT_LT(at, 2000);
        }
    }
}

TEST_F(StoreDurability, FailingSystemCallsLeaveTheOldOrTheNewWhole) {
    constexpr int kPorts = 300;
    const std::string old = Tagged(kPorts, "old");
    const std::string json = Tagged(kPorts, "new");
    fault::Options options;
    options.warmUp = true;
    options.step = fault::FromEnvironment("STORE_FAULT_STEP", 7);
    for (const char *plan : {"write:%:ENOSPC", "write:%:EIO", "write:%:short=100", "fsync:%:EIO",
                             "truncate:%:EIO", "open:%:EMFILE", "read:%:EIO"}) {
        SCOPED_TRACE(plan);
        const auto reset = [&] {
            std::filesystem::remove_all(directory_);
            std::filesystem::create_directory(directory_);
            EXPECT_EQ(SaveOnce(path_, old), OK);
        };
        reset();
        fault::Sweep(
            std::string(plan) + ":path=" + directory_,
            [&](fault::Child &) { return static_cast<uint32_t>(SaveOnce(path_, json)); },
            [&](uint64_t round, const fault::Report &report) {
                SCOPED_TRACE(round);
                EXPECT_LT(report.status, 100U); // cancelling always succeeds
                EXPECT_EQ(report.leakedFds, 0);
                const std::string after = StoredTag(kPorts);
                const bool whole = after == "new" || (after == "old" && report.status != OK);
                EXPECT_TRUE(whole) << after << ' ' << report.status;
                ExpectSound();
                reset();
            },
            options);
    }
}

TEST_F(StoreDurability, EachFailedAllocationReturnsAStatusAndKeepsTheOld) {
    constexpr int kPorts = 20;
    const std::string json = Tagged(kPorts, "new");
    ASSERT_EQ(SaveOnce(path_, Tagged(kPorts, "old")), OK);
    fault::Options options;
    options.warmUp = true;
    options.step = fault::FromEnvironment("STORE_MEMORY_STEP", 7);
    fault::Sweep(
        "alloc:%", [&](fault::Child &) { return static_cast<uint32_t>(SaveOnce(path_, json)); },
        [&](uint64_t round, const fault::Report &report) {
            SCOPED_TRACE(round);
            const bool expected =
                report.status == OK || report.status == NO_MEMORY || report.status == IO_ERROR;
            EXPECT_TRUE(expected) << report.status;
            EXPECT_EQ(report.leakedBlocks, 0);
            EXPECT_EQ(report.leakedFds, 0);
            if (report.status == OK) {
                EXPECT_EQ(StoredTag(kPorts), "new");
            }
        },
        options);
    ExpectSound();
}

TEST_F(StoreDurability, TwoWritersAndAReaderNeverSeeAMixture) {
    constexpr int kPorts = 200;
    const uint64_t saves = fault::FromEnvironment("STORE_RACE_SAVES", 30);
    ASSERT_EQ(SaveOnce(path_, Tagged(kPorts, "start")), OK);
    std::vector<pid_t> writers;
    for (const char *name : {"one", "two"}) {
        const pid_t child = fork();
        if (child == 0) {
            for (uint64_t i = 0; i < saves; i++) {
                const int32_t status = SaveOnce(path_, Tagged(kPorts, name + std::to_string(i)));
                if (status != OK && status != BUSY) _exit(status);
            }
            _exit(0);
        }
        writers.push_back(child);
    }
    std::size_t reads = 0;
    for (std::size_t running = writers.size(); running > 0; reads++) {
        EXPECT_NE(StoredTag(kPorts), "mixed");
        int status = 0;
        const pid_t ended = waitpid(-1, &status, WNOHANG);
        if (ended <= 0) continue;
        running--;
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << status;
    }
    EXPECT_GT(reads, 0U);
    const std::string last = StoredTag(kPorts);
    EXPECT_TRUE(last == "one" + std::to_string(saves - 1) || last == "two" + std::to_string(saves - 1))
        << last;
    ExpectSound();
}

using StoreConcurrency = AnyStoreTest;
RUN_OVER_EVERY_BACKEND(StoreConcurrency);

TEST_P(StoreConcurrency, ContentionIsReportedByTheCallsAfterBegin) {
    const StorePtr first = Open();
    const StorePtr second = Open();
    admin::SetBusyTimeout(second.get(), 20);
    ASSERT_EQ(BeginTransaction(first.get()), OK);
    ASSERT_EQ(Set(first.get(), NewSwitch().get(), "EXTERNAL"), OK);
    {
        EXPECT_EQ(BeginTransaction(second.get()), OK);
        Object **objects = nullptr;
        int32_t count = 0;
        Object *object = nullptr;
        EXPECT_EQ(GetInstances(second.get(), NewSpec(kKey).get(), &objects, &count), BUSY);
        EXPECT_EQ(GetDesiredUserConfigInstances(second.get(), kKey, kGroup, kComponent, &objects, &count),
                  BUSY);
        EXPECT_EQ(Get(second.get(), kKey, kGroup, kComponent, "sw1", &object), BUSY);
        EXPECT_EQ(Set(second.get(), NewSwitch().get(), "EXTERNAL"), BUSY);
        EXPECT_EQ(Delete(second.get(), kKey, kGroup, kComponent, "sw1"), BUSY);
        EXPECT_EQ(CommitTransaction(second.get()), BUSY);
        EXPECT_EQ(CancelTransaction(second.get()), OK);
        const Failure *const failure = admin::LastFailure(second.get());
        ASSERT_NE(failure, nullptr); // recorded by the begin; the rejected calls and the cancel keep it
        EXPECT_EQ(failure->status, BUSY);
        EXPECT_EQ(failure->sqliteCode, GetParam() == In::File ? SQLITE_BUSY : 0);
    }
    ASSERT_EQ(CommitTransaction(first.get()), OK);
    Save(second.get(), R"({"name":"second"})");
    EXPECT_EQ(Stored(first.get()), R"({"name":"second"})");
}

TEST_P(StoreConcurrency, ReaderInsideAWritersTransactionSeesTheOldContent) {
    const StorePtr writer = Open();
    Save(writer.get(), R"({"name":"old"})");
    const StorePtr reader = Open();
    ASSERT_EQ(BeginTransaction(writer.get()), OK);
    ASSERT_EQ(Set(writer.get(), NewSwitch(R"({"name":"new"})").get(), "EXTERNAL"), OK);
    EXPECT_EQ(Stored(reader.get()), R"({"name":"old"})");
    ASSERT_EQ(CommitTransaction(writer.get()), OK);
    EXPECT_EQ(Stored(reader.get()), R"({"name":"new"})");
}

TEST_P(StoreConcurrency, WritersWaitForEachOtherAndReadersDoNotWait) {
    const StorePtr first = Open();
    const StorePtr second = Open();
    Save(first.get(), R"({"name":"start"})");
    ASSERT_EQ(BeginTransaction(first.get()), OK);
    ASSERT_EQ(Set(first.get(), NewSwitch(R"({"name":"first"})").get(), "EXTERNAL"), OK);
    std::thread reader([this] {
        const StorePtr store = Open();
        EXPECT_EQ(Stored(store.get()), R"({"name":"start"})");
    });
    reader.join();
    std::thread writer([this, &second] { Save(second.get(), R"({"name":"second"})"); });
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    ASSERT_EQ(CommitTransaction(first.get()), OK);
    writer.join();
    EXPECT_EQ(Stored(first.get()), R"({"name":"second"})");
    int64_t revision = 0;
    ASSERT_EQ(admin::LatestRevision(first.get(), &revision), OK);
    EXPECT_EQ(revision, 3);
}

} // namespace
