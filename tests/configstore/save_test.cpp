/* SPDX-License-Identifier: Apache-2.0 */
// Saving whole states: what is written, cleared and deleted, and the messages.

#include "configstore/store_fixture.h"

using namespace state_builder;

namespace {

using SaveTest = StoreTest;

const char *const kPrefix = "current switches/network_vds/qel#";

Switch Small(const std::string &id, const std::string &name = "name") {
    Switch sw;
    sw.id = id;
    sw.global = {Alias(name), Version()};
    return sw;
}

// The object of a switch, edited in the store by hand.
class Edit {
public:
    explicit Edit(const char *id, bool create = false) {
        EXPECT_EQ(0, configstore::GetStore(&store_));
        if (create)
            EXPECT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", id, "{}", &object_));
        else
            EXPECT_EQ(0, configstore::Get(store_, "switches", "network_vds", "qel", id, &object_));
    }
    ~Edit() {
        EXPECT_EQ(0, configstore::Set(store_, object_, "EXTERNAL"));
        configstore::DestroyObject(object_);
        configstore::DestroyStore(store_);
    }
    Edit(const Edit &) = delete;
    Edit &operator=(const Edit &) = delete;
    configstore::Object *operator*() const { return object_; }

private:
    configstore::Store *store_ = nullptr;
    configstore::Object *object_ = nullptr;
};

TEST_F(SaveTest, WritesIdentityLimitsClassPropertiesAndPorts) {
    Switch sw = Small("id-1", "blue");
    sw.className = "vswitch";
    sw.host = {{"com.orbeno.common.host.portset", Text("ps")}};
    sw.ports = {{"p1", {{"com.orbeno.common.port.alias", Text("one")}}}, {"p2", {}}};
    ASSERT_EQ(0, Save({sw}));
    const std::string o = std::string(kPrefix) + "id-1";
    EXPECT_EQ(o + " {}\n" + o + "/product {}\n" + o + "/product/forwarding_class = \"vswitch\"\n" + o +
                  "/product/version = \"7.0.3\"\n" + o + "/max_ports = 65536\n" + o + "/name = \"blue\"\n" +
                  o + "/uuid = \"id-1\"\n" + o + "/portset_name = \"ps\"\n" + o + "/ports[p1] {}\n" + o +
                  "/ports[p1]/name = \"one\"\n" + o + "/ports[p2] {}\n",
              fake_store::Dump());
    EXPECT_EQ(0, SwitchesInTable());
    EXPECT_TRUE(Said("Ready to save dvs list\n"));
    EXPECT_TRUE(Said("SaveDVS: blue\n"));
    EXPECT_TRUE(Said("SaveGlobalProp: com.orbeno.common.alias\n"));
    EXPECT_TRUE(Said("SaveHostProp: com.orbeno.common.host.portset\n"));
}

TEST_F(SaveTest, NamesASwitchWithoutAliasUnknown) {
    Switch sw = Small("id-1");
    sw.global = {Version()};
    ASSERT_EQ(0, Save({sw}));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("/name = \"unknown\"\n"));
}

TEST_F(SaveTest, ReportsStartAndTimesToSyslog) {
    dvsConfigStoreTimeMs = 1'000'000'000;
    ASSERT_EQ(0, Save({Small("a")}));
    ASSERT_EQ(3u, system.size());
    EXPECT_EQ("Start DVSState_SaveBufToConfigStore_ByInstance, swId:[]", system[0]);
    long long ms = -1;
    char end = 0;
    EXPECT_EQ(2,
              std::sscanf(system[1].c_str(),
                          "DVSState_SaveBufToConfigStore_ByInstance GetInstances time: %lldm%c", &ms, &end));
    EXPECT_EQ(2, std::sscanf(system[2].c_str(),
                             "End DVSState_SaveBufToConfigStore_ByInstance, configStore time: %lldm%c", &ms,
                             &end));
    EXPECT_GE(ms, 0);
    EXPECT_LT(ms, 1'000'000'000) << "reset at the start";
    EXPECT_EQ(0, dvsConfigStoreTimeMs) << "reset after the report";
    system.clear();
    ASSERT_EQ(0, Save({Small("a")}, "a"));
    ASSERT_EQ(2u, system.size()) << "no switch is listed";
    EXPECT_EQ("Start DVSState_SaveBufToConfigStore_ByInstance, swId:[a]", system[0]);
}

TEST_F(SaveTest, OfAllDeletesObjectsOfRemovedSwitches) {
    ASSERT_EQ(0, Save({Small("a"), Small("b")}));
    ASSERT_EQ(0, Save({Small("b")}));
    EXPECT_EQ(std::string::npos, fake_store::Dump().find("#a"));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#b"));
}

TEST_F(SaveTest, ByIdTouchesNoOtherObject) {
    ASSERT_EQ(0, Save({Small("a", "old"), Small("b", "old"), Small("c", "old")}));
    ASSERT_EQ(0, Save({Small("a", "new"), Small("b", "new")}, "a"));
    const std::string dump = fake_store::Dump();
    EXPECT_NE(std::string::npos, dump.find("#a/name = \"new\"\n"));
    EXPECT_NE(std::string::npos, dump.find("#b/name = \"old\"\n"));
    EXPECT_NE(std::string::npos, dump.find("#c/name = \"old\"\n"));
}

TEST_F(SaveTest, ByAnUnknownIdCommitsAnEmptyTransaction) {
    ASSERT_EQ(0, Save({Small("a")}));
    const std::string before = fake_store::Dump();
    ASSERT_EQ(0, Save({Small("b")}, "nowhere"));
    EXPECT_EQ(before, fake_store::Dump());
    EXPECT_EQ("CommitTransaction", fake_store::CallName(fake_store::Calls()));
}

TEST_F(SaveTest, ByAnIdInTheStoreOnlyDeletesItsObject) {
    ASSERT_EQ(0, Save({Small("a"), Small("b")}));
    ASSERT_EQ(0, Save({Small("c")}, "a"));
    const std::string dump = fake_store::Dump();
    EXPECT_EQ(std::string::npos, dump.find("#a"));
    EXPECT_NE(std::string::npos, dump.find("#b"));
    EXPECT_EQ(std::string::npos, dump.find("#c"));
}

TEST_F(SaveTest, DeletesByUuidNotByInstanceId) {
    ASSERT_EQ(0, Save({Small("a")}));
    {
        const Edit edit("other", true);
        ASSERT_EQ(0, configstore::SetValueStr(*edit, "uuid", "a"));
    }
    ASSERT_EQ(0, Save({Small("a")})) << "the table has the switch with the object's uuid";
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#other"));
}

TEST_F(SaveTest, ClearsAllMembersItWritesInAnExistingObject) {
    Switch sw = Small("a");
    sw.global.push_back({"com.orbeno.common.opaqueDvs", Text("true")});
    sw.global.push_back({"com.orbeno.common.portset.ovl", Text("true")});
    sw.global.push_back({"com.orbeno.etherswitch.ipv4addr", {10, 0, 0, 1}});
    sw.global.push_back({"com.orbeno.common.uplinkPorts", U32(1) + Slot("u", 81)});
    sw.global.push_back({"com.orbeno.common.portset.mtu", U32(1500)});
    sw.global.push_back({"com.orbeno.common.respools.sched", {1}});
    sw.global.push_back({"com.orbeno.common.teamcheck.deploy", Bytes(5)});
    sw.global.push_back({"vendor", Text("v")});
    sw.host = {{"com.orbeno.common.host.portset", Text("ps")},
               {"com.orbeno.common.host.uplinkPorts", U32(1) + Slot("p1", 48)}};
    sw.ports = {{"p1", {}}};
    ASSERT_EQ(0, Save({Small("a")}));
    const std::string bare = fake_store::Dump();
    ASSERT_EQ(0, Save({sw}));
    ASSERT_NE(bare, fake_store::Dump());
    ASSERT_EQ(0, Save({Small("a")}));
    // The same lines; "uuid" is never cleared and stays first.
    auto lines = [](const std::string &text) {
        std::vector<std::string> sorted;
        for (std::size_t at = 0; at < text.size(); at = text.find('\n', at) + 1)
            sorted.push_back(text.substr(at, text.find('\n', at) - at));
        std::sort(sorted.begin(), sorted.end());
        return sorted;
    };
    EXPECT_EQ(lines(bare), lines(fake_store::Dump()));
}

TEST_F(SaveTest, RemovesTunnelEndPortsAndTheOtherObsoleteLists) {
    ASSERT_EQ(0, Save({Small("a")}));
    {
        const Edit edit("a");
        configstore::Object *port = nullptr;
        for (const char *list : {"vtep_ports", "uplink_ports", "hypnic_ports"})
            ASSERT_EQ(0, configstore::CreateSubObject(*edit, list, "x", &port));
        ASSERT_EQ(0, configstore::AppendValueString(*edit, "uplink_port_groupKeys", "g"));
    }
    ASSERT_NE(std::string::npos, fake_store::Dump().find("vtep_ports[x]"));
    ASSERT_EQ(0, Save({Small("a")}));
    for (const char *name : {"vtep_ports", "uplink_ports", "hypnic_ports", "uplink_port_groupKeys"})
        EXPECT_EQ(std::string::npos, fake_store::Dump().find(name)) << name;
}

TEST_F(SaveTest, KeepsUnknownMembers) {
    ASSERT_EQ(0, Save({Small("a")}));
    {
        const Edit edit("a");
        ASSERT_EQ(0, configstore::SetValueStr(*edit, "of_a_newer_writer", "kept"));
    }
    ASSERT_EQ(0, Save({Small("a")}));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#a/of_a_newer_writer = \"kept\"\n"));
}

TEST_F(SaveTest, ClassNamesOtherThanTheTwoKnownAreCodeZero) {
    const std::pair<const char *, uint32_t> cases[] = {{"vswitch", 1},     {"cswitch", 2}, {"vswitchX", 0},
                                                       {"etherswitch", 0}, {"VSWITCH", 0}, {"", 0}};
    for (const auto &[className, code] : cases) {
        Switch sw = Small("a");
        sw.className = className;
        ASSERT_EQ(0, Save({sw}));
        EXPECT_EQ(code, dvsSwitchClass) << className;
    }
}

TEST_F(SaveTest, VersionsAbove99HaveWidePortRecords) {
    for (const auto &[version, wide] : {std::pair(9u, false), std::pair(99u, false), std::pair(100u, true)}) {
        Switch sw = Small("a");
        sw.version = version;
        ASSERT_EQ(0, Save({sw}));
        EXPECT_EQ(wide, dvsWidePortRecords) << version;
    }
}

TEST_F(SaveTest, PortsOfEveryKindAreSavedAndDuplicatesShareAnInstance) {
    Switch sw = Small("a");
    sw.ports = {{"p1", {{"com.orbeno.common.port.alias", Text("active")}}},
                {"p1",
                 {{"com.orbeno.common.port.volatile.type", U32(2)},
                  {"com.orbeno.common.port.portgroupid", Text("pg")}}}};
    ASSERT_EQ(0, Save({sw}));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("/ports[p1]/name = \"active\"\n"));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("/ports[p1]/port_group_key = \"pg\"\n"));
    EXPECT_EQ(std::string::npos, fake_store::Dump().find("volatile.type"));
}

TEST_F(SaveTest, OfAnInvalidBufferEmptiesTheStore) {
    ASSERT_EQ(0, Save({Small("a")}));
    Bytes damaged = State({Small("a")});
    damaged[40] ^= 1;
    ASSERT_EQ(0, SaveBytes(damaged));
    EXPECT_EQ("", fake_store::Dump());
    ASSERT_EQ(0, Save({Small("a")}));
    ASSERT_EQ(0, DVSState_SaveBufToConfigStore(nullptr, 0));
    EXPECT_EQ("", fake_store::Dump());
}

TEST_F(SaveTest, ByIdOfAnInvalidBufferDeletesThatObjectOnly) {
    ASSERT_EQ(0, Save({Small("a"), Small("b")}));
    ASSERT_EQ(0, SaveBytes(Bytes(7), "a"));
    EXPECT_EQ(std::string::npos, fake_store::Dump().find("#a"));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#b"));
}

TEST_F(SaveTest, StopsAtTheFirstFailingSwitchAndKeepsTheStore) {
    ASSERT_EQ(0, Save({Small("a", "old"), Small("z", "old")}));
    const std::string before = fake_store::Dump();
    Switch bad = Small("b");
    bad.global.push_back({"com.orbeno.common.portset.mtu", Bytes(3)});
    EXPECT_EQ(-1, Save({Small("a", "new"), bad, Small("c")}));
    EXPECT_EQ(before, fake_store::Dump());
    EXPECT_TRUE(Said("Failed to save dvs: b to configstore\nFailed to save dvs to configstore\n"));
    EXPECT_FALSE(Said("SaveDVS: c")) << "the walk must end";
    EXPECT_EQ("CancelTransaction", fake_store::CallName(fake_store::Calls()));
    EXPECT_EQ(0u, system.back().find(
                      "End DVSState_SaveBufToConfigStore_ByInstance with error, configStore time: "));
    EXPECT_EQ(0, SwitchesInTable());
}

TEST_F(SaveTest, FailingHostOrPortPropertyFailsTheSwitchToo) {
    Switch host = Small("a");
    host.host = {{"com.orbeno.common.host.uplinkPorts", Bytes(1)}};
    EXPECT_EQ(-1, Save({host}));
    Switch port = Small("a");
    port.ports = {{"p", {{"com.orbeno.common.port.connectid", Bytes(1)}}}, {"q", {}}};
    EXPECT_EQ(-1, Save({port}));
    EXPECT_EQ("", fake_store::Dump());
}

TEST_F(SaveTest, ReportsKernelStateThatCannotBeFetched) {
    EXPECT_EQ(-1, DVSState_SaveToConfigStore());
    EXPECT_EQ(
        0u, messages.rfind("Failed to save DVS config to configstore when get DVS buffrom hyp. Error: ", 0));
    messages.clear();
    EXPECT_EQ(-1, DVSState_SaveToConfigStore_ByInstance("a"));
    EXPECT_EQ(
        0u, messages.rfind("Failed to save DVS config to configstore when get DVS buffrom hyp. Error: ", 0));
    EXPECT_EQ(0, fake_store::Calls());
}

} // namespace
