/* SPDX-License-Identifier: Apache-2.0 */
// Nested buffers written into a block that grows: bytes, statuses and messages are those of lists.

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

/// What the image hands over.
Buffer Finished(GrowingImage *image) {
    void *buf = nullptr;
    std::uint32_t len = 0;
    image->HandOver(&buf, &len);
    const auto *const bytes = static_cast<const std::uint8_t *>(buf);
    Buffer buffer(bytes, bytes + len);
    std::free(buf);
    return buffer;
}

constexpr std::uint32_t kVersion = 9;
using Adding = GrowingImage::Adding;

/// One entry: a value, or a nested list.
struct Step {
    std::string name;
    Adding adding = Adding::kAppend;
    std::uint32_t type = 0x10;
    std::string value;
    std::vector<Step> nested;
    bool isNested = false;
    bool isDropped = false;
};
using Steps = std::vector<Step>;

ListPtr ListOfSteps(const Steps &steps);

void AddTo(DVSData *list, const Step &step) {
    void *buf = nullptr;
    const void *data = step.value.data();
    auto size = static_cast<std::uint32_t>(step.value.size());
    if (step.isNested) {
        const ListPtr inner = ListOfSteps(step.nested);
        if (step.isDropped) return;
        ASSERT_EQ(DVSData_Serialize(inner.get(), &buf, &size, kVersion), HYP_OK);
        data = buf;
    }
    const auto add = step.adding == Adding::kAppend ? DVSData_Append : DVSData_Update;
    EXPECT_EQ(add(list, step.name.c_str(), data, size, step.type), HYP_OK);
    CountingFree(buf);
}

ListPtr ListOfSteps(const Steps &steps) {
    ListPtr list = NewList();
    for (const Step &step : steps)
        AddTo(list.get(), step);
    return list;
}

Buffer BytesOfLists(const Steps &steps) {
    const ListPtr list = ListOfSteps(steps);
    void *buf = nullptr;
    std::uint32_t len = 0;
    EXPECT_EQ(DVSData_Serialize(list.get(), &buf, &len, kVersion), HYP_OK);
    const auto *const bytes = static_cast<const std::uint8_t *>(buf);
    Buffer buffer(bytes, bytes + len);
    CountingFree(buf);
    return buffer;
}

void AddTo(GrowingImage *image, const Step &step) {
    if (!step.isNested) {
        EXPECT_EQ(step.adding == Adding::kAppend ? image->Append(step.name, BytesOf(step.value), step.type)
                                                 : image->Update(step.name, BytesOf(step.value), step.type),
                  HYP_OK);
        return;
    }
    ASSERT_EQ(image->BeginNested(step.name, step.type), HYP_OK);
    for (const Step &inner : step.nested)
        AddTo(image, inner);
    if (step.isDropped)
        image->DropNested();
    else
        EXPECT_EQ(image->EndNested(kVersion, step.adding), HYP_OK);
}

Buffer BytesOfImage(const Steps &steps) {
    GrowingImage image;
    EXPECT_EQ(image.BeginBuffer(), HYP_OK);
    for (const Step &step : steps)
        AddTo(&image, step);
    EXPECT_EQ(image.EndBuffer(kVersion), HYP_OK);
    return Finished(&image);
}

/// Compares the image with lists: the bytes, and the messages at every level.
void ExpectLikeLists(const Steps &steps) {
    for (const std::int32_t level : {-1, 0, 1, 2, 3}) {
        std::vector<std::string> expected;
        Buffer bytes;
        {
            const Messages messages(level);
            bytes = BytesOfLists(steps);
            expected = messages.All();
        }
        const Messages messages(level);
        ASSERT_EQ(BytesOfImage(steps), bytes) << level;
        ASSERT_EQ(messages.All(), expected) << level;
    }
}

Steps RandomSteps(std::mt19937 *random, std::size_t most, int depth) {
    Steps steps((*random)() % (most + 1));
    for (Step &step : steps) {
        const auto number = (*random)();
        step.name = number % 9 ? "com.orbeno.common." + std::to_string(number % 12)
                               : std::string(120 + number % 12, 'n');
        step.adding = (*random)() % 3 ? Adding::kUpdate : Adding::kAppend;
        const std::uint32_t types[] = {0x10, 0x80000020, 0};
        step.type = types[(*random)() % 3];
        step.value = std::string((*random)() % 4 * 4, static_cast<char>(number));
        step.isNested = depth > 0 && (*random)() % 2;
        step.isDropped = step.isNested && (*random)() % 5 == 0;
        if (step.isNested) {
            step.type = 0x10; // nested buffers have a type
            step.nested = RandomSteps(random, 3, depth - 1);
        }
    }
    return steps;
}

TEST(GrowingImage, IsLikeListsWhateverIsAddedAndUpdated) {
    std::mt19937 random(1);
    for (int round = 0; round < 300 && !testing::Test::HasFailure(); ++round) {
        SCOPED_TRACE(round);
        ExpectLikeLists(RandomSteps(&random, 14, 2));
    }
}

TEST(GrowingImage, IsLikeListsOfManyEntries) {
    std::mt19937 random(2);
    for (int round = 0; round < 20 && !testing::Test::HasFailure(); ++round) {
        SCOPED_TRACE(round);
        Steps steps;
        for (int i = 0; i < 400; ++i) {
            const auto name = "port " + std::to_string(random() % 300);
            Step step = {.name = name, .adding = Adding::kUpdate, .value = "", .nested = {}};
            step.isNested = round % 2 == 0;
            step.value = std::string(random() % 3, 'v');
            if (step.isNested)
                step.nested = {{.name = "key", .value = std::string(random() % 3 * 3, 'w'), .nested = {}}};
            steps.push_back(step);
        }
        steps.insert(steps.begin() + 100,
                     {.name = "port 7", .adding = Adding::kAppend, .value = "appended", .nested = {}});
        ExpectLikeLists(steps);
    }
}

// A name of 127 characters is also that of longer names, which are cut to it when they are stored.
TEST(GrowingImage, IsLikeListsForLongNames) {
    const std::string cut(127, 'x');
    for (const int others : {0, 100}) {
        Steps steps;
        for (int i = 0; i < others; ++i)
            steps.push_back({.name = std::to_string(i), .value = "v", .nested = {}});
        for (const std::string &name : {cut + "1", cut + "2", cut, cut + "1", cut})
            steps.push_back(
                {.name = name, .adding = Adding::kUpdate, .value = std::to_string(steps.size()), .nested = {}});
        steps.push_back({.name = cut, .adding = Adding::kUpdate, .value = "longer than before", .nested = {}});
        steps.push_back({.name = cut, .adding = Adding::kUpdate, .value = "", .nested = {}});
        ExpectLikeLists(steps);
    }
}

// What the block around has summed already changes.
TEST(GrowingImage, SumsAnUpdateBehindNestedBuffers) {
    const Step nested = {.name = "nested", .value = "", .nested = {{.name = "a", .value = "b", .nested = {}}},
                         .isNested = true};
    Steps steps = {{.name = "early", .value = "1234", .nested = {}}, nested};
    steps.push_back({.name = "early", .adding = Adding::kUpdate, .value = "5678", .nested = {}});
    steps.push_back(nested);
    steps.push_back({.name = "early", .adding = Adding::kUpdate, .value = "longer", .nested = {}});
    ExpectLikeLists(steps);
}

TEST(GrowingImage, ReportsAVersionBelowTheFormats) {
    const Messages messages(0);
    GrowingImage image;
    ASSERT_EQ(image.BeginBuffer(), HYP_OK);
    ASSERT_EQ(image.BeginNested("nested", 0x10), HYP_OK);
    EXPECT_EQ(image.EndNested(3, Adding::kAppend), HYP_OK);
    EXPECT_EQ(image.EndBuffer(4), HYP_OK);
    EXPECT_EQ(messages.All(), std::vector<std::string>{"DVS version 3 is smaller than 6.0.\n"});
}

TEST(GrowingImage, LargeOnesGrowWhetherExpectedOrNot) {
    const Props props(40, {"large", std::string(200'000, 'v'), 0x10});
    const Buffer expected = SerializedOf(props);
    for (const std::size_t announced : {std::size_t{0}, std::size_t{9'000'000}, SIZE_MAX}) {
        GrowingImage image;
        image.Expect(announced);
        ASSERT_EQ(image.BeginBuffer(), HYP_OK);
        for (const Prop &prop : props)
            ASSERT_EQ(image.Append(prop.name, BytesOf(prop.value), prop.type), HYP_OK);
        ASSERT_EQ(image.EndBuffer(kVersion), HYP_OK);
        EXPECT_EQ(Finished(&image), expected) << announced;
    }
}

TEST(GrowingImage, RefusesWhatDoesNotFitAndGoesOn) {
    GrowingImage image;
    ASSERT_EQ(image.BeginBuffer(), HYP_OK);
    ASSERT_EQ(image.BeginNested("nested", 0x10), HYP_OK);
    ASSERT_EQ(image.Append("a", BytesOf("value"), 0x10), HYP_OK);
    const std::uint8_t byte = 0;
    // Neither length is looked at: there is no such block.
    EXPECT_EQ(image.Append("huge", {&byte, GrowingImage::kMaxSize - 200}, 0x10), HYP_NO_MEMORY);
    EXPECT_EQ(image.Append("huge", {&byte, GrowingImage::kMaxSize - 1}, 0x10), HYP_BAD_PARAM);
    EXPECT_EQ(image.Update("huge", {&byte, std::size_t{UINT32_MAX} + 5}, 0x10), HYP_BAD_PARAM);
    ASSERT_EQ(image.EndNested(kVersion, Adding::kUpdate), HYP_OK);
    ASSERT_EQ(image.EndBuffer(kVersion), HYP_OK);
    const Step nested = {.name = "nested", .value = "",
                         .nested = {{.name = "a", .value = "value", .nested = {}}}, .isNested = true};
    EXPECT_EQ(Finished(&image), BytesOfLists({nested}));
}

} // namespace
} // namespace dvs::test
