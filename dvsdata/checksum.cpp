/* SPDX-License-Identifier: Apache-2.0 */
// The additive checksum, in the widest form the processor supports. Every serialization and every read sums
// each byte here; a plain loop is several times slower than the copy of the data.

#include "dvsdata/format.h"

#if defined(__x86_64__)
#include <immintrin.h>
#endif

namespace dvs::data {
namespace {

std::uint32_t SumTail(Bytes bytes) {
    std::uint32_t sum = 0;
    while (bytes.size() >= 4) {
        sum += Load32(bytes.data());
        bytes = bytes.subspan(4);
    }
    for (const std::uint8_t byte : bytes)
        sum += byte;
    return sum;
}

#if defined(__x86_64__)

std::uint32_t SumLanes(__m128i lanes) {
    lanes = _mm_add_epi32(lanes, _mm_shuffle_epi32(lanes, 0x4e));
    lanes = _mm_add_epi32(lanes, _mm_shuffle_epi32(lanes, 0xb1));
    return static_cast<std::uint32_t>(_mm_cvtsi128_si32(lanes));
}

std::uint32_t SumSse2(Bytes bytes) {
    const auto load = [](const std::uint8_t *at) {
        return _mm_loadu_si128(reinterpret_cast<const __m128i *>(at));
    };
    __m128i a = _mm_setzero_si128(), b = a, c = a, d = a;
    const std::uint8_t *at = bytes.data();
    const std::uint8_t *const end = at + (bytes.size() & ~std::size_t{63});
    for (; at != end; at += 64) {
        a = _mm_add_epi32(a, load(at));
        b = _mm_add_epi32(b, load(at + 16));
        c = _mm_add_epi32(c, load(at + 32));
        d = _mm_add_epi32(d, load(at + 48));
    }
    return SumLanes(_mm_add_epi32(_mm_add_epi32(a, b), _mm_add_epi32(c, d))) +
           SumTail(bytes.subspan(bytes.size() & ~std::size_t{63}));
}

__attribute__((target("avx2"))) inline __m256i Load256(const std::uint8_t *at) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i *>(at));
}

__attribute__((target("avx2"))) std::uint32_t SumAvx2(Bytes bytes) {
    __m256i a = _mm256_setzero_si256(), b = a, c = a, d = a;
    const std::uint8_t *at = bytes.data();
    const std::uint8_t *const wideEnd = at + (bytes.size() & ~std::size_t{127});
    for (; at != wideEnd; at += 128) {
        a = _mm256_add_epi32(a, Load256(at));
        b = _mm256_add_epi32(b, Load256(at + 32));
        c = _mm256_add_epi32(c, Load256(at + 64));
        d = _mm256_add_epi32(d, Load256(at + 96));
    }
    const std::uint8_t *const end = bytes.data() + (bytes.size() & ~std::size_t{31});
    for (; at != end; at += 32)
        a = _mm256_add_epi32(a, Load256(at));
    a = _mm256_add_epi32(_mm256_add_epi32(a, b), _mm256_add_epi32(c, d));
    return SumLanes(_mm_add_epi32(_mm256_castsi256_si128(a), _mm256_extracti128_si256(a, 1))) +
           SumTail(bytes.subspan(bytes.size() & ~std::size_t{31}));
}

#else

std::uint32_t SumPortable(Bytes bytes) {
    // Four independent accumulators, so that no addition waits for the previous one.
    std::uint32_t a = 0, b = 0, c = 0, d = 0;
    while (bytes.size() >= 16) {
        a += Load32(bytes.data());
        b += Load32(bytes.data() + 4);
        c += Load32(bytes.data() + 8);
        d += Load32(bytes.data() + 12);
        bytes = bytes.subspan(16);
    }
    return a + b + c + d + SumTail(bytes);
}

#endif

} // namespace

std::uint32_t SumBaseline(Bytes bytes) {
#if defined(__x86_64__)
    return SumSse2(bytes);
#else
    return SumPortable(bytes);
#endif
}

std::uint32_t Sum(Bytes bytes) {
#if defined(__x86_64__)
    if (__builtin_cpu_supports("avx2")) return SumAvx2(bytes);
#endif
    return SumBaseline(bytes);
}

} // namespace dvs::data
