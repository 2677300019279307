/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_REPLY_VALUE_H
#define EMULATOR_REPLY_VALUE_H

// Puts a fetched value into a reply; also the property names that the module itself uses.

#include "emulator/call.h"

namespace dvs::emulator {

/// Reading this global property returns the switch's version number.
inline constexpr const char *kSwitchVersionProp = "com.orbeno.common.version";

/// Assigned to a port when its link comes up.
inline constexpr const char *kConnectionIdProp = "com.orbeno.common.port.connectid";

/// Replies to a fetch with a value, or with the size that its buffer needs.
[[nodiscard]] inline HYP_ReturnStatus ReplyWith(const Call &call, const void *value, uint32_t size,
                                           Answer *answer) {
    answer->dataLen = size;
    if (size > call.record.dataLen) return HYP_LIMIT_EXCEEDED;
    answer->payload.data = static_cast<const char *>(value);
    answer->payload.size = size;
    return HYP_OK;
}

} // namespace dvs::emulator

#endif
