/* SPDX-License-Identifier: Apache-2.0 */
// Converters of the DEFAULT rows: the list that keeps a property without a row, and which of them load again.

#include "configstore/frame_fixture.h"

using namespace state_builder;

namespace {

constexpr uint32_t kGlobal = DVS_PROP_CLASS_GLOBAL;
constexpr uint32_t kHost = DVS_PROP_CLASS_HOST;
constexpr uint32_t kPort = DVS_PROP_CLASS_PORT;

struct Case {
    const char *key;
    uint32_t type;
    const char *stored; // after "/data/"
};

struct Unmapped : FrameTest, testing::WithParamInterface<uint32_t> {
    Unmapped() { dvsSwitchClass = GetParam(); }
    void ExpectStored(const Case &row, uint32_t propClass) {
        SCOPED_TRACE(row.key);
        ASSERT_EQ(0, Save(row.key, Text("val"), propClass, row.type));
        EXPECT_EQ(" {}\n/data {}\n" + std::string(row.stored), Content());
        ASSERT_EQ(0, configstore::DeleteSubObject(object, "data", ""));
    }
};

INSTANTIATE_TEST_SUITE_P(EveryClass, Unmapped, testing::Values(0u, 1u, 2u));

TEST_P(Unmapped, GlobalRulesApplyInTheirOrder) {
    ExpectStored({"k", 0x20,
                  "/data/other_data[k] {}\n/data/other_data[k]/opaque_data = bytes \"val\\x00\"\n"
                  "/data/other_data[k]/prop_type = 32\n/data/other_data[k]/dvs_config_type = 0\n"},
                 kGlobal);
    ExpectStored(
        {"k", 0x10, "/data/vendor_specific_config[k] {}\n/data/vendor_specific_config[k]/value = \"val\"\n"},
        kGlobal);
    ExpectStored({"x.com.orbeno.extraconfig.y", 0x10,
                  "/data/extra_config[x.com.orbeno.extraconfig.y] {}\n"
                  "/data/extra_config[x.com.orbeno.extraconfig.y]/value = \"val\"\n"},
                 kGlobal);
    ExpectStored({"com.orbeno.extraconfig.z", 0,
                  "/data/extra_config[com.orbeno.extraconfig.z] {}\n"
                  "/data/extra_config[com.orbeno.extraconfig.z]/value = \"val\"\n"},
                 kGlobal);
    ExpectStored({"com.orbeno.extraconfig.z", 0x18,
                  "/data/dvs_opaque_data[generated-1] {}\n"
                  "/data/dvs_opaque_data[generated-1]/key = \"com.orbeno.extraconfig.z\"\n"
                  "/data/dvs_opaque_data[generated-1]/opaque_data = bytes \"val\\x00\"\n"},
                 kGlobal);
    ExpectStored({"k", 0x08,
                  "/data/dvs_opaque_data[generated-2] {}\n/data/dvs_opaque_data[generated-2]/key = \"k\"\n"
                  "/data/dvs_opaque_data[generated-2]/opaque_data = bytes \"val\\x00\"\n"},
                 kGlobal);
}

TEST_P(Unmapped, HostRulesApplyInTheirOrder) {
    ExpectStored({"k", 0x18,
                  "/data/host_opaque_data[k] {}\n/data/host_opaque_data[k]/key = \"k\"\n"
                  "/data/host_opaque_data[k]/opaque_data = bytes \"val\\x00\"\n"},
                 kHost);
    const std::string list = "/data/vendor_specific_host_member_config";
    const std::string vendor = list + "[k] {}\n" + list + "[k]/value = \"val\"\n";
    ExpectStored({"k", 0x10, vendor.c_str()}, kHost);
    ExpectStored({"com.orbeno.extraconfig.z", 0x20,
                  "/data/other_data[com.orbeno.extraconfig.z] {}\n"
                  "/data/other_data[com.orbeno.extraconfig.z]/opaque_data = bytes \"val\\x00\"\n"
                  "/data/other_data[com.orbeno.extraconfig.z]/prop_type = 32\n"
                  "/data/other_data[com.orbeno.extraconfig.z]/dvs_config_type = 1\n"},
                 kHost);
}

TEST_P(Unmapped, PortRulesApplyInTheirOrder) {
    for (const uint32_t type : {0u, 0x08u, 0x10u, 0x18u, 0x20u}) {
        ExpectStored({"a.ruleset", type,
                      "/data/ruleset_data[a.ruleset] {}\n"
                      "/data/ruleset_data[a.ruleset]/opaque_data = bytes \"val\\x00\"\n"},
                     kPort);
    }
    ExpectStored({".ruleset", 0,
                  "/data/ruleset_data[.ruleset] {}\n/data/ruleset_data[.ruleset]/opaque_data = bytes "
                  "\"val\\x00\"\n"},
                 kPort);
    ExpectStored(
        {"k", 0x18, "/data/opaque_data[k] {}\n/data/opaque_data[k]/opaque_data = bytes \"val\\x00\"\n"},
        kPort);
    ExpectStored(
        {"k", 0x10, "/data/vendor_specific_data[k] {}\n/data/vendor_specific_data[k]/value = \"val\"\n"},
        kPort);
    ExpectStored({"com.orbeno.port.extraConfig", 0x08,
                  "/data/extra_config[com.orbeno.port.extraConfig] {}\n"
                  "/data/extra_config[com.orbeno.port.extraConfig]/value = \"val\"\n"},
                 kPort);
    ExpectStored({"com.orbeno.port.extraConfi", 0x08,
                  "/data/other_data[com.orbeno.port.extraConfi] {}\n"
                  "/data/other_data[com.orbeno.port.extraConfi]/opaque_data = bytes \"val\\x00\"\n"
                  "/data/other_data[com.orbeno.port.extraConfi]/prop_type = 8\n"},
                 kPort);
}

TEST_P(Unmapped, GlobalPropertiesLoadInListOrder) {
    const Props saved = {{"other", Bytes{1, 0, 2}, 0x24},
                         {"com.orbeno.extraconfig.e", Text("extra"), 0x10},
                         {"opaque", Bytes{0, 1}, 0x18},
                         {"vendor", Text("v"), 0x10}};
    for (const auto &prop : saved)
        ASSERT_EQ(0, Save(prop.key, prop.value, kGlobal, prop.type));
    EXPECT_EQ(Props({saved[3], saved[2], saved[1], saved[0]}), Load());
}

TEST_P(Unmapped, HostPropertiesLoadInListOrder) {
    const Props saved = {
        {"other", Bytes{1, 0, 2}, 0x24}, {"opaque", Bytes{0, 1}, 0x18}, {"vendor", Text("v"), 0x10}};
    for (const auto &prop : saved)
        ASSERT_EQ(0, Save(prop.key, prop.value, kHost, prop.type));
    EXPECT_EQ(Props({saved[2], saved[1], saved[0]}), Load(kHost));
}

TEST_P(Unmapped, OtherDataLoadsIntoItsClassOnly) {
    ASSERT_EQ(0, Save("g", Bytes{1}, kGlobal, 0x20));
    ASSERT_EQ(0, Save("h", Bytes{2}, kHost, 0x40));
    EXPECT_EQ(Props({{"g", {1}, 0x20}}), Load(kGlobal));
    EXPECT_EQ(Props({{"h", {2}, 0x40}}), Load(kHost));
}

TEST_P(Unmapped, PortPropertiesLoadInListOrderExceptOtherData) {
    const Props saved = {{"vendor", Text("v"), 0x10},
                         {"com.orbeno.port.extraConfig.e", Text("extra"), 0x08},
                         {"opaque", Bytes{0, 1}, 0x18},
                         {"x.ruleset", Bytes{9, 0, 9}, 0x10},
                         {"other", Bytes{5}, 0x20}};
    for (const auto &prop : saved)
        ASSERT_EQ(0, Save(prop.key, prop.value, kPort, prop.type));
    Props expected = {saved[3], saved[2], saved[1], saved[0]};
    expected[2].type = 0x10;
    EXPECT_EQ(expected, Load(kPort));
}

TEST_P(Unmapped, PortPropertyOfTypeZeroIsSavedButNotLoaded) {
    ASSERT_EQ(0, Save("plain", Bytes{5}, kPort, 0));
    EXPECT_NE(std::string::npos, Content().find("/data/other_data[plain]/prop_type = 0\n"));
    EXPECT_EQ(Props{}, Load(kPort));
    EXPECT_EQ(0, status);
}

TEST_P(Unmapped, EmptyValuesAreKept) {
    ASSERT_EQ(0, Save("vendor", {}, kGlobal, 0x10));
    ASSERT_EQ(0, Save("opaque", {}, kGlobal, 0x18));
    EXPECT_EQ(Props({{"vendor", Text(""), 0x10}, {"opaque", {}, 0x18}}), Load());
}

struct UnmappedFaults : FrameTest {};

TEST_F(UnmappedFaults, SwitchLoadSkipsUnreadableEntries) {
    configstore::Object *data = Sub(object, "data");
    Sub(data, "vendor_specific_config", "without value");
    ASSERT_EQ(0, Save("vendor", Text("v"), kGlobal, 0x10));
    ASSERT_EQ(0, configstore::SetValueInt(data, "extra_config", 1));
    Sub(data, "other_data", "without type");
    EXPECT_EQ(Props({{"vendor", Text("v"), 0x10}}), Load());
    EXPECT_EQ(0, status);
}

TEST_F(UnmappedFaults, PortLoadFailsAtUnreadableEntries) {
    Sub(Sub(object, "data"), "vendor_specific_data", "without value");
    (void)Load(kPort);
    EXPECT_EQ(6, status);
}

TEST_F(UnmappedFaults, PortLoadFailsWithTheListing) {
    Sub(object, "data");
    fake_store::FailFunction("GetSubObjectInstances", configstore::IO_ERROR);
    (void)Load(kPort);
    EXPECT_EQ(8, status);
    fake_store::FailFunction(nullptr);
}

TEST_F(UnmappedFaults, LoadFailsWhereDataIsNotAnObject) {
    ASSERT_EQ(0, configstore::SetValueInt(object, "data", 1));
    for (const uint32_t propClass : {kGlobal, kHost, kPort}) {
        (void)Load(propClass);
        EXPECT_EQ(4, status);
    }
}

TEST_F(UnmappedFaults, FailedIdGenerationIsIgnoredForGlobalsAndFailsHosts) {
    fake_store::FailFunction("GenerateInstanceId", configstore::IO_ERROR);
    EXPECT_EQ(0, Save("opaque", Bytes{1}, kGlobal, 0x18));
    EXPECT_EQ(" {}\n/data {}\n/data/dvs_opaque_data {}\n/data/dvs_opaque_data/key = \"opaque\"\n"
              "/data/dvs_opaque_data/opaque_data = bytes \"\\x01\"\n",
              Content());
    EXPECT_EQ(8, Save("opaque", Bytes{1}, kHost, 0x18));
    fake_store::FailFunction(nullptr);
}

TEST_F(UnmappedFaults, EveryFailingStoreCallOfASaveIsReturned) {
    const std::tuple<const char *, uint32_t, uint32_t> rows[] = {
        {"k", kGlobal, 0x20}, {"k", kGlobal, 0x10}, {"k", kHost, 0x08}, {"k", kHost, 0x20},
        {"k", kPort, 0x18},   {"k", kPort, 0x10},   {"k", kPort, 0},    {"k.ruleset", kPort, 0}};
    for (const auto &[key, propClass, type] : rows) {
        for (int call = 1;; ++call) {
            (void)configstore::DeleteSubObject(object, "data", "");
            fake_store::FailCall(call, configstore::IO_ERROR);
            const int32_t result = Save(key, Text("v"), propClass, type);
            if (!fake_store::Failed()) break;
            EXPECT_EQ(8, result) << key << " " << propClass << " "
                                 << fake_store::CallName(fake_store::Calls());
        }
    }
}

} // namespace
