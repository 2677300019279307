/* SPDX-License-Identifier: Apache-2.0 */
// Large blocks from the system; the process caches a few of them.

#include "platform/embedded/configstore/huge_pages.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "platform/embedded/configstore/document.h"

using namespace configstore;

namespace {

struct Block {
    char *data;
    std::size_t size;
};

Block Take(std::size_t size) {
    char *const data = MapHugePages(&size);
    EXPECT_NE(data, nullptr);
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(data) % kHugePage, 0U);
    std::memset(data, 'x', size);
    return {data, size};
}

} // namespace

TEST(HugePages, SizesAreRoundedUpToWholePages) {
    for (const std::size_t size : {std::size_t{1}, kHugePage, kHugePage + 1, 5 * kHugePage}) {
        const Block block = Take(size);
        EXPECT_GE(block.size, size);
        EXPECT_LT(block.size, size + kHugePage);
        EXPECT_EQ(block.size % kHugePage, 0U);
        UnmapHugePages(block.data, block.size);
    }
}

TEST(HugePages, RejectsOversizedRequests) {
    for (std::size_t size : {SIZE_MAX, SIZE_MAX / 2}) {
        const std::size_t wanted = size;
        EXPECT_EQ(MapHugePages(&size), nullptr) << wanted;
    }
}

TEST(HugePages, FreedBlocksAreReusedAndNeverHandedOutTwice) {
    for (int round = 0; round < 3; round++) {
        std::vector<Block> blocks;
        std::set<const char *> distinct;
        for (int i = 0; i < 6; i++) {
            blocks.push_back(Take(kHugePage));
            distinct.insert(blocks.back().data);
        }
        EXPECT_EQ(distinct.size(), blocks.size());
        for (const Block &block : blocks)
            UnmapHugePages(block.data, block.size);
    }
    const Block first = Take(kHugePage);
    UnmapHugePages(first.data, first.size);
    const Block again = Take(kHugePage);
    EXPECT_EQ(again.data, first.data);
    UnmapHugePages(again.data, again.size);
}

TEST(HugePages, TextsKeepTheirContentsWhileGrowing) {
    const std::string large(kHugePage - 100, 'l');
    for (const std::size_t first : {std::size_t{1}, kHugePage / 2, kHugePage / 2 + 1, kHugePage - 100}) {
        const std::string expected = large.substr(0, first) + "small" + large;
        Buffer text;
        text.Put(std::string_view(large).substr(0, first));
        text.Put("small");
        text.Put(large);
        EXPECT_TRUE(text.View() == expected) << first;
    }
}
