/* SPDX-License-Identifier: Apache-2.0 */
// The commands. Each fills the record's fields that it uses and sends the record through the device channel.
// The module's status is returned unchanged.

#include <cstdio>

#include "kernel/request.h"

namespace {

using dvs::hyp::Command;

/// A record under construction. Setters name the fields; Call and Fetch send it.
class Request {
public:
    explicit Request(Command command) : command_(command) {}

    Request &Switch(const char *name) { return dvs::hyp::SetText(record_.switchName, name), *this; }
    Request &Port(const char *id) { return dvs::hyp::SetText(record_.portId, id), *this; }
    Request &Name(const char *name) { return dvs::hyp::SetText(record_.propName, name), *this; }
    Request &MaxPorts(uint32_t ports) { return record_.maxPorts = ports, *this; }
    Request &Version(uint32_t version) { return record_.version = version, *this; }

    /// Uplink data is addressed by the uplink's number, as text in the property name.
    Request &Uplink(int uplink) {
        std::snprintf(record_.propName, sizeof record_.propName, "%d", uplink);
        return *this;
    }

    Request &Value(const void *value, uint32_t size) {
        record_.data = dvs::hyp::Address(value);
        record_.dataLen = size;
        return *this;
    }
    Request &Value(const void *value, uint32_t size, uint32_t propType) {
        record_.propType = propType;
        return Value(value, size);
    }

    HYP_ReturnStatus Call() { return DVSHYP_Ioctl(NumberOf(command_), &record_); }
    HYP_ReturnStatus Fetch(void **out, uint32_t *outLen) {
        return dvs::hyp::Fetch(command_, &record_, out, outLen);
    }

private:
    Command command_;
    DVSHYPRequest record_{};
};

HYP_ReturnStatus GetSwitchProp(Command command, const char *switchName, const char *propName, void **out,
                               uint32_t *outLen) {
    return Request(command).Switch(switchName).Name(propName).Fetch(out, outLen);
}

HYP_ReturnStatus SetSwitchProp(Command command, const char *switchName, const char *propName,
                               const void *value, uint32_t len, uint32_t propType) {
    return Request(command).Switch(switchName).Name(propName).Value(value, len, propType).Call();
}

} // namespace

// Whole states

extern "C" HYP_ReturnStatus DVSHYP_StateInit(const void *state, uint32_t len) {
    return Request(Command::StateInit).Value(state, len).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_StateCleanup(void) {
    return Request(Command::StateCleanup).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_StateSanitize(void) {
    return Request(Command::StateSanitize).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_StateGet(void **out, uint32_t *outLen) {
    return Request(Command::StateGet).Fetch(out, outLen);
}

// Switches

extern "C" HYP_ReturnStatus DVSHYP_SwitchAdd(const char *switchName, const char *className, uint32_t maxPorts,
                                             uint32_t version) {
    return Request(Command::SwitchAdd)
        .Switch(switchName)
        .Name(className)
        .MaxPorts(maxPorts)
        .Version(version)
        .Call();
}

extern "C" HYP_ReturnStatus DVSHYP_SwitchRemove(const char *switchName) {
    return Request(Command::SwitchRemove).Switch(switchName).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_SwitchAssociate(const char *switchName) {
    return Request(Command::SwitchAssociate).Switch(switchName).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_SwitchDissociate(const char *switchName) {
    return Request(Command::SwitchDissociate).Switch(switchName).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_SwitchSetMaxPorts(const char *switchName, uint32_t maxPorts) {
    return Request(Command::SwitchSetMaxPorts).Switch(switchName).MaxPorts(maxPorts).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_SwitchSetVersion(const char *switchName, uint32_t version) {
    return Request(Command::SwitchSetVersion).Switch(switchName).Version(version).Call();
}

// Switch properties

extern "C" HYP_ReturnStatus DVSHYP_GlobalPropGet(const char *switchName, const char *propName, void **out,
                                                 uint32_t *outLen) {
    return GetSwitchProp(Command::GlobalPropGet, switchName, propName, out, outLen);
}

extern "C" HYP_ReturnStatus DVSHYP_GlobalPropSet(const char *switchName, const char *propName,
                                                 const void *value, uint32_t len, uint32_t propType) {
    return SetSwitchProp(Command::GlobalPropSet, switchName, propName, value, len, propType);
}

extern "C" HYP_ReturnStatus DVSHYP_GlobalPropClear(const char *switchName, const char *propName) {
    return DVSHYPSwitchPropClear(switchName, propName, static_cast<uint32_t>(Command::GlobalPropClear));
}

extern "C" HYP_ReturnStatus DVSHYP_HostPropGet(const char *switchName, const char *propName, void **out,
                                               uint32_t *outLen) {
    return GetSwitchProp(Command::HostPropGet, switchName, propName, out, outLen);
}

extern "C" HYP_ReturnStatus DVSHYP_HostPropSet(const char *switchName, const char *propName,
                                               const void *value, uint32_t len, uint32_t propType) {
    return SetSwitchProp(Command::HostPropSet, switchName, propName, value, len, propType);
}

extern "C" HYP_ReturnStatus DVSHYP_HostPropClear(const char *switchName, const char *propName) {
    return DVSHYPSwitchPropClear(switchName, propName, static_cast<uint32_t>(Command::HostPropClear));
}

extern "C" HYP_ReturnStatus DVSHYPSwitchPropClear(const char *switchName, const char *propName,
                                                  uint32_t command) {
    return Request(static_cast<Command>(command)).Switch(switchName).Name(propName).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_SmartNICGlobalPropGet(const char *switchName, const char *propName,
                                                         void **out, uint32_t *outLen) {
    return GetSwitchProp(Command::SmartNICGlobalPropGet, switchName, propName, out, outLen);
}

extern "C" HYP_ReturnStatus DVSHYP_SmartNICHostPropGet(const char *switchName, const char *propName,
                                                       void **out, uint32_t *outLen) {
    return GetSwitchProp(Command::SmartNICHostPropGet, switchName, propName, out, outLen);
}

// Ports

extern "C" HYP_ReturnStatus DVSHYP_PortAdd(const char *switchName, const char *portId, const void *portData,
                                           uint32_t len) {
    return Request(Command::PortAdd).Switch(switchName).Port(portId).Value(portData, len).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_PortRemove(const char *switchName, const char *portId) {
    return Request(Command::PortRemove).Switch(switchName).Port(portId).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_PortFind(const char *switchName, const char *portId) {
    return Request(Command::PortFind).Switch(switchName).Port(portId).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_PortStateGet(const char *switchName, const char *portId, void **out,
                                                uint32_t *outLen) {
    return Request(Command::PortStateGet).Switch(switchName).Port(portId).Fetch(out, outLen);
}

extern "C" HYP_ReturnStatus DVSHYP_PortDataGet(const char *switchName, const char *portId,
                                               const char *propName, void **out, uint32_t *outLen) {
    return Request(Command::PortDataGet).Switch(switchName).Port(portId).Name(propName).Fetch(out, outLen);
}

extern "C" HYP_ReturnStatus DVSHYP_PortDataSet(const char *switchName, const char *portId,
                                               const char *propName, const void *value, uint32_t len,
                                               uint32_t propType) {
    return Request(Command::PortDataSet)
        .Switch(switchName)
        .Port(portId)
        .Name(propName)
        .Value(value, len, propType)
        .Call();
}

extern "C" HYP_ReturnStatus DVSHYP_PortDataClear(const char *switchName, const char *portId,
                                                 const char *propName) {
    return Request(Command::PortDataClear).Switch(switchName).Port(portId).Name(propName).Call();
}

extern "C" HYP_ReturnStatus DVSHYP_UplinkDataSet(const char *switchName, const char *portId, int uplink,
                                                 const void *value, uint32_t len, uint32_t propType) {
    return Request(Command::UplinkDataSet)
        .Switch(switchName)
        .Port(portId)
        .Uplink(uplink)
        .Value(value, len, propType)
        .Call();
}

extern "C" HYP_ReturnStatus DVSHYP_UplinkDataGet(const char *switchName, const char *portId, int uplink,
                                                 void **out, uint32_t *outLen) {
    return Request(Command::UplinkDataGet).Switch(switchName).Port(portId).Uplink(uplink).Fetch(out, outLen);
}

extern "C" HYP_ReturnStatus DVSHYP_SmartNICPortDataGet(const char *switchName, const char *portId,
                                                       const char *propName, void **out, uint32_t *outLen) {
    return Request(Command::SmartNICPortDataGet)
        .Switch(switchName)
        .Port(portId)
        .Name(propName)
        .Fetch(out, outLen);
}
