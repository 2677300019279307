/* SPDX-License-Identifier: Apache-2.0 */
// The reference implementation of state serialization (level_by_level.h), built on the exported list
// operations.

#include "dvsstate/level_by_level.h"

#include <cstring>
#include <utility>

#include "dvsstate/message.h"
#include "dvsstate/names.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/port_table.h"
#include "dvsstate/switch_table.h"

namespace dvs::test::plain {

using namespace dvs::state;

namespace {

/// Owns a buffer that a list serialized; frees it with that list.
class ListBuffer {
public:
    explicit ListBuffer(DVSData *list) : list_(list) {}
    ~ListBuffer() {
        if (buf) DVSData_FreeAssocData(list_, buf);
    }
    ListBuffer(const ListBuffer &) = delete;
    ListBuffer &operator=(const ListBuffer &) = delete;

    void *buf = nullptr;
    uint32_t len = 0;

private:
    DVSData *list_;
};

HYP_ReturnStatus DVSStateSerializeSubList(DVSData *parent, const char *name, DVSData *list,
                                          uint32_t version) {
    if (!list) return HYP_OK;
    ListBuffer nested(list);
    const HYP_ReturnStatus status =
        version == kFilteredVersion
            ? DVSData_SerializeExTypeProp(list, &nested.buf, &nested.len, kFilteredTypes)
            : DVSData_Serialize(list, &nested.buf, &nested.len, version);
    if (status != HYP_OK) return status;
    return DVSData_Update(parent, name, nested.buf, nested.len, kStatePropType);
}

/// One of the five leading entries of a switch, with its own failure message.
HYP_ReturnStatus Reported(HYP_ReturnStatus status, const char *what, const DVSwitch *sw) {
    if (status != HYP_OK) {
        Message(kError, "Failed to add switch %s %s, return %s\n", sw->switchId, what, Text(status));
        Message(kTrace, "Add DVS(%s) property list succesfully\n", sw->switchId);
    }
    return status;
}

HYP_ReturnStatus AddFields(DVSData *list, DVSwitch *sw) {
    char className[128] = {};
    std::memcpy(className, sw->className, strnlen(sw->className, sizeof className));
    HYP_ReturnStatus status =
        Reported(DVSData_Update(list, kSwitchVersion, &sw->version, sizeof sw->version, kStatePropType),
                 "version", sw);
    if (status != HYP_OK) return status;
    status = Reported(DVSData_Update(list, kClassName, className, sizeof className, kStatePropType),
                      "class name", sw);
    if (status != HYP_OK) return status;
    status =
        Reported(DVSData_Update(list, kMaxPorts, &sw->newMaxPorts, sizeof sw->newMaxPorts, kStatePropType),
                 "max ports", sw);
    if (status != HYP_OK) return status;
    status = Reported(DVSStateSerializeSubList(list, kGlobalPropList, sw->globalPropList, sw->version),
                      "global property list", sw);
    if (status != HYP_OK) return status;
    status = Reported(DVSStateSerializeSubList(list, kHostPropList, sw->hostPropList, sw->version),
                      "host property list", sw);
    if (status == HYP_OK) Message(kTrace, "Add DVS(%s) property list succesfully\n", sw->switchId);
    return status;
}

HYP_ReturnStatus AddPorts(DVSData *list, DVSwitch *sw) {
    HYP_ReturnStatus status = HYP_OK;
    WalkPorts(sw, [&](DVSPort *port) {
        if (port->portType == 0) return false;
        ListBuffer nested(port->portData);
        status = PortSerialize(port, &nested.buf, &nested.len);
        if (status == HYP_OK)
            status = DVSData_Append(list, port->portId, nested.buf, nested.len, kStatePropType);
        return status != HYP_OK;
    });
    return status;
}

} // namespace

HYP_ReturnStatus PortSerialize(DVSPort *port, void **buf, uint32_t *len) {
    Message(kDetail, "DVSState_PortSerialize %s\n", port->portId);
    const uint32_t version = port->owner->version;
    DVSData *list = port->portData;
    if (port->portType == DVS_PORT_ACTIVE || FindEntry(list, kPortKind))
        return DVSData_Serialize(list, buf, len, version);
    // Writes the kind with the data, then restores the list, without messages.
    const int32_t level = std::exchange(dvsdata_debug, -1);
    HYP_ReturnStatus status =
        DVSData_Append(list, kPortKind, &port->portType, sizeof port->portType, kStatePropType);
    dvsdata_debug = level;
    if (status != HYP_OK) return status;
    status = DVSData_Serialize(list, buf, len, version);
    dvsdata_debug = -1;
    (void)DVSData_Remove(list, kPortKind);
    dvsdata_debug = level;
    return status;
}

HYP_ReturnStatus SwitchSerialize(DVSwitch *sw, void **buf, uint32_t *len) {
    Message(kTrace, "DVSState_SwitchSerialize %s\n", sw->switchId);
    OwnedList list;
    HYP_ReturnStatus status = NewList(list);
    if (status != HYP_OK) return status;
    status = AddFields(list.get(), sw);
    if (status == HYP_OK) status = AddPorts(list.get(), sw);
    if (status == HYP_OK) status = DVSData_Serialize(list.get(), buf, len, sw->version);
    Message(kTrace, "DVSState_SwitchDeserialize dvs %s return %s\n", sw->switchId, Text(status));
    return status;
}

HYP_ReturnStatus ConfigSerialize(void **buf, uint32_t *len) {
    Message(kTrace, "DVSState_ConfigSerialize\n");
    OwnedList state;
    HYP_ReturnStatus status = NewList(state);
    if (status != HYP_OK) {
        Message(kError, "DVSState_ConfigSerialize, alloc failed\n");
        return status;
    }
    {
        const StateLock lock;
        for (DVSwitch *sw : dvsSwitchTable) {
            if (!sw) continue;
            ListBuffer nested(state.get());
            status = SwitchSerialize(sw, &nested.buf, &nested.len);
            if (status == HYP_OK)
                status = DVSData_Update(state.get(), sw->switchId, nested.buf, nested.len, kStatePropType);
            if (status == HYP_OK) continue;
            Message(kError, "DVSStateConfigSerializeCB DVS %s failed %s\n", sw->switchId, Text(status));
            return HYP_EXISTS;
        }
    }
    return DVSData_Serialize(state.get(), buf, len, kStateVersion);
}

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

HYP_ReturnStatus LoadPorts(DVSwitch *sw, DVSData *list) {
    for (DVSDataEntry *entry = nullptr; DVSData_Next(list, entry, &entry) == HYP_OK;) {
        void *data = nullptr;
        const uint32_t size = DVSData_Data(entry, &data);
        const HYP_ReturnStatus status = PortAddDeserialize(sw, DVSData_Name(entry), data, size);
        if (status != HYP_OK) return status;
    }
    return HYP_OK;
}

void Replace(DVSData *&old, OwnedList &list) {
    DVSData_Free(old);
    old = list.release();
}

} // namespace

HYP_ReturnStatus PortAddDeserialize(DVSwitch *sw, const char *portId, const void *buf, uint32_t len) {
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
    if (status == HYP_OK) (void)data.release(); // the port owns it from here on
    return status;
}

HYP_ReturnStatus SwitchDeserialize(const char *switchId, const void *buf, uint32_t len) {
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
    status = LoadPorts(sw, list.get());
    if (status != HYP_OK && create) (void)DVSStateSwitchRemove(switchId);
    Message(status == HYP_OK ? kTrace : kError, "Deserialize dvs %s return %s\n", switchId, Text(status));
    return status;
}

HYP_ReturnStatus ConfigDeserialize(const void *buf, uint32_t len) {
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
        status = SwitchDeserialize(DVSData_Name(entry), data, size);
        if (status == HYP_OK) continue;
        Message(kError, "DVSState_SwitchDeserialize failed %s\n", Text(status));
        (void)DVSState_ConfigReset(); // the first failure is the one to report
        return status;
    }
    return HYP_OK;
}

} // namespace dvs::test::plain
