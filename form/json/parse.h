/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_JSON_PARSE_H
#define FORM_JSON_PARSE_H

// JSON text from outside into a document, strictly: UTF-8 only, no duplicate keys, no absurd depth, nothing
// behind the value.

#include <string_view>

#include <boost/json/value.hpp>

namespace dvs::form {

/// Throws Error(Malformed) with line, column and the path ("$.switches[0].ports[3]") of the fault.
boost::json::value ParseJson(std::string_view text);

/// Refuses what ParseJson does, in little more memory than the names of one object's members take. Whether
/// the document is an object.
bool IsJsonObject(std::string_view text);

} // namespace dvs::form

#endif
