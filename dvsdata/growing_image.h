/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_GROWING_IMAGE_H
#define DVSDATA_GROWING_IMAGE_H

// Nested buffers written front to back into a block that grows: for those who learn the entries one by one
// and would otherwise build a list, serialize it, put the result into a list and serialize that. The bytes
// are those of the lists' way. Leans on format.h; the config store's load stands on it.
//
// What this way cannot do, it does not report entry by entry: it gives up, takes everything that follows and
// keeps nothing of it, and GaveUp() tells at the end that the lists' way has to be gone instead. That is so
// without memory, for a result above kMaxSize, and when a buffer with updates gets many entries, among which
// only a list's index finds a name fast.

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "dvsdata/format.h"
#include "dvsdata/open_buffer.h"

namespace dvs::data {

class GrowingImage {
public:
    static constexpr std::size_t kMaxDepth = 3;
    static constexpr std::size_t kMaxSize = std::size_t{1} << 30;
    static constexpr std::uint32_t kMaxUpdates = 64;

    GrowingImage() = default;
    ~GrowingImage();
    GrowingImage(const GrowingImage &) = delete;
    GrowingImage &operator=(const GrowingImage &) = delete;

    /// A buffer: the outermost one, or the whole value of an entry just begun.
    void BeginBuffer();
    void EndBuffer();
    void BeginEntry(std::string_view name, std::uint32_t propType);
    void EndEntry();
    /// DVSData_Append to the innermost buffer.
    void Append(std::string_view name, Bytes value, std::uint32_t propType);
    /// DVSData_Update of the innermost buffer, all of whose entries came by this.
    void Update(std::string_view name, Bytes value, std::uint32_t propType);

    /// About so many bytes more will come.
    void Expect(std::size_t size);

    void GiveUp() { gaveUp_ = true; }
    [[nodiscard]] bool GaveUp() const { return gaveUp_; }
    /// The finished image, to be released with free(); the image is of no use afterwards.
    void HandOver(void **buf, std::uint32_t *len);

private:
    struct Level {
        OpenBuffer buffer;
        std::size_t entry;     // the last one
        std::uint32_t entries; // by Update
        std::uint64_t names;   // their marks (MarkOf)
    };

    /// Room at the end; null when there is none.
    std::uint8_t *Claim(std::size_t size) {
        if ((gaveUp_ || size > capacity_ - at_) && !MakeRoom(size)) return nullptr;
        std::uint8_t *const at = begin_ + at_;
        at_ += size;
        return at;
    }
    bool MakeRoom(std::size_t size) { return !gaveUp_ && Grow(size); }
    /// One of 64: entries whose marks differ have different names, and most are told apart by that. The
    /// factors are such that hardly any two known keys of a table fall together.
    [[nodiscard]] static std::uint64_t MarkOf(std::string_view name) {
        constexpr std::size_t kLast = 34;
        constexpr std::size_t kThirdLast = 15;
        std::size_t mark = name.size();
        if (name.size() >= 3) [[likely]]
            mark += static_cast<std::uint8_t>(name.back()) * kLast +
                    static_cast<std::uint8_t>(name[name.size() - 3]) * kThirdLast;
        return std::uint64_t{1} << mark % 64;
    }
    bool Grow(std::size_t size);
    [[gnu::always_inline]] inline void Put(std::string_view name, Bytes value, std::uint32_t propType);
    void UpdateInPlace(std::size_t entry, std::string_view name, Bytes value, std::uint32_t propType);
    [[nodiscard]] std::size_t Find(std::string_view name) const;

    std::uint8_t *begin_ = nullptr;
    std::size_t at_ = 0;
    std::size_t capacity_ = 0;
    std::array<Level, kMaxDepth> levels_{};
    std::size_t depth_ = 0;
    Level *level_ = nullptr; // the innermost
    bool gaveUp_ = false;
};

} // namespace dvs::data

#endif
