/* SPDX-License-Identifier: Apache-2.0 */
// Compares bit vectors with std::vector<bool>, at and around the boundaries of their 64-bit words.

#include "platform/runtime.h"

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <random>
#include <vector>

namespace {

using Owner = std::unique_ptr<BitVector, decltype(&BitVector_Free)>;

Owner Make(uint32_t bits) {
    return {BitVector_Alloc(bits), &BitVector_Free};
}

std::optional<uint32_t> Next(const BitVector *vector, uint32_t start, bool value) {
    uint32_t pos = 0;
    if (!BitVector_NextBit(vector, start, value, &pos)) return std::nullopt;
    return pos;
}

std::optional<uint32_t> ModelNext(const std::vector<bool> &model, uint32_t start, bool value) {
    for (std::size_t i = start; i < model.size(); i++) {
        if (model[i] == value) return static_cast<uint32_t>(i);
    }
    return std::nullopt;
}

class BitVectorSizes : public testing::TestWithParam<uint32_t> {};

TEST_P(BitVectorSizes, StartsClear) {
    const uint32_t bits = GetParam();
    const Owner vector = Make(bits);
    ASSERT_TRUE(vector);
    for (uint32_t i = 0; i < bits; i++)
        EXPECT_FALSE(BitVector_IsSet(vector.get(), i));
    EXPECT_EQ(Next(vector.get(), 0, true), std::nullopt);
    EXPECT_EQ(Next(vector.get(), 0, false), bits == 0 ? std::nullopt : std::optional<uint32_t>(0));
}

TEST_P(BitVectorSizes, EndsAtTheRequestedSize) {
    const uint32_t bits = GetParam();
    const Owner vector = Make(bits);
    for (uint32_t i = 0; i < bits; i++)
        BitVector_SetBit(vector.get(), i);
    EXPECT_EQ(Next(vector.get(), 0, false), std::nullopt)
        << "spare bits of the last word are not part of the vector";
    for (const uint32_t beyond : {bits, bits + 1, bits + 63, bits + 64, UINT32_MAX}) {
        BitVector_SetBit(vector.get(), beyond);
        EXPECT_FALSE(BitVector_IsSet(vector.get(), beyond));
        BitVector_ClearBit(vector.get(), beyond);
        EXPECT_EQ(Next(vector.get(), beyond, true), std::nullopt);
        EXPECT_EQ(Next(vector.get(), beyond, false), std::nullopt);
    }
}

TEST_P(BitVectorSizes, AgreesWithTheModel) {
    const uint32_t bits = GetParam();
    const Owner vector = Make(bits);
    std::vector<bool> model(bits);
    std::mt19937 random(bits);
    for (int round = 0; round < 200 && bits > 0; round++) {
        const auto bit = static_cast<uint32_t>(random() % bits);
        const bool value = random() % 3 != 0;
        value ? BitVector_SetBit(vector.get(), bit) : BitVector_ClearBit(vector.get(), bit);
        model[bit] = value;
        const auto start = static_cast<uint32_t>(random() % (bits + 2));
        ASSERT_EQ(Next(vector.get(), start, true), ModelNext(model, start, true));
        ASSERT_EQ(Next(vector.get(), start, false), ModelNext(model, start, false));
    }
    for (uint32_t i = 0; i < bits; i++)
        EXPECT_EQ(BitVector_IsSet(vector.get(), i), model[i]) << i;
}

INSTANTIATE_TEST_SUITE_P(AroundWords, BitVectorSizes,
                         testing::Values(0u, 1u, 2u, 63u, 64u, 65u, 127u, 128u, 129u, 1000u));

TEST(BitVector, NextBitWalksAllSetBits) {
    const Owner vector = Make(65536);
    const std::vector<uint32_t> set{0, 1, 63, 64, 127, 4096, 65535};
    for (const uint32_t bit : set)
        BitVector_SetBit(vector.get(), bit);
    std::vector<uint32_t> walked;
    for (auto bit = Next(vector.get(), 0, true); bit; bit = Next(vector.get(), *bit + 1, true))
        walked.push_back(*bit);
    EXPECT_EQ(walked, set);
}

TEST(BitVector, NextBitKeepsThePositionWhenThereIsNone) {
    const Owner vector = Make(10);
    uint32_t pos = 4711;
    EXPECT_FALSE(BitVector_NextBit(vector.get(), 0, true, &pos));
    EXPECT_EQ(pos, 4711u);
}

TEST(BitVector, FreeAcceptsNull) {
    BitVector_Free(nullptr);
}

} // namespace
