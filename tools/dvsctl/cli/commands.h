/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_COMMANDS_H
#define DVSCTL_CLI_COMMANDS_H

// The verbs. Each is in a file of its own name; what they take is in the table (commands.cpp).

#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

Exit RunShow(Context &context);
Exit RunVerify(Context &context);
Exit RunDiff(Context &context);
Exit RunCopy(Context &context);
Exit RunHexdump(Context &context);
Exit RunGenerate(Context &context);
Exit RunProps(Context &context);

Exit RunStoreList(Context &context);
Exit RunStoreExport(Context &context);
Exit RunStoreImport(Context &context);
Exit RunStoreDelete(Context &context);
Exit RunStoreHistory(Context &context);
Exit RunStoreRestore(Context &context);
Exit RunStoreBackup(Context &context);
Exit RunStoreUpgrade(Context &context);
Exit RunStoreCheck(Context &context);
Exit RunSchema(Context &context);

} // namespace dvs::ctl

#endif
