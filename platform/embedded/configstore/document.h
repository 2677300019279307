/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_H

// A tree as a JSON document and back. Singletons and lists of instances are both JSON objects, the latter
// keyed by instance id; members keep their order. How bytes are written is told in text_code.h.

#include <cstdlib>
#include <memory>
#include <string>
#include <string_view>

#include "platform/embedded/configstore/node.h"

namespace configstore {

/// Text under construction, in a block of its own that is not cleared first.
class Buffer {
public:
    Buffer() = default;
    ~Buffer() { Release(); }
    Buffer(const Buffer &) = delete;
    Buffer &operator=(const Buffer &) = delete;
    /// At least `size` more bytes to write to; throws std::bad_alloc.
    char *Room(std::size_t size) {
        if (capacity_ - size_ < size) Grow(size);
        return data_ + size_;
    }
    void Used(const char *end) { size_ = static_cast<std::size_t>(end - data_); }
    void Put(char c) {
        *Room(1) = c;
        size_++;
    }
    void Put(std::string_view text) {
        char *const at = Room(text.size());
        if (!text.empty()) std::memcpy(at, text.data(), text.size());
        size_ += text.size();
    }
    void Clear() { size_ = 0; }
    [[nodiscard]] bool Empty() const { return size_ == 0; }
    [[nodiscard]] std::string_view View() const { return {data_, size_}; }

private:
    void Grow(std::size_t size);
    void Release();

    char *data_ = nullptr; // from the heap, or huge pages when the capacity is that large
    std::size_t size_ = 0;
    std::size_t capacity_ = 0;
};

/// Appends the tree's document.
void WriteDocument(const Tree &tree, Buffer *out);

/// A text as JSON, with its quotes; `asIs` for one that is in document form already.
void WriteText(std::string_view text, bool asIs, Buffer *out);

enum class Reading {
    Tolerant, // unknown members are kept
    Strict,   // and refused, like lists with more items than the schema allows: imports
};

/// The deepest nesting that a document may have.
inline constexpr std::size_t kMaxDepth = 32;

/// Where a document that has been read has its longest list of instances; a field of null is for nowhere.
struct Outline {
    const Field *field = nullptr;
    std::size_t begin = 0;
    std::size_t end = 0;
};

/// Fills an empty tree. What the schema does not allow is marked in the tree and is no failure. False, with
/// the reason and the place, for what is not JSON, not an object, too deep, has a name twice or a NUL in a
/// name or text; the tree then holds what had been read.
/// `where`, unless null, receives the path of the member that was refused or was being read.
[[nodiscard]] bool ReadDocument(std::string_view text, Reading reading, Tree *tree, std::string *why,
                                std::string *where = nullptr);

/// Fills an empty tree from a document as the store writes them in which all is allowed, and finds its
/// outline. The root's lists of instances are looked through and stay text. False, with the tree in an
/// unknown state, for any other document: ReadDocument has more to say about it.
[[nodiscard]] bool ReadOutline(std::shared_ptr<const Buffer> text, Tree *tree, Outline *outline);

/// Fills an empty tree from a document that was read before, all but the list of the outline, which stays
/// text for now. False, with the tree in an unknown state, when it was not for an object of this kind.
[[nodiscard]] bool ReadAgain(std::shared_ptr<const Buffer> text, const Outline &outline, Tree *tree);

} // namespace configstore

#endif
