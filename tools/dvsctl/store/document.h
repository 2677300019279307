/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_STORE_DOCUMENT_H
#define DVSCTL_STORE_DOCUMENT_H

// Documents of the config store as JSON values, and what differs between two of them, field by field.

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <boost/json/value.hpp>

#include "tools/dvsctl/cli/output.h"

namespace dvs::ctl {

/// A stored document; nothing where it is none.
std::optional<boost::json::value> ReadDocument(std::string_view text);

/// One field that is in one document only, or has another value in the other.
struct FieldChange {
    std::string path; ///< "ports/7/settings/blocked", not escaped; empty for the document
    std::optional<boost::json::value> before, after;
};

/// What leads from `before` to `after`. Objects are compared by member, everything else as a whole.
std::vector<FieldChange> CompareDocuments(const std::optional<boost::json::value> &before,
                                          const std::optional<boost::json::value> &after);

/// One line a change, behind "+ ", "- " or "~ ".
void WriteFieldChanges(const std::vector<FieldChange> &changes, std::string_view indent, bool full,
                       Output &out);
boost::json::array FieldChangesJson(const std::vector<FieldChange> &changes);

} // namespace dvs::ctl

#endif
