/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_KERNEL_PROPERTIES_H
#define DVSCTL_KERNEL_PROPERTIES_H

// Property lists that the module hands back, as tables and JSON.

#include <optional>
#include <string>
#include <vector>

#include <boost/json/object.hpp>

#include "form/json/typed.h"
#include "form/model.h"
#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

/// The entries of a serialized list from the module. Throws Error(Malformed) for one that is damaged.
std::vector<Property> PropertiesOf(Bytes bytes, const std::string &title);

/// The list as a table, or as "properties" of the document. With an owner, what known properties mean is said
/// as `dvsctl show` says it.
void WriteProperties(Context &context, const std::vector<Property> &properties, boost::json::object document,
                     const std::optional<Owner> &owner = {});

} // namespace dvs::ctl

#endif
