/* SPDX-License-Identifier: Apache-2.0 */
// Tests every message of the property lists, with its level. deserialize_test.cpp covers the errors of
// damaged buffers, serialize_test.cpp those of inconsistent lists.

#include <gtest/gtest.h>

#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

using Texts = std::vector<std::string>;

/// Returns what `work` prints at each level from -1 to 3.
template <typename Work> std::vector<Texts> AtEveryLevel(Work work) {
    std::vector<Texts> result;
    for (std::int32_t level = -1; level <= 3; ++level) {
        Messages messages(level);
        work(&messages);
        for (const int at : messages.Levels())
            EXPECT_LE(at, level);
        result.push_back(messages.All());
    }
    return result;
}

constexpr std::size_t kSilent = 0, kErrors = 1, kTraces = 2, kDetails = 3, kEntries = 4;

TEST(DataMessages, AreOffByDefault) {
    EXPECT_EQ(dvsdata_debug, -1);
}

TEST(DataMessages, GoToStandardOutput) {
    dvsdata_debug = 1;
    testing::internal::CaptureStdout();
    NewList();
    EXPECT_EQ(testing::internal::GetCapturedStdout(),
              "Allocing new handle\nDVSData handle allocated, serialSize = 16\n");
    dvsdata_debug = -1;
}

TEST(DataMessages, OfAlloc) {
    const auto texts = AtEveryLevel([](Messages *) { NewList(); });
    EXPECT_EQ(texts[kErrors], Texts{});
    EXPECT_EQ(texts[kTraces],
              (Texts{"Allocing new handle\n", "DVSData handle allocated, serialSize = 16\n"}));
}

TEST(DataMessages, OfAppend) {
    const auto texts = AtEveryLevel([](Messages *messages) {
        const ListPtr list = NewList();
        (void)messages->Take();
        Append(list.get(), {"name", "1234"});
    });
    EXPECT_EQ(texts[kTraces], Texts{});
    EXPECT_EQ(texts[kDetails], (Texts{"added data name, len 4, start serialSize = 16\n",
                                      "added data name, serialSize = 164\n"}));
}

TEST(DataMessages, OfOverflowingAppendsPrintFromLevelTwo) {
    const ListPtr list = NewList();
    const auto texts = AtEveryLevel([&](Messages *) {
        EXPECT_EQ(DVSData_Append(list.get(), "n", "", 0xfffffff0, 0), HYP_BAD_PARAM);
        EXPECT_EQ(DVSData_Append(list.get(), "n", "", 0xffffff66, 0), HYP_BAD_PARAM);
    });
    EXPECT_EQ(texts[kTraces], Texts{});
    EXPECT_EQ(texts[kDetails],
              (Texts{"Datalen 4294967280, serial size 128 for prop n will cause unsigned operation warp\n",
                     "Serial size 4294967288 for prop n will cause unsigned operation warp\n"}));
}

TEST(DataMessages, OfUpdate) {
    const ListPtr list = ListOf({{"a", "1", 0x48}, {"b", "2"}});
    Messages messages(2);
    DVSData_Update(list.get(), "b", "3", 1, 0);
    EXPECT_EQ(messages.Take(), Texts{"updated data b, datalen = 1, serialSize = 304\n"});
    DVSData_Update(list.get(), "a", "12", 2, 0);
    EXPECT_EQ(messages.Take(),
              (Texts{"Remove entry a, datalen = 1, flag = 0x48 serialSize = 160\n",
                     "added data a, len 2, start serialSize = 160\n", "added data a, serialSize = 308\n"}));
    dvsdata_debug = 1;
    DVSData_Update(list.get(), "a", "1", 1, 0);
    DVSData_Update(list.get(), "a", "1", 1, 0);
    EXPECT_EQ(messages.Take(), Texts{});
}

TEST(DataMessages, OfRemoveNameTheNewTotal) {
    const ListPtr list = ListOf({{"a", "1", 0x48}, {"b", "2"}});
    Messages messages(2);
    DVSData_Remove(list.get(), "a");
    DVSData_Remove(list.get(), "a");
    EXPECT_EQ(messages.Take(), Texts{"Remove entry a, datalen = 1, flag = 0x48 serialSize = 160\n"});
    dvsdata_debug = 1;
    DVSData_Remove(list.get(), "b");
    EXPECT_EQ(messages.Take(), Texts{});
}

void SerializeAndFree(DVSData *list, const char *exName, std::uint32_t mask, int which) {
    void *buf = nullptr;
    std::uint32_t len = 0;
    if (which == 0) DVSData_SerializeExNamedProp(list, &buf, &len, 9, exName);
    if (which == 1) DVSData_SerializeExTypeProp(list, &buf, &len, mask);
    if (which == 2) DVSData_SerializeEntry(list, exName, &buf, &len);
    DVSData_FreeAssocData(list, buf);
}

TEST(DataMessages, OfSerialize) {
    const ListPtr list = ListOf({{"a", "12"}});
    const auto texts = AtEveryLevel([&](Messages *) { SerializeAndFree(list.get(), nullptr, 0, 0); });
    EXPECT_EQ(texts[kTraces], Texts{});
    EXPECT_EQ(texts[kDetails],
              (Texts{"allocating buffer size 164\n", "serializing a: 2/148 data/serial bytes\n"}));
}

TEST(DataMessages, OfTheNameFilterPrintInBothPasses) {
    const ListPtr list = ListOf({{"a", "12"}, {"xb", ""}});
    const auto texts = AtEveryLevel([&](Messages *) { SerializeAndFree(list.get(), "x", 0, 0); });
    const Texts filter{"Entry a, length 2 exName x\n", "Entry xb, length 0 exName x\n"};
    EXPECT_EQ(texts[kErrors], Texts{});
    EXPECT_EQ(texts[kTraces], (Texts{filter[0], filter[1], filter[0], filter[1]}));
    EXPECT_EQ(texts[kDetails], (Texts{filter[0], filter[1], "allocating buffer size 164\n", filter[0],
                                      "serializing a: 2/148 data/serial bytes\n", filter[1]}));
}

TEST(DataMessages, OfTheTypeFilterPrintForMaskZeroToo) {
    const ListPtr list = ListOf({{"a", "12", 0x28}});
    const auto texts = AtEveryLevel([&](Messages *) { SerializeAndFree(list.get(), nullptr, 0, 1); });
    EXPECT_EQ(texts[kErrors], Texts{});
    EXPECT_EQ(texts[kTraces], Texts(2, "Property type entry a, length 2 flag 28/0\n"));
}

TEST(DataMessages, OfSerializeEntry) {
    const ListPtr list = ListOf({{"a", "12"}});
    const auto texts = AtEveryLevel([&](Messages *) { SerializeAndFree(list.get(), "a", 0, 2); });
    EXPECT_EQ(texts[kTraces], Texts{});
    EXPECT_EQ(texts[kDetails], Texts{"serializing a: 2/148 data/serial bytes\n"});
}

TEST(DataMessages, OfDeserialize) {
    const Buffer buffer = SerializedOf({{"a", "12", 0x10}, {"b", "", 1}});
    const auto texts = AtEveryLevel([&](Messages *) { Read(buffer); });
    EXPECT_EQ(texts[kSilent], Texts{});
    EXPECT_EQ(texts[kErrors], Texts{});
    EXPECT_EQ(texts[kTraces],
              (Texts{"Allocing new handle\n", "DVSData handle allocated, serialSize = 16\n"}));
    EXPECT_EQ(
        texts[kDetails],
        (Texts{"Deserialize data, length = 308\n", "Allocing new handle\n",
               "DVSData handle allocated, serialSize = 16\n", "added data a, len 2, start serialSize = 16\n",
               "added data a, serialSize = 164\n", "Deserialize data done, serializeSize = 164\n"}));
    EXPECT_EQ(texts[kEntries],
              (Texts{"Deserialize data, length = 308\n", "Allocing new handle\n",
                     "DVSData handle allocated, serialSize = 16\n",
                     "deserializing a: 2/148 data/serial bytes 16 flag\n",
                     "added data a, len 2, start serialSize = 16\n", "added data a, serialSize = 164\n",
                     "deserializing b: 0/144 data/serial bytes 1 flag\n",
                     "Deserialize data done, serializeSize = 164\n"}));
}

TEST(DataMessages, OfGetPropVal) {
    const Buffer buffer = SerializedOf({{"a", "12", 0x10}, {"b", "", 1}});
    char value[4];
    const auto texts = AtEveryLevel([&](Messages *) {
        DVSData_DeserializeGetPropVal(buffer.data(), static_cast<std::uint32_t>(buffer.size()), "b", value,
                                      4);
    });
    EXPECT_EQ(texts[kTraces], Texts{});
    EXPECT_EQ(texts[kDetails], Texts{"Deserialize data, length = 308\n"});
    EXPECT_EQ(texts[kEntries],
              (Texts{"Deserialize data, length = 308\n", "deserializing a: 2/148 data/serial bytes 16 flag\n",
                     "deserializing b: 0/144 data/serial bytes 1 flag\n"}));
}

} // namespace
} // namespace dvs::test
