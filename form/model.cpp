/* SPDX-License-Identifier: Apache-2.0 */
// From serialized bytes to the model.

#include "form/model.h"

#include <algorithm>
#include <array>

#include <fmt/format.h>

#include "dvs/state.h"
#include "dvsdata/buffer_view.h"
#include "dvsstate/names.h"

namespace dvs::form {

namespace {

struct KindRow {
    std::uint32_t kind;
    const char *name;
};

constexpr KindRow kKinds[] = {
    {DVS_PORT_ACTIVE, "active"},
    {DVS_PORT_SHADOW, "shadow"},
    {DVS_PORT_ZOMBIE, "zombie"},
    {DVS_PORT_LOCAL_CACHE, "local-cache"},
};

void Fill(Property &property, const data::EntryView &view) {
    property.name = view.Name();
    property.type = view.propType;
    property.value = view.value;
    property.offset = view.offset;
}

Role RoleOf(const state::StateItem &item) {
    if (item.kind == state::StateItemKind::Other) return Role::Other;
    if (item.kind == state::StateItemKind::Port) return Role::Port;
    for (const Role role : {Role::Version, Role::ClassName, Role::MaxPorts, Role::GlobalList})
        if (item.entry.Name() == RoleName(role)) return role;
    return Role::HostList;
}

void AddItem(State &state, const state::StateItem &item) {
    if (item.kind == state::StateItemKind::State || item.kind == state::StateItemKind::End) return;
    if (item.depth == 1) {
        Switch &sw = state.switches.emplace_back();
        Fill(sw, item.entry);
        sw.isOther = item.kind == state::StateItemKind::Other;
    } else if (item.depth == 2) {
        Entry &entry = state.switches.back().entries.emplace_back();
        Fill(entry, item.entry);
        entry.role = RoleOf(item);
        entry.kind = item.portKind;
    } else {
        Fill(state.switches.back().entries.back().list.emplace_back(), item.entry);
    }
}

// The text of a property, up to its NUL; empty when it is not there.
std::string_view TextOf(const std::vector<Property> &list, std::string_view name) {
    for (const Property &property : list) {
        if (property.name != name) continue;
        const std::string_view text = AsText(property.value);
        return text.substr(0, text.find('\0'));
    }
    return {};
}

void FindAliases(State &state) {
    for (Switch &sw : state.switches) {
        if (const Entry *global = sw.Find(Role::GlobalList))
            sw.alias = TextOf(global->list, dvs::state::kSwitchAlias);
        for (Entry &entry : sw.entries)
            if (entry.role == Role::Port) entry.alias = TextOf(entry.list, dvs::state::kPortAlias);
    }
}

} // namespace

const std::string_view kKindProperty = dvs::state::kPortKind;

const char *RoleName(Role role) {
    switch (role) {
    case Role::Version:
        return dvs::state::kSwitchVersion;
    case Role::ClassName:
        return dvs::state::kClassName;
    case Role::MaxPorts:
        return dvs::state::kMaxPorts;
    case Role::GlobalList:
        return dvs::state::kGlobalPropList;
    case Role::HostList:
        return dvs::state::kHostPropList;
    case Role::Port:
    case Role::Other:
        break;
    }
    return "";
}

const char *KindName(std::uint32_t kind) {
    for (const KindRow &row : kKinds)
        if (row.kind == kind) return row.name;
    return nullptr;
}

std::optional<std::uint32_t> KindFromName(std::string_view name) {
    for (const KindRow &row : kKinds)
        if (row.name == name) return row.kind;
    return std::nullopt;
}

std::optional<std::uint32_t> AsNumber(Bytes value) {
    if (value.size() != sizeof(std::uint32_t)) return std::nullopt;
    return data::Load32(value.data());
}

const Entry *Switch::Find(Role role) const {
    const auto found =
        std::find_if(entries.begin(), entries.end(), [&](const Entry &e) { return e.role == role; });
    return found == entries.end() ? nullptr : &*found;
}

std::optional<std::uint32_t> Switch::Number(Role role) const {
    const Entry *entry = Find(role);
    return entry ? AsNumber(entry->value) : std::nullopt;
}

std::string_view Switch::ClassName() const {
    const Entry *entry = Find(Role::ClassName);
    if (!entry) return {};
    const std::string_view text = AsText(entry->value);
    return text.substr(0, text.find('\0'));
}

std::size_t Switch::PortCount() const {
    return static_cast<std::size_t>(
        std::count_if(entries.begin(), entries.end(), [](const Entry &e) { return e.role == Role::Port; }));
}

std::size_t Switch::PropertyCount() const {
    std::size_t count = 0;
    for (const Entry &entry : entries)
        count += entry.list.size();
    return count;
}

State ParseState(Bytes bytes) {
    State state;
    state::StateView view(bytes);
    for (state::StateItem item; view.Next(&item);) {
        if (item.kind == state::StateItemKind::State) state.size = item.buffer->Header().totalLength;
        AddItem(state, item);
    }
    FindAliases(state);
    return state;
}

std::string ShowPath(const state::StatePath &path) {
    if (path.depth == 0) return {};
    std::string text = "switch " + std::string(path.names[0]);
    if (path.depth == 1) return text;
    // A port may have the name of a field; where that matters the byte offset tells them apart.
    const std::string_view member = path.names[1];
    bool isPort = true;
    for (int i = 0; i <= static_cast<int>(Role::HostList); ++i)
        isPort = isPort && member != RoleName(static_cast<Role>(i));
    text += (isPort ? ", port " : ", ") + std::string(member);
    if (path.depth > 2) text += ", property " + std::string(path.names[2]);
    return text;
}

std::string ShowFault(const state::StateFault &fault) {
    std::array<char, 256> text{};
    (void)fault.Describe(text); // longer than any of its texts
    return text.data();
}

} // namespace dvs::form
