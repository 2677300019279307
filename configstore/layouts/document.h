/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_DOCUMENT_H
#define CONFIGSTORE_LAYOUTS_DOCUMENT_H

// docs/properties.md, made of the mapping tables and the registry, and the words in which it and others who
// explain properties put the tables. Names in these words stand in backticks.

#include <string>

#include "configstore/layouts/store_form.h"
#include "dvs/configstore.h"

namespace dvs::layout {

/// "number", "text", …
const char *Word(Kind kind);
/// "uint32", "list of texts", …
const char *Word(Form form);

/// "settings/vlan".
std::string PathOf(const DVSProp2ConfigEntry &row);

/// What a field may hold, behind a colon: ": 0 `GRE`, 1 `ERSPAN2`"; empty for a field without a domain.
std::string DomainText(const Field &field);

/// What is taken there: "list of texts, at most 80 bytes".
std::string FormText(const StoreField &field);
/// The texts it may be, behind a colon; empty where any will do.
std::string DomainText(const StoreField &field);

/// How many elements a part has: "`count` of them".
std::string CountText(const Part &part);

/// Which elements of a part are another record: "those of `receive_count` are …". The record's name stands in
/// *.
std::string VariantText(const Variant &variant);

/// The whole document. It depends on nothing but the tables, so the same tables give the same bytes.
std::string PropertiesDocument();

} // namespace dvs::layout

#endif
