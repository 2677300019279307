/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_FAULTS_H
#define EMULATOR_FAULTS_H

// Fault injection: makes chosen commands of the module fail.
//
//   command=N     the command's number; without it, every command
//   nth=N         only the N-th matching request, once; without it, every one
//   status=S      fail with this status (decimal or 0x…)
//   errno=E       fail with this errno (number or name)
//   delay=D       delay the reply: milliseconds, or with the suffix ms or s
//   drop          close the connection without executing the request
//   drop=after    execute the request, then close the connection without a reply

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "dvs/status.h"

namespace dvs::emulator {

enum class Drop { No, Before, After };

struct Fault {
    std::string text; // as given by the user
    std::optional<int32_t> command;
    uint64_t nth = 0; // 0: every one
    std::optional<HYP_ReturnStatus> status;
    std::optional<int> error;
    std::chrono::milliseconds delay{0};
    Drop drop = Drop::No;
    uint64_t seen = 0; // matching requests so far

    bool Fails() const { return status || error; }
};

class Faults {
public:
    /// Parses and adds a fault. On a parse error returns false and sets `*why`.
    [[nodiscard]] bool Add(std::string_view text, std::string *why);
    void Clear() { faults_.clear(); }
    const std::vector<Fault> &All() const { return faults_; }

    /// Counts a request and returns the first fault that applies to it.
    [[nodiscard]] std::optional<Fault> Next(int32_t command);

private:
    std::vector<Fault> faults_;
};

} // namespace dvs::emulator

#endif
