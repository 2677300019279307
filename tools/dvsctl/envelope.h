/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_ENVELOPE_H
#define DVSCTL_ENVELOPE_H

// What every JSON document of the program begins with.

#include <string_view>

#include <boost/json/object.hpp>

namespace dvs::ctl {

/// Raised when a reader of older documents would misunderstand newer ones. New members do not raise it.
inline constexpr int kSchemaVersion = 1;

/// {"schema_version": 1, "command": …}; without a command when it is not known.
inline boost::json::object Envelope(std::string_view command) {
    boost::json::object document;
    document["schema_version"] = kSchemaVersion;
    if (!command.empty()) document["command"] = command;
    return document;
}

} // namespace dvs::ctl

#endif
