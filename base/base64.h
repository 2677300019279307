/* SPDX-License-Identifier: Apache-2.0 */
#ifndef BASE_BASE64_H
#define BASE_BASE64_H

// Base64 (RFC 4648) in canonical form only: padded, without line breaks, unused bits zero.

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace dvs::base {

namespace base64 {

inline constexpr char kDigits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

/// Indexed by character; 0xff if it is no base64 digit.
inline constexpr std::array<std::uint8_t, 256> kValues = [] {
    std::array<std::uint8_t, 256> values{};
    values.fill(0xff);
    for (std::uint8_t i = 0; i < 64; i++)
        values[static_cast<unsigned char>(kDigits[i])] = i;
    return values;
}();

} // namespace base64

/// The size of the text for `size` bytes.
[[nodiscard]] constexpr std::size_t Base64Size(std::size_t size) {
    return (size + 2) / 3 * 4;
}

/// The maximum number of bytes that a text of `size` characters decodes to.
[[nodiscard]] constexpr std::size_t DecodedBase64Size(std::size_t size) {
    return size / 4 * 3;
}

/// Writes Base64Size(size) characters. Returns their end.
inline char *EncodeBase64(char *out, const void *data, std::size_t size) {
    const auto *at = static_cast<const std::uint8_t *>(data);
    const auto digit = [](std::uint32_t value) { return base64::kDigits[value & 63]; };
    for (; size >= 3; size -= 3, at += 3) {
        const std::uint32_t group = std::uint32_t{at[0]} << 16 | std::uint32_t{at[1]} << 8 | at[2];
        *out++ = digit(group >> 18);
        *out++ = digit(group >> 12);
        *out++ = digit(group >> 6);
        *out++ = digit(group);
    }
    if (size > 0) {
        const std::uint32_t group = std::uint32_t{at[0]} << 16 | (size > 1 ? std::uint32_t{at[1]} << 8 : 0);
        *out++ = digit(group >> 18);
        *out++ = digit(group >> 12);
        *out++ = size > 1 ? digit(group >> 6) : '=';
        *out++ = '=';
    }
    return out;
}

/// Decodes into `out`, which has room for DecodedBase64Size(text.size()) bytes; *size receives the number of
/// bytes written. False if the text is not canonical base64.
[[nodiscard]] inline bool DecodeBase64(std::string_view text, void *out, std::size_t *size) {
    if (text.size() % 4 != 0) return false;
    auto *at = static_cast<std::uint8_t *>(out);
    const auto value = [text](std::size_t i) {
        return std::uint32_t{base64::kValues[static_cast<unsigned char>(text[i])]};
    };
    std::size_t padding = 0;
    while (padding < 2 && padding < text.size() && text[text.size() - 1 - padding] == '=')
        padding++;
    const std::size_t whole = padding > 0 ? text.size() - 4 : text.size();
    for (std::size_t i = 0; i < whole; i += 4) {
        const std::uint32_t a = value(i), b = value(i + 1), c = value(i + 2), d = value(i + 3);
        if ((a | b | c | d) > 63) return false;
        const std::uint32_t group = a << 18 | b << 12 | c << 6 | d;
        *at++ = static_cast<std::uint8_t>(group >> 16);
        *at++ = static_cast<std::uint8_t>(group >> 8);
        *at++ = static_cast<std::uint8_t>(group);
    }
    if (padding > 0) {
        const std::uint32_t a = value(whole), b = value(whole + 1);
        const std::uint32_t c = padding == 1 ? value(whole + 2) : 0;
        if ((a | b | c) > 63) return false;
        if (padding == 1 ? (c & 3) != 0 : (b & 15) != 0) return false; // unused bits must be zero
        *at++ = static_cast<std::uint8_t>(a << 2 | b >> 4);
        if (padding == 1) *at++ = static_cast<std::uint8_t>((b & 15) << 4 | c >> 2);
    }
    *size = static_cast<std::size_t>(at - static_cast<std::uint8_t *>(out));
    return true;
}

} // namespace dvs::base

#endif
