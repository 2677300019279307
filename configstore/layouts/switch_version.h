/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_SWITCH_VERSION_H
#define CONFIGSTORE_LAYOUTS_SWITCH_VERSION_H

// The version of a switch: a number in the property, a text in the store and in typed values. A text stands for
// two numbers; the switch's overlay flag tells which.

#include <array>
#include <iterator>

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

namespace dvs::layout {

struct VersionRow {
    const char *text;
    uint32_t number;
    uint32_t overlayNumber; // with the overlay flag set
};

// clang-format off
inline constexpr VersionRow kVersions[] = {
    {"6.0.0",     4,   4},
    {"6.5.0",     5,   5},
    {"6.6.0",     6,   6},
    {"7.0.0",     7, 107},
    {"7.0.2",     8, 108},
    {"7.0.3",     9, 109},
    {"8.0.0",    10, 110},
    {"8.0.2",    11, 111},
    {"8.0.3",    12, 112},
    {"OVL 1.0", 100, 100},
};
// clang-format on

/// The text of a number; null for a number that is no version.
constexpr const char *VersionText(uint32_t number) {
    for (const VersionRow &row : kVersions) {
        if (row.number == number || row.overlayNumber == number) return row.text;
    }
    return nullptr;
}

/// The number of a text; 0 for a text that is no version.
constexpr uint32_t VersionNumber(std::string_view text, bool isOverlay) {
    for (const VersionRow &row : kVersions) {
        if (text == row.text) return isOverlay ? row.overlayNumber : row.number;
    }
    return 0;
}

inline constexpr auto kVersionTexts = [] {
    std::array<const char *, std::size(kVersions)> texts{};
    for (std::size_t i = 0; i < texts.size(); ++i)
        texts[i] = kVersions[i].text;
    return texts;
}();
inline constexpr Domain kVersionDomain = {"switch versions", kVersionTexts.data(), kVersionTexts.size(), {}};

inline constexpr Field kVersionFields[] = {
    {"version", 0, 4, Kind::kUnsigned, nullptr, "number of the switch's version"},
};
inline constexpr Record kSwitchVersion = {"switch version", 4, kVersionFields, {}};
static_assert(IsSound(kSwitchVersion));

inline constexpr StoreField kVersionForm = {
    nullptr, Form::kText, {.keep = Keep::kVersion, .field = &kVersionFields[0]},
    "",      0,           &kVersionDomain,
    nullptr, {},          "version of the switch; 107 to 112 have the texts of 7 to 12"};

} // namespace dvs::layout

#endif
