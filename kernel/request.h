/* SPDX-License-Identifier: Apache-2.0 */
#ifndef KERNEL_REQUEST_H
#define KERNEL_REQUEST_H

// Helpers to fill the request record, and the fetch with a growing buffer. The record's layout is the
// module's interface, so the assertions below fix every offset.

#include <cstddef>
#include <cstdint>
#include <cstring>

#include "dvs/hyp.h"
#include "platform/device_commands.h"

namespace dvs::hyp {

static_assert(sizeof(DVSHYPRequest) == 424);
static_assert(offsetof(DVSHYPRequest, switchName) == 0);
static_assert(offsetof(DVSHYPRequest, portId) == 64);
static_assert(offsetof(DVSHYPRequest, propName) == 112);
static_assert(offsetof(DVSHYPRequest, maxPorts) == 240);
static_assert(offsetof(DVSHYPRequest, version) == 244);
static_assert(offsetof(DVSHYPRequest, propType) == 248);
static_assert(offsetof(DVSHYPRequest, reserved) == 252);
static_assert(offsetof(DVSHYPRequest, status) == 256);
static_assert(offsetof(DVSHYPRequest, dataLen) == 260);
static_assert(offsetof(DVSHYPRequest, data) == 264);
static_assert(offsetof(DVSHYPRequest, cmd) == 272);
static_assert(offsetof(DVSHYPRequest, cmdInLen) == 400);
static_assert(offsetof(DVSHYPRequest, cmdIn) == 404);
static_assert(offsetof(DVSHYPRequest, cmdOutLen) == 412);
static_assert(offsetof(DVSHYPRequest, cmdOut) == 416);
static_assert(sizeof(DVSHYPExternalIdResult) == 176);
static_assert(sizeof(DVSHYPPortListEntry) == 52);
static_assert(sizeof(DVSHYPPortList) == 8);

using device::Command;

/// Buffer size of the first attempt of a fetch or command execution.
inline constexpr uint32_t kFirstBufferSize = 32768;

/// Copies `text` with its NUL into a zeroed field, truncated to the field.
template <std::size_t N> void SetText(char (&field)[N], const char *text) {
    std::memcpy(field, text, strnlen(text, N - 1));
}

/// An address in the form of the record.
inline uint64_t Address(const void *pointer) {
    return reinterpret_cast<std::uintptr_t>(pointer);
}

/// Sends `req` with a receive buffer that grows as long as the module asks for a larger size. On success
/// `*out` is the caller's, of `*outLen` bytes; otherwise it is null. Opens its own descriptor, so it is
/// thread-safe.
[[nodiscard]] HYP_ReturnStatus Fetch(Command command, DVSHYPRequest *req, void **out, uint32_t *outLen);

} // namespace dvs::hyp

#endif
