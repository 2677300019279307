/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_VERBS_VERSION_WARNING_H
#define DVSCTL_VERBS_VERSION_WARNING_H

// A trap for operators: a load from the config store needs the version of every switch, and the store has it
// from a property that nothing else asks for. A switch without it can be made and saved, and the store then
// loads no switch any more.

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "form/model.h"
#include "tools/dvsctl/cli/error.h"

namespace dvs::ctl {

/// The global property that carries a switch's version into the config store.
extern const std::string_view kVersionProperty;

/// The command that gives a live switch its version; without a number, with a word in its place.
std::string SetVersionCommand(std::string_view switchId, std::optional<std::uint32_t> version);

/// The warning about a live switch that is left without the property.
Error VersionlessWarning(std::string_view switchId, std::optional<std::uint32_t> version);

/// The switches of a state that lack it.
std::vector<const Switch *> VersionlessSwitches(const State &state);

/// The warning that goes with a save of `state` after which the store does not load; `cause` is the load's.
Error UnloadableWarning(const State &state, Error cause);

} // namespace dvs::ctl

#endif
