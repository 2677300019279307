/* SPDX-License-Identifier: Apache-2.0 */
// Helpers of the config store's tests (support.h).

#include "platform/configstore/support.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <sqlite3.h>
#include <utility>

#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/store.h"
#include "platform/runtime.h"

namespace {

// Replaces the host's log. Does not allocate, because some tests count allocations.
char g_hostLog[1 << 14];
std::size_t g_hostLogSize = 0;

} // namespace

extern "C" void LogV(uint32_t, const char *format, va_list args) {
    const std::size_t left = sizeof g_hostLog - g_hostLogSize;
    const int size = std::vsnprintf(g_hostLog + g_hostLogSize, left, format, args);
    if (size > 0) g_hostLogSize += std::min(static_cast<std::size_t>(size), left - 1);
}

namespace store_test {

using namespace configstore;

std::string TakeHostLog() {
    return std::string(g_hostLog, std::exchange(g_hostLogSize, 0));
}

std::string LastFailure(const Store *store) {
    const Failure *const failure = admin::LastFailure(store);
    return failure ? configstore::Text(*failure) : "";
}

ObjectPtr NewSwitch(const std::string &json, const char *id) {
    Object *object = nullptr;
    EXPECT_EQ(CreateObject(kKey, kGroup, kComponent, id, json.c_str(), &object), OK);
    return ObjectPtr(object);
}

SpecPtr NewSpec(const char *key, const char *id) {
    FilterSpec *spec = nullptr;
    EXPECT_EQ(CreateFilterSpecObject(key, "", "", id, &spec), OK);
    return SpecPtr(spec);
}

Object *Sub(Object *parent, const char *name, const char *id) {
    Object *object = nullptr;
    int32_t status = GetSubObject(parent, name, id, &object);
    if (status == NOT_FOUND) status = CreateSubObject(parent, name, id, &object);
    EXPECT_EQ(status, OK) << name;
    return object;
}

std::string Json(const Object *object) {
    Buffer text;
    WriteDocument(*reinterpret_cast<const Tree *>(object), &text);
    return std::string(text.View());
}

std::string Text(Object *object, const char *name) {
    char *text = nullptr;
    const int32_t status = GetValueStr(object, name, &text);
    if (status != OK) return "<" + std::to_string(status) + ">";
    std::string copy(text);
    FreeString(text);
    return copy;
}

std::vector<std::string> Texts(Object *object, const char *name) {
    char **texts = nullptr;
    int32_t count = 0;
    if (const int32_t status = GetValueStringArray(object, name, &texts, &count); status != OK)
        return {"<" + std::to_string(status) + ">"};
    std::vector<std::string> copy(texts, texts + count);
    FreeStringArray(texts, count);
    return copy;
}

std::vector<std::string> Ids(Object *object, const char *key, int32_t *status, const char *id) {
    const SpecPtr spec = NewSpec(key, id);
    Object **found = nullptr;
    int32_t count = 0;
    *status = GetSubObjectInstances(object, spec.get(), &found, &count);
    std::vector<std::string> ids;
    for (int32_t i = 0; i < count; i++)
        ids.push_back(Text(found[i], "key"));
    FreeSubObjectArray(found);
    return ids;
}

std::vector<std::string> StoredIds(Store *store) {
    FilterSpec *raw = nullptr;
    EXPECT_EQ(CreateFilterSpecObject(kKey, kGroup, kComponent, "", &raw), OK);
    const SpecPtr spec(raw);
    Object **objects = nullptr;
    int32_t count = 0;
    EXPECT_EQ(GetInstances(store, spec.get(), &objects, &count), OK);
    std::vector<std::string> ids;
    for (int32_t i = 0; i < count; i++)
        ids.push_back(Text(objects[i], "key"));
    DestroyObjects(objects, count);
    return ids;
}

void StoreTest::SetUp() {
    char name[] = "/tmp/store_test.XXXXXX";
    ASSERT_NE(mkdtemp(name), nullptr);
    directory_ = name;
    path_ = directory_ + "/store.db";
}

void StoreTest::TearDown() {
    std::filesystem::remove_all(directory_);
}

StorePtr StoreTest::Open() {
    Store *store = nullptr;
    Failure failure;
    EXPECT_EQ(admin::Open(path_, false, &store, &failure), OK) << configstore::Text(failure);
    return StorePtr(store);
}

StorePtr AnyStoreTest::Open() {
    if (GetParam() == In::File) return StoreTest::Open();
    auto store = std::make_unique<Store>("in memory", FailureKeeper::Log::No);
    store->backend = OpenMemory(memory_, &store->failures);
    return StorePtr(store.release());
}

void PrintTo(In in, std::ostream *out) {
    *out << (in == In::File ? "File" : "Memory");
}

std::string NameOf(const testing::TestParamInfo<In> &info) {
    return testing::PrintToString(info.param);
}

void StoreTest::Save(Store *store, const std::string &json, const char *id, const char *source) {
    const ObjectPtr object = NewSwitch(json, id);
    ASSERT_EQ(BeginTransaction(store), OK);
    ASSERT_EQ(Set(store, object.get(), source), OK);
    ASSERT_EQ(CommitTransaction(store), OK);
}

std::string StoreTest::Stored(Store *store, const char *id) {
    Object *object = nullptr;
    const int32_t status = Get(store, kKey, kGroup, kComponent, id, &object);
    if (status == NOT_FOUND) return {};
    EXPECT_EQ(status, OK);
    const ObjectPtr owner(object);
    return owner ? Json(owner.get()) : "";
}

int64_t StoreTest::Number(const std::string &sql) {
    sqlite3 *db = nullptr;
    EXPECT_EQ(sqlite3_open(path_.c_str(), &db), SQLITE_OK);
    sqlite3_stmt *statement = nullptr;
    EXPECT_EQ(sqlite3_prepare_v2(db, sql.c_str(), -1, &statement, nullptr), SQLITE_OK) << sqlite3_errmsg(db);
    EXPECT_EQ(sqlite3_step(statement), SQLITE_ROW) << sql;
    const int64_t number = sqlite3_column_int64(statement, 0);
    sqlite3_finalize(statement);
    sqlite3_close(db);
    return number;
}

void StoreTest::Run(const std::string &sql) {
    sqlite3 *db = nullptr;
    ASSERT_EQ(sqlite3_open(path_.c_str(), &db), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(db, sql.c_str(), nullptr, nullptr, nullptr), SQLITE_OK) << sqlite3_errmsg(db);
    sqlite3_close(db);
}

} // namespace store_test
