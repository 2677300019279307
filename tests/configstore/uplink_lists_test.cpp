/* SPDX-License-Identifier: Apache-2.0 */
// Converters of the uplink lists between slots and a list of strings.

#include "configstore/frame_fixture.h"

using namespace state_builder;

namespace {

constexpr const char *kKeys = "com.orbeno.common.host.uplinkPorts";
constexpr const char *kNames = "com.orbeno.common.uplinkPorts";
constexpr uint32_t kHost = DVS_PROP_CLASS_HOST;

struct UplinkLists : FrameTest, testing::WithParamInterface<uint32_t> {
    UplinkLists() { dvsSwitchClass = GetParam(); }
};

INSTANTIATE_TEST_SUITE_P(EveryClass, UplinkLists, testing::Values(0u, 1u, 2u));

TEST_P(UplinkLists, KeysRoundTripAsAListOfStrings) {
    const Bytes value = U32(2) + Slot("port-1", 48) + Slot("port-22", 48);
    ASSERT_EQ(0, Save(kKeys, value, kHost));
    EXPECT_EQ(" {}\n/uplink_port_keys[] = \"port-1\"\n/uplink_port_keys[] = \"port-22\"\n", Content());
    EXPECT_EQ(Props({{kKeys, value, 0x10}}), Load(kHost));
}

TEST_P(UplinkLists, NamesRoundTripAsAListOfStrings) {
    const Bytes value = U32(2) + Slot("uplink1", 81) + Slot(std::string(80, 'n'), 81);
    ASSERT_EQ(0, Save(kNames, value));
    EXPECT_EQ(" {}\n/uplink_port_names[] = \"uplink1\"\n/uplink_port_names[] = \"" + std::string(80, 'n') +
                  "\"\n",
              Content());
    EXPECT_EQ(Props({{kNames, value, 0x10}}), Load());
}

TEST_P(UplinkLists, ReplaceAnEarlierList) {
    ASSERT_EQ(0, Save(kKeys, U32(1) + Slot("old", 48), kHost));
    ASSERT_EQ(0, Save(kKeys, U32(1) + Slot("new", 48), kHost));
    EXPECT_EQ(" {}\n/uplink_port_keys[] = \"new\"\n", Content());
}

TEST_P(UplinkLists, NoKeysAreSavedAsAnEmptyListAndLoadNoProperty) {
    ASSERT_EQ(0, Save(kKeys, U32(1) + Slot("old", 48), kHost));
    ASSERT_EQ(0, Save(kKeys, U32(0), kHost));
    EXPECT_EQ(" {}\n/uplink_port_keys = []\n", Content());
    EXPECT_EQ(Props{}, Load(kHost));
    EXPECT_EQ(0, status);
}

TEST_P(UplinkLists, NoNamesAreNotSavedAndKeepTheOldList) {
    ASSERT_EQ(0, Save(kNames, U32(0)));
    EXPECT_EQ(" {}\n", Content());
    ASSERT_EQ(0, Save(kNames, U32(1) + Slot("old", 81)));
    ASSERT_EQ(0, Save(kNames, U32(0)));
    EXPECT_EQ(" {}\n/uplink_port_names[] = \"old\"\n", Content());
}

TEST_P(UplinkLists, RejectACountLargerThanTheValue) {
    ASSERT_EQ(0, Save(kKeys, U32(1) + Slot("old", 48), kHost));
    const std::string before = Content();
    EXPECT_EQ(-1, Save(kKeys, U32(2) + Slot("a", 48) + Bytes(47), kHost));
    EXPECT_EQ(-1, Save(kKeys, U32(0xffffffff) + Slot("a", 48), kHost));
    EXPECT_EQ(-1, Save(kKeys, Bytes(3), kHost));
    EXPECT_EQ(before, Content());
    EXPECT_EQ(-1, Save(kNames, U32(1) + Bytes(80)));
    EXPECT_EQ(-1, Save(kNames, {}));
    EXPECT_EQ(before, Content());
}

TEST_P(UplinkLists, UnterminatedSlotContinuesToTheEndOfTheValue) {
    const Bytes value = U32(2) + Raw(std::string(48, 'a')) + Raw(std::string(48, 'b'));
    ASSERT_EQ(0, Save(kKeys, value, kHost));
    EXPECT_EQ(" {}\n/uplink_port_keys[] = \"" + std::string(48, 'a') + std::string(48, 'b') +
                  "\"\n/uplink_port_keys[] = \"" + std::string(48, 'b') + "\"\n",
              Content());
}

TEST_P(UplinkLists, LongTextOverflowsIntoTheNextSlotButNotTheEnd) {
    const std::string first(60, 'f');
    const std::string last(200, 'l');
    ASSERT_EQ(0, configstore::AppendValueString(object, "uplink_port_keys", first.c_str()));
    ASSERT_EQ(0, configstore::AppendValueString(object, "uplink_port_keys", "x"));
    ASSERT_EQ(0, configstore::AppendValueString(object, "uplink_port_keys", last.c_str()));
    const Bytes value = Find(Load(kHost), kKeys).value;
    // The first text overflows by 12 characters and its NUL; the second slot's text then overwrites two of
    // them.
    Bytes expected =
        U32(3) + Raw(std::string(48, 'f')) + Slot("x", 2) + Raw(std::string(10, 'f')) + Bytes(36);
    expected = expected + Raw(std::string(47, 'l')) + Bytes(1);
    EXPECT_EQ(expected, value);
}

TEST_P(UplinkLists, ListOfAnotherTypeFailsNamesAndLoadsNoKeys) {
    ASSERT_EQ(0, configstore::SetValueInt(object, "uplink_port_keys", 1));
    EXPECT_EQ(Props{}, Load(kHost));
    EXPECT_EQ(0, status) << "a count below 1 loads nothing, regardless of the status";
    ASSERT_EQ(0, configstore::SetValueInt(object, "uplink_port_names", 1));
    (void)Load();
    EXPECT_EQ(4, status);
}

TEST_P(UplinkLists, FailWithTheStore) {
    fake_store::FailFunction("SetValueEmptyList", configstore::IO_ERROR);
    EXPECT_EQ(8, Save(kKeys, U32(1) + Slot("a", 48), kHost));
    EXPECT_EQ(" {}\n", Content());
    EXPECT_EQ(0, Save(kNames, U32(1) + Slot("a", 81))) << "saving names does not read the list";
    fake_store::FailFunction("AppendValueString", configstore::IO_ERROR);
    EXPECT_EQ(8, Save(kKeys, U32(1) + Slot("a", 48), kHost));
    EXPECT_EQ(8, Save(kNames, U32(1) + Slot("a", 81)));
    fake_store::FailFunction(nullptr);
}

} // namespace
