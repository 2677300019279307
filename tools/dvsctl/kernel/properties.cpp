/* SPDX-License-Identifier: Apache-2.0 */
// Single property lists on their way out.

#include "tools/dvsctl/kernel/properties.h"

#include <boost/json/array.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvsdata/buffer_view.h"
#include "form/json/codec.h"
#include "form/value.h"
#include "tools/dvsctl/cli/table.h"
#include "tools/dvsctl/verbs/typed_fields.h"

namespace dvs::ctl {

namespace {

constexpr Column kColumns[] = {
    // name, right, by default
    {"name", false, true},
    {"type", false, true},
    {"size", true, true},
    {"value", false, true},
};

} // namespace

std::vector<Property> PropertiesOf(Bytes bytes, const std::string &title) {
    std::vector<Property> properties;
    data::BufferView view(bytes);
    for (data::EntryView entry; view.Next(&entry);)
        properties.push_back({entry.Name(), entry.propType, entry.value, entry.offset});
    if (view.Ok()) return properties;
    Error error(ErrorKind::Malformed, title);
    error.source = "kernel:";
    error.offset = view.FirstFault().offset;
    error.why = fmt::format("the module's reply is damaged: {}", view.FirstFault().Text());
    error.next = "dvsctl verify kernel: looks at the whole state";
    throw Error(error);
}

void WriteProperties(Context &context, const std::vector<Property> &properties, boost::json::object document,
                     const std::optional<Owner> &owner) {
    TypedViews views;
    if (context.options.json) {
        boost::json::array array;
        for (const Property &property : properties) {
            boost::json::object object = PropertyToJson(property);
            if (owner) AddMeaning(views.Of(*owner, property), object);
            array.emplace_back(std::move(object));
        }
        document["properties"] = std::move(array);
        context.out.Json(std::move(document));
        return;
    }
    Table table(kColumns, context.options);
    for (const Property &property : properties) {
        const TypedText text = owner ? DescribeProperty(views, *owner, property) : TypedText();
        std::string value =
            text.summary.empty() ? ShowValue(property.value, context.options.full) : text.summary;
        if (!text.damage.empty()) value += " (does not fit: " + text.damage + ")";
        table.Add({{ShowName(property.name)},
                   {fmt::format("0x{:02x}", property.type), Style::Dim},
                   {std::to_string(property.value.size()), Style::Dim},
                   {std::move(value)}});
    }
    if (!properties.empty()) table.Write(context.out);
}

} // namespace dvs::ctl
