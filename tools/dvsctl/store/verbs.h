/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_STORE_VERBS_H
#define DVSCTL_STORE_VERBS_H

// What several of the store verbs report: changes of objects, and that there is nothing.

#include <optional>
#include <string>
#include <vector>

#include <boost/json/value.hpp>

#include "tools/dvsctl/store/access.h"

namespace dvs::ctl {

/// An object of the store, before and after; nothing where it is not there.
struct ObjectChange {
    admin::Address address;
    std::optional<boost::json::value> before, after;
};

/// False when there is certainly no database at `path`.
bool IsStoreThere(const std::string &path);

/// The result of a verb without a store, where --if-exists allows that: `member` is the list that is empty.
Exit ReportNothing(Context &context, const char *command, const std::string &path, const char *member);

/// What a verb did, or would do with --dry-run.
struct ChangeReport {
    const char *command; ///< "store restore"
    std::string path;    ///< the database
    std::string done;    ///< remark when it is done: "restored …"
    std::vector<ObjectChange> changes;
};

/// Prints it; objects that stay the same are left out.
void WriteReport(Context &context, const ChangeReport &report);

} // namespace dvs::ctl

#endif
