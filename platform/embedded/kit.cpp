/* SPDX-License-Identifier: Apache-2.0 */
// The embedded host's system-information interface (platform/kit.h). It has one node, the host-wide port
// limit, and asks for it in a fixed order: the program, the emulator, the environment, the default.

#include "platform/kit.h"

#include <charconv>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include "platform/embedded/emulator_limits.h"
#include "platform/embedded/host_limits.h"

namespace {

constexpr uint32_t kInterfaceVersion = 21;
constexpr uint32_t kDefaultMaxPorts = 65536;

/// Digits only. 0 is refused too: to the library it means "not read yet".
HYP_ReturnStatus ParsePorts(std::string_view text, uint32_t *ports) {
    const char *end = text.data() + text.size();
    uint32_t number = 0;
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    if (error != std::errc() || stop != end || number == 0) return HYP_BAD_PARAM;
    *ports = number;
    return HYP_OK;
}

HYP_ReturnStatus MaxPorts(uint32_t *ports) {
    if (const uint32_t set = DVSHost_MaxPorts()) {
        *ports = set;
        return HYP_OK;
    }
    const HYP_ReturnStatus status = dvs::embedded::EmulatorMaxPorts(ports);
    if (status != HYP_NOT_FOUND) return status;
    if (const char *text = secure_getenv("DVS_MAX_PORTS")) return ParsePorts(text, ports);
    *ports = kDefaultMaxPorts;
    return HYP_OK;
}

} // namespace

extern "C" HYP_ReturnStatus KIT_CheckSig(const char *signature, uint32_t version) {
    if (!signature) return HYP_BAD_PARAM;
    return version == kInterfaceVersion ? HYP_OK : HYP_NOT_SUPPORTED;
}

extern "C" HYP_ReturnStatus KIT_Get(uint32_t node, const void *, void *value, uint32_t size) {
    if (node != KIT_NODE_net_maxPortsSystemWide) return HYP_NOT_FOUND;
    uint32_t ports = 0;
    if (!value || size != sizeof ports) return HYP_BAD_PARAM;
    const HYP_ReturnStatus status = MaxPorts(&ports);
    if (status == HYP_OK) std::memcpy(value, &ports, sizeof ports);
    return status;
}
