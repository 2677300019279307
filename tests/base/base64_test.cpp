/* SPDX-License-Identifier: Apache-2.0 */
// Base64 in both directions: the vectors of RFC 4648, and every kind of invalid text.

#include "base/base64.h"

#include <optional>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

using namespace dvs::base;

namespace {

std::string Encode(std::string_view bytes) {
    std::string text(Base64Size(bytes.size()), '\0');
    EXPECT_EQ(EncodeBase64(text.data(), bytes.data(), bytes.size()), text.data() + text.size());
    return text;
}

std::optional<std::string> Decode(std::string_view text) {
    std::string bytes(DecodedBase64Size(text.size()), '\0');
    std::size_t size = 0;
    if (!DecodeBase64(text, bytes.data(), &size)) return std::nullopt;
    bytes.resize(size);
    return bytes;
}

TEST(Base64, KnownVectorsInBothDirections) {
    const struct {
        std::string_view bytes, text;
    } rows[] = {
        {"", ""},
        {"f", "Zg=="},
        {"fo", "Zm8="},
        {"foo", "Zm9v"},
        {"foob", "Zm9vYg=="},
        {"fooba", "Zm9vYmE="},
        {"foobar", "Zm9vYmFy"},
        {"\xff\xfe\xfd", "//79"},
        {"\xfb\xef\xbe", "++++"},
    };
    for (const auto &row : rows) {
        EXPECT_EQ(Encode(row.bytes), row.text);
        EXPECT_EQ(Decode(row.text), row.bytes);
    }
}

TEST(Base64, DecodesTheCanonicalFormOnly) {
    for (const std::string_view text : {
             "Z", "Zg", "Zm9", "Zg=",         // not padded
             "Zg===", "Z===", "====", "=",    // padded too much
             "Zh==", "Zm9=",                  // unused bits that are not zero
             "Zg==Zg==", "Z=g=",              // padding inside
             "Zm9-", "Zm9_", "Zm 9", "Zm9\n", // other alphabets, white space
         })
        EXPECT_EQ(Decode(text), std::nullopt) << text;
}

} // namespace
