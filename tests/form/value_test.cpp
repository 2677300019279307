/* SPDX-License-Identifier: Apache-2.0 */
// The display form of values, and bytes as digits and back.

#include "form/value.h"

#include <gtest/gtest.h>

#include <string>

#include "form/states.h"

namespace {

using namespace dvs::form;
using namespace dvs::form::test;
using namespace std::string_literals;

struct LookCase {
    std::string bytes;
    ValueForm form;
    std::string shown;
};

TEST(Value, IsShownByItsKind) {
    const LookCase cases[] = {
        {"production\0"s, ValueForm::Text, "\"production\""},
        {"Zürich\0"s, ValueForm::Text, "\"Zürich\""},
        {"two\nlines\0"s, ValueForm::Text, "\"two\\nlines\""},
        {"abc\0"s, ValueForm::Text, "\"abc\" (or 6513249)"},
        {"\x28\x23\0\0"s, ValueForm::Number, "9000"},
        {"\0\0\0\0"s, ValueForm::Number, "0"},
        {"\xff\xff\xff\xff"s, ValueForm::Number, "4294967295"},
        {"abcd", ValueForm::Number, "1684234849"},
        {"false", ValueForm::PaddedText, "\"false\" (5 bytes, no NUL)"},
        {"slot\0\0\0\0"s, ValueForm::PaddedText, "\"slot\" (8 bytes)"},
        {"ab\0\0\0"s, ValueForm::Raw, "61 62 00 00 00 (5 bytes)"},
        {"true\0f"s, ValueForm::Raw, "74 72 75 65 00 66 (6 bytes)"},
        {"\x1b[31m\0"s, ValueForm::Raw, "1b 5b 33 31 6d 00 (6 bytes)"},
        {"\xff\xfe text\0"s, ValueForm::Raw, "ff fe 20 74 65 78 74 00 (8 bytes)"},
        {"\1", ValueForm::Raw, "01 (1 byte)"},
        {"\0"s, ValueForm::Raw, "00 (1 byte)"},
        {"", ValueForm::Raw, "(empty)"},
    };
    for (const LookCase &c : cases) {
        EXPECT_EQ(LookAt(AsBytes(c.bytes)).form, c.form) << c.shown;
        EXPECT_EQ(ShowValue(AsBytes(c.bytes), false), c.shown);
    }
}

std::string Slots(std::uint32_t count, std::initializer_list<std::string> names, std::size_t width) {
    const Buffer number = Number(count);
    std::string bytes(number.begin(), number.end());
    for (std::string name : names) {
        name.resize(width, '\0');
        bytes += name;
    }
    return bytes;
}

TEST(Value, ShowsListsOfNames) {
    const std::string uplinks = Slots(2, {"uplink1", "uplink2"}, 81), keys = Slots(1, {"17"}, 48);
    EXPECT_EQ(ShowValue(AsBytes(uplinks), false), "[\"uplink1\", \"uplink2\"]");
    EXPECT_EQ(ShowValue(AsBytes(keys), false), "[\"17\"]");
    EXPECT_EQ(LookAt(AsBytes(Slots(3, {"uplink1", "uplink2"}, 81))).form, ValueForm::Raw); // wrong count
    EXPECT_EQ(LookAt(AsBytes(Slots(1, {"a\0b"s}, 48))).form, ValueForm::Raw); // bytes after the NUL
    EXPECT_EQ(LookAt(AsBytes(Slots(1, {std::string(48, 'x')}, 48))).form, ValueForm::Raw); // no NUL
    EXPECT_EQ(LookAt(AsBytes(Slots(1, {""}, 48))).form, ValueForm::Raw);
}

TEST(Value, TruncatesLongValuesByDefault) {
    const std::string bytes(100, '\x80');
    EXPECT_LT(ShowValue(AsBytes(bytes), false).size(), 100u);
    EXPECT_NE(ShowValue(AsBytes(bytes), false).find("(100 bytes)"), std::string::npos);
    EXPECT_EQ(ShowValue(AsBytes(bytes), true).size(), 299u + std::string(" (100 bytes)").size());
    const std::string text = std::string(119, 'a') + "ä" + std::string(500, 'b') + '\0';
    const std::string cut = ShowValue(AsBytes(text), false);
    EXPECT_TRUE(IsUtf8(cut)); // not truncated inside a character
    EXPECT_NE(cut.find("(622 bytes)"), std::string::npos);
}

TEST(Digits, HexRoundTrips) {
    std::string all;
    for (int i = 0; i < 256; ++i)
        all += static_cast<char>(i);
    const auto back = FromHexDigits(ToHexDigits(AsBytes(all)));
    ASSERT_TRUE(back);
    EXPECT_EQ(AsText(*back), all);
    EXPECT_EQ(AsText(*FromHexDigits("DE ad be EF")), "\xde\xad\xbe\xef");
    EXPECT_TRUE(FromHexDigits("")->empty());
    for (const char *bad : {"0", "0g", "00 ", " 00", "00  00", "0 0", "0x00"})
        EXPECT_FALSE(FromHexDigits(bad)) << bad;
}

TEST(Digits, Base64RoundTrips) {
    std::string bytes;
    for (int i = 0; i < 300; ++i) {
        const auto back = FromBase64(ToBase64(AsBytes(bytes)));
        ASSERT_TRUE(back) << i;
        ASSERT_EQ(AsText(*back), bytes);
        bytes += static_cast<char>(i * 37);
    }
    EXPECT_EQ(ToBase64(AsBytes("any carnal pleas")), "YW55IGNhcm5hbCBwbGVhcw==");
    for (const char *bad :
         {"YQ", "YQ=", "YR==", "YQ==YQ==", "=", "====", "Y===", "YWJ=", "YW J", "YW-_", "YQ==\n"})
        EXPECT_FALSE(FromBase64(bad)) << bad;
}

} // namespace
