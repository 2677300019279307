/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_LACP_GROUPS_H
#define CONFIGSTORE_CONVERTERS_LACP_GROUPS_H

// A switch's link aggregation groups.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// The value of a mode's text; 0xFFFFFFFF, after a message, for a text that is none.
uint32_t LacpModeOf(const Context &context, const char *text);

/// Type 16: a table of groups <-> the instances of "lacp_groups", keyed by the group key.
int32_t SaveLacpGroups(const SaveArgs &args);
int32_t LoadLacpGroups(const LoadArgs &args);

} // namespace dvs::convert

#endif
