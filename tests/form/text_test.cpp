/* SPDX-License-Identifier: Apache-2.0 */
// Text for a terminal, and name patterns.

#include "form/text.h"

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace dvs::form;
using namespace std::string_literals;

struct EscapeCase {
    std::string given, shown;
};

TEST(Escape, ReplacesTerminalControls) {
    const EscapeCase cases[] = {
        {"plain text", "plain text"},
        {"Zürich 東京", "Zürich 東京"},
        {"\x1b[31mred", "\\x1b[31mred"},
        {"a\nb\tc\rd", "a\\nb\\tc\\rd"},
        {"back\\slash", "back\\\\slash"},
        {"nul\0inside"s, "nul\\x00inside"},
        {"del\x7f", "del\\x7f"},
        {"\xc2\x9b"
         "31m",
         "\\u{9b}31m"}, // CSI of the second control set
        {"\xe2\x80\xae"
         "gpj.exe",
         "\\u{202e}gpj.exe"},               // right-to-left override
        {"\xe2\x80\x8b", "\\u{200b}"},      // zero width space
        {"\xf3\xa0\x81\x81", "\\u{e0041}"}, // tag character
        {"\xff\xfe", "\\xff\\xfe"},
        {"\xc0\xaf", "\\xc0\\xaf"},          // overlong
        {"\xed\xa0\x80", "\\xed\\xa0\\x80"}, // surrogate
        {"cut \xe2\x82", "cut \\xe2\\x82"},
        {"\xf4\x90\x80\x80", "\\xf4\\x90\\x80\\x80"}, // above U+10FFFF
    };
    for (const EscapeCase &c : cases)
        EXPECT_EQ(Escape(c.given), c.shown);
}

TEST(Escape, NeverLeavesAControlByte) {
    std::string all;
    for (int i = 0; i < 256; ++i)
        for (int j = 0; j < 256; ++j)
            all += {static_cast<char>(i), static_cast<char>(j)};
    const std::string shown = Escape(all);
    EXPECT_TRUE(IsUtf8(shown));
    for (const char c : shown)
        EXPECT_FALSE((static_cast<unsigned char>(c) < 0x20) || c == 0x7f);
}

TEST(Quote, EscapesItsOwnQuotes) {
    EXPECT_EQ(Quote("say \"hi\""), "\"say \\\"hi\\\"\"");
}

TEST(ShowName, QuotesOnlyWhenNeeded) {
    EXPECT_EQ(ShowName("web-1"), "web-1");
    EXPECT_EQ(ShowName("50 2e 1a"), "50 2e 1a");
    EXPECT_EQ(ShowName(""), "\"\"");
    EXPECT_EQ(ShowName("end "), "\"end \"");
}

TEST(ValidUtf8, KeepsTextAndReplacesTheRest) {
    EXPECT_EQ(ValidUtf8("ok \xc3\xa4 \xff."), "ok \xc3\xa4 \xef\xbf\xbd.");
}

TEST(Width, CountsColumnsNotBytes) {
    EXPECT_EQ(Width("abc"), 3u);
    EXPECT_EQ(Width("Zürich"), 6u);
    EXPECT_EQ(Width("東京"), 4u);
    EXPECT_EQ(Width("e\xcc\x81"), 1u);
}

TEST(Hex, TruncatesWithAnEllipsis) {
    const std::uint8_t bytes[] = {0, 0xab, 0xff};
    EXPECT_EQ(Hex(bytes), "00 ab ff");
    EXPECT_EQ(Hex(bytes, 2), "00 ab …");
    EXPECT_EQ(Hex({}), "");
}

struct GlobCase {
    const char *pattern, *text;
    bool matches;
};

TEST(Glob, MatchesWholeNames) {
    const GlobCase cases[] = {
        {"", "", true},
        {"", "a", false},
        {"*", "", true},
        {"*.mtu", "com.orbeno.common.portset.mtu", true},
        {"*.mtu", "com.orbeno.mtu.x", false},
        {"com.*.port.*", "com.orbeno.common.port.alias", true},
        {"a?c", "abc", true},
        {"a?c", "ac", false},
        {"a**c", "abbc", true},
        {"[a-c]x", "bx", true},
        {"[a-c]x", "dx", false},
        {"[!a-c]x", "dx", true},
        {"[]]", "]", true},
        {"[a-]", "-", true},
        {"[ab", "[ab", true},
        {"\\*", "*", true},
        {"\\*", "x", false},
        {"a\\", "a\\", true},
        {"\xff*", "\xff\xfe", true},
    };
    for (const GlobCase &c : cases)
        EXPECT_EQ(GlobMatch(c.pattern, c.text), c.matches) << c.pattern << " on " << c.text;
}

TEST(Glob, ManyStarsAreFast) {
    // An exponential matcher, which tries every split for every star, would not finish.
    std::string pattern;
    for (int i = 0; i < 60; ++i)
        pattern += "a*";
    EXPECT_FALSE(GlobMatch(pattern + "b", std::string(2000, 'a')));
}

} // namespace
