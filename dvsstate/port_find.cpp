/* SPDX-License-Identifier: Apache-2.0 */
// Finds ports by id, by the UUID of their switch and by alias, and walks them. Uses the port table; used by
// the kernel interface and the config store.

#include "dvsstate/message.h"
#include "dvsstate/names.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/port_table.h"
#include "dvsstate/uuid_text.h"

using namespace dvs::state;

namespace {

DVSPort *FindById(const char *switchId, const char *portId, uint32_t kind) {
    return DVSState_FindPortByIDAndType(DVSState_SwitchFind(switchId), portId, kind);
}

DVSPort *DVSStatePortFindByAliasOnDVS(DVSwitch *sw, std::string_view alias, uint32_t kind) {
    DVSPort *found = nullptr;
    if (!sw) return found;
    WalkPorts(sw, [&](DVSPort *port) {
        if (port->portType != kind) return false;
        DVSDataEntry *entry = FindEntry(port->portData, kPortAlias);
        if (entry && TextOf(entry) == alias) found = port;
        return found != nullptr;
    });
    return found;
}

DVSPort *DVSStatePortFindByAlias(const char *switchAlias, const char *portAlias, uint32_t kind) {
    return DVSStatePortFindByAliasOnDVS(DVSState_SwitchFindByAlias(switchAlias), portAlias, kind);
}

} // namespace

DVSPort *DVSState_FindPortByIDAndType(DVSwitch *sw, const char *portId, uint32_t kind) {
    return sw ? FindPort(sw, portId, kind) : nullptr;
}

DVSPort *DVSState_PortFindOnDVSwitch(DVSwitch *sw, const char *portId) {
    DVSPort *port = DVSState_FindPortByIDAndType(sw, portId, DVS_PORT_ACTIVE);
    return port ? port : DVSState_FindPortByIDAndType(sw, portId, DVS_PORT_LOCAL_CACHE);
}

DVSPort *DVSState_PortFind(const char *switchId, const char *portId) {
    return DVSState_PortFindOnDVSwitch(DVSState_SwitchFind(switchId), portId);
}

DVSPort *DVSState_PortFindShadow(const char *switchId, const char *portId) {
    return FindById(switchId, portId, DVS_PORT_SHADOW);
}

DVSPort *DVSState_PortFindZombie(const char *switchId, const char *portId) {
    return FindById(switchId, portId, DVS_PORT_ZOMBIE);
}

DVSPort *DVSState_LocalCachePortFind(const char *switchId, const char *portId) {
    return FindById(switchId, portId, DVS_PORT_LOCAL_CACHE);
}

DVSPort *DVSState_PortFindByUUID(const uint8_t uuid[16], const char *portId) {
    const auto switchId = UuidText(uuid);
    DVSPort *port = DVSState_PortFind(switchId.data(), portId);
    // Known quirk, kept: the first lookup already tried the local-cache ports.
    return port ? port : DVSState_LocalCachePortFind(switchId.data(), portId);
}

DVSPort *DVSState_PortFindShadowByUUID(const uint8_t uuid[16], const char *portId) {
    return DVSState_PortFindShadow(UuidText(uuid).data(), portId);
}

DVSPort *DVSState_PortFindByAliasType(DVSwitch *sw, const char *alias, uint32_t kind) {
    return DVSStatePortFindByAliasOnDVS(sw, alias, kind);
}

DVSPort *DVSState_PortFindByAliasOnDVS(DVSwitch *sw, const char *alias) {
    DVSPort *port = DVSStatePortFindByAliasOnDVS(sw, alias, DVS_PORT_ACTIVE);
    return port ? port : DVSStatePortFindByAliasOnDVS(sw, alias, DVS_PORT_LOCAL_CACHE);
}

DVSPort *DVSState_PortFindByAlias(const char *switchAlias, const char *portAlias) {
    return DVSStatePortFindByAlias(switchAlias, portAlias, DVS_PORT_ACTIVE);
}

DVSPort *DVSState_PortFindShadowByAlias(const char *switchAlias, const char *portAlias) {
    return DVSStatePortFindByAlias(switchAlias, portAlias, DVS_PORT_SHADOW);
}

void DVSState_PortForEach(DVSwitch *sw, DVSPortForEachFn callback, void *arg) {
    if (sw) WalkPorts(sw, [&](DVSPort *port) { return callback(port, arg); });
}

const char *DVS_PortId(DVSPort *port) {
    return port->portId;
}

const char *DVS_PortAlias(DVSPort *port) {
    DVSDataEntry *entry = FindEntry(port->portData, kPortAlias);
    if (!entry) return kUnknown;
    void *data = nullptr;
    DVSData_Data(entry, &data);
    return static_cast<const char *>(data);
}
