/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_COMMANDS_H
#define DVSCTL_COMMANDS_H

// The verbs. Each is in a file of its own name; what they take is in the table (commands.cpp).

#include "tools/dvsctl/context.h"

namespace dvs::ctl {

Exit RunShow(Context &context);
Exit RunVerify(Context &context);
Exit RunDiff(Context &context);
Exit RunCopy(Context &context);
Exit RunHexdump(Context &context);

} // namespace dvs::ctl

#endif
