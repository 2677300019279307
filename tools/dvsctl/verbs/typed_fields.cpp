/* SPDX-License-Identifier: Apache-2.0 */
// The typed view's trees as lines (typed_fields.h).

#include "tools/dvsctl/verbs/typed_fields.h"

#include <algorithm>

#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "form/value.h"

namespace dvs::ctl {

namespace {

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

} // namespace

TypedText DescribeProperty(TypedViews &views, const Owner &owner, const Property &property) {
    const typed::View &view = views.Of(owner, property);
    TypedText text;
    if (view.state == typed::State::kDamaged) text.damage = Escape(view.reason);
    if (view.state != typed::State::kTyped) return text;
    const std::string_view bytes = AsText(property.value);
    if (view.tree.kind == Node::Kind::kText && bytes.size() == view.tree.text.size() + 1 &&
        bytes.starts_with(view.tree.text) && LookAt(property.value).form == ValueForm::Text)
        return text;
    text.summary = FitsOneLine(view.tree) ? ShowLine(view.tree)
                   : view.summary.empty() ? Count(view.tree.items.size(), "field")
                                          : Escape(view.summary);
    if (!FitsOneLine(view.tree)) AddLines(view.tree, 0, text.lines);
    return text;
}

} // namespace dvs::ctl
