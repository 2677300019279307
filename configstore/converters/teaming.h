/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_TEAMING_H
#define CONFIGSTORE_CONVERTERS_TEAMING_H

// How a switch or a port spreads its traffic over the physical uplinks.

#include "configstore/converters/converter.h"

/// The policy value of a store text: TEAMING_POLICY_ENUM at the text's slot in TEAMING_POLICY_SCHEMA, 0 for a
/// text that is none of them. Always returns 0.
int32_t TeamingPolicyFromSchema(const char *text, int32_t *value);

namespace dvs::convert {

/// Type 17: the etherswitch family's port policy. Loads for that family only.
int32_t SaveEtherswitchTeaming(const SaveArgs &args);
int32_t LoadEtherswitchTeaming(const LoadArgs &args);

/// Type 18: the vswitch family's policy, of a switch and of a port. Neither saves nor loads for an
/// etherswitch.
int32_t SaveVswitchTeaming(const SaveArgs &args);
int32_t LoadVswitchTeaming(const LoadArgs &args);

} // namespace dvs::convert

#endif
