/* SPDX-License-Identifier: Apache-2.0 */
// The grammar and the schema once more, for a look only (document_skim.h). What is accepted here is accepted
// by the quick reader (document_plain.cpp); what is not is read there, and judged there.

#include "platform/embedded/configstore/document_skim.h"

#include <array>
#include <bit>
#include <cstring>
#include <span>
#include <string>
#include <vector>

#include "base/base64.h"
#include "platform/embedded/configstore/document_parts.h"
#include "platform/embedded/configstore/node.h"
#include "platform/embedded/configstore/text_code.h"

namespace configstore {

namespace {

constexpr std::size_t kMaxSkimDepth = 8;
constexpr std::size_t kWord = sizeof(uint64_t);

class Skimmer {
public:
    Skimmer(const char *at, const char *last) : at_(at), last_(last) {}

    const char *List(const Shape *shape) {
        return *at_ == '{' && Instances(shape, 0) && at_ <= last_ ? at_ : nullptr;
    }

private:
    // As in the quick reader, the last byte is a brace, and whoever steps over it gives up: the byte at at_
    // may be looked at.

    bool Take(char c) {
        if (*at_ != c) return false;
        at_++;
        return true;
    }

    bool TakeEnd() { return Take('}') && at_ <= last_; }

    /// Of an object, from its opening brace through the closing one.
    bool Members(const Shape *shape, std::size_t depth) {
        if (!shape || depth > kMaxSkimDepth || !Take('{')) return false;
        if (*at_ == '}') return TakeEnd();
        uint64_t seen = 0;
        uint32_t before = shape->Number();
        do {
            const Field *const field = NextField(shape, before);
            if (!field) return false;
            const uint64_t bit = uint64_t{1} << field->index;
            if (seen & bit) return false;
            seen |= bit;
            before = field->number;
            if (!Value(*field, depth)) return false;
        } while (Take(','));
        return TakeEnd();
    }

    /// As the quick reader's.
    const Field *NextField(const Shape *shape, uint32_t before) {
        const Field *const guess = before < next_.size() ? next_[before] : nullptr;
        if (guess && StandsAt(*guess, at_, last_)) {
            at_ += guess->prefix.size();
            return guess;
        }
        std::string_view name;
        if (!Text(&name) || !Take(':')) return nullptr;
        const Field *const field = shape->Find(name);
        if (field && before < next_.size()) next_[before] = field;
        return field;
    }

    /// Of an object, from its opening brace through the closing one.
    bool Instances(const Shape *shape, std::size_t depth) {
        if (depth > kMaxSkimDepth || !Take('{')) return false;
        if (*at_ == '}') return TakeEnd();
        const std::size_t firstId = ids_.size();
        do {
            std::string_view id;
            if (!Text(&id) || !Take(':')) return false;
            ids_.push_back(HashName(id));
            if (!Members(shape, depth + 1)) return false;
        } while (Take(','));
        if (!TakeEnd()) return false;
        const bool differ = AllDiffer(std::span(ids_).subspan(firstId));
        ids_.resize(firstId);
        return differ;
    }

    bool Value(const Field &field, std::size_t depth) {
        switch (field.type) {
        case FieldType::Any:
            return false;
        case FieldType::Bool:
            return Literal("true") || Literal("false");
        case FieldType::Integer:
            return Integer(field);
        case FieldType::Text:
            return TextValue(field);
        case FieldType::Binary:
            return BinaryValue();
        case FieldType::TextList:
        case FieldType::IntegerList:
            return List(field);
        case FieldType::Object:
            return Members(field.shape, depth + 1);
        case FieldType::Instances:
            return Instances(field.shape, depth + 1);
        }
        return false;
    }

    bool Literal(std::string_view word) {
        if (static_cast<std::size_t>(last_ - at_) < word.size() ||
            std::memcmp(at_, word.data(), word.size()) != 0)
            return false;
        at_ += word.size();
        return true;
    }

    bool Integer(const Field &field) {
        int64_t number = 0;
        return TakeInteger(&at_, &number) && IntegerFits(&field, number);
    }

    bool List(const Field &field) {
        if (!Take('[')) return false;
        if (Take(']')) return true;
        do {
            if (!(field.type == FieldType::TextList ? TextValue(field) : Integer(field))) return false;
        } while (Take(','));
        return Take(']');
    }

    bool TextValue(const Field &field) {
        std::string_view text;
        std::size_t escapes = 0;
        return Text(&text, &escapes) && TextFits(&field, text.size() - escapes);
    }

    bool BinaryValue() {
        std::string_view text;
        std::size_t size = 0;
        if (!Text(&text)) return false;
        decoded_.resize(text.size() / 4 * 3 + 1);
        return dvs::base::DecodeBase64(text, decoded_.data(), &size);
    }

    /// A text that is as it is written. Names, ids and base64 mostly are.
    bool Text(std::string_view *text) {
        std::size_t escapes = 0;
        return Text(text, &escapes) && escapes == 0;
    }

    /// A text as it is written, between its quotes, and how many bytes of that are backslashes of escapes.
    bool Text(std::string_view *text, std::size_t *escapes) {
        if (!Take('"')) return false;
        const char *const begin = at_;
        while (at_ < last_) {
            const auto left = static_cast<std::size_t>(last_ - at_);
            uint64_t word = 0;
            std::memcpy(&word, at_, left < kWord ? left : kWord); // zeros are special
            const uint64_t special = SpecialBytes(word);
            if (special == 0) {
                at_ += kWord;
                continue;
            }
            at_ += std::countr_zero(special) / 8;
            if (*at_ == '"') {
                *text = {begin, static_cast<std::size_t>(at_++ - begin)};
                return true;
            }
            if (!StepOver(escapes)) return false;
        }
        return false;
    }

    /// Over an escape, or a character beyond ASCII.
    bool StepOver(std::size_t *escapes) {
        if (*at_ == '\\') {
            constexpr std::string_view kEscaped = "\"\\/nrtbf";
            if (kEscaped.find(at_[1]) == std::string_view::npos) return false;
            ++*escapes;
            at_ += 2;
            return true;
        }
        const std::size_t length = static_cast<unsigned char>(*at_) < 0x80 ? 0 : PlainSequence(at_, last_);
        at_ += length;
        return length > 0;
    }

    const char *at_;
    const char *const last_;
    std::array<const Field *, 256> next_{}; // by the number of the field before, or of the shape
    std::vector<uint64_t> ids_;             // of the lists of instances being looked through
    std::string decoded_;
};

} // namespace

const char *SkimInstances(const char *at, const char *last, const Shape *shape) {
    return Skimmer(at, last).List(shape);
}

} // namespace configstore
