/* SPDX-License-Identifier: Apache-2.0 */
// Narrowing a state down.

#include "tools/dvsctl/verbs/filter.h"

#include "form/error.h"

namespace dvs::ctl {

namespace {

// Prefers ids: an alias counts only where nothing has that id, so that every switch and port can be reached.
template <typename Item, typename IsCandidate>
bool KeepNamed(std::vector<Item> &items, std::string_view name, IsCandidate isCandidate) {
    bool hasId = false, found = false;
    for (const Item &item : items)
        hasId = hasId || (isCandidate(item) && item.name == name);
    std::erase_if(items, [&](const Item &item) {
        const bool keep =
            isCandidate(item) && (item.name == name || (!hasId && !name.empty() && item.alias == name));
        found = found || keep;
        return !keep;
    });
    return found;
}

[[noreturn]] void ThrowNotThere(const std::string &source, std::string what, std::string_view name,
                                std::string next) {
    throw Error(ErrorKind::NotThere, "there is no " + what + " \"" + std::string(name) + "\"")
        .In(source)
        .Try(std::move(next));
}

bool KeepPorts(State &state, std::string_view name) {
    bool found = false;
    for (Switch &sw : state.switches)
        found |= KeepNamed(sw.entries, name, [](const Entry &e) { return e.role == Role::Port; });
    std::erase_if(state.switches, [](const Switch &sw) { return sw.entries.empty(); });
    return found;
}

bool KeepProperties(State &state, std::string_view pattern) {
    bool found = false;
    for (Switch &sw : state.switches) {
        for (Entry &entry : sw.entries) {
            std::erase_if(entry.list, [&](const Property &p) { return !GlobMatch(pattern, p.name); });
            found = found || !entry.list.empty();
        }
        std::erase_if(sw.entries, [](const Entry &e) { return e.list.empty(); });
    }
    std::erase_if(state.switches, [](const Switch &sw) { return sw.entries.empty(); });
    return found;
}

} // namespace

void ApplyFilter(const Options &options, const std::string &source, State &state) {
    const std::string list = "dvsctl show " + source + " lists what there is";
    if (options.switchId &&
        !KeepNamed(state.switches, *options.switchId, [](const Switch &) { return true; }) &&
        !options.ifExists)
        ThrowNotThere(source, "switch", *options.switchId, list);
    if (options.portId && !KeepPorts(state, *options.portId) && !options.ifExists)
        ThrowNotThere(source, "port", *options.portId, list);
    if (options.props && !KeepProperties(state, *options.props) && !options.ifExists)
        ThrowNotThere(source, "property that matches", *options.props,
                      list + "; quote the pattern for the shell");
}

} // namespace dvs::ctl
