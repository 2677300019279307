/* SPDX-License-Identifier: Apache-2.0 */
// Nested buffers written into one block equal level-by-level serialization byte for byte. Reading them in
// place gives the same result as reading them into lists.

#include <gtest/gtest.h>

#include <string>

#include "dvsdata/list_internal.h"
#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

using data::EntrySize;
using data::Filter;
using data::ImageWriter;

const Props kInner{
    {"alias", "port", 0x20}, {"volatile", U32Value(2), 0x10}, {"opaque", std::string(300, '\x81'), 8}};

std::string Text(const Buffer &buffer) {
    return {buffer.begin(), buffer.end()};
}

/// Three levels, built list by list.
Buffer LevelByLevel(const Props &inner) {
    const Buffer ports = SerializedOf({{"version", U32Value(9), 0x10},
                                       {"port-1", Text(SerializedOf(inner)), 0x10},
                                       {"port-2", Text(SerializedOf({})), 0x10}});
    return SerializedOf({{"dvs-1", Text(ports), 0x10}, {"dvs-2", Text(SerializedOf({})), 0x10}});
}

/// The same in one pass.
HYP_ReturnStatus WriteNested(DVSData *inner, const Filter &filter, std::span<std::uint8_t> block,
                             bool *complete) {
    const std::uint32_t innerSize = data::SerializedSize(inner, filter);
    const std::uint32_t middleSize = 16 + EntrySize(4) + EntrySize(innerSize) + EntrySize(16);
    const ListPtr empty = NewList();
    const std::string version = U32Value(9);
    ImageWriter writer(block);
    writer.BeginBuffer();
    writer.BeginEntry("dvs-1", 0x10, middleSize);
    writer.BeginBuffer();
    writer.Entry("version", 0x10, {reinterpret_cast<const std::uint8_t *>(version.data()), 4});
    writer.BeginEntry("port-1", 0x10, innerSize);
    HYP_ReturnStatus status = writer.List(inner, filter, innerSize);
    writer.EndEntry();
    writer.BeginEntry("port-2", 0x10, 16);
    if (status == HYP_OK) status = writer.List(empty.get(), Filter::None(), 16);
    writer.EndEntry();
    writer.EndBuffer();
    writer.EndEntry();
    writer.BeginEntry("dvs-2", 0x10, 16);
    writer.BeginBuffer();
    writer.EndBuffer();
    writer.EndEntry();
    writer.EndBuffer();
    *complete = writer.Complete();
    return status;
}

TEST(ImageWriter, NestedLevelsEqualListsInLists) {
    const Buffer expected = LevelByLevel(kInner);
    Buffer block(expected.size(), 0xee);
    bool complete = false;
    EXPECT_EQ(WriteNested(ListOf(kInner).get(), Filter::None(), block, &complete), HYP_OK);
    EXPECT_TRUE(complete);
    EXPECT_EQ(block, expected);
}

TEST(ImageWriter, AppliesFilters) {
    const Buffer expected = LevelByLevel({kInner[0], kInner[2]});
    Buffer block(expected.size());
    bool complete = false;
    EXPECT_EQ(WriteNested(ListOf(kInner).get(), Filter::WithoutName("volatile"), block, &complete), HYP_OK);
    EXPECT_TRUE(complete);
    EXPECT_EQ(block, expected);
}

TEST(ImageWriter, NeverWritesPastItsBlock) {
    const ListPtr inner = ListOf(kInner);
    const std::size_t size = LevelByLevel(kInner).size();
    for (std::size_t less = 1; less <= size; ++less) {
        bool complete = true;
        const std::unique_ptr<std::uint8_t[]> block(new std::uint8_t[size - less]);
        (void)WriteNested(inner.get(), Filter::None(), {block.get(), size - less}, &complete);
        ASSERT_FALSE(complete) << less;
    }
}

TEST(ImageWriter, IsNotCompleteWithRoomLeftOrALevelOpen) {
    Buffer block(20);
    ImageWriter writer(block);
    writer.BeginBuffer();
    EXPECT_FALSE(writer.Complete());
    writer.EndBuffer();
    EXPECT_EQ(writer.Position(), 16u);
    EXPECT_FALSE(writer.Complete());
}

TEST(ImageWriter, RejectsAnInconsistentList) {
    const ListPtr inner = ListOf(kInner);
    inner->serialSize += 4;
    Buffer block(4096);
    bool complete = true;
    EXPECT_EQ(WriteNested(inner.get(), Filter::None(), block, &complete), HYP_LIMIT_EXCEEDED);
}

// ---- Reading in place ----

TEST(InPlaceList, ReturnsWhatTheListWouldHold) {
    const ExactBlock block(SerializedOf({{"a", "1", 0x10}, {"dropped", "2", 1}, {"b", "3", 0x20}}));
    data::InPlaceList list;
    ASSERT_EQ(list.Open(block.bytes()), HYP_OK);
    for (int round = 0; round < 2; ++round) {
        data::EntryRef entry;
        ASSERT_TRUE(list.Next(&entry));
        EXPECT_EQ(entry.name, "a");
        EXPECT_EQ(entry.offset, 12u);
        ASSERT_TRUE(list.Next(&entry));
        EXPECT_EQ(entry.name, "b");
        EXPECT_EQ(entry.value[0], '3');
        EXPECT_FALSE(list.Next(&entry));
        list.Rewind();
    }
}

TEST(InPlaceList, PrintsTheSameMessagesAsTheDeserializer) {
    Buffer good = SerializedOf({{"a", "1", 0x10}, {"dropped", "2", 1}, {"b", "3", 0x20}});
    Buffer late = good; // A fault after valid entries.
    SetU32(&late, 12 + 144 + 144, 100000);
    Mend(&late);
    Buffer early = good;
    early[40] ^= 1;
    for (const Buffer &buffer : {good, late, early}) {
        const ExactBlock block(buffer);
        std::vector<std::string> expected;
        HYP_ReturnStatus status = HYP_OK;
        {
            Messages messages(3);
            status = Read(buffer).first;
            expected = messages.Take();
        }
        Messages messages(3);
        data::InPlaceList list;
        EXPECT_EQ(list.Open(block.bytes()), status);
        EXPECT_EQ(messages.Take(), expected);
        data::EntryRef entry;
        if (status == HYP_OK)
            while (list.Next(&entry)) {
            }
        EXPECT_TRUE(messages.All().empty()); // The message is printed only once.
    }
}

TEST(InPlaceList, KnownSumsEqualTheValuesSums) {
    Props props;
    for (int i = 0; i < 40; ++i) {
        const Buffer inner =
            SerializedOf({{"n" + std::to_string(i), std::string(static_cast<std::size_t>(i) * 3, 'v')}});
        props.push_back({"value " + std::to_string(i), Text(inner), 0x10});
    }
    const ExactBlock block(SerializedOf(props));
    data::InPlaceList list;
    ASSERT_EQ(list.Open(block.bytes(), data::kDeserializeTypeMask, {}, data::PartSums::Yes), HYP_OK);
    data::EntryRef entry;
    int known = 0;
    while (list.Next(&entry)) {
        if (entry.sum.known) {
            EXPECT_EQ(entry.sum.sum, data::Sum(entry.value));
            ++known;
        }
        data::InPlaceList nested;
        EXPECT_EQ(nested.Open(entry.value, data::kDeserializeTypeMask, entry.sum), HYP_OK);
        DVSData *copy = nullptr;
        EXPECT_EQ(data::ReadList(&copy, entry.value, CountingAlloc, CountingFree, data::kDeserializeTypeMask,
                                 entry.sum),
                  HYP_OK);
        EXPECT_EQ(Serialized(copy), Buffer(entry.value.begin(), entry.value.end()));
        DVSData_Free(copy);
    }
    EXPECT_EQ(known, 32);
}

TEST(InPlaceList, KnownSumDoesNotHideANestedFault) {
    Buffer inner = SerializedOf({{"n", "1234"}});
    inner[150] ^= 1;
    const ExactBlock block(SerializedOf({{"outer", Text(inner), 0x10}}));
    data::InPlaceList list, nested;
    ASSERT_EQ(list.Open(block.bytes(), data::kDeserializeTypeMask, {}, data::PartSums::Yes), HYP_OK);
    data::EntryRef entry;
    ASSERT_TRUE(list.Next(&entry));
    ASSERT_TRUE(entry.sum.known);
    EXPECT_EQ(nested.Open(entry.value, data::kDeserializeTypeMask, entry.sum), HYP_BAD_CHECKSUM);
}

TEST(InPlaceList, SumExcludesBytesAfterANestedBuffer) {
    Buffer inner = SerializedOf({{"n", "1234"}});
    inner.insert(inner.end(), 8, 0x11);
    const ExactBlock block(SerializedOf({{"outer", Text(inner), 0x10}}));
    data::InPlaceList list, nested;
    ASSERT_EQ(list.Open(block.bytes(), data::kDeserializeTypeMask, {}, data::PartSums::Yes), HYP_OK);
    data::EntryRef entry;
    ASSERT_TRUE(list.Next(&entry));
    EXPECT_EQ(nested.Open(entry.value, data::kDeserializeTypeMask, entry.sum), HYP_OK);
}

TEST(RemoveAfter, RemovesExactlyTheGivenEntryAmongDuplicates) {
    const ListPtr list = ListOf({{"twin", "1"}, {"twin", "2"}, {"twin", "3"}});
    data::RemoveAfter(list.get(), list->head);
    EXPECT_EQ(ContentOf(list), (Props{{"twin", "1"}, {"twin", "3"}}));
    data::RemoveAfter(list.get(), nullptr);
    EXPECT_EQ(ContentOf(list), (Props{{"twin", "3"}}));
    DVSDataEntry *entry = nullptr;
    ASSERT_EQ(DVSData_Lookup(list.get(), "twin", &entry), HYP_OK);
    EXPECT_EQ(entry, list->tail);
}

} // namespace
} // namespace dvs::test
