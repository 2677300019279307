/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_ENCODE_H
#define FORM_ENCODE_H

// Serialized lists from any names and bytes, built without a property list: no duplicates are merged, no
// order is changed, no host's limits apply. Unspecified bytes are written as zero, as the library writes
// them.

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "form/text.h"

namespace dvs::form {

struct NewEntry {
    std::string name; ///< at most 127 bytes, no NUL
    std::uint32_t type = 0;
    std::vector<std::uint8_t> value;
};

/// The serialized list of the entries in order. Throws Error(Malformed) when it would pass the format's
/// 32-bit sizes.
std::vector<std::uint8_t> EncodeList(std::span<const NewEntry> entries);

} // namespace dvs::form

#endif
