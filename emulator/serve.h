/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_SERVE_H
#define EMULATOR_SERVE_H

// The two ways of running: in the foreground until a signal, and around one command.

#include <functional>

#include "emulator/options.h"

namespace dvs::emulator {

/// Serves until SIGTERM, SIGINT or SIGHUP (unless that is ignored) and saves the state; the exit status.
/// `ready` is called once clients can connect.
[[nodiscard]] int Serve(const Options &options, const std::function<void()> &ready);

/// Starts an emulator and a store of its own for the options' command; the command's exit status.
[[nodiscard]] int RunCommand(Options options);

/// A line on standard error.
void Complain(const std::string &text);

} // namespace dvs::emulator

#endif
