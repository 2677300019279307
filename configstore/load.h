/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LOAD_H
#define CONFIGSTORE_LOAD_H

// The load of a whole state out of a store that the caller has opened.

#include <cstdint>

#include "platform/configstore.h"

namespace dvs::config {

/// DVSState_LoadFromConfigStoreAsBuf from `store`, with the same results and messages.
[[nodiscard]] int32_t LoadState(configstore::Store *store, bool desired, void **out, uint32_t *outLen);

} // namespace dvs::config

#endif
