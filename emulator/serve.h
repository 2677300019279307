/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_SERVE_H
#define EMULATOR_SERVE_H

// The two modes: in the foreground until a signal, and around one command.

#include <functional>

#include "emulator/options.h"

namespace dvs::emulator {

/// Serves until SIGTERM, SIGINT or SIGHUP (unless ignored), then saves the state. Returns the exit status.
/// Calls `ready` once clients can connect.
[[nodiscard]] int Serve(const Options &options, const std::function<void()> &ready);

/// Runs the options' command with a private emulator and store. Returns the command's exit status.
[[nodiscard]] int RunCommand(Options options);

/// Prints a line to standard error.
void PrintError(const std::string &text);

} // namespace dvs::emulator

#endif
