/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_SCRATCH_TABLE_H
#define CONFIGSTORE_SCRATCH_TABLE_H

// The switch table as scratch space of one save or upgrade.

#include <cstdint>

#include "dvs/state.h"

namespace dvs::config {

/// Holds the switch-state lock. The destructor empties the table and releases the lock.
class ScratchTable {
public:
    ScratchTable() : lock_(DVSwitchHandleLock()) {}
    ~ScratchTable() {
        if (isKept_) return;
        (void)DVSState_ConfigReset(); // what is reported is the save's own result
        DVSwitchHandleUnlock(lock_);
    }
    ScratchTable(const ScratchTable &) = delete;
    ScratchTable &operator=(const ScratchTable &) = delete;

    /// Replaces the table's switches by those of a state buffer.
    [[nodiscard]] HYP_ReturnStatus Load(const void *buf, uint32_t len) {
        (void)DVSState_ConfigReset();
        return DVSState_ConfigDeserialize(buf, len);
    }
    /// Leaves the lock held and the table loaded.
    void Keep() { isKept_ = true; }

private:
    MXUserRecLock *lock_;
    bool isKept_ = false;
};

} // namespace dvs::config

#endif
