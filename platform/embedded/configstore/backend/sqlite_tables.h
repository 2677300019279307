/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_BACKEND_SQLITE_TABLES_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_BACKEND_SQLITE_TABLES_H

// The database's tables, and how an older version of them becomes the present one.

#include "platform/embedded/configstore/backend/sqlite.h"

namespace configstore {

/// Brings a freshly opened database to the present version: makes the tables of an empty one, refuses a newer
/// one (FAILED) and one that is not a store's (CORRUPT) without touching it.
[[nodiscard]] int32_t Migrate(const Connection &connection);

} // namespace configstore

#endif
