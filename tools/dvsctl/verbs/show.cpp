/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl show`: a state as an aligned tree, as flat lines, or as JSON.

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "form/json/codec.h"
#include "form/value.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/cli/table.h"
#include "tools/dvsctl/sources/source.h"
#include "tools/dvsctl/verbs/filter.h"
#include "tools/dvsctl/verbs/show.h"
#include "tools/dvsctl/verbs/typed_fields.h"

namespace dvs::ctl {

namespace {

constexpr Column kColumns[] = {
    // name, right, by default
    {"switch"},
    {"port"},
    {"kind"},
    {"list"},
    {"name", false, true},
    {"type", false, true},
    {"size", true, true},
    {"value", false, true},
    {"offset", true},
};

struct FieldRow {
    Role role;
    const char *label;
};

constexpr FieldRow kFields[] = {
    {Role::Version, "version"},
    {Role::ClassName, "class"},
    {Role::MaxPorts, "max_ports"},
};

class Tree {
public:
    /// With `typed`, known properties are shown as the typed fields that the config store keeps them in.
    Tree(const Options &options, bool typed) : options_(options), typed_(typed), table_(kColumns, options) {
        // With a column that says where a line belongs there is no need for the lines between.
        flat_ =
            table_.Shows("switch") || table_.Shows("port") || table_.Shows("list") || table_.Shows("kind");
        offsets_ = table_.Shows("offset");
    }

    void Add(const Switch &sw) {
        switch_ = &sw;
        std::string summary = fmt::format("{}, {}", Count(sw.PortCount(), "port"),
                                          Count(sw.PropertyCount(), "property", "properties"));
        if (!sw.alias.empty()) summary = Quote(sw.alias) + ", " + summary;
        if (sw.isOther) summary = "not loaded: its type has none of the bits a load asks for";
        Header(0, "switch " + ShowName(sw.name), sw.type, std::move(summary));
        for (const Entry &entry : sw.entries)
            AddEntry(entry);
    }

    void Write(Output &out) { table_.Write(out); }

private:
    void AddEntry(const Entry &entry) {
        entry_ = &entry;
        const std::string count = Count(entry.list.size(), "property", "properties");
        switch (entry.role) {
        case Role::Version:
        case Role::MaxPorts:
        case Role::ClassName:
            AddField(entry);
            break;
        case Role::GlobalList:
            Header(1, "global", entry.type, count);
            break;
        case Role::HostList:
            Header(1, "host", entry.type, count);
            break;
        case Role::Port: {
            const std::string alias = entry.alias.empty() ? "" : Quote(entry.alias) + ", ";
            Header(1, "port " + ShowName(entry.name), entry.type,
                   alias + ShowKind(entry.kind) + ", " + count);
            break;
        }
        case Role::Other:
            Line(1, entry, ShowName(entry.name), ShowValue(entry.value, options_.full));
            break;
        }
        for (const Property &property : entry.list)
            AddProperty(entry, property);
        entry_ = nullptr;
    }

    void AddProperty(const Entry &entry, const Property &property) {
        const TypedText text =
            typed_ ? DescribeProperty(views_, OwnerOf(*switch_, entry), property) : TypedText();
        std::string value = text.summary.empty() ? ShowValue(property.value, options_.full) : text.summary;
        if (!text.damage.empty()) value += " (does not fit: " + text.damage + ")";
        Line(2, property, ShowName(property.name), std::move(value));
        if (flat_) return;
        for (const FieldLine &line : text.lines)
            table_.Add({{}, {}, {}, {}, {Indented(3 + line.depth, line.name)}, {}, {}, {line.value}, {}});
    }

    void AddField(const Entry &entry) {
        for (const FieldRow &row : kFields)
            if (row.role == entry.role) Line(1, entry, row.label, ShowField(entry, options_.full));
    }

    void Header(std::size_t depth, const std::string &name, std::uint32_t type, std::string value) {
        if (flat_) return;
        const std::string unusual = type == kStateType ? "" : fmt::format("0x{:02x}", type);
        table_.Add({{},
                    {},
                    {},
                    {},
                    {Indented(depth, name), depth == 0 ? Style::Heading : Style::Name},
                    {unusual, Style::Dim},
                    {},
                    {std::move(value), Style::Dim},
                    {}});
    }

    void Line(std::size_t depth, const Property &property, const std::string &name, std::string value) {
        const bool isPort = entry_ && entry_->role == Role::Port;
        const char *list = !entry_ || &property == entry_     ? ""
                           : isPort                           ? "port"
                           : entry_->role == Role::GlobalList ? "global"
                                                              : "host";
        // What no column shows is not made.
        table_.Add({{flat_ ? ShowName(switch_->name) : ""},
                    {flat_ && isPort ? ShowName(entry_->name) : ""},
                    {flat_ && isPort ? ShowKind(entry_->kind) : ""},
                    {flat_ ? list : ""},
                    {flat_ ? name : Indented(depth, name)},
                    {fmt::format("0x{:02x}", property.type), Style::Dim},
                    {std::to_string(property.value.size()), Style::Dim},
                    {std::move(value)},
                    {offsets_ ? std::to_string(property.offset) : ""}});
    }

    static std::string Indented(std::size_t depth, const std::string &name) {
        return std::string(depth * 2, ' ') + name;
    }

    const Options &options_;
    bool typed_;
    TypedViews views_;
    Table table_;
    bool flat_ = false, offsets_ = false;
    const Switch *switch_ = nullptr;
    const Entry *entry_ = nullptr;
};

} // namespace

std::string ShowKind(std::uint32_t kind) {
    return KindName(kind) ? KindName(kind) : fmt::format("kind {}", kind);
}

std::string ShowField(const Entry &entry, bool full) {
    if (entry.role == Role::ClassName) {
        const std::string_view all = AsText(entry.value);
        const std::string_view text = all.substr(0, all.find('\0'));
        if (all.find_first_not_of('\0', text.size()) == std::string_view::npos) return ShowName(text);
    }
    if (const auto number = AsNumber(entry.value)) return std::to_string(*number);
    return ShowValue(entry.value, full);
}

StateCount CountState(const State &state) {
    StateCount count;
    count.switches = state.switches.size();
    for (const Switch &sw : state.switches) {
        count.ports += sw.PortCount();
        count.properties += sw.PropertyCount();
    }
    return count;
}

std::string ShowCount(const StateCount &count) {
    return fmt::format("{}, {}, {}", Count(count.switches, "switch", "switches"), Count(count.ports, "port"),
                       Count(count.properties, "property", "properties"));
}

boost::json::object CountJson(const StateCount &count) {
    boost::json::object object;
    object["switches"] = count.switches;
    object["ports"] = count.ports;
    object["properties"] = count.properties;
    return object;
}

Exit RunShow(Context &context) {
    const Options &options = context.options;
    const auto source = OpenSource(options.source);
    LoadedState loaded = LoadState(context, *source);
    ApplyFilter(options, source->Name(), loaded.state);
    const StateCount count = CountState(loaded.state);
    if (options.json) {
        boost::json::object document = Envelope("show");
        document["source"] = ValidUtf8(source->Name());
        document["summary"] = CountJson(count);
        document["switches"] =
            SwitchesToJson(loaded.state, options.raw ? TypedForm::None : TypedForm::Beside);
        context.out.Json(std::move(document));
        return Exit::Done;
    }
    Tree tree(options, !options.raw);
    for (const Switch &sw : loaded.state.switches)
        tree.Add(sw);
    if (!options.noHeadings && !options.columns)
        context.out.Remark(fmt::format("{} {}\n", ShowLead(*source), ShowCount(count)));
    if (count.switches > 0) tree.Write(context.out);
    return Exit::Done;
}

} // namespace dvs::ctl
