/* SPDX-License-Identifier: Apache-2.0 */
// The store double must follow the parts of the contract that other tests depend on.

#include "configstore/fake_store.h"

#include <gtest/gtest.h>

using namespace configstore;

namespace {

struct FakeStore : testing::Test {
    FakeStore() {
        fake_store::Reset();
        EXPECT_EQ(OK, GetStore(&store));
        EXPECT_EQ(OK, CreateObject("k", "g", "c", "id", "{}", &object));
    }
    ~FakeStore() override {
        DestroyObject(object);
        DestroyStore(store);
        EXPECT_EQ(0, fake_store::OpenHandles());
    }
    Store *store = nullptr;
    Object *object = nullptr;
};

TEST_F(FakeStore, DiscardsACancelledTransaction) {
    ASSERT_EQ(OK, Set(store, object, "EXTERNAL"));
    const std::string before = fake_store::Dump();
    ASSERT_EQ(OK, BeginTransaction(store));
    ASSERT_EQ(OK, Delete(store, "k", "g", "c", "id"));
    EXPECT_EQ(before, fake_store::Dump());
    ASSERT_EQ(OK, CancelTransaction(store));
    EXPECT_EQ(before, fake_store::Dump());
    EXPECT_NE("", before);
}

TEST_F(FakeStore, ReturnsCopies) {
    ASSERT_EQ(OK, Set(store, object, "EXTERNAL"));
    Object *copy = nullptr;
    ASSERT_EQ(OK, Get(store, "k", "g", "c", "id", &copy));
    ASSERT_EQ(OK, SetValueInt(copy, "n", 1));
    EXPECT_EQ("current k/g/c#id {}\n", fake_store::Dump());
    DestroyObject(copy);
}

TEST_F(FakeStore, DescendsIntoSingletonsWhereTheMemberIsAbsent) {
    Object *sub = nullptr;
    Object *instance = nullptr;
    ASSERT_EQ(OK, CreateSubObject(object, "sub", "", &sub));
    ASSERT_EQ(OK, CreateSubObject(sub, "list", "b", &instance));
    ASSERT_EQ(OK, CreateSubObject(sub, "list", "a", &instance));
    FilterSpec *spec = nullptr;
    ASSERT_EQ(OK, CreateFilterSpecObject("list", "", "", "", &spec));
    Object **found = nullptr;
    int32_t count = 0;
    ASSERT_EQ(OK, GetSubObjectInstances(object, spec, &found, &count));
    ASSERT_EQ(2, count);
    char *key = nullptr;
    ASSERT_EQ(OK, GetValueStr(found[0], "key", &key));
    EXPECT_STREQ("b", key);
    FreeString(key);
    FreeSubObjectArray(found);
    DestroyFilterSpecObject(spec);
}

TEST_F(FakeStore, RejectsOtherTypesAndNumbersOutOfRange) {
    ASSERT_EQ(OK, SetValueLong(object, "n", 70000));
    uint16_t small = 0;
    bool flag = false;
    Object *sub = nullptr;
    EXPECT_EQ(SCHEMA_VIOLATION, GetValueUint16(object, "n", &small));
    EXPECT_EQ(SCHEMA_VIOLATION, GetValueBool(object, "n", &flag));
    EXPECT_EQ(SCHEMA_VIOLATION, GetSubObject(object, "n", "", &sub));
    EXPECT_EQ(BAD_PARAMETER, SetValueStr(object, "s", nullptr));
}

TEST_F(FakeStore, FailsTheRequestedCall) {
    fake_store::FailCall(2, IO_ERROR);
    EXPECT_EQ(OK, SetValueInt(object, "a", 1));
    EXPECT_EQ(IO_ERROR, SetValueInt(object, "b", 1));
    EXPECT_TRUE(fake_store::Failed());
    EXPECT_EQ(OK, SetValueInt(object, "c", 1));
    EXPECT_EQ(" {}\n/a = 1\n/c = 1\n", fake_store::Dump(object));
    EXPECT_EQ("SetValueInt", fake_store::CallName(fake_store::Calls()));
}

} // namespace
