/* SPDX-License-Identifier: Apache-2.0 */
// The save that looks before it leaps: the plain one takes a buffer it cannot load for one without switches,
// and would empty the store. Stands on the state view, which finds what a load would stumble over, and on the
// plain save.

#include "dvs/configstore.h"

#include "configstore/log.h"
#include "configstore/save.h"
#include "dvs/state.h"
#include "dvsstate/state_view.h"
#include "dvsstate/switch_table.h"

namespace {

constexpr std::size_t kTextSize = 512;

// First what is wrong, then where: the smallest thing that has the fault.
void Report(const dvs::state::StateFault &fault) {
    char what[kTextSize];
    char where[kTextSize];
    (void)fault.Describe(what); // cut where it is longer
    (void)fault.path.Format(where);
    dvs::config::LogError("State is not saved to configstore: %s, at byte %zu%s%s\n", what, fault.offset,
                          *where ? " in " : "", where);
}

HYP_ReturnStatus Verify(const void *buf, uint32_t len) {
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

} // namespace

int32_t DVSState_SaveBufToConfigStoreChecked(const void *buf, uint32_t len, const char *switchId) {
    const HYP_ReturnStatus status = Verify(buf, len);
    if (status != HYP_OK) return static_cast<int32_t>(status);
    // What is sound may still not load, for want of memory.
    return dvs::config::SaveBuffer(buf, len, switchId, dvs::config::Unloadable::IsRefused);
}
