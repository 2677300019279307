/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_ROUND_TRIP_RANDOM_STATE_H
#define TESTS_CONFIGSTORE_ROUND_TRIP_RANDOM_STATE_H

// Random valid states with everything that a round trip changes: keys of both families, unusual type words,
// bytes after texts, properties without a row, ports of all kinds.

#include <string>
#include <vector>

#include "configstore/layouts/value_generator.h"
#include "configstore/state_builder.h"

namespace round_trip {

state_builder::Switch RandomSwitch(const std::string &id, const std::string &className,
                                   value_generator::Generator *random);

} // namespace round_trip

#endif
