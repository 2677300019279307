/* SPDX-License-Identifier: Apache-2.0 */
// The administration functions: list, import and export, history, restore, backup, check.

#include "platform/configstore/support.h"

#include <algorithm>
#include <filesystem>
#include <sys/stat.h>

using namespace configstore;
using namespace store_test;

namespace {

Address At(const char *id, Layer layer = Layer::Current) {
    return {layer, kKey, kGroup, kComponent, id};
}

class StoreAdmin : public AnyStoreTest {
protected:
    int32_t Import(Store *store, const std::string &json, const char *id = "sw1") {
        problems_.clear();
        return admin::Import(store, At(id), json, &problems_);
    }
    std::vector<admin::Problem> problems_;
};
RUN_OVER_EVERY_BACKEND(StoreAdmin);

using StoreAdminFile = StoreTest;

TEST_P(StoreAdmin, ListsBothLayersWithRevisionAndSize) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"a"})", "b");
    Save(store.get(), "{}", "a", "USER");
    std::vector<admin::Entry> entries;
    ASSERT_EQ(admin::List(store.get(), &entries), OK);
    ASSERT_EQ(entries.size(), 2U);
    EXPECT_EQ(entries[0].address.instance, "b");
    EXPECT_EQ(entries[0].revision, 1);
    EXPECT_EQ(entries[0].bytes, 12U);
    EXPECT_GT(entries[0].savedMs, 0);
    EXPECT_EQ(entries[1].address.layer, admin::Layer::Desired);
}

TEST_P(StoreAdmin, ExportReturnsTheStoredDocument) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"a"})");
    std::string json;
    EXPECT_EQ(admin::Export(store.get(), At("sw1"), &json), OK);
    EXPECT_EQ(json, R"({"name":"a"})");
    EXPECT_EQ(admin::Export(store.get(), At("sw1", admin::Layer::Desired), &json), NOT_FOUND);
}

TEST_P(StoreAdmin, ImportStoresAGoodDocument) {
    const StorePtr store = Open();
    EXPECT_EQ(Import(store.get(), R"({"name":"a","product":{"version":"8.0.3"}})"), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"a","product":{"version":"8.0.3"}})");
}

TEST_P(StoreAdmin, ImportRejectsWhatSetWouldKeepAndStoresNothing) {
    struct {
        const char *json;
        int32_t status;
        std::string_view where;
    } const cases[] = {
        {R"({"unheard_of":1})", BAD_PARAMETER, "unheard_of"},                       // unknown member
        {R"({"settings":{"unheard_of":1}})", BAD_PARAMETER, "settings/unheard_of"}, // also below
        {R"({"name":"a","name":"b"})", BAD_PARAMETER, "name"},                      // duplicate
        {R"({"ports":{"p":{},"p":{}}})", BAD_PARAMETER, "ports"},                   // duplicate instance
        {R"({"ports":{"p":{"name":"a\u0000"}}})", BAD_PARAMETER, "ports[p]/name"},  // NUL in a text
        {R"({"ports":{"p":{"nam\u0000":"a"}}})", BAD_PARAMETER,
         std::string_view("ports[p]/nam\0", 13)}, // NUL in a name
        {R"({"uplink_port_keys":["a\u0000"]})", BAD_PARAMETER, "uplink_port_keys"},
        {R"({"product":{"version":"9.9.9"}})", SCHEMA_VIOLATION, "product/version"}, // enumeration
        {R"({"switch_address":"10.0.0.300"})", SCHEMA_VIOLATION, "switch_address"},  // pattern
        {R"({"name":1})", SCHEMA_VIOLATION, "name"},
        {"[]", BAD_PARAMETER, ""},
        {"{", BAD_PARAMETER, ""},
        {"", BAD_PARAMETER, ""},
    };
    const StorePtr store = Open();
    for (const auto &one : cases) {
        EXPECT_EQ(Import(store.get(), one.json), one.status) << one.json;
        ASSERT_FALSE(problems_.empty()) << one.json;
        const bool found =
            std::any_of(problems_.begin(), problems_.end(),
                        [&](const admin::Problem &problem) { return problem.where == one.where; });
        EXPECT_TRUE(found) << one.json << ": " << problems_[0].where << ": " << problems_[0].what;
    }
    EXPECT_TRUE(StoredIds(store.get()).empty());
}

TEST_P(StoreAdmin, ImportRejectsTooManyItems) {
    std::string json =
        R"({"settings":{"uplink_teaming_policy":{"uplink_port_order":{"active_uplink_ports":[)";
    for (int i = 0; i < 33; i++)
        json += i == 0 ? "\"u\"" : ",\"u\"";
    json += "]}}}}";
    const StorePtr store = Open();
    EXPECT_EQ(Import(store.get(), json), BAD_PARAMETER);
    EXPECT_NE(problems_[0].what.find("more than 32 items"), std::string::npos) << problems_[0].what;
}

TEST_P(StoreAdmin, HistoryListsTheLatestFirst) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"1"})");
    Save(store.get(), R"({"name":"2"})");
    ASSERT_EQ(admin::Delete(store.get(), At("sw1")), OK);
    std::vector<admin::Entry> past;
    ASSERT_EQ(admin::History(store.get(), &past), OK);
    ASSERT_EQ(past.size(), 2U);
    EXPECT_EQ(past[0].revision, 2);
    EXPECT_EQ(past[0].ended, 3);
    EXPECT_TRUE(past[0].deleted);
    EXPECT_EQ(past[1].revision, 1);
    EXPECT_EQ(past[1].ended, 2);
    EXPECT_FALSE(past[1].deleted);
}

TEST_P(StoreAdmin, EveryHistoricDocumentCanBeReadAndRestored) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"1"})");
    Save(store.get(), R"({"name":"2"})");
    ASSERT_EQ(admin::Delete(store.get(), At("sw1")), OK);
    std::string json;
    EXPECT_EQ(admin::ExportAsOf(store.get(), At("sw1"), 1, &json), OK);
    EXPECT_EQ(json, R"({"name":"1"})");
    EXPECT_EQ(admin::ExportAsOf(store.get(), At("sw1"), 3, &json), NOT_FOUND);
    EXPECT_EQ(admin::ExportAsOf(store.get(), At("sw1"), 4, &json), NOT_FOUND);
    ASSERT_EQ(admin::RestoreObject(store.get(), At("sw1"), 2), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"2"})");
    ASSERT_EQ(admin::RestoreObject(store.get(), At("sw1"), 1), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"1"})");
    EXPECT_EQ(admin::ExportAsOf(store.get(), At("sw1"), 4, &json), OK);
    EXPECT_EQ(json, R"({"name":"2"})");
    EXPECT_EQ(admin::RestoreObject(store.get(), At("sw1"), 3), NOT_FOUND);
}

TEST_P(StoreAdmin, RestoresTheWholeStoreAsOfARevision) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"a1"})", "a");
    Save(store.get(), R"({"name":"b1"})", "b", "USER");
    Save(store.get(), R"({"name":"a2"})", "a");
    Save(store.get(), R"({"name":"c1"})", "c");
    std::vector<admin::Change> changes;
    ASSERT_EQ(admin::RestoreStore(store.get(), 2, &changes), OK);
    EXPECT_EQ(changes.size(), 2U);
    EXPECT_EQ(Stored(store.get(), "a"), R"({"name":"a1"})");
    EXPECT_EQ(StoredIds(store.get()), std::vector<std::string>{"a"});
    ASSERT_EQ(admin::RestoreStore(store.get(), 4, &changes), OK);
    EXPECT_EQ(Stored(store.get(), "a"), R"({"name":"a2"})");
    EXPECT_EQ(Stored(store.get(), "c"), R"({"name":"c1"})");
    ASSERT_EQ(admin::RestoreStore(store.get(), 0, &changes), OK);
    EXPECT_EQ(changes.size(), 3U);
    std::vector<admin::Entry> entries;
    ASSERT_EQ(admin::List(store.get(), &entries), OK);
    EXPECT_TRUE(entries.empty());
    EXPECT_EQ(admin::RestoreStore(store.get(), 99, &changes), NOT_FOUND);
}

TEST_P(StoreAdmin, PlannedRestoreCanBeCancelled) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"a1"})");
    Save(store.get(), R"({"name":"a2"})");
    std::vector<admin::Change> changes;
    ASSERT_EQ(BeginTransaction(store.get()), OK);
    ASSERT_EQ(admin::RestoreStore(store.get(), 1, &changes), OK);
    EXPECT_EQ(changes.size(), 1U);
    ASSERT_EQ(CancelTransaction(store.get()), OK);
    EXPECT_EQ(Stored(store.get()), R"({"name":"a2"})");
}

TEST_F(StoreAdminFile, BackupIsASeparateStoreForTheOwnerOnly) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"kept"})");
    const std::string copy = directory_ + "/copy.db";
    ASSERT_EQ(admin::Backup(store.get(), copy), OK);
    struct stat info {};
    ASSERT_EQ(stat(copy.c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0600U);
    Store *opened = nullptr;
    ASSERT_EQ(admin::Open(copy, true, &opened), OK);
    const StorePtr owner(opened);
    EXPECT_EQ(Stored(opened), R"({"name":"kept"})");
    EXPECT_EQ(admin::Backup(store.get(), copy), EXISTS);
    EXPECT_EQ(LastFailure(store.get()), "config store " + path_ + ": backup to " + copy + ": File exists");
    EXPECT_EQ(admin::Backup(store.get(), directory_ + "/no/where.db"), IO_ERROR);
}

TEST_F(StoreAdminFile, ReadOnlyStoreRejectsChangesAndIsNotCreated) {
    Store *opened = nullptr;
    Failure failure;
    EXPECT_EQ(admin::Open(path_, true, &opened, &failure), IO_ERROR);
    EXPECT_EQ(Text(failure),
              "config store " + path_ + ": the file cannot be opened: No such file or directory");
    EXPECT_FALSE(std::filesystem::exists(path_));
    Save(Open().get(), R"({"name":"a"})");
    ASSERT_EQ(admin::Open(path_, true, &opened), OK);
    const StorePtr store(opened);
    EXPECT_EQ(Stored(opened), R"({"name":"a"})");
    EXPECT_EQ(Set(opened, NewSwitch().get(), "EXTERNAL"), IO_ERROR);
    EXPECT_EQ(BeginTransaction(opened), OK);
    EXPECT_EQ(Set(opened, NewSwitch().get(), "EXTERNAL"), IO_ERROR);
    EXPECT_EQ(CommitTransaction(opened), IO_ERROR);
    EXPECT_EQ(CancelTransaction(opened), OK);
    EXPECT_EQ(LastFailure(opened), "config store " + path_ + ": the file cannot be written to");
}

TEST_F(StoreAdminFile, CheckReportsDocumentsThatViolateTheSchema) {
    const StorePtr store = Open();
    Save(store.get(), R"({"name":"old"})");
    Save(store.get(), R"({"name":"new"})");
    std::vector<admin::Problem> problems;
    EXPECT_EQ(admin::Check(store.get(), &problems), OK);
    EXPECT_TRUE(problems.empty());
    Run(R"(UPDATE document SET text = '{"max_ports":"many"}' WHERE id = 2)");
    Run("UPDATE document SET text = '{' WHERE id = 1");
    EXPECT_EQ(admin::Check(store.get(), &problems), OK);
    ASSERT_EQ(problems.size(), 2U);
    EXPECT_EQ(problems[0].where, "current switches/network_vds/qel[sw1] of revision 2: max_ports");
    EXPECT_EQ(problems[1].where, "current switches/network_vds/qel[sw1] of revision 1");
    problems.clear();
    Run("DELETE FROM document WHERE id = 1");
    EXPECT_EQ(admin::Check(store.get(), &problems), OK);
    EXPECT_EQ(problems.size(), 2U);
    std::string text;
    EXPECT_EQ(admin::ExportAsOf(store.get(), At("sw1"), 1, &text), CORRUPT);
    EXPECT_EQ(LastFailure(store.get()), "config store " + path_ + ": document 1 is missing");
}

TEST_F(StoreAdminFile, EveryStatusHasAText) {
    for (int32_t status = OK; status <= NO_MEMORY; status++)
        EXPECT_STRNE(admin::StatusText(status), "");
    EXPECT_NE(admin::Schema(kKey, kGroup).find("forwarding_class"), std::string_view::npos);
}

} // namespace
