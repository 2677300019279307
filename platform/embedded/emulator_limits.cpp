/* SPDX-License-Identifier: Apache-2.0 */
// The emulator's port limit. Until there is an emulator client to ask, no emulator is ever configured.

#include "platform/embedded/emulator_limits.h"

namespace dvs::embedded {

HYP_ReturnStatus EmulatorMaxPorts(uint32_t *) {
    return HYP_NOT_FOUND;
}

} // namespace dvs::embedded
