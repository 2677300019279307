/* SPDX-License-Identifier: Apache-2.0 */
// Lists around the sizes at which the name index changes its form, and lists without an index: callers must
// see the result of a plain walk.

#include <gtest/gtest.h>

#include <string>

#include "dvsdata/list_support.h"
#include "dvsdata/name_index.h"

namespace dvs::test {
namespace {

constexpr std::uint32_t kShortMax = data::NameIndex::kShortMax;

std::string NameAt(std::uint32_t i) {
    return "com.orbeno.common.setting." + std::to_string(i);
}

ListPtr ListOfSize(std::uint32_t count) {
    ListPtr list = NewList();
    for (std::uint32_t i = 0; i < count; ++i)
        Append(list.get(), {NameAt(i), U32Value(i)});
    return list;
}

/// Looks up every name of the list and compares the result with the first match of a walk.
void ExpectFindsFirstMatches(DVSData *list) {
    ExpectSound(list);
    for (DVSDataEntry *entry = list->head; entry; entry = entry->next) {
        DVSDataEntry *first = list->head;
        while (std::string_view(first->name) != entry->name)
            first = first->next;
        DVSDataEntry *found = nullptr;
        ASSERT_EQ(DVSData_Lookup(list, entry->name, &found), HYP_OK) << entry->name;
        ASSERT_EQ(found, first) << entry->name;
    }
    DVSDataEntry *none = nullptr;
    EXPECT_EQ(DVSData_Lookup(list, "com.orbeno.common.setting.x", &none), HYP_NOT_FOUND);
    EXPECT_EQ(DVSData_Lookup(list, "", &none), HYP_NOT_FOUND);
}

class IndexedList : public testing::TestWithParam<std::uint32_t> {};
INSTANTIATE_TEST_SUITE_P(Sizes, IndexedList,
                         testing::Values(1, 3, 4, 5, 15, 16, 17, 31, 32, 33, 34, 63, 64, 65, 127, 128, 129,
                                         500));

TEST_P(IndexedList, FindsEveryEntry) {
    ExpectFindsFirstMatches(ListOfSize(GetParam()).get());
}

TEST_P(IndexedList, FindsTheFirstOfDuplicateNames) {
    const ListPtr list = ListOfSize(GetParam());
    for (std::uint32_t i = 0; i < GetParam(); ++i)
        Append(list.get(), {NameAt(i), "twin"});
    ExpectFindsFirstMatches(list.get());
    for (std::uint32_t i = 0; i < GetParam(); i += 3)
        ASSERT_EQ(DVSData_Remove(list.get(), NameAt(i).c_str()), HYP_OK);
    ExpectFindsFirstMatches(list.get());
}

TEST_P(IndexedList, StaysCorrectAfterRemovalsFromTheFront) {
    const ListPtr list = ListOfSize(GetParam());
    for (std::uint32_t i = 0; i < GetParam(); ++i) {
        ASSERT_EQ(DVSData_Remove(list.get(), NameAt(i).c_str()), HYP_OK);
        if (i < 40 || i % 50 == 0) ExpectFindsFirstMatches(list.get());
    }
    EXPECT_EQ(list->serialSize, 16u);
    Append(list.get(), {"again", "1"});
    ExpectFindsFirstMatches(list.get());
}

TEST_P(IndexedList, StaysCorrectAfterRemovalsFromBackAndMiddle) {
    for (const std::uint32_t step : {2u, 3u, 5u}) {
        const ListPtr list = ListOfSize(GetParam());
        for (std::uint32_t i = GetParam(); i-- > 0;)
            if (i % step) {
                ASSERT_EQ(DVSData_Remove(list.get(), NameAt(i).c_str()), HYP_OK);
                if (i < 40) ExpectFindsFirstMatches(list.get());
            }
        for (std::uint32_t i = 0; i < 40; ++i)
            Append(list.get(), {NameAt(1000 + i), ""});
        ExpectFindsFirstMatches(list.get());
    }
}

TEST_P(IndexedList, GrowsInListOrderAfterRemovals) {
    const ListPtr list = ListOfSize(GetParam());
    for (std::uint32_t i = 0; i < GetParam(); i += 4)
        ASSERT_EQ(DVSData_Remove(list.get(), NameAt(i).c_str()), HYP_OK);
    for (std::uint32_t i = 0; i < 2 * GetParam(); ++i)
        Append(list.get(), {NameAt(i), "twin"});
    ExpectFindsFirstMatches(list.get());
}

TEST_P(IndexedList, StaysCorrectAfterUpdatesMoveToTheTail) {
    const ListPtr list = ListOfSize(GetParam());
    for (std::uint32_t i = 0; i < GetParam(); i += 2)
        ASSERT_EQ(DVSData_Update(list.get(), NameAt(i).c_str(), "another", 7, 0), HYP_OK);
    ExpectFindsFirstMatches(list.get());
}

TEST_P(IndexedList, FreesEveryBlock) {
    ResetHeap();
    ListPtr list = ListOfSize(GetParam());
    for (std::uint32_t i = 0; i < GetParam(); i += 2)
        ASSERT_EQ(DVSData_Remove(list.get(), NameAt(i).c_str()), HYP_OK);
    list.reset();
    EXPECT_EQ(Heap().Live(), 0u);
}

TEST(NameIndex, ShortListsAllocateNoIndex) {
    ResetHeap();
    const ListPtr list = ListOfSize(kShortMax);
    EXPECT_EQ(Heap().allocs, kShortMax + 1u);
}

TEST(NameIndex, LookupsAllocateNothing) {
    const ListPtr list = ListOfSize(1000);
    ResetHeap();
    ExpectFindsFirstMatches(list.get());
    EXPECT_EQ(Heap().allocs, 0u);
}

TEST(NameIndex, LongListsAllocateFewBlocksForTheIndex) {
    ResetHeap();
    const ListPtr list = ListOfSize(1000);
    EXPECT_GT(Heap().allocs, 1001u);
    EXPECT_LE(Heap().allocs, 1001u + 8u);
}

TEST(NameIndex, FailedAllocationFallsBackToAWalk) {
    const ListPtr list = ListOfSize(kShortMax);
    {
        const FailingHeap failing(2, FailingHeap::Only); // The 33rd entry, then the table.
        Append(list.get(), {NameAt(kShortMax), "1"});
        EXPECT_EQ(Heap().allocs, 1u);
    }
    ExpectFindsFirstMatches(list.get());
    ASSERT_EQ(DVSData_Remove(list.get(), NameAt(7).c_str()), HYP_OK);
    ExpectFindsFirstMatches(list.get());
    ResetHeap();
    for (std::uint32_t i = 100; i < 200; ++i)
        Append(list.get(), {NameAt(i), "1"});
    EXPECT_GT(Heap().allocs, 100u); // The allocation is retried as the list grows.
    ExpectFindsFirstMatches(list.get());
}

TEST(NameIndex, ListThatShrinksWithoutATableCountsAsShort) {
    const ListPtr list = ListOfSize(kShortMax);
    {
        const FailingHeap failing(2, FailingHeap::Only);
        Append(list.get(), {NameAt(kShortMax), "1"});
    }
    for (std::uint32_t i = 0; i < 20; ++i)
        ASSERT_EQ(DVSData_Remove(list.get(), NameAt(i).c_str()), HYP_OK);
    ExpectFindsFirstMatches(list.get());
    ResetHeap();
    Append(list.get(), {"one more", "1"});
    EXPECT_EQ(Heap().allocs, 1u);
    ExpectFindsFirstMatches(list.get());
}

TEST(NameIndex, AppendsThousandsOfDuplicatesQuickly) {
    const ListPtr list = NewList();
    for (std::uint32_t i = 0; i < 50000; ++i)
        Append(list.get(), {"twin", U32Value(i)});
    for (std::uint32_t i = 0; i < 1000; ++i)
        ASSERT_EQ(DVSData_Remove(list.get(), "twin"), HYP_OK);
    DVSDataEntry *entry = nullptr;
    ASSERT_EQ(DVSData_Lookup(list.get(), "twin", &entry), HYP_OK);
    EXPECT_EQ(entry, list->head);
    EXPECT_EQ(std::string(reinterpret_cast<const char *>(entry->data), 4), U32Value(1000));
}

} // namespace
} // namespace dvs::test
