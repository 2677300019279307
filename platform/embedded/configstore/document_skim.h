/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_SKIM_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_SKIM_H

// Looks through a list of instances in a document's text without making nodes of it. For document_plain.cpp
// alone: a save lists all objects, and throws away the ports of each.

#include "platform/embedded/configstore/schema.h"

namespace configstore {

/// The end of the list that begins with the brace at `at`, in a text whose last byte, a brace, is at `last`.
/// Null unless the quick reader would read the list with nothing in it that the schema does not allow; null
/// also for content that is rare and not worth the trouble. The list may not reach the last byte.
[[nodiscard]] const char *SkimInstances(const char *at, const char *last, const Shape *shape);

} // namespace configstore

#endif
