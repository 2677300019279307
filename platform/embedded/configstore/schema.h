/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_SCHEMA_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_SCHEMA_H

// The store's schema, compiled: what each field of an object may hold. The source is the JSON Schema file of
// platform/embedded/schemas, which the build puts into the library; it is compiled on first use, once per
// process. The nodes of a tree (node.h) point to these descriptors, so that checking a value needs no walk
// and no lookup.

#include <cstdint>
#include <deque>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace configstore {

enum class FieldType : uint8_t {
    Any,         // whatever it holds: names of older releases, which are only ever removed
    Bool,        //
    Integer,     // a whole number between minimum and maximum
    Text,        // at most maxBytes bytes
    Binary,      // base64 in the document
    TextList,    // texts of at most maxBytes bytes, in order
    IntegerList, // numbers between minimum and maximum, in order
    Object,      // a singleton sub-object with the fields of `shape`
    Instances,   // sub-objects by instance id, each with the fields of `shape`
};

class Shape;

struct Field {
    std::string name;
    FieldType type = FieldType::Any;
    int64_t minimum = INT64_MIN;
    int64_t maximum = INT64_MAX;
    uint64_t maxBytes = UINT64_MAX;
    uint64_t maxItems = UINT64_MAX; // of a list, or instances; imports only
    const Shape *shape = nullptr;
    std::size_t index = 0; // among the fields of the shape that has it
    std::string prefix;    // the name as a document writes it: "name":
};

/// The fields of one kind of object, found by name.
class Shape {
public:
    static constexpr std::size_t kMaxFields = 64; // a reader marks what it has seen in one 64-bit word

    [[nodiscard]] const Field *Find(std::string_view name) const;
    [[nodiscard]] const std::vector<const Field *> &Fields() const { return fields_; }
    void Add(Field field);

private:
    static std::size_t Hash(std::string_view name);
    void Rehash();

    std::deque<Field> owned_;
    std::vector<const Field *> fields_;
    std::vector<const Field *> slots_; // open addressing, a power of two, at most half full
};

/// The shape of the objects of a key and group; null when the store has no schema for them.
[[nodiscard]] const Shape *FindSchema(std::string_view key, std::string_view group);

/// The schema file's text for a key and group; empty when there is none.
[[nodiscard]] std::string_view SchemaText(std::string_view key, std::string_view group);

/// Compiles a schema text. Null, with a reason, for one that uses what the compiler does not know.
class CompiledSchema;
struct CompiledSchemaDeleter {
    void operator()(CompiledSchema *schema) const;
};
using CompiledSchemaPtr = std::unique_ptr<CompiledSchema, CompiledSchemaDeleter>;
[[nodiscard]] CompiledSchemaPtr CompileSchema(std::string_view text, std::string *why);
[[nodiscard]] const Shape *RootShape(const CompiledSchema *schema);

} // namespace configstore

#endif
