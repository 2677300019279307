/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_CONTEXT_H
#define DVSCTL_CLI_CONTEXT_H

// What every verb is handed: the options, the way out, the library's messages and the time that is left.

#include <chrono>

#include "tools/dvsctl/cli/error.h"
#include "tools/dvsctl/cli/log_capture.h"
#include "tools/dvsctl/cli/options.h"
#include "tools/dvsctl/cli/output.h"

namespace dvs::ctl {

/// The moment at which waiting ends (--timeout).
class Deadline {
public:
    explicit Deadline(double seconds)
        : end_(std::chrono::steady_clock::now() +
               std::chrono::duration_cast<std::chrono::steady_clock::duration>(
                   std::chrono::duration<double>(seconds))) {}

    bool IsOver() const { return std::chrono::steady_clock::now() >= end_; }

    /// Milliseconds left, rounded up, at least 0: what poll(2) takes.
    int MillisecondsLeft() const {
        const auto left =
            std::chrono::ceil<std::chrono::milliseconds>(end_ - std::chrono::steady_clock::now());
        return left.count() < 0               ? 0
               : left.count() > 1'000'000'000 ? 1'000'000'000
                                              : static_cast<int>(left.count());
    }

private:
    std::chrono::steady_clock::time_point end_;
};

struct Context {
    const Options &options;
    Output &out;
    LogCapture &log;
    Deadline deadline;
};

} // namespace dvs::ctl

#endif
