/* SPDX-License-Identifier: Apache-2.0 */
#ifndef BASE_UTF8_H
#define BASE_UTF8_H

// UTF-8 validation: no overlong forms, no surrogates, nothing above U+10FFFF.

#include <cstddef>

namespace dvs::base {

/// The length of the well-formed sequence at `text`, 1 to 4 bytes; 0 if it is not well-formed.
[[nodiscard]] inline std::size_t Utf8Length(const char *text, const char *end) {
    const auto *const at = reinterpret_cast<const unsigned char *>(text);
    const auto left = static_cast<std::size_t>(end - text);
    const auto follows = [at](std::size_t i) { return (at[i] & 0xc0) == 0x80; };
    if (left == 0) return 0;
    if (at[0] < 0x80) return 1;
    if (at[0] < 0xc2) return 0;
    if (at[0] < 0xe0) return left >= 2 && follows(1) ? 2 : 0;
    if (at[0] < 0xf0) {
        if (left < 3 || !follows(1) || !follows(2)) return 0;
        const bool overlong = at[0] == 0xe0 && at[1] < 0xa0;
        const bool surrogate = at[0] == 0xed && at[1] >= 0xa0;
        return overlong || surrogate ? 0 : 3;
    }
    if (at[0] > 0xf4 || left < 4 || !follows(1) || !follows(2) || !follows(3)) return 0;
    const bool overlong = at[0] == 0xf0 && at[1] < 0x90;
    const bool beyond = at[0] == 0xf4 && at[1] >= 0x90;
    return overlong || beyond ? 0 : 4;
}

} // namespace dvs::base

#endif
