/* SPDX-License-Identifier: Apache-2.0 */
// Queries: one list of the module's state, reduced to the requested entries, and the list of a switch's
// ports. Uses the switch table as scratch, and the filters.

#include <cstdlib>
#include <cstring>
#include <span>
#include <string_view>

#include "dvsstate/versions.h"
#include "kernel/filters.h"
#include "kernel/request.h"
#include "kernel/scratch.h"

namespace {

using dvs::hyp::List;

constexpr const char *kSwitchVersion = "com.orbeno.common.version";
constexpr const char *kConnectionId = "com.orbeno.common.port.connectid";
constexpr const char *kExtraConfig = "com.orbeno.extraconfig.";
constexpr const char *kPortExtraConfig = "com.orbeno.port.extraConfig";
constexpr std::string_view kPortsetFc = "com.orbeno.net.portset.fc.";

/// Port data of this type belongs to the platform also below "com.orbeno.net.".
constexpr uint32_t kDefaultType = 32;

/// The type for which overlay queries keep kPortsetFc entries of any type.
constexpr uint32_t kStateType = 16;

const char *kKeptVswitchNames[] = {"com.orbeno.vswitch.disabled", nullptr};

struct PlatformName {
    const char *needle;
    const char **keep;
};

/// The names that a vendor query of a switch removes, in this order.
constexpr PlatformName kPlatformNames[] = {
    {"com.orbeno.common.", nullptr},
    {"com.orbeno.etherswitch.", nullptr},
    {"com.orbeno.vswitch.", kKeptVswitchNames},
    {"dvfilter-generic-", nullptr},
    {"com.orbeno.ovlData.", nullptr},
};

constexpr PlatformName kNewerPlatformNames[] = {
    {"com.orbeno.vswitch.teaming", nullptr},
    {"com.orbeno.ovl.vdr.dvptracking", nullptr},
};

/// The names that a vendor query of a port removes, in this order.
constexpr PlatformName kPortPlatformNames[] = {
    {"com.orbeno.common.", nullptr},
    {"com.orbeno.etherswitch.", nullptr},
    {"com.orbeno.vswitch.", nullptr},
    {"com.orbeno.port.extraConfig.", nullptr},
    {"com.orbeno.port.opaque.network", nullptr},
    {"dvfilter-generic-", nullptr},
};

constexpr std::string_view kOverlayPrefixes[] = {
    "com.orbeno.ovlData.",          "com.orbeno.vswitch.teaming",        "com.orbeno.ovl.",
    "com.orbeno.common.opaqueDvs.", "com.orbeno.host.feature.container", "com.orbeno.extraconfig.opaqueDvs.",
    "com.orbeno.vswitch.disabled",  "com.orbeno.net.portset.fc.",        "com.orbeno.extraConfig.sddcaas.",
};

/// Moves a list out of the switch, so that the table's reset does not free it. Returns an empty list if the
/// switch has none, and null if out of memory.
List Detach(DVSData **member) {
    List list(*member);
    *member = nullptr;
    return list ? std::move(list) : dvs::hyp::NewList();
}

/// Common part of the switch-level queries: reduces one list of one switch and returns it on success only.
template <class Narrow>
HYP_ReturnStatus QuerySwitchList(const char *switchName, bool global, DVSData **out, Narrow &&narrow) {
    return dvs::hyp::WithModuleSwitch(switchName, [&](DVSwitch *sw) -> HYP_ReturnStatus {
        List list = Detach(global ? &sw->globalPropList : &sw->hostPropList);
        if (!list) return HYP_NO_MEMORY;
        narrow(list.get());
        *out = list.release();
        return HYP_OK;
    });
}

/// Applies the filters. Their status is ignored: they return HYP_NOT_FOUND at the end of the list.
void StripAll(DVSData *list, std::span<const PlatformName> names, uint32_t propType) {
    for (const PlatformName &name : names)
        (void)DVSHYPStripNamedPropForType(list, name.needle, name.keep, propType);
}

/// Returns false also if the module returns no version, or less than four bytes.
bool IsNewerSwitch(const char *switchName) {
    void *value = nullptr;
    uint32_t valueLen = 0;
    if (DVSHYP_GlobalPropGet(switchName, kSwitchVersion, &value, &valueLen) != HYP_OK) return false;
    const dvs::hyp::Buffer fetched(value);
    uint32_t version = 0;
    if (valueLen < sizeof version) return false;
    std::memcpy(&version, value, sizeof version);
    return dvs::state::IsOverlayVersion(version);
}

uint32_t ConnectionId(DVSPort *port) {
    void *value = nullptr;
    uint32_t valueLen = 0;
    uint32_t id = 0;
    if (DVSState_PortDataRead(port, kConnectionId, &value, &valueLen) != HYP_OK || valueLen < sizeof id)
        return 0;
    std::memcpy(&id, value, sizeof id);
    return id;
}

/// A port list being filled; `capacity` entries were allocated.
struct PortListFill {
    DVSHYPPortList *list;
    uint32_t capacity;
};

bool AppendPortOfType(DVSPort *port, void *arg) {
    auto *fill = static_cast<PortListFill *>(arg);
    DVSHYPPortList *list = fill->list;
    if (port->portType != list->portType) return false;
    if (list->numEntries == fill->capacity) return true;
    DVSHYPPortListEntry *entry = &list->entries[list->numEntries++];
    dvs::hyp::SetText(entry->portId, DVS_PortId(port));
    entry->connectionId = ConnectionId(port);
    return false;
}

} // namespace

extern "C" HYP_ReturnStatus DVSHYPVendorPropList(const char *switchName, DVSData **out, uint32_t propType,
                                                 bool host) {
    return QuerySwitchList(switchName, !host, out, [&](DVSData *list) {
        if (!host) (void)DVSHYPStripNamedPropForType(list, kExtraConfig, nullptr, propType);
        StripAll(list, kPlatformNames, propType);
        if (IsNewerSwitch(switchName)) StripAll(list, kNewerPlatformNames, propType);
    });
}

extern "C" HYP_ReturnStatus DVSHYP_VendorGlobalPropList(const char *switchName, DVSData **out,
                                                        uint32_t propType) {
    return DVSHYPVendorPropList(switchName, out, propType, false);
}

extern "C" HYP_ReturnStatus DVSHYP_VendorHostPropList(const char *switchName, DVSData **out,
                                                      uint32_t propType) {
    return DVSHYPVendorPropList(switchName, out, propType, true);
}

extern "C" HYP_ReturnStatus DVSHYP_VendorPortPropList(const char *switchName, const char *portId,
                                                      DVSData **out, uint32_t propType) {
    List list;
    const HYP_ReturnStatus status = dvs::hyp::FetchPortData(switchName, portId, &list);
    if (status != HYP_OK) return status;
    StripAll(list.get(), kPortPlatformNames, propType);
    if (propType == kDefaultType)
        (void)DVSHYPStripNamedPropForType(list.get(), "com.orbeno.net.", nullptr, propType);
    *out = list.release();
    return HYP_OK;
}

extern "C" HYP_ReturnStatus DVSHYP_ExtraConfigPropList(const char *switchName, DVSData **out,
                                                       uint32_t propType) {
    return QuerySwitchList(switchName, true, out, [&](DVSData *list) {
        (void)DVSHYPExtractNamedPropForType(list, kExtraConfig, propType);
    });
}

extern "C" HYP_ReturnStatus DVSHYP_ExtraConfigPortPropList(const char *switchName, const char *portId,
                                                           DVSData **out, uint32_t propType) {
    List list;
    const HYP_ReturnStatus status = dvs::hyp::FetchPortData(switchName, portId, &list);
    if (status != HYP_OK) return status;
    (void)DVSHYPExtractNamedPropForType(list.get(), kPortExtraConfig, propType);
    *out = list.release();
    return HYP_OK;
}

extern "C" bool IsOvlProp(const char *name) {
    const std::string_view text(name);
    for (const std::string_view prefix : kOverlayPrefixes) {
        if (text.starts_with(prefix)) return true;
    }
    return false;
}

extern "C" HYP_ReturnStatus DVSHYP_OvlPropList(const char *switchName, uint32_t propType, bool global,
                                               DVSData **out) {
    return QuerySwitchList(switchName, global, out, [&](DVSData *list) {
        (void)dvs::hyp::KeepIf(list, [&](const DVSDataEntry *entry) {
            const char *name = DVSData_Name(entry);
            if (DVSData_IsSamePropType(entry, propType) && IsOvlProp(name)) return true;
            return propType == kStateType && std::string_view(name).starts_with(kPortsetFc);
        });
    });
}

extern "C" HYP_ReturnStatus DVSHYP_SwitchPortList(const char *switchName, DVSHYPPortList **out,
                                                  uint32_t portType) {
    return dvs::hyp::WithModuleSwitch(switchName, [&](DVSwitch *sw) -> HYP_ReturnStatus {
        const uint32_t ports = sw->numPorts;
        const std::size_t size = sizeof(DVSHYPPortList) + std::size_t{ports} * sizeof(DVSHYPPortListEntry);
        auto *list = static_cast<DVSHYPPortList *>(std::calloc(1, size));
        if (!list) return HYP_NO_MEMORY;
        list->portType = portType;
        PortListFill fill{list, ports};
        DVSState_PortForEach(sw, AppendPortOfType, &fill);
        *out = list;
        return HYP_OK;
    });
}
