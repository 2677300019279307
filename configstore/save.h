/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_SAVE_H
#define CONFIGSTORE_SAVE_H

// The worker behind the plain and the checked save (dvs/configstore.h).

#include <cstdint>

namespace dvs::config {

/// What becomes of a buffer that does not load into the switch table.
enum class Unloadable {
    CountsAsEmpty, // the plain save: one without switches
    IsRefused      // the checked save: its status is the result and the store is not opened
};

[[nodiscard]] int32_t SaveBuffer(const void *buf, uint32_t len, const char *switchId, Unloadable policy);

} // namespace dvs::config

#endif
