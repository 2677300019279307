/* SPDX-License-Identifier: Apache-2.0 */
// Differences on their way out: as a list for people, as a table, as JSON.

#include <algorithm>
#include <array>
#include <map>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "configstore/layouts/registry.h"
#include "configstore/layouts/walk.h"
#include "dvs/configstore.h"
#include "dvsstate/versions.h"
#include "form/json/codec.h"
#include "form/value.h"
#include "tools/dvsctl/cli/options.h"
#include "tools/dvsctl/cli/output.h"
#include "tools/dvsctl/cli/table.h"
#include "tools/dvsctl/verbs/changes.h"
#include "tools/dvsctl/verbs/show.h"
#include "tools/dvsctl/verbs/typed_fields.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

struct KindRow {
    const char *word;
    const char *sign;
    Style style;
};

// In the order of ChangeKind.
constexpr KindRow kKinds[] = {
    {"added", "+", Style::Added},
    {"removed", "-", Style::Removed},
    {"changed", "~", Style::Changed},
    {"reordered", "%", Style::Changed},
};

// In the order of Subject.
constexpr const char *kSubjects[] = {"switch", "field", "list", "port", "property", "entry"};

const KindRow &RowOf(const Change &change) {
    return kKinds[static_cast<std::size_t>(change.kind)];
}

const char *SubjectWord(const Change &change) {
    return kSubjects[static_cast<std::size_t>(change.subject)];
}

const Property &Either(const Change &change) {
    return change.before ? *change.before : *change.after;
}

const char *FieldLabel(const Property &field) {
    const Role role = static_cast<const Entry &>(field).role;
    return role == Role::Version ? "version" : role == Role::ClassName ? "class" : "max_ports";
}

std::string Name(const Change &change) {
    if (!change.before && !change.after) return "";
    if (change.subject == Subject::Field) return FieldLabel(Either(change));
    return ShowName(Either(change).name);
}

Owner OwnerOf(const Change &change, const Property *side) {
    const Switch &sw = side == change.after && change.now ? *change.now : *change.sw;
    const std::string_view list = change.list;
    const std::uint32_t propClass = list == "global" ? DVS_PROP_CLASS_GLOBAL
                                    : list == "host" ? DVS_PROP_CLASS_HOST
                                                     : DVS_PROP_CLASS_PORT;
    return {propClass, sw.Number(Role::Version).value_or(0)};
}

/// Changes in words.
class Words {
public:
    explicit Words(const Options &options) : options_(options) {}

    /// What one side holds, for the column or the arrow.
    std::string Side(const Change &change, const Property *side);

    struct Both {
        std::string text;                ///< "VLAN 100 -> VLAN 200 (type 0x10 -> 0x20)": only what differs
        std::vector<std::string> fields; ///< fields of a typed value that differ, one line each
    };
    Both Sides(const Change &change);

    TypedText Typed(const Change &change, const Property *side) {
        if (!side || options_.raw || change.subject != Subject::Property) return {};
        return DescribeProperty(views_, OwnerOf(change, side), *side);
    }

private:
    const Options &options_;
    TypedViews views_;
};

std::string Words::Side(const Change &change, const Property *side) {
    if (!side) return "";
    switch (change.subject) {
    case Subject::Switch: {
        const auto &sw = static_cast<const Switch &>(*side);
        return fmt::format("{}, {}, {}", ShowName(sw.ClassName()), Count(sw.PortCount(), "port"),
                           Count(sw.PropertyCount(), "property", "properties"));
    }
    case Subject::Field:
        return ShowField(static_cast<const Entry &>(*side), options_.full);
    case Subject::Port: {
        const auto &port = static_cast<const Entry &>(*side);
        return fmt::format("{}, {}", ShowKind(port.kind), Count(port.list.size(), "property", "properties"));
    }
    case Subject::List:
        return Count(static_cast<const Entry &>(*side).list.size(), "property", "properties");
    case Subject::Property:
    case Subject::Entry:
        break;
    }
    const TypedText typed = Typed(change, side);
    if (!typed.summary.empty()) return typed.summary;
    const std::string value = ShowValue(side->value, options_.full);
    return typed.damage.empty() ? value : value + " (does not fit: " + typed.damage + ")";
}

// The fields by their whole names: "failure_criteria.check_beacon".
std::map<std::string, std::string> FieldsByName(const TypedText &typed) {
    std::map<std::string, std::string> fields;
    std::vector<std::string> above;
    for (const FieldLine &line : typed.lines) {
        above.resize(line.depth);
        std::string name = above.empty() ? "" : above.back();
        name += (name.empty() || line.name.starts_with('[') ? "" : ".") + line.name;
        above.push_back(name);
        if (!line.value.empty()) fields[name] = line.value;
    }
    return fields;
}

std::vector<std::string> FieldChanges(const TypedText &before, const TypedText &after) {
    const auto left = FieldsByName(before), right = FieldsByName(after);
    if (left.empty() || right.empty()) return {};
    std::vector<std::string> lines;
    for (const auto &[name, value] : left) {
        const auto now = right.find(name);
        if (now == right.end())
            lines.push_back(fmt::format("- {}: {}", name, value));
        else if (now->second != value)
            lines.push_back(fmt::format("~ {}: {} -> {}", name, value, now->second));
    }
    for (const auto &[name, value] : right)
        if (!left.contains(name)) lines.push_back(fmt::format("+ {}: {}", name, value));
    return lines;
}

// The fields of the records that differ although they mean the same.
std::vector<std::string> RecordChanges(const Owner &owner, const Property &before, const Property &after) {
    const layout::Record *record =
        layout::RecordOf(owner.propClass, before.name, state::HasWidePortRecords(owner.version));
    if (!record) return {};
    std::map<std::string, std::string> left;
    (void)layout::Walk(*record, before.value,
                       [&](const layout::Item &item) { left[item.path] = layout::TextOf(item); });
    std::vector<std::string> lines;
    (void)layout::Walk(*record, after.value, [&](const layout::Item &item) {
        const auto was = left.find(item.path);
        const std::string now = layout::TextOf(item);
        if (was != left.end() && was->second != now)
            lines.push_back(Escape(fmt::format("~ {} of the record: {} -> {}", item.path, was->second, now)));
    });
    if (lines.empty() && before.value.size() != after.value.size())
        lines.push_back(
            fmt::format("~ size of the record: {} -> {} bytes", before.value.size(), after.value.size()));
    return lines;
}

Words::Both Words::Sides(const Change &change) {
    if (change.kind == ChangeKind::Reordered) return {"the order differs", {}};
    std::string before = Side(change, change.before), after = Side(change, change.after);
    if (!change.before || !change.after) return {before + after, {}};
    Both both;
    both.fields = FieldChanges(Typed(change, change.before), Typed(change, change.after));
    if (before == after && both.fields.empty() && !Typed(change, change.before).summary.empty())
        both.fields = RecordChanges(OwnerOf(change, change.before), *change.before, *change.after);
    if (before == after && both.fields.empty() &&
        AsText(change.before->value) != AsText(change.after->value) &&
        (change.subject == Subject::Property || change.subject == Subject::Entry)) {
        // What differs lies behind the cut of a long value, or in bytes that its fields do not show.
        before = ShowValue(change.before->value, true);
        after = ShowValue(change.after->value, true);
    }
    both.text = before == after ? before : before + " -> " + after;
    if (change.before->type != change.after->type)
        both.text += fmt::format(" (type 0x{:02x} -> 0x{:02x})", change.before->type, change.after->type);
    return both;
}

std::string PortTitle(const Entry &port) {
    return fmt::format("port {} ({})", ShowName(port.name), ShowKind(port.kind));
}

std::string SwitchTitle(const Switch &sw) {
    const std::string_view alias = sw.alias;
    return "switch " + ShowName(sw.name) + (alias.empty() ? "" : " " + Quote(alias));
}

/// Prints the headings under which a change stands, each once.
class Listing {
public:
    Listing(const Options &options, Output &out) : words_(options), out_(out) {}

    void Add(const Change &change) {
        const bool isSwitch = change.subject == Subject::Switch;
        if (!isSwitch) Enter(0, switch_, change.sw, SwitchTitle(*change.sw));
        if (isSwitch) switch_ = nullptr;
        if (isSwitch || !change.sw) container_ = nullptr;
        if (change.subject == Subject::Property) {
            if (change.port)
                Enter(1, container_, change.port, PortTitle(*change.port));
            else
                Enter(1, container_, static_cast<const void *>(change.list), change.list);
        } else {
            container_ = nullptr;
        }
        const std::size_t depth = isSwitch ? 0 : change.subject == Subject::Property ? 2 : 1;
        const Words::Both sides = words_.Sides(change);
        const std::string line = RowOf(change).sign + std::string(" ") + Label(change) + sides.text;
        out_.Write(std::string(depth * 2, ' ') + out_.Paint(RowOf(change).style, line) + "\n");
        for (const std::string &field : sides.fields)
            out_.Write(std::string(depth * 2 + 2, ' ') + out_.Paint(RowOf(change).style, field) + "\n");
    }

private:
    static std::string Label(const Change &change) {
        const std::string name = Name(change);
        const std::string what =
            change.subject == Subject::Switch ? "switch " + name
            : change.subject == Subject::Port ? "port " + name
            : change.subject == Subject::List ? std::string("list ") + change.list
            : name.empty() && change.kind == ChangeKind::Reordered && change.subject == Subject::Entry
                ? "entries"
                : name;
        return what.empty() || what == "switch " ? what : what + ": ";
    }

    void Enter(std::size_t depth, const void *&current, const void *next, const std::string &title) {
        if (current == next) return;
        current = next;
        if (depth == 0) container_ = nullptr;
        out_.Write(std::string(depth * 2, ' ') +
                   out_.Paint(depth == 0 ? Style::Heading : Style::Name, title) + "\n");
    }

    Words words_;
    Output &out_;
    const void *switch_ = nullptr;
    const void *container_ = nullptr;
};

constexpr Column kColumns[] = {
    // name, right, by default
    {"change", false, true}, {"what", false, true}, {"switch", false, true}, {"port", false, true},
    {"list", false, true},   {"name", false, true}, {"before", false, true}, {"after", false, true},
    {"type-before"},         {"type-after"},
};

void WriteTable(const std::vector<Change> &changes, const Options &options, Output &out) {
    Table table(kColumns, options);
    Words words(options);
    const auto type = [](const Property *side) {
        return side ? fmt::format("0x{:02x}", side->type) : std::string();
    };
    for (const Change &change : changes)
        table.Add({{RowOf(change).word, RowOf(change).style},
                   {SubjectWord(change)},
                   {change.sw ? ShowName(change.sw->name) : ""},
                   {change.port ? ShowName(change.port->name) : ""},
                   {change.list},
                   {Name(change)},
                   {words.Side(change, change.before)},
                   {words.Side(change, change.after)},
                   {type(change.before)},
                   {type(change.after)}});
    table.Write(out);
}

json::value SideJson(const Change &change, const Property &side) {
    switch (change.subject) {
    case Subject::Port: {
        const auto &port = static_cast<const Entry &>(side);
        json::object object;
        object["kind"] = ShowKind(port.kind);
        object["properties"] = port.list.size();
        return object;
    }
    case Subject::Switch: {
        const auto &sw = static_cast<const Switch &>(side);
        json::object object;
        object["class"] = ValidUtf8(sw.ClassName());
        object["ports"] = sw.PortCount();
        object["properties"] = sw.PropertyCount();
        return object;
    }
    case Subject::List: {
        json::object object;
        object["properties"] = static_cast<const Entry &>(side).list.size();
        return object;
    }
    case Subject::Field: {
        const auto &field = static_cast<const Entry &>(side);
        if (field.role == Role::ClassName)
            return json::value(ValidUtf8(AsText(field.value).substr(0, AsText(field.value).find('\0'))));
        if (const auto number = AsNumber(field.value)) return *number;
        break;
    }
    case Subject::Property:
    case Subject::Entry:
        break;
    }
    return ValueToJson(side.value);
}

// Beside the value, what it means.
void AddTyped(json::object &object, const Change &change, const Property *side, const char *name,
              TypedViews &views) {
    if (!side) return;
    const typed::View &view = views.Of(OwnerOf(change, side), *side);
    if (view.state == typed::State::kTyped) object[fmt::format("typed_{}", name)] = NodeToJson(view.tree);
    if (view.state == typed::State::kDamaged) object[fmt::format("damage_{}", name)] = ValidUtf8(view.reason);
}

json::object ChangeJson(const Change &change, TypedViews *views) {
    json::object object;
    object["change"] = RowOf(change).word;
    object["what"] = SubjectWord(change);
    if (change.sw) object["switch"] = NameToJson(change.sw->name);
    if (change.port) {
        object["port"] = NameToJson(change.port->name);
        object["kind"] = ShowKind(change.port->kind);
    }
    if (*change.list) object["list"] = change.list;
    if (change.kind == ChangeKind::Reordered) return object;
    if (change.subject == Subject::Field)
        object["name"] = FieldLabel(Either(change));
    else if (change.subject != Subject::Switch && change.subject != Subject::Port &&
             change.subject != Subject::List)
        object["name"] = NameToJson(Either(change).name);
    if (change.before) object["before"] = SideJson(change, *change.before);
    if (change.after) object["after"] = SideJson(change, *change.after);
    if (views && change.subject == Subject::Property) {
        AddTyped(object, change, change.before, "before", *views);
        AddTyped(object, change, change.after, "after", *views);
    }
    if (change.before && change.after && change.before->type != change.after->type) {
        object["type_before"] = change.before->type;
        object["type_after"] = change.after->type;
    }
    return object;
}

} // namespace

std::string ShowChangeCount(const std::vector<Change> &changes) {
    std::array<std::size_t, std::size(kKinds)> counts{};
    for (const Change &change : changes)
        ++counts[static_cast<std::size_t>(change.kind)];
    std::string text;
    for (std::size_t i = 0; i < counts.size(); ++i)
        if (counts[i] > 0)
            text += fmt::format("{}{} {}", text.empty() ? "" : ", ", counts[i], kKinds[i].word);
    return text.empty() ? "no differences" : text;
}

void WriteChanges(const std::vector<Change> &changes, const Options &options, Output &out) {
    if (options.columns) {
        WriteTable(changes, options, out);
        return;
    }
    Listing listing(options, out);
    for (const Change &change : changes)
        listing.Add(change);
}

json::array ChangesJson(const std::vector<Change> &changes, const Options &options) {
    TypedViews views;
    json::array array;
    for (const Change &change : changes)
        array.emplace_back(ChangeJson(change, options.raw ? nullptr : &views));
    return array;
}

} // namespace dvs::ctl
