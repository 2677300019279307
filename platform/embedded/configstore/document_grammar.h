/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_GRAMMAR_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_GRAMMAR_H

// The grammar of the documents that the store writes itself, which it reads several times as fast as a general
// parser. What becomes of the content is up to a sink: document_plain.cpp makes nodes of it, or checks it
// without making any.
//
// The grammar covers well-formed documents of described fields. Everything else is refused, sound or not, and
// left to the general reader (document_read.cpp): white space, names that the schema does not know, names that
// occur twice, \u escapes, numbers that are not whole.
//
// A sink has
//
//   Node                          a handle of an object, a list or a value
//   kTakesMisfits                 whether it takes values that the schema does not allow
//   Members(sink, node)           the members of an object: Node Add(const Field *); void End()
//   AddInstance(list, id)         a Node, an object
//   MakeObject, MakeInstances     of a node
//   Put(node, field, value)       a bool, an integer or a text; false if it is refused
//   PutMisfit(node, field, kind)  false and true of the wrong type, null, an empty list
//   BeginList(), AddItem(field, item), EndList(node, field)
//   LeaveList(node, field, at)    the end of a list of instances of the root that is not to be read now, or null
//   EndRootList(field, at, end)   tells of one that has been read

#include <algorithm>
#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/embedded/configstore/node.h"
#include "platform/embedded/configstore/text_code.h"

namespace configstore {

/// A text as a document has it between its quotes.
struct EscapedText {
    std::string_view text;
    std::size_t escapes = 0; // backslashes that begin one

    [[nodiscard]] std::size_t Size() const { return text.size() - escapes; } // of the text that it stands for
    /// Writes the text that it stands for, Size() bytes. Returns the end.
    char *Unescape(char *out) const;
};

/// Whether no two hashes are equal. May reorder them. False also where that would take long to find out, as
/// with ids that were chosen to fall together.
[[nodiscard]] bool AreDistinct(std::span<uint64_t> hashes);

template <typename Sink> class DocumentReader {
    using Node = typename Sink::Node;

public:
    /// `last` is the text's last byte, which must be a brace. Only the outermost object or list may step over it,
    /// so that no other check for the end is needed.
    DocumentReader(Sink *sink, const char *last) : sink_(*sink), last_(last) {}

    // All functions read from `at` and return where they end; null for what the grammar does not cover.

    /// The members of an object, through the closing brace. 1 is the outermost depth.
    [[nodiscard]] const char *ReadObject(const char *at, Node node, const Shape *shape, std::size_t depth) {
        return *at == '{' ? Members(at + 1, node, shape, depth) : nullptr;
    }
    /// A list of instances of that shape, through the closing brace.
    [[nodiscard]] const char *ReadInstances(const char *at, Node list, const Shape *shape,
                                            std::size_t depth) {
        return *at == '{' ? Instances(at + 1, list, shape, depth) : nullptr;
    }

private:
    static constexpr std::size_t kMaxPlainDepth = 16; // below the limit of documents, which has a message

    const char *TakeEnd(const char *at, std::size_t depth) {
        return *at == '}' && (at < last_ || depth == 1) ? at + 1 : nullptr;
    }

    const char *Members(const char *at, Node node, const Shape *shape, std::size_t depth) {
        if (!shape || depth > kMaxPlainDepth) return nullptr;
        typename Sink::Members members(&sink_, node);
        if (*at != '}') {
            uint64_t seen = 0;
            uint32_t before = shape->Number();
            for (;; at++) {
                const Field *field = nullptr;
                at = NextField(at, shape, before, &field);
                if (!at || (seen & field->bit)) return nullptr;
                seen |= field->bit;
                before = field->number;
                at = Value(at, members.Add(field), field, depth);
                if (!at) return nullptr;
                if (*at != ',') break;
            }
        }
        members.End();
        return TakeEnd(at, depth);
    }

    /// A name with its colon. The field that followed another one once mostly follows it again. `before` is the
    /// number of that field, or of the shape.
    const char *NextField(const char *at, const Shape *shape, uint32_t before, const Field **field) {
        const Field *const guess = next_[before % kMostNumbers];
        if (guess && guess->StandsAt(at, last_)) [[likely]] {
            *field = guess;
            return at + guess->prefix.size();
        }
        std::string_view name;
        at = Name(at, &name);
        if (!at || *at != ':') return nullptr;
        *field = shape->Find(name);
        if (!*field) return nullptr;
        if ((*field)->IsShort()) next_[before % kMostNumbers] = *field;
        return at + 1;
    }

    const char *Value(const char *at, Node node, const Field *field, std::size_t depth) {
        switch (field->type) {
        case FieldType::Bool:
            if (const char *const end = Bool(at, node, field)) return end;
            break;
        case FieldType::Integer:
            if (IsNumber(*at)) return Integer(at, node, field);
            break;
        case FieldType::Text:
        case FieldType::Binary:
            if (*at == '"') return Text(at, node, field);
            break;
        case FieldType::TextList:
            if (*at == '[') return List<EscapedText>(at, node, field);
            break;
        case FieldType::IntegerList:
            if (*at == '[') return List<int64_t>(at, node, field);
            break;
        case FieldType::Object:
            if (*at != '{') break;
            sink_.MakeObject(node);
            return Members(at + 1, node, field->shape, depth + 1);
        case FieldType::Instances:
            if (*at != '{') break;
            return depth == 1 ? RootList(at, node, field) : NewInstances(at, node, field, depth);
        case FieldType::Any:
            break;
        }
        return Sink::kTakesMisfits ? Misfit(at, node, field) : nullptr;
    }

    /// A value of another type than the schema has for it.
    const char *Misfit(const char *at, Node node, const Field *field) {
        switch (*at) {
        case '"':
            return Text(at, node, field);
        case 't':
        case 'f':
            return Bool(at, node, field);
        case 'n':
            return Literal(at, "null") && sink_.PutMisfit(node, field, Kind::Null) ? at + 4 : nullptr;
        case '[':
            return field->type == FieldType::Instances && at[1] == ']' ? EmptyList(at, node, field) : nullptr;
        default:
            return IsNumber(*at) ? Integer(at, node, field) : nullptr;
        }
    }

    const char *RootList(const char *at, Node node, const Field *field) {
        const char *end = sink_.LeaveList(node, field, at, last_);
        if (!end) end = NewInstances(at, node, field, 1);
        if (end) sink_.EndRootList(field, at, end);
        return end;
    }

    const char *NewInstances(const char *at, Node node, const Field *field, std::size_t depth) {
        sink_.MakeInstances(node);
        return Instances(at + 1, node, field->shape, depth + 1);
    }

    const char *Instances(const char *at, Node list, const Shape *shape, std::size_t depth) {
        if (depth > kMaxPlainDepth) return nullptr;
        if (*at == '}') return TakeEnd(at, depth);
        const std::size_t firstId = ids_.size();
        for (;; at++) {
            std::string_view id;
            at = Name(at, &id);
            if (!at || *at != ':') return nullptr;
            ids_.push_back(HashName(id));
            at = ReadObject(at + 1, sink_.AddInstance(list, id), shape, depth + 1);
            if (!at) return nullptr;
            if (*at != ',') break;
        }
        const bool distinct = AreDistinct(std::span(ids_).subspan(firstId));
        ids_.resize(firstId);
        return distinct ? TakeEnd(at, depth) : nullptr;
    }

    const char *EmptyList(const char *at, Node node, const Field *field) {
        return sink_.PutMisfit(node, field, Kind::EmptyList) ? at + 2 : nullptr;
    }

    /// From the opening bracket through the closing one.
    template <typename Item> const char *List(const char *at, Node node, const Field *field) {
        if (at[1] == ']') return EmptyList(at, node, field);
        sink_.BeginList();
        do {
            Item item;
            at = Scan(at + 1, &item);
            if (!at || !sink_.AddItem(field, item)) return nullptr;
        } while (*at == ',');
        return *at == ']' && sink_.EndList(node, field) ? at + 1 : nullptr;
    }

    const char *Integer(const char *at, Node node, const Field *field) {
        int64_t number = 0;
        at = Scan(at, &number);
        return at && sink_.Put(node, field, number) ? at : nullptr;
    }

    const char *Text(const char *at, Node node, const Field *field) {
        EscapedText text;
        at = Scan(at, &text);
        return at && sink_.Put(node, field, text) ? at : nullptr;
    }

    const char *Bool(const char *at, Node node, const Field *field) {
        const bool value = Literal(at, "true");
        if (!value && !Literal(at, "false")) return nullptr;
        return sink_.Put(node, field, value) ? at + (value ? 4 : 5) : nullptr;
    }

    template <std::size_t kSize> [[nodiscard]] bool Literal(const char *at, const char (&word)[kSize]) const {
        constexpr std::size_t kLength = kSize - 1; // known to the compiler, which needs no call then
        return last_ - at >= static_cast<std::ptrdiff_t>(kLength) && std::memcmp(at, word, kLength) == 0;
    }

    static bool IsNumber(char c) { return c == '-' || (c >= '0' && c <= '9'); }

    /// A whole number that something follows as it does in a document.
    static const char *Scan(const char *at, int64_t *number) {
        constexpr std::ptrdiff_t kSafeDigits = 18; // every such number fits
        const bool negative = *at == '-';
        const char *const digits = negative ? at + 1 : at;
        const char *end = digits;
        uint64_t value = 0;
        unsigned digit = 0;
        while ((digit = static_cast<unsigned char>(*end) - unsigned{'0'}) < 10) {
            value = value * 10 + digit; // overflows only in what is refused
            end++;
        }
        const std::ptrdiff_t count = end - digits;
        if (count == 0 || count > kSafeDigits || (*digits == '0' && (count > 1 || negative))) return nullptr;
        if (*end != ',' && *end != '}' && *end != ']') return nullptr;
        *number = negative ? -static_cast<int64_t>(value) : static_cast<int64_t>(value);
        return end;
    }

    /// A text with its quotes.
    const char *Scan(const char *at, EscapedText *text) const {
        if (*at++ != '"') return nullptr;
        const char *const begin = at;
        std::size_t escapes = 0;
        while (at < last_) {
            const uint64_t special = SpecialBytes(WordAt(at));
            if (special == 0) {
                at += sizeof(uint64_t);
                continue;
            }
            at += std::countr_zero(special) / 8;
            if (*at == '"') {
                *text = {{begin, static_cast<std::size_t>(at - begin)}, escapes};
                return at + 1;
            }
            const std::size_t length = SpecialLength(at);
            if (length == 0) return nullptr;
            escapes += *at == '\\';
            at += length;
        }
        return nullptr;
    }

    /// The bytes at a place; behind the last byte, zeros, which are special.
    [[nodiscard]] uint64_t WordAt(const char *at) const {
        uint64_t word = 0;
        if (last_ - at >= static_cast<std::ptrdiff_t>(sizeof word)) [[likely]]
            std::memcpy(&word, at, sizeof word);
        else
            std::memcpy(&word, at, static_cast<std::size_t>(last_ - at));
        return word;
    }

    /// The length of an escape, or of a character beyond ASCII. 0 for a control character, a stray byte, and a
    /// character that stands for a byte.
    [[nodiscard]] std::size_t SpecialLength(const char *at) const {
        if (*at == '\\') {
            constexpr std::string_view kEscaped = "\"\\/nrtbf";
            return kEscaped.find(at[1]) == std::string_view::npos ? 0 : 2;
        }
        return static_cast<unsigned char>(*at) < 0x80 ? 0 : PlainSequence(at, last_);
    }

    /// A text that is a name or an id; good until the next one.
    const char *Name(const char *at, std::string_view *name) {
        EscapedText text;
        at = Scan(at, &text);
        if (!at) return nullptr;
        *name = text.text;
        if (text.escapes == 0) return at;
        unescaped_.resize(text.Size());
        (void)text.Unescape(unescaped_.data());
        *name = unescaped_;
        return at;
    }

    static constexpr std::size_t kMostNumbers = 256;

    Sink &sink_;
    const char *const last_;
    std::array<const Field *, kMostNumbers> next_{}; // by the number of the field before, or of the shape
    std::vector<uint64_t> ids_;                      // hashes, of the lists of instances being read
    std::string unescaped_;
};

} // namespace configstore

#endif
