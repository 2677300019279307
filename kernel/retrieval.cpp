/* SPDX-License-Identifier: Apache-2.0 */
// The persistent state: the module's live state without data that is only valid while the host runs. Uses the
// fetch, the switch table as scratch, the state file and the filters. Used by the saves to the state file and
// the config store.

#include <cstdlib>
#include <cstring>
#include <string_view>

#include "dvs/file.h"
#include "kernel/log.h"
#include "kernel/scratch.h"
#include "platform/status_text.h"

namespace {

constexpr const char *kVolatilePart = ".volatile.";
constexpr const char *kOpaquePortset = "com.orbeno.common.portset.opaque";
constexpr const char *kPortPersist = "com.orbeno.common.port.volatile.persist";
constexpr std::string_view kTrue = "true";

/// Serialization skips ports of this type.
constexpr uint32_t kSkippedPort = 0;

void StripVolatile(DVSData *list) {
    if (list) (void)DVSHYPStripNamedProp(list, kVolatilePart); // the status only marks the end of the walk
}

/// Compares only the four bytes of "true", so longer values that begin with them match too.
bool IsOpaquePortset(DVSwitch *sw) {
    void *value = nullptr;
    uint32_t valueLen = 0;
    if (DVSState_HostPropRead(sw, kOpaquePortset, &value, &valueLen) != HYP_OK) return false;
    return std::string_view(static_cast<const char *>(value), valueLen).starts_with(kTrue);
}

/// True for ids of decimal digits only with a value above 999, at any length.
bool IsDynamicPortId(std::string_view id) {
    if (id.empty() || id.find_first_not_of("0123456789") != std::string_view::npos) return false;
    const std::size_t first = id.find_first_not_of('0');
    return first != std::string_view::npos && id.size() - first > 3;
}

/// Removes a port of an opaque port set with such an id: these ports do not persist.
bool RemoveDynamicPort(DVSPort *port, void *) {
    // Copy the id: the record is freed first.
    char id[sizeof port->portId];
    std::memcpy(id, port->portId, sizeof id);
    // This does not find ports that are not active; their type excludes them from the persistent state.
    if (IsDynamicPortId(std::string_view(id, strnlen(id, sizeof id))))
        (void)DVSState_PortRemove(DVS_SwitchId(port->owner), id);
    return false;
}

bool CleanPort(DVSPort *port, void *) {
    void *value = nullptr;
    const bool dropped = port->portType != DVS_PORT_ACTIVE ||
                         DVSState_PortDataRead(port, kPortPersist, &value, nullptr) == HYP_OK;
    if (dropped)
        port->portType = kSkippedPort;
    else
        StripVolatile(port->portData);
    return false;
}

bool CleanSwitch(DVSwitch *sw, void *) {
    StripVolatile(sw->globalPropList);
    StripVolatile(sw->hostPropList);
    if (IsOpaquePortset(sw)) DVSState_PortForEach(sw, RemoveDynamicPort, nullptr);
    DVSState_PortForEach(sw, CleanPort, nullptr);
    return false;
}

/// The last step of a retrieval, with the persistent state in the table.
HYP_ReturnStatus CleanAndSerialize(void **out, uint32_t *outLen) {
    DVSState_SwitchForEach(CleanSwitch, nullptr);
    return DVSState_ConfigSerialize(out, outLen);
}

/// The switches moved out of the table, and the ids of the non-persistent ones.
struct ParkedSwitches {
    DVSwitch *switches[32] = {};
    char removedIds[32][64] = {};

    ParkedSwitches() = default;
    ~ParkedSwitches() { DVSState_FreeDVSArray(switches); }
    ParkedSwitches(const ParkedSwitches &) = delete;
    ParkedSwitches &operator=(const ParkedSwitches &) = delete;
};

/// Loads the state file into the empty table.
HYP_ReturnStatus LoadStateFile(const char *stateFile) {
    void *contents = nullptr;
    uint32_t contentsLen = 0;
    uint32_t alignOffset = 0;
    HYP_ReturnStatus status = DVSFile_Read(stateFile, &contents, &contentsLen, &alignOffset);
    if (status != HYP_OK) return status;
    status = DVSState_ConfigDeserialize(contents, contentsLen);
    if (status != HYP_OK) {
        // The contents stay allocated on this path, as documented in dvs/hyp.h.
        dvs::hyp::Print("DVSState_ConfigDeserialize failed: %s\n", HYP_ReturnStatusToString(status));
        return status;
    }
    std::free(static_cast<char *>(contents) - alignOffset);
    return HYP_OK;
}

HYP_ReturnStatus PersistLoadedState(void **out, uint32_t *outLen, const char *stateFile) {
    ParkedSwitches parked;
    const bool fromFile =
        DVSState_StripDvsWithNoPersistFlag(parked.switches, parked.removedIds, stateFile != nullptr);
    if (fromFile) {
        const HYP_ReturnStatus status = LoadStateFile(stateFile);
        if (status != HYP_OK) return status;
        DVSState_UpdateGlobalSwsArray(parked.switches, parked.removedIds);
    }
    return CleanAndSerialize(out, outLen);
}

} // namespace

extern "C" HYP_ReturnStatus DVSHYP_PersistentStateGet(void **out, uint32_t *outLen) {
    return DVSHYP_PersistentStateGetWithFile(out, outLen, nullptr);
}

extern "C" HYP_ReturnStatus DVSHYP_PersistentStateGetWithFile(void **out, uint32_t *outLen,
                                                              const char *stateFile) {
    return dvs::hyp::WithModuleState([&] { return PersistLoadedState(out, outLen, stateFile); });
}

extern "C" HYP_ReturnStatus DVSHYP_PersistentPortStateGet(const char *switchName, const char *portId,
                                                          uint32_t dvsVersion, void **out, uint32_t *outLen) {
    dvs::hyp::List list;
    const HYP_ReturnStatus status = dvs::hyp::FetchPortData(switchName, portId, &list);
    if (status != HYP_OK) return status;
    StripVolatile(list.get());
    return DVSData_Serialize(list.get(), out, outLen, dvsVersion);
}
