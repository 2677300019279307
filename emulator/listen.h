/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_LISTEN_H
#define EMULATOR_LISTEN_H

// Where the emulator is reached: making its socket without taking another emulator's away.

#include <string>

namespace dvs::emulator {

/// Listens at `path`, mode 0600; a socket that nobody listens at any more is replaced. Emulators that start
/// there at the same time take turns, so that one of them gets it and the others find it in use. -1 with
/// `*why`.
[[nodiscard]] int ListenAt(const std::string &path, std::string *why);

} // namespace dvs::emulator

#endif
