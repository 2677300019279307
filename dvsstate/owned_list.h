/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_OWNED_LIST_H
#define DVSSTATE_OWNED_LIST_H

// Property lists of the switch state: made with the process heap, owned until they are handed over, and read
// where there may be none.

#include <cstdint>
#include <memory>
#include <string_view>

#include "dvs/data.h"

namespace dvs::state {

struct ListFree {
    void operator()(DVSData *list) const { DVSData_Free(list); }
};
using OwnedList = std::unique_ptr<DVSData, ListFree>;

/// An empty list. `list` is untouched on failure.
[[nodiscard]] HYP_ReturnStatus NewList(OwnedList &list);

/// The list that a buffer holds. `list` is untouched on failure.
[[nodiscard]] HYP_ReturnStatus DeserializeOwned(OwnedList &list, const void *buf, uint32_t len);

/// The first entry of this name in a list that may be absent; none when there is no such entry or list.
[[nodiscard]] DVSDataEntry *FindEntry(DVSData *list, const char *name);

/// An entry's value as text: up to its first NUL, or its end.
[[nodiscard]] std::string_view TextOf(DVSDataEntry *entry);

} // namespace dvs::state

#endif
