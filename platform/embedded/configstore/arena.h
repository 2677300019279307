/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_ARENA_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_ARENA_H

// The memory of one object tree: handed out piece by piece, given back all at once. Nothing moves and nothing
// is released before the tree is, which is what keeps handles valid while their siblings come and go.

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <new>
#include <string_view>

#include "platform/embedded/configstore/huge_pages.h"

namespace configstore {

class Arena {
public:
    Arena() = default;
    Arena(const Arena &) = delete;
    Arena &operator=(const Arena &) = delete;
    ~Arena() {
        while (chunks_) {
            Chunk *next = chunks_->next;
            GiveBlock(chunks_);
            chunks_ = next;
        }
    }

    /// `size` bytes aligned for a pointer; throws std::bad_alloc.
    void *Allocate(std::size_t size) {
        size = (size + 7) & ~std::size_t{7};
        if (size <= left_) [[likely]] {
            void *const block = cursor_;
            cursor_ += size;
            left_ -= size;
            return block;
        }
        return AllocateSlow(size);
    }

    /// About so much will be asked for: the chunks are to be few.
    void Expect(std::size_t size) {
        while (nextChunk_ < kLargestChunk && nextChunk_ < size)
            nextChunk_ *= 2;
    }

    /// Bytes taken from the system so far.
    [[nodiscard]] std::size_t Taken() const { return taken_; }

    /// A copy of the bytes with a NUL behind them.
    char *Copy(std::string_view bytes) {
        auto *const copy = static_cast<char *>(Allocate(bytes.size() + 1));
        if (!bytes.empty()) std::memcpy(copy, bytes.data(), bytes.size());
        copy[bytes.size()] = '\0';
        return copy;
    }

private:
    struct Chunk {
        Chunk *next;
        std::size_t size; // with this
    };
    static constexpr std::size_t kFirstChunk = 2048;
    static constexpr std::size_t kLargestChunk = kHugePage;

    static void *TakeBlock(std::size_t *size) {
        return *size < kHugePage ? std::malloc(*size) : MapHugePages(size);
    }

    static void GiveBlock(Chunk *chunk) {
        if (chunk->size < kHugePage)
            std::free(chunk);
        else
            UnmapHugePages(chunk, chunk->size);
    }

    [[gnu::noinline]] void *AllocateSlow(std::size_t size) {
        // A large piece gets a chunk of its own behind the current one, so that the current one's rest stays
        // in use.
        const bool alone = size > nextChunk_ / 4;
        std::size_t whole = nextChunk_;
        if (alone && __builtin_add_overflow(size, sizeof(Chunk), &whole)) throw std::bad_alloc();
        auto *const chunk = static_cast<Chunk *>(TakeBlock(&whole));
        if (!chunk) throw std::bad_alloc();
        chunk->size = whole;
        taken_ += whole;
        char *const start = reinterpret_cast<char *>(chunk + 1);
        if (alone && chunks_) {
            chunk->next = chunks_->next;
            chunks_->next = chunk;
            return start;
        }
        chunk->next = chunks_;
        chunks_ = chunk;
        cursor_ = start + size;
        left_ = whole - sizeof(Chunk) - size;
        if (nextChunk_ < kLargestChunk) nextChunk_ *= 2;
        return start;
    }

    Chunk *chunks_ = nullptr;
    char *cursor_ = nullptr;
    std::size_t left_ = 0;
    std::size_t nextChunk_ = kFirstChunk;
    std::size_t taken_ = 0;
};

} // namespace configstore

#endif
