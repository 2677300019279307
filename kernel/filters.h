/* SPDX-License-Identifier: Apache-2.0 */
#ifndef KERNEL_FILTERS_H
#define KERNEL_FILTERS_H

// The walk shared by all name filters of the kernel interface.

#include "dvs/data.h"
#include "dvsdata/list_internal.h"

namespace dvs::hyp {

/// Removes every entry that `keep` rejects, deciding for each entry separately. After a removal, continues
/// from the entry before it. Returns the status that ended the walk.
template <class Keep> HYP_ReturnStatus KeepIf(DVSData *list, Keep keep) {
    DVSDataEntry *before = nullptr;
    DVSDataEntry *entry = nullptr;
    HYP_ReturnStatus status;
    while ((status = DVSData_Next(list, before, &entry)) == HYP_OK) {
        if (keep(entry))
            before = entry;
        else
            dvs::data::RemoveAfter(list, before);
    }
    return status;
}

} // namespace dvs::hyp

#endif
