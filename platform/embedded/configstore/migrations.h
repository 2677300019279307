/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_MIGRATIONS_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_MIGRATIONS_H

// The database's tables, and the way from any older version to the present one.

#include "platform/embedded/configstore/database.h"

namespace configstore {

/// Brings a freshly opened database to kSchemaVersion: makes the tables of an empty one, refuses a newer one
/// (FAILED) and one that is not a store's (CORRUPT) without touching it.
[[nodiscard]] int32_t Migrate(Store *store);

} // namespace configstore

#endif
