/* SPDX-License-Identifier: Apache-2.0 */
// Texts in their document form (text_code.h).

#include "platform/embedded/configstore/text_code.h"

#include <cstring>

#include "base/utf8.h"

namespace configstore {

namespace {

using Byte = unsigned char;

/// U+10FE80 to U+10FEFF: f4 8f ba 80 to f4 8f bb bf.
bool IsEncodedByte(const Byte *at) {
    return at[0] == 0xf4 && at[1] == 0x8f && (at[2] & 0xfe) == 0xba;
}

} // namespace

std::size_t PlainSequence(const char *at, const char *end) {
    const std::size_t length = dvs::base::Utf8Length(at, end);
    return length == 4 && IsEncodedByte(reinterpret_cast<const Byte *>(at)) ? 0 : length;
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

} // namespace configstore
