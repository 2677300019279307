/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_SCHEMA_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_SCHEMA_H

// The store's schema, compiled: what each field of an object may hold. The source is the JSON Schema file of
// platform/embedded/schemas, which the build puts into the library; it is compiled on first use, once per
// process. The nodes of a tree (node.h) point to these descriptors, so that checking a value needs no walk
// and no lookup.

#include <array>
#include <atomic>
#include <cstdint>
#include <cstring>
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

/// The mark of all members without a field.
inline constexpr uint32_t kUndescribedMark = uint32_t{1} << 31;

struct Field {
    std::string name;
    FieldType type = FieldType::Any;
    int64_t minimum = INT64_MIN;
    int64_t maximum = INT64_MAX;
    uint64_t maxBytes = UINT64_MAX;
    uint64_t maxItems = UINT64_MAX; // of a list, or instances; imports only
    const Shape *shape = nullptr;
    std::size_t index = 0; // among the fields of the shape that has it
    uint64_t bit = 0;      // of that index
    uint32_t mark = 0;     // the bit by which an object tells whether it may have such a member
    uint32_t number = 0;   // among the fields and shapes of the schema, from 1
    std::string prefix;    // the name as a document writes it: "name":

    // A short prefix once more, for comparing it in few steps, with a mask of the bytes that count.
    static constexpr std::size_t kMaxWords = 6;
    std::array<uint64_t, kMaxWords> words{};
    std::array<uint64_t, kMaxWords> masks{};

    [[nodiscard]] bool IsShort() const { return prefix.size() <= sizeof words; }
    /// Whether the prefix, which must be short, stands at `at`. False close to the text's last byte.
    [[nodiscard]] bool StandsAt(const char *at, const char *last) const {
        if (last - at < static_cast<std::ptrdiff_t>(sizeof words)) return false;
        using Pair = uint64_t __attribute__((vector_size(16)));
        const auto difference = [this, at](std::size_t i) {
            Pair text, word, mask;
            std::memcpy(&text, at + i * sizeof(Pair), sizeof text);
            std::memcpy(&word, &words[2 * i], sizeof word);
            std::memcpy(&mask, &masks[2 * i], sizeof mask);
            return (text ^ word) & mask;
        };
        static_assert(kMaxWords == 6);
        const Pair all = difference(0) | difference(1) | difference(2);
        return (all[0] | all[1]) == 0;
    }
};

/// Fields by name.
class FieldIndex {
public:
    [[nodiscard]] const Field *Find(std::string_view name) const;
    /// Adds a field unless there is one of that name.
    void Add(const Field *field);

private:
    static std::size_t Hash(std::string_view name);
    [[nodiscard]] std::size_t PlaceOf(std::string_view name) const;

    std::size_t count_ = 0;
    std::vector<const Field *> slots_; // open addressing, a power of two, at most half full
};

/// The fields of one kind of object, found by name.
class Shape {
public:
    static constexpr std::size_t kMaxFields = 64; // a reader marks what it has seen in one 64-bit word

    [[nodiscard]] const Field *Find(std::string_view name) const { return index_.Find(name); }
    /// The same for a name that is asked for again and again, as those that stand in the code are: where a
    /// text stood before, the same text mostly stands again.
    [[nodiscard]] const Field *FindAgain(const char *name) const {
        const Field *const field = guesses_[GuessOf(name)].load(std::memory_order_relaxed);
        if (field && std::strcmp(field->name.c_str(), name) == 0) [[likely]]
            return field;
        return FindAnew(name);
    }
    /// Whether a field of a field's shape, or of one further down, has the name.
    [[nodiscard]] bool HasBelow(std::string_view name) const { return below_.Find(name) != nullptr; }
    [[nodiscard]] const std::vector<const Field *> &Fields() const { return fields_; }
    void Add(Field field);
    /// Collects the names for HasBelow, once all shapes have their fields.
    void IndexBelow();
    void SetNumber(uint32_t number) { number_ = number; }
    [[nodiscard]] uint32_t Number() const { return number_; }

private:
    static std::size_t GuessOf(const char *name) {
        return reinterpret_cast<uintptr_t>(name) * 0x9e3779b97f4a7c15U >> (64 - kGuessBits);
    }
    /// By the second guess, then by the name.
    [[gnu::noinline]] const Field *FindAnew(const char *name) const;

    uint32_t number_ = 0; // as a field's
    std::deque<Field> owned_;
    std::vector<const Field *> fields_;
    FieldIndex index_; // of them
    FieldIndex below_; // of the fields of the fields' shapes, and so on
    static constexpr unsigned kGuessBits = 8;
    /// By the address of the name. Guesses only: any thread may put in another at any time.
    mutable std::array<std::atomic<const Field *>, std::size_t{1} << kGuessBits> guesses_{};
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
