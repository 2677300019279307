/* SPDX-License-Identifier: Apache-2.0 */
// The frame around the converters: the choice of a key's row, the walk of its path, and the messages on
// failure.

#include "configstore/maps/prop_frame.h"

#include <cstdio>
#include <cstring>
#include <utility>
#include <vector>

#include "configstore/frame_fixture.h"

using namespace state_builder;

namespace {

struct PropFrame : FrameTest {};

// The tables are writable; a test that writes to one restores it.
class RowChange {
public:
    RowChange(DVSProp2ConfigEntry *row, const DVSProp2ConfigEntry &changed) : row_(row), was_(*row) {
        *row = changed;
    }
    ~RowChange() { *row_ = was_; }
    RowChange(const RowChange &) = delete;
    RowChange &operator=(const RowChange &) = delete;

private:
    DVSProp2ConfigEntry *row_;
    DVSProp2ConfigEntry was_;
};

DVSProp2ConfigEntry WithKey(DVSProp2ConfigEntry row, const char *key) {
    row.key = key;
    return row;
}
DVSProp2ConfigEntry WithType(DVSProp2ConfigEntry row, uint32_t type) {
    row.converterType = type;
    return row;
}

TEST_F(PropFrame, SavesAnUnknownGlobalKeyThroughTheDefaultRow) {
    ASSERT_EQ(0, Save("com.orbeno.extraconfig.some", Text("v")));
    EXPECT_EQ(" {}\n/data {}\n/data/extra_config[com.orbeno.extraconfig.some] {}\n"
              "/data/extra_config[com.orbeno.extraconfig.some]/value = \"v\"\n",
              Content());
    EXPECT_NE(std::string::npos, messages.find("Compare com.orbeno.extraconfig.some : DEFAULT success\n"));
}

TEST_F(PropFrame, SavesAnUnknownPortKeyThroughThePortDefaultRow) {
    ASSERT_EQ(0, Save("com.orbeno.port.own", Text("v"), DVS_PROP_CLASS_PORT));
    EXPECT_EQ(" {}\n/data {}\n/data/vendor_specific_data[com.orbeno.port.own] {}\n"
              "/data/vendor_specific_data[com.orbeno.port.own]/value = \"v\"\n",
              Content());
}

TEST_F(PropFrame, TreatsUnknownClassesAsGlobal) {
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n"), 7));
    EXPECT_EQ(" {}\n/name = \"n\"\n", Content());
}

TEST_F(PropFrame, LoadsUnknownClassesFromTheGlobalTable) {
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    for (const uint32_t propClass : {3u, 7u, 0xffffffffu}) {
        EXPECT_EQ(Props({{"com.orbeno.common.alias", Text("n"), 0x10}}), Load(propClass)) << propClass;
        EXPECT_EQ(0, status);
    }
}

TEST_F(PropFrame, TreatsANullValueOfAnyLengthAsEmpty) {
    EXPECT_EQ(0, SaveProp(object, "com.orbeno.common.alias", nullptr, 5, DVS_PROP_CLASS_GLOBAL, 0x10));
    EXPECT_EQ(" {}\n/name = \"\"\n", Content());
    EXPECT_EQ(-1, SaveProp(object, "com.orbeno.common.portset.mtu", nullptr, 4, DVS_PROP_CLASS_GLOBAL, 0x10));
}

TEST_F(PropFrame, KeepsKeysOfOtherClassesSeparate) {
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n"), DVS_PROP_CLASS_HOST));
    EXPECT_NE(std::string::npos, Content().find("/data/vendor_specific_host_member_config"));
}

TEST_F(PropFrame, LoadsTheRepeatedMulticastFilterRowIntoOneProperty) {
    ASSERT_EQ(0, Save("com.orbeno.etherswitch.multicastFilter", Text("snooping")));
    EXPECT_EQ(" {}\n/settings {}\n/settings/multicast_filtering_mode = \"snooping\"\n", Content());
    MakeSwitch();
    const Props expected = {Version(), {"com.orbeno.etherswitch.multicastFilter", Text("snooping"), 0x10}};
    EXPECT_EQ(expected, Load()) << messages;
}

TEST_F(PropFrame, CreatesEveryLevelOfADeepRow) {
    ASSERT_EQ(0, Save("com.orbeno.vswitch.port.priority", U32(5), DVS_PROP_CLASS_PORT));
    EXPECT_EQ(" {}\n/settings {}\n/settings/vlan {}\n/settings/vlan/priority = 5\n", Content());
}

TEST_F(PropFrame, SkipsADeepRowWhosePathIsAbsent) {
    Sub(object, "settings");
    EXPECT_EQ(Props{}, Load(DVS_PROP_CLASS_PORT));
    EXPECT_EQ(0, status);
    EXPECT_EQ(" {}\n/settings {}\n", Content()) << "a load creates nothing";
}

TEST_F(PropFrame, RejectsTheUnassignedTypeInBothDirections) {
    const RowChange change(&dvsGlobalProp2Config[0], WithType(dvsGlobalProp2Config[0], 30));
    EXPECT_EQ(-1, Save("com.orbeno.common.alias", Text("n")));
    EXPECT_EQ("Unknow prop type: 30\nSet prop: com.orbeno.common.alias failed\n", errors);
    errors.clear();
    (void)Load();
    EXPECT_EQ(-1, status);
    EXPECT_EQ("Faild to load prop: com.orbeno.common.alias, key: name, type:30 from configstore, rc: -1\n"
              "Load dvs props from configstore failed, props type:props\n",
              errors);
}

TEST_F(PropFrame, RejectsATypeAfterTheLast) {
    const RowChange change(&dvsGlobalProp2Config[0], WithType(dvsGlobalProp2Config[0], 37));
    EXPECT_EQ(-1, Save("com.orbeno.common.alias", Text("n")));
    EXPECT_EQ("Unknow prop type: 37\nSet prop: com.orbeno.common.alias failed\n", errors);
}

TEST_F(PropFrame, RebuildsEveryPropertyWithTheRowsType) {
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n"), DVS_PROP_CLASS_GLOBAL, 0x20));
    ASSERT_EQ(0, Save("com.orbeno.common.resv.threshold", U32(1), DVS_PROP_CLASS_GLOBAL, 0x08));
    for (const auto &prop : Load())
        EXPECT_EQ(0x10u, prop.type) << prop.key;
}

// --- The tables may change under the lookup. ---

TEST_F(PropFrame, LoadsTablesOfAnyLength) {
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    ASSERT_EQ(0, Save("com.orbeno.common.resv.threshold", U32(7)));
    // Rows through more sub-objects than exist, and two rows at the end that match.
    std::vector<DVSProp2ConfigEntry> table(60, dvsGlobalProp2Config[26]);
    for (std::size_t i = 0; i < table.size(); ++i)
        std::snprintf(table[i].path[0], sizeof table[i].path[0], "absent%zu", i % 10);
    table.push_back(dvsGlobalProp2Config[26]);
    table.push_back(dvsGlobalProp2Config[0]);
    table.push_back({});
    DVSProp2ConfigEntry *const usual = std::exchange(dvsConfigMaps[DVS_PROP_CLASS_GLOBAL], table.data());
    const Props loaded = Load();
    dvsConfigMaps[DVS_PROP_CLASS_GLOBAL] = usual;
    const Props expected = {{"com.orbeno.common.resv.threshold", U32(7), 0x10},
                            {"com.orbeno.common.alias", Text("n"), 0x10}};
    EXPECT_EQ(expected, loaded) << messages;
}

TEST_F(PropFrame, DetectsAChangedKey) {
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    const RowChange change(&dvsGlobalProp2Config[0], WithKey(dvsGlobalProp2Config[0], "com.example.new"));
    ASSERT_EQ(0, Save("com.example.new", Text("m")));
    EXPECT_EQ(" {}\n/name = \"m\"\n", Content());
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    EXPECT_NE(std::string::npos, Content().find("/data/vendor_specific_config[com.orbeno.common.alias]"));
}

TEST_F(PropFrame, DetectsAKeyRewrittenInPlace) {
    char key[] = "com.example.one";
    const RowChange change(&dvsGlobalProp2Config[0], WithKey(dvsGlobalProp2Config[0], key));
    ASSERT_EQ(0, Save("com.example.one", Text("1")));
    std::strcpy(key, "com.example.two");
    ASSERT_EQ(0, Save("com.example.two", Text("2")));
    EXPECT_EQ(" {}\n/name = \"2\"\n", Content());
}

TEST_F(PropFrame, DetectsAnEarlierRowOfTheSameKey) {
    ASSERT_EQ(0, Save("com.orbeno.common.resv.threshold", U32(7)));
    const RowChange change(&dvsGlobalProp2Config[0],
                           WithKey(dvsGlobalProp2Config[0], "com.orbeno.common.resv.threshold"));
    ASSERT_EQ(0, Save("com.orbeno.common.resv.threshold", Text("x")));
    EXPECT_NE(std::string::npos, Content().find("/name = \"x\"\n"));
}

TEST_F(PropFrame, DetectsAnEarlierDefaultRow) {
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    const RowChange change(&dvsGlobalProp2Config[0], dvsGlobalProp2Config[28]);
    ASSERT_EQ(0, Save("com.orbeno.common.resv.threshold", Text("x")));
    EXPECT_NE(std::string::npos, Content().find("[com.orbeno.common.resv.threshold]/value = \"x\"\n"));
}

TEST_F(PropFrame, DetectsAnEarlierEndRow) {
    ASSERT_EQ(0, Save("com.orbeno.common.resv.threshold", U32(7)));
    const RowChange change(&dvsGlobalProp2Config[0], dvsGlobalProp2Config[29]);
    EXPECT_EQ(-1, Save("com.orbeno.common.resv.threshold", U32(7)));
    EXPECT_EQ("Unknow prop: com.orbeno.common.resv.threshold\n"
              "Set prop: com.orbeno.common.resv.threshold failed\n",
              errors);
}

TEST_F(PropFrame, DetectsAnotherTableOfAClass) {
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    DVSProp2ConfigEntry table[2] = {{"com.example.only", {"only"}, 1, 1, 16, 0}, {}};
    dvsConfigMaps[0] = table;
    EXPECT_EQ(0, Save("com.example.only", Text("o")));
    EXPECT_EQ(-1, Save("com.orbeno.common.alias", Text("n"))) << "a table without a DEFAULT row";
    EXPECT_EQ(Props({{"com.example.only", Text("o"), 0x10}}), Load());
    dvsConfigMaps[0] = dvsGlobalProp2Config;
}

TEST_F(PropFrame, StaysInsideARowWhoseDepthIsTooLarge) {
    auto row = dvsGlobalProp2Config[0];
    row.depth = 0xffffffff;
    const RowChange change(&dvsGlobalProp2Config[0], row);
    EXPECT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    EXPECT_EQ(" {}\n/name {}\n/name/ {}\n/name// {}\n/name/// {}\n/name//// = \"n\"\n", Content());
    (void)Load();
    EXPECT_EQ(0, status);
}

TEST_F(PropFrame, UsesTheFirstNameOfARowWithoutDepth) {
    auto row = dvsGlobalProp2Config[0];
    row.depth = 0;
    const RowChange change(&dvsGlobalProp2Config[0], row);
    EXPECT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    EXPECT_EQ(" {}\n/name = \"n\"\n", Content());
}

// --- Sub-objects. ---

TEST_F(PropFrame, GetOrCreateFindsWithoutCreating) {
    configstore::Object *made = Sub(object, "sub");
    configstore::Object *found = nullptr;
    EXPECT_EQ(0, GetOrCreateSubObject(false, object, "sub", nullptr, &found));
    EXPECT_EQ(made, found);
    EXPECT_EQ(6, GetOrCreateSubObject(false, object, "other", nullptr, &found));
    EXPECT_EQ(nullptr, found);
    EXPECT_EQ("", errors);
}

TEST_F(PropFrame, GetOrCreateReportsFailures) {
    configstore::Object *found = object;
    fake_store::FailFunction("GetSubObject", configstore::IO_ERROR);
    EXPECT_EQ(8, GetOrCreateSubObject(true, object, "sub", nullptr, &found));
    EXPECT_EQ(nullptr, found);
    EXPECT_EQ("GetOrCreateSubObject for prop: sub failed, failure code: 8\n", errors);
    errors.clear();
    fake_store::FailFunction("CreateSubObject", configstore::NO_MEMORY);
    EXPECT_EQ(9, GetOrCreateSubObject(true, object, "sub", "id", &found));
    EXPECT_EQ("Create sub object for key: sub failed\n", errors);
    fake_store::FailFunction(nullptr);
}

TEST_F(PropFrame, PathWalkEndsAtTheLeafsParent) {
    const char path[3][128] = {"a", "b", "leaf"};
    configstore::Object *end = nullptr;
    EXPECT_EQ(6, GetSubObjectByPath(path, 3, object, &end, false));
    EXPECT_EQ(" {}\n", Content());
    ASSERT_EQ(0, GetSubObjectByPath(path, 3, object, &end, true));
    EXPECT_EQ(Sub(Sub(object, "a"), "b"), end);
    EXPECT_EQ(" {}\n/a {}\n/a/b {}\n", Content());
    EXPECT_EQ(0, GetSubObjectByPath(path, 1, object, &end, true));
    EXPECT_EQ(object, end);
    EXPECT_EQ(0, GetSubObjectByPath(path, 0, object, &end, true));
    EXPECT_EQ(object, end);
}

// --- Failures. ---

TEST_F(PropFrame, SaveReportsAPathThatFails) {
    ASSERT_EQ(0, configstore::SetValueInt(object, "settings", 1));
    EXPECT_EQ(4, Save("com.orbeno.common.portset.mtu", U32(1500)));
    EXPECT_EQ("GetOrCreateSubObject for prop: settings failed, failure code: 4\n"
              "Failed to get/create sub object for dvs prop:com.orbeno.common.portset.mtu stop and return\n"
              "Set prop: com.orbeno.common.portset.mtu failed\n",
              errors);
}

TEST_F(PropFrame, SaveReportsAConverterThatFails) {
    fake_store::FailFunction("SetValueStr", configstore::IO_ERROR);
    EXPECT_EQ(8, Save("com.orbeno.common.alias", Text("n")));
    EXPECT_EQ("Set prop: com.orbeno.common.alias failed\n", errors);
    fake_store::FailFunction(nullptr);
}

TEST_F(PropFrame, LoadEndsAtAPathThatFailsWithoutNamingTheRow) {
    ASSERT_EQ(0, configstore::SetValueInt(object, "product", 1));
    EXPECT_EQ(Props{}, Load());
    EXPECT_EQ(4, status);
    EXPECT_EQ("GetOrCreateSubObject for prop: product failed, failure code: 4\n"
              "Load dvs props from configstore failed, props type:props\n",
              errors);
}

TEST_F(PropFrame, LoadEndsAtAFieldOfAnotherType) {
    ASSERT_EQ(0, Save("com.orbeno.common.opaqueDvs", Text("true")));
    ASSERT_EQ(0, configstore::SetValueInt(object, "name", 1));
    EXPECT_EQ(Props{}, Load());
    EXPECT_EQ(4, status);
    EXPECT_EQ("Faild to load prop: com.orbeno.common.alias, key: name, type:1 from configstore, rc: 4\n"
              "Load dvs props from configstore failed, props type:props\n",
              errors);
}

TEST_F(PropFrame, LoadTreatsAConvertersNotFoundAsAFailure) {
    // The policy's object exists, its mode does not.
    configstore::Object *policy = Sub(Sub(object, "settings"), "lacp_policy");
    ASSERT_EQ(0, configstore::SetValueBool(policy, "enabled", true));
    EXPECT_EQ(Props{}, Load(DVS_PROP_CLASS_PORT));
    EXPECT_EQ(6, status);
}

TEST_F(PropFrame, PrintsNothingBelowItsLevels) {
    dvsconfigstore_debug = 0;
    ASSERT_EQ(0, Save("com.orbeno.common.alias", Text("n")));
    (void)Load();
    EXPECT_EQ("", messages);
    dvsconfigstore_debug = -1;
    EXPECT_EQ(-1, Save("com.orbeno.common.resv.threshold", {}));
    EXPECT_EQ("", messages);
    dvsconfigstore_debug = 10;
}

TEST_F(PropFrame, EveryFailingStoreCallFailsTheSaveWithItsStatus) {
    int call = 1;
    for (;; ++call) {
        fake_store::FailCall(call, configstore::IO_ERROR);
        const int32_t result = Save("com.orbeno.common.port.shaper.input", Bytes(24, 1), DVS_PROP_CLASS_PORT);
        if (!fake_store::Failed()) break;
        EXPECT_EQ(8, result) << fake_store::CallName(fake_store::Calls());
    }
    EXPECT_GT(call, 6);
}

// --- Traffic resources of ports. ---

TEST_F(PropFrame, LoadsTheSwitchsTrafficResourcesIntoPorts) {
    configstore::Object *resources = nullptr;
    ASSERT_EQ(0, configstore::CreateObject("k", "g", "c", "i", "{}", &resources));
    Sub(Sub(resources, "traffic_resources", "pool"), "allocation");
    const Props props = Load(DVS_PROP_CLASS_PORT, resources);
    ASSERT_EQ(1u, props.size());
    EXPECT_EQ("com.orbeno.common.port.respools.cfg", props[0].key);
    EXPECT_EQ(0x10u, props[0].type);
    EXPECT_EQ(4u + 212u, props[0].value.size());
    EXPECT_EQ(Props{}, Load(DVS_PROP_CLASS_PORT)) << "without the switch's object";
    EXPECT_EQ(Props{}, Load(DVS_PROP_CLASS_GLOBAL, resources)) << "for ports only";
    configstore::DestroyObject(resources);
}

TEST_F(PropFrame, FailsWithTheTrafficResources) {
    configstore::Object *resources = nullptr;
    ASSERT_EQ(0, configstore::CreateObject("k", "g", "c", "i", "{}", &resources));
    Sub(resources, "traffic_resources", "pool");
    fake_store::FailFunction("CreateFilterSpecObject", configstore::NO_MEMORY);
    EXPECT_EQ(Props{}, Load(DVS_PROP_CLASS_PORT, resources));
    EXPECT_EQ(9, status);
    fake_store::FailFunction(nullptr);
    configstore::DestroyObject(resources);
}

} // namespace
