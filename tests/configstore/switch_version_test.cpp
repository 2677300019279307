/* SPDX-License-Identifier: Apache-2.0 */
// Version, beacon timeout and switch address.

#include "configstore/converters/switch_version.h"

#include "configstore/frame_fixture.h"

using namespace state_builder;

namespace {

constexpr const char *kVersion = "com.orbeno.common.version";

int32_t ReadVersion(configstore::Object *object, uint32_t *number) {
    dvs::convert::SwitchVersion version = {*number, false};
    const int32_t status = dvs::convert::ReadSwitchVersion(dvs::config::Messages(), object, &version);
    *number = version.number;
    return status;
}

struct SwitchVersion : FrameTest {};

struct VersionCase {
    const char *text;
    uint32_t number, overlayNumber;
};
constexpr VersionCase kCases[] = {
    {"6.0.0", 4, 4},   {"6.5.0", 5, 5},    {"6.6.0", 6, 6},    {"7.0.0", 7, 107},  {"7.0.2", 8, 108},
    {"7.0.3", 9, 109}, {"8.0.0", 10, 110}, {"8.0.2", 11, 111}, {"8.0.3", 12, 112}, {"OVL 1.0", 100, 100},
};

TEST_F(SwitchVersion, EveryTextHasANumberAndAnOverlayNumber) {
    for (const auto &row : kCases) {
        SCOPED_TRACE(row.text);
        MakeSwitch("etherswitch", row.text);
        uint32_t version = 0;
        ASSERT_EQ(0, configstore::SetValueBool(object, "ovl_enabled", false));
        ASSERT_EQ(0, ReadVersion(object, &version));
        EXPECT_EQ(row.number, version);
        ASSERT_EQ(0, configstore::SetValueBool(object, "ovl_enabled", true));
        ASSERT_EQ(0, ReadVersion(object, &version));
        EXPECT_EQ(row.overlayNumber, version);
        EXPECT_EQ(U32(row.overlayNumber), Find(Load(), kVersion).value);
    }
}

TEST_F(SwitchVersion, EveryNumberInTheTableSavesItsText) {
    for (const auto &row : kCases) {
        for (const uint32_t number : {row.number, row.overlayNumber}) {
            ASSERT_EQ(0, Save(kVersion, U32(number)));
            EXPECT_EQ(" {}\n/product {}\n/product/version = \"" + std::string(row.text) + "\"\n", Content());
        }
    }
}

TEST_F(SwitchVersion, Saving109Writes703) {
    ASSERT_EQ(0, Save(kVersion, U32(109)));
    EXPECT_EQ(" {}\n/product {}\n/product/version = \"7.0.3\"\n", Content());
}

TEST_F(SwitchVersion, NumbersWithoutATextCannotBeSaved) {
    for (const uint32_t number : {0u, 3u, 13u, 99u, 101u, 106u, 113u, 0xffffffffu}) {
        errors.clear();
        EXPECT_EQ(-1, Save(kVersion, U32(number))) << number;
        EXPECT_EQ("Unknow version : (null)\nSet prop: com.orbeno.common.version failed\n", errors);
    }
    EXPECT_EQ(std::string::npos, Content().find("version"));
}

TEST_F(SwitchVersion, UnknownTextFailsTheRead) {
    MakeSwitch("etherswitch", "7.0.1");
    uint32_t version = 77;
    EXPECT_EQ(-1, ReadVersion(object, &version));
    EXPECT_EQ("Unknown vds version 7.0.1\n", errors);
    EXPECT_EQ(77u, version);
    (void)Load();
    EXPECT_EQ(-1, status);
}

TEST_F(SwitchVersion, Version800WithoutOverlayFlagLoadsAs10) {
    MakeSwitch("etherswitch", "8.0.0");
    EXPECT_EQ(U32(10), Find(Load(), kVersion).value);
    EXPECT_NE(std::string::npos, messages.find("Unabled to get ovl_enabled\n"));
    EXPECT_EQ("", errors) << "the message is a trace, not an error";
}

TEST_F(SwitchVersion, ReportsAbsentFields) {
    uint32_t version = 0;
    EXPECT_EQ(6, ReadVersion(object, &version));
    Sub(object, "product");
    EXPECT_EQ(6, ReadVersion(object, &version));
    EXPECT_EQ("Failed to get product obj, rc: 6\nFailed to get version obj, rc: 6\n", errors);
}

struct SwitchSettings : FrameTest, testing::WithParamInterface<uint32_t> {
    SwitchSettings() { dvsSwitchClass = GetParam(); }
};

INSTANTIATE_TEST_SUITE_P(EveryClass, SwitchSettings, testing::Values(0u, 1u, 2u));

TEST_P(SwitchSettings, BeaconTimeoutIsASignedNumber) {
    const char *key = "com.orbeno.etherswitch.beaconTimeout";
    ASSERT_EQ(0, Save(key, U32(0xfffffff6)));
    EXPECT_EQ(" {}\n/settings {}\n/settings/beacon = -10\n", Content());
    MakeSwitch();
    EXPECT_EQ(U32(0xfffffff6), Find(Load(), key).value);
}

TEST_P(SwitchSettings, BeaconTimeoutOfAnotherTypeFailsTheLoad) {
    MakeSwitch();
    ASSERT_EQ(0, configstore::SetValueStr(Sub(object, "settings"), "beacon", "10"));
    (void)Load();
    EXPECT_EQ(4, status);
}

TEST_P(SwitchSettings, AddressIsDottedText) {
    const char *key = "com.orbeno.etherswitch.ipv4addr";
    ASSERT_EQ(0, Save(key, {255, 0, 254, 1}));
    EXPECT_EQ(" {}\n/switch_address = \"255.0.254.1\"\n", Content());
    EXPECT_EQ(Bytes({255, 0, 254, 1}), Find(Load(), key).value);
}

TEST_P(SwitchSettings, InvalidAddressFailsTheLoadWithoutItsOwnMessage) {
    for (const char *text : {"10.0.0.300", "", "fe80::1", "1.2.3", "01.2.3.4.5"}) {
        errors.clear();
        ASSERT_EQ(0, configstore::SetValueStr(object, "switch_address", text));
        (void)Load();
        EXPECT_EQ(-1, status) << text;
        EXPECT_EQ("Faild to load prop: com.orbeno.etherswitch.ipv4addr, key: switch_address, type:5 from "
                  "configstore, rc: -1\nLoad dvs props from configstore failed, props type:props\n",
                  errors);
    }
}

} // namespace
