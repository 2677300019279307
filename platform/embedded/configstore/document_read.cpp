/* SPDX-License-Identifier: Apache-2.0 */
// Reads a document into a tree (document.h). Boost.JSON's event parser does the syntax, UTF-8 and depth; the
// events become nodes at once, without a document model in between, guided by the schema's shapes. Content
// that the shapes do not describe is kept as compact JSON text. Documents as the store writes them never come
// this far: document_plain.cpp reads them.

#include <algorithm>
#include <boost/json/basic_parser_impl.hpp>
#include <charconv>

#include "base/base64.h"
#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/document_plain.h"
#include "platform/embedded/configstore/text_code.h"

namespace configstore {

namespace {

namespace json = boost::json;
using json::error_code;

/// Takes the parser's events.
class Builder {
public:
    static constexpr std::size_t max_object_size = SIZE_MAX;
    static constexpr std::size_t max_array_size = SIZE_MAX;
    static constexpr std::size_t max_key_size = SIZE_MAX;
    static constexpr std::size_t max_string_size = SIZE_MAX;

    Builder(Tree *tree, Object *root, bool open, Reading reading)
        : tree_(tree), root_(root), open_(open), strict_(reading == Reading::Strict) {}

    [[nodiscard]] const std::string &Why() const { return why_; }
    /// The path of what was refused, or of what was being read.
    [[nodiscard]] std::string Where() const {
        if (depth_ == 0) return "";
        const std::string path = PathOf(rawDepth_ > 0 ? target_ : frames_[depth_ - 1].node);
        if (member_.empty()) return path;
        return path.empty() ? member_ : path + '/' + member_;
    }

    bool on_document_begin(error_code &) { return true; }
    bool on_document_end(error_code &) { return true; }
    bool on_comment_part(json::string_view, error_code &) { return true; }
    bool on_comment(json::string_view, error_code &) { return true; }
    bool on_number_part(json::string_view, error_code &) { return true; }

    bool on_object_begin(error_code &ec) {
        if (depth_ == 0) {
            MakeObject(root_);
            Push(root_, nullptr);
            return true;
        }
        if (rawDepth_ > 0) return BeginRaw('{');
        if (frames_[depth_ - 1].kind == Kind::EmptyList) return BreakList(ec) && BeginRaw('{');
        Object *const node = NewChild();
        const FieldType type = TypeOf(node);
        if (type == FieldType::Object) {
            MakeObject(node);
            Push(node, node);
        } else if (type == FieldType::Instances) {
            MakeInstances(tree_, node);
            Push(node, node);
        } else {
            target_ = node;
            return BeginRaw('{');
        }
        return true;
    }

    bool on_object_end(std::size_t count, error_code &ec) {
        Frame &frame = frames_[depth_ - 1];
        if (strict_ && rawDepth_ == 0 && frame.kind == Kind::Instances && count > frame.node->field->maxItems)
            return Refuse(ec, "more than " + std::to_string(frame.node->field->maxItems) + " instances");
        const auto from = hashes_.begin() + static_cast<std::ptrdiff_t>(frame.hashes);
        std::sort(from, hashes_.end());
        const bool twice = std::adjacent_find(from, hashes_.end()) != hashes_.end();
        hashes_.resize(frame.hashes);
        if (twice) return Refuse(ec, "a name occurs twice in an object");
        if (rawDepth_ > 0) return EndRaw('}');
        Pop();
        return true;
    }

    bool on_array_begin(error_code &ec) {
        if (depth_ == 0) {
            if (!open_) return Refuse(ec, "a document must be an object");
            list_ = NewList(tree_);
            root_->kind = Kind::EmptyList;
            Push(root_, root_);
            frames_[0].kind = Kind::EmptyList;
            return true;
        }
        if (rawDepth_ > 0) return BeginRaw('[');
        if (frames_[depth_ - 1].kind == Kind::EmptyList) return BreakList(ec) && BeginRaw('[');
        Object *const node = NewChild();
        const FieldType type = TypeOf(node);
        if (type != FieldType::TextList && type != FieldType::IntegerList && type != FieldType::Instances) {
            target_ = node;
            return BeginRaw('[');
        }
        list_ = NewList(tree_);
        node->kind = Kind::EmptyList;
        Push(node, node);
        return true;
    }

    bool on_array_end(std::size_t count, error_code &ec) {
        if (rawDepth_ > 0) return EndRaw(']');
        Object *const node = frames_[depth_ - 1].node;
        if (strict_ && node->described && count > node->field->maxItems)
            return Refuse(ec, "a list with more than " + std::to_string(node->field->maxItems) + " items");
        if (node->kind != Kind::EmptyList) node->list = list_;
        Judge(tree_, node);
        Pop();
        return true;
    }

    bool on_key_part(json::string_view part, std::size_t, error_code &) {
        text_.append(part.data(), part.size());
        return true;
    }

    bool on_key(json::string_view last, std::size_t, error_code &ec) {
        std::string_view key = Whole(last);
        Frame &frame = frames_[depth_ - 1];
        if (key.find('\0') != std::string_view::npos) {
            if (frame.kind == Kind::Object) member_ = Shown(key);
            return Refuse(ec, "a name with a NUL character");
        }
        if (rawDepth_ > 0) {
            hashes_.push_back(HashName(key));
            Separate();
            WriteText(key, true, &raw_);
            raw_.Put(':');
            text_.clear();
            return true;
        }
        if (HasEncodedBytes(key)) {
            decoded_.resize(key.size());
            decoded_.resize(static_cast<std::size_t>(DecodeText(decoded_.data(), key) - decoded_.data()));
            key = decoded_;
        }
        field_ = nullptr;
        if (frame.kind == Kind::Object) field_ = frame.shape ? NextField(frame, key) : nullptr;
        if (field_) {
            const uint64_t bit = uint64_t{1} << frame.next++;
            if (frame.next == frame.shape->Fields().size()) frame.next = 0;
            if (frame.seen & bit) {
                member_ = Shown(key);
                return Refuse(ec, "the name \"" + Shown(key) + "\" occurs twice in an object");
            }
            frame.seen |= bit;
        } else {
            if (strict_ && frame.kind == Kind::Object && frame.shape) {
                member_ = Shown(key);
                return Refuse(ec, "the schema knows no member \"" + Shown(key) + "\" here");
            }
            hashes_.push_back(HashName(key));
            key_.assign(key);
        }
        text_.clear();
        return true;
    }

    bool on_string_part(json::string_view part, std::size_t, error_code &) {
        text_.append(part.data(), part.size());
        return true;
    }

    bool on_string(json::string_view last, std::size_t, error_code &ec) {
        const std::string_view text = Whole(last);
        if (text.find('\0') != std::string_view::npos) {
            if (rawDepth_ == 0 && depth_ > 0 && frames_[depth_ - 1].kind == Kind::Object)
                member_ = field_ ? std::string(field_->name) : Shown(key_);
            return Refuse(ec, "a text with a NUL character");
        }
        if (!PutText(text, ec)) return false;
        text_.clear();
        if (text_.capacity() > kKeptCapacity) std::string().swap(text_);
        return true;
    }

    bool on_int64(int64_t value, json::string_view, error_code &ec) {
        if (rawDepth_ == 0 && depth_ > 0 && frames_[depth_ - 1].kind == Kind::EmptyList) {
            Object *const list = frames_[depth_ - 1].node;
            if (list->kind == Kind::EmptyList && TypeOf(list) != FieldType::TextList)
                list->kind = Kind::IntegerList;
            if (list->kind == Kind::IntegerList) {
                AppendInteger(tree_, list_, value);
                return true;
            }
        }
        return Scalar(
            ec, Kind::Integer, value, [&] { PutNumber(value); },
            [&](Object *node) { node->integer = value; });
    }

    bool on_uint64(uint64_t value, json::string_view, error_code &ec) {
        return Scalar(
            ec, Kind::Unsigned, value, [&] { PutNumber(value); },
            [&](Object *node) { node->unsignedInteger = value; });
    }

    bool on_double(double value, json::string_view, error_code &ec) {
        return Scalar(
            ec, Kind::Real, value, [&] { PutReal(value); }, [&](Object *node) { node->real = value; });
    }

    bool on_bool(bool value, error_code &ec) {
        return Scalar(
            ec, Kind::Bool, value,
            [&] { raw_.Put(value ? std::string_view("true") : std::string_view("false")); },
            [&](Object *node) { node->boolean = value; });
    }

    bool on_null(error_code &ec) {
        return Scalar(
            ec, Kind::Null, 0, [&] { raw_.Put(std::string_view("null")); }, [](Object *) {});
    }

private:
    struct Frame {
        Object *node;
        const Shape *shape;
        Kind kind;        // Object, Instances, or EmptyList for any list
        std::size_t next; // the field expected next: documents are mostly written in one order
        uint64_t seen;
        std::size_t hashes;
    };
    static constexpr std::size_t kKeptCapacity = std::size_t{1} << 16;

    bool Refuse(error_code &ec, std::string why) {
        why_ = std::move(why);
        if (depth_ > 0 && rawDepth_ == 0) {
            const std::string path = PathOf(frames_[depth_ - 1].node);
            if (!path.empty()) why_ = path + ": " + why_;
        }
        ec = json::error::syntax;
        return false;
    }

    static std::string Shown(std::string_view key) { return std::string(key.substr(0, 100)); }

    std::string_view Whole(json::string_view last) {
        if (text_.empty()) return {last.data(), last.size()};
        text_.append(last.data(), last.size());
        return text_;
    }

    void Push(Object *node, const Object *) {
        Frame &frame = frames_[depth_++];
        frame.node = node;
        frame.kind = node->kind;
        frame.shape = node->kind == Kind::Object ? ShapeOf(node) : nullptr;
        frame.next = 0;
        frame.seen = 0;
        frame.hashes = hashes_.size();
    }

    void Pop() { depth_--; }

    const Field *NextField(Frame &frame, std::string_view key) {
        const std::vector<const Field *> &fields = frame.shape->Fields();
        if (frame.next < fields.size() && fields[frame.next]->name == key) return fields[frame.next];
        const Field *const field = frame.shape->Find(key);
        if (field) frame.next = field->index;
        return field;
    }

    /// The node that the value at hand belongs to, added to the innermost object or list of instances.
    Object *NewChild() {
        const Frame &frame = frames_[depth_ - 1];
        if (frame.kind == Kind::Instances) return AddInstance(tree_, frame.node, key_);
        return AddMember(tree_, frame.node, field_, key_);
    }

    /// What the schema wants at a node. An instance is an object; nothing is wanted where nothing is known.
    static FieldType TypeOf(const Object *node) {
        if (node->described) return node->field->type;
        if (!node->isRoot && node->parent->kind == Kind::Instances) return FieldType::Object;
        return FieldType::Any;
    }

    template <typename Value, typename PutRaw, typename Fill>
    bool Scalar(error_code &ec, Kind kind, Value, PutRaw putRaw, Fill fill) {
        if (depth_ == 0) return Refuse(ec, "a document must be an object");
        if (rawDepth_ == 0 && frames_[depth_ - 1].kind == Kind::EmptyList && !BreakList(ec)) return false;
        if (rawDepth_ > 0) {
            Separate();
            putRaw();
            return true;
        }
        Object *const node = NewChild();
        node->kind = kind;
        fill(node);
        Judge(tree_, node);
        return true;
    }

    bool PutText(std::string_view text, error_code &ec) {
        if (depth_ == 0) return Refuse(ec, "a document must be an object");
        if (rawDepth_ == 0 && frames_[depth_ - 1].kind == Kind::EmptyList) {
            Object *const list = frames_[depth_ - 1].node;
            if (list->kind == Kind::EmptyList && TypeOf(list) != FieldType::IntegerList)
                list->kind = Kind::TextList;
            if (list->kind == Kind::TextList) {
                if (HasEncodedBytes(text)) {
                    decoded_.resize(text.size());
                    text = {decoded_.data(),
                            static_cast<std::size_t>(DecodeText(decoded_.data(), text) - decoded_.data())};
                }
                AppendText(tree_, list_, text);
                return true;
            }
            if (!BreakList(ec)) return false;
        }
        if (rawDepth_ > 0) {
            Separate();
            WriteText(text, true, &raw_);
            return true;
        }
        Object *const node = NewChild();
        FillText(node, text);
        Judge(tree_, node);
        return true;
    }

    void FillText(Object *node, std::string_view text) {
        if (TypeOf(node) == FieldType::Binary) {
            auto *const bytes = static_cast<char *>(tree_->arena.Allocate(text.size() / 4 * 3 + 1));
            std::size_t size = 0;
            if (dvs::base::DecodeBase64(text, bytes, &size)) {
                node->kind = Kind::Binary;
                node->span = {bytes, size};
                return;
            }
        }
        node->kind = Kind::Text;
        node->maybeBinary = !node->described;
        char *const copy = tree_->arena.Copy(text);
        std::size_t size = text.size();
        if (HasEncodedBytes(text)) {
            char *const end = DecodeText(copy, text);
            *end = '\0';
            size = static_cast<std::size_t>(end - copy);
        }
        node->span = {copy, size};
    }

    template <typename Number> void PutNumber(Number value) {
        char *const at = raw_.Room(32);
        raw_.Used(std::to_chars(at, at + 32, value).ptr);
    }

    void PutReal(double value) {
        const std::size_t before = raw_.View().size();
        PutNumber(value);
        if (raw_.View().substr(before).find_first_of(".eE") == std::string_view::npos)
            raw_.Put(std::string_view(".0"));
    }

    /// Puts the comma before the next element or name of raw content.
    void Separate() {
        if (raw_.Empty()) return;
        const char last = raw_.View().back();
        if (last != '[' && last != '{' && last != ':') raw_.Put(',');
    }

    bool BeginRaw(char opening) {
        Separate();
        raw_.Put(opening);
        rawDepth_++;
        Frame &frame = frames_[depth_++]; // only for the names seen
        frame.node = frames_[depth_ - 2].node;
        frame.kind = Kind::Raw;
        frame.hashes = hashes_.size();
        return true;
    }

    bool EndRaw(char closing) {
        raw_.Put(closing);
        depth_--;
        if (--rawDepth_ > 0) return true;
        target_->kind = Kind::Raw;
        target_->span = {tree_->arena.Copy(raw_.View()), raw_.View().size()};
        raw_.Clear();
        Judge(tree_, target_);
        return true;
    }

    /// The list at hand has an element that no packed list holds: what has been read of it becomes raw.
    bool BreakList(error_code &ec) {
        Frame &frame = frames_[depth_ - 1];
        if (frame.node == root_ && open_) return Refuse(ec, "a list of neither texts nor numbers");
        target_ = frame.node;
        raw_.Put('[');
        const char *at = list_->data;
        for (std::size_t i = 0; i < list_->count; i++) {
            Separate();
            if (target_->kind == Kind::IntegerList) {
                PutNumber(IntegerAt(list_, i));
            } else {
                WriteText(at, false, &raw_);
                at += std::strlen(at) + 1;
            }
        }
        frame.kind = Kind::Raw;
        frame.hashes = hashes_.size();
        rawDepth_ = 1;
        return true;
    }

    Tree *const tree_;
    Object *const root_;
    const bool open_; // the root may be a list: content that was kept as text
    const bool strict_;
    std::string why_;
    std::string member_; // of the innermost object, that was refused
    Frame frames_[kMaxDepth + 2];
    std::size_t depth_ = 0;
    std::size_t rawDepth_ = 0;
    Buffer raw_;
    Object *target_ = nullptr;     // the node that the raw content goes to
    const Field *field_ = nullptr; // of the last name read
    PackedList *list_ = nullptr;
    std::string key_;
    std::string text_; // parts of a name or text that comes in several
    std::string decoded_;
    std::vector<uint64_t> hashes_; // of undescribed names in the open objects
};

bool Parse(std::string_view text, Tree *tree, Object *root, bool open, Reading reading, std::string *why,
           std::string *where) {
    json::parse_options options;
    options.max_depth = kMaxDepth;
    json::basic_parser<Builder> parser(options, tree, root, open, reading);
    error_code ec;
    const std::size_t used = parser.write_some(false, text.data(), text.size(), ec);
    if (!ec && used < text.size()) ec = json::error::extra_data;
    if (!ec) return true;
    const std::string &own = parser.handler().Why();
    *why = "at byte " + std::to_string(used) + ": " + (own.empty() ? ec.message() : own);
    if (where) *where = parser.handler().Where();
    return false;
}

} // namespace

bool ReadDocument(std::string_view text, Reading reading, Tree *tree, std::string *why, std::string *where) {
    if (reading == Reading::Tolerant && ReadPlainDocument(text, tree)) return true;
    return Parse(text, tree, &tree->root, false, reading, why, where);
}

bool Expand(Tree *tree, Object *node) {
    if (node->kind == Kind::Later) {
        ReadLater(tree, node);
        return true;
    }
    if (node->kind != Kind::Raw || node->bad) return false;
    const Span raw = node->span;
    std::string why;
    if (Parse({raw.data, raw.size}, tree, node, true, Reading::Tolerant, &why, nullptr)) return true;
    node->kind = Kind::Raw;
    node->span = raw;
    return false;
}

bool TreatAsInstances(Tree *tree, Object *node) {
    const bool undescribed = !node->described || node->field->type == FieldType::Any;
    if (node->kind != Kind::Object || !undescribed) return false;
    std::size_t count = 0;
    Object *last = nullptr;
    for (Object *child = node->members.first; child; child = child->next) {
        const bool object =
            child->kind == Kind::Object || (child->kind == Kind::Raw && child->span.data[0] == '{');
        if (!object || child->described) return false;
        last = child;
        count++;
    }
    Object *const first = node->members.first;
    MakeInstances(tree, node);
    node->table->first = first;
    node->table->last = last;
    node->table->count = count;
    return true;
}

} // namespace configstore
