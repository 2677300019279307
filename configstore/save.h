/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_SAVE_H
#define CONFIGSTORE_SAVE_H

// Saves of whole state buffers into a store that the caller has opened, and the worker of the exported saves
// (dvs/configstore.h), which open the host's store themselves.

#include <cstdint>

#include "dvs/status.h"
#include "platform/configstore.h"

namespace dvs::config {

/// DVSState_SaveBufToConfigStore_ByInstance into `store`, which must have no transaction open. Unlike the
/// exported function it cleans up on every path: the switch table is reset and the lock released.
[[nodiscard]] int32_t SaveState(configstore::Store *store, const void *buf, uint32_t len,
                                const char *switchId);

/// The same for DVSState_SaveBufToConfigStoreChecked.
[[nodiscard]] int32_t SaveStateChecked(configstore::Store *store, const void *buf, uint32_t len,
                                       const char *switchId);

/// What happens to a buffer that does not load into the switch table.
enum class Unloadable {
    CountsAsEmpty, // the plain save treats it as a buffer without switches
    IsRefused      // the checked save returns the status of the load
};

/// A save into the host's store. Where the store cannot be opened (-1) the lock stays held and the table
/// loaded; where the transaction cannot be begun (its status) the store handle stays open as well. Callers
/// have always had to release the lock on these two paths.
[[nodiscard]] int32_t SaveToHostStore(const void *buf, uint32_t len, const char *switchId, Unloadable policy);

/// HYP_OK, or the status of the first fault of a state buffer, after a message that names it.
[[nodiscard]] HYP_ReturnStatus VerifyState(const void *buf, uint32_t len);

} // namespace dvs::config

#endif
