/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_STORE_PROGRESS_H
#define DVSCTL_STORE_PROGRESS_H

// A line on the terminal while one call of the library takes its time, so that nobody thinks the program
// hangs. Nothing where standard error is no terminal, with --quiet, or when the work is done at once.

#include <string>

#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

class Progress {
public:
    /// Shows `text` ("saving 2 switches, 4096 ports") and the seconds since, until destroyed.
    Progress(const Context &context, std::string text);
    ~Progress();
    Progress(const Progress &) = delete;
    Progress &operator=(const Progress &) = delete;

private:
    struct Ticker;
    Ticker *ticker_ = nullptr;
};

} // namespace dvs::ctl

#endif
