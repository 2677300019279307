/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_DOCUMENT_H
#define CONFIGSTORE_LAYOUTS_DOCUMENT_H

// docs/properties.md, made of the mapping tables and the registry.

#include <string>

namespace dvs::layout {

/// The whole document. It depends on nothing but the tables, so the same tables give the same bytes.
std::string PropertiesDocument();

} // namespace dvs::layout

#endif
