/* SPDX-License-Identifier: Apache-2.0 */
// The hash of texts: every byte and the length count, no byte outside the text is read, all bits are well mixed.

#include <algorithm>
#include <cstring>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "base/hash.h"

namespace dvs::base {
namespace {

/// Of a copy without a byte to spare on either side, so that sanitizers see reads outside it.
std::uint64_t HashOf(const std::string &text) {
    const std::unique_ptr<char[]> copy(new char[text.size()]);
    std::memcpy(copy.get(), text.data(), text.size());
    return HashText({copy.get(), text.size()});
}

TEST(HashText, DiffersWhereAnyByteDiffers) {
    for (std::size_t size = 0; size <= 130; ++size) {
        const std::string text(size, 'a');
        EXPECT_EQ(HashOf(text), HashOf(text));
        for (std::size_t i = 0; i < size; ++i) {
            std::string other = text;
            other[i] = 'b';
            EXPECT_NE(HashOf(other), HashOf(text)) << size << " " << i;
        }
    }
}

TEST(HashText, DiffersWhereTheLengthDiffers) {
    std::set<std::uint64_t> seen;
    for (std::size_t size = 0; size <= 130; ++size)
        EXPECT_TRUE(seen.insert(HashOf(std::string(size, '\0'))).second) << size;
}

TEST(HashText, SpreadsNamesThatDifferInANumber) {
    for (const char *const prefix : {"", "port-", "com.orbeno.common.port.setting."}) {
        constexpr std::size_t kNames = 1 << 16;
        constexpr std::uint64_t kBuckets = kNames;
        for (const int shift : {0, 16, 32, 48}) {
            std::vector<bool> isUsed(kBuckets);
            for (std::size_t i = 0; i < kNames; ++i)
                isUsed[HashText(prefix + std::to_string(i)) >> shift & (kBuckets - 1)] = true;
            const auto used = static_cast<std::size_t>(std::count(isUsed.begin(), isUsed.end(), true));
            // Random numbers use 1 - 1/e of the buckets, 63.2 %.
            EXPECT_GT(used, kBuckets * 60 / 100) << prefix << " " << shift;
        }
    }
}

} // namespace
} // namespace dvs::base
