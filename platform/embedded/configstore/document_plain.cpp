/* SPDX-License-Identifier: Apache-2.0 */
// The two sinks of the documents' grammar (document_grammar.h): one makes nodes, the other only checks. A save
// lists all objects and throws the ports of each away, so their lists are checked and stay text.

#include "platform/embedded/configstore/document_plain.h"

#include <cassert>

#include "base/base64.h"
#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/document_grammar.h"

namespace configstore {

char *EscapedText::Unescape(char *out) const {
    constexpr std::string_view kEscaped = "\"\\/nrtbf";
    constexpr std::string_view kMeant = "\"\\/\n\r\t\b\f";
    std::string_view rest = text;
    for (std::size_t i = 0; i < escapes; i++) {
        const std::size_t run = rest.find('\\');
        out = std::copy_n(rest.data(), run, out);
        *out++ = kMeant[kEscaped.find(rest[run + 1])];
        rest.remove_prefix(run + 2);
    }
    return std::copy_n(rest.data(), rest.size(), out);
}

bool AreDistinct(std::span<uint64_t> hashes) {
    constexpr std::size_t kFew = 32;
    constexpr std::size_t kMostSteps = 1024;
    if (hashes.size() < 2) return true;
    if (hashes.size() <= kFew) {
        std::sort(hashes.begin(), hashes.end());
        return std::adjacent_find(hashes.begin(), hashes.end()) == hashes.end();
    }
    // Many are not sorted, which takes longer than reading them. Half of a hash and its place are enough.
    std::vector<uint32_t> seen(std::bit_ceil(hashes.size() + hashes.size() / 3)); // 0 is nothing
    for (const uint64_t hash : hashes) {
        const auto half = static_cast<uint32_t>(hash >> 32 | 1);
        std::size_t at = hash & (seen.size() - 1);
        for (std::size_t steps = 0; seen[at] != 0; at = (at + 1) & (seen.size() - 1)) {
            if (seen[at] == half || ++steps == kMostSteps) return false;
        }
        seen[at] = half;
    }
    return true;
}

namespace {

/// Checks that the schema allows everything, and refuses what is rare and not worth the trouble. Text and
/// numbers are all it looks at, so that nodes are of no concern.
class CheckSink {
public:
    struct Node {};
    static constexpr bool kTakesMisfits = false;
    struct Members {
        Members(CheckSink *, Node) {}
        Node Add(const Field *) { return {}; }
        void End() {}
    };

    Node AddInstance(Node, std::string_view) { return {}; }
    void MakeObject(Node) {}
    void MakeInstances(Node) {}
    bool Put(Node, const Field *, bool) { return true; }
    bool Put(Node, const Field *field, int64_t value) { return IntegerFits(field, value); }
    bool Put(Node, const Field *field, const EscapedText &text) {
        if (field->type == FieldType::Text) return TextFits(field, text.Size());
        bytes_.resize(dvs::base::DecodedBase64Size(text.text.size()));
        std::size_t size = 0;
        return text.escapes == 0 && dvs::base::DecodeBase64(text.text, bytes_.data(), &size);
    }
    bool PutMisfit(Node, const Field *field, Kind kind) {
        return kind == Kind::EmptyList && field->type != FieldType::Instances;
    }
    void BeginList() {}
    bool AddItem(const Field *field, int64_t value) { return IntegerFits(field, value); }
    bool AddItem(const Field *field, const EscapedText &text) { return TextFits(field, text.Size()); }
    bool EndList(Node, const Field *) { return true; }
    const char *LeaveList(Node, const Field *, const char *, const char *) { return nullptr; }
    void EndRootList(const Field *, const char *, const char *) {}

private:
    std::string bytes_;
};

/// Makes the nodes of a tree, exactly as the general reader does.
class TreeSink {
public:
    using Node = Object *;
    static constexpr bool kTakesMisfits = true;

    /// Links the members at their end, in one go.
    class Members {
    public:
        Members(TreeSink *sink, Object *object)
            : arena_(sink->tree_->arena), object_(object), link_(&object->members.first) {}
        Object *Add(const Field *field) {
            Object *const member = NewNode(arena_, object_);
            member->described = true;
            member->field = field;
            present_ |= field->mark;
            *link_ = last_ = member;
            link_ = &member->next;
            return member;
        }
        void End() {
            object_->members.last = last_;
            object_->present = present_;
        }

    private:
        Arena &arena_;
        Object *object_;
        Object **link_;
        Object *last_ = nullptr;
        uint32_t present_ = 0;
    };

    explicit TreeSink(Tree *tree) : tree_(tree) {}

    Object *AddInstance(Object *list, std::string_view id) {
        return configstore::AddInstance(tree_, list, id);
    }
    void MakeObject(Object *node) { configstore::MakeObject(node); }
    void MakeInstances(Object *node) { configstore::MakeInstances(tree_, node); }

    bool Put(Object *node, const Field *field, bool value) {
        node->kind = Kind::Bool;
        node->boolean = value;
        if (field->type != FieldType::Bool) Judge(tree_, node);
        return true;
    }
    bool Put(Object *node, const Field *field, int64_t value) {
        node->kind = Kind::Integer;
        node->integer = value;
        if (field->type != FieldType::Integer || !IntegerFits(field, value)) Judge(tree_, node);
        return true;
    }
    bool Put(Object *node, const Field *field, const EscapedText &text) {
        const std::size_t size = text.Size();
        if (field->type == FieldType::Binary && text.escapes == 0 && Decode(text.text, node)) return true;
        auto *const bytes = static_cast<char *>(tree_->arena.Allocate(size + 1));
        (void)Copy(text, bytes);
        node->kind = Kind::Text;
        node->span = {bytes, size};
        if (field->type == FieldType::Text && TextFits(field, size)) [[likely]]
            return true;
        if (field->type != FieldType::Binary || !Decode({bytes, size}, node)) Judge(tree_, node);
        return true;
    }
    bool PutMisfit(Object *node, const Field *, Kind kind) {
        node->kind = kind;
        Judge(tree_, node);
        return true;
    }

    void BeginList() {
        list_ = NewList(tree_);
        fits_ = true;
    }
    bool AddItem(const Field *field, int64_t value) {
        AppendInteger(tree_, list_, value);
        fits_ &= IntegerFits(field, value);
        return true;
    }
    bool AddItem(const Field *field, const EscapedText &text) {
        const std::size_t size = text.Size();
        (void)Copy(text, AppendRoom(tree_, list_, size));
        fits_ &= TextFits(field, size);
        return true;
    }
    bool EndList(Object *node, const Field *field) {
        node->kind = field->type == FieldType::TextList ? Kind::TextList : Kind::IntegerList;
        node->list = list_;
        node->bad = !fits_;
        tree_->suspect |= !fits_;
        return true;
    }

    const char *LeaveList(Object *, const Field *, const char *, const char *) { return nullptr; }
    void EndRootList(const Field *, const char *, const char *) {}

protected:
    Tree *const tree_;

private:
    bool Decode(std::string_view text, Object *node) {
        const std::size_t most = dvs::base::DecodedBase64Size(text.size());
        auto *const bytes = static_cast<char *>(tree_->arena.Allocate(most + 1));
        std::size_t size = 0;
        if (!dvs::base::DecodeBase64(text, bytes, &size)) return false;
        node->kind = Kind::Binary;
        node->span = {bytes, size};
        return true;
    }
    /// With a NUL behind. Returns its place.
    static char *Copy(const EscapedText &text, char *out) {
        char *const end =
            text.escapes == 0 ? std::copy_n(text.text.data(), text.text.size(), out) : text.Unescape(out);
        *end = '\0';
        return end;
    }

    PackedList *list_ = nullptr;
    bool fits_ = true;
};

/// The same for an object that is probably rewritten: the root's lists of instances stay text.
class OutlineSink : public TreeSink {
public:
    /// `known` is the outline of an earlier look at the text; null for the first, which checks the lists.
    OutlineSink(Tree *tree, const char *start, const Outline *known)
        : TreeSink(tree), start_(start), known_(known) {}

    const char *LeaveList(Object *node, const Field *field, const char *at, const char *last) {
        const char *end = nullptr;
        if (known_) {
            const bool isKnown = known_->field == field && known_->begin == Offset(at);
            end = isKnown ? start_ + known_->end : nullptr;
        } else if (at[1] != '}') {
            CheckSink check;
            end = DocumentReader<CheckSink>(&check, last).ReadInstances(at, {}, field->shape, 2);
        }
        if (!end) return nullptr;
        node->span = {const_cast<char *>(at), static_cast<std::size_t>(end - at)}; // never written to
        node->kind = Kind::Later;
        return end;
    }
    void EndRootList(const Field *field, const char *at, const char *end) {
        const auto size = static_cast<std::size_t>(end - at);
        if (size > kEmptyList && size > found_.end - found_.begin) found_ = {field, Offset(at), Offset(end)};
    }
    [[nodiscard]] const Outline &Found() const { return found_; }

private:
    static constexpr std::size_t kEmptyList = 2; // bytes: {}

    [[nodiscard]] std::size_t Offset(const char *at) const { return static_cast<std::size_t>(at - start_); }

    const char *const start_;
    const Outline *const known_;
    Outline found_;
};

template <typename Sink> bool ReadRoot(std::string_view text, Tree *tree, Sink *sink) {
    if (text.empty() || text.back() != '}') return false;
    DocumentReader<Sink> reader(sink, &text.back());
    return reader.ReadObject(text.data(), &tree->root, tree->shape, 1) == text.data() + text.size();
}

} // namespace

bool ReadPlainDocument(std::string_view text, Tree *tree) {
    tree->arena.Expect(text.size() / 4);
    TreeSink sink(tree);
    if (ReadRoot(text, tree, &sink)) return true;
    MakeObject(&tree->root);
    tree->suspect = false;
    return false;
}

bool ReadOutline(std::shared_ptr<const Buffer> text, Tree *tree, Outline *outline) {
    tree->text = std::move(text);
    const std::string_view view = tree->text->View();
    OutlineSink sink(tree, view.data(), nullptr);
    if (!ReadRoot(view, tree, &sink) || tree->suspect)
        return false; // the general reader reports what is wrong
    *outline = sink.Found();
    return true;
}

bool ReadAgain(std::shared_ptr<const Buffer> text, const Outline &outline, Tree *tree) {
    tree->text = std::move(text);
    const std::string_view view = tree->text->View();
    OutlineSink sink(tree, view.data(), &outline);
    return ReadRoot(view, tree, &sink);
}

void ReadLater(Tree *tree, Object *node) {
    const Span text = node->span;
    try {
        MakeInstances(tree, node);
        TreeSink sink(tree);
        DocumentReader<TreeSink> reader(&sink, text.data + text.size - 1);
        [[maybe_unused]] const char *const end = reader.ReadInstances(text.data, node, node->field->shape, 1);
        assert(end == text.data + text.size);
    } catch (...) {
        node->kind = Kind::Later;
        node->span = text;
        throw;
    }
}

} // namespace configstore
