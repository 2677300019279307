/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_MODULE_H
#define EMULATOR_MODULE_H

// The switching module: the commands over the library's own switch table, which holds the live state.
// Independent of sockets; single-threaded.

#include <array>
#include <string>

#include "emulator/call.h"
#include "emulator/extras.h"
#include "emulator/faults.h"
#include "platform/device_commands.h"

namespace dvs::emulator {

/// The largest property value, and the largest state as it is serialized.
inline constexpr uint32_t kMaxValueSize = 16U << 20;
inline constexpr uint32_t kMaxStateSize = wire::kMaxTransfer;

struct Counters {
    std::array<uint64_t, device::kCommandEnd> calls{}; // by command number
    uint64_t refused = 0;
    uint64_t saves = 0;
};

class Module {
public:
    /// An empty `stateFile` means none. With `sync`, the state is saved after every change.
    Module(std::string stateFile, bool sync);

    /// Executes one command. Returns HYP_NO_MEMORY if out of memory.
    [[nodiscard]] Answer Execute(const Call &call);

    /// Loads the state file, if it exists. On failure the state is empty and `*why` describes the error.
    [[nodiscard]] HYP_ReturnStatus LoadState(std::string *why);

    /// Saves the state durably; HYP_OK if there is no state file.
    [[nodiscard]] HYP_ReturnStatus SaveState();

    Faults &FaultTable() { return faults_; }

private:
    friend struct CommandTable;

    HYP_ReturnStatus Dispatch(const Call &call, Answer *answer);

    HYP_ReturnStatus StateInit(const Call &call, Answer *answer);
    HYP_ReturnStatus StateCleanup(const Call &call, Answer *answer);
    HYP_ReturnStatus StateSanitize(const Call &call, Answer *answer);
    HYP_ReturnStatus StateGet(const Call &call, Answer *answer);
    HYP_ReturnStatus SwitchAdd(const Call &call, Answer *answer);
    HYP_ReturnStatus SwitchRemove(const Call &call, Answer *answer);
    HYP_ReturnStatus SwitchAssociate(const Call &call, Answer *answer);
    HYP_ReturnStatus SwitchDissociate(const Call &call, Answer *answer);
    HYP_ReturnStatus SwitchSetMaxPorts(const Call &call, Answer *answer);
    HYP_ReturnStatus SwitchSetVersion(const Call &call, Answer *answer);
    HYP_ReturnStatus GlobalPropGet(const Call &call, Answer *answer);
    HYP_ReturnStatus GlobalPropSet(const Call &call, Answer *answer);
    HYP_ReturnStatus GlobalPropClear(const Call &call, Answer *answer);
    HYP_ReturnStatus HostPropGet(const Call &call, Answer *answer);
    HYP_ReturnStatus HostPropSet(const Call &call, Answer *answer);
    HYP_ReturnStatus HostPropClear(const Call &call, Answer *answer);
    HYP_ReturnStatus PortAdd(const Call &call, Answer *answer);
    HYP_ReturnStatus PortRemove(const Call &call, Answer *answer);
    HYP_ReturnStatus PortDataGet(const Call &call, Answer *answer);
    HYP_ReturnStatus PortDataSet(const Call &call, Answer *answer);
    HYP_ReturnStatus PortDataClear(const Call &call, Answer *answer);
    HYP_ReturnStatus PortStateGet(const Call &call, Answer *answer);
    HYP_ReturnStatus PortFind(const Call &call, Answer *answer);
    HYP_ReturnStatus UplinkDataSet(const Call &call, Answer *answer);
    HYP_ReturnStatus UplinkDataGet(const Call &call, Answer *answer);
    HYP_ReturnStatus CmdExec(const Call &call, Answer *answer);

    // Text commands (text_commands.cpp); each fills `*reply`.
    friend struct TextCommandTable;
    struct TextArguments;
    HYP_ReturnStatus RunText(const TextArguments &arguments, std::string *reply);
    HYP_ReturnStatus TextHelp(const TextArguments &arguments, std::string *reply);
    HYP_ReturnStatus TextStats(const TextArguments &arguments, std::string *reply);
    HYP_ReturnStatus TextPorts(const TextArguments &arguments, std::string *reply);
    HYP_ReturnStatus TextEvent(const TextArguments &arguments, std::string *reply);
    HYP_ReturnStatus TextSave(const TextArguments &arguments, std::string *reply);
    HYP_ReturnStatus TextFault(const TextArguments &arguments, std::string *reply);

    uint32_t NextConnectionId();
    HYP_ReturnStatus LinkUp(DVSPort *port);
    HYP_ReturnStatus LinkDown(DVSPort *port);

    /// HYP_LIMIT_EXCEEDED if the state has no room for `size` more bytes.
    HYP_ReturnStatus CheckRoom(uint64_t size);
    /// The same for a property's value, which also has its own limit.
    HYP_ReturnStatus CheckValue(uint64_t size);
    PortExtras &ExtrasOf(DVSPort *port);
    void RemoveExtras(const char *switchName, const char *portId);

    const std::string stateFile_;
    const bool sync_;
    Extras extras_;
    Faults faults_;
    Counters counters_;
    uint32_t lastConnectionId_ = 0;
    uint64_t sizeBound_ = 0; // upper bound of the state's size; made exact before it rejects a value
    Block fetchedState_; // the state of a fetch whose buffer was too small; dropped on a change
    uint32_t fetchedStateSize_ = 0;
};

} // namespace dvs::emulator

#endif
