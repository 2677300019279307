/* SPDX-License-Identifier: Apache-2.0 */
// Tests the content, order and sizes of lists: append, update, remove, lookup, iteration and the accessors.

#include <gtest/gtest.h>

#include <string>
#include <cstddef>

#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

static_assert(offsetof(DVSDataEntry, serialSize) == 8 && offsetof(DVSDataEntry, name) == 12);
static_assert(offsetof(DVSDataEntry, propType) == 140 && offsetof(DVSDataEntry, dataLen) == 144);
static_assert(offsetof(DVSDataEntry, data) == 148);
static_assert(offsetof(DVSData, serialSize) == 0 && offsetof(DVSData, head) == 8 &&
              offsetof(DVSData, tail) == 16);
static_assert(offsetof(DVSData, allocFn) == 24 && offsetof(DVSData, freeFn) == 32);

std::uint32_t SizeAddedBy(std::uint32_t dataLen) {
    const ListPtr list = NewList();
    const std::string value(dataLen, 'v');
    EXPECT_EQ(DVSData_Append(list.get(), "n", value.data(), dataLen, 0x20), HYP_OK);
    EXPECT_EQ(list->head->serialSize, list->serialSize - 16);
    return list->serialSize - 16;
}

TEST(DataAlloc, NewListIsEmptyOfSize16) {
    const ListPtr list = NewList();
    EXPECT_EQ(list->serialSize, 16u);
    EXPECT_EQ(list->head, nullptr);
    EXPECT_EQ(list->tail, nullptr);
    EXPECT_EQ(list->allocFn, &CountingAlloc);
    EXPECT_EQ(list->freeFn, &CountingFree);
}

TEST(DataAlloc, ReturnsNoMemoryAndKeepsTheOutput) {
    const FailingHeap failing(1);
    DVSData *list = reinterpret_cast<DVSData *>(8);
    EXPECT_EQ(DVSData_Alloc(&list, CountingAlloc, CountingFree), HYP_NO_MEMORY);
    EXPECT_EQ(list, reinterpret_cast<DVSData *>(8));
}

TEST(DataFree, AcceptsNull) {
    DVSData_Free(nullptr);
}

TEST(DataFree, ReturnsEveryBlockToTheListsFree) {
    ResetHeap();
    ListOf({{"a", "1"}, {"b", "22"}, {"c", ""}}).reset();
    EXPECT_EQ(Heap().allocs, 4u);
    EXPECT_EQ(Heap().frees, 4u);
}

TEST(DataAppend, AddsTheStatedSizes) {
    EXPECT_EQ(SizeAddedBy(4), 148u);
    EXPECT_EQ(SizeAddedBy(0), 144u);
    EXPECT_EQ(SizeAddedBy(1), 144u);
    EXPECT_EQ(SizeAddedBy(2), 148u);
    EXPECT_EQ(SizeAddedBy(5), 148u);
    EXPECT_EQ(SizeAddedBy(6), 152u);
}

TEST(DataAppend, AllocatesOneBlockForImageAndLink) {
    const ListPtr list = NewList();
    ResetHeap();
    Append(list.get(), {"name", "four"});
    ASSERT_EQ(Heap().sizes.size(), 1u);
    EXPECT_EQ(Heap().sizes[0], 156u);
}

TEST(DataAppend, RejectsLengthsWhoseSumWraps) {
    const ListPtr list = ListOf({{"a", "1"}});
    const std::uint32_t before = list->serialSize;
    ResetHeap();
    for (const std::uint32_t len : {0xfffffff0u, 0xffffffffu, 0xffffff6eu})
        EXPECT_EQ(DVSData_Append(list.get(), "n", "", len, 0x20), HYP_BAD_PARAM) << len;
    EXPECT_EQ(Heap().allocs, 0u);
    EXPECT_EQ(list->serialSize, before);
    EXPECT_EQ(ContentOf(list).size(), 1u);
}

TEST(DataAppend, RejectsEntrySizesFromFffffff8) {
    const ListPtr list = NewList();
    const FailingHeap failing(1); // An accepted length fails in the allocator.
    for (std::uint32_t len = 0xffffff66; len <= 0xffffff6d; ++len)
        EXPECT_EQ(DVSData_Append(list.get(), "n", "", len, 0x20), HYP_BAD_PARAM) << len;
    EXPECT_EQ(DVSData_Append(list.get(), "n", "", 0xffffff65, 0x20), HYP_NO_MEMORY);
    EXPECT_EQ(list->serialSize, 16u);
}

TEST(DataAppend, KeepsDuplicateNamesAndActsOnTheFirst) {
    const ListPtr list = ListOf({{"twin", "first", 0x20}, {"twin", "second", 0x40}});
    DVSDataEntry *entry = nullptr;
    ASSERT_EQ(DVSData_Lookup(list.get(), "twin", &entry), HYP_OK);
    EXPECT_EQ(entry, list->head);
    EXPECT_EQ(DVSData_Update(list.get(), "twin", "FIRST", 5, 0x60), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"twin", "FIRST", 0x60}, {"twin", "second", 0x40}}));
    EXPECT_EQ(DVSData_Remove(list.get(), "twin"), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"twin", "second", 0x40}}));
    ExpectSound(list.get());
}

TEST(DataAppend, KeepsTypeZero) {
    EXPECT_EQ(ContentOf(ListOf({{"n", "v", 0}}))[0].type, 0u);
}

TEST(DataAppend, AcceptsAnEmptyValue) {
    const ListPtr list = NewList();
    EXPECT_EQ(DVSData_Append(list.get(), "n", nullptr, 0, 0x20), HYP_OK);
    EXPECT_EQ(DVSData_Update(list.get(), "n", nullptr, 0, 0x20), HYP_OK);
    EXPECT_EQ(DVSData_UpdateProp(list.get(), "n2", nullptr, 0), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"n", "", 0x20}, {"n2", "", 0x20}}));
}

TEST(DataAppend, CopiesTheValue) {
    const ListPtr list = NewList();
    std::string value = "before";
    Append(list.get(), {"n", value});
    value = "after!";
    EXPECT_EQ(ContentOf(list)[0].value, "before");
}

TEST(DataAppend, TruncatesLongNamesAfter127Characters) {
    const ListPtr list = NewList();
    const std::string name(200, 'x');
    Append(list.get(), {name, "v"});
    EXPECT_EQ(DVSData_Name(list->head), std::string(127, 'x'));
    DVSDataEntry *entry = nullptr;
    EXPECT_EQ(DVSData_Lookup(list.get(), name.c_str(), &entry), HYP_NOT_FOUND);
    EXPECT_EQ(DVSData_Lookup(list.get(), name.substr(0, 128).c_str(), &entry), HYP_NOT_FOUND);
    EXPECT_EQ(DVSData_Lookup(list.get(), name.substr(0, 127).c_str(), &entry), HYP_OK);
    EXPECT_EQ(DVSData_Lookup(list.get(), name.substr(0, 126).c_str(), &entry), HYP_NOT_FOUND);
    EXPECT_EQ(DVSData_Remove(list.get(), name.c_str()), HYP_NOT_FOUND);
    EXPECT_EQ(DVSData_Update(list.get(), name.c_str(), "w", 1, 0), HYP_OK);
    EXPECT_EQ(ContentOf(list).size(), 2u); // Not found, so added again.
}

TEST(DataAppend, ZeroesTheNamesTailAndThePadding) {
    for (std::uint32_t len = 0; len < 12; ++len) {
        const ListPtr list = NewList();
        const std::string value(len, 'v');
        Append(list.get(), {"ab", value});
        const DVSDataEntry *entry = list->head;
        for (std::size_t i = 2; i < 128; ++i)
            ASSERT_EQ(entry->name[i], '\0') << i;
        for (std::size_t i = len; i < entry->serialSize - 140; ++i)
            ASSERT_EQ(entry->data[i], 0u) << len << ' ' << i;
        EXPECT_EQ(ContentOf(list)[0].value, value);
    }
}

TEST(DataUpdate, KeepsThePositionAtTheSameLength) {
    const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}, {"c", "3"}});
    DVSDataEntry *const entry = list->head->next;
    EXPECT_EQ(DVSData_Update(list.get(), "b", "9", 1, 0x10), HYP_OK);
    EXPECT_EQ(list->head->next, entry);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "1"}, {"b", "9", 0x10}, {"c", "3"}}));
    ExpectSound(list.get());
}

TEST(DataUpdate, MovesToTheTailAtAnotherLength) {
    const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}, {"c", "3"}});
    EXPECT_EQ(DVSData_Update(list.get(), "b", "longer", 6, 0x10), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "1"}, {"c", "3"}, {"b", "longer", 0x10}}));
    EXPECT_EQ(DVSData_Update(list.get(), "a", "", 0, 0x40), HYP_OK);
    EXPECT_EQ(DVSData_Update(list.get(), "a", "again", 5, 0x40), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"c", "3"}, {"b", "longer", 0x10}, {"a", "again", 0x40}}));
    ExpectSound(list.get());
}

TEST(DataUpdate, TypeZeroKeepsTheOldTypeAtAnotherLength) {
    const ListPtr list = ListOf({{"a", "1", 0x48}});
    EXPECT_EQ(DVSData_Update(list.get(), "a", "12", 2, 0), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "12", 0x48}}));
}

TEST(DataUpdate, TypeZeroSetsTheDefaultTypeAtTheSameLength) {
    const ListPtr list = ListOf({{"a", "1", 0x48}});
    EXPECT_EQ(DVSData_Update(list.get(), "a", "2", 1, 0), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "2", 0x20}}));
}

TEST(DataUpdate, AddsAMissingName) {
    const ListPtr list = NewList();
    EXPECT_EQ(DVSData_Update(list.get(), "a", "1", 1, 0), HYP_OK);
    EXPECT_EQ(DVSData_Update(list.get(), "b", "2", 1, 0x10), HYP_OK);
    EXPECT_EQ(DVSData_UpdateProp(list.get(), "c", "3", 1), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "1", 0x20}, {"b", "2", 0x10}, {"c", "3", 0x20}}));
}

TEST(DataUpdate, UpdatePropUsesTypeZero) {
    const ListPtr list = ListOf({{"a", "1", 0x48}, {"b", "1", 0x48}});
    EXPECT_EQ(DVSData_UpdateProp(list.get(), "a", "2", 1), HYP_OK);
    EXPECT_EQ(DVSData_UpdateProp(list.get(), "b", "22", 2), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "2", 0x20}, {"b", "22", 0x48}}));
}

TEST(DataUpdate, LosesTheOldValueWhenTheAppendOverflows) {
    const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}});
    EXPECT_EQ(DVSData_Update(list.get(), "a", "", 0xfffffff0, 0x20), HYP_BAD_PARAM);
    EXPECT_EQ(ContentOf(list), (Props{{"b", "2"}}));
    ExpectSound(list.get());
}

TEST(DataUpdate, LosesTheOldValueWhenMemoryRunsOut) {
    const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}});
    const FailingHeap failing(1);
    EXPECT_EQ(DVSData_Update(list.get(), "b", "22", 2, 0x20), HYP_NO_MEMORY);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "1"}}));
    EXPECT_EQ(Heap().frees, 1u);
    ExpectSound(list.get());
}

// Callers shorten or retype a property by passing a value or name that lies in the list itself.
TEST(DataUpdate, AcceptsAPartOfTheOldValue) {
    const ListPtr list = ListOf({{"a", "0123456789"}, {"b", "2"}});
    EXPECT_EQ(DVSData_Update(list.get(), "a", list->head->data + 3, 4, 0), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"b", "2"}, {"a", "3456"}}));
}

TEST(DataUpdate, AcceptsTheOldEntrysOwnName) {
    const ListPtr list = ListOf({{"a", "0123456789"}, {"b", "2"}});
    EXPECT_EQ(DVSData_Update(list.get(), DVSData_Name(list->head), "new", 3, 0), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"b", "2"}, {"a", "new"}}));
}

TEST(DataUpdate, AcceptsTheOldValueAndAnotherEntrysValue) {
    const ListPtr list = ListOf({{"a", "01234"}, {"b", "56789"}});
    EXPECT_EQ(DVSData_Update(list.get(), "a", list->head->data, 5, 0x10), HYP_OK);
    EXPECT_EQ(DVSData_Update(list.get(), "b", list->head->data, 4, 0x10), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "01234", 0x10}, {"b", "0123", 0x10}}));
}

TEST(DataUpdate, FreesItsOwnValueOnceWhenMemoryRunsOut) {
    const ListPtr list = ListOf({{"a", "0123456789"}});
    const FailingHeap failing(1);
    EXPECT_EQ(DVSData_Update(list.get(), "a", list->head->data, 4, 0), HYP_NO_MEMORY);
    EXPECT_EQ(Heap().frees, 1u);
    EXPECT_EQ(list->serialSize, 16u);
}

TEST(DataRemove, ReturnsTheDefaultTypeForAMissingName) {
    const ListPtr list = ListOf({{"a", "1", 0x48}});
    std::uint32_t type = 0;
    EXPECT_EQ(DVSDataRemove(list.get(), "b", &type), HYP_NOT_FOUND);
    EXPECT_EQ(type, 0x20u);
    EXPECT_EQ(DVSDataRemove(list.get(), "b", nullptr), HYP_NOT_FOUND);
    EXPECT_EQ(DVSData_Remove(list.get(), "b"), HYP_NOT_FOUND);
}

TEST(DataRemove, ReturnsTheRemovedType) {
    const ListPtr list = ListOf({{"a", "1", 0x48}});
    std::uint32_t type = 0;
    EXPECT_EQ(DVSDataRemove(list.get(), "a", &type), HYP_OK);
    EXPECT_EQ(type, 0x48u);
    EXPECT_EQ(list->serialSize, 16u);
    EXPECT_EQ(list->head, nullptr);
    EXPECT_EQ(list->tail, nullptr);
}

TEST(DataRemove, OfTheTailMakesALaterAppendLinkToTheNewTail) {
    const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}});
    EXPECT_EQ(DVSData_Remove(list.get(), "b"), HYP_OK);
    Append(list.get(), {"c", "3"});
    EXPECT_EQ(ContentOf(list), (Props{{"a", "1"}, {"c", "3"}}));
    ExpectSound(list.get());
}

TEST(DataRemove, RemovesHeadAndMiddle) {
    const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}, {"c", "3"}, {"d", "4"}});
    EXPECT_EQ(DVSData_Remove(list.get(), "a"), HYP_OK);
    EXPECT_EQ(DVSData_Remove(list.get(), "c"), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"b", "2"}, {"d", "4"}}));
    ExpectSound(list.get());
}

TEST(DataRemove, AcceptsTheEntrysOwnName) {
    const ListPtr list = ListOf({{"a", "1"}});
    const Messages messages(2);
    EXPECT_EQ(DVSData_Remove(list.get(), DVSData_Name(list->head)), HYP_OK);
    EXPECT_TRUE(ContentOf(list).empty());
}

TEST(DataLookup, ComparesWholeNamesCaseSensitively) {
    const ListPtr list = ListOf({{"com.orbeno.common.alias", "1"}, {"", "2"}, {"com.orbeno.common", "3"}});
    DVSDataEntry *entry = nullptr;
    for (const char *missing :
         {"com.orbeno.common.Alias", "com.orbeno.common.alia", "com.orbeno.common.aliases", "a"})
        EXPECT_EQ(DVSData_Lookup(list.get(), missing, &entry), HYP_NOT_FOUND) << missing;
    EXPECT_EQ(DVSData_Lookup(list.get(), "com.orbeno.common", &entry), HYP_OK);
    EXPECT_EQ(entry, list->tail);
    EXPECT_EQ(DVSData_Lookup(list.get(), "", &entry), HYP_OK);
    EXPECT_EQ(entry, list->head->next);
}

TEST(DataLookup, ReturnsNotFoundAndKeepsTheOutput) {
    const ListPtr list = NewList();
    DVSDataEntry *entry = reinterpret_cast<DVSDataEntry *>(8);
    EXPECT_EQ(DVSData_Lookup(list.get(), "a", &entry), HYP_NOT_FOUND);
    EXPECT_EQ(entry, reinterpret_cast<DVSDataEntry *>(8));
}

TEST(DataNext, ReturnsNotFoundOnAnEmptyList) {
    const ListPtr list = NewList();
    DVSDataEntry *entry = nullptr;
    EXPECT_EQ(DVSData_Next(list.get(), nullptr, &entry), HYP_NOT_FOUND);
    EXPECT_EQ(entry, nullptr);
}

TEST(DataNext, WalksInOrderAndEnds) {
    const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}});
    DVSDataEntry *entry = nullptr;
    ASSERT_EQ(DVSData_Next(list.get(), nullptr, &entry), HYP_OK);
    EXPECT_STREQ(DVSData_Name(entry), "a");
    ASSERT_EQ(DVSData_Next(list.get(), entry, &entry), HYP_OK);
    EXPECT_STREQ(DVSData_Name(entry), "b");
    EXPECT_EQ(DVSData_Next(list.get(), entry, &entry), HYP_NOT_FOUND);
}

struct Walk {
    DVSData *list;
    Props seen;
    std::string stopAt, removeAt;
};

bool OnEntry(const char *name, const void *data, std::uint32_t dataLen, std::uint32_t propType, void *arg) {
    auto *const walk = static_cast<Walk *>(arg);
    walk->seen.push_back({name, {static_cast<const char *>(data), dataLen}, propType});
    if (walk->seen.back().name == walk->removeAt) {
        EXPECT_EQ(DVSData_Remove(walk->list, name), HYP_OK);
    }
    return walk->seen.back().name == walk->stopAt;
}

TEST(DataForEach, VisitsEveryEntryInOrder) {
    const Props props{{"a", "1", 0x10}, {"b", "", 0}, {"c", "333", 0x80000020}};
    const ListPtr list = ListOf(props);
    Walk walk{list.get(), {}, "none", "none"};
    DVSData_ForEach(list.get(), OnEntry, &walk);
    EXPECT_EQ(walk.seen, props);
}

TEST(DataForEach, StopsWhenTheCallbackSaysSo) {
    const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}, {"c", "3"}});
    Walk walk{list.get(), {}, "b", "none"};
    DVSData_ForEach(list.get(), OnEntry, &walk);
    EXPECT_EQ(walk.seen.size(), 2u);
}

TEST(DataForEach, AllowsTheCallbackToRemoveItsEntry) {
    for (const char *name : {"a", "b", "c"}) {
        const ListPtr list = ListOf({{"a", "1"}, {"b", "2"}, {"c", "3"}});
        Walk walk{list.get(), {}, "none", name};
        DVSData_ForEach(list.get(), OnEntry, &walk);
        EXPECT_EQ(walk.seen.size(), 3u);
        EXPECT_EQ(ContentOf(list).size(), 2u);
        ExpectSound(list.get());
    }
}

TEST(DataAccessors, ReturnTheEntrysFields) {
    const ListPtr list = ListOf({{"a", "123", 0x80000013}});
    void *data = nullptr;
    EXPECT_STREQ(DVSData_Name(list->head), "a");
    EXPECT_EQ(DVSData_PropType(list->head), 0x80000013u);
    EXPECT_EQ(DVSData_Data(list->head, &data), 3u);
    EXPECT_EQ(data, list->head->data);
}

TEST(DataIsSamePropType, ComparesBits2To7Only) {
    const ListPtr list = ListOf({{"a", "", 0x80000f13}});
    EXPECT_TRUE(DVSData_IsSamePropType(list->head, 0x10));
    EXPECT_FALSE(DVSData_IsSamePropType(list->head, 0x13)); // The expected type is not masked.
    EXPECT_FALSE(DVSData_IsSamePropType(list->head, 0x20));
    EXPECT_FALSE(DVSData_IsSamePropType(list->head, 0));
}

TEST(DataFreeAssocData, UsesTheListsFree) {
    const ListPtr list = NewList();
    DVSDataFreeFn freeFn = nullptr;
    DVSData_GetMemFreeFn(list.get(), &freeFn);
    EXPECT_EQ(freeFn, &CountingFree);
    ResetHeap();
    DVSData_FreeAssocData(list.get(), CountingAlloc(5));
    EXPECT_EQ(Heap().frees, 1u);
}

} // namespace
} // namespace dvs::test
