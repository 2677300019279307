/* SPDX-License-Identifier: Apache-2.0 */
// Tests serialization byte by byte: sizes, header, filters, the buffer convention, and lists with
// inconsistent sizes.

#include <gtest/gtest.h>

#include <algorithm>
#include <string>

#include "dvsdata/format.h"
#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

const Props kSome{{"com.orbeno.common.alias", "uplink switch", 0x20},
                  {"com.orbeno.common.port.volatile.type", U32Value(2), 0x10},
                  {"com.orbeno.common.port.volatile.persist", "1", 0x40},
                  {"opaque", std::string("\0\xff\0", 3), 0x80000008},
                  {"", "", 0}};

struct Output {
    HYP_ReturnStatus status = HYP_OK;
    void *buf = nullptr;
    std::uint32_t len = 0xdead;
};

Buffer TakeBytes(DVSData *list, const Output &output) {
    EXPECT_EQ(output.status, HYP_OK);
    if (!output.buf) return {};
    const auto *const bytes = static_cast<const std::uint8_t *>(output.buf);
    Buffer copy(bytes, bytes + output.len);
    DVSData_FreeAssocData(list, output.buf);
    return copy;
}

Buffer WithoutName(const Props &props, const char *exName) {
    const ListPtr list = ListOf(props);
    Output output;
    const std::uint32_t size = DVSData_SerializedSizeExNamedProp(list.get(), 9, exName);
    output.status = DVSData_SerializeExNamedProp(list.get(), &output.buf, &output.len, 9, exName);
    EXPECT_EQ(output.len, size);
    return TakeBytes(list.get(), output);
}

Buffer WithoutTypes(const Props &props, std::uint32_t mask) {
    const ListPtr list = ListOf(props);
    Output output;
    output.status = DVSData_SerializeExTypeProp(list.get(), &output.buf, &output.len, mask);
    return TakeBytes(list.get(), output);
}

TEST(DataSerialize, EmptyListIs16Bytes) {
    const Buffer expected{16, 0, 0, 0, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0, 0, 0};
    EXPECT_EQ(SerializedOf({}), expected);
    const auto [status, list] = Read(expected);
    ASSERT_EQ(status, HYP_OK);
    EXPECT_TRUE(ContentOf(list).empty());
}

TEST(DataSerialize, OneEntryOfFourBytesIs164Bytes) {
    const Buffer buffer = SerializedOf({{"a", "1234", 0x20}});
    ASSERT_EQ(buffer.size(), 164u);
    EXPECT_EQ(U32At(buffer, 0), 164u);
    EXPECT_EQ(U32At(buffer, 8), 1u); // version 1, reserved 0
    EXPECT_EQ(U32At(buffer, 12), 148u);
    EXPECT_EQ(U32At(buffer, 160), 0u);
}

TEST(DataSerialize, WritesEveryField) {
    const Buffer buffer = SerializedOf({{"name", "value", 0x80000014}});
    Buffer expected(164, 0);
    SetU32(&expected, 0, 164);
    expected[8] = 1;
    SetU32(&expected, 12, 148);
    std::copy_n("name", 4, expected.begin() + 16);
    SetU32(&expected, 12 + 132, 0x80000014);
    SetU32(&expected, 12 + 136, 5);
    std::copy_n("value", 5, expected.begin() + 12 + 140);
    Mend(&expected);
    EXPECT_EQ(buffer, expected);
}

TEST(DataSerialize, ChecksumMatchesItsDefinition) {
    for (std::uint32_t size = 0; size < 700; ++size) {
        Buffer bytes(size);
        for (std::uint32_t i = 0; i < size; ++i)
            bytes[i] = static_cast<std::uint8_t>(i * 167 + (i >> 3) + 200);
        ASSERT_EQ(data::Checksum(ExactBlock(bytes).bytes()), PlainChecksum(bytes)) << size;
    }
}

TEST(DataSerialize, EveryProcessorVariantGivesTheSameSum) {
    for (std::size_t size = 0; size < 700; ++size) {
        Buffer bytes(size);
        for (std::size_t i = 0; i < size; ++i)
            bytes[i] = static_cast<std::uint8_t>(i * 73 + 130);
        ASSERT_EQ(data::SumBaseline(ExactBlock(bytes).bytes()), data::Sum(ExactBlock(bytes).bytes())) << size;
    }
}

TEST(DataSerialize, SumsOfPiecesAddUp) {
    Buffer bytes(4099);
    for (std::size_t i = 0; i < bytes.size(); ++i)
        bytes[i] = static_cast<std::uint8_t>(i * 31 + (i >> 5));
    for (std::size_t cut = 0; cut < bytes.size(); cut += 4)
        ASSERT_EQ(data::Sum(std::span(bytes).first(cut)) + data::Sum(std::span(bytes).subspan(cut)),
                  data::Sum(bytes));
}

TEST(DataSerialize, SizeIsTheRunningTotal) {
    const ListPtr list = ListOf(kSome);
    EXPECT_EQ(DVSData_SerializedSize(list.get(), 0), list->serialSize);
    EXPECT_EQ(DVSData_SerializedSizeExNamedProp(list.get(), 0, nullptr), list->serialSize);
    EXPECT_EQ(Serialized(list.get()).size(), list->serialSize);
}

TEST(DataSerialize, RoundTrips) {
    const auto [status, list] = Read(SerializedOf(kSome), 0xffffffff);
    ASSERT_EQ(status, HYP_OK);
    EXPECT_EQ(ContentOf(list), Props(kSome.begin(), kSome.end() - 1)); // Type 0 shares no bit with any mask.
    ExpectSound(list.get());
}

TEST(DataSerialize, BuffersAreReproducible) {
    EXPECT_EQ(SerializedOf(kSome), SerializedOf(kSome));
}

TEST(DataSerialize, AcceptsACallersBufferOfAtLeastTheSize) {
    const ListPtr list = ListOf(kSome);
    const Buffer expected = Serialized(list.get());
    for (const std::uint32_t more : {0u, 1u, 100u}) {
        Buffer own(expected.size() + more, 0xee);
        void *buf = own.data();
        auto len = static_cast<std::uint32_t>(own.size());
        ResetHeap();
        EXPECT_EQ(DVSData_Serialize(list.get(), &buf, &len, 9), HYP_OK);
        EXPECT_EQ(Heap().allocs, 0u);
        EXPECT_EQ(buf, own.data());
        EXPECT_EQ(len, expected.size());
        EXPECT_TRUE(std::equal(expected.begin(), expected.end(), own.begin()));
        EXPECT_TRUE(
            std::all_of(own.begin() + len, own.end(), [](std::uint8_t byte) { return byte == 0xee; }));
    }
}

TEST(DataSerialize, RejectsACallersBufferOneByteTooSmall) {
    const ListPtr list = ListOf(kSome);
    Buffer own(list->serialSize - 1, 0xee);
    const Buffer untouched = own;
    void *buf = own.data();
    auto len = static_cast<std::uint32_t>(own.size());
    EXPECT_EQ(DVSData_Serialize(list.get(), &buf, &len, 9), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(buf, own.data());
    EXPECT_EQ(own, untouched);
    EXPECT_EQ(DVSData_SerializeExTypeProp(list.get(), &buf, &len, 0), HYP_LIMIT_EXCEEDED);
}

TEST(DataSerialize, AllocatesOneBlockOfTheSizeFromTheList) {
    const ListPtr list = ListOf(kSome);
    ResetHeap();
    Output output;
    output.status = DVSData_Serialize(list.get(), &output.buf, &output.len, 9);
    ASSERT_EQ(Heap().sizes.size(), 1u);
    EXPECT_EQ(Heap().sizes[0], list->serialSize);
    TakeBytes(list.get(), output);
    EXPECT_EQ(Heap().frees, 1u);
}

TEST(DataSerialize, ReturnsNoBufferWhenMemoryRunsOut) {
    const ListPtr list = ListOf(kSome);
    const FailingHeap failing(1);
    Output output;
    EXPECT_EQ(DVSData_Serialize(list.get(), &output.buf, &output.len, 9), HYP_NO_MEMORY);
    EXPECT_EQ(DVSData_SerializeExNamedProp(list.get(), &output.buf, &output.len, 9, "x"), HYP_NO_MEMORY);
    EXPECT_EQ(DVSData_SerializeExTypeProp(list.get(), &output.buf, &output.len, 1), HYP_NO_MEMORY);
    EXPECT_EQ(DVSData_SerializeEntry(list.get(), "opaque", &output.buf, &output.len), HYP_NO_MEMORY);
    EXPECT_EQ(output.buf, nullptr);
}

TEST(DataSerialize, WritesVersionsBelowFourWithAMessage) {
    const ListPtr list = ListOf(kSome);
    const Messages messages(0);
    Output output;
    output.status = DVSData_Serialize(list.get(), &output.buf, &output.len, 3);
    const Buffer old = TakeBytes(list.get(), output);
    EXPECT_EQ(messages.All(), (std::vector<std::string>{"DVS version 3 is smaller than 6.0.\n"}));
    EXPECT_EQ(old, Serialized(list.get()));
    output = {};
    output.status = DVSData_Serialize(list.get(), &output.buf, &output.len, 4);
    EXPECT_EQ(TakeBytes(list.get(), output), old);
    EXPECT_EQ(messages.All().size(), 1u); // version 4 causes no message
}

TEST(DataSerializeExNamedProp, VolatileOmitsTheTypeButKeepsThePersistFlag) {
    const Props kept{kSome[0], kSome[2], kSome[3], kSome[4]};
    EXPECT_EQ(WithoutName(kSome, "volatile"), SerializedOf(kept));
}

TEST(DataSerializeExNamedProp, WithoutANameOmitsNothing) {
    EXPECT_EQ(WithoutName(kSome, nullptr), SerializedOf(kSome));
}

TEST(DataSerializeExNamedProp, EmptyNameMatchesEveryName) {
    EXPECT_EQ(WithoutName(kSome, ""), SerializedOf({kSome[2]}));
}

TEST(DataSerializeExNamedProp, KeepsAnyNameThatContainsTheKeptKey) {
    const Props props{{"x.com.orbeno.common.port.volatile.persist.y", "1"}, {"volatile", "2"}};
    EXPECT_EQ(WithoutName(props, "volatile"), SerializedOf({props[0]}));
}

TEST(DataSerializeExTypeProp, OmitsTypesWithAnyBitOfTheMask) {
    EXPECT_EQ(WithoutTypes(kSome, 0x80000064), SerializedOf({kSome[1], kSome[4]}));
    EXPECT_EQ(WithoutTypes(kSome, 0x10), SerializedOf({kSome[0], kSome[2], kSome[3], kSome[4]}));
    EXPECT_EQ(WithoutTypes(kSome, 0xffffffff), SerializedOf({kSome[4]}));
}

TEST(DataSerializeExTypeProp, MaskZeroOmitsNothing) {
    EXPECT_EQ(WithoutTypes(kSome, 0), SerializedOf(kSome));
}

TEST(DataSerializeEntry, MakesABufferOfOneEntry) {
    const ListPtr list = ListOf(kSome);
    Output output;
    output.status = DVSData_SerializeEntry(list.get(), "opaque", &output.buf, &output.len);
    EXPECT_EQ(TakeBytes(list.get(), output), SerializedOf({kSome[3]}));
}

TEST(DataSerializeEntry, RejectsAnyCallersBuffer) {
    const ListPtr list = ListOf(kSome);
    Buffer own(4096);
    void *buf = own.data();
    std::uint32_t len = 4096;
    EXPECT_EQ(DVSData_SerializeEntry(list.get(), "opaque", &buf, &len), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(len, 0u);
    EXPECT_EQ(buf, own.data());
}

TEST(DataSerializeEntry, ComparesWholeNames) {
    const std::string name(200, 'x');
    const ListPtr list = ListOf({{name, "v"}, {"ab", "w"}});
    Output output;
    for (const std::string &missing : {name, name.substr(0, 126), std::string("a"), std::string()}) {
        output.len = 7;
        EXPECT_EQ(DVSData_SerializeEntry(list.get(), missing.c_str(), &output.buf, &output.len),
                  HYP_NOT_FOUND);
        EXPECT_EQ(output.len, 0u);
    }
    output.status = DVSData_SerializeEntry(list.get(), name.substr(0, 127).c_str(), &output.buf, &output.len);
    EXPECT_EQ(TakeBytes(list.get(), output), SerializedOf({{name, "v"}}));
}

// Inconsistent sizes are a bug of the list's owner. Serialization must not overrun the buffer and must not
// leak one.
class InconsistentList : public testing::Test {
protected:
    void Expect(const char *message) {
        ResetHeap();
        Output output;
        {
            const Messages messages(0);
            EXPECT_EQ(DVSData_Serialize(list_.get(), &output.buf, &output.len, 9), HYP_LIMIT_EXCEEDED);
            EXPECT_EQ(messages.All(), std::vector<std::string>{message});
        }
        EXPECT_EQ(output.buf, nullptr);
        EXPECT_EQ(Heap().Live(), 0u);
        Buffer own(list_->serialSize);
        void *buf = own.data();
        auto len = static_cast<std::uint32_t>(own.size());
        EXPECT_EQ(DVSData_Serialize(list_.get(), &buf, &len, 9), HYP_LIMIT_EXCEEDED);
        EXPECT_EQ(buf, own.data()); // The caller keeps its buffer.
    }
    ListPtr list_ = ListOf({{"a", "1234"}, {"b", "5678"}});
};

TEST_F(InconsistentList, TooSmallASizeFailsAtTheEntry) {
    list_->serialSize -= 4;
    Expect(
        "DVSData length changed during serialization, buflen = 308, lenRemaining = 148, name b, size 148\n");
}

TEST_F(InconsistentList, TooLargeASizeFailsAtTheEnd) {
    list_->serialSize += 8;
    Expect(
        "DVSData length changed during serialization, buflen = 320, lenRemaining = 12, name NULL, size 0\n");
}

TEST_F(InconsistentList, TooLargeAnEntryFailsAtTheEntry) {
    list_->head->serialSize = 5000;
    Expect(
        "DVSData length changed during serialization, buflen = 312, lenRemaining = 300, name a, size 5000\n");
}

TEST_F(InconsistentList, TooSmallAnEntryFailsAtTheEnd) {
    list_->head->serialSize = 144;
    Expect(
        "DVSData length changed during serialization, buflen = 312, lenRemaining = 8, name NULL, size 0\n");
}

TEST_F(InconsistentList, FilteredSizeStopsAtTheEntryThatDoesNotFit) {
    list_->serialSize -= 4;
    EXPECT_EQ(DVSData_SerializedSizeExNamedProp(list_.get(), 9, "zzz"), 16u + 148u);
    Output output;
    EXPECT_EQ(DVSData_SerializeExNamedProp(list_.get(), &output.buf, &output.len, 9, "zzz"),
              HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(output.buf, nullptr);
}

} // namespace
} // namespace dvs::test
