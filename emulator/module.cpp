/* SPDX-License-Identifier: Apache-2.0 */
// The table of commands, their common checks, and the commands on whole states and switches.
// module_values.cpp has the commands on properties and ports, text_commands.cpp the text commands.

#include "emulator/module.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <new>
#include <utility>

#include "dvsstate/port_table.h"
#include "dvsstate/switch_table.h"
#include "emulator/reply_value.h"

namespace dvs::emulator {

using device::Command;
using device::Transfer;

/// The handler of each command; the rows are those of device::kCommands, in the same order.
struct CommandTable {
    using Handler = HYP_ReturnStatus (Module::*)(const Call &, Answer *);
    struct Row {
        Command command;
        Handler handler;
    };
    static constexpr std::array kRows = {
        Row{Command::StateInit, &Module::StateInit},
        Row{Command::StateCleanup, &Module::StateCleanup},
        Row{Command::StateSanitize, &Module::StateSanitize},
        Row{Command::StateGet, &Module::StateGet},
        Row{Command::SwitchAdd, &Module::SwitchAdd},
        Row{Command::SwitchRemove, &Module::SwitchRemove},
        Row{Command::SwitchAssociate, &Module::SwitchAssociate},
        Row{Command::SwitchDissociate, &Module::SwitchDissociate},
        Row{Command::GlobalPropGet, &Module::GlobalPropGet},
        Row{Command::GlobalPropSet, &Module::GlobalPropSet},
        Row{Command::GlobalPropClear, &Module::GlobalPropClear},
        Row{Command::HostPropGet, &Module::HostPropGet},
        Row{Command::HostPropSet, &Module::HostPropSet},
        Row{Command::HostPropClear, &Module::HostPropClear},
        Row{Command::PortAdd, &Module::PortAdd},
        Row{Command::PortRemove, &Module::PortRemove},
        Row{Command::PortDataGet, &Module::PortDataGet},
        Row{Command::PortDataSet, &Module::PortDataSet},
        Row{Command::PortDataClear, &Module::PortDataClear},
        Row{Command::PortStateGet, &Module::PortStateGet},
        Row{Command::PortFind, &Module::PortFind},
        Row{Command::SwitchSetMaxPorts, &Module::SwitchSetMaxPorts},
        Row{Command::SwitchSetVersion, &Module::SwitchSetVersion},
        Row{Command::UplinkDataSet, &Module::UplinkDataSet},
        Row{Command::UplinkDataGet, &Module::UplinkDataGet},
        Row{Command::CmdExec, &Module::CmdExec},
        Row{Command::SmartNICGlobalPropGet, &Module::GlobalPropGet},
        Row{Command::SmartNICHostPropGet, &Module::HostPropGet},
        Row{Command::SmartNICPortDataGet, &Module::PortDataGet},
    };

    static Handler HandlerOf(const device::CommandRow *row) {
        return kRows[row - device::kCommands.data()].handler;
    }
};
static_assert(std::ranges::equal(CommandTable::kRows, device::kCommands, {}, &CommandTable::Row::command,
                                 &device::CommandRow::command));

namespace {

/// Upper bound for a switch in a serialized state, without its lists and ports: its entry and its three fixed
/// fields.
constexpr uint64_t kSwitchOverhead = 1024;

template <std::size_t N> bool Terminated(const char (&field)[N]) {
    return strnlen(field, N) < N;
}

/// False if a text of the record is not NUL-terminated.
bool HasTexts(const DVSHYPRequest &record) {
    return Terminated(record.switchName) && Terminated(record.portId) && Terminated(record.propName) &&
           Terminated(record.cmd);
}

/// True if a length has no buffer: copying from or to user space would fault.
bool LacksBuffer(const Call &call) {
    switch (device::TransferOf(call.request)) {
    case Transfer::ValueIn:
    case Transfer::ValueOut:
        return call.record.dataLen != 0 && !call.Has(wire::HasData);
    case Transfer::Execute:
        return (call.record.cmdInLen != 0 && !call.Has(wire::HasCmdIn)) ||
               (call.record.cmdOutLen != 0 && !call.Has(wire::HasCmdOut));
    case Transfer::None:
        return false;
    }
    return false;
}

/// Size of an entry with a value of `size` bytes in a serialized list.
constexpr uint64_t EntrySize(uint64_t size) {
    return size + 146;
}

uint64_t ListSize(const DVSData *list) {
    return list ? EntrySize(list->serialSize) : 0;
}

bool AddPortSize(DVSPort *port, void *arg) {
    // Reserve room for the kind that serialization may add.
    *static_cast<uint64_t *>(arg) += ListSize(port->portData) + EntrySize(sizeof port->portType);
    return false;
}

bool AddSwitchSize(DVSwitch *sw, void *arg) {
    *static_cast<uint64_t *>(arg) +=
        kSwitchOverhead + ListSize(sw->globalPropList) + ListSize(sw->hostPropList);
    DVSState_PortForEach(sw, AddPortSize, arg);
    return false;
}

/// Moves the current state, with its ports in the host-wide count, aside while another one is loaded.
/// Restores it unless it is dropped.
class SavedState {
public:
    SavedState() { Exchange(); }
    ~SavedState() {
        if (dropped_) return;
        (void)DVSState_ConfigReset();
        Exchange();
    }
    SavedState(const SavedState &) = delete;
    SavedState &operator=(const SavedState &) = delete;

    void Drop() {
        Exchange();
        (void)DVSState_ConfigReset();
        Exchange();
        dropped_ = true;
    }

private:
    void Exchange() {
        std::swap(switches_, dvs::state::dvsSwitchTable);
        std::swap(ports_, dvs::state::numPortsInUseHostWide);
    }

    std::array<DVSwitch *, dvs::state::kSwitchNum> switches_{};
    uint32_t ports_ = 0;
    bool dropped_ = false;
};

bool RemoveLeftoverPort(DVSPort *port, void *) {
    char id[sizeof port->portId];
    std::memcpy(id, port->portId, sizeof id);
    const char *switchId = DVS_SwitchId(port->owner);
    // The walk allows removing its current port. That port is the first with its id and kind, because earlier
    // ones have been removed.
    if (port->portType == DVS_PORT_ZOMBIE)
        (void)DVSState_PortRemoveZombie(switchId, id);
    else if (port->portType == DVS_PORT_LOCAL_CACHE)
        (void)DVSState_LocalCachePortRemove(switchId, id);
    return false;
}

bool SanitizeSwitch(DVSwitch *sw, void *) {
    DVSState_PortForEach(sw, RemoveLeftoverPort, nullptr);
    return false;
}

/// One past the highest slot in use: a lower limit would hide ports from the switch.
bool RaiseToSlot(DVSPort *port, void *arg) {
    auto *slots = static_cast<std::pair<uint32_t, const DVSwitch *> *>(arg);
    while (slots->second->ports[slots->first++] != port) {
    }
    return false;
}

uint32_t SlotsInUse(DVSwitch *sw) {
    std::pair<uint32_t, const DVSwitch *> slots{0, sw};
    DVSState_PortForEach(sw, RaiseToSlot, &slots);
    return slots.first;
}

} // namespace

int ErrnoOf(HYP_ReturnStatus status) {
    struct Row {
        HYP_ReturnStatus status;
        int error;
    };
    static constexpr Row kRows[] = {
        {HYP_OK, 0},
        {HYP_FAILURE, EINVAL}, // a value is missing
        {HYP_NOT_FOUND, ENOENT},
        {HYP_EXISTS, EEXIST},
        {HYP_LIMIT_EXCEEDED, ENOSPC},
        {HYP_BAD_PARAM, EINVAL},
        {HYP_NO_MEMORY, ENOMEM},
        {HYP_NOT_SUPPORTED, EOPNOTSUPP},
        {HYP_BAD_CHECKSUM, EINVAL},
    };
    for (const Row &row : kRows) {
        if (row.status == status) return row.error;
    }
    return EIO;
}

Module::Module(std::string stateFile, bool sync) : stateFile_(std::move(stateFile)), sync_(sync) {}

Answer Module::Execute(const Call &call) {
    Answer answer;
    answer.dataLen = call.record.dataLen;
    answer.cmdOutLen = call.record.cmdOutLen;
    try {
        answer.status = Dispatch(call, &answer);
    } catch (const std::bad_alloc &) {
        answer.status = HYP_NO_MEMORY;
    }
    if (answer.status != HYP_OK) {
        counters_.refused++;
        answer.payload = {};
        if (answer.error == 0) answer.error = ErrnoOf(answer.status);
    }
    return answer;
}

HYP_ReturnStatus Module::Dispatch(const Call &call, Answer *answer) {
    const device::CommandRow *row = device::FindCommand(call.request);
    if (!row) return HYP_NOT_SUPPORTED;
    counters_.calls[static_cast<std::size_t>(call.request)]++;
    if (LacksBuffer(call)) {
        // As with a failed copy from user space, the module has not written a status.
        answer->error = EFAULT;
        return call.record.status == HYP_OK ? static_cast<HYP_ReturnStatus>(HYP_FAILURE) : call.record.status;
    }
    if (!HasTexts(call.record)) return HYP_BAD_PARAM;
    const HYP_ReturnStatus status = (this->*CommandTable::HandlerOf(row))(call, answer);
    if (row->effect != device::Effect::ChangesState) return status;
    fetchedState_.reset();
    return status == HYP_OK && sync_ ? SaveState() : status;
}

HYP_ReturnStatus Module::CheckValue(uint64_t size) {
    return size > kMaxValueSize ? static_cast<HYP_ReturnStatus>(HYP_LIMIT_EXCEEDED) : CheckRoom(size);
}

HYP_ReturnStatus Module::CheckRoom(uint64_t size) {
    if (sizeBound_ + EntrySize(size) > kMaxStateSize) {
        sizeBound_ = 0;
        DVSState_SwitchForEach(AddSwitchSize, &sizeBound_);
        for (const auto &[switchId, sw] : extras_) {
            for (const auto &[portId, port] : sw.ports) {
                for (const auto &[uplink, value] : port.uplinks)
                    sizeBound_ += EntrySize(value.size());
            }
        }
        if (sizeBound_ + EntrySize(size) > kMaxStateSize) return HYP_LIMIT_EXCEEDED;
    }
    sizeBound_ += EntrySize(size);
    return HYP_OK;
}

void Module::RemoveExtras(const char *switchName, const char *portId) {
    const auto sw = extras_.find(std::string_view(switchName));
    if (sw == extras_.end()) return;
    const auto port = sw->second.ports.find(std::string_view(portId));
    if (port != sw->second.ports.end()) sw->second.ports.erase(port);
}

PortExtras &Module::ExtrasOf(DVSPort *port) {
    return extras_[DVS_SwitchId(port->owner)].ports[DVS_PortId(port)];
}

// Whole states

HYP_ReturnStatus Module::StateInit(const Call &call, Answer *) {
    const dvs::state::StateLock lock;
    SavedState old;
    const HYP_ReturnStatus status =
        DVSState_ConfigDeserialize(call.value.data(), static_cast<uint32_t>(call.value.size()));
    if (status != HYP_OK) return status;
    old.Drop();
    extras_.clear();
    sizeBound_ = call.value.size();
    return HYP_OK;
}

HYP_ReturnStatus Module::StateCleanup(const Call &, Answer *) {
    extras_.clear();
    return DVSState_ConfigReset();
}

HYP_ReturnStatus Module::StateSanitize(const Call &, Answer *) {
    DVSState_SwitchForEach(SanitizeSwitch, nullptr);
    // Delete the extra data of removed ports.
    for (auto &[switchId, sw] : extras_) {
        DVSwitch *found = DVSState_SwitchFind(switchId.c_str());
        std::erase_if(sw.ports, [&](const auto &port) {
            return !DVSState_PortFindOnDVSwitch(found, port.first.c_str());
        });
    }
    return HYP_OK;
}

HYP_ReturnStatus Module::StateGet(const Call &call, Answer *answer) {
    Block state = std::move(fetchedState_);
    if (!state) {
        void *serialized = nullptr;
        fetchedStateSize_ = 0;
        const HYP_ReturnStatus status = DVSState_ConfigSerialize(&serialized, &fetchedStateSize_);
        if (status != HYP_OK) return status;
        state.reset(serialized);
    }
    const HYP_ReturnStatus status = ReplyWith(call, state.get(), fetchedStateSize_, answer);
    // After a failure the client immediately retries with the returned size.
    if (status == HYP_OK)
        answer->payload.owned = std::move(state);
    else
        fetchedState_ = std::move(state);
    return status;
}

// Switches

HYP_ReturnStatus Module::SwitchAdd(const Call &call, Answer *) {
    const HYP_ReturnStatus status = CheckRoom(kSwitchOverhead);
    if (status != HYP_OK) return status;
    const DVSHYPRequest &record = call.record;
    return DVSState_SwitchAdd(record.switchName, record.propName, record.maxPorts, record.version);
}

HYP_ReturnStatus Module::SwitchRemove(const Call &call, Answer *) {
    const HYP_ReturnStatus status = DVSState_SwitchRemove(call.record.switchName);
    if (status == HYP_OK) extras_.erase(call.record.switchName);
    return status;
}

HYP_ReturnStatus Module::SwitchAssociate(const Call &call, Answer *) {
    if (!DVSState_SwitchFind(call.record.switchName)) return HYP_NOT_FOUND;
    extras_[call.record.switchName].associated = true;
    return HYP_OK;
}

HYP_ReturnStatus Module::SwitchDissociate(const Call &call, Answer *) {
    if (!DVSState_SwitchFind(call.record.switchName)) return HYP_NOT_FOUND;
    extras_[call.record.switchName].associated = false;
    return HYP_OK;
}

HYP_ReturnStatus Module::SwitchSetMaxPorts(const Call &call, Answer *) {
    DVSwitch *sw = DVSState_SwitchFind(call.record.switchName);
    if (!sw) return HYP_NOT_FOUND;
    const uint32_t ports = call.record.maxPorts;
    if (ports > uwMaxNumActivePortsSystemWide) return HYP_LIMIT_EXCEEDED;
    if (sw->classFlags & dvs::state::kUnlimitedClass) {
        // This class has no limit of its own: store the requested one; the number of slots stays the host's.
        sw->newMaxPorts = ports;
        return HYP_OK;
    }
    const uint32_t elsewhere = dvs::state::numPortsInUseHostWide - sw->numPorts;
    if (uwMaxNumActivePortsSystemWide - elsewhere < ports || ports < SlotsInUse(sw))
        return HYP_LIMIT_EXCEEDED;
    sw->newMaxPorts = ports;
    DVS_UpdateMaxPorts(sw);
    return HYP_OK;
}

HYP_ReturnStatus Module::SwitchSetVersion(const Call &call, Answer *) {
    const char *name = call.record.switchName;
    const uint32_t version = call.record.version;
    const HYP_ReturnStatus status = DVSState_SwitchSetVersion(name, version);
    if (status != HYP_OK) return status;
    // If the version is also set as a property, keep the two equal.
    DVSDataEntry *entry = nullptr;
    if (DVSState_GlobalPropLookup(name, kSwitchVersionProp, &entry) != HYP_OK) return HYP_OK;
    return DVSState_GlobalPropSet(name, kSwitchVersionProp, &version, sizeof version,
                                  DVSData_PropType(entry));
}

} // namespace dvs::emulator
