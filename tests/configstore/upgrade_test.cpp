/* SPDX-License-Identifier: Apache-2.0 */
// Upgrading from an old state file, and the list of its switches.

#include "configstore/upgrade.h"

#include <filesystem>

#include <unistd.h>

#include "configstore/store_fixture.h"
#include "dvs/file.h"
#include "fault/fault.h"

using namespace state_builder;

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#define DVS_LEAK_CHECK 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#include <sanitizer/lsan_interface.h>
#define DVS_LEAK_CHECK 1
#endif
#endif

namespace {

// The list of switches leaves the file's buffer allocated. The leak checker ignores it; a test below counts
// it.
DvsBasicInfo BasicInfoLeaving(const std::string &path) {
#ifdef DVS_LEAK_CHECK
    const __lsan::ScopedDisabler leaves;
#endif
    return BasicInfoFrom(path.c_str());
}

constexpr const char *kPortset = "com.orbeno.common.host.portset";

Switch Small(const std::string &id, const std::string &portset) {
    Switch sw;
    sw.id = id;
    sw.global = {Alias("name of " + id), Version()};
    sw.ports = {{"p1", {}}};
    if (!portset.empty()) sw.host = {{kPortset, Text(portset)}};
    return sw;
}

struct UpgradeTest : StoreTest {
    UpgradeTest() {
        char name[] = "/tmp/dvs-upgrade-XXXXXX";
        directory = mkdtemp(name);
        path = directory / "state";
    }
    ~UpgradeTest() override { std::filesystem::remove_all(directory); }
    void Write(const std::vector<Switch> &switches) {
        const Bytes state = State(switches);
        ASSERT_EQ(HYP_OK, DVSFile_WriteClassical(path.c_str(), state.data(),
                                                 static_cast<uint32_t>(state.size()), false));
    }
    [[nodiscard]] int32_t Retrieve() const { return RetrieveUpgradeInfoFrom(path.c_str()); }
    std::filesystem::path directory, path;
};

TEST_F(UpgradeTest, WritesTheIdentityOfSwitchesWithAPortset) {
    Write({Small("a", "ps-a")});
    ASSERT_EQ(0, Retrieve());
    const std::string o = "current switches/network_vds/qel#a";
    EXPECT_EQ(o + " {}\n" + o + "/max_ports = 65536\n" + o + "/name = \"name of a\"\n" + o +
                  "/uuid = \"a\"\n" + o + "/portset_name = \"ps-a\"\n",
              fake_store::Dump());
    EXPECT_EQ(0, SwitchesInTable());
    EXPECT_TRUE(Said("SaveDVS: name of a\n"));
}

TEST_F(UpgradeTest, KeepsTheObjectOfASwitchWithoutPortset) {
    ASSERT_EQ(0, Save({Small("a", "old")}));
    const std::string before = fake_store::Dump();
    Write({Small("a", ""), Small("b", "")});
    ASSERT_EQ(0, Retrieve());
    EXPECT_EQ(before, fake_store::Dump());
}

TEST_F(UpgradeTest, ClearsTheObjectOfASwitchWithAPortset) {
    ASSERT_EQ(0, Save({Small("a", "old")}));
    Write({Small("a", "new")});
    ASSERT_EQ(0, Retrieve());
    EXPECT_NE(std::string::npos, fake_store::Dump().find("/portset_name = \"new\"\n"));
    EXPECT_EQ(std::string::npos, fake_store::Dump().find("product"));
    EXPECT_EQ(std::string::npos, fake_store::Dump().find("ports["));
}

TEST_F(UpgradeTest, KeepsObjectsOfOtherSwitches) {
    ASSERT_EQ(0, Save({Small("gone", "old")}));
    Write({Small("a", "new")});
    ASSERT_EQ(0, Retrieve());
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#gone/name"));
}

TEST_F(UpgradeTest, EmptyStateFileSucceedsWithoutUsingTheStore) {
    std::fclose(std::fopen(path.c_str(), "w"));
    EXPECT_EQ(0, Retrieve());
    EXPECT_EQ(0, fake_store::Calls());
    EXPECT_EQ(std::vector<std::string>{"File is empty, skip load"}, system);
}

TEST_F(UpgradeTest, UnreadableStateFileSucceedsWithoutUsingTheStore) {
    ASSERT_EQ(HYP_OK, DVSState_SwitchAdd("mine", "vswitch", 8, 9));
    EXPECT_EQ(0, Retrieve());
    EXPECT_EQ(0, fake_store::Calls());
    ASSERT_EQ(2u, system.size()) << "the file's own line first";
    EXPECT_EQ("Failed to read DVS config from sticky-bit file.", system[1]);
    EXPECT_EQ(0, SwitchesInTable()) << "the table is reset anyway";
}

TEST_F(UpgradeTest, InvalidStateFileCommitsNothing) {
    ASSERT_EQ(0, Save({Small("a", "old")}));
    const std::string before = fake_store::Dump();
    const Bytes noise(512, 0x5a);
    ASSERT_EQ(HYP_OK, DVSFile_WriteClassical(path.c_str(), noise.data(), 512, false));
    EXPECT_EQ(0, Retrieve());
    EXPECT_EQ(before, fake_store::Dump());
}

TEST_F(UpgradeTest, WithoutStoreOrTransactionTheLockStaysHeldAndTheTableLoaded) {
    Write({Small("a", "ps")});
    fake_store::FailFunction("GetStore", configstore::IO_ERROR);
    EXPECT_EQ(-1, Retrieve());
    EXPECT_TRUE(Said("Get store failed\n"));
    EXPECT_EQ(1, SwitchesInTable());
    ReleaseKeptLock();
    fake_store::FailFunction("BeginTransaction", configstore::BUSY);
    EXPECT_EQ(2, Retrieve());
    EXPECT_EQ(1, SwitchesInTable());
    ReleaseKeptLock();
    fake_store::FailFunction(nullptr);
    fake_store::GiveNoStore(true);
    EXPECT_EQ(-1, Retrieve());
    ReleaseKeptLock();
}

TEST_F(UpgradeTest, UpgradeIntoAnOpenStoreLeavesNothing) {
    Write({Small("a", "ps")});
    configstore::Store *store = nullptr;
    ASSERT_EQ(0, configstore::GetStore(&store));
    fake_store::FailFunction("BeginTransaction", configstore::BUSY);
    EXPECT_EQ(2, dvs::config::UpgradeFromFile(store, path.c_str()));
    EXPECT_EQ(0, lock_count::Held());
    EXPECT_EQ(0, SwitchesInTable());
    EXPECT_EQ("", fake_store::Dump());
    fake_store::FailFunction(nullptr);
    EXPECT_EQ(0, dvs::config::UpgradeFromFile(store, path.c_str()));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#a/portset_name = \"ps\"\n"));
    EXPECT_EQ(0, dvs::config::UpgradeFromFile(store, (path.string() + ".absent").c_str()));
    EXPECT_EQ(0, lock_count::Held());
    EXPECT_EQ(0, SwitchesInTable());
    configstore::DestroyStore(store);
}

TEST_F(UpgradeTest, EachFailingStoreCallKeepsTheStore) {
    Write({Small("a", "new"), Small("b", "new"), Small("c", "")});
    dvsconfigstore_debug = -1;
    int call = 1;
    for (;; ++call) {
        fake_store::Reset();
        ASSERT_EQ(0, Save({Small("a", "old")}));
        const std::string before = fake_store::Dump();
        const int first = fake_store::Calls();
        fake_store::FailCall(call, configstore::IO_ERROR);
        const int32_t result = Retrieve();
        if (!fake_store::Failed()) break;
        const std::string failed = fake_store::CallName(first + call);
        SCOPED_TRACE(failed);
        EXPECT_NE(0, result);
        EXPECT_EQ(before, fake_store::Dump());
        if (failed == "GetStore" || failed == "BeginTransaction") ReleaseKeptLock();
        EXPECT_EQ(0, lock_count::Held());
        EXPECT_EQ(0, SwitchesInTable());
        EXPECT_EQ(0, fake_store::OpenHandles());
    }
    EXPECT_GT(call, 30);
    dvsconfigstore_debug = 10;
}

TEST_F(UpgradeTest, NamesTheSwitchThatFails) {
    Write({Small("a", "new")});
    fake_store::FailFunction("Set", configstore::SCHEMA_VIOLATION);
    EXPECT_EQ(4, Retrieve());
    EXPECT_TRUE(Said("Failed to save dvs: a to configstore\nFailed to save dvs to configstore\n"));
    EXPECT_EQ("CancelTransaction", fake_store::CallName(fake_store::Calls()));
}

// --- Basic info. ---

TEST_F(UpgradeTest, BasicInfoListsTheSwitchesOfTheFile) {
    Write({Small("a", "ps-a"), Small("b", "")});
    const int64_t blocks = fault_live_blocks();
    const DvsBasicInfo info = BasicInfoLeaving(path);
    ASSERT_EQ(2, info.count);
    EXPECT_STREQ("a", info.entries[0].switchId);
    EXPECT_STREQ("name of a", info.entries[0].name);
    EXPECT_STREQ("ps-a", info.entries[0].portsetName);
    EXPECT_STREQ("b", info.entries[1].switchId);
    EXPECT_EQ(nullptr, info.entries[1].portsetName);
    EXPECT_EQ(2, SwitchesInTable()) << "the table is not reset: it owns the returned texts";
    EXPECT_EQ(HYP_OK, DVSState_ConfigReset());
    EXPECT_EQ(blocks + 1, fault_live_blocks()) << "only the file's buffer stays allocated";
}

TEST_F(UpgradeTest, BasicInfoReplacesTheTable) {
    ASSERT_EQ(HYP_OK, DVSState_SwitchAdd("mine", "vswitch", 8, 9));
    Write({});
    EXPECT_EQ(0, BasicInfoLeaving(path).count);
    EXPECT_EQ(0, SwitchesInTable());
}

TEST_F(UpgradeTest, BasicInfoOfAnUnreadableFileIsEmptyAndKeepsTheTable) {
    ASSERT_EQ(HYP_OK, DVSState_SwitchAdd("mine", "vswitch", 8, 9));
    EXPECT_EQ(0, BasicInfoFrom((path.string() + ".absent").c_str()).count);
    EXPECT_EQ(1, SwitchesInTable());
    EXPECT_EQ(HYP_OK, DVSState_ConfigReset());
}

TEST_F(UpgradeTest, ExportedFunctionsReadTheHostsFile) {
    if (access("/etc/orbeno/dvsdata.db", F_OK) == 0) GTEST_SKIP() << "this host has a real state file";
    EXPECT_EQ(0, DVSState_RetrieveDVSUpgradeInfo());
    ASSERT_EQ(2u, system.size()) << "the file's own line first";
    EXPECT_EQ("Failed to read DVS config from sticky-bit file.", system[1]);
    EXPECT_EQ(0, GetDvsBasicInfoFromFileHyp().count);
}

} // namespace
