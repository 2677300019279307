/* SPDX-License-Identifier: Apache-2.0 */
// Writes a tree as its document (document.h), straight from the nodes: a save of thousands of ports spends
// its time here and in SQLite.

#include <bit>
#include <charconv>
#include <cmath>
#include <new>

#include "base/base64.h"
#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/text_code.h"

namespace configstore {

namespace {

constexpr std::size_t kLargeText = kHugePage / 2; // more than that goes into huge pages

} // namespace

void Buffer::Grow(std::size_t size) {
    // Who begins with that much knows how much it will be.
    const bool isExact = capacity_ == 0 && size > kLargeText;
    std::size_t capacity = isExact ? size : (capacity_ + size) * 2 + 256;
    if (capacity <= kLargeText) {
        auto *const data = static_cast<char *>(std::realloc(data_, capacity));
        if (!data) throw std::bad_alloc();
        data_ = data;
    } else {
        char *const data = MapHugePages(&capacity);
        if (!data) throw std::bad_alloc();
        if (size_ > 0) std::memcpy(data, data_, size_);
        Release();
        data_ = data;
    }
    capacity_ = capacity;
}

void Buffer::Release() {
    if (capacity_ < kHugePage)
        std::free(data_);
    else
        UnmapHugePages(data_, capacity_);
}

namespace {

constexpr std::size_t kEscapeSize = 6; // \u001f

char *PutEscape(char *out, unsigned char c) {
    constexpr char kHex[] = "0123456789abcdef";
    *out++ = '\\';
    switch (c) {
    case '"':
    case '\\':
        *out++ = static_cast<char>(c);
        return out;
    case '\n':
        *out++ = 'n';
        return out;
    case '\r':
        *out++ = 'r';
        return out;
    case '\t':
        *out++ = 't';
        return out;
    default:
        std::memcpy(out, "u00", 3);
        out[3] = kHex[c >> 4];
        out[4] = kHex[c & 15];
        return out + 5;
    }
}

/// Whether none of the eight bytes is a control character, a quote, a backslash or beyond ASCII.
bool IsPlain(uint64_t word) {
    constexpr uint64_t kOnes = 0x0101010101010101U;
    constexpr uint64_t kHighs = 0x8080808080808080U;
    const auto hasZero = [](uint64_t bytes) { return (bytes - kOnes) & ~bytes & kHighs; };
    const uint64_t control = (word - kOnes * 0x20) & ~word & kHighs;
    return ((word & kHighs) | control | hasZero(word ^ kOnes * '"') | hasZero(word ^ kOnes * '\\')) == 0;
}

char *PutRest(char *out, const char *at, const char *end, bool asIs) {
    while (at != end) {
        const auto c = static_cast<unsigned char>(*at);
        if (c < 0x20 || c == '"' || c == '\\') {
            out = PutEscape(out, c);
            at++;
            continue;
        }
        const std::size_t length = c < 0x80 || asIs ? 1 : PlainSequence(at, end);
        if (length == 0) {
            out = PutEncodedByte(out, c);
            at++;
            continue;
        }
        std::memcpy(out, at, length);
        out += length;
        at += length;
    }
    return out;
}

template <typename Number> void WriteNumber(Number value, Buffer *out) {
    constexpr std::size_t kLongest = 32;
    char *const at = out->Room(kLongest);
    out->Used(std::to_chars(at, at + kLongest, value).ptr);
}

void WriteReal(double value, Buffer *out) {
    const std::size_t before = out->View().size();
    WriteNumber(value, out);
    // "1" would come back as a whole number.
    if (out->View().substr(before).find_first_of(".eE") == std::string_view::npos)
        out->Put(std::string_view(".0"));
}

void WriteList(const Object &node, Buffer *out) {
    const PackedList &list = *node.list;
    char separator = '[';
    if (node.kind == Kind::IntegerList) {
        for (std::size_t i = 0; i < list.count; i++, separator = ',') {
            out->Put(separator);
            WriteNumber(IntegerAt(&list, i), out);
        }
    } else {
        const char *at = list.data;
        for (std::size_t i = 0; i < list.count; i++, separator = ',') {
            const std::string_view text(at);
            out->Put(separator);
            WriteText(text, false, out);
            at += text.size() + 1;
        }
    }
    if (list.count == 0) out->Put('[');
    out->Put(']');
}

void WriteNode(const Object &node, Buffer *out);

void WriteChildren(const Object &container, Buffer *out) {
    char separator = '{';
    for (const Object *child = FirstChild(&container); child; child = child->next, separator = ',') {
        if (child->described && child->field->IsShort()) {
            char *const at = out->Room(1 + sizeof child->field->words);
            *at = separator;
            std::memcpy(at + 1, child->field->words.data(), sizeof child->field->words);
            out->Used(at + 1 + child->field->prefix.size());
        } else if (child->described) {
            out->Put(separator);
            out->Put(std::string_view(child->field->prefix));
        } else {
            out->Put(separator);
            WriteText(NameOf(child), false, out);
            out->Put(':');
        }
        WriteNode(*child, out);
    }
    if (separator == '{') out->Put('{');
    out->Put('}');
}

void WriteNode(const Object &node, Buffer *out) {
    switch (node.kind) {
    case Kind::Dead:
    case Kind::Null:
        out->Put(std::string_view("null"));
        break;
    case Kind::Bool:
        out->Put(node.boolean ? std::string_view("true") : std::string_view("false"));
        break;
    case Kind::Integer:
        WriteNumber(node.integer, out);
        break;
    case Kind::Unsigned:
        WriteNumber(node.unsignedInteger, out);
        break;
    case Kind::Real:
        WriteReal(node.real, out);
        break;
    case Kind::Text:
        WriteText({node.span.data, node.span.size}, false, out);
        break;
    case Kind::Binary: {
        char *at = out->Room(dvs::base::Base64Size(node.span.size) + 2);
        *at++ = '"';
        at = dvs::base::EncodeBase64(at, node.span.data, node.span.size);
        *at++ = '"';
        out->Used(at);
        break;
    }
    case Kind::EmptyList:
        out->Put(std::string_view("[]"));
        break;
    case Kind::TextList:
    case Kind::IntegerList:
        WriteList(node, out);
        break;
    case Kind::Raw:
    case Kind::Later:
        out->Put({node.span.data, node.span.size});
        break;
    case Kind::Object:
    case Kind::Instances:
        WriteChildren(node, out);
        break;
    }
}

} // namespace

void WriteText(std::string_view text, bool asIs, Buffer *out) {
    char *to = out->Room(text.size() + 2 + 8);
    *to++ = '"';
    const char *at = text.data();
    const char *const end = at + text.size();
    for (; end - at >= 8; at += 8, to += 8) {
        uint64_t word = 0;
        std::memcpy(&word, at, 8);
        if (!IsPlain(word)) break;
        std::memcpy(to, &word, 8);
    }
    const auto left = static_cast<std::size_t>(end - at);
    if (left >= 8) { // something in the next eight bytes needs more room than it has
        out->Used(to);
        to = out->Room(left * kEscapeSize + 1);
        to = PutRest(to, at, end, asIs);
    } else {
        // Up to seven bytes, nearly always plain: the room above is enough for them then, and is asked for
        // else.
        for (; at != end; at++, to++) {
            const auto c = static_cast<unsigned char>(*at);
            if (c < 0x20 || c == '"' || c == '\\' || c >= 0x80) break;
            *to = *at;
        }
        if (at != end) {
            out->Used(to);
            to = out->Room(static_cast<std::size_t>(end - at) * kEscapeSize + 1);
            to = PutRest(to, at, end, asIs);
        }
    }
    *to++ = '"';
    out->Used(to);
}

void WriteDocument(const Tree &tree, Buffer *out) {
    // Nodes take three times what is written of them, or more. What is taken here and not used costs nothing.
    (void)out->Room(tree.arena.Taken() / 3);
    WriteChildren(tree.root, out);
}

} // namespace configstore
