/* SPDX-License-Identifier: Apache-2.0 */
// Untrusted database files: each is read or rejected without harm, and a rejected file is left unchanged.
// STORE_FLIP_ROUNDS sets the number of damaged copies.

#include "platform/configstore/support.h"

#include <filesystem>
#include <fstream>
#include <random>
#include <sqlite3.h>
#include <sys/stat.h>
#include <unistd.h>

using namespace configstore;
using namespace store_test;

namespace {

std::string ReadFile(const std::string &path) {
    std::ifstream file(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(file), {});
}

void WriteFile(const std::string &path, const std::string &bytes) {
    std::ofstream(path, std::ios::binary) << bytes;
}

class StoreHostileDatabase : public StoreTest {
protected:
    /// Opening returns the status, names the file and leaves the file's bytes unchanged.
    void ExpectRefused(int32_t wanted, const std::string &why) {
        const bool file = std::filesystem::is_regular_file(path_);
        const std::string before = file ? ReadFile(path_) : "";
        Store *store = nullptr;
        Failure failure;
        EXPECT_EQ(admin::Open(path_, false, &store, &failure), wanted);
        EXPECT_EQ(store, nullptr);
        EXPECT_EQ(failure.status, wanted);
        EXPECT_EQ(failure.path, path_);
        EXPECT_NE(failure.what.find(why), std::string::npos) << failure.what;
        if (file) {
            EXPECT_TRUE(ReadFile(path_) == before);
        }
    }

    /// The bytes of a valid store, in one file.
    std::string GoodStore() {
        {
            const StorePtr store = Open();
            for (int version = 0; version < 3; version++) {
                for (const char *id : {"a", "b", "c"}) {
                    std::string json = R"({"name":"version )" + std::to_string(version) + R"(","ports":{)";
                    for (int port = 0; port < 40; port++)
                        json += (port > 0 ? ",\"" : "\"") + std::to_string(port) + R"(":{"name":"port"})";
                    Save(store.get(), json + "}}", id);
                }
            }
        }
        EXPECT_FALSE(std::filesystem::exists(path_ + "-wal"));
        return ReadFile(path_);
    }

    /// Calls every function on the file, whatever it contains. Each may fail with an error that names the
    /// file.
    void Exercise() {
        Store *store = nullptr;
        Failure failure;
        if (admin::Open(path_, false, &store, &failure) != OK) {
            EXPECT_EQ(failure.path, path_);
            return;
        }
        const StorePtr owner(store);
        const auto expectRecord = [&](int32_t status) {
            if (status == OK || status == NOT_FOUND) return true;
            const Failure *const record = admin::LastFailure(store);
            EXPECT_TRUE(record && record->path == path_ && record->status == status) << status;
            return false;
        };
        FilterSpec *spec = nullptr;
        ASSERT_EQ(CreateFilterSpecObject(kKey, kGroup, kComponent, "", &spec), OK);
        const SpecPtr specOwner(spec);
        Object **objects = nullptr;
        int32_t count = 0;
        if (expectRecord(GetInstances(store, spec, &objects, &count))) DestroyObjects(objects, count);
        std::vector<admin::Problem> problems;
        expectRecord(admin::Check(store, &problems));
        const ObjectPtr object = NewSwitch(R"({"name":"new"})", "b");
        EXPECT_EQ(BeginTransaction(store), OK);
        const bool changed = expectRecord(Set(store, object.get(), "EXTERNAL")) &&
                             expectRecord(Delete(store, kKey, kGroup, kComponent, "a")) &&
                             expectRecord(CommitTransaction(store));
        if (!changed) {
            EXPECT_EQ(CancelTransaction(store), OK);
        }
    }
};

TEST_F(StoreHostileDatabase, RandomDamage) {
    const char *const wanted = std::getenv("STORE_FLIP_ROUNDS");
    const int rounds = wanted ? std::atoi(wanted) : 60;
    const std::string good = GoodStore();
    // The pages of a small store are mostly empty, so only used bytes are damaged.
    std::vector<std::size_t> used;
    for (std::size_t at = 0; at < good.size(); at++) {
        if (good[at] != 0) used.push_back(at);
    }
    std::mt19937_64 random(11);
    for (int round = 0; round < rounds; round++) {
        SCOPED_TRACE(round);
        std::string bad = good;
        if (round % 4 == 3) {
            bad.resize(random() % bad.size());
        } else {
            // Changes a few bytes anywhere, or many close together.
            const std::size_t from = random() % used.size();
            for (uint64_t flips = round % 4 == 2 ? 200 : 1 + random() % 8; flips > 0; flips--) {
                const std::size_t behind = round % 4 == 2 ? random() % 300 : random();
                bad[used[(from + behind) % used.size()]] = static_cast<char>(random());
            }
        }
        for (const char *suffix : {"-wal", "-shm"})
            std::filesystem::remove(path_ + suffix);
        WriteFile(path_, bad);
        Exercise();
    }
}

TEST_F(StoreHostileDatabase, DamagedDocumentIsCorruptAndNamed) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"a"})");
    Run("UPDATE document SET text = '{\"name\":'");
    Object *object = nullptr;
    EXPECT_EQ(Get(store.get(), kKey, kGroup, kComponent, "sw1", &object), CORRUPT);
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(
        LastFailure(store.get())
            .find("config store " + path_ + ": the document of switches/network_vds/qel[sw1] is damaged: "),
        0U)
        << LastFailure(store.get());
}

TEST_F(StoreHostileDatabase, RejectsANewerVersionUnchanged) {
    GoodStore();
    Run("PRAGMA user_version=2");
    ExpectRefused(FAILED, "newer release");
    EXPECT_FALSE(std::filesystem::exists(path_ + "-wal"));
}

TEST_F(StoreHostileDatabase, RejectsANewerVersionWithAWriteAheadLogUnchanged) {
    GoodStore();
    sqlite3 *db = nullptr;
    ASSERT_EQ(sqlite3_open(path_.c_str(), &db), SQLITE_OK);
    ASSERT_EQ(
        sqlite3_exec(db, "PRAGMA wal_autocheckpoint=0; PRAGMA user_version=2", nullptr, nullptr, nullptr),
        SQLITE_OK);
    sqlite3_db_config(db, SQLITE_DBCONFIG_NO_CKPT_ON_CLOSE, 1, nullptr);
    sqlite3_close(db);
    ASSERT_TRUE(std::filesystem::exists(path_ + "-wal"));
    const std::string log = ReadFile(path_ + "-wal");
    ExpectRefused(FAILED, "newer release");
    EXPECT_TRUE(ReadFile(path_ + "-wal") == log);
}

TEST_F(StoreHostileDatabase, RejectsAForeignDatabaseUnchanged) {
    Run("CREATE TABLE songs (title TEXT); INSERT INTO songs VALUES ('x')");
    ExpectRefused(CORRUPT, "not a config store");
}

TEST_F(StoreHostileDatabase, RejectsAForeignDatabaseWithAVersionUnchanged) {
    Run("PRAGMA user_version=1");
    ExpectRefused(CORRUPT, "not a config store");
}

TEST_F(StoreHostileDatabase, RejectsForeignTablesUnderOurApplicationId) {
    GoodStore();
    Run("CREATE TRIGGER t AFTER INSERT ON document BEGIN DELETE FROM object_row; END");
    ExpectRefused(CORRUPT, "tables");
    Run("DROP TRIGGER t; DROP VIEW history; CREATE VIEW history AS SELECT 1");
    ExpectRefused(CORRUPT, "tables");
}

TEST_F(StoreHostileDatabase, RejectsMoreTablesViewsOrIndexes) {
    GoodStore();
    for (const char *more : {"TABLE", "VIEW", "INDEX", "UNIQUE INDEX"}) {
        const std::string what = more;
        const std::string kind = what == "UNIQUE INDEX" ? "INDEX" : what;
        Run("CREATE " + what + " another " +
            (kind == "TABLE"  ? "(x)"
             : kind == "VIEW" ? "AS SELECT 1"
                              : "ON revision (saved_ms, revision)"));
        ExpectRefused(CORRUPT, "tables");
        Run("DROP " + kind + " another");
    }
    EXPECT_EQ(StoredIds(Open().get()).size(), 3U);
    Run("ANALYZE"); // what an administrator may do
    EXPECT_EQ(StoredIds(Open().get()).size(), 3U);
}

TEST_F(StoreHostileDatabase, RejectsAChangeAfterTheLastRevision) {
    GoodStore();
    Run("INSERT INTO revision VALUES (9223372036854775807, 0)");
    const StorePtr store = Open();
    EXPECT_EQ(Set(store.get(), NewSwitch().get(), "EXTERNAL"), CORRUPT);
    EXPECT_NE(LastFailure(store.get()).find("no revision after 9223372036854775807"), std::string::npos)
        << LastFailure(store.get());
    EXPECT_EQ(Number("SELECT count(*) FROM revision"), 10);
}

TEST_F(StoreHostileDatabase, RejectsAHardLinkUnderEitherName) {
    GoodStore();
    const std::string other = directory_ + "/other.db";
    ASSERT_EQ(link(path_.c_str(), other.c_str()), 0);
    ExpectRefused(IO_ERROR, "hard links");
    path_ = other;
    ExpectRefused(IO_ERROR, "hard links");
    ASSERT_EQ(unlink(path_.c_str()), 0);
    path_ = directory_ + "/store.db";
    EXPECT_EQ(StoredIds(Open().get()).size(), 3U);
}

TEST_F(StoreHostileDatabase, RejectsATextFileUnchanged) {
    WriteFile(path_, std::string(5000, 'x'));
    ExpectRefused(CORRUPT, "not a database");
}

TEST_F(StoreHostileDatabase, RejectsASymbolicLinkWithoutFollowingIt) {
    const std::string target = directory_ + "/target.db";
    ASSERT_EQ(symlink(target.c_str(), path_.c_str()), 0);
    ExpectRefused(IO_ERROR, "symbolic link");
    EXPECT_FALSE(std::filesystem::exists(target));
}

TEST_F(StoreHostileDatabase, RejectsADirectoryAndAFifo) {
    ASSERT_EQ(mkdir(path_.c_str(), 0700), 0);
    ExpectRefused(IO_ERROR, "a directory");
    std::filesystem::remove(path_);
    ASSERT_EQ(mkfifo(path_.c_str(), 0600), 0);
    ExpectRefused(IO_ERROR, "not a regular file");
}

TEST_F(StoreHostileDatabase, RejectsAMissingParentDirectory) {
    path_ = directory_ + "/no/such/store.db";
    ExpectRefused(IO_ERROR, "directory");
}

TEST_F(StoreHostileDatabase, EmptyFileBecomesAStore) {
    WriteFile(path_, "");
    EXPECT_TRUE(StoredIds(Open().get()).empty());
}

TEST_F(StoreHostileDatabase, RestrictsModesThatAreTooWide) {
    GoodStore();
    ASSERT_EQ(chmod(path_.c_str(), 0666), 0);
    (void)Open();
    struct stat info {};
    ASSERT_EQ(stat(path_.c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0600U);
}

TEST_F(StoreHostileDatabase, PathThatLooksLikeAUriIsAFileName) {
    ASSERT_EQ(chdir(directory_.c_str()), 0);
    path_ = "file:x.db?mode=memory";
    Save(Open().get(), "{}");
    EXPECT_TRUE(std::filesystem::exists(directory_ + "/file:x.db?mode=memory"));
    ASSERT_EQ(chdir("/"), 0);
}

} // namespace
