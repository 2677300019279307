/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_HEALTH_CHECK_H
#define CONFIGSTORE_CONVERTERS_HEALTH_CHECK_H

// Which checks of its surroundings a switch makes, and how often.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// The instance of "health_checks" that a property belongs to; null for a key that is no health check.
const char *HealthCheckInstance(const char *key);

/// Type 11: the property's key chooses the instance of "health_checks".
int32_t SaveHealthCheck(const SaveArgs &args);
int32_t LoadHealthCheck(const LoadArgs &args);

} // namespace dvs::convert

#endif
