/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_ENVELOPE_H
#define DVSCTL_CLI_ENVELOPE_H

// What every JSON document of the program begins with.

#include <string_view>

#include <boost/json/object.hpp>

#include "form/json/codec.h"
#include "tools/dvsctl/form.h"

namespace dvs::ctl {

/// {"schema_version": 1, "command": …}; without a command when it is not known.
inline boost::json::object Envelope(std::string_view command) {
    boost::json::object document;
    document["schema_version"] = kSchemaVersion;
    if (!command.empty()) document["command"] = command;
    return document;
}

} // namespace dvs::ctl

#endif
