/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_ROUND_TRIP_VALUES_H
#define TESTS_CONFIGSTORE_ROUND_TRIP_VALUES_H

// A second implementation of the round trip of one valid value: step by step, with plain offsets, without a
// store and without the converters. Used by model.cpp.

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "configstore/layouts/converter_type.h"
#include "configstore/round_trip/rules.h"

namespace round_trip {

using Value = std::vector<uint8_t>;
using Rules = std::set<Rule>;

/// The context that a value's round trip depends on.
struct Surroundings {
    bool isOverlay = false; // the stored overlay flag
    bool savesWide = false; // whether the save reads wide port records
    bool loadsWide = false; // whether the load writes wide port records
};

/// Applies the steps of a converter type to the value and adds the rules that changed it. Returns false if
/// nothing of the value is loaded.
bool RunSteps(dvs::ConverterType type, const Surroundings &around, Value *value, Rules *rules);

/// Whether all elements that the store keeps by key have a unique key, which the steps require.
bool HasDistinctKeys(dvs::ConverterType type, const Value &value);

/// Numbers and texts of a value, little-endian; reading past the end throws.
uint32_t NumberAt(const Value &value, std::size_t at, std::size_t width = 4);
std::string TextAt(const Value &value, std::size_t at, std::size_t most);

/// Predicts the round trip of a mirror session table (mirror_model.cpp).
bool MirrorSteps(const Surroundings &around, Value *value, Rules *rules);

} // namespace round_trip

#endif
