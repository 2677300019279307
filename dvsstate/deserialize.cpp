/* SPDX-License-Identifier: Apache-2.0 */
// Ports, switches and the whole switch table from serialized state, level by level, and the reset of the
// table. Leans on the exported list operations, the switch table and the port table.

#include "dvsstate/message.h"
#include "dvsstate/names.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/port_table.h"
#include "dvsstate/switch_table.h"

#include <cstring>

using namespace dvs::state;

namespace {

struct SwitchFields {
    uint32_t version = 0;
    std::string_view className;
    uint32_t maxPorts = 0;
};

/// The u32 an entry starts with. HYP_BAD_PARAM when it is shorter.
HYP_ReturnStatus ReadU32(DVSDataEntry *entry, uint32_t *value) {
    void *data = nullptr;
    if (DVSData_Data(entry, &data) < sizeof *value) return HYP_BAD_PARAM;
    std::memcpy(value, data, sizeof *value);
    return HYP_OK;
}

HYP_ReturnStatus DVSStateDeserializeSubList(DVSData *parent, const char *name, OwnedList &list) {
    DVSDataEntry *entry = FindEntry(parent, name);
    if (!entry) return HYP_OK;
    void *data = nullptr;
    const uint32_t size = DVSData_Data(entry, &data);
    const HYP_ReturnStatus status = DeserializeOwned(list, data, size);
    if (status == HYP_OK) (void)DVSData_Remove(parent, name);
    return status;
}

HYP_ReturnStatus ReadFields(DVSData *list, SwitchFields *fields) {
    DVSDataEntry *entry = nullptr;
    HYP_ReturnStatus status = DVSData_Lookup(list, kSwitchVersion, &entry);
    if (status != HYP_OK) {
        Message(kError, "Failed to find switchVersion, status:%d\n\n", static_cast<int>(status));
        return status;
    }
    status = ReadU32(entry, &fields->version);
    if (status != HYP_OK) return status;
    status = DVSData_Lookup(list, kClassName, &entry);
    if (status != HYP_OK) return status;
    fields->className = TextOf(entry);
    status = DVSData_Lookup(list, kMaxPorts, &entry);
    if (status != HYP_OK) return status;
    return ReadU32(entry, &fields->maxPorts);
}

HYP_ReturnStatus CreateSwitch(const char *switchId, const SwitchFields &fields) {
    Message(kError, "Create DVS %s with portset %s\n", switchId, "");
    const HYP_ReturnStatus status =
        DVSStateSwitchAdd(switchId, fields.className, fields.maxPorts, fields.version);
    if (status != HYP_OK) {
        Message(kError, "Failed to add switch %s/%.*s/%s/%d\n", switchId,
                static_cast<int>(fields.className.size()), fields.className.data(), "",
                static_cast<int>(fields.maxPorts));
    }
    return status;
}

HYP_ReturnStatus AddPorts(DVSwitch *sw, DVSData *list) {
    for (DVSDataEntry *entry = nullptr; DVSData_Next(list, entry, &entry) == HYP_OK;) {
        void *data = nullptr;
        const uint32_t size = DVSData_Data(entry, &data);
        const HYP_ReturnStatus status = DVSState_PortAddDeserialize(sw, DVSData_Name(entry), data, size);
        if (status != HYP_OK) return status;
    }
    return HYP_OK;
}

void Replace(DVSData *&old, OwnedList &list) {
    DVSData_Free(old);
    old = list.release();
}

} // namespace

HYP_ReturnStatus DVSState_PortAddDeserialize(DVSwitch *sw, const char *portId, const void *buf,
                                             uint32_t len) {
    if (!sw) return HYP_NOT_FOUND;
    Message(kDetail, "Deserialize %s, %s\n", sw->switchId, portId);
    OwnedList data;
    HYP_ReturnStatus status = DeserializeOwned(data, buf, len);
    if (status != HYP_OK) return status;
    if (DVSDataEntry *entry = FindEntry(data.get(), kPortKind)) {
        uint32_t kind = 0;
        status = ReadU32(entry, &kind);
        if (status != HYP_OK) return status;
        status = DVSStatePortAdd(sw, portId, data.get(), kind, nullptr);
        Message(kError, "Deserialize DV port(type %d) %s, return %s\n", static_cast<int>(kind), portId,
                Text(status));
        (void)DVSData_Remove(data.get(), kPortKind);
    } else {
        status = DVSStatePortAdd(sw, portId, data.get(), DVS_PORT_ACTIVE, nullptr);
        Message(kError, "Add active DV port %s, return %s\n", portId, Text(status));
    }
    if (status == HYP_OK) (void)data.release(); // the port's from here on
    return status;
}

HYP_ReturnStatus DVSState_PortDeserialize(const char *switchId, const char *portId, const void *buf,
                                          uint32_t len) {
    return DVSState_PortAddDeserialize(DVSState_SwitchFind(switchId), portId, buf, len);
}

HYP_ReturnStatus DVSState_SwitchDeserialize(const char *switchId, const void *buf, uint32_t len) {
    Message(kTrace, "Deserialize DVS %s\n", switchId);
    OwnedList list, hostList, globalList;
    HYP_ReturnStatus status = DeserializeOwned(list, buf, len);
    if (status != HYP_OK) return status;
    status = DVSStateDeserializeSubList(list.get(), kHostPropList, hostList);
    if (status != HYP_OK) return status;
    status = DVSStateDeserializeSubList(list.get(), kGlobalPropList, globalList);
    if (status != HYP_OK) return status;
    SwitchFields fields;
    status = ReadFields(list.get(), &fields);
    if (status != HYP_OK) return status;

    const bool create = !DVSState_SwitchFind(switchId);
    if (create) {
        status = CreateSwitch(switchId, fields);
        if (status != HYP_OK) return status;
    }
    for (const char *name : {kClassName, kMaxPorts, kSwitchVersion})
        (void)DVSData_Remove(list.get(), name);
    DVSwitch *sw = DVSState_SwitchFind(switchId);
    if (!sw) {
        Message(kError, "DVS %s acquire failed\n", switchId);
        return HYP_NOT_FOUND;
    }
    Replace(sw->hostPropList, hostList);
    Replace(sw->globalPropList, globalList);
    status = AddPorts(sw, list.get());
    if (status != HYP_OK && create) (void)DVSStateSwitchRemove(switchId);
    Message(status == HYP_OK ? kTrace : kError, "Deserialize dvs %s return %s\n", switchId, Text(status));
    return status;
}

HYP_ReturnStatus DVSState_ConfigDeserialize(const void *buf, uint32_t len) {
    Message(kTrace, "DVSState_ConfigDeserialize\n");
    OwnedList state;
    HYP_ReturnStatus status = DeserializeOwned(state, buf, len);
    if (status != HYP_OK) {
        Message(kError, "DVSState_ConfigDeserialize failed %s\n", Text(status));
        return status;
    }
    for (DVSDataEntry *entry = nullptr; DVSData_Next(state.get(), entry, &entry) == HYP_OK;) {
        void *data = nullptr;
        const uint32_t size = DVSData_Data(entry, &data);
        status = DVSState_SwitchDeserialize(DVSData_Name(entry), data, size);
        if (status == HYP_OK) continue;
        Message(kError, "DVSState_SwitchDeserialize failed %s\n", Text(status));
        (void)DVSState_ConfigReset(); // the failure that led here is the one to tell
        return status;
    }
    return HYP_OK;
}
