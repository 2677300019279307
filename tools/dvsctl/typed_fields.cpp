/* SPDX-License-Identifier: Apache-2.0 */
// The typed view's trees as lines and as JSON (typed_fields.h).

#include "tools/dvsctl/typed_fields.h"

#include <algorithm>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "configstore/typed/typed_value.h"
#include "dvs/configstore.h"
#include "tools/dvsctl/json_codec.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;
using typed::Node;

bool IsScalar(const Node &node) {
    return node.kind != Node::Kind::kList && node.kind != Node::Kind::kObject;
}

std::string ShowScalar(const Node &node) {
    switch (node.kind) {
    case Node::Kind::kBool:
        return node.flag ? "true" : "false";
    case Node::Kind::kNumber:
        return std::to_string(node.number) + (*node.unit ? std::string(" ") + node.unit : "");
    case Node::Kind::kText:
        return Quote(node.text);
    default:
        return "null";
    }
}

bool FitsOneLine(const Node &node) {
    return IsScalar(node) ||
           (node.kind == Node::Kind::kList && std::all_of(node.items.begin(), node.items.end(), IsScalar));
}

std::string ShowLine(const Node &node) {
    if (IsScalar(node)) return ShowScalar(node);
    std::string text;
    for (const Node &item : node.items)
        text += (text.empty() ? "" : ", ") + ShowScalar(item);
    return "[" + text + "]";
}

void AddLines(const Node &node, std::size_t depth, std::vector<FieldLine> &lines) {
    std::size_t index = 0;
    for (const Node &item : node.items) {
        const std::string name =
            node.kind == Node::Kind::kList ? fmt::format("[{}]", index++) : ShowName(item.name);
        if (FitsOneLine(item)) {
            lines.push_back({depth, name, ShowLine(item)});
            continue;
        }
        lines.push_back({depth, name, item.items.empty() ? "{}" : ""});
        AddLines(item, depth + 1, lines);
    }
}

json::value ToJson(const Node &node) {
    switch (node.kind) {
    case Node::Kind::kBool:
        return node.flag;
    case Node::Kind::kNumber:
        return node.number;
    case Node::Kind::kText:
        return json::value(ValidUtf8(node.text));
    case Node::Kind::kList: {
        json::array array;
        for (const Node &item : node.items)
            array.emplace_back(ToJson(item));
        return array;
    }
    case Node::Kind::kObject: {
        json::object object;
        for (const Node &item : node.items)
            object[ValidUtf8(item.name)] = ToJson(item);
        return object;
    }
    case Node::Kind::kNull:
        break;
    }
    return nullptr;
}

typed::View ViewOf(const Switch &sw, const Entry &entry, const Property &property) {
    const std::uint32_t propClass = entry.role == Role::GlobalList ? DVS_PROP_CLASS_GLOBAL
                                    : entry.role == Role::HostList ? DVS_PROP_CLASS_HOST
                                                                   : DVS_PROP_CLASS_PORT;
    return typed::Describe(propClass, property.name, property.value, {sw.Number(Role::Version).value_or(0)});
}

void AddTo(json::value &to, const typed::View &view) {
    json::object &object = to.as_object();
    if (view.state == typed::State::kDamaged) object["damage"] = ValidUtf8(view.reason);
    if (view.state != typed::State::kTyped) return;
    object["fields"] = ToJson(view.tree);
    if (!view.summary.empty()) object["summary"] = ValidUtf8(view.summary);
}

// The array in which the JSON form keeps the properties of an entry.
json::array *PropertiesOf(json::object &sw, const Entry &entry, std::size_t index, std::size_t portIndex) {
    json::value *place = nullptr;
    if (json::value *entries = sw.if_contains("entries"))
        place = entries->as_array().at(index).as_object().if_contains("properties");
    else if (entry.role == Role::Port)
        place = sw.at("ports").as_array().at(portIndex).as_object().if_contains("properties");
    else
        place = sw.if_contains(entry.role == Role::GlobalList ? "global" : "host");
    return place ? place->if_array() : nullptr;
}

} // namespace

TypedText DescribeProperty(const Switch &sw, const Entry &entry, const Property &property) {
    const typed::View view = ViewOf(sw, entry, property);
    TypedText text;
    if (view.state == typed::State::kDamaged) text.damage = Escape(view.reason);
    if (view.state != typed::State::kTyped) return text;
    text.summary = FitsOneLine(view.tree) ? ShowLine(view.tree)
                   : view.summary.empty() ? Count(view.tree.items.size(), "field")
                                          : Escape(view.summary);
    if (!FitsOneLine(view.tree)) AddLines(view.tree, 0, text.lines);
    return text;
}

void AddTypedFields(const State &state, json::array &switches) {
    for (std::size_t i = 0; i < state.switches.size(); ++i) {
        const Switch &sw = state.switches[i];
        json::object &object = switches.at(i).as_object();
        std::size_t port = 0;
        for (std::size_t j = 0; j < sw.entries.size(); ++j) {
            const Entry &entry = sw.entries[j];
            json::array *properties = entry.IsList() ? PropertiesOf(object, entry, j, port) : nullptr;
            port += entry.role == Role::Port;
            // A port's list may be shown without the property that carries its kind.
            std::size_t at = 0;
            for (const Property &property : entry.list) {
                if (!properties || at >= properties->size()) break;
                const json::value *name = properties->at(at).as_object().if_contains("name");
                if (!name || *name != NameToJson(property.name)) continue;
                AddTo(properties->at(at++), ViewOf(sw, entry, property));
            }
        }
    }
}

} // namespace dvs::ctl
