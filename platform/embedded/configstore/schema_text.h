/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_SCHEMA_TEXT_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_SCHEMA_TEXT_H

// The schema file's bytes; the definition is written by the build (CMakeLists.txt).

#include <cstddef>

namespace configstore {

extern const unsigned char kSwitchesSchema[];
extern const std::size_t kSwitchesSchemaSize;

} // namespace configstore

#endif
