/* SPDX-License-Identifier: Apache-2.0 */
// Single property lists on their way out.

#include "tools/dvsctl/kernel/properties.h"

#include <boost/json/array.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvsdata/buffer_view.h"
#include "tools/dvsctl/json_codec.h"
#include "tools/dvsctl/table.h"
#include "tools/dvsctl/value.h"

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
    Error error(Exit::Malformed, title);
    error.source = "kernel:";
    error.offset = view.FirstFault().offset;
    error.why = fmt::format("the module's reply is damaged: {}", view.FirstFault().Text());
    error.next = "dvsctl verify kernel: looks at the whole state";
    throw Error(error);
}

void WriteProperties(Context &context, const std::vector<Property> &properties,
                     boost::json::object document) {
    if (context.options.json) {
        boost::json::array array;
        for (const Property &property : properties)
            array.emplace_back(PropertyToJson(property));
        document["properties"] = std::move(array);
        context.out.Json(std::move(document));
        return;
    }
    Table table(kColumns, context.options);
    for (const Property &property : properties)
        table.Add({{ShowName(property.name)},
                   {fmt::format("0x{:02x}", property.type), Style::Dim},
                   {std::to_string(property.value.size()), Style::Dim},
                   {ShowValue(property.value, context.options.full)}});
    if (!properties.empty()) table.Write(context.out);
}

} // namespace dvs::ctl
