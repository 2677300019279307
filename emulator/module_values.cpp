/* SPDX-License-Identifier: Apache-2.0 */
// The commands on properties, ports and uplink data: thin wrappers over the library's operations.

#include <charconv>
#include <cstring>

#include "emulator/module.h"
#include "emulator/reply_value.h"

namespace {

using dvs::emulator::Answer;
using dvs::emulator::Call;

using ReadProp = HYP_ReturnStatus (*)(DVSwitch *, const char *, void **, uint32_t *);

HYP_ReturnStatus ReplyWithProp(const Call &call, ReadProp read, Answer *answer) {
    DVSwitch *sw = DVSState_SwitchFind(call.record.switchName);
    if (!sw) return HYP_NOT_FOUND;
    void *value = nullptr;
    uint32_t size = 0;
    const HYP_ReturnStatus status = read(sw, call.record.propName, &value, &size);
    return status == HYP_OK ? dvs::emulator::ReplyWith(call, value, size, answer) : status;
}

DVSPort *FindPort(const Call &call) {
    return DVSState_PortFind(call.record.switchName, call.record.portId);
}

uint32_t SizeOf(const Call &call) {
    return static_cast<uint32_t>(call.value.size());
}

/// Parses the uplink's number as the library writes it: decimal digits only.
bool ParseUplink(const char *text, int32_t *uplink) {
    const char *end = text + std::strlen(text);
    const auto [stop, error] = std::from_chars(text, end, *uplink);
    return error == std::errc() && stop == end;
}

} // namespace

namespace dvs::emulator {

// Switch properties

HYP_ReturnStatus Module::GlobalPropGet(const Call &call, Answer *answer) {
    const HYP_ReturnStatus status = ReplyWithProp(call, DVSState_GlobalPropRead, answer);
    if (status != HYP_NOT_FOUND || std::strcmp(call.record.propName, kSwitchVersionProp) != 0) return status;
    DVSwitch *sw = DVSState_SwitchFind(call.record.switchName);
    return sw ? ReplyWith(call, &sw->version, sizeof sw->version, answer) : status;
}

HYP_ReturnStatus Module::GlobalPropSet(const Call &call, Answer *) {
    const HYP_ReturnStatus status = CheckValue(call.value.size());
    if (status != HYP_OK) return status;
    return DVSState_GlobalPropSet(call.record.switchName, call.record.propName, call.value.data(),
                                  SizeOf(call), call.record.propType);
}

HYP_ReturnStatus Module::GlobalPropClear(const Call &call, Answer *) {
    return DVSState_GlobalPropClear(call.record.switchName, call.record.propName);
}

HYP_ReturnStatus Module::HostPropGet(const Call &call, Answer *answer) {
    return ReplyWithProp(call, DVSState_HostPropRead, answer);
}

HYP_ReturnStatus Module::HostPropSet(const Call &call, Answer *) {
    const HYP_ReturnStatus status = CheckValue(call.value.size());
    if (status != HYP_OK) return status;
    return DVSState_HostPropSet(call.record.switchName, call.record.propName, call.value.data(), SizeOf(call),
                                call.record.propType);
}

HYP_ReturnStatus Module::HostPropClear(const Call &call, Answer *) {
    return DVSState_HostPropClear(call.record.switchName, call.record.propName);
}

// Ports

HYP_ReturnStatus Module::PortAdd(const Call &call, Answer *) {
    // Check the room, not the value limit: a port's data is a whole list, and a fetched port can be added
    // again.
    const HYP_ReturnStatus status = CheckRoom(call.value.size());
    if (status != HYP_OK) return status;
    return DVSState_PortDeserialize(call.record.switchName, call.record.portId, call.value.data(),
                                    SizeOf(call));
}

HYP_ReturnStatus Module::PortRemove(const Call &call, Answer *) {
    const HYP_ReturnStatus status = DVSState_PortRemove(call.record.switchName, call.record.portId);
    if (status == HYP_OK) RemoveExtras(call.record.switchName, call.record.portId);
    return status;
}

HYP_ReturnStatus Module::PortFind(const Call &call, Answer *) {
    return ::FindPort(call) ? HYP_OK : HYP_NOT_FOUND;
}

HYP_ReturnStatus Module::PortStateGet(const Call &call, Answer *answer) {
    DVSPort *port = ::FindPort(call);
    if (!port) return HYP_NOT_FOUND;
    void *serialized = nullptr;
    uint32_t size = 0;
    HYP_ReturnStatus status = DVSState_PortSerialize(port, &serialized, &size);
    if (status != HYP_OK) return status;
    Block state(serialized);
    status = ReplyWith(call, serialized, size, answer);
    answer->payload.owned = std::move(state);
    return status;
}

HYP_ReturnStatus Module::PortDataGet(const Call &call, Answer *answer) {
    DVSPort *port = ::FindPort(call);
    if (!port) return HYP_NOT_FOUND;
    void *value = nullptr;
    uint32_t size = 0;
    const HYP_ReturnStatus status = DVSState_PortDataGet(port, call.record.propName, &value, &size);
    return status == HYP_OK ? ReplyWith(call, value, size, answer) : status;
}

HYP_ReturnStatus Module::PortDataSet(const Call &call, Answer *) {
    DVSPort *port = ::FindPort(call);
    if (!port) return HYP_NOT_FOUND;
    const HYP_ReturnStatus status = CheckValue(call.value.size());
    if (status != HYP_OK) return status;
    return DVSState_PortDataSet(port, call.record.propName, call.value.data(), SizeOf(call),
                                call.record.propType);
}

HYP_ReturnStatus Module::PortDataClear(const Call &call, Answer *) {
    DVSPort *port = ::FindPort(call);
    return port ? DVSState_PortDataClear(port, call.record.propName)
                : static_cast<HYP_ReturnStatus>(HYP_NOT_FOUND);
}

// Uplink data: per port and uplink number

HYP_ReturnStatus Module::UplinkDataSet(const Call &call, Answer *) {
    int32_t uplink = 0;
    if (!ParseUplink(call.record.propName, &uplink)) return HYP_BAD_PARAM;
    DVSPort *port = ::FindPort(call);
    if (!port) return HYP_NOT_FOUND;
    // As with properties, an empty value is an error.
    if (call.value.empty()) return HYP_FAILURE;
    const HYP_ReturnStatus status = CheckValue(call.value.size());
    if (status != HYP_OK) return status;
    ExtrasOf(port).uplinks[uplink].assign(call.value.begin(), call.value.end());
    return HYP_OK;
}

HYP_ReturnStatus Module::UplinkDataGet(const Call &call, Answer *answer) {
    int32_t uplink = 0;
    if (!ParseUplink(call.record.propName, &uplink)) return HYP_BAD_PARAM;
    DVSPort *port = ::FindPort(call);
    if (!port) return HYP_NOT_FOUND;
    const auto &uplinks = ExtrasOf(port).uplinks;
    const auto found = uplinks.find(uplink);
    if (found == uplinks.end()) return HYP_NOT_FOUND;
    return ReplyWith(call, found->second.data(), static_cast<uint32_t>(found->second.size()), answer);
}

} // namespace dvs::emulator
