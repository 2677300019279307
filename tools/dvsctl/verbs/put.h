/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_VERBS_PUT_H
#define DVSCTL_VERBS_PUT_H

// Putting a whole state into a source, as `copy` and `generate` do: --dry-run, --no-replace and the report
// are the same wherever the state comes from.

#include "form/model.h"
#include "tools/dvsctl/cli/context.h"
#include "tools/dvsctl/sources/source.h"

namespace dvs::ctl {

struct PutJob {
    const char *verb;             ///< of the report
    const char *did;              ///< "copied"
    const Source *from = nullptr; ///< null where the state was made here
};

/// Refuses options that exclude each other. Before anything is read.
void CheckPutOptions(const Options &options, const Source &to);

/// Writes the state to `to`, or with --dry-run says what that would change, and reports. `loaded` has been
/// judged.
Exit PutState(Context &context, const PutJob &job, LoadedState loaded, Source &to);

/// The JSON report of a job that had nothing to put.
void ReportNothingPut(Context &context, const PutJob &job, const Source &to);

} // namespace dvs::ctl

#endif
