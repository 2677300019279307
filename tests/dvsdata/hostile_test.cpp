/* SPDX-License-Identifier: Apache-2.0 */
// Thousands of damaged buffers, each in a block of exactly its size. Both deserializers and the view must
// stay inside the block, and the view must report a fault exactly when the deserializer rejects the buffer.

#include <gtest/gtest.h>

#include <string>

#include "dvsdata/buffer_view.h"
#include "dvsdata/list_internal.h"
#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

using data::BufferView;
using data::EntryView;
using data::FaultKind;

Props ViewOf(std::span<const std::uint8_t> bytes, data::Fault *fault) {
    BufferView view(bytes);
    EntryView entry;
    Props props;
    while (view.Next(&entry))
        props.push_back(
            {std::string(entry.Name()), std::string(entry.value.begin(), entry.value.end()), entry.propType});
    *fault = view.FirstFault();
    EXPECT_NE(view.Ok(), fault->kind != FaultKind::None);
    EXPECT_EQ(view.Ok(), view.AtEnd());
    return props;
}

/// Reads the buffer in every available way; all must agree.
void Probe(const Buffer &buffer, const std::string &what) {
    const ExactBlock block(buffer);
    const auto [status, list] = Read(buffer, 0xffffffff);
    data::Fault fault;
    Props seen = ViewOf(block.bytes(), &fault);
    EXPECT_EQ(fault.Status(), status) << what << ": " << fault.Text();
    EXPECT_LE(fault.offset, buffer.size()) << what;

    const auto [sharedStatus, shared] = ReadShared(buffer, 0xffffffff);
    EXPECT_EQ(sharedStatus, status) << what;
    if (status == HYP_OK) {
        EXPECT_EQ(ContentOf(shared), ContentOf(list)) << what;
    }

    data::InPlaceList inPlace;
    ASSERT_EQ(inPlace.Open(block.bytes(), 0xffffffff, {}, data::PartSums::Yes), status) << what;
    if (status == HYP_OK) {
        std::erase_if(seen, [](const Prop &prop) { return prop.type == 0; });
        EXPECT_EQ(ContentOf(list), seen) << what;
        Props inOrder;
        data::EntryRef entry;
        while (inPlace.Next(&entry))
            inOrder.push_back({std::string(entry.name), std::string(entry.value.begin(), entry.value.end()),
                               entry.propType});
        EXPECT_EQ(inOrder, seen) << what;
        ExpectSound(list.get());
    }
    char value[64];
    (void)DVSData_DeserializeGetPropVal(block.data(), block.size(), "third", value, sizeof value);
    (void)DVSData_DeserializeGetPropVal(block.data(), block.size(), "nothing of that name", value,
                                        sizeof value);
}

Buffer Written() {
    return SerializedOf(
        {{"first", "12345", 0x10}, {"second", std::string(200, 's'), 0x20}, {"third", "", 0x80000008}});
}

TEST(DamagedBuffer, IsRejectedWhenTruncatedAtAnyLength) {
    const Buffer written = Written();
    for (std::size_t size = 0; size < written.size(); ++size) {
        Buffer buffer(written.begin(), written.begin() + static_cast<std::ptrdiff_t>(size));
        EXPECT_EQ(Read(buffer).first, HYP_BAD_PARAM) << size;
        Probe(buffer, "cut to " + std::to_string(size));
        if (size < 16) continue;
        SetU32(&buffer, 0, static_cast<std::uint32_t>(size)); // Truncated, with a matching header length.
        Mend(&buffer);
        Probe(buffer, "cut and mended to " + std::to_string(size));
    }
}

TEST(DamagedBuffer, AllReadersAgreeOnEveryChangedByte) {
    const Buffer written = Written();
    for (std::size_t i = 0; i < written.size(); ++i)
        for (const unsigned change : {0x01u, 0x80u, 0xffu}) {
            Buffer buffer = written;
            buffer[i] = static_cast<std::uint8_t>(buffer[i] ^ change);
            Probe(buffer, "byte " + std::to_string(i));
            if (U32At(buffer, 0) > buffer.size()) continue;
            Mend(&buffer);
            Probe(buffer, "mended byte " + std::to_string(i));
        }
}

TEST(DamagedBuffer, AllReadersAgreeOnWrongSizesAndLengths) {
    const Buffer written = Written();
    std::vector<std::uint32_t> lies{0x7fffffff, 0x80000000, 0xfffffff0, 0xffffffff};
    for (std::uint32_t lie = 0; lie < written.size() + 20; ++lie)
        lies.push_back(lie);
    for (const std::size_t entry : {std::size_t{12}, std::size_t{160}, std::size_t{160 + 344}})
        for (const std::size_t field : {std::size_t{0}, std::size_t{136}})
            for (const std::uint32_t lie : lies) {
                Buffer buffer = written;
                SetU32(&buffer, entry + field, lie);
                Mend(&buffer);
                Probe(buffer, "lie " + std::to_string(lie) + " at " + std::to_string(entry + field));
            }
}

TEST(DamagedBuffer, AllReadersAgreeOnWrongHeaderLengths) {
    const Buffer written = Written();
    for (std::uint32_t length = 0; length <= written.size() + 1; ++length) {
        Buffer buffer = written;
        SetU32(&buffer, 0, length);
        Probe(buffer, "length " + std::to_string(length));
        Mend(&buffer);
        Probe(buffer, "mended length " + std::to_string(length));
    }
}

TEST(DamagedBuffer, RandomBytesAreRejected) {
    std::uint64_t state = 1;
    for (int round = 0; round < 2000; ++round) {
        Buffer buffer(static_cast<std::size_t>(round) % 400);
        for (auto &byte : buffer) {
            state = state * 6364136223846793005u + 1442695040888963407u;
            byte = static_cast<std::uint8_t>(state >> 56);
        }
        Probe(buffer, "noise " + std::to_string(round));
        if (buffer.size() < 16) continue;
        SetU32(&buffer, 0, static_cast<std::uint32_t>(buffer.size()));
        SetU32(&buffer, 8, 1);
        Mend(&buffer);
        Probe(buffer, "noise behind a good header " + std::to_string(round));
    }
}

} // namespace
} // namespace dvs::test
