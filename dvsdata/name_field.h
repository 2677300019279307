/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_NAME_FIELD_H
#define DVSDATA_NAME_FIELD_H

// The name field of a serialized entry from any writer: the length of the name, and whether the bytes after
// it are what this library would have written. Computes both from the whole field without a data-dependent
// branch, because name lengths vary.

#include <bit>
#include <cstdint>
#include <cstring>

#include "dvsdata/format.h"

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace dvs::data {

/// One bit for each zero among 64 bytes.
inline std::uint64_t ZerosIn(const std::uint8_t *bytes) {
#if defined(__SSE2__)
    const auto zeros = [bytes](std::size_t from) {
        const __m128i piece = _mm_loadu_si128(reinterpret_cast<const __m128i *>(bytes + from));
        const int mask = _mm_movemask_epi8(_mm_cmpeq_epi8(piece, _mm_setzero_si128()));
        return std::uint64_t{static_cast<std::uint32_t>(mask)};
    };
    return zeros(0) | zeros(16) << 16 | zeros(32) << 32 | zeros(48) << 48;
#else
    std::uint64_t bits = 0;
    for (std::size_t i = 0; i < 64; ++i)
        bits |= std::uint64_t{bytes[i] == 0} << i;
    return bits;
#endif
}

/// Bits for the zeros of a name field.
struct NameField {
    explicit NameField(const std::uint8_t *field) : low(ZerosIn(field)), high(ZerosIn(field + 64)) {}

    /// Characters up to the NUL, at most 127, as a list stores them.
    [[nodiscard]] std::uint32_t Len() const {
        if (low) return static_cast<std::uint32_t>(std::countr_zero(low));
        return high ? 64 + static_cast<std::uint32_t>(std::countr_zero(high)) : kMaxNameLen;
    }

    /// True if the name ends in a NUL and only zeros follow.
    [[nodiscard]] bool IsPlain() const {
        // If all bits from the lowest one up are set, adding the lowest bit carries them all away.
        const auto onesToTheEnd = [](std::uint64_t bits) { return bits + (bits & -bits) == 0; };
        return low ? onesToTheEnd(low) && ~high == 0 : high && onesToTheEnd(high);
    }

    std::uint64_t low, high;
};

} // namespace dvs::data

#endif
