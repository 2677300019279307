/* SPDX-License-Identifier: Apache-2.0 */
// Helpers over property lists (owned_list.h). They use the exported list operations only.

#include "dvsstate/owned_list.h"

#include <cstdlib>
#include <cstring>

namespace dvs::state {

HYP_ReturnStatus NewList(OwnedList &list) {
    DVSData *made = nullptr;
    const HYP_ReturnStatus status = DVSData_Alloc(&made, std::malloc, std::free);
    if (status == HYP_OK) list.reset(made);
    return status;
}

HYP_ReturnStatus DeserializeOwned(OwnedList &list, const void *buf, uint32_t len) {
    DVSData *made = nullptr;
    const HYP_ReturnStatus status = DVSData_Deserialize(&made, buf, len, std::malloc, std::free);
    if (status == HYP_OK) list.reset(made);
    return status;
}

DVSDataEntry *FindEntry(DVSData *list, const char *name) {
    DVSDataEntry *entry = nullptr;
    return list && DVSData_Lookup(list, name, &entry) == HYP_OK ? entry : nullptr;
}

std::string_view TextOf(DVSDataEntry *entry) {
    void *data = nullptr;
    const uint32_t size = DVSData_Data(entry, &data);
    const auto *text = static_cast<const char *>(data);
    return {text, strnlen(text, size)};
}

} // namespace dvs::state
