/* SPDX-License-Identifier: Apache-2.0 */
// Stores and transactions: what is committed is there, what is cancelled is not, and every status once.

#include "platform/configstore/support.h"

#include <sys/stat.h>

using namespace configstore;
using namespace store_test;

using StoreRows = StoreTest;
using StoreTransactions = StoreTest;

TEST_F(StoreRows, EmptyStoreListsNothingWithSuccess) {
    const StorePtr store = Open();
    EXPECT_TRUE(StoredIds(store.get()).empty());
    Object **objects = nullptr;
    int32_t count = 7;
    EXPECT_EQ(GetDesiredUserConfigInstances(store.get(), kKey, kGroup, kComponent, &objects, &count), OK);
    EXPECT_EQ(count, 0);
}

TEST_F(StoreRows, ObjectReadsBackFromAnotherConnection) {
    {
        const StorePtr store = Open();
        Save(store.get(), R"({"name":"one","max_ports":8})");
    }
    const StorePtr store = Open();
    EXPECT_EQ(Stored(store.get()), R"({"name":"one","max_ports":8})");
}

TEST_F(StoreRows, AbsentObjectIsNotFound) {
    const StorePtr store = Open();
    Object *object = nullptr;
    EXPECT_EQ(Get(store.get(), kKey, kGroup, kComponent, "x", &object), NOT_FOUND);
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(Delete(store.get(), kKey, kGroup, kComponent, "x"), NOT_FOUND);
}

TEST_F(StoreRows, ListsInAscendingInstanceId) {
    const StorePtr store = Open();
    for (const char *id : {"b", "a", "c"})
        Save(store.get(), "{}", id);
    EXPECT_EQ(StoredIds(store.get()), (std::vector<std::string>{"a", "b", "c"}));
}

TEST_F(StoreRows, DesiredLayerIsApartFromTheCurrentOne) {
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

TEST_F(StoreRows, DeleteRemovesTheCurrentObjectOnly) {
    const StorePtr store = Open();
    Save(store.get(), "{}", "sw1", "USER");
    Save(store.get(), "{}", "sw1", "EXTERNAL");
    EXPECT_EQ(Delete(store.get(), kKey, kGroup, kComponent, "sw1"), OK);
    EXPECT_EQ(Stored(store.get()), "");
    EXPECT_EQ(Number("SELECT count(*) FROM object WHERE layer = 'desired'"), 1);
}

TEST_F(StoreRows, SingletonObjectHasNoInstanceId) {
    const StorePtr store = Open();
    Object *raw = nullptr;
    ASSERT_EQ(CreateObject("k", "g", "c", nullptr, "{}", &raw), OK);
    const ObjectPtr object(raw);
    ASSERT_EQ(Set(store.get(), object.get(), "EXTERNAL"), OK);
    ASSERT_EQ(Get(store.get(), "k", "g", "c", "", &raw), OK);
    DestroyObject(raw);
}

TEST_F(StoreRows, UnknownSourceIsABadParameter) {
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

TEST_F(StoreRows, EveryReplacedAndDeletedDocumentIsInHistory) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"1"})");
    Save(store.get(), R"({"name":"2"})");
    ASSERT_EQ(Delete(store.get(), kKey, kGroup, kComponent, "sw1"), OK);
    EXPECT_EQ(Number("SELECT count(*) FROM history"), 2);
    EXPECT_EQ(Number("SELECT document ->> '$.name' FROM history ORDER BY ended LIMIT 1"), 1);
    EXPECT_EQ(Number("SELECT deleted FROM history ORDER BY ended DESC LIMIT 1"), 1);
    EXPECT_EQ(Number("SELECT count(*) FROM object"), 0);
}

TEST_F(StoreRows, TransactionTakesOneRevision) {
    const StorePtr store = Open();
    ASSERT_EQ(BeginTransaction(store.get()), OK);
    for (const char *id : {"a", "b"})
        ASSERT_EQ(Set(store.get(), NewSwitch("{}", id).get(), "EXTERNAL"), OK);
    ASSERT_EQ(CommitTransaction(store.get()), OK);
    Save(store.get(), R"({"name":"x"})", "a");
    EXPECT_EQ(Number("SELECT revision FROM object WHERE instance = 'a'"), 2);
    EXPECT_EQ(Number("SELECT revision FROM object WHERE instance = 'b'"), 1);
}

TEST_F(StoreRows, FileAndDirectoryAreForTheOwnerOnly) {
    const mode_t before = umask(0);
    path_ = directory_ + "/sub/store.db";
    setenv("DVS_CONFIGSTORE", path_.c_str(), 1);
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

TEST_F(StoreRows, MemoryDatabaseIsOnePerProcess) {
    setenv("DVS_CONFIGSTORE", ":memory:", 1);
    Save(Open().get(), R"({"name":"kept"})");
    EXPECT_EQ(Stored(Open().get()), R"({"name":"kept"})");
}

TEST_F(StoreRows, PathIsReadWithEachStore) {
    Save(Open().get(), "{}");
    setenv("DVS_CONFIGSTORE", (directory_ + "/other.db").c_str(), 1);
    EXPECT_TRUE(StoredIds(Open().get()).empty());
}

TEST_F(StoreTransactions, CancelLeavesTheStoreAsItWas) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"old"})");
    ASSERT_EQ(BeginTransaction(store.get()), OK);
    ASSERT_EQ(Set(store.get(), NewSwitch(R"({"name":"new"})").get(), "EXTERNAL"), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"new"})");
    ASSERT_EQ(CancelTransaction(store.get()), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"old"})");
    EXPECT_EQ(Number("SELECT count(*) FROM history"), 0);
    EXPECT_EQ(Number("SELECT count(*) FROM revision"), 1);
}

TEST_F(StoreTransactions, DestroyCancels) {
    {
        const StorePtr store = Open();
        ASSERT_EQ(BeginTransaction(store.get()), OK);
        ASSERT_EQ(Set(store.get(), NewSwitch().get(), "EXTERNAL"), OK);
    }
    EXPECT_TRUE(StoredIds(Open().get()).empty());
}

TEST_F(StoreTransactions, MisuseIsABadParameter) {
    const StorePtr store = Open();
    EXPECT_EQ(CommitTransaction(store.get()), BAD_PARAMETER);
    EXPECT_EQ(CancelTransaction(store.get()), BAD_PARAMETER);
    ASSERT_EQ(BeginTransaction(store.get()), OK);
    EXPECT_EQ(BeginTransaction(store.get()), BAD_PARAMETER);
    EXPECT_EQ(CancelTransaction(store.get()), OK);
}
