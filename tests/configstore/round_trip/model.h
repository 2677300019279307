/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_ROUND_TRIP_MODEL_H
#define TESTS_CONFIGSTORE_ROUND_TRIP_MODEL_H

// Predicts a valid state after a save into a store and a load, by the documented rules. The model is
// independent: it has keys, places and classes, but no store and no converter. Every property stays the same,
// or named rules change or drop it; every new property has a rule too. Tests compare the library's result
// with the prediction.

#include <optional>
#include <string>
#include <vector>

#include "configstore/round_trip/values.h"
#include "configstore/state_builder.h"

namespace round_trip {

/// A state load drops a property whose type word has none of these bits.
inline constexpr uint32_t kReadTypes = 0x800000fc;

/// The facts about a switch that the converters of its properties get.
struct SwitchTraits {
    std::string className;
    uint32_t savedVersion = 0;  // from the switch record
    uint32_t loadedVersion = 0; // as read back
    bool isOverlay = false;
    [[nodiscard]] bool IsEtherswitch() const { return className != "vswitch" && className != "cswitch"; }
};

/// The result of a round trip for one list of properties.
struct ListFate {
    struct Kept {
        state_builder::Prop after;
        std::vector<std::size_t> from; // the original properties it is made of
        Rules rules;
    };
    struct Gone {
        std::size_t from;
        Rule rule;
    };
    std::vector<Kept> kept; // in load order
    std::vector<Gone> gone;
    [[nodiscard]] state_builder::Props After() const;
};

/// Predicts the round trip of a list of the class. `pools` are the pools that the load adds to an uplink
/// port. `switchName` is the name that the save gives a switch without one.
struct ListContext {
    SwitchTraits sw;
    uint32_t propClass = 0;
    std::optional<Value> pools;
    const char *nameless = nullptr;
};
ListFate FateOf(const ListContext &context, const state_builder::Props &before);

/// The errors in a prediction, as sentences: duplicated or missing properties, and changes without a rule.
std::vector<std::string> Unexplained(const state_builder::Props &before, const ListFate &fate);

/// Predicts the whole state. Fails the running test if a change has no rule or if the state contains a case
/// that the model does not cover (see model.cpp).
std::vector<state_builder::Switch> AfterRoundTrip(const std::vector<state_builder::Switch> &before,
                                                  uint32_t hostLimit, Ledger *ledger);

/// The differences of two states, one line per field or property.
std::vector<std::string> Differences(const std::vector<state_builder::Switch> &expected,
                                     const std::vector<state_builder::Switch> &actual);

} // namespace round_trip

#endif
