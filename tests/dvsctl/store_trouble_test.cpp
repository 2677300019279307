/* SPDX-License-Identifier: Apache-2.0 */
// dvsctl with a store that is busy, damaged, foreign or newer, or whose disk is full.

#include <sqlite3.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <memory>

#include <unistd.h>

#include "configstore/save.h"
#include "dvs/status.h"
#include "platform/embedded/configstore/admin.h"
#include "store_fixture.h"

namespace {

using namespace dvs::ctl::test;

class StoreTrouble : public StoreProgram {
protected:
    using Database = std::unique_ptr<sqlite3, int (*)(sqlite3 *)>;

    /// The path as the interposer sees it.
    [[nodiscard]] std::string Directory() const { return std::filesystem::canonical(At(".")); }
    static Database OpenDatabase(const std::string &path) {
        sqlite3 *db = nullptr;
        EXPECT_EQ(sqlite3_open(path.c_str(), &db), SQLITE_OK);
        return {db, sqlite3_close};
    }
    static void Sql(const Database &db, const char *sql) {
        EXPECT_EQ(sqlite3_exec(db.get(), sql, nullptr, nullptr, nullptr), SQLITE_OK)
            << sqlite3_errmsg(db.get());
    }
    template <typename SaveFn> int32_t SaveWith(SaveFn save, const void *state, uint32_t size) const {
        configstore::Store *store = nullptr;
        EXPECT_EQ(configstore::admin::Open(store_, false, &store), configstore::OK);
        const int32_t status = save(store, state, size, nullptr);
        configstore::DestroyStore(store);
        return status;
    }
    void ExpectStoreError(const char *named) const {
        const std::vector<std::vector<std::string>> verbs = {{"show", "store:"},
                                                             {"verify", "store:"},
                                                             {"store", "list"},
                                                             {"copy", At("site.db"), "store:"},
                                                             {"copy", At("site.db"), "store:", "--dry-run"}};
        for (const auto &verb : verbs) {
            const Result result = Ctl(verb);
            EXPECT_EQ(result.status, 7) << verb[0] << ' ' << verb[1] << '\n' << result.out << result.err;
            EXPECT_NE(result.err.find(named), std::string::npos) << verb[0] << '\n' << result.err;
        }
    }
};

TEST_F(StoreTrouble, FailsAsBusyAfterTheTimeout) {
    Save();
    const std::string document = Document();
    const Database other = OpenDatabase(store_);
    Sql(other, "BEGIN IMMEDIATE");
    const std::vector<std::vector<std::string>> verbs = {{"copy", At("site.db"), "store:"},
                                                         {"store", "delete", "alpha"},
                                                         {"store", "restore", "--revision", "0"},
                                                         {"store", "upgrade", At("site.db")}};
    for (auto verb : verbs) {
        verb.insert(verb.end(), {"--timeout", "0.2"});
        const Result result = Ctl(verb);
        EXPECT_EQ(result.status, 8) << verb[0] << ' ' << verb[1] << '\n' << result.err;
    }
    EXPECT_EQ(Ctl({"show", "store:"}).status, 0); // readers do not wait
    EXPECT_EQ(Json(Ctl({"copy", At("site.db"), "store:", "--timeout", "0", "--json"})).at("error").at("name"),
              "busy");
    Sql(other, "ROLLBACK");
    EXPECT_EQ(Document(), document);
}

TEST_F(StoreTrouble, WaitingIsShownOnATerminalOnly) {
    Save();
    const Database other = OpenDatabase(store_);
    Sql(other, "BEGIN IMMEDIATE");
    const std::vector<std::string> verb = {"copy", At("site.db"), "store:", "--timeout", "1"};
    const Result shown = RunInTerminal(verb, {"DVS_CONFIGSTORE=" + store_});
    EXPECT_EQ(shown.status, 8);
    EXPECT_NE(shown.out.find("\rwaiting for other writers of " + store_ + ": "), std::string::npos)
        << shown.out;
    EXPECT_NE(shown.out.find("\r\x1b[K"), std::string::npos) << "the line must be erased: " << shown.out;
    EXPECT_EQ(Ctl(verb).err.find("waiting"), std::string::npos);
    Sql(other, "ROLLBACK");
}

TEST_F(StoreTrouble, RejectsAForeignDatabaseUnchanged) {
    {
        const Database foreign = OpenDatabase(store_);
        Sql(foreign, "CREATE TABLE mail (text TEXT)");
    }
    const std::string before = Get("store.db");
    ExpectStoreError("not a config store");
    EXPECT_EQ(Get("store.db"), before);
}

TEST_F(StoreTrouble, RejectsANewerDatabaseUnchanged) {
    Save();
    {
        const Database db = OpenDatabase(store_);
        Sql(db, "PRAGMA user_version=99");
    }
    const std::string before = Get("store.db");
    ExpectStoreError("newer release");
    EXPECT_EQ(Get("store.db"), before);
}

TEST_F(StoreTrouble, RejectsAFileThatIsNotADatabase) {
    Put("store.db", std::string(4096, 'x'));
    ExpectStoreError("store.db");
    EXPECT_EQ(Get("store.db"), std::string(4096, 'x'));
}

TEST_F(StoreTrouble, RejectsALink) {
    Save();
    ASSERT_EQ(symlink(store_.c_str(), At("link.db").c_str()), 0);
    EXPECT_EQ(Ctl({"show", "store:" + At("link.db")}).status, 7);
}

TEST_F(StoreTrouble, CheckAndVerifyNameADocumentThatViolatesTheSchema) {
    Save();
    {
        const Database db = OpenDatabase(store_);
        Sql(db, "UPDATE document SET text = replace(text, '9000', '\"many\"')");
    }
    const Result checked = Ctl({"store", "check"});
    EXPECT_EQ(checked.status, 7);
    EXPECT_NE(checked.out.find("max_mtu"), std::string::npos) << checked.out;
    EXPECT_EQ(Json(Ctl({"store", "check", "--json"})).at("is_sound"), false);
    const Result verified = Ctl({"verify", "store:"});
    EXPECT_EQ(verified.status, 7);
    EXPECT_NE(verified.err.find("max_mtu"), std::string::npos) << verified.err;
}

// Buffers that the checked save rejects. The plain save accepts them and empties the store, as documented.
struct UnsoundRow {
    const char *what;
    HYP_ReturnStatus refusal; ///< of the checked save
    std::string (*make)(const std::string &sound);
};

std::string StateOf(int switches) {
    std::vector<dvs::form::NewEntry> entries;
    for (int i = 0; i < switches; ++i)
        entries.push_back(MakeSwitch("s" + std::to_string(i), {}, {}, {}));
    return std::string(dvs::form::AsText(dvs::form::EncodeList(entries)));
}

const UnsoundRow kUnsound[] = {
    {"no state at all", HYP_BAD_PARAM, [](const std::string &) { return std::string("no state at all"); }},
    {"cut in its header", HYP_BAD_PARAM, [](const std::string &sound) { return sound.substr(0, 10); }},
    {"cut in the middle", HYP_BAD_PARAM, [](const std::string &sound) { return sound.substr(0, 600); }},
    {"a wrong byte in a name", HYP_BAD_CHECKSUM,
     [](const std::string &sound) {
         std::string damaged = sound;
         damaged[damaged.find("production")] ^= 1;
         return damaged;
     }},
    {"more switches than the table holds", HYP_LIMIT_EXCEEDED,
     [](const std::string &) { return StateOf(33); }},
};

TEST_F(StoreTrouble, RestoreUndoesAPlainSaveOfAnInvalidBuffer) {
    Save();
    const std::string alpha = Document("alpha"), beta = Document("beta");
    for (const UnsoundRow &row : kUnsound) {
        SCOPED_TRACE(row.what);
        const std::string buffer = row.make(Get("site.db"));
        const auto size = static_cast<uint32_t>(buffer.size());
        const std::string before = Get("store.db");
        EXPECT_EQ(SaveWith(dvs::config::SaveStateChecked, buffer.data(), size),
                  static_cast<int32_t>(row.refusal));
        EXPECT_EQ(Get("store.db"), before);

        // The plain save treats a buffer that does not load as a state without switches.
        ASSERT_EQ(SaveWith(dvs::config::SaveState, buffer.data(), size), 0);
        EXPECT_EQ(Json(Ctl({"store", "list", "--json"})).at("objects"), boost::json::array());
        const auto events = Json(Ctl({"store", "history", "--json"})).at("events").as_array();
        ASSERT_FALSE(events.empty());
        EXPECT_EQ(events[0].at("event"), "deleted");
        const auto revision = std::to_string(events[0].at("revision").as_int64() - 1);
        ASSERT_EQ(Ctl({"store", "restore", "--revision", revision}).status, 0);
        EXPECT_EQ(Document("alpha"), alpha);
        EXPECT_EQ(Document("beta"), beta);
    }
}

TEST_F(StoreTrouble, FullDiskKeepsTheOldContent) {
    Save();
    const std::string document = Document();
    PutState("changed.db", Site("db"));
    int refused = 0;
    for (int nth = 1; nth <= 12; ++nth) {
        const Result result =
            Ctl({"copy", At("changed.db"), "store:"},
                {"LD_PRELOAD=" DVS_FAULT_LIBRARY, "ASAN_OPTIONS=verify_asan_link_order=0",
                 "DVS_FAULT=write:" + std::to_string(nth) + "+:ENOSPC:path=" + Directory()});
        if (result.status == 0) break;
        ++refused;
        EXPECT_EQ(result.status, 7) << nth << '\n' << result.err;
        EXPECT_EQ(Document(), document) << nth;
        EXPECT_EQ(Ctl({"store", "check"}).status, 0) << nth;
    }
    EXPECT_GT(refused, 0);
}

TEST_F(StoreTrouble, NewStoreOnAFullDiskFailsCleanly) {
    const Result result = Ctl({"copy", At("site.db"), "store:"},
                              {"LD_PRELOAD=" DVS_FAULT_LIBRARY, "ASAN_OPTIONS=verify_asan_link_order=0",
                               "DVS_FAULT=write:1+:ENOSPC:path=" + Directory()});
    EXPECT_EQ(result.status, 7) << result.err;
    EXPECT_EQ(Ctl({"copy", At("site.db"), "store:"}).status, 0); // once there is room
}

TEST_F(StoreTrouble, ShowsNoProgressForSmallSavesOrIntoFiles) {
    const Result result = Ctl({"copy", At("site.db"), "store:"});
    EXPECT_EQ(result.err, "");
    EXPECT_EQ(result.out.find('\r'), std::string::npos);
}

} // namespace
