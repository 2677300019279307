/* SPDX-License-Identifier: Apache-2.0 */
// Creates and recognises the names of temporary files for durable.cpp. Allocates nothing, like the rest of a
// durable write.

#include "dvsfile/temp_name.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>

#include <sys/random.h>

namespace dvs::file {

namespace {

constexpr std::string_view kHexDigits = "0123456789abcdef";

bool FillRandom(std::array<uint8_t, kRandomBytes> *bytes) {
    // Reads this small are never partial. EINTR only occurs before the system's pool is initialized.
    ssize_t got = 0;
    do {
        got = getrandom(bytes->data(), bytes->size(), 0);
    } while (got < 0 && errno == EINTR);
    return got == static_cast<ssize_t>(bytes->size());
}

} // namespace

bool MakeTempName(std::string_view base, TempName *name) {
    std::array<uint8_t, kRandomBytes> bytes{};
    if (!FillRandom(&bytes)) return false;
    base = base.substr(0, kMaxBaseLen);
    char *at = name->data();
    *at++ = '.';
    at = std::ranges::copy(base, at).out;
    at = std::ranges::copy(kTempMark, at).out;
    for (const uint8_t byte : bytes) {
        *at++ = kHexDigits[byte >> 4];
        *at++ = kHexDigits[byte & 15];
    }
    *at = '\0';
    return true;
}

bool IsTempName(std::string_view base, std::string_view name) {
    const auto take = [&name](std::string_view part) {
        if (!name.starts_with(part)) return false;
        name.remove_prefix(part.size());
        return true;
    };
    return take(".") && take(base.substr(0, kMaxBaseLen)) && take(kTempMark) &&
           name.size() == 2 * kRandomBytes && name.find_first_not_of(kHexDigits) == std::string_view::npos;
}

} // namespace dvs::file
