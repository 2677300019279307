/* SPDX-License-Identifier: Apache-2.0 */
// Tests the read-only view: each field of each entry with its offset, and each kind of fault with its byte.

#include "dvsdata/buffer_view.h"

#include <gtest/gtest.h>

#include <string>

#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

using data::BufferView;
using data::EntryView;
using data::Fault;
using data::FaultKind;

Buffer Two() {
    return SerializedOf({{"first", "12345", 0x10}, {"second", "1234", 0}});
}

void ExpectFault(const Buffer &buffer, FaultKind kind, std::size_t offset, std::uint32_t found,
                 std::uint32_t expected) {
    const ExactBlock block(buffer);
    const Fault fault = data::VerifyBuffer(block.bytes(), 1000);
    EXPECT_EQ(fault.kind, kind) << fault.Text();
    EXPECT_EQ(fault.offset, 1000 + offset);
    EXPECT_EQ(fault.found, found);
    EXPECT_EQ(fault.expected, expected);
}

TEST(BufferView, ReturnsHeaderAndEntriesOfEveryType) {
    const ExactBlock block(Two());
    BufferView view(block.bytes());
    EXPECT_EQ(view.Header().totalLength, 312u);
    EXPECT_EQ(view.Header().version, 1u);
    EXPECT_EQ(view.Header().reserved, 0u);
    EXPECT_EQ(view.Header().checksum, view.ComputedChecksum());
    EntryView entry;
    ASSERT_TRUE(view.Next(&entry));
    EXPECT_EQ(entry.offset, 12u);
    EXPECT_EQ(entry.size, 148u);
    EXPECT_TRUE(entry.IsUsualSize());
    EXPECT_EQ(entry.Name(), "first");
    EXPECT_EQ(entry.nameField.size(), 128u);
    EXPECT_EQ(entry.propType, 0x10u);
    EXPECT_EQ(entry.ValueOffset(), 152u);
    EXPECT_EQ(entry.DataLen(), 5u);
    EXPECT_EQ(std::string(entry.value.begin(), entry.value.end()), "12345");
    EXPECT_EQ(entry.padding.size(), 3u);
    ASSERT_TRUE(view.Next(&entry));
    EXPECT_EQ(entry.offset, 160u);
    EXPECT_EQ(entry.propType, 0u);
    EXPECT_FALSE(view.Next(&entry));
    EXPECT_TRUE(view.AtEnd());
    EXPECT_TRUE(view.Ok());
    EXPECT_EQ(view.UsedSize(), 312u);
    EXPECT_FALSE(view.Next(&entry));
}

TEST(BufferView, RewindsToTheFirstEntry) {
    const ExactBlock block(Two());
    BufferView view(block.bytes());
    EntryView entry;
    while (view.Next(&entry)) {
    }
    view.Rewind();
    ASSERT_TRUE(view.Next(&entry));
    EXPECT_EQ(entry.offset, 12u);
    EXPECT_FALSE(view.AtEnd());
}

TEST(BufferView, NestedOffsetsCountFromTheOutermostBuffer) {
    const Buffer inner = SerializedOf({{"inner", "1"}});
    const Buffer outer = SerializedOf({{"x", ""}, {"outer", std::string(inner.begin(), inner.end())}});
    const ExactBlock block(outer);
    BufferView view(block.bytes());
    EntryView entry;
    ASSERT_TRUE(view.Next(&entry));
    ASSERT_TRUE(view.Next(&entry));
    BufferView nested(entry.value, entry.ValueOffset());
    EXPECT_EQ(nested.BaseOffset(), 12u + 144u + 140u);
    ASSERT_TRUE(nested.Next(&entry));
    EXPECT_EQ(entry.offset, 12u + 144u + 140u + 12u);
    EXPECT_EQ(entry.Name(), "inner");
    EXPECT_EQ(outer[entry.ValueOffset()], '1');
}

TEST(BufferView, ReportsEachFaultAtItsByte) {
    ExpectFault(Two(), FaultKind::None, static_cast<std::size_t>(-1000), 0, 0);
    ExpectFault(Buffer(15), FaultKind::TooShort, 15, 15, 16);
    ExpectFault({}, FaultKind::TooShort, 0, 0, 16);
    Buffer buffer = Two();
    SetU32(&buffer, 0, 15);
    ExpectFault(buffer, FaultKind::LengthTooSmall, 0, 15, 16);
    SetU32(&buffer, 0, 313);
    ExpectFault(buffer, FaultKind::LengthTooLarge, 0, 313, 312);
    buffer = Two();
    buffer[8] = 3;
    ExpectFault(buffer, FaultKind::Version, 8, 3, 1);
    buffer = Two();
    const std::uint32_t right = U32At(buffer, 4);
    SetU32(&buffer, 4, right + 1);
    ExpectFault(buffer, FaultKind::Checksum, 4, right + 1, right);
    buffer = Two();
    SetU32(&buffer, 160, 153);
    Mend(&buffer);
    ExpectFault(buffer, FaultKind::EntryTooLarge, 160, 153, 152);
    SetU32(&buffer, 160, 142);
    Mend(&buffer);
    ExpectFault(buffer, FaultKind::EntryLengths, 160, 4, 142);
    SetU32(&buffer, 160, 150);
    Mend(&buffer);
    ExpectFault(buffer, FaultKind::NoMarker, 310, 2, 4);
}

TEST(BufferView, DescribesFaultsInText) {
    char text[128];
    const Fault fault{FaultKind::Checksum, 4, 0xab, 0xcd};
    EXPECT_TRUE(fault.Describe(text));
    EXPECT_STREQ(text, "checksum does not match (0xab stored, 0xcd computed)");
    EXPECT_TRUE(Fault{}.Describe(text));
    EXPECT_STREQ(text, "no fault");
    for (std::size_t size = 1; size < 53; ++size) {
        EXPECT_FALSE(fault.Describe(std::span(text).first(size))) << size;
        EXPECT_EQ(std::string_view(text).size(), size - 1);
    }
    EXPECT_FALSE(fault.Describe({}));
}

TEST(BufferView, CanWalkPastAWrongVersionOrChecksum) {
    Buffer buffer = Two();
    buffer[8] = 3;
    buffer[100] ^= 1;
    const ExactBlock block(buffer);
    BufferView view(block.bytes());
    EntryView entry;
    EXPECT_FALSE(view.Next(&entry));
    ASSERT_TRUE(view.WalkAnyway());
    EXPECT_TRUE(view.Next(&entry));
    EXPECT_TRUE(view.Next(&entry));
    EXPECT_FALSE(view.Next(&entry));
    EXPECT_TRUE(view.AtEnd());
    EXPECT_EQ(view.FirstFault().kind, FaultKind::Version);
    view.Rewind();
    EXPECT_FALSE(view.Next(&entry)); // The fault is reported again.
}

TEST(BufferView, DoesNotWalkPastAWrongLength) {
    Buffer buffer = Two();
    SetU32(&buffer, 0, 5000);
    const ExactBlock block(buffer);
    BufferView view(block.bytes());
    EntryView entry;
    EXPECT_FALSE(view.WalkAnyway());
    EXPECT_FALSE(view.Next(&entry));
    EXPECT_EQ(BufferView().Header().totalLength, 0u);
}

TEST(BufferView, TruncatesNamesLikeAList) {
    Buffer buffer = SerializedOf({{std::string(127, 'n'), "1"}});
    buffer[16 + 127] = 'n';
    Mend(&buffer);
    const ExactBlock block(buffer);
    BufferView view(block.bytes());
    EntryView entry;
    ASSERT_TRUE(view.Next(&entry));
    EXPECT_EQ(entry.Name(), std::string(127, 'n'));
    EXPECT_EQ(EntryView().Name(), "");
}

} // namespace
} // namespace dvs::test
