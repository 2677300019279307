/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_ROUND_TRIP_MODEL_H
#define TESTS_CONFIGSTORE_ROUND_TRIP_MODEL_H

// What a sound state is after it was saved into a store and loaded back, by the documented rules: a small
// model of its own that knows keys, places and classes, but no store and no converter. Every property of the
// state before is either the same after, or changed or dropped by rules with names; what is new has a rule
// too. Tests compare what the library loads with what is expected here.

#include <optional>
#include <string>
#include <vector>

#include "configstore/round_trip/values.h"
#include "configstore/state_builder.h"

namespace round_trip {

/// A property whose type word has none of these bits is not read from a state.
inline constexpr uint32_t kReadTypes = 0x800000fc;

/// What the converters are told of the switch whose properties they handle.
struct SwitchTraits {
    std::string className;
    uint32_t savedVersion = 0;  // of the switch record
    uint32_t loadedVersion = 0; // as it is read back
    bool isOverlay = false;
    [[nodiscard]] bool IsEtherswitch() const { return className != "vswitch" && className != "cswitch"; }
};

/// What becomes of one list of properties.
struct ListFate {
    struct Kept {
        state_builder::Prop after;
        std::vector<std::size_t> from; // the properties before that it is made of
        Rules rules;
    };
    struct Gone {
        std::size_t from;
        Rule rule;
    };
    std::vector<Kept> kept; // in the order of a load
    std::vector<Gone> gone;
    [[nodiscard]] state_builder::Props After() const;
};

/// The fate of a list of the class. `pools` are what the load gives an uplink port; `switchName` is the name
/// that the save gives a switch whose own properties have none.
struct ListContext {
    SwitchTraits sw;
    uint32_t propClass = 0;
    std::optional<Value> pools;
    const char *nameless = nullptr;
};
ListFate FateOf(const ListContext &context, const state_builder::Props &before);

/// What is wrong with a fate, as sentences: properties that are in it twice or not at all, and changes that
/// no rule explains.
std::vector<std::string> Unexplained(const state_builder::Props &before, const ListFate &fate);

/// The whole state. Fails the running test where a change is unexplained, or where the state has what the
/// model does not know (see model.cpp); nothing is passed over.
std::vector<state_builder::Switch> AfterRoundTrip(const std::vector<state_builder::Switch> &before,
                                                  uint32_t hostLimit, Ledger *ledger);

/// Where two states differ, one line a field or property.
std::vector<std::string> Differences(const std::vector<state_builder::Switch> &expected,
                                     const std::vector<state_builder::Switch> &actual);

} // namespace round_trip

#endif
