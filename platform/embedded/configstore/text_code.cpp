/* SPDX-License-Identifier: Apache-2.0 */
// Text and binary values in their document form (text_code.h).

#include "platform/embedded/configstore/text_code.h"

#include <array>
#include <cstring>

namespace configstore {

namespace {

using Byte = unsigned char;

constexpr char kDigits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
constexpr uint8_t kNoDigit = 0xff;

constexpr std::array<uint8_t, 256> kDigitValues = [] {
    std::array<uint8_t, 256> values{};
    for (auto &value : values)
        value = kNoDigit;
    for (uint8_t i = 0; i < 64; i++)
        values[static_cast<Byte>(kDigits[i])] = i;
    return values;
}();

bool Follows(Byte byte) {
    return (byte & 0xc0) == 0x80;
}

/// U+10FE80 to U+10FEFF: f4 8f ba 80 to f4 8f bb bf.
bool IsEncodedByte(const Byte *at) {
    return at[0] == 0xf4 && at[1] == 0x8f && (at[2] & 0xfe) == 0xba;
}

} // namespace

std::size_t PlainSequence(const char *text, const char *end) {
    const auto *const at = reinterpret_cast<const Byte *>(text);
    const auto left = static_cast<std::size_t>(end - text);
    if (at[0] < 0x80) return 1;
    if (at[0] < 0xc2) return 0;
    if (at[0] < 0xe0) return left >= 2 && Follows(at[1]) ? 2 : 0;
    if (at[0] < 0xf0) {
        if (left < 3 || !Follows(at[1]) || !Follows(at[2])) return 0;
        const bool overlong = at[0] == 0xe0 && at[1] < 0xa0;
        const bool surrogate = at[0] == 0xed && at[1] >= 0xa0;
        return overlong || surrogate ? 0 : 3;
    }
    if (at[0] > 0xf4 || left < 4 || !Follows(at[1]) || !Follows(at[2]) || !Follows(at[3])) return 0;
    const bool overlong = at[0] == 0xf0 && at[1] < 0x90;
    const bool beyond = at[0] == 0xf4 && at[1] >= 0x90;
    return overlong || beyond || IsEncodedByte(at) ? 0 : 4;
}

char *PutEncodedByte(char *out, unsigned char byte) {
    out[0] = static_cast<char>(0xf4);
    out[1] = static_cast<char>(0x8f);
    out[2] = static_cast<char>(0xb8 | (byte >> 6));
    out[3] = static_cast<char>(0x80 | (byte & 0x3f));
    return out + kEncodedByte;
}

bool HasEncodedBytes(std::string_view text) {
    const char *at = text.data();
    const char *const end = at + text.size();
    while (at != end &&
           (at = static_cast<const char *>(std::memchr(at, 0xf4, static_cast<std::size_t>(end - at))))) {
        if (end - at >= 4 && IsEncodedByte(reinterpret_cast<const Byte *>(at))) return true;
        at++;
    }
    return false;
}

char *DecodeText(char *out, std::string_view text) {
    const char *at = text.data();
    const char *const end = at + text.size();
    while (at != end) {
        const auto *const bytes = reinterpret_cast<const Byte *>(at);
        if (end - at >= 4 && IsEncodedByte(bytes)) {
            *out++ = static_cast<char>((bytes[2] & 3) << 6 | (bytes[3] & 0x3f));
            at += 4;
        } else {
            *out++ = *at++;
        }
    }
    return out;
}

char *PutBase64(char *out, const char *data, std::size_t size) {
    const auto *at = reinterpret_cast<const Byte *>(data);
    for (; size >= 3; size -= 3, at += 3) {
        const uint32_t word = static_cast<uint32_t>(at[0]) << 16 | static_cast<uint32_t>(at[1]) << 8 | at[2];
        *out++ = kDigits[word >> 18];
        *out++ = kDigits[word >> 12 & 63];
        *out++ = kDigits[word >> 6 & 63];
        *out++ = kDigits[word & 63];
    }
    if (size > 0) {
        const uint32_t word =
            static_cast<uint32_t>(at[0]) << 16 | (size > 1 ? static_cast<uint32_t>(at[1]) << 8 : 0);
        *out++ = kDigits[word >> 18];
        *out++ = kDigits[word >> 12 & 63];
        *out++ = size > 1 ? kDigits[word >> 6 & 63] : '=';
        *out++ = '=';
    }
    return out;
}

bool DecodeBase64(std::string_view text, char *out, std::size_t *size) {
    if (text.size() % 4 != 0) return false;
    const char *const start = out;
    std::size_t padding = 0;
    while (padding < 2 && padding < text.size() && text[text.size() - 1 - padding] == '=')
        padding++;
    const auto value = [](char digit) {
        return static_cast<uint32_t>(kDigitValues[static_cast<Byte>(digit)]);
    };
    const std::size_t whole = padding > 0 ? text.size() - 4 : text.size();
    for (std::size_t at = 0; at < whole; at += 4) {
        const uint32_t a = value(text[at]), b = value(text[at + 1]), c = value(text[at + 2]),
                       d = value(text[at + 3]);
        if ((a | b | c | d) > 63) return false;
        const uint32_t word = a << 18 | b << 12 | c << 6 | d;
        *out++ = static_cast<char>(word >> 16);
        *out++ = static_cast<char>(word >> 8);
        *out++ = static_cast<char>(word);
    }
    if (padding > 0) {
        const uint32_t a = value(text[whole]), b = value(text[whole + 1]);
        const uint32_t c = padding == 1 ? value(text[whole + 2]) : 0;
        if ((a | b | c) > 63) return false;
        if (padding == 1 ? (c & 3) != 0 : (b & 15) != 0) return false;
        *out++ = static_cast<char>(a << 2 | b >> 4);
        if (padding == 1) *out++ = static_cast<char>((b & 15) << 4 | c >> 2);
    }
    *size = static_cast<std::size_t>(out - start);
    return true;
}

} // namespace configstore
