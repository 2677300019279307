/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_TEXT_CODE_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_TEXT_CODE_H

// How bytes that are not UTF-8, and binary values, are written in a document.
//
// A text is kept as it is while it is UTF-8. A byte that is not part of a well-formed sequence becomes the
// private character U+10FE00 + byte (U+10FE80 to U+10FEFF). Should a text hold one of those very characters,
// its four bytes are written like four such bytes: whatever a document holds in that range stands for a byte,
// so that each text has one form and each form one text. Binary values are base64 (base/base64.h).

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace configstore {

/// Marks the bytes that end a run of plain characters: control characters, quotes, backslashes and all beyond
/// ASCII. Exact up to the first mark, which is all that is asked for.
[[nodiscard]] inline uint64_t SpecialBytes(uint64_t word) {
    constexpr uint64_t kOnes = 0x0101010101010101U;
    constexpr uint64_t kHighs = 0x8080808080808080U;
    const uint64_t quote = word ^ kOnes * '"';
    const uint64_t backslash = word ^ kOnes * '\\';
    return (((word - kOnes * 0x20) & ~word) | ((quote - kOnes) & ~quote) |
            ((backslash - kOnes) & ~backslash) | word) &
           kHighs;
}

/// Length of the UTF-8 sequence at `at`, 0 when there is none or when it is one of the private characters.
[[nodiscard]] std::size_t PlainSequence(const char *at, const char *end);

/// The most bytes that one byte of a text takes in its document form.
inline constexpr std::size_t kEncodedByte = 4;
/// Writes the private character that stands for `byte`: always kEncodedByte bytes.
char *PutEncodedByte(char *out, unsigned char byte);

/// Whether the text of a document has private characters that stand for bytes.
[[nodiscard]] bool HasEncodedBytes(std::string_view text);
/// Writes the bytes that a document's text stands for; no more than it has. Returns the end.
char *DecodeText(char *out, std::string_view text);

} // namespace configstore

#endif
