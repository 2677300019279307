/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_EXTRAS_H
#define EMULATOR_EXTRAS_H

// What the module keeps beside the switch table: associations, link states, uplink data. None of it is part
// of the state that commands 0 and 3 exchange, nor of the state file.

#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace dvs::emulator {

struct PortExtras {
    bool linkUp = false;
    bool gaveConnectionId = false; // by a link that came up; taken back when it goes down
    std::map<int32_t, std::vector<char>> uplinks;
};

struct SwitchExtras {
    bool associated = false;
    std::map<std::string, PortExtras, std::less<>> ports;
};

/// By switch id.
using Extras = std::map<std::string, SwitchExtras, std::less<>>;

} // namespace dvs::emulator

#endif
