/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_UPGRADE_H
#define CONFIGSTORE_UPGRADE_H

// The workers behind the two upgrade functions of dvs/configstore.h, which read the host's own state file and
// write the host's own store. These take a path, and one of them a store, for tools and tests.

#include <cstdint>

#include "dvs/configstore.h"
#include "platform/configstore.h"

namespace dvs::config {

/// DVSState_RetrieveDVSUpgradeInfo of another state file into `store`, which must have no transaction open.
/// Unlike the exported function it cleans up on every path: the switch table is reset and the lock released.
[[nodiscard]] int32_t UpgradeFromFile(configstore::Store *store, const char *stateFile);

} // namespace dvs::config

/// DVSState_RetrieveDVSUpgradeInfo of another state file.
int32_t RetrieveUpgradeInfoFrom(const char *stateFile);

/// GetDvsBasicInfoFromFileHyp of another state file.
DvsBasicInfo BasicInfoFrom(const char *stateFile);

#endif
