/* SPDX-License-Identifier: Apache-2.0 */
// Saving many properties gives the same result as saving them one by one, even when a table changes in
// between.

#include "configstore/maps/prop_saver.h"

#include <cstring>
#include <vector>

#include "configstore/frame_fixture.h"

using namespace state_builder;

namespace {

struct PropSaverTest : FrameTest {
    int32_t SaveMany(const Props &props, uint32_t propClass = DVS_PROP_CLASS_GLOBAL) {
        int32_t result = 0;
        const dvs::convert::Context context = {.switchClass = dvsSwitchClass};
        dvs::config::PropSaver saver(context, dvs::config::PropSaver::For::kManyProperties);
        saver.Begin(object, propClass);
        for (const auto &prop : props) {
            result = saver.Save(prop.key.c_str(), prop.value, prop.type);
            if (result) break;
        }
        saver.End();
        return result;
    }
};

// Replaces the global table with a test table.
class OwnTable {
public:
    explicit OwnTable(std::vector<DVSProp2ConfigEntry> rows) : rows_(std::move(rows)) {
        rows_.push_back({});
        dvsConfigMaps[0] = rows_.data();
    }
    ~OwnTable() { dvsConfigMaps[0] = dvsGlobalProp2Config; }
    OwnTable(const OwnTable &) = delete;
    OwnTable &operator=(const OwnTable &) = delete;
    DVSProp2ConfigEntry &operator[](std::size_t i) { return rows_[i]; }

private:
    std::vector<DVSProp2ConfigEntry> rows_;
};

DVSProp2ConfigEntry TextRow(const char *key, const char *leaf) {
    DVSProp2ConfigEntry row = {key, {}, 1, 1, 16, 0};
    std::strcpy(row.path[0], leaf);
    return row;
}

TEST_F(PropSaverTest, FindsTheSameRowsAsAWalk) {
    for (int kind = 0; kind < 3; ++kind) {
        using enum dvs::ConverterType;
        const auto defaultType = kind == DVS_PROP_CLASS_PORT ? kPortDefault : kSwitchDefault;
        const auto *table = GetConfigMap(kind);
        dvs::config::RowIndex index(table, defaultType);
        for (int round = 0; round < 2; ++round) // the second by what came behind what in the first
            for (const auto *row = table; row->key; ++row)
                EXPECT_EQ(dvs::config::FindRow(table, row->key, defaultType), index.Find(row->key).row)
                    << row->key;
        for (const char *key : {"", "x", "com.orbeno.common.alia", "com.orbeno.common.aliass", "DEFAULT",
                                "com.orbeno.etherswitch.port.vlan "})
            EXPECT_EQ(dvs::config::FindRow(table, key, defaultType), index.Find(key).row) << key;
    }
}

TEST_F(PropSaverTest, WritesTheSameAsSingleSaves) {
    const Props props = {
        {"com.orbeno.common.port.block", Text("true")},        {"com.orbeno.common.port.connectid", U32(5)},
        {"com.orbeno.etherswitch.port.vlan", Bytes(8)},        {"com.orbeno.vswitch.port.priority", U32(1)},
        {"com.orbeno.common.port.shaper.input", Bytes(24, 1)}, {"own", Text("v")},
        {"com.orbeno.etherswitch.port.ipfix", Text("enabled")}};
    ASSERT_EQ(0, SaveMany(props, DVS_PROP_CLASS_PORT));
    const std::string many = Content();
    configstore::DestroyObject(object);
    ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "sw", "{}", &object));
    for (const auto &prop : props)
        ASSERT_EQ(0, Save(prop.key, prop.value, DVS_PROP_CLASS_PORT, prop.type));
    EXPECT_EQ(many, Content());
}

TEST_F(PropSaverTest, FailsLikeSingleSaves) {
    EXPECT_EQ(-1, SaveMany({{"com.orbeno.common.portset.mtu", Bytes(3)}}));
    EXPECT_EQ("Set prop: com.orbeno.common.portset.mtu failed\n", errors);
    errors.clear();
    configstore::Object *settings = Sub(object, "settings");
    (void)settings;
    ASSERT_EQ(0, configstore::DeleteSubObject(object, "settings", ""));
    ASSERT_EQ(0, configstore::SetValueInt(object, "settings", 1));
    EXPECT_EQ(4, SaveMany({{"com.orbeno.common.portset.mtu", U32(3)}}));
    EXPECT_EQ("GetOrCreateSubObject for prop: settings failed, failure code: 4\n"
              "Failed to get/create sub object for dvs prop:com.orbeno.common.portset.mtu stop and return\n"
              "Set prop: com.orbeno.common.portset.mtu failed\n",
              errors);
    OwnTable table({TextRow("only", "leaf")});
    errors.clear();
    EXPECT_EQ(-1, SaveMany({{"other", Text("x")}}));
    EXPECT_EQ("Unknow prop: other\nSet prop: other failed\n", errors);
}

TEST_F(PropSaverTest, SaverUsesTheTableOfItsCreation) {
    char key[] = "com.example.one";
    OwnTable table(
        {TextRow("com.example.zero", "zero"), TextRow(key, "one"), TextRow("com.example.two", "two")});
    ASSERT_EQ(0, SaveMany({{"com.example.one", Text("1")}}));
    std::strcpy(key, "com.example.new"); // in place
    EXPECT_EQ(-1, SaveMany({{"com.example.one", Text("2")}}));
    ASSERT_EQ(0, SaveMany({{"com.example.new", Text("3")}}));
    table[0].key = "com.example.two"; // an earlier row of a later key
    ASSERT_EQ(0, SaveMany({{"com.example.two", Text("4")}}));
    table[2] = dvsGlobalProp2Config[28]; // a DEFAULT row
    ASSERT_EQ(0, SaveMany({{"unknown", Text("5")}}));
    EXPECT_EQ(" {}\n/one = \"3\"\n/zero = \"4\"\n/data {}\n/data/vendor_specific_config[unknown] {}\n"
              "/data/vendor_specific_config[unknown]/value = \"5\"\n",
              Content());
    table[0].key = nullptr; // the end
    EXPECT_EQ(-1, SaveMany({{"com.example.two", Text("6")}}));
}

TEST_F(PropSaverTest, WalksATableTooLargeForItsIndex) {
    std::vector<std::string> keys;
    for (int i = 0; i < 200; ++i)
        keys.push_back("com.example.key" + std::to_string(i));
    std::vector<DVSProp2ConfigEntry> rows;
    for (const auto &key : keys)
        rows.push_back(TextRow(key.c_str(), ("leaf" + key.substr(15)).c_str()));
    const std::string longKey(100, 'k');
    {
        OwnTable table(rows);
        ASSERT_EQ(0, SaveMany({{keys[199], Text("last")}}));
        EXPECT_EQ(" {}\n/leaf199 = \"last\"\n", Content());
        EXPECT_EQ(-1, SaveMany({{"unknown", Text("x")}}));
    }
    OwnTable table({TextRow(longKey.c_str(), "long")});
    EXPECT_EQ(0, SaveMany({{longKey, Text("x")}}));
}

TEST_F(PropSaverTest, DoesNotCacheASubObjectThatARowMayReplace) {
    DVSProp2ConfigEntry below = {"below", {"sub", "leaf"}, 2, 1, 16, 0};
    DVSProp2ConfigEntry list = {"list", {"sub"}, 1, 20, 16, 0};
    OwnTable table({below, list});
    // An absent sub-object first: a cached pointer would then be used as a list.
    EXPECT_EQ(4, SaveMany({{"below", Text("1")}, {"list", U32(1) + Slot("x", 81)}, {"below", Text("2")}}));
    ASSERT_EQ(0, configstore::DeleteSubObject(object, "sub", ""));
    EXPECT_EQ(4, SaveMany({{"list", U32(1) + Slot("x", 81)}, {"below", Text("2")}}));
}

TEST_F(PropSaverTest, AddsItsTimeToTheCounter) {
    dvsConfigStoreTimeMs = 5;
    ASSERT_EQ(0, SaveMany({{"com.orbeno.common.alias", Text("x")}}));
    EXPECT_GE(dvsConfigStoreTimeMs, 5);
}

} // namespace
