/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_ADDRESS_H
#define CONFIGSTORE_CONVERTERS_ADDRESS_H

// IP addresses as the store writes them: dotted IPv4, and IPv6 as eight full groups without compression. They
// stand in records as four or sixteen bytes in network order.

#include <cstdint>
#include <span>

namespace dvs::convert {

struct AddressText {
    char text[40]; // eight groups of four digits, seven colons, NUL
};

/// The text of the first four bytes, or of all sixteen.
AddressText FormatAddress(std::span<const uint8_t, 16> address, bool isIpv6);

/// Writes the address that `text` names and whether it is IPv6. False, with neither touched, when it names
/// none.
[[nodiscard]] bool ParseAddress(const char *text, std::span<uint8_t, 16> address, bool *isIpv6);

} // namespace dvs::convert

#endif
