/* SPDX-License-Identifier: Apache-2.0 */
#ifndef KERNEL_FILTERS_H
#define KERNEL_FILTERS_H

// The walk that every name filter of the kernel interface is made of.

#include "dvs/data.h"
#include "dvsdata/list_internal.h"

namespace dvs::hyp {

/// Removes every entry that `keep` rejects, each judged by itself; walks on from the entry before a removed
/// one. Returns the status that ended the walk.
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
