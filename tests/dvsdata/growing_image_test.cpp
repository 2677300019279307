/* SPDX-License-Identifier: Apache-2.0 */
// Nested buffers written into a block that grows are byte for byte what lists give, whatever is appended and
// updated; and what cannot be done that way is given up for good.

#include "dvsdata/growing_image.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <random>
#include <string>

#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

using data::GrowingImage;

data::Bytes BytesOf(const std::string &value) {
    return {reinterpret_cast<const std::uint8_t *>(value.data()), value.size()};
}

std::string TextOf(const Buffer &buffer) {
    return {buffer.begin(), buffer.end()};
}

/// What the image hands over.
Buffer Finished(GrowingImage *image) {
    EXPECT_FALSE(image->GaveUp());
    void *buf = nullptr;
    std::uint32_t len = 0;
    image->HandOver(&buf, &len);
    const auto *const bytes = static_cast<const std::uint8_t *>(buf);
    Buffer buffer(bytes, bytes + len);
    std::free(buf);
    return buffer;
}

void WriteBuffer(GrowingImage *image, const Props &props) {
    image->BeginBuffer();
    for (const Prop &prop : props)
        image->Append(prop.name, BytesOf(prop.value), prop.type);
    image->EndBuffer();
}

Props RandomProps(std::mt19937 *random, std::size_t most) {
    Props props((*random)() % (most + 1));
    for (Prop &prop : props) {
        const auto name = (*random)();
        prop.name =
            name % 9 ? "com.orbeno.common." + std::to_string(name % 20) : std::string(name % 128, 'n');
        prop.value = std::string((*random)() % 40, static_cast<char>(name));
        prop.type = (*random)() % 4 ? 0x10 : 0x80000020;
    }
    return props;
}

TEST(GrowingImage, OneBufferIsTheListsBytes) {
    std::mt19937 random(1);
    for (int round = 0; round < 300; ++round) {
        const Props props = RandomProps(&random, 12);
        GrowingImage image;
        WriteBuffer(&image, props);
        ASSERT_EQ(Finished(&image), SerializedOf(props)) << round;
    }
}

TEST(GrowingImage, NestedBuffersAreTheListsBytes) {
    std::mt19937 random(2);
    for (int round = 0; round < 100; ++round) {
        Props state;
        GrowingImage image;
        image.BeginBuffer();
        for (auto sw = random() % 4; sw > 0; --sw) {
            Props members = RandomProps(&random, 3);
            image.BeginEntry("switch", 0x10);
            image.BeginBuffer();
            for (const Prop &member : members)
                image.Append(member.name, BytesOf(member.value), member.type);
            for (auto port = random() % 5; port > 0; --port) {
                const Props props = RandomProps(&random, 6);
                image.BeginEntry("port " + std::to_string(port), 0x10);
                WriteBuffer(&image, props);
                image.EndEntry();
                members.push_back({"port " + std::to_string(port), TextOf(SerializedOf(props)), 0x10});
            }
            image.EndBuffer();
            image.EndEntry();
            state.push_back({"switch", TextOf(SerializedOf(members)), 0x10});
        }
        image.EndBuffer();
        ASSERT_EQ(Finished(&image), SerializedOf(state)) << round;
    }
}

TEST(GrowingImage, UpdatesActLikeTheLists) {
    std::mt19937 random(3);
    for (int round = 0; round < 300; ++round) {
        const ListPtr list = NewList();
        GrowingImage image;
        image.BeginBuffer();
        for (int step = 0; step < 30; ++step) {
            const auto number = random() % 8;
            const std::string name = number ? "com.orbeno.common." + std::to_string(number) : "";
            const std::string value(random() % 3 * 4, static_cast<char>('a' + step % 26));
            const std::uint32_t type = random() % 3 ? 0x10 : 0; // 0 keeps a type, or not, as lists do
            ASSERT_EQ(DVSData_Update(list.get(), name.c_str(), value.data(),
                                     static_cast<std::uint32_t>(value.size()), type),
                      HYP_OK);
            image.Update(name, BytesOf(value), type);
        }
        image.EndBuffer();
        ASSERT_EQ(Finished(&image), Serialized(list.get())) << round;
    }
}

TEST(GrowingImage, LargeOnesGrowWhetherExpectedOrNot) {
    const Props props(40, {"large", std::string(200'000, 'v'), 0x10});
    const Buffer expected = SerializedOf(props);
    for (const std::size_t announced : {std::size_t{0}, std::size_t{9'000'000}, SIZE_MAX}) {
        GrowingImage image;
        image.Expect(announced);
        WriteBuffer(&image, props);
        EXPECT_EQ(Finished(&image), expected) << announced;
    }
}

// ---- Giving up ----

/// Takes all that may follow and stays given up.
void ExpectGivenUp(GrowingImage *image) {
    EXPECT_TRUE(image->GaveUp());
    image->Expect(1'000'000);
    image->Append("a", BytesOf("value"), 0x10);
    image->Update("a", BytesOf("value"), 0x10);
    image->BeginEntry("nested", 0x10);
    WriteBuffer(image, {{"a", "value"}});
    image->EndEntry();
    image->EndBuffer();
    EXPECT_TRUE(image->GaveUp());
}

TEST(GrowingImage, GivesUpWhenToldTo) {
    GrowingImage image;
    image.BeginBuffer();
    image.GiveUp();
    ExpectGivenUp(&image);
}

TEST(GrowingImage, GivesUpABufferOfManyUpdates) {
    GrowingImage image;
    image.BeginBuffer();
    for (std::uint32_t i = 0; i < GrowingImage::kMaxUpdates; ++i)
        image.Update("n" + std::to_string(i), BytesOf("value"), 0x10);
    image.Update("n0", BytesOf("other"), 0x10); // one that is there takes no more to find
    EXPECT_FALSE(image.GaveUp());
    image.Update("one more", BytesOf("value"), 0x10);
    ExpectGivenUp(&image);
}

TEST(GrowingImage, GivesUpWhatDoesNotFitWithoutLookingAtIt) {
    for (const std::size_t size : {GrowingImage::kMaxSize / 2, GrowingImage::kMaxSize + 1}) {
        GrowingImage image;
        image.BeginBuffer();
        const std::uint8_t byte = 0;
        image.Append("huge", {&byte, size}, 0x10);
        ExpectGivenUp(&image);
    }
}

} // namespace
} // namespace dvs::test
