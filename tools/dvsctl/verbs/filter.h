/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_VERBS_FILTER_H
#define DVSCTL_VERBS_FILTER_H

// The part of a state that --switch, --port and --props ask for.

#include <string>

#include "form/model.h"
#include "tools/dvsctl/cli/options.h"
#include "tools/dvsctl/form.h"

namespace dvs::ctl {

/// Keeps what the options ask for. Throws Error(NotThere) when a switch, port or property that was asked for
/// is not in the state, unless --if-exists.
void ApplyFilter(const Options &options, const std::string &source, State &state);

} // namespace dvs::ctl

#endif
