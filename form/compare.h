/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_COMPARE_H
#define FORM_COMPARE_H

// What differs between two states: by switch, field, property and port, never by bytes that carry no meaning.

#include <cstdint>
#include <vector>

#include "form/model.h"

namespace dvs::form {

enum class ChangeKind { Added, Removed, Changed, Reordered };

/// What a change is about. A switch or port that came or went is one change, whatever it holds.
enum class Subject { Switch, Field, List, Port, Property, Entry };

/// One difference. The pointers lead into the compared states and live as long as these.
struct Change {
    ChangeKind kind = ChangeKind::Changed;
    Subject subject = Subject::Property;
    const Switch *sw = nullptr;  ///< the switch it is in, on the side that has it (before, when both have)
    const Entry *port = nullptr; ///< the port it is in or is, likewise
    const char *list = "";       ///< "global", "host", "port" of a property, a list or an order
    const Property *before = nullptr; ///< what was there; null when added
    const Property *after = nullptr;  ///< what is there now; null when removed
    const Switch *now = nullptr;      ///< the switch after, where both sides have it
};

struct CompareOptions {
    bool order = false;       ///< another order of the same entries is a difference
    bool ignoreTypes = false; ///< another type word with the same value is none
};

/// Switches are matched by id; ports by id and kind; properties by name; namesakes by their order. In the
/// order of `before`, what is only in `after` behind it.
std::vector<Change> Compare(const State &before, const State &after, const CompareOptions &options);

} // namespace dvs::form

#endif
