/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_PLAIN_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_DOCUMENT_PLAIN_H

// The quick way to read a document that looks as the store itself writes it. For document_read.cpp alone,
// which reads all others, and says what is wrong with them.

#include <string_view>

#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/node.h"

namespace configstore {

/// Fills an empty tree, exactly as the general reader would in its tolerant way. False for a document that
/// this reader leaves to the general one, sound or not: the tree is empty again then.
[[nodiscard]] bool ReadPlainDocument(std::string_view text, Tree *tree);

/// Reads the instances of a Later node.
void ReadLater(Tree *tree, Object *node);

} // namespace configstore

#endif
