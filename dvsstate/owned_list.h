/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_OWNED_LIST_H
#define DVSSTATE_OWNED_LIST_H

// Property lists of the switch state: allocated on the process heap, owned until handed over, with null-safe
// reads.

#include <cstdint>
#include <memory>
#include <string_view>

#include "dvs/data.h"

namespace dvs::state {

struct ListFree {
    void operator()(DVSData *list) const { DVSData_Free(list); }
};
using OwnedList = std::unique_ptr<DVSData, ListFree>;

/// Creates an empty list. `list` is untouched on failure.
[[nodiscard]] HYP_ReturnStatus NewList(OwnedList &list);

/// Deserializes a buffer into a list. `list` is untouched on failure.
[[nodiscard]] HYP_ReturnStatus DeserializeOwned(OwnedList &list, const void *buf, uint32_t len);

/// Returns the first entry with this name; null if there is no such entry or `list` is null.
[[nodiscard]] DVSDataEntry *FindEntry(DVSData *list, const char *name);

/// An entry's value as text: up to its first NUL or its end.
[[nodiscard]] std::string_view TextOf(DVSDataEntry *entry);

} // namespace dvs::state

#endif
