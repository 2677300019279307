/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_OPTIONS_H
#define EMULATOR_OPTIONS_H

// The emulator's command line.

#include <cstdint>
#include <string>
#include <vector>

#include "emulator/faults.h"

namespace dvs::emulator {

enum class Mode { Serve, Run, Help, Version };

/// Exit statuses of the emulator itself; `run` returns its command's status.
enum ExitStatus { kExitDone = 0, kExitFailed = 1, kExitUsage = 2, kExitDamaged = 6 };

struct Options {
    Mode mode = Mode::Serve;
    std::string socket;
    std::string state;
    uint32_t maxPorts = 0; // 0: the host's default
    bool sync = false;
    Faults faults;
    std::vector<char *> command; // of `run`, null-terminated
};

/// Parses the command line. On a usage error returns false and sets `*why`.
[[nodiscard]] bool ParseOptions(int argc, char **argv, Options *options, std::string *why);

void PrintHelp();

} // namespace dvs::emulator

#endif
