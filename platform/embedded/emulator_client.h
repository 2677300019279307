/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_EMULATOR_CLIENT_H
#define PLATFORM_EMBEDDED_EMULATOR_CLIENT_H

// The client's end of the emulator's socket: connecting, sending a whole request, receiving a whole reply.
// Used by the embedded device and by the host limits; stands apart from the functions of every contract
// header.

#include <cstddef>

#include <sys/uio.h>

#include "platform/embedded/emulator_wire.h"

namespace dvs::embedded {

/// The socket named by DVS_EMULATOR; none when no emulator is configured.
[[nodiscard]] const char *EmulatorPath();

/// A connected descriptor, closed on exec; -1 with errno, also when the peer takes nobody in for half a
/// minute.
[[nodiscard]] int ConnectEmulator(const char *path);

/// Ends waits for the first byte of a reply, too, after half a minute. Not for commands, which take as long
/// as they take.
void LimitReceive(int fd);

/// Sends all of `parts` (which it consumes). False with errno when the peer did not get the whole.
[[nodiscard]] bool SendWhole(int fd, iovec *parts, std::size_t num);

/// Receives a reply's header and up to `capacity` bytes of its payload. False with errno when the connection
/// broke, when a reply that has begun does not go on for half a minute, or when it is no reply: the
/// connection is of no use then. What the reply says is for the caller to judge; its payload was received
/// only if it fits.
[[nodiscard]] bool ReceiveReply(int fd, wire::ReplyHeader *header, void *payload, std::size_t capacity);

} // namespace dvs::embedded

#endif
