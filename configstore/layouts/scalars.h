/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_SCALARS_H
#define CONFIGSTORE_LAYOUTS_SCALARS_H

// The records of single values and of plain lists of texts.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

namespace dvs::layout::scalar {

inline constexpr const char *kBoolTexts[] = {"true", "false"};
inline constexpr Domain kBools = {"truth values", kBoolTexts, 2, {}};
inline constexpr const char *kEnabledTexts[] = {"enabled", ""};
inline constexpr Domain kEnabled = {"enabled or not", kEnabledTexts, 2, {}};

// clang-format off
inline constexpr Field kNumberFields[] = {
    // name   offset width kind             domain   meaning
    {"value",      0,    4, Kind::kUnsigned, nullptr, "the number"},
};
inline constexpr Field kSignedFields[] = {
    {"value",      0,    4, Kind::kSigned,   nullptr, "the number"},
};
inline constexpr Field kTextFields[] = {
    {"text",       0,    0, Kind::kText,     nullptr, "the text; its NUL is the value's last byte"},
};
inline constexpr Field kBoolFields[] = {
    {"value",      0,    1, Kind::kBool,     nullptr, "0 or 1"},
};
inline constexpr Field kBoolTextFields[] = {
    {"text",       0,    0, Kind::kLiteral,  &kBools,   "\"true\" with a NUL, or anything else for false"},
};
inline constexpr Field kEnabledFields[] = {
    {"text",       0,    0, Kind::kLiteral,  &kEnabled, "\"enabled\" with a NUL, or anything else for false"},
};
inline constexpr Field kPassthroughFields[] = {
    {"value",      0,    4, Kind::kUnsigned, nullptr, "2: allowed; 0: not allowed"},
};
inline constexpr Field kIpv4Fields[] = {
    {"address",    0,    4, Kind::kIpv4,     nullptr, "the address, network order"},
};
inline constexpr Field kOpaqueFields[] = {
    {"bytes",      0,    0, Kind::kOpaque,   nullptr, "not looked into"},
};

inline constexpr Field kCountFields[] = {
    {"count",      0,    4, Kind::kCount,    nullptr, "number of slots"},
};
inline constexpr Field kKeyFields[] = {
    {"key",        0,   48, Kind::kText,     nullptr, "key of an uplink port"},
};
inline constexpr Field kNameFields[] = {
    {"name",       0,   81, Kind::kText,     nullptr, "name of an uplink port"},
};
// clang-format on

inline constexpr Record kKey = {"uplink port key", 48, kKeyFields, {}};
inline constexpr Record kName = {"uplink port name", 81, kNameFields, {}};
static_assert(IsSound(kKey) && IsSound(kName));

inline constexpr Part kKeyParts[] = {{"keys", &kKey, CountBy::kField, 0, "count", nullptr, 0, "the keys"}};
inline constexpr Part kNameParts[] = {
    {"names", &kName, CountBy::kField, 0, "count", nullptr, 0, "the names"}};

} // namespace dvs::layout::scalar

namespace dvs::layout {

inline constexpr Record kNumber = {"number", 4, scalar::kNumberFields, {}};
inline constexpr Record kSignedNumber = {"signed number", 4, scalar::kSignedFields, {}};
inline constexpr Record kTextValue = {"text", 0, scalar::kTextFields, {}};
inline constexpr Record kBoolByte = {"one-byte boolean", 1, scalar::kBoolFields, {}};
inline constexpr Record kBoolText = {"boolean as text", 0, scalar::kBoolTextFields, {}};
inline constexpr Record kEnabledText = {"enabled as text", 0, scalar::kEnabledFields, {}};
inline constexpr Record kPassthrough = {"passthrough flag", 4, scalar::kPassthroughFields, {}};
inline constexpr Record kIpv4Value = {"IPv4 address", 4, scalar::kIpv4Fields, {}};
inline constexpr Record kOpaqueValue = {"opaque value", 0, scalar::kOpaqueFields, {}};
inline constexpr Record kUplinkKeys = {"uplink port keys", 4, scalar::kCountFields, scalar::kKeyParts};
inline constexpr Record kUplinkNames = {"uplink port names", 4, scalar::kCountFields, scalar::kNameParts};
static_assert(IsSound(kNumber) && IsSound(kSignedNumber) && IsSound(kTextValue) && IsSound(kBoolByte));
static_assert(IsSound(kBoolText) && IsSound(kEnabledText) && IsSound(kPassthrough) && IsSound(kIpv4Value));
static_assert(IsSound(kOpaqueValue) && IsSound(kUplinkKeys) && IsSound(kUplinkNames));

} // namespace dvs::layout

namespace dvs::layout {

// clang-format off
inline constexpr StoreField kNumberForm       = {nullptr, Form::kUint32, In(kNumber, "value"),                             "", 0, nullptr, nullptr, {}, "the number"};
inline constexpr StoreField kSignedNumberForm = {nullptr, Form::kInt,    In(kSignedNumber, "value"),                       "", 0, nullptr, nullptr, {}, "the number"};
inline constexpr StoreField kTextForm         = {nullptr, Form::kText,   In(kTextValue, "text"),                           "", 0, nullptr, nullptr, {}, "the text"};
inline constexpr StoreField kBoolByteForm     = {nullptr, Form::kBool,   In(kBoolByte, "value"),                           "", 0, nullptr, nullptr, {}, "the flag"};
inline constexpr StoreField kBoolTextForm     = {nullptr, Form::kBool,   Literal(kBoolText, {"true\0f", 6}, "false"),      "", 0, nullptr, nullptr, {}, "the flag"};
inline constexpr StoreField kOverlayForm      = {nullptr, Form::kBool,   Literal(kBoolText, {"true", 5}, "false"),         "", 0, nullptr, nullptr, {}, "the flag"};
inline constexpr StoreField kEnabledForm      = {nullptr, Form::kBool,   Literal(kEnabledText, {"enabled", 8}, {}),        "", 0, nullptr, nullptr, {}, "the flag"};
inline constexpr StoreField kPassthroughForm  = {nullptr, Form::kBool,   Exactly(kPassthrough, "value", 2),               "", 0, nullptr, nullptr, {}, "the flag"};
inline constexpr StoreField kIpv4Form         = {nullptr, Form::kText,   In(kIpv4Value, "address"),                        "", 0, nullptr, nullptr, {}, "dotted IPv4 address", Rule::kIpv4};
inline constexpr StoreField kUplinkKeysForm   = {nullptr, Form::kTexts,  Elements(kUplinkKeys, "keys", "key"),             "", 47, nullptr, nullptr, {}, "keys of uplink ports"};
inline constexpr StoreField kUplinkNamesForm  = {nullptr, Form::kTexts,  Elements(kUplinkNames, "names", "name"),          "", 80, nullptr, nullptr, {}, "names of uplink ports"};
inline constexpr StoreField kUnmappedForm     = {nullptr, Form::kNone,   {},                                               "", 0, nullptr, nullptr, {}, "lists below \"data\", by kind of property"};
// clang-format on

} // namespace dvs::layout

#endif
