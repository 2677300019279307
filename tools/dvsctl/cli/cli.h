/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_CLI_H
#define DVSCTL_CLI_CLI_H

namespace dvs::ctl {

/// Runs the command line and returns the exit status. The one place where errors are reported.
int RunCommandLine(int argc, char **argv);

} // namespace dvs::ctl

#endif
