/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_DEVICE_COMMANDS_H
#define PLATFORM_DEVICE_COMMANDS_H

// The switching module's commands: numbers, names, and the buffers of the request record that each one uses.
// This is the only list; the library, the embedded device and the emulator use it. docs/emulator.md has it as
// a table.

#include <algorithm>
#include <array>
#include <cstdint>
#include <string_view>

namespace dvs::device {

/// Command numbers are the request numbers of the device's ioctl. The library does not send 23 to 25.
enum class Command : int32_t {
    StateInit = 0,
    StateCleanup = 1,
    StateSanitize = 2,
    StateGet = 3,
    SwitchAdd = 4,
    SwitchRemove = 5,
    SwitchAssociate = 6,
    SwitchDissociate = 7,
    GlobalPropGet = 8,
    GlobalPropSet = 9,
    GlobalPropClear = 10,
    HostPropGet = 11,
    HostPropSet = 12,
    HostPropClear = 13,
    PortAdd = 14,
    PortRemove = 15,
    PortDataGet = 16,
    PortDataSet = 17,
    PortDataClear = 18,
    PortStateGet = 19,
    PortFind = 20,
    SwitchSetMaxPorts = 21,
    SwitchSetVersion = 22,
    UplinkDataSet = 26,
    UplinkDataGet = 27,
    CmdExec = 28,
    SmartNICGlobalPropGet = 29,
    SmartNICHostPropGet = 30,
    SmartNICPortDataGet = 31,
};

constexpr int32_t NumberOf(Command command) {
    return static_cast<int32_t>(command);
}

/// The buffers of the record that a command uses.
enum class Transfer : uint8_t {
    None,
    ValueIn,  ///< the module reads `data`
    ValueOut, ///< the module writes `data`
    Execute,  ///< the module reads `cmdIn` and writes `cmdOut`
};

/// Whether a command that succeeds changes the state that StateGet returns.
enum class Effect : uint8_t { None, ChangesState };

struct CommandRow {
    Command command;
    std::string_view name;
    Transfer transfer;
    Effect effect;
};

/// In the order of their numbers.
inline constexpr std::array kCommands = {
    CommandRow{Command::StateInit, "state init", Transfer::ValueIn, Effect::ChangesState},
    CommandRow{Command::StateCleanup, "state cleanup", Transfer::None, Effect::ChangesState},
    CommandRow{Command::StateSanitize, "state sanitize", Transfer::None, Effect::ChangesState},
    CommandRow{Command::StateGet, "state get", Transfer::ValueOut, Effect::None},
    CommandRow{Command::SwitchAdd, "switch add", Transfer::None, Effect::ChangesState},
    CommandRow{Command::SwitchRemove, "switch remove", Transfer::None, Effect::ChangesState},
    CommandRow{Command::SwitchAssociate, "switch associate", Transfer::None, Effect::None},
    CommandRow{Command::SwitchDissociate, "switch dissociate", Transfer::None, Effect::None},
    CommandRow{Command::GlobalPropGet, "global property get", Transfer::ValueOut, Effect::None},
    CommandRow{Command::GlobalPropSet, "global property set", Transfer::ValueIn, Effect::ChangesState},
    CommandRow{Command::GlobalPropClear, "global property clear", Transfer::None, Effect::ChangesState},
    CommandRow{Command::HostPropGet, "host property get", Transfer::ValueOut, Effect::None},
    CommandRow{Command::HostPropSet, "host property set", Transfer::ValueIn, Effect::ChangesState},
    CommandRow{Command::HostPropClear, "host property clear", Transfer::None, Effect::ChangesState},
    CommandRow{Command::PortAdd, "port add", Transfer::ValueIn, Effect::ChangesState},
    CommandRow{Command::PortRemove, "port remove", Transfer::None, Effect::ChangesState},
    CommandRow{Command::PortDataGet, "port data get", Transfer::ValueOut, Effect::None},
    CommandRow{Command::PortDataSet, "port data set", Transfer::ValueIn, Effect::ChangesState},
    CommandRow{Command::PortDataClear, "port data clear", Transfer::None, Effect::ChangesState},
    CommandRow{Command::PortStateGet, "port state get", Transfer::ValueOut, Effect::None},
    CommandRow{Command::PortFind, "port find", Transfer::None, Effect::None},
    CommandRow{Command::SwitchSetMaxPorts, "switch set max ports", Transfer::None, Effect::ChangesState},
    CommandRow{Command::SwitchSetVersion, "switch set version", Transfer::None, Effect::ChangesState},
    CommandRow{Command::UplinkDataSet, "uplink data set", Transfer::ValueIn, Effect::None},
    CommandRow{Command::UplinkDataGet, "uplink data get", Transfer::ValueOut, Effect::None},
    CommandRow{Command::CmdExec, "text command", Transfer::Execute, Effect::None},
    CommandRow{Command::SmartNICGlobalPropGet, "SmartNIC global property get", Transfer::ValueOut,
               Effect::None},
    CommandRow{Command::SmartNICHostPropGet, "SmartNIC host property get", Transfer::ValueOut, Effect::None},
    CommandRow{Command::SmartNICPortDataGet, "SmartNIC port data get", Transfer::ValueOut, Effect::None},
};
static_assert(std::ranges::is_sorted(kCommands, {}, &CommandRow::command));

/// One more than the largest command number.
inline constexpr int32_t kCommandEnd = NumberOf(kCommands.back().command) + 1;

/// Returns null if the number is no command.
constexpr const CommandRow *FindCommand(int32_t number) {
    const auto row =
        std::ranges::lower_bound(kCommands, static_cast<Command>(number), {}, &CommandRow::command);
    return row != kCommands.end() && NumberOf(row->command) == number ? row : nullptr;
}

constexpr Transfer TransferOf(int32_t number) {
    const CommandRow *row = FindCommand(number);
    return row ? row->transfer : Transfer::None;
}

} // namespace dvs::device

#endif
