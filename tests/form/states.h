/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_FORM_STATES_H
#define TESTS_FORM_STATES_H

// States for the tests of the command line, built entry by entry.

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "form/encode.h"

namespace dvs::form::test {

using Buffer = std::vector<std::uint8_t>;

Buffer Number(std::uint32_t value);
Buffer Text(std::string_view text); ///< with its NUL
Buffer Raw(std::string_view bytes);

NewEntry MakeProperty(std::string name, Buffer value, std::uint32_t type = 0x20);
NewEntry MakeList(std::string name, const std::vector<NewEntry> &entries, std::uint32_t type = 0x10);

/// The five fixed entries in their usual order, then the given ones.
NewEntry MakeSwitch(std::string id, std::vector<NewEntry> global, std::vector<NewEntry> host,
                    std::vector<NewEntry> ports, std::uint32_t version = 8,
                    std::string_view className = "etherswitch");

/// Two switches, four ports (one of them a shadow), eight properties.
Buffer SmallState();

/// Recomputes the checksums of the state's buffer and of each nested buffer after a change.
void Mend(Buffer &state);

} // namespace dvs::form::test

#endif
