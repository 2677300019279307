/* SPDX-License-Identifier: Apache-2.0 */
// dvsctl: the command line over the library, for operators and developers.

#include "tools/dvsctl/cli/cli.h"

int main(int argc, char **argv) {
    return dvs::ctl::RunCommandLine(argc, argv);
}
