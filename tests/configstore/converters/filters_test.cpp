/* SPDX-License-Identifier: Apache-2.0 */
// Traffic filters of a port: variable sizes, the overlapping load, and the copies that abort the process.

#include "configstore/converters/converter_fixture.h"

using namespace converter_test;

namespace {

constexpr const char *kKey = "com.orbeno.common.port.dvfilter";

Bytes Filter(uint32_t slot, const std::string &agent, uint32_t onFailure,
             const std::vector<std::string> &parameters, uint32_t firstOrdinal = 0) {
    Bytes bytes;
    bytes.U32(slot).Text(agent, 40).U32(static_cast<uint32_t>(parameters.size())).U32(onFailure);
    for (const auto &text : parameters)
        bytes.U32(firstOrdinal++).Text(text, 256);
    return bytes;
}

struct Filters : ConverterTest {
    configstore::Object *Stored(const char *id, const char *slot,
                                const std::vector<std::string> &parameters) {
        configstore::Object *filter = Sub(std::string("settings/filter_policy/network_filters[") + id + "]");
        EXPECT_EQ(0, configstore::SetValueStr(filter, "slot_number", slot));
        EXPECT_EQ(0, configstore::SetValueEmptyList(filter, "parameters"));
        for (const auto &text : parameters) {
            EXPECT_EQ(0, configstore::AppendValueString(filter, "parameters", text.c_str()));
        }
        return filter;
    }
};
using FiltersDeathTest = Filters;

TEST_F(Filters, SavesEachFilterUnderItsSlot) {
    const Bytes value =
        Bytes().U32(2).Add(Filter(1, "agent", 1, {"a", "b"}, 7)).Add(Filter(2, "other", 2, {}));
    ASSERT_EQ(0, Save(kPort, kKey, value));
    const std::string base = "/settings/filter_policy";
    const std::string list = base + "/network_filters";
    EXPECT_EQ("/settings {}\n" + base + " {}\n" + list + "[1] {}\n" + list + "[1]/agent_name = \"agent\"\n" +
                  list + "[1]/slot_number = \"1\"\n" + list + "[1]/on_failure = \"FAIL_OPEN\"\n" + list +
                  "[1]/parameters[] = \"a\"\n" + list + "[1]/parameters[] = \"b\"\n" + list + "[2] {}\n" +
                  list + "[2]/agent_name = \"other\"\n" + list + "[2]/slot_number = \"2\"\n" + list +
                  "[2]/on_failure = \"FAIL_CLOSED\"\n" + list + "[2]/parameters = []\n",
              Dump());
}

TEST_F(Filters, LargestSlotIsMinusOneAsIdAndUnsignedAsText) {
    ASSERT_EQ(0, Save(kPort, kKey, Bytes().U32(1).Add(Filter(4294967295u, "agent", 0, {}))));
    EXPECT_NE(std::string::npos, Dump().find("network_filters[-1]/slot_number = \"4294967295\"\n"));
    EXPECT_EQ(Bytes().U32(1).Add(Filter(4294967295u, "agent", 0, {})), LoadOne(kPort, kKey));
}

TEST_F(Filters, OneFilterLoadsWithParametersNumberedFromZero) {
    ASSERT_EQ(0, Save(kPort, kKey, Bytes().U32(1).Add(Filter(3, "agent", 1, {"a", "b"}, 5))));
    EXPECT_EQ(Bytes().U32(1).Add(Filter(3, "agent", 1, {"a", "b"}, 0)), LoadOne(kPort, kKey));
}

TEST_F(Filters, LaterFiltersAreLoadedOverEarlierParameters) {
    ASSERT_EQ(0, Save(kPort, kKey,
                      Bytes()
                          .U32(2)
                          .Add(Filter(1, "one", 1, {std::string(100, 'p')}))
                          .Add(Filter(2, "two", 0, {"q"}))));
    // The second filter overwrites the first one's parameter; the end of the value is unchanged.
    Bytes expected = Bytes().U32(2).Add(Filter(1, "one", 1, {std::string(100, 'p')})).Zeros(52 + 260);
    const Bytes second = Filter(2, "two", 0, {"q"});
    for (const auto &[from, to] :
         {std::pair(0, 4), std::pair(4, 8), std::pair(44, 48), std::pair(48, 52), std::pair(52, 56)}) {
        std::copy(second.begin() + from, second.begin() + to, expected.begin() + 56 + from);
    }
    expected[56 + 56] = 'q'; // a text is copied up to its NUL
    expected[56 + 57] = 0;
    EXPECT_EQ(expected, LoadOne(kPort, kKey));
}

TEST_F(Filters, NoFiltersAreAnEmptyListAndACountOfZero) {
    ASSERT_EQ(0, Save(kPort, kKey, Bytes().U32(1).Add(Filter(3, "agent", 1, {}))));
    ASSERT_EQ(0, Save(kPort, kKey, Bytes().U32(0)));
    EXPECT_EQ("/settings {}\n/settings/filter_policy {}\n/settings/filter_policy/network_filters = []\n",
              Dump());
    EXPECT_EQ(Bytes().U32(0), LoadOne(kPort, kKey));
}

TEST_F(Filters, FailedListingIsACountOfZero) {
    ASSERT_EQ(0, Save(kPort, kKey, Bytes().U32(1).Add(Filter(3, "agent", 1, {"a"}))));
    const int before = fake_store::Calls();
    ASSERT_TRUE(LoadOne(kPort, kKey));
    int listing = 1;
    while (fake_store::CallName(before + listing) != "GetSubObjectInstances")
        ++listing;
    fake_store::FailCall(listing, configstore::IO_ERROR);
    EXPECT_EQ(Bytes().U32(0), LoadOne(kPort, kKey));
    EXPECT_TRUE(fake_store::Failed());
    EXPECT_EQ(0, loadStatus);
}

TEST_F(Filters, SlotTextsAreReadAsUnsignedDecimal) {
    const std::pair<const char *, uint32_t> rows[] = {
        {"12", 12}, {" 12x", 12}, {"-1", 0xffffffff}, {"", 0}, {"x", 0}};
    for (const auto &[text, expected] : rows) {
        (void)configstore::DeleteSubObject(object, "settings", "");
        Stored("a", text, {});
        EXPECT_EQ(Bytes().U32(1).Add(Filter(expected, "", 0, {})), LoadOne(kPort, kKey)) << text;
    }
}

TEST_F(Filters, UnreadableFieldsAreZero) {
    configstore::Object *filter = Sub("settings/filter_policy/network_filters[x]");
    ASSERT_EQ(0, configstore::SetValueInt(filter, "slot_number", 4));
    ASSERT_EQ(0, configstore::SetValueStr(filter, "on_failure", "fail_open"));
    EXPECT_EQ(Bytes().U32(1).Add(Filter(0, "", 0, {})), LoadOne(kPort, kKey));
}

TEST_F(Filters, RejectsCountsBeyondTheValue) {
    Bytes whole = Bytes().U32(2).Add(Filter(1, "a", 1, {"x"})).Add(Filter(2, "b", 1, {"y"}));
    for (std::size_t length = 0; length < whole.size(); ++length) {
        EXPECT_EQ(-1, Save(kPort, kKey, {whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(length)}))
            << length;
    }
    EXPECT_EQ("/settings {}\n", Dump());
    for (const uint32_t count : {3u, 0x7fffffffu, 0xffffffffu}) {
        EXPECT_EQ(-1,
                  Save(kPort, kKey, Bytes().U32(count).Add(Filter(1, "a", 1, {})).Add(Filter(2, "b", 1, {}))))
            << count;
        Bytes parameters = Bytes().U32(1).U32(1).Text("a", 40).U32(count).U32(1).Zeros(520);
        EXPECT_EQ(-1, Save(kPort, kKey, parameters)) << count;
    }
}

TEST_F(Filters, UnterminatedTextsEndWithTheValue) {
    Bytes value = Bytes().U32(1).Add(Filter(1, std::string(40, 'a'), 0x01010101, {std::string(256, 'p')}));
    // The agent's name continues into the count (1, 0, 0, 0) and ends there.
    ASSERT_EQ(0, Save(kPort, kKey, value));
    EXPECT_NE(std::string::npos, Dump().find("agent_name = \"" + std::string(40, 'a') + "\\x01\"\n"));
    EXPECT_NE(std::string::npos, Dump().find("parameters[] = \"" + std::string(256, 'p') + "\"\n"));
}

TEST_F(Filters, ListsThatBecomeReadableLateHaveNoRoom) {
    Stored("1", "1", {"a", "b"});
    const auto whole = LoadOne(kPort, kKey);
    // The first read of the parameters allocates their room.
    for (int call = 1; call < 40; ++call) {
        fake_store::FailCall(call, configstore::IO_ERROR);
        const auto loaded = LoadOne(kPort, kKey);
        if (loadStatus || !loaded || loaded->size() == whole->size()) continue;
        EXPECT_TRUE(loaded->size() == 56 || loaded->size() == 4) << call;
    }
    fake_store::FailCall(0);
}

TEST_F(FiltersDeathTest, AgentNamesThatDoNotFitAreFatal) {
    configstore::Object *filter = Stored("1", "1", {});
    ASSERT_EQ(0, configstore::SetValueStr(filter, "agent_name", std::string(39, 'a').c_str()));
    EXPECT_EQ(Bytes().U32(1).Add(Filter(1, std::string(39, 'a'), 0, {})), LoadOne(kPort, kKey));
    ASSERT_EQ(0, configstore::SetValueStr(filter, "agent_name", std::string(40, 'a').c_str()));
    EXPECT_DEATH((void)Load(kPort), "");
}

TEST_F(FiltersDeathTest, ParametersThatDoNotFitAreFatal) {
    Stored("1", "1", {std::string(255, 'a')});
    EXPECT_EQ(Bytes().U32(1).Add(Filter(1, "", 0, {std::string(255, 'a')})), LoadOne(kPort, kKey));
    Stored("1", "1", {std::string(256, 'a')});
    EXPECT_DEATH((void)Load(kPort), "");
}

} // namespace
