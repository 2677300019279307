/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_COMPLETION_H
#define DVSCTL_CLI_COMPLETION_H

// What a shell needs to know to complete dvsctl's command lines, made from the command table.

#include <string>

namespace dvs::ctl {

/// A script for bash that completes verbs, options, their values, sources and paths.
std::string BashCompletion();

} // namespace dvs::ctl

#endif
