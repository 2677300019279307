/* SPDX-License-Identifier: Apache-2.0 */
// The output of `dvsctl props` for the known properties.

#include "program.h"

#include <set>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>

#include "dvs/configstore.h"
#include "form/json/typed.h"

namespace {

using namespace dvs::ctl::test;

class Props : public ProgramTest {};

bool Has(const std::string &text, std::string_view part) {
    return text.find(part) != std::string::npos;
}

TEST_F(Props, ListsEveryKeyOfTheMappingTables) {
    const Result result = Dvsctl({"props", "--columns", "name", "--no-headings"});
    EXPECT_EQ(result.status, 0);
    for (const int propClass : {DVS_PROP_CLASS_GLOBAL, DVS_PROP_CLASS_HOST, DVS_PROP_CLASS_PORT})
        for (const auto *row = GetConfigMap(propClass); row->key; ++row)
            EXPECT_EQ(Has(result.out, row->key), std::string_view(row->key) != "DEFAULT") << row->key;
}

TEST_F(Props, ExplainsAProperty) {
    const std::string out = Dvsctl({"props", "com.orbeno.etherswitch.port.vlan"}).out;
    EXPECT_TRUE(Has(out, "com.orbeno.etherswitch.port.vlan (port)")) << out;
    EXPECT_TRUE(Has(out, "settings/vlan")) << out;
    EXPECT_TRUE(Has(out, "24, etherswitch port VLAN")) << out;
    EXPECT_TRUE(Has(out, "A load without memory skips the property.")) << out;
    EXPECT_TRUE(Has(out, "port VLAN policy, 8 bytes; then ranges")) << out;
    EXPECT_TRUE(Has(out, "trunk_vlan_ids[].start")) << out;
}

TEST_F(Props, NamesTypedFieldsAsInDocuments) {
    const std::string out = Dvsctl({"props", "com.orbeno.etherswitch.port.vlan"}).out;
    EXPECT_TRUE(Has(out, "\nvlan_id                 uint16, 0 to 4095 ")) << out;
    EXPECT_TRUE(Has(out, "\ntrunk_vlan_ids[].end    uint16, 0 to 4095, never left out ")) << out;
    EXPECT_TRUE(Has(Dvsctl({"props", "com.orbeno.etherswitch.cdp"}).out, "protocol spoken: CDP, LLDP"));
}

TEST_F(Props, EveryExampleIsAValidValue) {
    const auto document = Json(Dvsctl({"props", "*", "--json"}));
    for (const auto &property : document.at("properties").as_array()) {
        const std::string name(property.at("name").as_string());
        const std::string_view list = property.at("list").as_string();
        const std::uint32_t propClass = list == "global" ? DVS_PROP_CLASS_GLOBAL
                                        : list == "host" ? DVS_PROP_CLASS_HOST
                                                         : DVS_PROP_CLASS_PORT;
        dvs::form::NodeFlaw flaw;
        const auto node = dvs::form::NodeFromJson(property.at("example"), flaw);
        ASSERT_TRUE(node) << name;
        const auto built = dvs::typed::Build(propClass, name, *node, {8});
        EXPECT_TRUE(built.ok) << name << " " << built.field << " " << built.reason;
        EXPECT_TRUE(built.differences.empty()) << name;
    }
}

TEST_F(Props, AcceptsPatterns) {
    const std::string out = Dvsctl({"props", "*.port.vlan"}).out;
    EXPECT_TRUE(Has(out, "com.orbeno.etherswitch.port.vlan"));
    EXPECT_TRUE(Has(out, "com.orbeno.vswitch.port.vlan"));
    EXPECT_FALSE(Has(out, "teaming"));
}

TEST_F(Props, JsonHasLayoutAndTypedForm) {
    const auto document = Json(Dvsctl({"props", "com.orbeno.common.port.shaper.input", "--json"}));
    EXPECT_EQ(document.at("command"), "props");
    const auto &property = document.at("properties").at(0);
    EXPECT_EQ(property.at("list"), "port");
    EXPECT_EQ(property.at("path"), "settings/in_shaping_policy");
    EXPECT_EQ(property.at("converter").at("type"), 26);
    EXPECT_EQ(property.at("records").at(0).at("size"), 24);
    EXPECT_EQ(property.at("records").at(0).at("fields").at(1).at("offset"), 8);
    EXPECT_EQ(property.at("typed").at("members").at(1).at("unit"), "bit/s");
}

TEST_F(Props, ReturnsNotFoundForAnUnknownName) {
    EXPECT_EQ(Dvsctl({"props", "com.example.unknown"}).status, 4);
    EXPECT_EQ(Dvsctl({"props", "DEFAULT"}).status, 4);
    const Result lenient = Dvsctl({"props", "com.example.unknown", "--if-exists", "--json"});
    EXPECT_EQ(lenient.status, 0);
    EXPECT_TRUE(Json(lenient).at("properties").as_array().empty());
}

} // namespace
