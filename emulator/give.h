/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_GIVE_H
#define EMULATOR_GIVE_H

// How a fetched value gets into an answer, and the names the module itself knows.

#include "emulator/call.h"

namespace dvs::emulator {

/// Read as a global property, this is the switch's version number.
inline constexpr const char *kSwitchVersionProp = "com.orbeno.common.version";

/// Given to a port by a link that comes up.
inline constexpr const char *kConnectionIdProp = "com.orbeno.common.port.connectid";

/// Answers a fetch with a value, or with the size that its buffer should have.
[[nodiscard]] inline HYP_ReturnStatus Give(const Call &call, const void *value, uint32_t size,
                                           Answer *answer) {
    answer->dataLen = size;
    if (size > call.record.dataLen) return HYP_LIMIT_EXCEEDED;
    answer->payload.data = static_cast<const char *>(value);
    answer->payload.size = size;
    return HYP_OK;
}

} // namespace dvs::emulator

#endif
