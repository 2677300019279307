/* SPDX-License-Identifier: Apache-2.0 */
// The save of the kernel's persistent state: fetched through the kernel interface, then saved like any
// buffer.

#include "dvs/configstore.h"

#include "configstore/log.h"
#include "dvs/hyp.h"
#include "platform/status_text.h"

int32_t DVSState_SaveToConfigStore_ByInstance(const char *switchId) {
    void *buf = nullptr;
    uint32_t len = 0;
    const HYP_ReturnStatus status = DVSHYP_PersistentStateGet(&buf, &len);
    if (status != HYP_OK) {
        dvs::config::Messages().Error(
            "Failed to save DVS config to configstore when get DVS buffrom hyp. Error: %s\n",
            HYP_ReturnStatusToString(status));
        return -1;
    }
    const int32_t saved = DVSState_SaveBufToConfigStore_ByInstance(buf, len, switchId);
    DVSHYP_DataFree(buf);
    return saved;
}

int32_t DVSState_SaveToConfigStore(void) {
    return DVSState_SaveToConfigStore_ByInstance(nullptr);
}
