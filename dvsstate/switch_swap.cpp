/* SPDX-License-Identifier: Apache-2.0 */
// Operations on the whole switch table: the reset, and the replacement of non-persistent switches by their
// stored copies in the kernel's persistent state. All hold the lock "dvsstate" throughout.

#include <algorithm>
#include <cstring>
#include <span>
#include <utility>

#include "dvsstate/message.h"
#include "dvsstate/names.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/switch_table.h"

using namespace dvs::state;

namespace {

bool IsNotPersisted(DVSwitch *sw) {
    DVSDataEntry *entry = FindEntry(sw->globalPropList, kNoPersist);
    if (!entry) return false;
    void *data = nullptr;
    return DVSData_Data(entry, &data) > 0 && *static_cast<const uint8_t *>(data) != 0;
}

} // namespace

HYP_ReturnStatus DVSState_ConfigReset(void) {
    const StateLock lock;
    for (DVSwitch *const &slot : dvsSwitchTable) {
        if (!slot) continue;
        char id[kSwitchIdSize];
        std::memcpy(id, slot->switchId, sizeof id);
        const HYP_ReturnStatus status = DVSStateSwitchRemove(id);
        if (status == HYP_OK) continue;
        Message(kError, "Failed to remove DVS %s, return %s\n", id, Text(status));
        return HYP_EXISTS;
    }
    return HYP_OK;
}

bool DVSState_StripDvsWithNoPersistFlag(DVSwitch *parked[32], char removedIds[32][64], bool park) {
    const StateLock lock;
    bool marked = false;
    std::size_t row = 0;
    for (DVSwitch *const &slot : dvsSwitchTable) {
        if (!slot || !IsNotPersisted(slot)) continue;
        char id[kSwitchIdSize];
        std::memcpy(id, slot->switchId, sizeof id);
        if (DVSStateSwitchRemove(id) != HYP_OK) {
            MessageUnguarded("failed to remove dvs %s\n", id);
            continue;
        }
        std::memcpy(removedIds[row++], id, sizeof id);
        marked = marked || park;
    }
    if (marked) {
        std::ranges::copy(dvsSwitchTable, parked);
        dvsSwitchTable.fill(nullptr);
    } else {
        std::fill_n(parked, kSwitchNum, nullptr);
    }
    return marked;
}

void DVSState_UpdateGlobalSwsArray(DVSwitch *table[32], const char ids[32][64]) {
    const StateLock lock;
    DVSwitch **const end = table + kSwitchNum;
    DVSwitch **position = table;
    for (std::size_t row = 0; row < kSwitchNum; row++) {
        const auto slot = FindSlot({ids[row], strnlen(ids[row], kSwitchIdSize)});
        if (slot == dvsSwitchTable.end()) continue;
        position = std::find(position, end, nullptr);
        if (position == end) continue; // no room: the switch stays in the table
        *position++ = std::exchange(*slot, nullptr);
    }
    std::ranges::swap_ranges(dvsSwitchTable, std::span(table, kSwitchNum));
}

void DVSState_FreeDVSArray(DVSwitch *table[32]) {
    const StateLock lock;
    (void)DVSState_ConfigReset();
    std::copy_n(table, kSwitchNum, dvsSwitchTable.begin());
    (void)DVSState_ConfigReset();
}
