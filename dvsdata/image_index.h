/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_IMAGE_INDEX_H
#define DVSDATA_IMAGE_INDEX_H

// Finds an entry by name in a long buffer that is being written (growing_image.h). Slots hold offsets, because
// the block moves when it grows.

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <memory>
#include <string_view>

#include "dvsdata/format.h"

namespace dvs::data {

/// An entry whose value length is this has been removed; no entry can have a value of that length.
inline constexpr std::uint32_t kRemovedLen = UINT32_MAX;

[[nodiscard]] inline bool IsRemoved(const std::uint8_t *entry) {
    return Load32(entry + kDataLenOffset) == kRemovedLen;
}

class ImageIndex {
public:
    static constexpr std::size_t kNone = SIZE_MAX;

    void Clear() {
        used_ = 0;
        indexedTo_ = 0;
        slots_.reset();
        size_ = 0;
    }
    /// Adds the entries between the last one it has and `end`. `entries` is the offset of the buffer's first
    /// entry. False, with the index empty, when there is no memory.
    [[nodiscard]] bool CatchUp(const std::uint8_t *block, std::size_t entries, std::size_t end);
    /// Offset of the first entry of that name that has not been removed; kNone when there is none.
    [[nodiscard]] std::size_t Find(const std::uint8_t *block, std::string_view name) const;

private:
    struct Slot {
        std::uint32_t hash;
        std::uint32_t offset; // 0 for an empty slot
    };

    bool Reserve(std::size_t count);
    void Add(std::uint32_t hash, std::size_t offset);

    std::unique_ptr<Slot[], decltype(&std::free)> slots_{nullptr, &std::free};
    std::size_t size_ = 0; // of the slots, a power of two
    std::size_t used_ = 0;
    std::size_t indexedTo_ = 0;
};

} // namespace dvs::data

#endif
