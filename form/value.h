/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_VALUE_H
#define FORM_VALUE_H

// What a value looks like: the one rule by which displays, differences and the JSON form choose how to write
// bytes.

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "form/text.h"

namespace dvs::form {

enum class ValueForm {
    Text,       ///< plain text of at least one character and exactly one NUL, at its end
    Number,     ///< four bytes that are no text: u32, little-endian
    PaddedText, ///< at least four characters of plain text and no NUL, or two and more up to the end
    NameList, ///< a u32 count and that many slots of one of the known widths, each plain text filled up with
              ///< NULs
    Raw,      ///< anything else
};

struct ValueLook {
    ValueForm form;
    std::string_view text;    ///< Text, PaddedText: without the NULs
    std::uint32_t number = 0; ///< Number
    std::size_t slot = 0;     ///< NameList: width of a slot
};

/// The names of a NameList.
std::vector<std::string_view> NamesOf(Bytes value, std::size_t slot);

ValueLook LookAt(Bytes value);

/// The value on one line, escaped: "text", 1500, "text" (5 bytes, no NUL), ["a", "b"], 01 02 … (81 bytes).
/// With `full`, long values are not cut.
std::string ShowValue(Bytes value, bool full);

std::string ToHexDigits(Bytes bytes);
std::string ToBase64(Bytes bytes);
/// Empty when the text is not pairs of hexadecimal digits, optionally with single spaces between the pairs.
std::optional<std::vector<std::uint8_t>> FromHexDigits(std::string_view text);
/// Empty when the text is not base64 with padding, in its one canonical form.
std::optional<std::vector<std::uint8_t>> FromBase64(std::string_view text);

} // namespace dvs::form

#endif
