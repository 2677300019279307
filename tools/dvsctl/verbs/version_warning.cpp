/* SPDX-License-Identifier: Apache-2.0 */
// The words of the warnings (version_warning.h).

#include "tools/dvsctl/verbs/version_warning.h"

#include <algorithm>

#include <fmt/format.h>

namespace dvs::ctl {

const std::string_view kVersionProperty = "com.orbeno.common.version";

namespace {

// A word of a shell's command line. Without a backslash, which would be doubled when it is shown.
std::string ShellWord(std::string_view text) {
    std::string word = "'";
    for (const char c : text)
        word += c == '\'' ? std::string("'\"'\"'") : std::string(1, c);
    return word + "'";
}

bool HasVersion(const Switch &sw) {
    const Entry *global = sw.Find(Role::GlobalList);
    return global && std::ranges::any_of(global->list, [](const Property &property) {
               return property.name == kVersionProperty;
           });
}

} // namespace

std::string SetVersionCommand(std::string_view switchId, std::optional<std::uint32_t> version) {
    const std::string number = version ? std::to_string(*version) : "VERSION";
    return fmt::format("dvsctl kernel prop set {} {} {} --as number", ShellWord(switchId), kVersionProperty,
                       number);
}

Error VersionlessWarning(std::string_view switchId, std::optional<std::uint32_t> version) {
    return Error(ErrorKind::Warning, fmt::format("switch {} has no property {}", switchId, kVersionProperty))
        .In("kernel:")
        .Because("once it is saved like this, the config store cannot be loaded, this switch or any other")
        .Try(SetVersionCommand(switchId, version));
}

std::vector<const Switch *> VersionlessSwitches(const State &state) {
    std::vector<const Switch *> found;
    for (const Switch &sw : state.switches)
        if (!sw.isOther && !HasVersion(sw)) found.push_back(&sw);
    return found;
}

Error UnloadableWarning(const State &state, Error cause) {
    cause.kind = ErrorKind::Warning;
    cause.title = "as it is saved now, the config store cannot be loaded: no switch of it";
    cause.next = "dvsctl store history and dvsctl store restore bring back what was there before";
    const auto lacking = VersionlessSwitches(state);
    const auto isNamed = [&](const Switch *sw) {
        return std::ranges::any_of(cause.messages, [&](const std::string &message) {
            return message.find(fmt::format(" {} ", sw->name)) != std::string::npos;
        });
    };
    const auto culprit = std::ranges::find_if(lacking, isNamed);
    if (culprit == lacking.end()) return cause;
    const Switch &sw = **culprit;
    cause.why = fmt::format("switch {} has no property {}, which a load needs of every switch", sw.name,
                            kVersionProperty);
    if (lacking.size() > 1) cause.why += fmt::format(" (nor have {} others)", lacking.size() - 1);
    cause.next = fmt::format("{}, where the live module is the source, else add it in the JSON form; then "
                             "copy again",
                             SetVersionCommand(sw.name, sw.Number(Role::Version)));
    return cause;
}

} // namespace dvs::ctl
