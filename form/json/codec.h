/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_JSON_CODEC_H
#define FORM_JSON_CODEC_H

// The JSON form of states (docs/json-form.md): lossless for every sound state, and written so that people can
// read and edit it. Encoding is in json_encode.cpp, decoding in json_decode.cpp.

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <boost/json/fwd.hpp>

#include "form/model.h"

namespace dvs::form {

/// Raised when a reader of older documents would misunderstand newer ones. New members do not raise it.
inline constexpr int kSchemaVersion = 1;

/// A value by the form's rule: text, number, padded text, or bytes as hexadecimal digits or base64.
boost::json::value ValueToJson(Bytes value);

/// A name: a string where it is UTF-8, else its bytes.
boost::json::value NameToJson(std::string_view name);

boost::json::object PropertyToJson(const Property &property);

/// What becomes of properties whose meaning is known.
enum class TypedForm {
    None,    ///< bytes, as of any other
    Beside,  ///< "value" for the bytes, "typed" and "summary" (or "damage") beside it: for looking
    Instead, ///< "typed" where it stands for these very bytes and says more than they do: for keeping
};

/// The member "switches".
boost::json::array SwitchesToJson(const State &state, TypedForm form);

/// The whole document as text.
std::string StateToJsonText(const State &state, TypedForm form = TypedForm::Instead);

/// The serialized state that the document describes. Throws Error(Malformed) with the place in the document.
std::vector<std::uint8_t> StateFromJsonText(std::string_view text);

/// Longest value that is written as hexadecimal digits; longer ones are base64.
inline constexpr std::size_t kMostHexBytes = 64;
/// Widest slot of a list of names, for the same reason as below.
inline constexpr std::size_t kMostSlotBytes = 128;
/// Largest size of a padded text; keeps a short document from describing a huge value.
inline constexpr std::size_t kMostPaddedBytes = 4096;

} // namespace dvs::form

#endif
