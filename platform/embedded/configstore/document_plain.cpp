/* SPDX-License-Identifier: Apache-2.0 */
// Reads the documents that the store writes itself, several times as fast as a general parser could
// (document_plain.h). It knows well-formed documents of described fields only and gives up at anything else:
// white space, names that the schema does not know, \u escapes, numbers that are not whole, content of
// another type than the schema has for it, anything doubtful.

#include "platform/embedded/configstore/document_plain.h"

#include <array>
#include <bit>
#include <cassert>
#include <cstring>
#include <span>
#include <string>
#include <vector>

#include "base/base64.h"
#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/document_parts.h"
#include "platform/embedded/configstore/document_skim.h"
#include "platform/embedded/configstore/text_code.h"

namespace configstore {

namespace {

constexpr std::size_t kMaxPlainDepth = 16; // below the general reader's limit, which has a message
static_assert(kMaxPlainDepth < kMaxDepth);

constexpr std::size_t kWord = sizeof(uint64_t);
constexpr std::size_t kEmptyList = 2; // bytes: {}

class PlainReader {
public:
    enum class Lists { Built, Skimmed };

    /// The text is not empty. `known` is the outline to go by, if there is one; `lists` says what becomes of
    /// the root's lists of instances.
    PlainReader(std::string_view text, Tree *tree, const Outline *known = nullptr, Lists lists = Lists::Built)
        : tree_(tree), start_(text.data()), at_(text.data()), last_(text.data() + text.size() - 1),
          known_(known), lists_(lists) {}

    bool Read() {
        return *last_ == '}' && Take('{') && Members(&tree_->root, tree_->shape, 1) && at_ == last_ + 1;
    }

    /// The text of a list of instances.
    void ReadList(Object *list) {
        MakeInstances(tree_, list);
        [[maybe_unused]] const bool read = Take('{') && Instances(list, list->field->shape, 1);
        assert(read);
    }

    [[nodiscard]] const Outline &Found() const { return found_; }

private:
    // The last byte is a brace. Only the end of the root object may step over it, so that nothing else need
    // ask whether there is a byte to look at.

    bool TakeEnd(std::size_t depth) { return Take('}') && (at_ <= last_ || depth == 1); }

    bool Take(char c) {
        if (*at_ != c) return false;
        at_++;
        return true;
    }

    /// Behind the opening brace, through the closing one.
    bool Members(Object *object, const Shape *shape, std::size_t depth) {
        if (!shape || depth > kMaxPlainDepth) return false;
        if (*at_ == '}') return TakeEnd(depth);
        uint64_t seen = 0;
        uint32_t before = shape->Number();
        do {
            const Field *const field = NextField(shape, before);
            if (!field) return false;
            const uint64_t bit = uint64_t{1} << field->index;
            if (seen & bit) return false;
            seen |= bit;
            before = field->number;
            Object *const member = AddDescribed(tree_, object, field);
            if (!Value(member, field, depth)) return false;
        } while (Take(','));
        return TakeEnd(depth);
    }

    /// A name with its colon. What came behind a field once, mostly comes behind it again. `before` is the
    /// number of that field, or of the shape.
    const Field *NextField(const Shape *shape, uint32_t before) {
        const Field *const guess = before < next_.size() ? next_[before] : nullptr;
        if (guess && IsNext(*guess)) {
            at_ += guess->prefix.size();
            return guess;
        }
        std::string_view name;
        if (!Text(&name) || !Take(':')) return nullptr;
        const Field *const field = shape->Find(name);
        if (field && before < next_.size()) next_[before] = field;
        return field;
    }

    [[nodiscard]] bool IsNext(const Field &field) const { return StandsAt(field, at_, last_); }

    bool Value(Object *node, const Field *field, std::size_t depth) {
        switch (*at_) {
        case '{':
            at_++;
            if (field->type == FieldType::Object) {
                MakeObject(node);
                return Members(node, field->shape, depth + 1);
            }
            if (field->type != FieldType::Instances) return false;
            return depth == 1 ? RootInstances(node, field) : NewInstances(node, field, depth);
        case '[':
            at_++;
            return List(node, field);
        case '"':
            return TextValue(node, field);
        case 't':
            return Literal(node, field, "true", Kind::Bool, true);
        case 'f':
            return Literal(node, field, "false", Kind::Bool, false);
        case 'n':
            return Literal(node, field, "null", Kind::Null, false);
        default:
            if (!TakeInteger(&at_, &node->integer)) return false;
            node->kind = Kind::Integer;
            if (field->type != FieldType::Integer || !IntegerFits(field, node->integer)) Judge(tree_, node);
            return true;
        }
    }

    bool NewInstances(Object *node, const Field *field, std::size_t depth) {
        MakeInstances(tree_, node);
        return Instances(node, field->shape, depth + 1);
    }

    bool RootInstances(Object *node, const Field *field) {
        const auto begin = static_cast<std::size_t>(at_ - 1 - start_);
        if (known_ && known_->field == field && known_->begin == begin) {
            LeaveText(node, start_ + known_->end);
            return true;
        }
        if (lists_ == Lists::Skimmed && *at_ != '}') {
            const char *const end = SkimInstances(at_ - 1, last_, field->shape);
            if (!end) return false;
            LeaveText(node, end);
        } else if (!NewInstances(node, field, 1)) {
            return false;
        }
        const auto end = static_cast<std::size_t>(at_ - start_);
        if (end - begin > kEmptyList && end - begin > found_.end - found_.begin) found_ = {field, begin, end};
        return true;
    }

    void LeaveText(Object *node, const char *end) {
        node->span = {const_cast<char *>(at_ - 1),
                      static_cast<std::size_t>(end - at_ + 1)}; // nobody writes to it
        node->kind = Kind::Later;
        at_ = end;
    }

    /// Behind the opening brace, through the closing one.
    bool Instances(Object *list, const Shape *shape, std::size_t depth) {
        if (depth > kMaxPlainDepth) return false;
        if (*at_ == '}') return TakeEnd(depth);
        const std::size_t firstId = ids_.size();
        do {
            std::string_view id;
            if (!Text(&id) || !Take(':') || !Take('{')) return false;
            ids_.push_back(HashName(id));
            if (!Members(AddInstance(tree_, list, id), shape, depth + 1)) return false;
        } while (Take(','));
        if (!TakeEnd(depth)) return false;
        const bool differ = AllDiffer(std::span(ids_).subspan(firstId));
        ids_.resize(firstId);
        return differ;
    }

    /// Behind the opening bracket, through the closing one.
    bool List(Object *node, const Field *field) {
        node->kind = Kind::EmptyList;
        if (field->type != FieldType::TextList && field->type != FieldType::IntegerList &&
            field->type != FieldType::Instances)
            return false;
        if (Take(']')) {
            Judge(tree_, node);
            return true;
        }
        if (field->type == FieldType::Instances) return false;
        PackedList *const list = NewList(tree_);
        do {
            std::string_view text;
            int64_t number = 0;
            if (field->type == FieldType::TextList) {
                if (!Text(&text)) return false;
                AppendText(tree_, list, text);
            } else {
                if (!TakeInteger(&at_, &number)) return false;
                AppendInteger(tree_, list, number);
            }
        } while (Take(','));
        node->kind = field->type == FieldType::TextList ? Kind::TextList : Kind::IntegerList;
        node->list = list;
        Judge(tree_, node);
        return Take(']');
    }

    bool TextValue(Object *node, const Field *field) {
        std::string_view text;
        if (!Text(&text)) return false;
        std::size_t size = 0;
        if (field->type == FieldType::Binary && DecodeBase64Into(text, &size, node)) {
            Judge(tree_, node);
            return true;
        }
        node->kind = Kind::Text;
        node->span = {tree_->arena.Copy(text), text.size()};
        if (field->type != FieldType::Text || !TextFits(field, text.size())) Judge(tree_, node);
        return true;
    }

    bool DecodeBase64Into(std::string_view text, std::size_t *size, Object *node) {
        auto *const bytes = static_cast<char *>(tree_->arena.Allocate(text.size() / 4 * 3 + 1));
        if (!dvs::base::DecodeBase64(text, bytes, size)) return false;
        node->kind = Kind::Binary;
        node->span = {bytes, *size};
        return true;
    }

    template <std::size_t kSize>
    bool Literal(Object *node, const Field *field, const char (&word)[kSize], Kind kind, bool value) {
        constexpr std::size_t kLength = kSize - 1;
        if (static_cast<std::size_t>(last_ - at_) < kLength || std::memcmp(at_, word, kLength) != 0)
            return false;
        at_ += kLength;
        node->kind = kind;
        if (kind == Kind::Bool) node->boolean = value;
        if (kind != Kind::Bool || field->type != FieldType::Bool) Judge(tree_, node);
        return true;
    }

    /// A text with its quotes; good until the next one.
    bool Text(std::string_view *text) {
        if (!Take('"')) return false;
        const char *run = at_;
        SkipPlain();
        if (*at_ == '"') {
            *text = {run, static_cast<std::size_t>(at_++ - run)};
            return true;
        }
        unescaped_.clear();
        while (*at_ == '\\') {
            const char unescaped = Unescaped(at_[1]);
            if (!unescaped) return false;
            unescaped_.append(run, at_).push_back(unescaped);
            run = at_ += 2;
            SkipPlain();
        }
        if (*at_ != '"')
            return false; // a control character, a stray byte, one that stands for a byte, the end
        *text = unescaped_.append(run, at_++);
        return true;
    }

    /// On to the next quote, backslash, control character or byte that is no part of an ordinary character,
    /// or to the last byte.
    void SkipPlain() {
        while (at_ < last_) {
            uint64_t word = 0;
            if (static_cast<std::size_t>(last_ - at_) >= kWord)
                std::memcpy(&word, at_, kWord);
            else
                std::memcpy(&word, at_, static_cast<std::size_t>(last_ - at_));
            const uint64_t special = SpecialBytes(word); // zeros where the text is shorter than a word
            if (special == 0) {
                at_ += kWord;
                continue;
            }
            at_ += std::countr_zero(special) / 8;
            if (static_cast<unsigned char>(*at_) < 0x80) return;
            const std::size_t length = PlainSequence(at_, last_);
            if (length == 0) return;
            at_ += length;
        }
    }

    static char Unescaped(char escape) {
        switch (escape) {
        case '"':
        case '\\':
        case '/':
            return escape;
        case 'n':
            return '\n';
        case 'r':
            return '\r';
        case 't':
            return '\t';
        case 'b':
            return '\b';
        case 'f':
            return '\f';
        default:
            return '\0';
        }
    }

    Tree *const tree_;
    const char *const start_;
    const char *at_;
    const char *const last_;
    const Outline *const known_;
    const Lists lists_;
    Outline found_;
    std::array<const Field *, 256> next_{}; // by the number of the field before, or of the shape
    std::string unescaped_;
    std::vector<uint64_t> ids_; // of the lists of instances being read
};

} // namespace

bool ReadPlainDocument(std::string_view text, Tree *tree) {
    tree->arena.Expect(text.size() / 4);
    if (!text.empty() && PlainReader(text, tree).Read()) return true;
    MakeObject(&tree->root);
    tree->tables = nullptr; // no list has an index yet
    tree->suspect = false;
    return false;
}

bool ReadOutline(std::shared_ptr<const Buffer> text, Tree *tree, Outline *outline) {
    if (text->Empty()) return false;
    tree->text = std::move(text);
    PlainReader reader(tree->text->View(), tree, nullptr, PlainReader::Lists::Skimmed);
    if (!reader.Read() || tree->suspect) return false; // what has to be refused must be there to be found
    *outline = reader.Found();
    return true;
}

bool ReadAgain(std::shared_ptr<const Buffer> text, const Outline &outline, Tree *tree) {
    tree->text = std::move(text);
    return PlainReader(tree->text->View(), tree, &outline).Read();
}

void ReadLater(Tree *tree, Object *node) {
    const Span text = node->span;
    try {
        PlainReader({text.data, text.size}, tree).ReadList(node);
    } catch (...) {
        node->kind = Kind::Later;
        node->span = text;
        throw;
    }
}

} // namespace configstore
