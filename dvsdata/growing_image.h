/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_GROWING_IMAGE_H
#define DVSDATA_GROWING_IMAGE_H

// Nested buffers, written front to back into one block that grows. The entries become known one by one; each
// is written once, where a list would be built, serialized, put into another list and serialized with it.
//
// The result, the statuses and the messages are those of such lists: a buffer that is begun prints what
// DVSData_Alloc prints, an entry what DVSData_Append or DVSData_Update prints, and a buffer that ends what
// DVSData_Serialize prints.

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "dvsdata/format.h"
#include "dvsdata/image_index.h"
#include "dvsdata/open_buffer.h"

namespace dvs::data {

class GrowingImage {
public:
    static constexpr std::size_t kMaxDepth = 3;
    static constexpr std::size_t kMaxSize = UINT32_MAX;

    /// How a nested buffer becomes an entry of the buffer around it.
    enum class Adding : bool {
        kAppend, // DVSData_Append: behind an entry of the same name, if there is one
        kUpdate  // DVSData_Update: in its place
    };

    GrowingImage() = default;
    ~GrowingImage();
    GrowingImage(const GrowingImage &) = delete;
    GrowingImage &operator=(const GrowingImage &) = delete;

    // HYP_NO_MEMORY, also for an image of more than 4 GiB, leaves the image as it was before the call, and it can be used further. HYP_BAD_PARAM: a
    // value whose entry would be larger than the format allows.

    /// The outermost buffer.
    [[nodiscard]] HYP_ReturnStatus BeginBuffer();
    [[nodiscard]] HYP_ReturnStatus EndBuffer(std::uint32_t version);
    /// A buffer that is the value of an entry of the innermost one. `name` must outlive it.
    [[nodiscard]] HYP_ReturnStatus BeginNested(std::string_view name, std::uint32_t propType);
    /// On failure the buffer is dropped.
    [[nodiscard]] HYP_ReturnStatus EndNested(std::uint32_t version, Adding adding);
    /// Drops the innermost buffer and its entry.
    void DropNested();

    /// DVSData_Append and DVSData_Update of the innermost buffer.
    [[nodiscard]] HYP_ReturnStatus Append(std::string_view name, Bytes value, std::uint32_t propType);
    [[nodiscard]] HYP_ReturnStatus Update(std::string_view name, Bytes value, std::uint32_t propType);

    /// Allocates for about `size` more bytes. Without effect when there is no memory.
    void Expect(std::size_t size);

    /// The finished buffer, lent.
    [[nodiscard]] Bytes Finished() const { return {begin_, at_}; }
    /// The finished buffer, to be released with free(). The image is empty afterwards.
    void HandOver(void **buf, std::uint32_t *len);

private:
    struct Level {
        OpenBuffer buffer;
        std::size_t entry;     // start of the nested buffer's entry
        std::string_view name; // its name, uncut
        std::uint32_t propType;
        std::uint32_t count;   // entries, removed ones included
        std::uint32_t removed; // bytes of removed entries
        std::uint64_t marks;   // of the names (MarkOf)
        ImageIndex index;      // used for long buffers only
    };

    /// Room at the end; null when there is none.
    std::uint8_t *Claim(std::size_t size) {
        if (size > capacity_ - at_ && !Grow(size)) return nullptr;
        std::uint8_t *const at = begin_ + at_;
        at_ += size;
        return at;
    }
    /// One bit of 64. Names with different marks differ; most names are told apart by that. The factors keep
    /// nearly all known keys of a table apart.
    [[nodiscard]] static std::uint64_t MarkOf(std::string_view name) {
        constexpr std::size_t kLast = 34;
        constexpr std::size_t kThirdLast = 15;
        if (name.size() > kMaxNameLen) [[unlikely]]
            name = name.substr(0, kMaxNameLen); // as it is stored
        std::size_t mark = name.size();
        if (name.size() >= 3) [[likely]]
            mark += static_cast<std::uint8_t>(name.back()) * kLast +
                    static_cast<std::uint8_t>(name[name.size() - 3]) * kThirdLast;
        return std::uint64_t{1} << mark % 64;
    }
    /// The size of the list that the level's entries up to `end` would be.
    [[nodiscard]] static std::uint32_t SizeOf(const Level &level, std::size_t end) {
        return static_cast<std::uint32_t>(end - level.buffer.start + kMarkerSize - level.removed);
    }

    bool Grow(std::size_t size);
    bool Resize(std::size_t capacity);
    [[nodiscard]] HYP_ReturnStatus Open();
    [[nodiscard]] HYP_ReturnStatus Close(std::uint32_t version);
    [[nodiscard]] HYP_ReturnStatus AddNested(Adding adding);
    [[nodiscard]] HYP_ReturnStatus Put(std::string_view name, std::uint64_t mark, Bytes value,
                                       std::uint32_t propType);
    [[nodiscard]] HYP_ReturnStatus Replace(std::size_t entry, std::string_view name, Bytes value,
                                           std::uint32_t propType);
    [[nodiscard]] std::size_t Find(std::string_view name, std::size_t end);
    void Remove(std::size_t entry, std::size_t end);
    void Compact();
    void EmitEntries(const Level &level) const;

    std::uint8_t *begin_ = nullptr;
    std::size_t at_ = 0;
    std::size_t capacity_ = 0;
    std::array<Level, kMaxDepth> levels_{};
    std::size_t depth_ = 0;
    Level *level_ = nullptr; // the innermost
};

} // namespace dvs::data

#endif
