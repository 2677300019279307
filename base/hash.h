/* SPDX-License-Identifier: Apache-2.0 */
#ifndef BASE_HASH_H
#define BASE_HASH_H

// A text hash for in-memory tables. Do not store or send it; it does not protect against texts that collide
// on purpose.

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace dvs::base {

namespace hash {

inline std::uint64_t Load64(const char *from) {
    std::uint64_t word;
    std::memcpy(&word, from, sizeof word);
    return word;
}

inline std::uint64_t Load32(const char *from) {
    std::uint32_t word;
    std::memcpy(&word, from, sizeof word);
    return word;
}

/// The two halves of a 128-bit product, added without carry: every bit of either factor reaches all of it.
inline std::uint64_t Fold(std::uint64_t a, std::uint64_t b) {
    __extension__ using Wide = unsigned __int128;
    const Wide product = Wide{a} * b;
    return static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
}

} // namespace hash

/// All 64 bits are well mixed, so tables may use any of them. 16 bytes per step; the last step overlaps the
/// previous one instead of reading fewer bytes.
[[nodiscard]] inline std::uint64_t HashText(std::string_view text) {
    constexpr std::uint64_t kFirst = 0x9e3779b97f4a7c15, kSecond = 0xd1b54a32d192ed03;
    const char *at = text.data();
    const char *const end = at + text.size();
    std::uint64_t hash = text.size() ^ kSecond;
    std::uint64_t low = 0, high = 0;
    if (text.size() >= 16) {
        for (; end - at > 16; at += 16)
            hash = hash::Fold(hash::Load64(at) ^ kFirst, hash::Load64(at + 8) ^ hash);
        low = hash::Load64(end - 16);
        high = hash::Load64(end - 8);
    } else if (text.size() >= 8) {
        low = hash::Load64(at);
        high = hash::Load64(end - 8);
    } else if (text.size() >= 4) {
        low = hash::Load32(at) | hash::Load32(end - 4) << 32;
    } else if (!text.empty()) {
        const auto byte = [text](std::size_t i) {
            return std::uint64_t{static_cast<unsigned char>(text[i])};
        };
        low = byte(0) | byte(text.size() / 2) << 8 | byte(text.size() - 1) << 16;
    }
    return hash::Fold(low ^ kFirst, high ^ hash);
}

} // namespace dvs::base

#endif
