/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_VERBS_SHOW_H
#define DVSCTL_VERBS_SHOW_H

// How parts of a state read, for every verb that prints them.

#include <cstdint>
#include <string>

#include <boost/json/fwd.hpp>

#include "form/model.h"
#include "tools/dvsctl/form.h"

namespace dvs::ctl {

/// "shadow", or "kind 9" for a kind without a name.
std::string ShowKind(std::uint32_t kind);

/// A switch's version, class or limit.
std::string ShowField(const Entry &entry, bool full);

struct StateCount {
    std::uint64_t switches = 0, ports = 0, properties = 0;
};

StateCount CountState(const State &state);

/// "2 switches, 20 ports, 97 properties".
std::string ShowCount(const StateCount &count);
boost::json::object CountJson(const StateCount &count);

} // namespace dvs::ctl

#endif
