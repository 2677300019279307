/* SPDX-License-Identifier: Apache-2.0 */
// Records of single values and of plain lists: too small to stand in a file each. Those of the structured
// families stand in configstore/converters/.

#include "configstore/layouts/records.h"

namespace dvs::layout {
namespace {

constexpr const char *kBoolTexts[] = {"true", "false"};
constexpr Domain kBools = {"truth values", kBoolTexts, 2, {}};
constexpr const char *kEnabledTexts[] = {"enabled", ""};
constexpr Domain kEnabled = {"enabled or not", kEnabledTexts, 2, {}};

// clang-format off
constexpr Field kNumberFields[] = {
    // name   offset width kind             domain   meaning
    {"value",      0,    4, Kind::kUnsigned, nullptr, "the number"},
};
constexpr Field kSignedFields[] = {
    {"value",      0,    4, Kind::kSigned,   nullptr, "the number"},
};
constexpr Field kTextFields[] = {
    {"text",       0,    0, Kind::kText,     nullptr, "the text; its NUL is the value's last byte"},
};
constexpr Field kBoolFields[] = {
    {"value",      0,    1, Kind::kBool,     nullptr, "0 or 1"},
};
constexpr Field kBoolTextFields[] = {
    {"text",       0,    0, Kind::kLiteral,  &kBools,   "\"true\" with a NUL, or anything else for false"},
};
constexpr Field kEnabledFields[] = {
    {"text",       0,    0, Kind::kLiteral,  &kEnabled, "\"enabled\" with a NUL, or anything else for false"},
};
constexpr Field kPassthroughFields[] = {
    {"value",      0,    4, Kind::kUnsigned, nullptr, "2: allowed; 0: not allowed"},
};
constexpr Field kIpv4Fields[] = {
    {"address",    0,    4, Kind::kIpv4,     nullptr, "the address, network order"},
};
constexpr Field kVersionFields[] = {
    {"version",    0,    4, Kind::kUnsigned, nullptr, "number of the switch's version"},
};
constexpr Field kOpaqueFields[] = {
    {"bytes",      0,    0, Kind::kOpaque,   nullptr, "not looked into"},
};

constexpr Field kCountFields[] = {
    {"count",      0,    4, Kind::kCount,    nullptr, "number of slots"},
};
constexpr Field kKeyFields[] = {
    {"key",        0,   48, Kind::kText,     nullptr, "key of an uplink port"},
};
constexpr Field kNameFields[] = {
    {"name",       0,   81, Kind::kText,     nullptr, "name of an uplink port"},
};
// clang-format on

constexpr Record kKey = {"uplink port key", 48, kKeyFields, {}};
constexpr Record kName = {"uplink port name", 81, kNameFields, {}};
static_assert(IsSound(kKey) && IsSound(kName));

constexpr Part kKeyParts[] = {{"keys", &kKey, CountBy::kField, 0, "count", nullptr, 0, "the keys"}};
constexpr Part kNameParts[] = {{"names", &kName, CountBy::kField, 0, "count", nullptr, 0, "the names"}};

} // namespace

constexpr Record kNumber = {"number", 4, kNumberFields, {}};
constexpr Record kSignedNumber = {"signed number", 4, kSignedFields, {}};
constexpr Record kTextValue = {"text", 0, kTextFields, {}};
constexpr Record kBoolByte = {"one-byte boolean", 1, kBoolFields, {}};
constexpr Record kBoolText = {"boolean as text", 0, kBoolTextFields, {}};
constexpr Record kEnabledText = {"enabled as text", 0, kEnabledFields, {}};
constexpr Record kPassthrough = {"passthrough flag", 4, kPassthroughFields, {}};
constexpr Record kIpv4Value = {"IPv4 address", 4, kIpv4Fields, {}};
constexpr Record kSwitchVersion = {"switch version", 4, kVersionFields, {}};
constexpr Record kOpaqueValue = {"opaque value", 0, kOpaqueFields, {}};
constexpr Record kUplinkKeys = {"uplink port keys", 4, kCountFields, kKeyParts};
constexpr Record kUplinkNames = {"uplink port names", 4, kCountFields, kNameParts};
static_assert(IsSound(kNumber) && IsSound(kSignedNumber) && IsSound(kTextValue) && IsSound(kBoolByte));
static_assert(IsSound(kBoolText) && IsSound(kEnabledText) && IsSound(kPassthrough) && IsSound(kIpv4Value));
static_assert(IsSound(kSwitchVersion) && IsSound(kOpaqueValue) && IsSound(kUplinkKeys) &&
              IsSound(kUplinkNames));

} // namespace dvs::layout
