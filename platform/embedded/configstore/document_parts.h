/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_PARTS_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_PARTS_H

// What the two quick readers of the store's own documents share: document_plain.cpp, which makes nodes, and
// document_skim.cpp, which only looks. The last byte of a text is a brace, so that a run of digits or of a
// name ends before it does.

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <span>
#include <vector>

#include "platform/embedded/configstore/schema.h"

namespace configstore {

/// Whether the field's name stands at `at` as a document writes it, with its colon. False also for names that
/// are too long for a quick look, and close to `last`, the text's last byte.
[[nodiscard]] inline bool StandsAt(const Field &field, const char *at, const char *last) {
    if (last - at < static_cast<std::ptrdiff_t>(sizeof field.words)) return false;
    const auto difference = [&field, at](std::size_t i) {
        uint64_t word = 0;
        std::memcpy(&word, at + i * sizeof word, sizeof word);
        return (word ^ field.words[i]) & field.masks[i];
    };
    // All words, whether they count or not: that takes less than counting them.
    static_assert(Field::kMaxWords == 5);
    const uint64_t all = difference(0) | difference(1) | difference(2) | difference(3) | difference(4);
    return all == 0 && field.wordNum > 0;
}

/// Steps over a whole number that something follows as it does in a document. False for any other text, which
/// *at may be left inside of.
[[nodiscard]] inline bool TakeInteger(const char **at, int64_t *number) {
    constexpr std::ptrdiff_t kSafeDigits = 18; // of any such number fits
    const bool negative = **at == '-';
    const char *const digits = negative ? *at + 1 : *at;
    const char *end = digits;
    uint64_t value = 0;
    unsigned digit = 0;
    while ((digit = static_cast<unsigned char>(*end) - unsigned{'0'}) < 10) {
        value = value * 10 + digit; // goes round only in what is refused
        end++;
    }
    const std::ptrdiff_t count = end - digits;
    if (count == 0 || count > kSafeDigits || (*digits == '0' && (count > 1 || negative))) return false;
    if (*end != ',' && *end != '}' && *end != ']') return false;
    *at = end;
    *number = negative ? -static_cast<int64_t>(value) : static_cast<int64_t>(value);
    return true;
}

/// Whether no two hashes of ids are the same, which may be reordered. False also where that would take long to
/// say, as it does of ids that were chosen to fall together.
[[nodiscard]] inline bool AllDiffer(std::span<uint64_t> hashes) {
    constexpr std::size_t kFew = 32;
    constexpr std::size_t kMostSteps = 1024;
    if (hashes.size() <= kFew) {
        std::sort(hashes.begin(), hashes.end());
        return std::adjacent_find(hashes.begin(), hashes.end()) == hashes.end();
    }
    // Many are not sorted, which takes longer than reading them. Half of a hash and its place are enough.
    std::vector<uint32_t> seen(std::bit_ceil(hashes.size() + hashes.size() / 3)); // 0 is nothing
    for (const uint64_t hash : hashes) {
        const auto half = static_cast<uint32_t>(hash >> 32 | 1);
        std::size_t at = hash & (seen.size() - 1);
        for (std::size_t steps = 0; seen[at] != 0; at = (at + 1) & (seen.size() - 1)) {
            if (seen[at] == half || ++steps == kMostSteps) return false;
        }
        seen[at] = half;
    }
    return true;
}

} // namespace configstore

#endif
