/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_EMULATOR_LIMITS_H
#define PLATFORM_EMBEDDED_EMULATOR_LIMITS_H

// The emulator's part in the host limits: asked by the embedded KIT_Get, second in its order of sources.

#include <cstdint>

#include "dvs/status.h"

namespace dvs::embedded {

/// Asks the configured emulator for the host's port limit. HYP_OK with `*ports` set; HYP_NOT_FOUND, with
/// `*ports` untouched, when no emulator is configured; any other status fails the KIT_Get that asked.
///
/// Stands in an object file without any function of a contract header, and leans on none that has one: it is
/// pulled into programs that bring their own device.
[[nodiscard]] HYP_ReturnStatus EmulatorMaxPorts(uint32_t *ports);

} // namespace dvs::embedded

#endif
