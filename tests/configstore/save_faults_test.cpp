/* SPDX-License-Identifier: Apache-2.0 */
// Saves with a failing store: the store keeps no partial change, and no lock stays held except where
// documented.

#include "configstore/save.h"
#include "configstore/store_fixture.h"

using namespace state_builder;

namespace {

using SaveFaults = StoreTest;

std::vector<Switch> Before() {
    Switch a;
    a.id = "a";
    a.global = {Alias("old"), Version()};
    a.ports = {{"p1", {}}};
    Switch stale = a;
    stale.id = "stale";
    return {a, stale};
}

// One property of every kind of place: own field, sub-object, list, instance, list of the DEFAULT rows.
std::vector<Switch> After() {
    Switch a;
    a.id = "a";
    a.global = {Alias("new"),
                Version(),
                {"com.orbeno.common.portset.mtu", U32(1500)},
                {"com.orbeno.common.uplinkPorts", U32(2) + Slot("u1", 81) + Slot("u2", 81)},
                {"com.orbeno.common.teamcheck.deploy", Bytes(5)},
                {"opaque", Bytes{1}, 0x18},
                {"other", Bytes{1}, 0x20}};
    a.host = {{"com.orbeno.common.host.uplinkPorts", U32(1) + Slot("p1", 48)}};
    a.ports = {{"p1",
                {{"com.orbeno.common.port.alias", Text("x")},
                 {"com.orbeno.common.port.shaper.input", Bytes(24, 1)}}},
               {"p2", {{"x.ruleset", Bytes(9)}}}};
    Switch b = a;
    b.id = "b";
    return {a, b};
}

// Calls whose failure the save ignores by contract.
bool IsHarmless(const std::string &call) {
    return call == "GenerateInstanceId" || call == "CancelTransaction";
}

void FailEachCall(const char *id) {
    const Bytes after = State(After());
    int call = 1;
    for (;; ++call) {
        fake_store::Reset();
        ASSERT_EQ(0, StoreTest::Save(Before()));
        const std::string before = fake_store::Dump();
        fake_store::FailCall(call, configstore::IO_ERROR);
        const int first = fake_store::Calls();
        const int32_t result = StoreTest::SaveBytes(after, id);
        if (!fake_store::Failed()) {
            EXPECT_EQ(0, result);
            EXPECT_NE(before, fake_store::Dump());
            break;
        }
        const std::string failed = fake_store::CallName(first + call);
        SCOPED_TRACE(failed + ", call " + std::to_string(call));
        if (result == 0) {
            EXPECT_TRUE(IsHarmless(failed) || failed == "SetValueEmptyList") << "the save must fail";
            continue;
        }
        EXPECT_EQ(before, fake_store::Dump());
        EXPECT_TRUE(result == configstore::IO_ERROR || (result == -1 && failed == "GetStore") ||
                    (result == -1 && failed == "CreateObject"))
            << result;
        if (failed == "GetStore" || failed == "BeginTransaction") {
            EXPECT_EQ(failed == "GetStore" ? -1 : 8, result);
            EXPECT_EQ(2, StoreTest::SwitchesInTable()) << "the table stays loaded";
            StoreTest::ReleaseKeptLock();
            fake_store::DestroyKeptStore();
        }
        EXPECT_EQ(0, StoreTest::SwitchesInTable());
        EXPECT_EQ(0, lock_count::Held());
        EXPECT_EQ(0, fake_store::OpenHandles());
    }
    EXPECT_GT(call, 60);
}

TEST_F(SaveFaults, EachFailingStoreCallKeepsTheStore) {
    dvsconfigstore_debug = -1;
    FailEachCall(nullptr);
}

TEST_F(SaveFaults, EachFailingStoreCallOfASaveByIdKeepsTheStore) {
    dvsconfigstore_debug = -1;
    FailEachCall("a");
}

TEST_F(SaveFaults, WithoutAStoreTheLockStaysHeldAndTheTableLoaded) {
    fake_store::GiveNoStore(true);
    EXPECT_EQ(-1, Save(After()));
    EXPECT_TRUE(Said("Get store failed\n"));
    EXPECT_EQ(2, SwitchesInTable());
    ReleaseKeptLock();
    fake_store::FailFunction("GetStore", configstore::IO_ERROR);
    EXPECT_EQ(-1, Save(After()));
    EXPECT_EQ(2, SwitchesInTable());
    ReleaseKeptLock();
}

TEST_F(SaveFaults, WithoutATransactionTheLockStaysHeldAndTheTableLoaded) {
    fake_store::FailFunction("BeginTransaction", configstore::BUSY);
    EXPECT_EQ(2, Save(After()));
    EXPECT_EQ(2, SwitchesInTable());
    EXPECT_EQ(1, fake_store::OpenHandles()) << "the store handle stays open";
    ReleaseKeptLock();
    fake_store::DestroyKeptStore();
}

TEST_F(SaveFaults, WithoutATransactionTheCheckedSaveKeepsTheSame) {
    fake_store::FailFunction("BeginTransaction", configstore::BUSY);
    EXPECT_EQ(2, SaveChecked(State(After())));
    EXPECT_EQ(2, SwitchesInTable());
    EXPECT_EQ(1, fake_store::OpenHandles());
    ReleaseKeptLock();
    fake_store::DestroyKeptStore();
}

// Saves into the caller's store clean up on every path.
TEST_F(SaveFaults, SaveIntoAnOpenStoreLeavesNothing) {
    configstore::Store *store = nullptr;
    ASSERT_EQ(0, configstore::GetStore(&store));
    const Bytes state = State(After());
    const auto len = static_cast<uint32_t>(state.size());
    for (const auto save : {dvs::config::SaveState, dvs::config::SaveStateChecked}) {
        fake_store::FailFunction("BeginTransaction", configstore::BUSY);
        EXPECT_EQ(2, save(store, state.data(), len, nullptr));
        EXPECT_EQ(0, lock_count::Held());
        EXPECT_EQ(0, SwitchesInTable());
        fake_store::FailFunction(nullptr);
        EXPECT_EQ(0, save(store, state.data(), len, nullptr));
        EXPECT_EQ(0, lock_count::Held());
        EXPECT_EQ(0, SwitchesInTable());
        EXPECT_EQ(1, fake_store::OpenHandles()) << "the test's own store";
    }
    const int calls = fake_store::Calls();
    EXPECT_EQ(0, dvs::config::SaveStateChecked(store, state.data(), len, "a"));
    EXPECT_EQ("BeginTransaction", fake_store::CallName(calls + 1));
    const std::string saved = fake_store::Dump();
    Bytes damaged = state;
    damaged[40] ^= 1;
    EXPECT_NE(0, dvs::config::SaveStateChecked(store, damaged.data(), len, nullptr));
    EXPECT_EQ(saved, fake_store::Dump());
    EXPECT_EQ(0, dvs::config::SaveState(store, damaged.data(), len, nullptr));
    EXPECT_EQ("", fake_store::Dump());
    configstore::DestroyStore(store);
}

TEST_F(SaveFaults, ReturnsTheStatusOfAFailedListing) {
    fake_store::FailFunction("GetInstances", configstore::CORRUPT);
    EXPECT_EQ(7, Save(After()));
    EXPECT_EQ("CancelTransaction", fake_store::CallName(fake_store::Calls()));
}

TEST_F(SaveFaults, DoesNotOverwriteAnUnreadableObject) {
    ASSERT_EQ(0, Save(Before()));
    const std::string before = fake_store::Dump();
    fake_store::FailFunction("Get", configstore::CORRUPT);
    EXPECT_EQ(7, Save(After()));
    EXPECT_EQ(7, Save(After(), "a"));
    EXPECT_EQ(before, fake_store::Dump());
}

TEST_F(SaveFaults, ReturnsMinusOneWhenAnObjectCannotBeCreated) {
    fake_store::FailFunction("CreateObject", configstore::NO_MEMORY);
    EXPECT_EQ(-1, Save(After()));
    EXPECT_TRUE(Said("Get/Create dvs_switch:a failed\n"));
    EXPECT_EQ("", fake_store::Dump());
}

TEST_F(SaveFaults, FailedCommitIsCancelledAndReportedTwice) {
    ASSERT_EQ(0, Save(Before()));
    const std::string before = fake_store::Dump();
    system.clear();
    fake_store::FailFunction("CommitTransaction", configstore::BUSY);
    EXPECT_EQ(2, Save(After()));
    EXPECT_EQ(before, fake_store::Dump());
    EXPECT_EQ("CancelTransaction", fake_store::CallName(fake_store::Calls()));
    ASSERT_EQ(4u, system.size());
    EXPECT_EQ(0u, system[2].find("End DVSState_SaveBufToConfigStore_ByInstance, configStore time: "));
    EXPECT_EQ(0u,
              system[3].find("End DVSState_SaveBufToConfigStore_ByInstance with error, configStore time: "));
}

TEST_F(SaveFaults, IgnoresTheStatusOfAFailedCancel) {
    fake_store::FailFunction("CancelTransaction", configstore::IO_ERROR);
    EXPECT_EQ(0, Save(After()));
    auto bad = After();
    bad[0].global.push_back({"com.orbeno.common.resv.threshold", {}});
    EXPECT_EQ(-1, Save(bad));
}

TEST_F(SaveFaults, ClearingIgnoresOnlyAbsentMembers) {
    ASSERT_EQ(0, Save(Before()));
    for (const char *call : {"RemoveValue", "DeleteSubObject", "DeleteSubObjectInstances"}) {
        fake_store::FailFunction(call, configstore::NOT_FOUND);
        EXPECT_EQ(0, Save(Before())) << call;
        fake_store::FailFunction(call, configstore::IO_ERROR);
        EXPECT_EQ(8, Save(Before())) << call;
    }
}

TEST_F(SaveFaults, ObjectWithoutUuidFailsASaveOfAll) {
    fake_store::Reset();
    configstore::Store *store = nullptr;
    configstore::Object *object = nullptr;
    ASSERT_EQ(0, configstore::GetStore(&store));
    ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "nameless", "{}", &object));
    ASSERT_EQ(0, configstore::Set(store, object, "EXTERNAL"));
    configstore::DestroyObject(object);
    configstore::DestroyStore(store);
    const std::string before = fake_store::Dump();
    EXPECT_EQ(6, Save(After()));
    EXPECT_EQ(before, fake_store::Dump());
    EXPECT_EQ(0, Save(After(), "a"));
}

} // namespace
