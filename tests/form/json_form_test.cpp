/* SPDX-License-Identifier: Apache-2.0 */
// The JSON form: conversion to JSON and back loses nothing, and errors name their place in the document.

#include "form/json/codec.h"

#include <gtest/gtest.h>

#include <fstream>
#include <random>
#include <sstream>
#include <string>

#include "dvs/state.h"
#include "form/error.h"
#include "form/states.h"

namespace {

using namespace dvs::form;
using namespace dvs::form::test;
using namespace std::string_literals;

std::string ToJson(const Buffer &state) {
    return StateToJsonText(ParseState(state));
}

void ExpectSurvives(const Buffer &state) {
    ASSERT_FALSE(dvs::state::VerifyState(state).first) << "the test's state must be valid";
    const std::string text = ToJson(state);
    EXPECT_EQ(StateFromJsonText(text), state) << text;
}

Buffer StateOf(std::vector<NewEntry> switches) {
    return EncodeList(switches);
}

Buffer OneSwitch(std::vector<NewEntry> entries) {
    return StateOf({MakeList("s", entries)});
}

std::vector<NewEntry> Fields() {
    return {{"switchVersion", 0x10, Number(8)},
            {"className", 0x10, Buffer(128, 0)},
            {"maxPorts", 0x10, Number(4)}};
}

std::vector<NewEntry> FieldsAnd(std::initializer_list<NewEntry> more) {
    auto entries = Fields();
    entries.insert(entries.end(), more);
    return entries;
}

TEST(JsonForm, KeepsAnEmptyState) {
    ExpectSurvives(StateOf({}));
}

TEST(JsonForm, KeepsASmallState) {
    ExpectSurvives(SmallState());
}

TEST(JsonForm, IsReadableWherePossible) {
    const std::string text = ToJson(SmallState());
    for (const char *part : {
             R"("class": "etherswitch")",
             R"("max_ports": 512)",
             R"({"name": "x.mtu", "type": 32, "value": 9000})",
             R"({"name": "com.orbeno.common.alias", "type": 16, "value": "production"})",
             R"("kind": "shadow")",
             R"({"name": "x.blob", "type": 32, "value": {"hex": "010200"}})",
         })
        EXPECT_NE(text.find(part), std::string::npos) << part << "\n" << text;
    EXPECT_EQ(text.find("volatile.type"), std::string::npos) << "the kind replaces it";
}

TEST(JsonForm, KeepsEveryValue) {
    std::vector<NewEntry> properties;
    const std::string values[] = {
        "",
        "\0"s,
        "a",
        "a\0"s,
        "abc\0"s,
        "abcd",
        "abcd\0"s,
        "abcde",
        "abcd\0\0"s,
        "ab\0\0\0"s,
        "a\0b\0"s,
        "\0\0\0\0"s,
        "\xff\xff\xff\xff",
        "\xff\xfe\0"s,
        "false",
        "true\0f"s,
        std::string(64, '\x80'),
        std::string(65, '\x80'),
        std::string(5000, 'x'),
        "long" + std::string(4092, '\0'),
        "long" + std::string(4093, '\0'),
        "quote\"back\\slash\0"s,
        "tab\t\0"s,
        "\x1b[0m\0"s,
        "\xc2\x9b\0"s,
        "\xe2\x80\xae\0"s,
        "\xed\xa0\x80\0"s,
        "\1\0\0\0x"s + std::string(80, '\0'),
        "\1\0\0\0"s + std::string(81, '\0'),
        "\1\0\0\0"s + std::string(48, 'y'),
    };
    int n = 0;
    for (const std::string &value : values)
        properties.push_back(MakeProperty("p" + std::to_string(n++), Raw(value)));
    ExpectSurvives(StateOf({MakeSwitch("s", properties, properties, {MakeList("1", properties)})}));
}

TEST(JsonForm, KeepsEveryShortValue) {
    // All values of one byte, and of two bytes from a set with every kind of byte.
    std::vector<NewEntry> properties;
    for (int i = 0; i < 256; ++i)
        properties.push_back(MakeProperty("p", Raw(std::string(1, static_cast<char>(i)))));
    const std::string kinds = "\0\1\t\n\r \"\\aZ\x7f\x80\xc2\xe2\xff"s;
    for (const char a : kinds)
        for (const char b : kinds)
            properties.push_back(MakeProperty("p", Raw(std::string{a, b})));
    ExpectSurvives(StateOf({MakeSwitch("s", properties, {}, {})}));
}

TEST(JsonForm, KeepsEveryName) {
    std::vector<NewEntry> properties;
    for (const std::string &name :
         {""s, " "s, "\xff\xfe"s, "name with \"quotes\" and \\"s, "\x1b]0;title\x07"s, "Zürich"s,
          "\xed\xa0\x80"s, std::string(127, 'n'), std::string(126, 'n') + "\xc3"})
        properties.push_back(MakeProperty(name, Number(1)));
    ExpectSurvives(StateOf(
        {MakeSwitch("\xfe id", properties, {}, {MakeList("\x80port", properties), MakeList("", {})})}));
}

TEST(JsonForm, KeepsEveryTypeWord) {
    std::vector<NewEntry> properties;
    for (const std::uint32_t type : {0u, 1u, 3u, 4u, 0x10u, 0x18u, 0x20u, 0x80000000u, 0xffffffffu})
        properties.push_back(MakeProperty("p", Number(type), type));
    ExpectSurvives(StateOf({MakeSwitch("s", properties, {}, {MakeList("1", properties, 0x14)})}));
    for (const std::uint32_t type : {0u, 1u, 0x20u, 0xffffffffu}) {
        ExpectSurvives(StateOf({MakeList("s", FieldsAnd({}), type)}));
        ExpectSurvives(
            OneSwitch(FieldsAnd({MakeList("globalPropList", properties, type), MakeList("1", {}, type)})));
    }
}

TEST(JsonForm, KeepsUnusualOrders) {
    const auto f = Fields();
    const NewEntry port = MakeList("1", {}),
                   global = MakeList("globalPropList", {MakeProperty("g", Number(1))});
    const NewEntry host = MakeList("hostPropList", {});
    ExpectSurvives(OneSwitch({f[2], f[1], f[0], port, host, global}));
    ExpectSurvives(OneSwitch({port, f[0], f[1], f[2]}));
    ExpectSurvives(OneSwitch({f[0], f[1], f[2], host, global, port}));
}

TEST(JsonForm, KeepsMissingAndUnusualFields) {
    ExpectSurvives(OneSwitch(Fields())); // no lists, no ports
    ExpectSurvives(OneSwitch({{"switchVersion", 0x10, Raw("\x08\0\0\0more"s)},
                              {"className", 0x10, Text("vswitch")},
                              {"maxPorts", 0x20, Number(0x00434241)}}));
    ExpectSurvives(OneSwitch({{"switchVersion", 0x10, Number(0x00434241)}, // looks like text
                              {"className", 0x10, Raw("\xff\0x"s + std::string(125, '\0'))},
                              {"maxPorts", 0x10, Number(4)}}));
    Buffer full(128, 'c'), tail(128, 0);
    tail[0] = 'c';
    tail[127] = 1;
    ExpectSurvives(OneSwitch({Fields()[0], {"className", 0x10, full}, Fields()[2]}));
    ExpectSurvives(OneSwitch({Fields()[0], {"className", 0x10, tail}, Fields()[2]}));
    ExpectSurvives(OneSwitch({Fields()[0], {"className", 0x10, {}}, Fields()[2]}));
}

TEST(JsonForm, KeepsDuplicates) {
    const NewEntry p = MakeProperty("twice", Number(1)), q = MakeProperty("twice", Text("other"), 0x10);
    ExpectSurvives(StateOf({MakeSwitch("s", {p, q, p}, {}, {}), MakeSwitch("s", {}, {}, {})}));
    // Every reader treats a second field of the same name as a port.
    ExpectSurvives(OneSwitch(FieldsAnd({MakeList("maxPorts", {p}), MakeList("className", {})})));
}

TEST(JsonForm, KeepsEntriesThatALoadIgnores) {
    ExpectSurvives(StateOf({MakeProperty("not a switch", Text("at all"), 1), MakeSwitch("s", {}, {}, {})}));
    ExpectSurvives(OneSwitch(
        FieldsAnd({MakeProperty("globalPropList", Raw("\1\2"), 2), MakeList("globalPropList", {})})));
}

TEST(JsonForm, KeepsPortKindsInEveryNotation) {
    const std::string name = "com.orbeno.common.port.volatile.type";
    const NewEntry p = MakeProperty("p", Number(1));
    const auto kind = [&](Buffer value, std::uint32_t type = 0x10) {
        return MakeProperty(name, std::move(value), type);
    };
    const std::vector<std::vector<NewEntry>> lists = {
        {p, kind(Number(2))},       // as the library writes it
        {kind(Number(2)), p},       // not at the end
        {p, kind(Number(3), 0x20)}, // of another type
        {p, kind(Number(1))},       // active, stated explicitly
        {p, kind(Number(9))},       // an unknown kind
        {p, kind(Number(4)), kind(Number(2))},
        {p, kind(Number(2), 1)}, // a load ignores it: active
        {p, kind(Number(4), 1), kind(Number(2))},
        {p, kind(Raw("\2\0\0\0x"s))}, // longer than its number
        {kind(Number(4))},
    };
    for (const auto &list : lists)
        ExpectSurvives(StateOf({MakeSwitch("s", {}, {}, {MakeList("1", list)})}));
}

TEST(JsonForm, KeepsRandomStates) {
    std::mt19937 random(1);
    const auto below = [&](unsigned n) { return static_cast<unsigned>(random() % n); };
    const auto bytes = [&](std::size_t size, bool nul) {
        Buffer out(size);
        for (auto &b : out)
            b = static_cast<std::uint8_t>(below(4) == 0 ? below(256) : 'a' + below(26));
        if (!nul)
            for (auto &b : out)
                b = b == 0 ? 1 : b;
        return out;
    };
    const auto name = [&] {
        const Buffer n = bytes(below(20), false);
        return std::string(n.begin(), n.end());
    };
    const auto list = [&] {
        std::vector<NewEntry> entries;
        for (unsigned i = below(6); i-- > 0;)
            entries.push_back({name(), static_cast<std::uint32_t>(random()), bytes(below(200), true)});
        return entries;
    };
    for (int round = 0; round < 300; ++round) {
        std::vector<NewEntry> switches;
        for (unsigned i = below(3); i-- > 0;) {
            std::vector<NewEntry> entries = Fields();
            if (below(4)) entries.push_back(MakeList("globalPropList", list()));
            if (below(4)) entries.push_back(MakeList("hostPropList", list()));
            for (unsigned p = below(4); p-- > 0;)
                entries.push_back(MakeList(std::to_string(p) + name(), list()));
            if (below(4) == 0) std::shuffle(entries.begin(), entries.end(), random);
            switches.push_back(MakeList(name(), entries));
        }
        const Buffer state = StateOf(switches);
        ASSERT_EQ(StateFromJsonText(ToJson(state)), state) << ToJson(state);
    }
}

TEST(JsonForm, DropsOnlyBytesWithoutMeaning) {
    // Bytes that the format leaves unspecified are dropped: name tails, padding, the reserved field, bytes
    // after an end marker. Everything else is kept.
    Buffer state = SmallState();
    const Buffer clean = state;
    state[10] = 0x77;           // reserved
    state[12 + 4 + 100] = 0x55; // tail of the first switch's name
    Mend(state);
    ASSERT_NE(state, clean);
    EXPECT_EQ(StateFromJsonText(ToJson(state)), clean);
}

TEST(JsonForm, RestoresTheLibrarysOwnBytes) {
    ASSERT_EQ(
        DVSState_ConfigDeserialize(SmallState().data(), static_cast<std::uint32_t>(SmallState().size())),
        HYP_OK);
    void *block = nullptr;
    std::uint32_t size = 0;
    ASSERT_EQ(DVSState_ConfigSerialize(&block, &size), HYP_OK);
    const auto *start = static_cast<std::uint8_t *>(block);
    const Buffer written(start, start + size);
    std::free(block);
    ASSERT_EQ(DVSState_ConfigReset(), HYP_OK);
    ExpectSurvives(written);
}

TEST(JsonForm, ExampleIsAValidState) {
    std::ifstream file(std::string(DVS_SOURCE_DIR) + "/examples/site-basic.json");
    std::stringstream text;
    text << file.rdbuf();
    const Buffer state = StateFromJsonText(text.str());
    const auto verdict = dvs::state::VerifyState(state, 65536);
    EXPECT_FALSE(verdict.first);
    EXPECT_EQ(verdict.all.switches, 2u);
    EXPECT_EQ(verdict.all.ports, 20u);
    EXPECT_EQ(DVSState_ConfigDeserialize(state.data(), static_cast<std::uint32_t>(state.size())), HYP_OK);
    EXPECT_NE(DVSState_SwitchFindByAlias("storage"), nullptr);
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
    ExpectSurvives(state);
}

std::string Document(const std::string &switches) {
    return "{\"schema_version\": 1, \"switches\": [" + switches + "]}";
}

std::string WithValue(const std::string &value) {
    return Document(R"({"id": "s", "global": [{"name": "n", "value": )" + value + "}]}");
}

Buffer ValueFrom(const std::string &value) {
    const Buffer state = StateFromJsonText(WithValue(value));
    const Bytes bytes = ParseState(state).switches.at(0).entries.at(0).list.at(0).value;
    return {bytes.begin(), bytes.end()};
}

TEST(JsonForm, AcceptsValuesInEveryNotation) {
    EXPECT_EQ(ValueFrom("\"text\""), Text("text"));
    EXPECT_EQ(ValueFrom("\"\""), Raw("\0"s));
    EXPECT_EQ(ValueFrom("\"a\\u0000b\""), Raw("a\0b\0"s));
    EXPECT_EQ(ValueFrom("4294967295"), Number(0xffffffff));
    EXPECT_EQ(ValueFrom("{\"hex\": \"DE AD be ef\"}"), Raw("\xde\xad\xbe\xef"));
    EXPECT_EQ(ValueFrom("{\"hex\": \"\", \"comment\": \"none\"}"), Buffer());
    EXPECT_EQ(ValueFrom("{\"base64\": \"AAEC\"}"), Raw("\0\1\2"s));
    EXPECT_EQ(ValueFrom("{\"text\": \"ab\", \"size\": 4}"), Raw("ab\0\0"s));
    EXPECT_EQ(ValueFrom("{\"text\": \"ab\", \"size\": 2}"), Raw("ab"));
    EXPECT_EQ(ValueFrom("{\"names\": [], \"slot\": 81}"), Number(0));
    EXPECT_EQ(ValueFrom("{\"names\": [\"a\", \"b\"], \"slot\": 3}"), Raw("\2\0\0\0a\0\0b\0\0"s));
}

TEST(JsonForm, FillsInDefaults) {
    const Buffer state =
        StateFromJsonText(Document(R"({"id": "s", "version": 8, "class": "vswitch", "max_ports": 1,
        "global": [{"name": "n", "value": 1}], "ports": [{"id": "1"}, {"id": "2", "kind": "zombie"}, {"id": "3", "kind": "active"}]})"));
    const State model = ParseState(state);
    const auto &entries = model.switches.at(0).entries;
    EXPECT_EQ(model.switches[0].type, 0x10u);
    EXPECT_EQ(entries.at(1).value.size(), 128u);
    EXPECT_EQ(entries.at(3).list.at(0).type, 0x20u);
    EXPECT_EQ(entries.at(4).kind, 1u);
    EXPECT_EQ(entries.at(5).kind, 3u);
    EXPECT_TRUE(entries.at(6).list.empty());
}

struct BadCase {
    std::string document, path, why;
};

TEST(JsonForm, ReportsErrorsWithTheirPlace) {
    const std::string port = R"({"id": "s", "ports": [{"id": "1", )";
    const BadCase cases[] = {
        {"[]", "$", "it is an array, an object is expected"},
        {"{}", "$", "the key \"switches\" is missing"},
        {R"({"switches": [], "swiches": []})", "$.swiches", "the key is not known here"},
        {R"({"switches": {}})", "$.switches", "an array is expected"},
        {R"({"schema_version": 2, "switches": []})", "$.schema_version", "it is 2, this program knows 1"},
        {R"({"schema_version": "1", "switches": []})", "$.schema_version", "a whole number is expected"},
        {Document("1"), "$.switches[0]", "it is a number, an object is expected"},
        {Document("{}"), "$.switches[0]", "the key \"id\" is missing"},
        {Document(R"({"id": 7})"), "$.switches[0].id", "a string is expected"},
        {Document("{\"id\": \"" + std::string(128, 'i') + "\"}"), "$.switches[0].id",
         "it has 128 bytes, a name has at most 127"},
        {Document(R"({"id": "a\u0000b"})"), "$.switches[0].id", "a name cannot hold a NUL"},
        {Document(R"({"id": {"hex": "00"}})"), "$.switches[0].id", "a name cannot hold a NUL"},
        {Document(R"({"id": "s", "type": -1})"), "$.switches[0].type", "from 0 to 4294967295"},
        {Document(R"({"id": "s", "type": 4294967296})"), "$.switches[0].type", "from 0 to 4294967295"},
        {Document(R"({"id": "s", "type": 1.5})"), "$.switches[0].type", "from 0 to 4294967295"},
        {Document(R"({"id": "s", "entries": [], "version": 8})"), "$.switches[0].version", "not known here"},
        {Document("{\"id\": \"s\", \"class\": \"" + std::string(128, 'c') + "\"}"), "$.switches[0].class",
         "at most 127"},
        {Document(port + R"("kind": "visible"}]})"), "$.switches[0].ports[0].kind", "a port is"},
        {Document(
             port +
             R"("kind": "shadow", "properties": [{"name": "com.orbeno.common.port.volatile.type", "value": 3}]}]})"),
         "$.switches[0].ports[0].kind", "says otherwise"},
        {Document(port + R"("properties": [{"name": "n"}]}]})"), "$.switches[0].ports[0].properties[0]",
         "\"typed\" is missing"},
        {WithValue("true"), "$.switches[0].global[0].value", "it is a boolean"},
        {WithValue("null"), "$.switches[0].global[0].value", "it is null"},
        {WithValue("[1]"), "$.switches[0].global[0].value", "it is an array"},
        {WithValue("-1"), "$.switches[0].global[0].value", "from 0 to 4294967295"},
        {WithValue("1e3"), "$.switches[0].global[0].value", "from 0 to 4294967295"},
        {WithValue("1e999"), "$.switches[0].global[0].value", ""},
        {WithValue("99999999999999999999999999"), "$.switches[0].global[0].value", "from 0 to 4294967295"},
        {WithValue("{}"), "$.switches[0].global[0].value", "bytes are given as"},
        {WithValue(R"({"hex": "00", "base64": ""})"), "$.switches[0].global[0].value", "bytes are given as"},
        {WithValue(R"({"hex": "0"})"), "$.switches[0].global[0].value.hex", "pairs of hexadecimal digits"},
        {WithValue(R"({"hex": 0})"), "$.switches[0].global[0].value.hex", "a string is expected"},
        {WithValue(R"({"base64": "A"})"), "$.switches[0].global[0].value.base64", "not base64"},
        {WithValue(R"({"text": "abc", "size": 2})"), "$.switches[0].global[0].value.size",
         "the text has 3 bytes"},
        {WithValue(R"({"text": "a", "size": 4294967295})"), "$.switches[0].global[0].value.size",
         "4096 bytes at most"},
        {WithValue(R"({"text": "a"})"), "$.switches[0].global[0].value", "bytes are given as"},
        {WithValue(R"({"names": ["abc"], "slot": 3})"), "$.switches[0].global[0].value.names[0]",
         "room for 2"},
        {WithValue(R"({"names": [1], "slot": 3})"), "$.switches[0].global[0].value.names[0]",
         "a string is expected"},
        {WithValue(R"({"names": [], "slot": 0})"), "$.switches[0].global[0].value.slot", "1 to 128"},
        {WithValue(R"({"octal": "7"})"), "$.switches[0].global[0].value.octal", "not known here"},
    };
    for (const BadCase &c : cases) {
        try {
            (void)StateFromJsonText(c.document);
            ADD_FAILURE() << c.document;
        } catch (const Error &error) {
            EXPECT_EQ(error.kind, ErrorKind::Malformed);
            EXPECT_EQ(error.path.substr(0, error.path.find(',')), c.path) << c.document;
            EXPECT_NE(error.why.find(c.why), std::string::npos) << c.document << ": " << error.why;
        }
    }
}

} // namespace
