/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl props`: every known property, in a table or explained one by one, out of the library's tables.

#include <algorithm>
#include <set>
#include <vector>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/serialize.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "configstore/layouts/document.h"
#include "configstore/layouts/registry.h"
#include "form/text.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/cli/table.h"
#include "tools/dvsctl/verbs/generate_values.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;
using layout::Field;
using layout::Form;
using layout::Part;
using layout::Record;
using layout::StoreField;

struct ClassRow {
    std::uint32_t propClass;
    const char *name;
};
constexpr ClassRow kClasses[] = {
    {DVS_PROP_CLASS_GLOBAL, "global"},
    {DVS_PROP_CLASS_HOST, "host"},
    {DVS_PROP_CLASS_PORT, "port"},
};

struct Known {
    const char *list;
    const DVSProp2ConfigEntry *row;
    const layout::TypeInfo *type;
    const char *meaning;
};

// Without the DEFAULT rows, which stand for every other key; a key with two rows is one property.
std::vector<Known> AllKnown() {
    std::vector<Known> all;
    for (const ClassRow &each : kClasses) {
        std::set<std::string_view> seen;
        for (const auto *row = GetConfigMap(static_cast<int>(each.propClass)); row->key; ++row) {
            const layout::TypeInfo *type = layout::FindType(ConverterTypeOf(*row));
            if (!type || !layout::FindProperty(each.propClass, row->key) || !seen.insert(row->key).second)
                continue;
            const char *meaning = layout::MeaningOf(each.propClass, row->key);
            all.push_back({each.name, row, type, meaning ? meaning : ""});
        }
    }
    return all;
}

// The document's words without its marks.
std::string Plain(std::string text) {
    std::erase_if(text, [](char c) { return c == '`' || c == '*'; });
    return text;
}

std::string Extent(const Field &field) {
    return field.width ? std::to_string(field.width) : "rest";
}

// What is shared by text and JSON walks: records below a record, each once.
void CollectRecords(const Record &record, std::vector<const Record *> &records) {
    if (std::ranges::find(records, &record) != records.end()) return;
    records.push_back(&record);
    for (const Part &part : record.parts) {
        CollectRecords(*part.element, records);
        for (const layout::Variant &variant : part.variants)
            CollectRecords(*variant.element, records);
    }
}

std::vector<const Record *> RecordsOf(const layout::TypeInfo &type) {
    std::vector<const Record *> records;
    CollectRecords(*type.record, records);
    CollectRecords(*type.wide, records);
    return records;
}

json::object RecordJson(const Record &record) {
    json::array fields, parts;
    for (const Field &field : record.fields) {
        json::object object{{"name", field.name}, {"offset", field.offset}};
        if (field.width) object["size"] = field.width;
        object["kind"] = layout::Word(field.kind);
        object["meaning"] = field.meaning;
        if (const std::string domain = Plain(layout::DomainText(field)); !domain.empty())
            object["values"] = domain.substr(domain.find_first_not_of(": "));
        fields.emplace_back(std::move(object));
    }
    for (const Part &part : record.parts) {
        json::object object{{"name", part.name},
                            {"record", part.element->name},
                            {"count", Plain(layout::CountText(part))},
                            {"meaning", part.meaning}};
        json::array variants;
        for (const layout::Variant &variant : part.variants)
            variants.emplace_back(json::object{{"record", variant.element->name},
                                               {"counted_by", variant.share},
                                               {"field", variant.field},
                                               {"value", variant.value}});
        if (!variants.empty()) object["variants"] = std::move(variants);
        parts.emplace_back(std::move(object));
    }
    return {{"name", record.name},
            {"size", record.size},
            {"fields", std::move(fields)},
            {"parts", std::move(parts)}};
}

json::object FormJson(const StoreField &field, const char *name) {
    json::object object{{"name", name}, {"form", layout::Word(field.form)}, {"meaning", field.meaning}};
    if (*field.unit) object["unit"] = field.unit;
    if (field.maxText) object["max_bytes"] = field.maxText;
    if (field.id) object["instance_id"] = field.id;
    if (field.isNeeded) object["is_needed"] = true;
    if (field.rule == layout::Rule::kVlan) object["maximum"] = 4095;
    if (field.domain) {
        json::array values;
        for (std::uint32_t i = 0; i < field.domain->textCount; ++i)
            if (field.domain->texts[i]) values.emplace_back(field.domain->texts[i]);
        object["values"] = std::move(values);
    }
    if (!field.members.empty()) {
        json::array members;
        for (const StoreField &member : field.members)
            members.emplace_back(FormJson(member, member.name));
        object["members"] = std::move(members);
    }
    return object;
}

json::object KnownJson(const Known &known) {
    json::array records;
    for (const Record *record : RecordsOf(*known.type))
        records.emplace_back(RecordJson(*record));
    json::object object{{"name", known.row->key}, {"list", known.list}, {"path", layout::PathOf(*known.row)}};
    object["converter"] =
        json::object{{"type", static_cast<std::uint32_t>(known.type->type)}, {"name", known.type->name}};
    object["meaning"] = known.meaning;
    if (*known.type->quirks) object["quirks"] = known.type->quirks;
    object["records"] = std::move(records);
    object["typed"] = FormJson(*known.type->form, known.row->path[known.row->depth - 1]);
    object["example"] = ExampleOf(known.row->key);
    return object;
}

constexpr Column kColumns[] = {
    // name, right, by default
    {"list", false, true},
    {"name", false, true},
    {"path", false, true},
    {"type", true},
    {"converter"},
    {"size", true},
    {"form"},
    {"quirks"},
    {"meaning", false, true},
};

void WriteTable(const std::vector<Known> &all, Context &context) {
    Table table(kColumns, context.options);
    for (const Known &known : all) {
        const Record &record = *known.type->record;
        const bool isOpen = !record.parts.empty() || (!record.fields.empty() && !record.fields.back().width);
        table.Add({{known.list},
                   {known.row->key, Style::Name},
                   {layout::PathOf(*known.row)},
                   {std::to_string(static_cast<std::uint32_t>(known.type->type))},
                   {known.type->name},
                   {fmt::format("{}{}", record.size, isOpen ? "+" : "")},
                   {layout::Word(known.type->form->form)},
                   {known.type->quirks},
                   {known.meaning, Style::Dim}});
    }
    table.Write(context.out);
}

constexpr Column kLayoutColumns[] = {
    {"offset", true, true}, {"size", true, true},     {"field", false, true},
    {"kind", false, true},  {"meaning", false, true},
};
constexpr Column kFormColumns[] = {
    {"typed", false, true},
    {"form", false, true},
    {"meaning", false, true},
};

void WriteRecord(const Record &record, Context &context) {
    Output &out = context.out;
    std::string title = record.name;
    if (record.size) title += fmt::format(", {} bytes", record.size);
    for (const Part &part : record.parts)
        title += fmt::format("; then {}: {}, each a record \"{}\", {}", part.name, part.meaning,
                             part.element->name, Plain(layout::CountText(part)));
    out.Write("\n  " + title + "\n");
    for (const Part &part : record.parts)
        for (const layout::Variant &variant : part.variants)
            out.Write("    " + Plain(layout::VariantText(variant)) + "\n");
    if (record.fields.empty()) return;
    Table table(kLayoutColumns, context.options);
    for (const Field &field : record.fields)
        table.Add({{std::to_string(field.offset)},
                   {Extent(field)},
                   {field.name, Style::Name},
                   {layout::Word(field.kind)},
                   {field.meaning + Plain(layout::DomainText(field)), Style::Dim}});
    table.Write(out);
}

// Paths as a typed value has them, from its own start.
void AddForm(const StoreField &field, const std::string &path, Table &table) {
    table.Add({{path.empty() ? "(the value)" : path, Style::Name},
               {Plain(layout::FormText(field))},
               {field.meaning + Plain(layout::DomainText(field)), Style::Dim}});
    std::string below = path + (field.form == Form::kInstances ? "[]" : "");
    if (!below.empty()) below += ".";
    for (const StoreField &member : field.members)
        AddForm(member, below + member.name, table);
}

void Explain(const Known &known, Context &context) {
    Output &out = context.out;
    out.Write(fmt::format("{} ({})\n", out.Paint(Style::Name, known.row->key), known.list));
    out.Write(fmt::format("  {}\n", known.meaning));
    out.Write(fmt::format("  in the store: {}\n  converter:    {}, {}\n", layout::PathOf(*known.row),
                          static_cast<std::uint32_t>(known.type->type), known.type->name));
    if (*known.type->quirks) out.Write(fmt::format("  oddities:     {}\n", known.type->quirks));
    for (const Record *record : RecordsOf(*known.type))
        WriteRecord(*record, context);
    out.Write("\n");
    Table table(kFormColumns, context.options);
    AddForm(*known.type->form, "", table);
    table.Write(out);
    out.Write(fmt::format("\n  for example: \"typed\": {}\n", json::serialize(ExampleOf(known.row->key))));
}

std::vector<Known> Wanted(const Options &options) {
    std::vector<Known> all = AllKnown();
    if (!options.name) return all;
    std::erase_if(all, [&](const Known &known) { return !GlobMatch(*options.name, known.row->key); });
    if (all.empty() && !options.ifExists)
        throw Error(ErrorKind::NotThere, "no known property is called \"" + *options.name + "\"")
            .Because("properties without a place of their own in the store are kept as they are")
            .Try("dvsctl props lists the known ones; patterns are quoted for the shell: '*.vlan'");
    return all;
}

} // namespace

Exit RunProps(Context &context) {
    const Options &options = context.options;
    const std::vector<Known> wanted = Wanted(options);
    if (options.json) {
        json::array properties;
        for (const Known &known : wanted)
            properties.emplace_back(KnownJson(known));
        json::object document = Envelope("props");
        document["properties"] = std::move(properties);
        context.out.Json(std::move(document));
    } else if (options.columns || !options.name) {
        WriteTable(wanted, context);
    } else {
        for (const Known &known : wanted) {
            if (&known != &wanted.front()) context.out.Write("\n");
            Explain(known, context);
        }
    }
    return Exit::Done;
}

} // namespace dvs::ctl
