/* SPDX-License-Identifier: Apache-2.0 */
// Tests reading of whole buffers and of single values: which buffers are rejected, the status and message of
// each, and the order of the checks. Every buffer lies in a heap block of exactly its size.

#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

using Texts = std::vector<std::string>;

const Props kTwo{{"com.orbeno.common.first", "12345", 0x10}, {"second", "1234", 0x20}};

struct BadBuffer {
    const char *name;
    std::function<void(Buffer *)> damage;
    HYP_ReturnStatus status;
    const char *message;
    HYP_ReturnStatus valueStatus; // of reading one value from the buffer
    const char *valueMessage;
};

void PrintTo(const BadBuffer &bad, std::ostream *out) {
    *out << bad.name;
}

constexpr std::size_t kSecond = 12 + 148;

// The buffer of kTwo is 312 bytes: entries at 12 and 160, marker at 308.
const BadBuffer kBad[] = {
    {"FifteenBytes", [](Buffer *b) { b->resize(15); }, HYP_BAD_PARAM,
     "bad data: buffer size 15 smaller than minimum header size\n", HYP_BAD_PARAM,
     "bad data: buffer size 15 smaller than minimum header size\n"},
    {"HeaderLengthOf8", [](Buffer *b) { SetU32(b, 0, 8); }, HYP_BAD_PARAM,
     "bad data: data size 8 in header smaller than minimum header size\n", HYP_BAD_PARAM,
     "bad data: data size 8 in header smaller than minimum header size\n"},
    {"HeaderLengthBeyondTheBuffer", [](Buffer *b) { SetU32(b, 0, 313); }, HYP_BAD_PARAM,
     "bad data: buffer size 312 smaller than size 313 in header\n", HYP_BAD_PARAM,
     "bad data: buffer size 312 smaller than size 313 in header\n"},
    {"Version2", [](Buffer *b) { (*b)[8] = 2; }, HYP_BAD_PARAM,
     "Bad data: expected header version 1, actual 2\n", HYP_BAD_PARAM, "Unsupported DVS data version 2\n"},
    {"VersionBeforeChecksum",
     [](Buffer *b) {
         (*b)[9] = 1;
         SetU32(b, 4, 0x1234);
     },
     HYP_BAD_PARAM, "Bad data: expected header version 1, actual 257\n", HYP_BAD_CHECKSUM, nullptr},
    {"EntryBeyondTheBuffer",
     [](Buffer *b) {
         SetU32(b, kSecond, 153);
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: data length smaller than data block size 153\n", HYP_BAD_PARAM,
     "bad data: data length smaller than data block size 153\n"},
    {"EntryOf4GiB",
     [](Buffer *b) {
         SetU32(b, kSecond, 0xffffffff);
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: data length smaller than data block size -1\n", HYP_BAD_PARAM,
     "bad data: data length smaller than data block size -1\n"},
    {"ValueLargerThanItsEntry",
     [](Buffer *b) {
         SetU32(b, kSecond + 136, 149);
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: data block not serialized correctly 149/148\n", HYP_BAD_PARAM, ""},
    {"ValueWithoutRoom",
     [](Buffer *b) {
         SetU32(b, kSecond + 136, 6);
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: data block not serialized correctly 6/148\n", HYP_OK, ""},
    {"EntryOfOneByte",
     [](Buffer *b) {
         SetU32(b, kSecond, 1);
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: data block not serialized correctly 4/1\n", HYP_OK, ""},
    {"NoMarkerLeft",
     [](Buffer *b) {
         SetU32(b, kSecond, 152);
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: not end with 4 (zero) marker bytes\n", HYP_OK, ""},
    {"ThreeBytesOfMarker",
     [](Buffer *b) {
         SetU32(b, kSecond, 149);
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: not end with 4 (zero) marker bytes\n", HYP_OK, ""},
    {"MarkerNotZero",
     [](Buffer *b) {
         (*b)[308] = 200;
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: data length smaller than data block size 200\n", HYP_OK, ""},
    {"MarkerOfTwo",
     [](Buffer *b) {
         (*b)[308] = 2;
         Mend(b);
     },
     HYP_BAD_PARAM, "bad data: data block not serialized correctly 0/2\n", HYP_OK, ""},
};

class BadBuffers : public testing::TestWithParam<BadBuffer> {
protected:
    Buffer Damaged() const {
        Buffer buffer = SerializedOf(kTwo);
        GetParam().damage(&buffer);
        return buffer;
    }
};
INSTANTIATE_TEST_SUITE_P(Damage, BadBuffers, testing::ValuesIn(kBad),
                         [](const auto &each) { return std::string(each.param.name); });

TEST_P(BadBuffers, AreRejectedWithoutALeak) {
    const Buffer buffer = Damaged();
    ResetHeap();
    const Messages messages(0);
    const auto [status, list] = Read(buffer);
    EXPECT_EQ(status, GetParam().status);
    EXPECT_EQ(list, nullptr);
    EXPECT_EQ(messages.All(), Texts{GetParam().message});
    EXPECT_EQ(Heap().Live(), 0u);
}

TEST_P(BadBuffers, AreRejectedAlikeByListsInOneBlock) {
    const Buffer buffer = Damaged();
    ResetHeap();
    const Messages messages(0);
    const auto [status, list] = ReadShared(buffer);
    EXPECT_EQ(status, GetParam().status);
    EXPECT_EQ(list, nullptr);
    EXPECT_EQ(messages.All(), Texts{GetParam().message});
    EXPECT_EQ(Heap().Live(), 0u);
}

TEST_P(BadBuffers, ReturnSingleValuesThatAreStillReadable) {
    const ExactBlock block(Damaged());
    const Messages messages(0);
    char value[4096];
    EXPECT_EQ(DVSData_DeserializeGetPropVal(block.data(), block.size(), "second", value, sizeof value),
              GetParam().valueStatus);
    if (GetParam().valueMessage)
        EXPECT_EQ(messages.All(), *GetParam().valueMessage ? Texts{GetParam().valueMessage} : Texts{});
    else
        EXPECT_EQ(messages.All().size(), 1u);
}

TEST(DataDeserialize, MessageNamesBothChecksums) {
    Buffer buffer = SerializedOf({{"a", "1234"}});
    const std::uint32_t right = U32At(buffer, 4);
    SetU32(&buffer, 4, 0xabcd);
    char expected[80];
    std::snprintf(expected, sizeof expected, "bad chksum: expected 0x%x, actual 0x%x\n", 0xabcdu, right);
    const Messages messages(0);
    EXPECT_EQ(Read(buffer).first, HYP_BAD_CHECKSUM);
    EXPECT_EQ(messages.All(), Texts{expected});
}

TEST(DataDeserialize, RejectsAnyChangedByteFromOffset32) {
    const Buffer written = SerializedOf(kTwo);
    for (std::size_t i = 32; i < written.size(); ++i) {
        Buffer buffer = written;
        buffer[i] ^= 0x40;
        EXPECT_EQ(Read(buffer).first, HYP_BAD_CHECKSUM) << i;
    }
}

TEST(DataDeserialize, ChecksumExcludesReservedBytesAndStartOfFirstName) {
    const Buffer written = SerializedOf(kTwo);
    for (const std::size_t i : {10u, 11u, 16u, 17u, 20u, 31u}) {
        Buffer buffer = written;
        buffer[i] ^= 0x40;
        EXPECT_EQ(Read(buffer).first, HYP_OK) << i;
    }
}

TEST(DataDeserialize, ChecksLengthsBeforeTheChecksum) {
    for (const std::uint32_t length : {0u, 8u, 15u, 313u, 0xffffffffu}) {
        Buffer buffer = SerializedOf(kTwo);
        SetU32(&buffer, 0, length);
        SetU32(&buffer, 4, 0x1234);
        EXPECT_EQ(Read(buffer).first, HYP_BAD_PARAM) << length;
    }
    EXPECT_EQ(Read({}).first, HYP_BAD_PARAM);
    DVSData *list = nullptr;
    EXPECT_EQ(DVSData_Deserialize(&list, nullptr, 100, CountingAlloc, CountingFree), HYP_BAD_PARAM);
}

TEST(DataDeserialize, KeepsType10AndDropsType1) {
    DVSData *list = nullptr;
    const Buffer buffer = SerializedOf(
        {{"a", "", 0x10}, {"b", "", 1}, {"c", "", 0}, {"d", "", 0x103}, {"e", "", 0x80000000}, {"f", "", 4}});
    ASSERT_EQ(DVSData_Deserialize(&list, buffer.data(), static_cast<std::uint32_t>(buffer.size()),
                                  CountingAlloc, CountingFree),
              HYP_OK);
    const ListPtr owner(list);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "", 0x10}, {"e", "", 0x80000000}, {"f", "", 4}}));
}

TEST(DataDeserialize, WithPropTypeKeepsTypesThatShareABit) {
    const Buffer buffer = SerializedOf({{"a", "", 0x10}, {"b", "", 1}, {"c", "", 0x18}});
    EXPECT_EQ(ContentOf(Read(buffer, 8).second), (Props{{"c", "", 0x18}}));
    EXPECT_EQ(ContentOf(Read(buffer, 1).second), (Props{{"b", "", 1}}));
    EXPECT_TRUE(ContentOf(Read(buffer, 0).second).empty());
}

TEST(DataDeserialize, IgnoresBytesAfterLengthAndMarker) {
    Buffer buffer = SerializedOf(kTwo);
    buffer.insert(buffer.end(), 40, 0xcc);
    EXPECT_EQ(ContentOf(Read(buffer).second), kTwo); // after the header's length
    SetU32(&buffer, 0, static_cast<std::uint32_t>(buffer.size()));
    Mend(&buffer);
    EXPECT_EQ(ContentOf(Read(buffer).second), kTwo); // after the marker
}

TEST(DataDeserialize, AcceptsOddLengthsAndSizes) {
    Buffer buffer = SerializedOf({{"a", "1234"}});
    buffer.insert(buffer.begin() + 160, 1, 0x77); // One extra byte of padding: entry size 149.
    SetU32(&buffer, 0, 165);
    SetU32(&buffer, 12, 149);
    Mend(&buffer);
    const auto [status, list] = Read(buffer);
    ASSERT_EQ(status, HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "1234"}}));
    EXPECT_EQ(list->serialSize, 164u);
}

TEST(DataDeserialize, TruncatesAnUnterminatedName) {
    Buffer buffer = SerializedOf({{std::string(127, 'n'), "1234"}});
    buffer[16 + 127] = 'n';
    Mend(&buffer);
    const auto [status, list] = Read(buffer);
    ASSERT_EQ(status, HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{std::string(127, 'n'), "1234"}}));
}

TEST(DataDeserialize, ZeroesUnusedBytesOfAForeignBuffer) {
    const Props props{{"ab", "12345"}};
    Buffer buffer = SerializedOf(props);
    for (std::size_t i = 16 + 3; i < 16 + 128; ++i)
        buffer[i] = 0xaa; // after the name's NUL
    for (std::size_t i = 12 + 145; i < 12 + 148; ++i)
        buffer[i] = 0xbb; // padding
    Mend(&buffer);
    const auto [status, list] = Read(buffer);
    ASSERT_EQ(status, HYP_OK);
    EXPECT_EQ(Serialized(list.get()), SerializedOf(props));
}

TEST(DataDeserialize, ZeroesTheTailOfNamesOfEveryLength) {
    for (std::size_t length = 0; length < 128; ++length) {
        const Props props{{std::string(length, 'n'), "1234"}};
        const Buffer written = SerializedOf(props);
        for (std::size_t behind = length + 1; behind < 128; ++behind) {
            Buffer buffer = written;
            buffer[16 + behind] = 1;
            Mend(&buffer);
            const auto [status, list] = Read(buffer);
            ASSERT_EQ(status, HYP_OK);
            ASSERT_EQ(Serialized(list.get()), written) << length << ' ' << behind;
            DVSDataEntry *entry = nullptr;
            ASSERT_EQ(DVSData_Lookup(list.get(), props[0].name.c_str(), &entry), HYP_OK) << length;
        }
    }
}

TEST(DataDeserialize, ReturnsNoMemoryWithoutALeak) {
    Props props;
    for (int i = 0; i < 40; ++i)
        props.push_back({"name" + std::to_string(i), "v"});
    const Buffer buffer = SerializedOf(props);
    std::uint64_t refused = 0;
    for (std::uint64_t n = 1; n <= 42; ++n) {
        const FailingHeap failing(n, FailingHeap::Only);
        const auto [status, list] = Read(buffer);
        if (n == 35) { // The name index is optional: the load succeeds without it.
            EXPECT_EQ(status, HYP_OK);
            EXPECT_EQ(ContentOf(list), props);
            continue;
        }
        EXPECT_EQ(status, HYP_NO_MEMORY) << n;
        EXPECT_EQ(list, nullptr);
        EXPECT_EQ(Heap().Live(), 0u);
        ++refused;
    }
    EXPECT_EQ(refused, 41u);
}

// ---- Lists in one block ----

TEST(ListInOneBlock, HoldsTheSameContentInOneAllocation) {
    const Props props{{"a", "", 0x10}, {"dropped", "1", 1}, {"b", "12345"}, {"c", std::string(300, 'v')}};
    const Buffer buffer = SerializedOf(props);
    ResetHeap();
    const auto [status, list] = ReadShared(buffer);
    ASSERT_EQ(status, HYP_OK);
    EXPECT_EQ(Heap().allocs, 1u);
    ExpectSound(list.get());
    EXPECT_EQ(ContentOf(list), (Props{props[0], props[2], props[3]}));
    EXPECT_EQ(Serialized(list.get()), Serialized(Read(buffer).second.get()));
}

TEST(ListInOneBlock, AllocatesAddedEntriesSeparatelyAndFreesThem) {
    const Props props{{"a", "1"}, {"b", "2"}, {"c", "3"}};
    const Buffer buffer = SerializedOf(props);
    ResetHeap();
    auto [status, list] = ReadShared(buffer);
    ASSERT_EQ(status, HYP_OK);
    Append(list.get(), {"d", "4"});
    ASSERT_EQ(DVSData_Update(list.get(), "a", "longer", 6, 0), HYP_OK);
    EXPECT_EQ(Heap().allocs, 3u);
    ASSERT_EQ(DVSData_Remove(list.get(), "b"), HYP_OK);
    EXPECT_EQ(Heap().frees, 0u); // it had no block of its own
    ASSERT_EQ(DVSData_Remove(list.get(), "d"), HYP_OK);
    EXPECT_EQ(Heap().frees, 1u);
    EXPECT_EQ(ContentOf(list), (Props{{"c", "3"}, {"a", "longer"}}));
    list.reset();
    EXPECT_EQ(Heap().Live(), 0u);
}

TEST(ListInOneBlock, PrintsTheSameMessagesAsOtherLists) {
    const Buffer buffer = SerializedOf(kTwo);
    for (const int level : {1, 2, 3}) {
        Messages messages(level);
        (void)Read(buffer);
        const Texts expected = messages.Take();
        (void)ReadShared(buffer);
        EXPECT_EQ(messages.Take(), expected) << level;
    }
}

TEST(ListInOneBlock, ReturnsNoMemory) {
    const Buffer buffer = SerializedOf(kTwo);
    const FailingHeap failing(1);
    const auto [status, list] = ReadShared(buffer);
    EXPECT_EQ(status, HYP_NO_MEMORY);
    EXPECT_EQ(list, nullptr);
}

TEST(ListInOneBlock, UpdateAcceptsTheValueOfTheEntryItReplaces) {
    const auto [status, list] = ReadShared(SerializedOf({{"a", "0123456789"}}));
    ASSERT_EQ(status, HYP_OK);
    DVSDataEntry *entry = nullptr;
    ASSERT_EQ(DVSData_Lookup(list.get(), "a", &entry), HYP_OK);
    ASSERT_EQ(DVSData_Update(list.get(), entry->name, entry->data + 4, 6, 0), HYP_OK);
    EXPECT_EQ(ContentOf(list), (Props{{"a", "456789"}}));
}

// ---- Single values ----

HYP_ReturnStatus GetValue(const Buffer &buffer, const char *name, std::string *value) {
    const ExactBlock block(buffer);
    const ExactBlock room(std::span(reinterpret_cast<const std::uint8_t *>(value->data()), value->size()));
    const HYP_ReturnStatus status = DVSData_DeserializeGetPropVal(
        block.data(), block.size(), name, const_cast<std::uint8_t *>(room.data()), room.size());
    value->assign(reinterpret_cast<const char *>(room.data()), room.size());
    return status;
}

TEST(DataGetPropVal, CopiesTheFirstMatchOnly) {
    const Buffer buffer = SerializedOf({{"a", "1234", 0}, {"twin", "first", 1}, {"twin", "second", 0x20}});
    std::string value = "........";
    EXPECT_EQ(GetValue(buffer, "twin", &value), HYP_OK);
    EXPECT_EQ(value, "first...");
    value = "....";
    EXPECT_EQ(GetValue(buffer, "a", &value), HYP_OK); // The type is ignored; the room is exact.
    EXPECT_EQ(value, "1234");
}

TEST(DataGetPropVal, RejectsNullArgumentsWithoutAMessage) {
    const Buffer buffer = SerializedOf(kTwo);
    const auto size = static_cast<std::uint32_t>(buffer.size());
    char value[8];
    const Messages messages(3);
    EXPECT_EQ(DVSData_DeserializeGetPropVal(nullptr, size, "second", value, 8), HYP_BAD_PARAM);
    EXPECT_EQ(DVSData_DeserializeGetPropVal(buffer.data(), size, nullptr, value, 8), HYP_BAD_PARAM);
    EXPECT_EQ(DVSData_DeserializeGetPropVal(buffer.data(), size, "second", nullptr, 8), HYP_BAD_PARAM);
    EXPECT_TRUE(messages.All().empty());
}

TEST(DataGetPropVal, ReturnsNotFoundForAnEmptyBufferOrUnknownName) {
    std::string value(8, '.');
    EXPECT_EQ(GetValue(SerializedOf({}), "a", &value), HYP_NOT_FOUND);
    EXPECT_EQ(GetValue(SerializedOf(kTwo), "third", &value), HYP_NOT_FOUND);
    EXPECT_EQ(GetValue(SerializedOf(kTwo), "com.orbeno.common.firs", &value), HYP_NOT_FOUND);
    EXPECT_EQ(GetValue(SerializedOf(kTwo), "", &value), HYP_NOT_FOUND);
    EXPECT_EQ(value, "........");
}

TEST(DataGetPropVal, RejectsTooLittleRoomWithAMessage) {
    const Messages messages(0);
    std::string value(3, '.');
    EXPECT_EQ(GetValue(SerializedOf(kTwo), "second", &value), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(
        messages.All(),
        Texts{"propVal buffer of size 3 not sufficient to store value of size 4 for property second\n"});
    EXPECT_EQ(value, "...");
}

TEST(DataGetPropVal, ChecksTheChecksumBeforeTheVersion) {
    Buffer buffer = SerializedOf(kTwo);
    buffer[8] = 7;
    std::string value(8, '.');
    const Messages messages(0);
    EXPECT_EQ(GetValue(buffer, "second", &value), HYP_BAD_PARAM);
    EXPECT_EQ(messages.All(), Texts{"Unsupported DVS data version 7\n"});
    buffer[100] ^= 1;
    EXPECT_EQ(GetValue(buffer, "second", &value), HYP_BAD_CHECKSUM);
}

TEST(DataGetPropVal, ComparesAtMost128Characters) {
    Buffer buffer = SerializedOf({{std::string(127, 'n'), "1234"}});
    std::string value(4, '.');
    EXPECT_EQ(GetValue(buffer, std::string(128, 'n').c_str(), &value), HYP_NOT_FOUND);
    buffer[16 + 127] = 'n'; // An unterminated name field.
    Mend(&buffer);
    EXPECT_EQ(GetValue(buffer, std::string(128, 'n').c_str(), &value), HYP_OK);
    EXPECT_EQ(GetValue(buffer, std::string(200, 'n').c_str(), &value), HYP_OK);
    EXPECT_EQ(GetValue(buffer, std::string(127, 'n').c_str(), &value), HYP_NOT_FOUND);
}

TEST(DataGetPropVal, RejectsAValueThatLeavesTheBuffer) {
    Buffer buffer = SerializedOf({{"a", "1234"}});
    std::string value(100, '.');
    for (const std::uint32_t len : {13u, 100u, 0xfffffff0u, 0xffffffffu}) {
        SetU32(&buffer, 12 + 136, len);
        Mend(&buffer);
        EXPECT_EQ(GetValue(buffer, "a", &value), HYP_BAD_PARAM) << len;
    }
    SetU32(&buffer, 12 + 136, 12); // Into the marker, which is still inside the buffer.
    Mend(&buffer);
    EXPECT_EQ(GetValue(buffer, "a", &value), HYP_OK);
}

TEST(DataGetPropVal, RejectsAnEntryShorterThanItsFixedPart) {
    Buffer buffer = SerializedOf({});
    buffer.resize(12 + 139, 0);
    SetU32(&buffer, 0, 12 + 139);
    SetU32(&buffer, 12, 100);
    Mend(&buffer);
    std::string value(8, '.');
    EXPECT_EQ(GetValue(buffer, "", &value), HYP_BAD_PARAM);
}

TEST(DataGetPropVal, AllocatesNothing) {
    const Buffer buffer = SerializedOf(kTwo);
    std::string value(8, '.');
    ResetHeap();
    EXPECT_EQ(GetValue(buffer, "second", &value), HYP_OK);
    EXPECT_EQ(Heap().allocs, 0u);
}

} // namespace
} // namespace dvs::test
