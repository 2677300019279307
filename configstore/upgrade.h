/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_UPGRADE_H
#define CONFIGSTORE_UPGRADE_H

// The workers behind the two upgrade functions of dvs/configstore.h, which read the host's own state file:
// these take its path, for tools and tests.

#include <cstdint>

#include "dvs/configstore.h"

/// DVSState_RetrieveDVSUpgradeInfo of another state file.
int32_t RetrieveUpgradeInfoFrom(const char *stateFile);

/// GetDvsBasicInfoFromFileHyp of another state file.
DvsBasicInfo BasicInfoFrom(const char *stateFile);

#endif
