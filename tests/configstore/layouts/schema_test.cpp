/* SPDX-License-Identifier: Apache-2.0 */
// The store forms of the registry and the config store's schema describe the same documents.

#include <gtest/gtest.h>

#include <boost/json.hpp>

#include <fstream>
#include <set>
#include <sstream>

#include "configstore/layouts/registry.h"

using namespace dvs;
using namespace dvs::layout;
namespace json = boost::json;

namespace {

class Schema {
public:
    Schema() {
        std::ifstream file(DVS_SOURCE_DIR "/platform/embedded/schemas/network_vds.switches.json");
        std::stringstream text;
        text << file.rdbuf();
        root_ = json::parse(text.str());
    }

    [[nodiscard]] const json::object &Root() const { return root_.as_object(); }

    // Follows a reference to a definition.
    [[nodiscard]] const json::object &Resolve(const json::value &node) const {
        const json::object &object = node.as_object();
        const auto *reference = object.if_contains("$ref");
        if (!reference) return object;
        const std::string name(reference->as_string());
        return Root().at("definitions").at(name.substr(name.rfind('/') + 1)).as_object();
    }

    // A member of an object; null where the schema knows none of that name.
    [[nodiscard]] const json::object *Member(const json::object &object, const char *name) const {
        const auto *properties = object.if_contains("properties");
        const auto *member = properties ? properties->as_object().if_contains(name) : nullptr;
        return member ? &Resolve(*member) : nullptr;
    }

    [[nodiscard]] const json::object &Instance(const json::object &list) const {
        return Resolve(list.at("additionalProperties"));
    }

private:
    json::value root_;
};

struct Numbers {
    Form form;
    double least, most;
};
constexpr Numbers kNumbers[] = {
    {Form::kUint16, 0, UINT16_MAX}, {Form::kUint32, 0, UINT32_MAX}, {Form::kInt, INT32_MIN, INT32_MAX}};

const char *TypeOf(Form form) {
    switch (form) {
    case Form::kBool:
        return "boolean";
    case Form::kText:
        return "string";
    case Form::kTexts:
    case Form::kInts:
        return "array";
    case Form::kObject:
    case Form::kInstances:
        return "object";
    default:
        return "integer";
    }
}

struct StoreForms : testing::Test {
    void Compare(const StoreField &field, const json::object &node, const std::string &path) {
        EXPECT_EQ(TypeOf(field.form), node.at("type").as_string()) << path;
        for (const Numbers &each : kNumbers) {
            if (field.form != each.form) continue;
            // A vswitch's speed is written wider than an etherswitch's, into the same field.
            EXPECT_GE(each.least, node.at("minimum").to_number<double>()) << path;
            EXPECT_LE(each.most, node.at("maximum").to_number<double>()) << path;
        }
        if (field.domain && node.contains("enum")) {
            std::set<std::string> known;
            for (const auto &text : node.at("enum").as_array())
                known.emplace(text.as_string());
            std::set<std::string> named;
            for (uint32_t i = 0; i < field.domain->textCount; ++i) {
                if (field.domain->texts[i]) named.emplace(field.domain->texts[i]);
            }
            EXPECT_EQ(known, named) << path;
        }
        const json::object &object = field.form == Form::kInstances ? schema.Instance(node) : node;
        for (const StoreField &member : field.members) {
            const json::object *found = schema.Member(object, member.name);
            ASSERT_NE(nullptr, found) << path << "." << member.name;
            Compare(member, *found, path + "." + member.name);
        }
    }

    Schema schema;
};

TEST_F(StoreForms, AgreeWithTheSchema) {
    for (uint32_t propClass = 0; propClass <= 2; ++propClass) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            const TypeInfo *info = FindType(ConverterTypeOf(*row));
            if (info->form->form == Form::kNone || info->type == dvs::ConverterType::kPortPools)
                continue; // written nowhere
            const json::object *node = &schema.Root();
            if (propClass == DVS_PROP_CLASS_PORT) node = &schema.Instance(*schema.Member(*node, "ports"));
            for (uint32_t i = 0; i < row->depth && node; ++i)
                node = schema.Member(*node, row->path[i]);
            ASSERT_NE(nullptr, node) << row->key;
            // The form of a health check is that of its instance.
            Compare(*info->form,
                    info->type == dvs::ConverterType::kHealthCheck ? schema.Instance(*node) : *node,
                    row->key);
        }
    }
}

} // namespace
