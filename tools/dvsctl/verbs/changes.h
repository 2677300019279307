/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_VERBS_CHANGES_H
#define DVSCTL_VERBS_CHANGES_H

// Differences between two states as `diff` and every --dry-run show them.

#include <string>
#include <vector>

#include <boost/json/fwd.hpp>

#include "form/compare.h"
#include "tools/dvsctl/form.h"

namespace dvs::ctl {

class Output;
struct Options;

/// "3 added, 1 removed, 2 changed".
std::string ShowChangeCount(const std::vector<Change> &changes);

/// The changes as an indented list with + - ~ before each, or with --columns as a table.
void WriteChanges(const std::vector<Change> &changes, const Options &options, Output &out);

boost::json::array ChangesJson(const std::vector<Change> &changes, const Options &options);

} // namespace dvs::ctl

#endif
