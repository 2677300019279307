/* SPDX-License-Identifier: Apache-2.0 */
// Compiles the JSON Schema text into descriptors (schema.h). Boost.JSON reads the text; only the keywords
// that the schema file uses are known, and anything else is refused, so that no constraint is silently left
// out.

#include "platform/embedded/configstore/schema.h"

#include <algorithm>
#include <boost/json.hpp>
#include <cassert>
#include <cstring>
#include <map>
#include <new>
#include <stdexcept>

#include "platform/embedded/configstore/log.h"
#include "platform/embedded/configstore/schema_text.h"

namespace configstore {

namespace json = boost::json;

std::size_t FieldIndex::Hash(std::string_view name) {
    // Names of one schema differ in length, first or last bytes nearly always; what collides is compared.
    uint64_t first = 0;
    uint64_t last = 0;
    if (name.size() >= 8) {
        std::memcpy(&first, name.data(), 8);
        std::memcpy(&last, name.data() + name.size() - 8, 8);
    } else if (name.size() >= 4) {
        std::memcpy(&first, name.data(), 4);
        std::memcpy(&last, name.data() + name.size() - 4, 4);
    } else if (!name.empty()) {
        std::memcpy(&first, name.data(), 1);
        std::memcpy(&last, name.data() + name.size() - 1, 1);
    }
    const uint64_t mixed = (first ^ (last * 0x9e3779b97f4a7c15U) ^ name.size()) * 0xff51afd7ed558ccdU;
    return static_cast<std::size_t>(mixed >> 32);
}

std::size_t FieldIndex::PlaceOf(std::string_view name) const {
    const std::size_t mask = slots_.size() - 1;
    std::size_t at = Hash(name) & mask;
    while (slots_[at] && slots_[at]->name != name)
        at = (at + 1) & mask;
    return at;
}

const Field *FieldIndex::Find(std::string_view name) const {
    return slots_.empty() ? nullptr : slots_[PlaceOf(name)];
}

void FieldIndex::Add(const Field *field) {
    if (Find(field->name)) return;
    if (++count_ * 2 > slots_.size()) {
        std::vector<const Field *> old(std::max<std::size_t>(8, slots_.size() * 2), nullptr);
        old.swap(slots_);
        for (const Field *known : old)
            if (known) slots_[PlaceOf(known->name)] = known;
    }
    slots_[PlaceOf(field->name)] = field;
}

void Shape::IndexBelow() {
    std::vector<const Shape *> shapes = {this}; // one may lead back to another
    for (std::size_t i = 0; i < shapes.size(); i++) {
        for (const Field *field : shapes[i]->fields_) {
            const Shape *const shape = field->shape;
            if (!shape) continue;
            for (const Field *below : shape->fields_)
                below_.Add(below);
            if (std::find(shapes.begin(), shapes.end(), shape) == shapes.end()) shapes.push_back(shape);
        }
    }
}

const Field *Shape::FindAnew(const char *name) const {
    const std::size_t at = GuessOf(name);
    const Field *const second = guesses_[at ^ 1].load(std::memory_order_relaxed);
    if (second && std::strcmp(second->name.c_str(), name) == 0) return second;
    const Field *const field = Find(name);
    if (!field) return nullptr;
    // Two names that fall together get two places; a third one takes the second place.
    const bool isTaken = guesses_[at].load(std::memory_order_relaxed) != nullptr;
    guesses_[isTaken ? at ^ 1 : at].store(field, std::memory_order_relaxed);
    return field;
}

void Shape::Add(Field field) {
    field.prefix = '"' + field.name + "\":";
    if (field.IsShort()) {
        std::memcpy(field.words.data(), field.prefix.data(), field.prefix.size());
        std::memset(field.masks.data(), 0xff, field.prefix.size());
    }
    field.index = fields_.size();
    field.bit = uint64_t{1} << field.index;
    field.mark = uint32_t{1} << field.index % 31;
    static_assert(kUndescribedMark == uint32_t{1} << 31);
    owned_.push_back(std::move(field));
    fields_.push_back(&owned_.back());
    index_.Add(fields_.back());
}

class CompiledSchema {
public:
    explicit CompiledSchema(std::string_view text)
        : document_(json::parse(json::string_view(text.data(), text.size()))) {
        root_ = ShapeOf(document_);
        for (Shape &shape : shapes_)
            shape.IndexBelow();
        document_ = nullptr;
    }
    [[nodiscard]] const Shape *Root() const { return root_; }

private:
    const json::value &Resolve(const json::value &node) {
        const json::value *at = &node;
        while (const json::value *ref = at->as_object().if_contains("$ref")) {
            const json::string &target = ref->as_string();
            if (!target.starts_with("#/definitions/"))
                throw std::runtime_error("a reference to elsewhere: " + std::string(target));
            at = &document_.at("definitions").at(target.subview(14));
        }
        return *at;
    }

    const Shape *ShapeOf(const json::value &unresolved) {
        const json::value &node = Resolve(unresolved);
        if (const auto known = known_.find(&node); known != known_.end()) return known->second;
        shapes_.emplace_back();
        Shape *const shape = &shapes_.back();
        known_.emplace(&node, shape);
        shape->SetNumber(++number_);
        const json::object &properties = node.at("properties").as_object();
        if (properties.size() > Shape::kMaxFields)
            throw std::runtime_error("an object with too many properties");
        for (const auto &[name, value] : properties) {
            Field field = FieldOf(value);
            field.name.assign(name.data(), name.size());
            field.number = ++number_;
            shape->Add(std::move(field));
        }
        return shape;
    }

    Field FieldOf(const json::value &unresolved) {
        const json::value &node = Resolve(unresolved);
        const json::object &keywords = node.as_object();
        Field field;
        const json::value *const type = keywords.if_contains("type");
        if (!type) return field;
        const json::string &name = type->as_string();
        if (name == "boolean") {
            field.type = FieldType::Bool;
        } else if (name == "integer") {
            field.type = FieldType::Integer;
            field.minimum = keywords.at("minimum").to_number<int64_t>();
            field.maximum = keywords.at("maximum").to_number<int64_t>();
        } else if (name == "string") {
            field.type = keywords.contains("contentEncoding") ? FieldType::Binary : FieldType::Text;
            if (const json::value *most = keywords.if_contains("maxLength"))
                field.maxBytes = most->to_number<uint64_t>();
        } else if (name == "array") {
            field = ListOf(keywords);
        } else if (name == "object") {
            const json::value *const additional = keywords.if_contains("additionalProperties");
            const bool instances = additional && additional->is_object();
            field.type = instances ? FieldType::Instances : FieldType::Object;
            field.shape = ShapeOf(instances ? *additional : node);
            if (const json::value *most = keywords.if_contains("maxProperties"))
                field.maxItems = most->to_number<uint64_t>();
        } else {
            throw std::runtime_error("an unknown type: " + std::string(name));
        }
        return field;
    }

    Field ListOf(const json::object &keywords) {
        Field field = FieldOf(keywords.at("items"));
        switch (field.type) {
        case FieldType::Text:
            field.type = FieldType::TextList;
            break;
        case FieldType::Integer:
            field.type = FieldType::IntegerList;
            break;
        default:
            throw std::runtime_error("a list of neither texts nor numbers");
        }
        if (const json::value *most = keywords.if_contains("maxItems"))
            field.maxItems = most->to_number<uint64_t>();
        return field;
    }

    json::value document_;
    std::deque<Shape> shapes_;
    std::map<const json::value *, const Shape *> known_;
    const Shape *root_ = nullptr;
    uint32_t number_ = 0;
};

void CompiledSchemaDeleter::operator()(CompiledSchema *schema) const {
    delete schema;
}

CompiledSchemaPtr CompileSchema(std::string_view text, std::string *why) {
    try {
        return CompiledSchemaPtr(new CompiledSchema(text));
    } catch (const std::bad_alloc &) {
        throw;
    } catch (const std::exception &error) {
        if (why) *why = error.what();
        return nullptr;
    }
}

const Shape *RootShape(const CompiledSchema *schema) {
    return schema->Root();
}

std::string_view SchemaText(std::string_view key, std::string_view group) {
    if (key != "switches" || group != "network_vds") return {};
    return {reinterpret_cast<const char *>(kSwitchesSchema), kSwitchesSchemaSize};
}

const Shape *FindSchema(std::string_view key, std::string_view group) {
    const std::string_view text = SchemaText(key, group);
    if (text.empty()) return nullptr;
    static const CompiledSchemaPtr switches = [&] {
        std::string why;
        CompiledSchemaPtr compiled = CompileSchema(text, &why);
        if (!compiled) Log("config store: the built-in schema of switches cannot be used: %s", why.c_str());
        assert(compiled);
        return compiled;
    }();
    return switches ? RootShape(switches.get()) : nullptr;
}

} // namespace configstore
