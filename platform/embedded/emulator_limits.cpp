/* SPDX-License-Identifier: Apache-2.0 */
// The emulator's port limit, asked over a connection of its own.

#include "platform/embedded/emulator_limits.h"

#include <unistd.h>

#include "platform/embedded/emulator_client.h"

namespace dvs::embedded {

HYP_ReturnStatus EmulatorMaxPorts(uint32_t *ports) {
    const char *path = EmulatorPath();
    if (!path) return HYP_NOT_FOUND;
    const int fd = ConnectEmulator(path);
    // An emulator that is not there is no source of limits, as a missing device is none.
    if (fd == -1) return HYP_NOT_FOUND;
    // Who asks for a limit has asked for no command, and may hold the lock of the switch table.
    LimitReceive(fd);
    wire::RequestHeader request{};
    request.magic = wire::kMagic;
    request.version = wire::kVersion;
    request.kind = static_cast<uint16_t>(wire::Kind::Limits);
    iovec part{&request, sizeof request};
    wire::ReplyHeader reply{};
    uint32_t limit = 0;
    const bool answered = SendWhole(fd, &part, 1) && ReceiveReply(fd, &reply, &limit, sizeof limit);
    close(fd);
    // 0 would mean "not read yet" to the library.
    if (!answered || reply.error != 0 || reply.payloadSize != sizeof limit || limit == 0) return HYP_FAILURE;
    *ports = limit;
    return HYP_OK;
}

} // namespace dvs::embedded
