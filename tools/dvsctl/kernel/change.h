/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_KERNEL_CHANGE_H
#define DVSCTL_KERNEL_CHANGE_H

// The frame of every verb that changes something in the module: sending, --dry-run, --may-exist,
// --if-exists, the report.

#include <functional>
#include <string>

#include "tools/dvsctl/kernel/target.h"

namespace dvs::ctl {

struct KernelChange {
    const char *command; ///< the verb, as JSON output names it
    Target target;
    std::string infinitive; ///< "remove": what is done to the target …
    std::string past;       ///< … "removed"
    std::string detail;     ///< behind the target, " to 9000"; may be empty

    /// The library's call to the module.
    std::function<HYP_ReturnStatus(const Target &target)> send;
    /// The same on the switch table, which holds the module's state: what --dry-run compares.
    std::function<HYP_ReturnStatus(const Target &target)> plan;
    std::optional<Error> warning = {}; ///< what somebody who made the change should know
    bool isInState = true; ///< false for what the module keeps beside its state: the plan only checks then
};

Exit CarryOut(Context &context, KernelChange change);

} // namespace dvs::ctl

#endif
