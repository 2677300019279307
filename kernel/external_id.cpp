/* SPDX-License-Identifier: Apache-2.0 */
// Finds a port by the external id of its virtual adapter. This is the only command without its own request:
// it searches a fetched copy of the module's whole state.

#include <cstdlib>
#include <cstring>
#include <memory>
#include <string_view>

#include "kernel/request.h"
#include "kernel/scratch.h"

namespace {

/// Property names of a port's external id, in order of precedence.
constexpr const char *kExternalIdKeys[] = {
    "com.orbeno.port.extraConfig.vnic.external.id",
    "com.orbeno.port.extraConfig.hypnic.external.id",
};

bool ReadExternalId(DVSPort *port, std::string_view *id) {
    for (const char *key : kExternalIdKeys) {
        void *value = nullptr;
        uint32_t valueLen = 0;
        if (DVSState_PortDataRead(port, key, &value, &valueLen) != HYP_OK) continue;
        const char *text = static_cast<const char *>(value);
        *id = std::string_view(text, strnlen(text, valueLen));
        return true;
    }
    return false;
}

/// Matches if the stored id is a prefix of the requested id; an empty stored id always matches.
bool StopAtMatch(DVSPort *port, void *arg) {
    auto *result = static_cast<DVSHYPExternalIdResult *>(arg);
    std::string_view stored;
    if (!ReadExternalId(port, &stored)) return false;
    if (!std::string_view(result->externalId).starts_with(stored)) return false;
    dvs::hyp::SetText(result->portId, DVS_PortId(port));
    return true;
}

} // namespace

extern "C" HYP_ReturnStatus DVSHYP_PortGetByExternalId(const char *switchName, const char *externalId,
                                                       DVSHYPExternalIdResult **out) {
    if (std::strlen(externalId) >= sizeof(DVSHYPExternalIdResult::externalId)) return HYP_BAD_PARAM;
    return dvs::hyp::WithModuleSwitch(switchName, [&](DVSwitch *sw) -> HYP_ReturnStatus {
        auto *result = static_cast<DVSHYPExternalIdResult *>(std::calloc(1, sizeof(DVSHYPExternalIdResult)));
        if (!result) return HYP_NO_MEMORY;
        dvs::hyp::SetText(result->externalId, externalId);
        DVSState_PortForEach(sw, StopAtMatch, result);
        *out = result;
        return HYP_OK;
    });
}
