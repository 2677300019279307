/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_HELP_H
#define DVSCTL_CLI_HELP_H

// The help texts, made from the command table.

#include <string>
#include <string_view>

#include "tools/dvsctl/cli/command.h"

namespace dvs::ctl {

/// `dvsctl --help`.
std::string OverviewHelp();

/// `dvsctl VERB --help`.
std::string CommandHelp(const Command &command);

/// The verb nearest to a mistyped word; empty when none is near.
std::string NearestCommand(std::string_view word);

} // namespace dvs::ctl

#endif
