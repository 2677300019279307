/* SPDX-License-Identifier: Apache-2.0 */
// Stores and transactions, over every backend: a commit is visible, a cancelled change is not, and every
// status once.

#include "platform/configstore/support.h"

#include <filesystem>
#include <sys/stat.h>

using namespace configstore;
using namespace store_test;

namespace {

class StoreRows : public AnyStoreTest {
protected:
    static std::vector<admin::Entry> History(Store *store) {
        std::vector<admin::Entry> entries;
        EXPECT_EQ(admin::History(store, &entries), OK);
        return entries;
    }
    /// The revision that stored the object's current document.
    static int64_t RevisionOf(Store *store, const std::string &id) {
        std::vector<admin::Entry> entries;
        EXPECT_EQ(admin::List(store, &entries), OK);
        for (const admin::Entry &entry : entries)
            if (entry.address.instance == id) return entry.revision;
        return -1;
    }
};
RUN_OVER_EVERY_BACKEND(StoreRows);

using StoreFile = StoreTest;

TEST_P(StoreRows, EmptyStoreListsNothingAndSucceeds) {
    const StorePtr store = Open();
    EXPECT_TRUE(StoredIds(store.get()).empty());
    Object **objects = nullptr;
    int32_t count = 7;
    EXPECT_EQ(GetDesiredUserConfigInstances(store.get(), kKey, kGroup, kComponent, &objects, &count), OK);
    EXPECT_EQ(count, 0);
}

TEST_P(StoreRows, ObjectReadsBackFromAnotherConnection) {
    {
        const StorePtr store = Open();
        Save(store.get(), R"({"name":"one","max_ports":8})");
    }
    const StorePtr store = Open();
    EXPECT_EQ(Stored(store.get()), R"({"name":"one","max_ports":8})");
}

TEST_P(StoreRows, AbsentObjectIsNotFound) {
    const StorePtr store = Open();
    Object *object = nullptr;
    EXPECT_EQ(Get(store.get(), kKey, kGroup, kComponent, "x", &object), NOT_FOUND);
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(Delete(store.get(), kKey, kGroup, kComponent, "x"), NOT_FOUND);
}

TEST_P(StoreRows, ListsInAscendingInstanceId) {
    const StorePtr store = Open();
    for (const char *id : {"b", "a", "c"})
        Save(store.get(), "{}", id);
    EXPECT_EQ(StoredIds(store.get()), (std::vector<std::string>{"a", "b", "c"}));
}

TEST_P(StoreRows, DesiredLayerIsSeparateFromTheCurrentOne) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"wanted"})", "sw1", "USER");
    EXPECT_EQ(Stored(store.get()), "");
    Object **objects = nullptr;
    int32_t count = 0;
    ASSERT_EQ(GetDesiredUserConfigInstances(store.get(), kKey, kGroup, kComponent, &objects, &count), OK);
    ASSERT_EQ(count, 1);
    EXPECT_EQ(Text(objects[0], "name"), "wanted");
    DestroyObjects(objects, count);
}

TEST_P(StoreRows, DeleteRemovesTheCurrentObjectOnly) {
    const StorePtr store = Open();
    Save(store.get(), "{}", "sw1", "USER");
    Save(store.get(), "{}", "sw1", "EXTERNAL");
    EXPECT_EQ(Delete(store.get(), kKey, kGroup, kComponent, "sw1"), OK);
    EXPECT_EQ(Stored(store.get()), "");
    std::vector<admin::Entry> entries;
    ASSERT_EQ(admin::List(store.get(), &entries), OK);
    ASSERT_EQ(entries.size(), 1U);
    EXPECT_EQ(entries[0].address.layer, Layer::Desired);
}

TEST_P(StoreRows, SingletonObjectHasNoInstanceId) {
    const StorePtr store = Open();
    Object *raw = nullptr;
    ASSERT_EQ(CreateObject("k", "g", "c", nullptr, "{}", &raw), OK);
    const ObjectPtr object(raw);
    ASSERT_EQ(Set(store.get(), object.get(), "EXTERNAL"), OK);
    ASSERT_EQ(Get(store.get(), "k", "g", "c", "", &raw), OK);
    DestroyObject(raw);
}

TEST_P(StoreRows, UnknownSourceIsABadParameter) {
    const StorePtr store = Open();
    const ObjectPtr object = NewSwitch();
    EXPECT_EQ(Set(store.get(), object.get(), "external"), BAD_PARAMETER);
    EXPECT_EQ(Set(store.get(), object.get(), nullptr), BAD_PARAMETER);
    EXPECT_EQ(Set(store.get(), Sub(object.get(), "settings"), "EXTERNAL"), BAD_PARAMETER);
    EXPECT_EQ(Set(store.get(), nullptr, "EXTERNAL"), BAD_PARAMETER);
    EXPECT_EQ(Set(nullptr, object.get(), "EXTERNAL"), BAD_PARAMETER);
    EXPECT_EQ(GetStore(nullptr), BAD_PARAMETER);
    DestroyStore(nullptr);
}

TEST_P(StoreRows, EveryReplacedAndDeletedDocumentIsInHistory) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"1"})");
    Save(store.get(), R"({"name":"2"})");
    ASSERT_EQ(Delete(store.get(), kKey, kGroup, kComponent, "sw1"), OK);
    const std::vector<admin::Entry> past = History(store.get());
    ASSERT_EQ(past.size(), 2U);
    EXPECT_TRUE(past[0].deleted);
    EXPECT_FALSE(past[1].deleted);
    std::string first;
    ASSERT_EQ(admin::ExportAsOf(store.get(), past[1].address, 1, &first), OK);
    EXPECT_EQ(first, R"({"name":"1"})");
    EXPECT_TRUE(StoredIds(store.get()).empty());
}

TEST_P(StoreRows, DocumentReplacedWithinItsOwnTransactionLeavesNoHistory) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"before"})");
    ASSERT_EQ(BeginTransaction(store.get()), OK);
    for (const char *json : {R"({"name":"between"})", R"({"name":"after"})"})
        ASSERT_EQ(Set(store.get(), NewSwitch(json).get(), "EXTERNAL"), OK);
    ASSERT_EQ(CommitTransaction(store.get()), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"after"})");
    const std::vector<admin::Entry> past = History(store.get());
    ASSERT_EQ(past.size(), 1U);
    std::string text;
    ASSERT_EQ(admin::ExportAsOf(store.get(), past[0].address, 1, &text), OK);
    EXPECT_EQ(text, R"({"name":"before"})");
}

TEST_F(StoreFile, ReadableViewsShowTheDocuments) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"1"})");
    Save(store.get(), R"({"name":"2"})");
    EXPECT_EQ(Number("SELECT document ->> '$.name' FROM object"), 2);
    ASSERT_EQ(Delete(store.get(), kKey, kGroup, kComponent, "sw1"), OK);
    EXPECT_EQ(Number("SELECT count(*) FROM history"), 2);
    EXPECT_EQ(Number("SELECT document ->> '$.name' FROM history ORDER BY ended LIMIT 1"), 1);
    EXPECT_EQ(Number("SELECT deleted FROM history ORDER BY ended DESC LIMIT 1"), 1);
    EXPECT_EQ(Number("SELECT count(*) FROM object"), 0);
}

TEST_P(StoreRows, TransactionTakesOneRevision) {
    const StorePtr store = Open();
    ASSERT_EQ(BeginTransaction(store.get()), OK);
    for (const char *id : {"a", "b"})
        ASSERT_EQ(Set(store.get(), NewSwitch("{}", id).get(), "EXTERNAL"), OK);
    ASSERT_EQ(CommitTransaction(store.get()), OK);
    Save(store.get(), R"({"name":"x"})", "a");
    EXPECT_EQ(RevisionOf(store.get(), "a"), 2);
    EXPECT_EQ(RevisionOf(store.get(), "b"), 1);
}

TEST_F(StoreFile, FileAndDirectoryAreForTheOwnerOnly) {
    const mode_t before = umask(0);
    path_ = directory_ + "/sub/store.db";
    const StorePtr store = Open();
    Save(store.get(), "{}");
    umask(before);
    struct stat info {};
    ASSERT_EQ(stat((directory_ + "/sub").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0700U);
    for (const char *suffix : {"", "-wal", "-shm"}) {
        ASSERT_EQ(stat((path_ + suffix).c_str(), &info), 0) << suffix;
        EXPECT_EQ(info.st_mode & 0777, 0600U) << suffix;
    }
}

/// The store that GetStore opens; the environment names it.
StorePtr OpenHosts(const std::string &path) {
    setenv("DVS_CONFIGSTORE", path.c_str(), 1);
    Store *store = nullptr;
    EXPECT_EQ(GetStore(&store), OK);
    return StorePtr(store);
}

TEST_F(StoreFile, MemoryDatabaseIsOnePerProcess) {
    Save(OpenHosts(":memory:").get(), R"({"name":"kept"})");
    EXPECT_EQ(Stored(OpenHosts(":memory:").get()), R"({"name":"kept"})");
    EXPECT_FALSE(std::filesystem::exists(":memory:"));
    Store *other = nullptr;
    ASSERT_EQ(admin::OpenInMemory(&other), OK);
    EXPECT_EQ(Stored(StorePtr(other).get()), ""); // a separate store
}

TEST_F(StoreFile, PathIsReadWithEachStore) {
    Save(OpenHosts(path_).get(), "{}");
    EXPECT_TRUE(StoredIds(OpenHosts(directory_ + "/other.db").get()).empty());
    EXPECT_EQ(admin::DefaultPath(), directory_ + "/other.db");
}

TEST_F(StoreFile, FailuresAreLoggedForTheHostsStoreOnly) {
    const ObjectPtr bad = NewSwitch(R"({"name":7})");
    const StorePtr store = OpenHosts(path_);
    (void)TakeHostLog();
    EXPECT_EQ(Set(store.get(), bad.get(), "EXTERNAL"), SCHEMA_VIOLATION);
    EXPECT_EQ(TakeHostLog(),
              "config store " + path_ + ": switches/network_vds/qel[sw1]: name: it must be a text");
    const StorePtr tools = Open();
    EXPECT_EQ(Set(tools.get(), bad.get(), "USER"), SCHEMA_VIOLATION);
    EXPECT_EQ(TakeHostLog(), "");
    const Failure *const failure = admin::LastFailure(tools.get());
    ASSERT_NE(failure, nullptr);
    EXPECT_EQ(failure->status, SCHEMA_VIOLATION);
    EXPECT_EQ(failure->path, path_);
    EXPECT_EQ(failure->address, (Address{Layer::Desired, kKey, kGroup, kComponent, "sw1"}));
    EXPECT_EQ(failure->field, "name");
    EXPECT_EQ(failure->what, "switches/network_vds/qel[sw1]: name: it must be a text");
    EXPECT_TRUE(StoredIds(tools.get()).empty());
    EXPECT_EQ(admin::LastFailure(tools.get()), nullptr); // a call that succeeds has no failure
}

TEST_P(StoreRows, CancelLeavesTheStoreAsItWas) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"old"})");
    ASSERT_EQ(BeginTransaction(store.get()), OK);
    ASSERT_EQ(Set(store.get(), NewSwitch(R"({"name":"new"})").get(), "EXTERNAL"), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"new"})");
    ASSERT_EQ(CancelTransaction(store.get()), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"old"})");
    EXPECT_TRUE(History(store.get()).empty());
    int64_t revision = 0;
    ASSERT_EQ(admin::LatestRevision(store.get(), &revision), OK);
    EXPECT_EQ(revision, 1);
}

TEST_P(StoreRows, DestroyCancels) {
    {
        const StorePtr store = Open();
        ASSERT_EQ(BeginTransaction(store.get()), OK);
        ASSERT_EQ(Set(store.get(), NewSwitch().get(), "EXTERNAL"), OK);
    }
    EXPECT_TRUE(StoredIds(Open().get()).empty());
}

TEST_P(StoreRows, MisuseIsABadParameter) {
    const StorePtr store = Open();
    EXPECT_EQ(CommitTransaction(store.get()), BAD_PARAMETER);
    EXPECT_EQ(CancelTransaction(store.get()), BAD_PARAMETER);
    ASSERT_EQ(BeginTransaction(store.get()), OK);
    EXPECT_EQ(BeginTransaction(store.get()), BAD_PARAMETER);
    EXPECT_EQ(CancelTransaction(store.get()), OK);
}

} // namespace
