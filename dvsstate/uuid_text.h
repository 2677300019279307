/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_UUID_TEXT_H
#define DVSSTATE_UUID_TEXT_H

// The text form of a UUID, used as a switch id: sixteen pairs of lower-case hexadecimal digits, separated by
// spaces, with a hyphen between the eighth and the ninth.

#include <array>
#include <cstddef>
#include <cstdint>

namespace dvs::state {

inline constexpr std::size_t kUuidSize = 16;
inline constexpr std::size_t kUuidTextSize =
    3 * kUuidSize; // a pair and its separator, or the terminator at the end

[[nodiscard]] inline std::array<char, kUuidTextSize> UuidText(const uint8_t *uuid) {
    constexpr char kDigits[] = "0123456789abcdef";
    std::array<char, kUuidTextSize> text;
    for (std::size_t i = 0; i < kUuidSize; i++) {
        text[3 * i] = kDigits[uuid[i] >> 4];
        text[3 * i + 1] = kDigits[uuid[i] & 0x0f];
        text[3 * i + 2] = i == kUuidSize / 2 - 1 ? '-' : ' ';
    }
    text.back() = '\0';
    return text;
}

} // namespace dvs::state

#endif
