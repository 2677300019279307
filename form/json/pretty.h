/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_JSON_PRETTY_H
#define FORM_JSON_PRETTY_H

// JSON documents as people read them.

#include <string>

#include <boost/json/fwd.hpp>

namespace dvs::form {

/// The document as text: `"key": value` lines, indented, small objects and arrays on one line. Characters
/// that a terminal could act on are written as \uXXXX.
std::string PrettyJson(const boost::json::value &document);

} // namespace dvs::form

#endif
