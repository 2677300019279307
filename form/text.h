/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_TEXT_H
#define FORM_TEXT_H

// Bytes as text: what may reach a terminal or a JSON document, how wide it is there, and name patterns.
// Everything read from states, documents and arguments passes through here before it is shown.

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace dvs::form {

using Bytes = std::span<const std::uint8_t>;

inline std::string_view AsText(Bytes bytes) {
    return {reinterpret_cast<const char *>(bytes.data()), bytes.size()};
}
inline Bytes AsBytes(std::string_view text) {
    return {reinterpret_cast<const std::uint8_t *>(text.data()), text.size()};
}

/// Decodes one UTF-8 sequence at `*at` and moves behind it. Empty, with `*at` untouched, when the bytes there
/// are not one (overlong forms, surrogates and values above U+10FFFF included).
std::optional<char32_t> DecodeUtf8(std::string_view text, std::size_t *at);

bool IsUtf8(std::string_view text);

/// True for characters that show as themselves: no control character of either set, nothing invisible,
/// nothing that changes the direction of the text around it.
bool IsPrintable(char32_t character);

/// True for valid UTF-8 of printable characters, tabs and line ends.
bool IsPlainText(std::string_view text);

/// The text with everything a terminal could act on replaced: \n \r \t \\ by name, other bytes as \xNN,
/// unprintable characters as \u{N}. What is valid and printable stays as it is.
std::string Escape(std::string_view text);

/// Escape, in double quotes, with inner quotes escaped.
std::string Quote(std::string_view text);

/// A name for display: escaped, and quoted only where its bounds would not be seen (empty, or spaces at an
/// end).
std::string ShowName(std::string_view name);

/// The text with each byte that is not UTF-8 replaced by U+FFFD, for prose in JSON (errors, messages).
std::string ValidUtf8(std::string_view text);

/// Columns the text takes on a terminal.
std::size_t Width(std::string_view text);

/// "1 port", "2 ports".
std::string Count(std::uint64_t number, std::string_view noun, std::string_view plural);
inline std::string Count(std::uint64_t number, std::string_view noun) {
    return Count(number, noun, std::string(noun) + "s");
}

/// Bytes as "01 ab …": at most `most` of them, with an ellipsis when there are more.
std::string Hex(Bytes bytes, std::size_t most = SIZE_MAX);

/// Matches the whole text against a pattern of `*`, `?`, `[a-z]`, `[!a-z]` and `\` before a character meant
/// as itself. Works on bytes, in time proportional to the product of the lengths. An unclosed `[` stands for
/// itself.
bool GlobMatch(std::string_view pattern, std::string_view text);

} // namespace dvs::form

#endif
