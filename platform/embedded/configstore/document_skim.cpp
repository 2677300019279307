/* SPDX-License-Identifier: Apache-2.0 */
// The grammar and the schema once more, for a look only (document_skim.h). What is accepted here is accepted
// by the quick reader (document_plain.cpp); what is not is read there, and judged there.

#include "platform/embedded/configstore/document_skim.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <vector>

#include "platform/embedded/configstore/node.h"
#include "platform/embedded/configstore/text_code.h"

namespace configstore {

namespace {

constexpr std::size_t kMaxSkimDepth = 8;
constexpr std::size_t kWord = sizeof(uint64_t);

uint64_t WordAt(const char *at) {
    uint64_t word = 0;
    std::memcpy(&word, at, kWord);
    return word;
}

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
        const void *before = shape;
        do {
            const Field *const field = NextField(shape, before);
            if (!field) return false;
            const uint64_t bit = uint64_t{1} << field->index;
            if (seen & bit) return false;
            seen |= bit;
            before = field;
            if (!Value(*field, depth)) return false;
        } while (Take(','));
        return TakeEnd();
    }

    const Field *NextField(const Shape *shape, const void *before) {
        Guess &guess = guesses_[(reinterpret_cast<uintptr_t>(before) / sizeof(Field)) % guesses_.size()];
        if (guess.before == before && TakePrefix(guess.field->prefix)) return guess.field;
        std::string_view name;
        if (!Text(&name) || !Take(':')) return nullptr;
        const Field *const field = shape->Find(name);
        if (field) guess = {before, field};
        return field;
    }

    bool TakePrefix(const std::string &prefix) {
        const std::size_t size = prefix.size();
        if (size > static_cast<std::size_t>(last_ - at_)) return false;
        if (size < kWord) {
            if (std::memcmp(at_, prefix.data(), size) != 0) return false;
        } else {
            for (std::size_t i = 0; i + kWord < size; i += kWord) {
                if (WordAt(at_ + i) != WordAt(prefix.data() + i)) return false;
            }
            if (WordAt(at_ + size - kWord) != WordAt(prefix.data() + size - kWord)) return false;
        }
        at_ += size;
        return true;
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
        const auto from = ids_.begin() + static_cast<std::ptrdiff_t>(firstId);
        std::sort(from, ids_.end());
        const bool twice = std::adjacent_find(from, ids_.end()) != ids_.end();
        ids_.resize(firstId);
        return !twice;
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
        constexpr std::ptrdiff_t kSafeDigits = 18; // of any such number fits
        const bool negative = Take('-');
        const char *const digits = at_;
        int64_t value = 0;
        while (*at_ >= '0' && *at_ <= '9' && at_ - digits < kSafeDigits)
            value = value * 10 + (*at_++ - '0');
        const std::ptrdiff_t count = at_ - digits;
        if (count == 0 || (*digits == '0' && (count > 1 || negative))) return false;
        if (*at_ != ',' && *at_ != '}' && *at_ != ']') return false;
        return IntegerFits(&field, negative ? -value : value);
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
        return DecodeBase64(text, decoded_.data(), &size);
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

    struct Guess {
        const void *before = nullptr; // the field before, or the shape
        const Field *field = nullptr;
    };

    const char *at_;
    const char *const last_;
    std::array<Guess, 128> guesses_{};
    std::vector<uint64_t> ids_; // of the lists of instances being looked through
    std::string decoded_;
};

} // namespace

const char *SkimInstances(const char *at, const char *last, const Shape *shape) {
    return Skimmer(at, last).List(shape);
}

} // namespace configstore
