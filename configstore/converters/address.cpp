/* SPDX-License-Identifier: Apache-2.0 */
// IP addresses of converters (address.h).

#include "configstore/converters/address.h"

#include <cstdio>
#include <cstring>

#include <arpa/inet.h>

namespace dvs::convert {
namespace {

constexpr std::size_t kIpv6Size = 16;
constexpr std::size_t kIpv4Size = 4;

bool Parse(int family, const char *text, uint8_t (&bytes)[kIpv6Size]) {
    return inet_pton(family, text, bytes) == 1;
}

} // namespace

AddressText FormatAddress(std::span<const uint8_t, kIpv6Size> address, bool isIpv6) {
    AddressText result = {};
    if (!isIpv6) {
        // Four bytes always make a text that fits.
        (void)inet_ntop(AF_INET, address.data(), result.text, sizeof result.text);
        return result;
    }
    char *out = result.text;
    for (std::size_t i = 0; i < kIpv6Size; i += 2) {
        out += std::snprintf(out, 6, i ? ":%02x%02x" : "%02x%02x", address[i], address[i + 1]);
    }
    return result;
}

bool ParseAddress(const char *text, std::span<uint8_t, kIpv6Size> address, bool *isIpv6) {
    uint8_t bytes[kIpv6Size] = {};
    const bool isIpv4 = Parse(AF_INET, text, bytes);
    if (!isIpv4 && !Parse(AF_INET6, text, bytes)) return false;
    std::memcpy(address.data(), bytes, isIpv4 ? kIpv4Size : kIpv6Size);
    *isIpv6 = !isIpv4;
    return true;
}

} // namespace dvs::convert
