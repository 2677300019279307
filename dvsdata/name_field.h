/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_NAME_FIELD_H
#define DVSDATA_NAME_FIELD_H

// The name field of a serialized entry, as somebody else wrote it: how long the name is and whether what lies
// behind it is what this library would have written. Both from one look at the whole field and without a
// branch that depends on it, since names of all lengths take turns. Leans on format.h.

#include <bit>
#include <cstdint>
#include <cstring>

#include "dvsdata/format.h"

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace dvs::data {

/// A bit for each zero among 64 bytes.
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

    /// Characters up to the NUL, at most 127: what a list stores.
    [[nodiscard]] std::uint32_t Len() const {
        if (low) return static_cast<std::uint32_t>(std::countr_zero(low));
        return high ? 64 + static_cast<std::uint32_t>(std::countr_zero(high)) : kMaxNameLen;
    }

    /// It ends in a NUL, and nothing but zeros follow.
    [[nodiscard]] bool IsPlain() const {
        // Nothing but ones from the lowest one on: adding that one carries all of them away.
        const auto onesToTheEnd = [](std::uint64_t bits) { return bits + (bits & -bits) == 0; };
        return low ? onesToTheEnd(low) && ~high == 0 : high && onesToTheEnd(high);
    }

    std::uint64_t low, high;
};

} // namespace dvs::data

#endif
