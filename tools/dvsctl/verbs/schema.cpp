/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl schema`: the schema of the store's documents, whole or field by field.

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/parse.hpp>
#include <boost/json/serialize.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "form/text.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/cli/table.h"
#include "tools/dvsctl/store/access.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

// A definition, where the schema only points to one; a description beside the pointer stays in force.
const json::object &Resolve(const json::object &root, const json::object &schema) {
    const json::value *reference = schema.if_contains("$ref");
    if (!reference) return schema;
    const std::string name(reference->as_string());
    return root.at("definitions").at(name.substr(name.rfind('/') + 1)).as_object();
}

const json::object *Instances(const json::object &schema) {
    const json::value *more = schema.if_contains("additionalProperties");
    return more ? more->if_object() : nullptr;
}

std::string Text(const json::object &schema, const char *member) {
    const json::value *value = schema.if_contains(member);
    if (!value) return {};
    return value->is_string() ? std::string(value->as_string()) : json::serialize(*value);
}

// "instances" is what a list keyed by ids is called in the store's own words.
std::string TypeOf(const json::object &root, const json::object &given) {
    const json::object &schema = Resolve(root, given);
    if (Instances(schema)) return "instances";
    std::string type = Text(schema, "type");
    if (type == "array") {
        const json::value *items = schema.if_contains("items");
        type = "list of " + (items && items->is_object() ? TypeOf(root, items->as_object()) : "anything");
    }
    return type.empty() ? "anything" : type;
}

std::string LimitsOf(const json::object &schema) {
    constexpr const char *kLimits[] = {"minimum",  "maximum", "minLength",       "maxLength", "minItems",
                                       "maxItems", "pattern", "contentEncoding", "enum"};
    std::string limits;
    for (const char *limit : kLimits)
        if (const std::string text = Text(schema, limit); !text.empty())
            limits += fmt::format("{}{} {}", limits.empty() ? "" : ", ", limit, text);
    return limits;
}

struct Place {
    const json::object *given;  // as it stands where it is used
    const json::object *schema; // resolved
};

// The next step of a path: a member, an instance by any id, or an element of a list.
const json::object *Step(const json::object &schema, std::string_view word) {
    if (const json::value *properties = schema.if_contains("properties"))
        if (const json::value *member = properties->as_object().if_contains(word)) return member->if_object();
    if (const json::object *instances = Instances(schema)) return instances;
    if (const json::value *items = schema.if_contains("items")) return items->if_object();
    return nullptr;
}

std::string MembersOf(const json::object &schema) {
    std::string members;
    if (const json::value *properties = schema.if_contains("properties"))
        for (const auto &[name, unused] : properties->as_object())
            members += fmt::format("{}{}", members.empty() ? "" : ", ", std::string_view(name));
    return members;
}

// "ports[a/b]/name", as the store's refusals have it, is "ports/name": which instance does not matter.
std::string WithoutIds(std::string path) {
    for (std::size_t at = path.find('['); at != std::string::npos; at = path.find('[', at)) {
        std::size_t end = path.find("]/", at);
        if (end == std::string::npos) end = path.back() == ']' ? path.size() - 1 : end;
        if (end == std::string::npos) break;
        path.erase(at, end + 1 - at);
    }
    return path;
}

Place Walk(const json::object &root, const std::string &path) {
    Place place{&root, &root};
    const std::string named = WithoutIds(path);
    std::string_view rest = named;
    // Errors and differences write paths with slashes, for ids may have dots in them.
    const char separator = path.find_first_of("/[") != std::string::npos ? '/' : '.';
    for (bool more = !rest.empty(); more;) {
        const std::size_t end = rest.find(separator);
        const std::string_view word = rest.substr(0, end);
        more = end != std::string_view::npos;
        const json::object *next = Step(*place.schema, word);
        // A list of instances may be passed through without naming one: ports.name is ports.*.name.
        if (next && Instances(*place.schema) == next) {
            const json::object &one = Resolve(root, *next);
            if (const json::object *member = Step(one, word)) next = member;
        }
        if (!next) {
            const std::string members = MembersOf(*place.schema);
            throw Error(ErrorKind::NotThere, "the schema has no field \"" + std::string(word) + "\"")
                .Field(path)
                .Because(members.empty() ? "there are no fields below " + TypeOf(root, *place.given)
                                         : "the fields there are " + members)
                .Try("dvsctl schema shows the whole schema");
        }
        place = {next, &Resolve(root, *next)};
        if (more) rest.remove_prefix(end + 1);
    }
    return place;
}

constexpr Column kFields[] = {
    {"field", false, true},
    {"type", false, true},
    {"description", false, true},
};

void AddMembers(const json::object &root, const json::object &schema, Table &table) {
    const json::value *properties = schema.if_contains("properties");
    if (!properties) return;
    for (const auto &[name, value] : properties->as_object()) {
        if (!value.is_object()) continue;
        const json::object &member = value.as_object();
        std::string description = Text(member, "description");
        if (description.empty()) description = Text(Resolve(root, member), "description");
        table.Add({{Escape(std::string_view(name)), Style::Name},
                   {TypeOf(root, member)},
                   {Escape(description), Style::Dim}});
    }
}

void ShowPlace(Context &context, const json::object &root, const Place &place, const std::string &path) {
    Output &out = context.out;
    std::string description = Text(*place.given, "description");
    if (description.empty()) description = Text(*place.schema, "description");
    out.Write(fmt::format("{}: {}\n", out.Paint(Style::Name, Escape(path)), TypeOf(root, *place.given)));
    if (!description.empty()) out.Write("  " + Escape(description) + "\n");
    if (const std::string limits = LimitsOf(*place.schema); !limits.empty())
        out.Write("  " + Escape(limits) + "\n");
    const json::object *inside = place.schema;
    if (const json::object *one = Instances(*inside))
        inside = &Resolve(root, *one);
    else if (const json::value *items = inside->if_contains("items"); items && items->is_object())
        inside = &Resolve(root, items->as_object());
    if (!inside->contains("properties")) return;
    Table table(kFields, context.options);
    AddMembers(root, *inside, table);
    out.Write("\n");
    table.Write(out);
}

} // namespace

Exit RunSchema(Context &context) {
    const admin::Address address = SwitchAddress(admin::Layer::Current, "");
    const std::string_view text = admin::Schema(address.key, address.group);
    const json::value schema = json::parse(text);
    const std::string path = context.options.name.value_or("");
    const Place place = Walk(schema.as_object(), path);
    if (context.options.json) {
        json::object document = Envelope("schema");
        if (!path.empty()) document["field"] = ValidUtf8(path);
        if (!path.empty()) document["type"] = TypeOf(schema.as_object(), *place.given);
        document["schema"] = *place.given;
        context.out.Json(std::move(document));
    } else if (path.empty()) {
        context.out.Write(text);
    } else {
        ShowPlace(context, schema.as_object(), place, path);
    }
    return Exit::Done;
}

} // namespace dvs::ctl
