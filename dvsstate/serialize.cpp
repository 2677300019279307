/* SPDX-License-Identifier: Apache-2.0 */
// Serialization of ports, switches and the whole switch table, level by level. Leans on the exported list
// operations.

#include "dvsstate/message.h"
#include "dvsstate/names.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/port_table.h"
#include "dvsstate/switch_table.h"

using namespace dvs::state;

namespace {

/// A buffer that a list's serialization made, given back to that list.
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
    HYP_ReturnStatus status =
        Reported(DVSData_Update(list, kSwitchVersion, &sw->version, sizeof sw->version, kStatePropType),
                 "version", sw);
    if (status != HYP_OK) return status;
    status = Reported(DVSData_Update(list, kClassName, sw->className, sizeof sw->className, kStatePropType),
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
        status = DVSState_PortSerialize(port, &nested.buf, &nested.len);
        if (status == HYP_OK)
            status = DVSData_Append(list, port->portId, nested.buf, nested.len, kStatePropType);
        return status != HYP_OK;
    });
    return status;
}

} // namespace

HYP_ReturnStatus DVSState_PortSerialize(DVSPort *port, void **buf, uint32_t *len) {
    Message(kDetail, "DVSState_PortSerialize %s\n", port->portId);
    const uint32_t version = port->owner->version;
    DVSData *list = port->portData;
    if (port->portType == DVS_PORT_ACTIVE || FindEntry(list, kPortKind))
        return DVSData_Serialize(list, buf, len, version);
    // The kind goes out with the data; the list itself is left as it was found.
    HYP_ReturnStatus status =
        DVSData_Append(list, kPortKind, &port->portType, sizeof port->portType, kStatePropType);
    if (status != HYP_OK) return status;
    status = DVSData_Serialize(list, buf, len, version);
    (void)DVSData_Remove(list, kPortKind);
    return status;
}

HYP_ReturnStatus DVSState_SwitchSerialize(DVSwitch *sw, void **buf, uint32_t *len) {
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

HYP_ReturnStatus DVSState_ConfigSerialize(void **buf, uint32_t *len) {
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
            status = DVSState_SwitchSerialize(sw, &nested.buf, &nested.len);
            if (status == HYP_OK)
                status = DVSData_Update(state.get(), sw->switchId, nested.buf, nested.len, kStatePropType);
            if (status == HYP_OK) continue;
            Message(kError, "DVSStateConfigSerializeCB DVS %s failed %s\n", sw->switchId, Text(status));
            return HYP_EXISTS;
        }
    }
    return DVSData_Serialize(state.get(), buf, len, kStateVersion);
}
