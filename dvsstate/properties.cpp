/* SPDX-License-Identifier: Apache-2.0 */
// Host and global properties of a switch and the data of a port: thin operations over their property lists.
// Values are opaque bytes here; the converters of the config store interpret them.

#include <cstdarg>

#include "dvsstate/message.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/switch_table.h"

using namespace dvs::state;

namespace {

// The two families differ in their list and in the names in their traces.
struct Family {
    DVSData *DVSwitch::*list;
    const char *setTrace, *clearTrace, *lookupTrace, *readTrace, *isSetTrace;
};

constexpr Family kHost = {
    &DVSwitch::hostPropList,           "DVSState_HostPropSet %s, %s\n",
    "DVSState_HostPropClear %s, %s\n", "DVSState_HostPropLookup %s, %s\n",
    "DVSState_HostPropRead %s, %s\n",  "DVSState_HostPropIsSet %s: %s\n",
};

constexpr Family kGlobal = {
    &DVSwitch::globalPropList,           "DVSState_GlobalPropSet %s, %s\n",
    "DVSState_GlobalPropClear %s, %s\n", "DVSState_GlobalPropLookup %s, %s\n",
    "DVSState_GlobalPropRead %s, %s\n",  "DVSState_GlobalPropIsSet %s: %s\n",
};

/// Emits a trace from the tables above: a format with two texts, the switch id and the property's name.
void Trace(int level, const char *format, const char *switchId, const char *name) {
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
    Message(level, format, switchId, name);
#pragma GCC diagnostic pop
}

HYP_ReturnStatus Lookup(DVSData *list, const char *name, DVSDataEntry **entry) {
    return list ? DVSData_Lookup(list, name, entry) : static_cast<HYP_ReturnStatus>(HYP_NOT_FOUND);
}

HYP_ReturnStatus Read(DVSData *list, const char *name, void **data, uint32_t *len) {
    DVSDataEntry *entry = nullptr;
    const HYP_ReturnStatus status = Lookup(list, name, &entry);
    if (status != HYP_OK) return status;
    const uint32_t size = DVSData_Data(entry, data);
    if (len) *len = size;
    return HYP_OK;
}

HYP_ReturnStatus ForEach(DVSData *list, DVSPropForEachFn callback, void *arg) {
    if (!list) return HYP_NOT_FOUND;
    DVSDataEntry *entry = nullptr;
    for (;;) {
        const HYP_ReturnStatus status = DVSData_Next(list, entry, &entry);
        if (status != HYP_OK) return status; // HYP_NOT_FOUND: the walk is complete
        if (callback(entry, arg)) return true;
    }
}

/// Sets a property. Creates the list if the switch has none.
HYP_ReturnStatus Update(DVSData *&list, const char *name, const void *data, uint32_t len, uint32_t propType) {
    if (list) return DVSData_Update(list, name, data, len, propType);
    OwnedList made;
    HYP_ReturnStatus status = NewList(made);
    if (status != HYP_OK) return status;
    status = DVSData_Update(made.get(), name, data, len, propType);
    if (status == HYP_OK) list = made.release();
    return status;
}

HYP_ReturnStatus PropSet(const Family &family, const char *switchId, const char *name, const void *data,
                         uint32_t len, uint32_t propType) {
    if (!data || len == 0) return HYP_FAILURE;
    Trace(kTrace, family.setTrace, switchId, name);
    DVSwitch *sw = DVSState_SwitchFind(switchId);
    if (!sw) return HYP_NOT_FOUND;
    return Update(sw->*family.list, name, data, len, propType);
}

HYP_ReturnStatus PropClear(const Family &family, const char *switchId, const char *name) {
    Trace(kTrace, family.clearTrace, switchId, name);
    DVSwitch *sw = DVSState_SwitchFind(switchId);
    if (!sw || !(sw->*family.list)) return HYP_NOT_FOUND;
    return DVSData_Remove(sw->*family.list, name);
}

HYP_ReturnStatus PropLookup(const Family &family, const char *switchId, const char *name,
                            DVSDataEntry **entry) {
    Trace(kDetail, family.lookupTrace, switchId, name);
    DVSwitch *sw = DVSState_SwitchFind(switchId);
    if (!sw) return HYP_NOT_FOUND;
    return Lookup(sw->*family.list, name, entry);
}

HYP_ReturnStatus PropRead(const Family &family, DVSwitch *sw, const char *name, void **data, uint32_t *len) {
    Trace(kDetail, family.readTrace, sw->switchId, name);
    return Read(sw->*family.list, name, data, len);
}

bool PropIsSet(const Family &family, DVSwitch *sw, const char *name) {
    Trace(kDetail, family.isSetTrace, sw->switchId, name);
    return FindEntry(sw->*family.list, name) != nullptr;
}

} // namespace

HYP_ReturnStatus DVSState_HostPropSet(const char *switchId, const char *name, const void *data, uint32_t len,
                                      uint32_t propType) {
    return PropSet(kHost, switchId, name, data, len, propType);
}

HYP_ReturnStatus DVSState_HostPropClear(const char *switchId, const char *name) {
    return PropClear(kHost, switchId, name);
}

HYP_ReturnStatus DVSState_HostPropLookup(const char *switchId, const char *name, DVSDataEntry **entry) {
    return PropLookup(kHost, switchId, name, entry);
}

HYP_ReturnStatus DVSState_HostPropRead(DVSwitch *sw, const char *name, void **data, uint32_t *len) {
    return PropRead(kHost, sw, name, data, len);
}

bool DVSState_HostPropIsSet(DVSwitch *sw, const char *name) {
    return PropIsSet(kHost, sw, name);
}

HYP_ReturnStatus DVSState_HostPropForEach(DVSwitch *sw, DVSPropForEachFn callback, void *arg) {
    return ForEach(sw->hostPropList, callback, arg);
}

HYP_ReturnStatus DVSState_GlobalPropSet(const char *switchId, const char *name, const void *data,
                                        uint32_t len, uint32_t propType) {
    return PropSet(kGlobal, switchId, name, data, len, propType);
}

HYP_ReturnStatus DVSState_GlobalPropClear(const char *switchId, const char *name) {
    return PropClear(kGlobal, switchId, name);
}

HYP_ReturnStatus DVSState_GlobalPropLookup(const char *switchId, const char *name, DVSDataEntry **entry) {
    return PropLookup(kGlobal, switchId, name, entry);
}

HYP_ReturnStatus DVSState_GlobalPropRead(DVSwitch *sw, const char *name, void **data, uint32_t *len) {
    return PropRead(kGlobal, sw, name, data, len);
}

bool DVSState_GlobalPropIsSet(DVSwitch *sw, const char *name) {
    return PropIsSet(kGlobal, sw, name);
}

HYP_ReturnStatus DVSState_GlobalPropForEach(DVSwitch *sw, DVSPropForEachFn callback, void *arg) {
    return ForEach(sw->globalPropList, callback, arg);
}

namespace {

enum class DataOperation { Get, Set, Clear };

/// In- and outputs of the operation: the outputs of a get, the value of a set.
struct DataArguments {
    const void *value = nullptr;
    uint32_t size = 0;
    uint32_t propType = 0;
    void **data = nullptr;
    uint32_t *len = nullptr;
};

HYP_ReturnStatus RunDataOperation(DVSPort *port, const char *name, DataOperation operation,
                                  const DataArguments &arguments) {
    switch (operation) {
    case DataOperation::Set:
        if (!arguments.value || arguments.size == 0) return HYP_FAILURE;
        return Update(port->portData, name, arguments.value, arguments.size, arguments.propType);
    case DataOperation::Clear:
        return port->portData ? DVSData_Remove(port->portData, name)
                              : static_cast<HYP_ReturnStatus>(HYP_NOT_FOUND);
    case DataOperation::Get:
        break;
    }
    return Read(port->portData, name, arguments.data, arguments.len);
}

HYP_ReturnStatus DVSStatePortDataCommon(DVSPort *port, const char *name, DataOperation operation,
                                        const DataArguments &arguments) {
    const HYP_ReturnStatus status = RunDataOperation(port, name, operation, arguments);
    if (status != HYP_OK) {
        Message(kTrace, "DVSStatePortDataCommon failed to set/get data switch %s,port %s, data %s type %d\n",
                port->owner->switchId, port->portId, name, static_cast<int>(port->portType));
    }
    return status;
}

} // namespace

HYP_ReturnStatus DVSState_PortDataGet(DVSPort *port, const char *name, void **data, uint32_t *len) {
    Message(kDetail, "DVSState_PortDataGet %s, %s, %s\n", port->owner->switchId, port->portId, name);
    return DVSStatePortDataCommon(port, name, DataOperation::Get, {.data = data, .len = len});
}

HYP_ReturnStatus DVSState_PortDataSet(DVSPort *port, const char *name, const void *data, uint32_t len,
                                      uint32_t propType) {
    Message(kDetail, "DVSState_PortDataSet %s, %s, %s\n", port->owner->switchId, port->portId, name);
    return DVSStatePortDataCommon(port, name, DataOperation::Set,
                                  {.value = data, .size = len, .propType = propType});
}

HYP_ReturnStatus DVSState_PortDataClear(DVSPort *port, const char *name) {
    Message(kDetail, "DVSState_PortDataClear %s, %s, %s\n", port->owner->switchId, port->portId, name);
    return DVSStatePortDataCommon(port, name, DataOperation::Clear, {});
}

HYP_ReturnStatus DVSState_PortDataRead(DVSPort *port, const char *name, void **data, uint32_t *len) {
    return Read(port->portData, name, data, len);
}

HYP_ReturnStatus DVSState_PortDataForEach(DVSPort *port, DVSPropForEachFn callback, void *arg) {
    return ForEach(port->portData, callback, arg);
}
