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
#include <sys/mman.h>

namespace configstore {

class Arena {
public:
    Arena() = default;
    Arena(const Arena &) = delete;
    Arena &operator=(const Arena &) = delete;
    ~Arena() {
        while (chunks_) {
            Chunk *next = chunks_->next;
            std::free(chunks_);
            chunks_ = next;
        }
    }

    /// `size` bytes aligned for a pointer; throws std::bad_alloc.
    void *Allocate(std::size_t size) {
        size = (size + 7) & ~std::size_t{7};
        if (size <= left_) {
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
        std::size_t size;
    };
    static constexpr std::size_t kFirstChunk = 2048;
    static constexpr std::size_t kLargestChunk = std::size_t{1} << 21; // a huge page

    /// A tree of thousands of ports takes megabytes, used once: its page faults cost more than all the rest,
    /// unless they are few.
    static void *TakeBlock(std::size_t size) {
        if (size < kLargestChunk) return std::malloc(size);
        void *block = nullptr;
        if (posix_memalign(&block, kLargestChunk, size) != 0) return nullptr;
        (void)madvise(block, size, MADV_HUGEPAGE);
        return block;
    }

    void *AllocateSlow(std::size_t size) {
        // A large piece gets a chunk of its own behind the current one, so that the current one's rest stays
        // in use.
        const bool alone = size > nextChunk_ / 4;
        const std::size_t room = alone ? size : nextChunk_ - sizeof(Chunk);
        if (room > SIZE_MAX - sizeof(Chunk)) throw std::bad_alloc();
        auto *const chunk = static_cast<Chunk *>(TakeBlock(sizeof(Chunk) + room));
        if (!chunk) throw std::bad_alloc();
        chunk->size = room;
        char *const start = reinterpret_cast<char *>(chunk + 1);
        if (alone && chunks_) {
            chunk->next = chunks_->next;
            chunks_->next = chunk;
            return start;
        }
        chunk->next = chunks_;
        chunks_ = chunk;
        cursor_ = start + size;
        left_ = room - size;
        if (nextChunk_ < kLargestChunk) nextChunk_ *= 2;
        return start;
    }

    Chunk *chunks_ = nullptr;
    char *cursor_ = nullptr;
    std::size_t left_ = 0;
    std::size_t nextChunk_ = kFirstChunk;
};

} // namespace configstore

#endif
