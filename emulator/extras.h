/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_EXTRAS_H
#define EMULATOR_EXTRAS_H

// Data that the module stores outside the switch table: associations, link states, uplink data. It is not
// part of the state that commands 0 and 3 exchange, nor of the state file.

#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace dvs::emulator {

struct PortExtras {
    bool linkUp = false;
    bool assignedConnectionId = false; // assigned when the link came up; removed when it goes down
    std::map<int32_t, std::vector<char>> uplinks;
};

struct SwitchExtras {
    bool associated = false;
    std::map<std::string, PortExtras, std::less<>> ports;
};

/// Keyed by switch id.
using Extras = std::map<std::string, SwitchExtras, std::less<>>;

} // namespace dvs::emulator

#endif
