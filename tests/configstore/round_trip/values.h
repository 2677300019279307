/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_ROUND_TRIP_VALUES_H
#define TESTS_CONFIGSTORE_ROUND_TRIP_VALUES_H

// What a round trip makes of one sound value, said a second time: step by step, with plain offsets, without a
// store, and without anything of the converters. Used by model.cpp.

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "configstore/layouts/converter_type.h"
#include "configstore/round_trip/rules.h"

namespace round_trip {

using Value = std::vector<uint8_t>;
using Rules = std::set<Rule>;

/// What values depend on beside themselves.
struct Surroundings {
    bool isOverlay = false; // the stored overlay flag
    bool savesWide = false; // port records as they are read by the save
    bool loadsWide = false; // and as they are written by the load
};

/// Applies the steps of a converter type to the value and adds the rules that changed it. False where nothing
/// of it comes back.
bool RunSteps(dvs::ConverterType type, const Surroundings &around, Value *value, Rules *rules);

/// Whether all elements that the store keeps by a key have one, and one of their own: what the steps need.
bool HasDistinctKeys(dvs::ConverterType type, const Value &value);

/// Numbers and texts of a value, little-endian; reading past the end throws.
uint32_t NumberAt(const Value &value, std::size_t at, std::size_t width = 4);
std::string TextAt(const Value &value, std::size_t at, std::size_t most);

/// What becomes of a mirror session table (mirror_model.cpp).
bool MirrorSteps(const Surroundings &around, Value *value, Rules *rules);

} // namespace round_trip

#endif
