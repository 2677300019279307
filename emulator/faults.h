/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_FAULTS_H
#define EMULATOR_FAULTS_H

// Faults on demand: what an agent's developer wants the module to do wrong, and when.
//
//   command=N     the command's number; every command without it
//   nth=N         only the N-th matching request, then never again; every one without it
//   status=S      refuse with this status (decimal or 0x…)
//   errno=E       refuse with this errno (number or name)
//   delay=D       answer late: milliseconds, or with the suffix ms or s
//   drop          close the connection instead of carrying the request out
//   drop=after    carry the request out, then close the connection instead of answering

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
    std::string text; // as it was given
    std::optional<int32_t> command;
    uint64_t nth = 0; // 0: every one
    std::optional<HYP_ReturnStatus> status;
    std::optional<int> error;
    std::chrono::milliseconds delay{0};
    Drop drop = Drop::No;
    uint64_t seen = 0; // matching requests so far

    bool Refuses() const { return status || error; }
};

class Faults {
public:
    /// Adds the fault that `text` describes. False, with `*why`, when it describes none.
    [[nodiscard]] bool Add(std::string_view text, std::string *why);
    void Clear() { faults_.clear(); }
    const std::vector<Fault> &All() const { return faults_; }

    /// Counts a request and returns what is to go wrong with it: the first fault whose turn it is.
    [[nodiscard]] std::optional<Fault> Next(int32_t command);

private:
    std::vector<Fault> faults_;
};

} // namespace dvs::emulator

#endif
