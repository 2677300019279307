/* SPDX-License-Identifier: Apache-2.0 */
// The checked save. A plain save treats a buffer that does not load as one without switches and empties the
// store; the checked save verifies the buffer first, with the state view.

#include "dvs/configstore.h"

#include "configstore/log.h"
#include "configstore/save.h"
#include "dvs/state.h"
#include "dvsstate/state_view.h"
#include "dvsstate/switch_table.h"

namespace {

constexpr std::size_t kTextSize = 512;

// Names the fault, then the smallest part of the state that has it.
void Report(const dvs::state::StateFault &fault) {
    char what[kTextSize];
    char where[kTextSize];
    (void)fault.Describe(what); // cut if it is longer
    (void)fault.path.Format(where);
    dvs::config::Messages().Error("State is not saved to configstore: %s, at byte %zu%s%s\n", what, fault.offset,
                          *where ? " in " : "", where);
}

} // namespace

HYP_ReturnStatus dvs::config::VerifyState(const void *buf, uint32_t len) {
    if (uwMaxNumActivePortsSystemWide == 0) {
        const HYP_ReturnStatus status = dvs::state::ReadHostLimit("");
        if (status != HYP_OK) return status;
    }
    const std::span bytes(static_cast<const uint8_t *>(buf), buf ? len : 0);
    const auto verdict = dvs::state::VerifyState(bytes, uwMaxNumActivePortsSystemWide);
    if (!verdict.first) return HYP_OK;
    Report(verdict.located);
    return verdict.first.Status();
}

int32_t DVSState_SaveBufToConfigStoreChecked(const void *buf, uint32_t len, const char *switchId) {
    const HYP_ReturnStatus status = dvs::config::VerifyState(buf, len);
    if (status != HYP_OK) return static_cast<int32_t>(status);
    // A sound buffer can still fail to load, without memory.
    return dvs::config::SaveToHostStore(buf, len, switchId, dvs::config::Unloadable::IsRefused);
}
