/* SPDX-License-Identifier: Apache-2.0 */
// Lists of the kernel interface: allocated on the process heap, decoded from the module's replies.

#include "kernel/scratch.h"

#include <cstdlib>

namespace {

void *HeapAlloc(uint64_t size) {
    return std::malloc(size);
}

} // namespace

namespace dvs::hyp {

List NewList() {
    DVSData *list = nullptr;
    return List(DVSData_Alloc(&list, HeapAlloc, std::free) == HYP_OK ? list : nullptr);
}

HYP_ReturnStatus FetchPortData(const char *switchName, const char *portId, List *list) {
    void *data = nullptr;
    uint32_t dataLen = 0;
    HYP_ReturnStatus status = DVSHYP_PortStateGet(switchName, portId, &data, &dataLen);
    if (status != HYP_OK) return status;
    const Buffer fetched(data);
    DVSData *decoded = nullptr;
    status = DVSData_Deserialize(&decoded, data, dataLen, HeapAlloc, std::free);
    if (status == HYP_OK) list->reset(decoded);
    return status;
}

} // namespace dvs::hyp
