/* SPDX-License-Identifier: Apache-2.0 */
// The typed form of known properties in documents: written where it loses nothing, read back as the same
// bytes, and rejected by path and field where it is wrong.

#include <gtest/gtest.h>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/parse.hpp>
#include <boost/json/serialize.hpp>
#include <boost/json/value.hpp>

#include "form/error.h"
#include "form/json/codec.h"
#include "form/states.h"

namespace {

using namespace dvs::form;
using namespace dvs::form::test;
using namespace std::string_literals;
namespace json = boost::json;

constexpr const char *kVlan = "com.orbeno.etherswitch.port.vlan";
constexpr const char *kShaper = "com.orbeno.common.port.shaper.input";

Buffer AccessVlan(char id) {
    return Raw("\0\0"s + id + "\0\0\0\0\0"s);
}

Buffer PortState(const std::string &name, const Buffer &value) {
    return EncodeList(
        std::vector<NewEntry>{MakeSwitch("s", {}, {}, {MakeList("7", {MakeProperty(name, value, 0x10)})})});
}

// A state of one port with one property, as a user writes it.
std::string Document(const std::string &property) {
    return R"({"switches": [{"id": "s", "version": 8, "class": "etherswitch", "max_ports": 512, "global": [],
        "host": [], "ports": [{"id": "7", "properties": [)" +
           property + "]}]}]}";
}

std::string Named(const char *name, const std::string &rest) {
    return R"({"name": ")"s + name + "\", " + rest + "}";
}

json::object PropertyOf(const std::string &document) {
    return json::parse(document).at("switches").at(0).at("ports").at(0).at("properties").at(0).as_object();
}

json::object Written(const Buffer &state, TypedForm form = TypedForm::Instead) {
    const std::string text = StateToJsonText(ParseState(state), form);
    EXPECT_EQ(StateFromJsonText(text), state) << text;
    return PropertyOf(text);
}

Error Refusal(const std::string &property) {
    try {
        (void)StateFromJsonText(Document(property));
    } catch (const Error &error) {
        EXPECT_EQ(error.kind, ErrorKind::Malformed);
        return error;
    }
    ADD_FAILURE() << "taken: " << property;
    return {ErrorKind::Warning, ""};
}

TEST(TypedForm, RepresentsExactlyTheBytes) {
    const json::object property = Written(PortState(kVlan, AccessVlan(100)));
    EXPECT_FALSE(property.contains("value"));
    EXPECT_EQ(property.at("typed").at("vlan_id"), 100);
}

TEST(TypedForm, KeepsReadableValuesUnchanged) {
    const json::object property = Written(PortState("com.orbeno.common.port.alias", Text("web")));
    EXPECT_EQ(property.at("value"), "web");
    EXPECT_FALSE(property.contains("typed"));
}

TEST(TypedForm, KeepsBytesThatWouldNotRoundTrip) {
    // The typed form has no member for the record's reserved field.
    const Buffer value = Raw("\0\0\x64\0\x01\0\0\0"s);
    const json::object property = Written(PortState(kVlan, value));
    EXPECT_EQ(property.at("value").at("hex"), "0000640001000000");
    EXPECT_FALSE(property.contains("typed"));
}

TEST(TypedForm, KeepsDamagedAndUnknownValues) {
    for (const char *name : {kVlan, "com.example.unknown"}) {
        const json::object property = Written(PortState(name, Raw("\x01\xff\x02"s)));
        EXPECT_EQ(property.at("value").at("hex"), "01ff02");
        EXPECT_FALSE(property.contains("typed"));
    }
}

TEST(TypedForm, IsShownWithTheBytes) {
    const json::object property = Written(PortState(kVlan, AccessVlan(100)), TypedForm::Beside);
    EXPECT_EQ(property.at("value").at("hex"), "0000640000000000");
    EXPECT_EQ(property.at("typed").at("vlan_id"), 100);
    EXPECT_EQ(property.at("summary"), "VLAN 100");
}

TEST(TypedForm, DamageIsShownWithTheBytes) {
    const json::object property = Written(PortState(kVlan, Raw("\x01\0\x02"s)), TypedForm::Beside);
    EXPECT_EQ(property.at("value").at("hex"), "010002");
    EXPECT_NE(std::string(property.at("damage").as_string()).find("at byte 3"), std::string::npos);
}

TEST(TypedForm, CanBeOmitted) {
    EXPECT_FALSE(Written(PortState(kVlan, AccessVlan(100)), TypedForm::None).contains("typed"));
}

TEST(TypedForm, IsReadInsteadOfBytes) {
    EXPECT_EQ(StateFromJsonText(Document(Named(kVlan, R"("typed": {"vlan_id": 100})"))),
              PortState(kVlan, AccessVlan(100)));
}

TEST(TypedForm, DependsOnTheSwitchsVersion) {
    // Overlay switches use the same version texts as others, with different numbers.
    for (const std::uint32_t version : {8u, 108u}) {
        const std::string text =
            R"({"switches": [{"id": "s", "version": )" + std::to_string(version) +
            R"(, "global": [{"name": "com.orbeno.common.version", "typed": "7.0.2"}]}]})";
        const Buffer state = StateFromJsonText(text);
        const State parsed = ParseState(state);
        EXPECT_EQ(AsNumber(parsed.switches[0].Find(Role::GlobalList)->list[0].value), version);
    }
}

TEST(TypedForm, IsReadInSwitchesOfAnUnusualShape) {
    const std::string text = R"({"switches": [{"id": "s", "entries": [
        {"name": "switchVersion", "type": 16, "value": 8},
        {"name": "7", "properties": [)" +
                             Named(kVlan, R"("typed": {"vlan_id": 100})") +
                             R"(]}, {"name": "globalPropList", "properties": [
        {"name": "com.orbeno.etherswitch.cdp", "typed": {"protocol": "LLDP", "operation": "BOTH"}}]}]}]})";
    const Buffer state = StateFromJsonText(text);
    const State parsed = ParseState(state);
    ASSERT_EQ(parsed.switches[0].entries.size(), 3u);
    EXPECT_TRUE(std::ranges::equal(parsed.switches[0].entries[1].list[0].value, AccessVlan(100)));
    EXPECT_TRUE(std::ranges::equal(parsed.switches[0].entries[2].list[0].value, Raw("\x01\x03")));
    EXPECT_EQ(StateFromJsonText(StateToJsonText(parsed)), state);
}

TEST(TypedForm, NamesPathAndField) {
    const Error error =
        Refusal(Named(kVlan, R"("typed": {"trunk_vlan_ids": [{"start": 1, "end": 10}, {"start": "x"}]})"));
    EXPECT_EQ(error.path, "$.switches[0].ports[0].properties[0].typed.trunk_vlan_ids[1].start");
    EXPECT_EQ(error.field, "trunk_vlan_ids[1].start");
    EXPECT_FALSE(error.why.empty());
}

TEST(TypedForm, RejectsPropertiesWithoutATypedForm) {
    EXPECT_NE(Refusal(Named(kVlan, R"("typed": {"vlan": 100})")).path.find(".typed.vlan"), std::string::npos);
    EXPECT_NE(Refusal(Named(kVlan, R"("typed": {"vlan_id": 70000})")).path.find(".typed.vlan_id"),
              std::string::npos);
    EXPECT_NE(Refusal(Named(kVlan, R"("typed": {"vlan_id": 1.5})")).why.find("whole number"),
              std::string::npos);
    EXPECT_NE(Refusal(Named(kVlan, R"("typed": null)")).why, "");
    EXPECT_NE(Refusal(Named("com.example.unknown", R"("typed": 1)")).why.find("no typed form"),
              std::string::npos);
    EXPECT_NE(Refusal(Named(kVlan, R"("type": 16)")).why.find("\"value\" or \"typed\""), std::string::npos);
}

TEST(TypedForm, SuggestsWhereFieldsBelong) {
    for (const char *fields : {R"({"vlan_id": 100})", "[1]", "true", "{}"}) {
        const Error error = Refusal(Named(kVlan, R"("value": )" + std::string(fields)));
        EXPECT_EQ(error.path, "$.switches[0].ports[0].properties[0].value");
        EXPECT_EQ(error.why, "these are no bytes; what a value means is given as \"typed\" in its place");
    }
    EXPECT_NE(Refusal(Named(kVlan, R"("value": {"hex": "00", "vlan_id": 1})")).why.find("not known here"),
              std::string::npos);
}

TEST(TypedForm, RejectsValuesThatWouldNotRoundTrip) {
    // The record counts bytes; three bits are not a whole byte.
    const Error error = Refusal(Named(
        kShaper, R"("typed": {"average_bandwidth": 8003, "peak_bandwidth": 8000, "burst_size": 8000})"));
    EXPECT_NE(error.path.find("average_bandwidth"), std::string::npos) << error.path;
}

TEST(TypedForm, MustAgreeWithTheBytes) {
    const Buffer state = StateFromJsonText(Document(
        Named(kVlan, R"("type": 16, "value": {"hex": "0000640000000000"}, "typed": {"vlan_id": 100})")));
    EXPECT_EQ(state, PortState(kVlan, AccessVlan(100)));
    const Error error =
        Refusal(Named(kVlan, R"("value": {"hex": "0000640000000000"}, "typed": {"vlan_id": 101})"));
    EXPECT_EQ(error.path, "$.switches[0].ports[0].properties[0].typed");
    EXPECT_NE(error.why.find("says something else"), std::string::npos);
}

} // namespace
