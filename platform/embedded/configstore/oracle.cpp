/* SPDX-License-Identifier: Apache-2.0 */
// The general validator (oracle.h) on valijson. JSON Schema counts characters where the store counts bytes,
// so texts are shown to it with one character for each byte.

#include "platform/embedded/configstore/oracle.h"

#include <boost/json.hpp>
#include <valijson/adapters/boost_json_adapter.hpp>
#include <valijson/schema.hpp>
#include <valijson/schema_parser.hpp>
#include <valijson/validation_results.hpp>
#include <valijson/validator.hpp>

#include "platform/embedded/configstore/text_code.h"

namespace configstore {

namespace {

namespace json = boost::json;

/// Takes out of the schema what this strictness does not judge. Base64 stays the compiled check's business in
/// imports: the pattern for it would be matched by recursion, as deep as the text is long.
void Relax(json::value &node, Strictness strictness) {
    if (json::array *const array = node.if_array()) {
        for (json::value &element : *array)
            Relax(element, strictness);
        return;
    }
    json::object *const object = node.if_object();
    if (!object) return;
    const bool binary = object->contains("contentEncoding");
    if (binary == (strictness == Strictness::Import)) object->erase("pattern");
    if (strictness == Strictness::Store) {
        object->erase("enum");
        object->erase("maxItems");
        object->erase("maxProperties");
        const json::value *const additional = object->if_contains("additionalProperties");
        if (additional && additional->is_bool()) object->erase("additionalProperties");
    }
    for (auto &member : *object)
        Relax(member.value(), strictness);
}

void ShowBytes(json::value &node) {
    if (json::string *const text = node.if_string()) {
        const std::string_view coded(text->data(), text->size());
        std::string bytes(coded.size(), '\0');
        bytes.resize(static_cast<std::size_t>(DecodeText(bytes.data(), coded) - bytes.data()));
        for (char &byte : bytes)
            byte =
                static_cast<unsigned char>(byte) < 0x80 ? byte : '\x7f'; // in no enumeration and no pattern
        *text = bytes;
    } else if (json::array *const array = node.if_array()) {
        for (json::value &element : *array)
            ShowBytes(element);
    } else if (json::object *const object = node.if_object()) {
        for (auto &member : *object)
            ShowBytes(member.value());
    }
}

} // namespace

struct Oracle::Impl {
    json::value document;
    valijson::Schema schema;
};

Oracle::Oracle(std::string_view schema, Strictness strictness) : impl_(std::make_unique<Impl>()) {
    impl_->document = json::parse(json::string_view(schema.data(), schema.size()));
    // Properties may be named like keywords; only the schema's own ones are looked at by name.
    Relax(impl_->document, strictness);
    valijson::SchemaParser parser;
    const valijson::adapters::BoostJsonAdapter adapter(impl_->document);
    parser.populateSchema(adapter, impl_->schema);
}

Oracle::~Oracle() = default;

bool Oracle::Accepts(std::string_view document, std::vector<Finding> *findings) const {
    json::error_code ec;
    json::value parsed = json::parse(json::string_view(document.data(), document.size()), ec);
    if (ec) {
        if (findings) findings->push_back({"", ec.message()});
        return false;
    }
    ShowBytes(parsed);
    valijson::Validator validator;
    valijson::ValidationResults results;
    const valijson::adapters::BoostJsonAdapter adapter(parsed);
    const bool accepted = validator.validate(impl_->schema, adapter, findings ? &results : nullptr);
    for (valijson::ValidationResults::Error error; findings && results.popError(error);) {
        std::string path;
        for (const std::string &part : error.context) { // "<root>", then each name in brackets
            if (part == "<root>" || part.size() < 2) continue;
            if (!path.empty()) path += '/';
            path.append(part, 1, part.size() - 2);
        }
        findings->push_back({path, error.description});
    }
    return accepted;
}

} // namespace configstore
