/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_SCHEMA_H
#define DVSCTL_SCHEMA_H

// What the schema of the store's documents says about one of them.

#include <string>

#include <boost/json/fwd.hpp>

namespace dvs::ctl {

/// Path ("settings/max_mtuu") of the first member that the schema does not have; empty where it has all.
std::string UnknownField(const boost::json::value &document);

} // namespace dvs::ctl

#endif
