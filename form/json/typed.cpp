/* SPDX-License-Identifier: Apache-2.0 */
// Trees into JSON and out of it (typed_json.h).

#include "form/json/typed.h"

#include <algorithm>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <fmt/format.h>

#include "dvs/configstore.h"
#include "form/text.h"

namespace dvs::form {

namespace {

namespace json = boost::json;
using typed::Node;

// Keeps the memory of a state with many different values within bounds: two generations of so many.
constexpr std::size_t kMostRemembered = 8192;

std::optional<Node> ItemFromJson(const json::value &value, const std::string &path, NodeFlaw &flaw) {
    Node node;
    if (value.is_bool()) {
        node.kind = Node::Kind::kBool;
        node.flag = value.get_bool();
    } else if (value.is_int64() || (value.is_uint64() && value.get_uint64() <= INT64_MAX)) {
        node.kind = Node::Kind::kNumber;
        node.number = value.to_number<std::int64_t>();
    } else if (value.is_number()) {
        flaw = {path, value.is_double() ? "it is no whole number" : "it is too large a number"};
        return std::nullopt;
    } else if (value.is_string()) {
        node.kind = Node::Kind::kText;
        node.text.assign(value.get_string().data(), value.get_string().size());
    } else if (value.is_array()) {
        node.kind = Node::Kind::kList;
        for (const json::value &element : value.get_array()) {
            auto item = ItemFromJson(element, fmt::format("{}[{}]", path, node.items.size()), flaw);
            if (!item) return std::nullopt;
            node.items.push_back(std::move(*item));
        }
    } else if (value.is_object()) {
        node.kind = Node::Kind::kObject;
        for (const auto &member : value.get_object()) {
            const std::string name(member.key());
            auto item = ItemFromJson(member.value(), path.empty() ? name : path + "." + name, flaw);
            if (!item) return std::nullopt;
            item->name = name;
            node.items.push_back(std::move(*item));
        }
    }
    return node;
}

bool BuildsAgain(const Owner &owner, const Property &property, const json::value &tree) {
    NodeFlaw flaw;
    const auto node = NodeFromJson(tree, flaw);
    if (!node) return false;
    const typed::Built built =
        typed::Build(owner.propClass, property.name, *node, {owner.version}, typed::Ask::kResult);
    return built.ok && std::ranges::equal(built.bytes, property.value);
}

} // namespace

Owner OwnerOf(const Switch &sw, const Entry &entry) {
    const std::uint32_t propClass = entry.role == Role::GlobalList ? DVS_PROP_CLASS_GLOBAL
                                    : entry.role == Role::HostList ? DVS_PROP_CLASS_HOST
                                                                   : DVS_PROP_CLASS_PORT;
    return {propClass, sw.Number(Role::Version).value_or(0)};
}

json::value NodeToJson(const Node &node) {
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
            array.emplace_back(NodeToJson(item));
        return array;
    }
    case Node::Kind::kObject: {
        json::object object;
        for (const Node &item : node.items)
            object[ValidUtf8(item.name)] = NodeToJson(item);
        return object;
    }
    case Node::Kind::kNull:
        break;
    }
    return nullptr;
}

void AddMeaning(const typed::View &view, json::object &object) {
    if (view.state == typed::State::kDamaged) object["damage"] = ValidUtf8(view.reason);
    if (view.state != typed::State::kTyped) return;
    object["typed"] = NodeToJson(view.tree);
    if (!view.summary.empty()) object["summary"] = ValidUtf8(view.summary);
}

std::optional<Node> NodeFromJson(const json::value &value, NodeFlaw &flaw) {
    return ItemFromJson(value, "", flaw);
}

TypedViews::Found &TypedViews::Find(const Owner &owner, const Property &property) {
    // Numbers first, as bytes: they have one length.
    key_.assign(reinterpret_cast<const char *>(&owner.propClass), sizeof owner.propClass);
    key_.append(reinterpret_cast<const char *>(&owner.version), sizeof owner.version);
    key_.append(property.name).push_back('\0');
    key_.append(AsText(property.value));
    if (const auto known = younger_.find(key_); known != younger_.end()) return known->second;
    if (younger_.size() >= kMostRemembered) {
        older_ = std::move(younger_);
        younger_.clear();
    }
    Found &found = younger_[key_];
    if (auto known = older_.extract(key_)) {
        found = std::move(known.mapped());
        return found;
    }
    found.view =
        typed::Describe(owner.propClass, property.name, property.value, {owner.version}, typed::Ask::kResult);
    return found;
}

bool TypedViews::IsExact(const Owner &owner, const Property &property) {
    Found &found = Find(owner, property);
    if (!found.isExact)
        found.isExact = found.view.state == typed::State::kTyped &&
                        BuildsAgain(owner, property, NodeToJson(found.view.tree));
    return *found.isExact;
}

} // namespace dvs::form
