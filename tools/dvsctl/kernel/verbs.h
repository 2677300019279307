/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_KERNEL_VERBS_H
#define DVSCTL_KERNEL_VERBS_H

// The verbs that are about the switching module alone. What they take is in the table (commands_kernel.cpp).

#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

// switch_verbs.cpp
Exit RunKernelSwitchAdd(Context &context);
Exit RunKernelSwitchRemove(Context &context);
Exit RunKernelSwitchAssociate(Context &context);
Exit RunKernelSwitchDissociate(Context &context);
Exit RunKernelSwitchSetVersion(Context &context);
Exit RunKernelSwitchSetMaxPorts(Context &context);
Exit RunKernelStateSanitize(Context &context);
Exit RunKernelStateCleanup(Context &context);

// prop_verbs.cpp
Exit RunKernelPropGet(Context &context);
Exit RunKernelPropSet(Context &context);
Exit RunKernelPropClear(Context &context);
Exit RunKernelUplinkGet(Context &context);
Exit RunKernelUplinkSet(Context &context);

// port_verbs.cpp
Exit RunKernelPortAdd(Context &context);
Exit RunKernelPortRemove(Context &context);
Exit RunKernelPortFind(Context &context);
Exit RunKernelPortState(Context &context);
Exit RunKernelPorts(Context &context);
Exit RunKernelFindExternalId(Context &context);

// query_verbs.cpp
Exit RunKernelVendorProps(Context &context);
Exit RunKernelExtraProps(Context &context);
Exit RunKernelOverlayProps(Context &context);
Exit RunKernelExec(Context &context);

} // namespace dvs::ctl

#endif
