/* SPDX-License-Identifier: Apache-2.0 */
// Bit vectors of the embedded runtime (platform/runtime.h): a count and its 64-bit words in one block. Bits
// of the last word behind the vector's end are always clear; a search for clear bits must therefore check
// where it ended.

#include "platform/runtime.h"

#include <bit>
#include <cstdlib>

struct alignas(uint64_t) BitVector {
    uint32_t bits;
};

namespace {

constexpr uint32_t kWordBits = 64;

std::size_t WordNum(uint32_t bits) {
    return (static_cast<std::size_t>(bits) + kWordBits - 1) / kWordBits;
}
uint64_t *Words(BitVector *vector) {
    return reinterpret_cast<uint64_t *>(vector + 1);
}
const uint64_t *Words(const BitVector *vector) {
    return reinterpret_cast<const uint64_t *>(vector + 1);
}
constexpr uint64_t Mask(uint32_t bit) {
    return uint64_t{1} << (bit % kWordBits);
}

} // namespace

extern "C" BitVector *BitVector_Alloc(uint32_t bits) {
    auto *vector =
        static_cast<BitVector *>(std::calloc(1, sizeof(BitVector) + WordNum(bits) * sizeof(uint64_t)));
    if (vector) vector->bits = bits;
    return vector;
}

extern "C" void BitVector_Free(BitVector *vector) {
    std::free(vector);
}

extern "C" void BitVector_SetBit(BitVector *vector, uint32_t bit) {
    if (bit < vector->bits) Words(vector)[bit / kWordBits] |= Mask(bit);
}

extern "C" void BitVector_ClearBit(BitVector *vector, uint32_t bit) {
    if (bit < vector->bits) Words(vector)[bit / kWordBits] &= ~Mask(bit);
}

extern "C" bool BitVector_IsSet(const BitVector *vector, uint32_t bit) {
    return bit < vector->bits && (Words(vector)[bit / kWordBits] & Mask(bit)) != 0;
}

extern "C" bool BitVector_NextBit(const BitVector *vector, uint32_t start, bool value, uint32_t *pos) {
    if (start >= vector->bits) return false;
    const uint64_t flip = value ? 0 : ~uint64_t{0};
    const uint64_t *words = Words(vector);
    const std::size_t num = WordNum(vector->bits);
    std::size_t index = start / kWordBits;
    uint64_t word = (words[index] ^ flip) & ~(Mask(start) - 1);
    while (word == 0) {
        if (++index == num) return false;
        word = words[index] ^ flip;
    }
    const uint64_t found = index * uint64_t{kWordBits} + static_cast<uint64_t>(std::countr_zero(word));
    if (found >= vector->bits) return false;
    *pos = static_cast<uint32_t>(found);
    return true;
}
