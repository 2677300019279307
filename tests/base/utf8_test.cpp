/* SPDX-License-Identifier: Apache-2.0 */
// Valid UTF-8: each form at its limits, and each kind of invalid sequence.

#include "base/utf8.h"

#include <string_view>

#include <gtest/gtest.h>

using dvs::base::Utf8Length;

namespace {

std::size_t LengthOf(std::string_view text) {
    return Utf8Length(text.data(), text.data() + text.size());
}

TEST(Utf8, LengthOfEachFormAtItsLimits) {
    constexpr std::string_view kNul("\0", 1);
    EXPECT_EQ(LengthOf(kNul), 1U);
    for (const std::string_view one : {"a", "\x7f"})
        EXPECT_EQ(LengthOf(one), 1U);
    for (const std::string_view two : {"\xc2\x80", "\xdf\xbf"})
        EXPECT_EQ(LengthOf(two), 2U);
    for (const std::string_view three : {"\xe0\xa0\x80", "\xed\x9f\xbf", "\xee\x80\x80", "\xef\xbf\xbf"})
        EXPECT_EQ(LengthOf(three), 3U);
    for (const std::string_view four : {"\xf0\x90\x80\x80", "\xf4\x8f\xbf\xbf"})
        EXPECT_EQ(LengthOf(four), 4U);
    EXPECT_EQ(LengthOf("\xc3\xa9 and more"), 2U);
}

TEST(Utf8, BrokenSequencesHaveNoLength) {
    for (const std::string_view broken : {
             "", // nothing
             "\x80",
             "\xbf", // a lone continuation byte
             "\xc0\x80",
             "\xc1\xbf", // overlong, two bytes
             "\xe0\x9f\xbf",
             "\xf0\x8f\xbf\xbf", // overlong, three and four
             "\xed\xa0\x80",
             "\xed\xbf\xbf", // surrogates
             "\xf4\x90\x80\x80",
             "\xf5\x80\x80\x80", // above U+10FFFF
             "\xff",             // never a lead byte
             "\xc3",
             "\xe1\x80",
             "\xf1\x80\x80", // truncated
             "\xc3(",
             "\xe1\x80(",
             "\xe1(\x80",
             "\xf1(", // another byte instead of a continuation
         })
        EXPECT_EQ(LengthOf(broken), 0U) << testing::PrintToString(std::string(broken));
}

} // namespace
