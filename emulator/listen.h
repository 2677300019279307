/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_LISTEN_H
#define EMULATOR_LISTEN_H

// Creates the emulator's socket without disturbing another emulator.

#include <string>

namespace dvs::emulator {

/// Listens at `path`, mode 0600. Replaces a socket without a listener. If several emulators start at the same
/// path, one gets the socket and the others find it in use. Returns -1 and sets `*why` on failure.
[[nodiscard]] int ListenAt(const std::string &path, std::string *why);

} // namespace dvs::emulator

#endif
