/* SPDX-License-Identifier: Apache-2.0 */
#ifndef KERNEL_SCRATCH_H
#define KERNEL_SCRATCH_H

// The module's state in the process's switch table for the duration of one operation, and the owners of
// fetched data.

#include <cstdint>
#include <memory>

#include "dvs/hyp.h"

namespace dvs::hyp {

struct FreeData {
    void operator()(void *buf) const { DVSHYP_DataFree(buf); }
};
using Buffer = std::unique_ptr<void, FreeData>;

struct FreeList {
    void operator()(DVSData *list) const { DVSData_Free(list); }
};
using List = std::unique_ptr<DVSData, FreeList>;

/// The switch table borrowed under "dvshyp". On every path, the table is emptied before the lock is released.
class BorrowedTable {
public:
    BorrowedTable() : lock_(DVSwitchHYPLock()) {}
    ~BorrowedTable() {
        // If the reset fails, retrying would not help.
        (void)DVSState_ConfigReset();
        DVSwitchHYPUnlock(lock_);
    }
    BorrowedTable(const BorrowedTable &) = delete;
    BorrowedTable &operator=(const BorrowedTable &) = delete;

private:
    MXUserRecLock *lock_;
};

/// Fetches the module's state, loads it into the borrowed table, and returns what `work` returns.
template <class Work> [[nodiscard]] HYP_ReturnStatus WithModuleState(Work &&work) {
    void *state = nullptr;
    uint32_t stateLen = 0;
    HYP_ReturnStatus status = DVSHYP_StateGet(&state, &stateLen);
    if (status != HYP_OK) return status;
    Buffer fetched(state);
    const BorrowedTable table;
    status = DVSState_ConfigDeserialize(fetched.get(), stateLen);
    fetched.reset();
    return status == HYP_OK ? work() : status;
}

/// The same for an operation on one switch: HYP_NOT_FOUND if the state does not contain it.
template <class Work> [[nodiscard]] HYP_ReturnStatus WithModuleSwitch(const char *switchName, Work &&work) {
    return WithModuleState([&]() -> HYP_ReturnStatus {
        DVSwitch *sw = DVSState_SwitchFind(switchName);
        return sw ? work(sw) : static_cast<HYP_ReturnStatus>(HYP_NOT_FOUND);
    });
}

/// Fetches one port's property list from the module and decodes it into a list of the process heap.
[[nodiscard]] HYP_ReturnStatus FetchPortData(const char *switchName, const char *portId, List *list);

/// Creates an empty list on the process heap; null if out of memory.
[[nodiscard]] List NewList();

} // namespace dvs::hyp

#endif
