/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_MODEL_H
#define FORM_MODEL_H

// A state as the verbs see it: switches, their entries and properties, as views into the serialized bytes, in
// their order and with their duplicates. Stands on the library's read-only views; loads nothing into the
// switch table.

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "dvsstate/state_view.h"
#include "form/text.h"

namespace dvs::form {

struct Property {
    std::string_view name;
    std::uint32_t type = 0;
    Bytes value;
    std::size_t offset = 0; ///< of the entry, from the start of the state
};

/// What an entry of a switch is. Of several namesakes the first is the field; the others count as ports, as
/// for the library. Other: its type is one that a load passes over, whatever its name.
enum class Role { Version, ClassName, MaxPorts, GlobalList, HostList, Port, Other };

struct Entry : Property {
    Role role = Role::Port;
    std::vector<Property> list; ///< of a property list or port
    std::uint32_t kind = 1;     ///< of a port
    std::string_view alias;     ///< of a port; empty when it has none

    bool IsList() const { return role >= Role::GlobalList && role <= Role::Port; }
};

struct Switch : Property {
    bool isOther = false; ///< its type is one that a load passes over; it has no entries then
    std::vector<Entry> entries;
    std::string_view alias; ///< empty when it has none

    /// The first entry of the role; null when there is none. Not for ports.
    const Entry *Find(Role role) const;
    std::optional<std::uint32_t> Number(Role role) const; ///< of a 4-byte field
    std::string_view ClassName() const;                   ///< up to its NUL; empty when absent
    std::size_t PortCount() const;
    std::size_t PropertyCount() const;
};

struct State {
    std::vector<Switch> switches;
    std::size_t size = 0; ///< of the buffer, without what lies behind it
};

/// Name of the entry that has the role ("switchVersion"); empty for ports.
const char *RoleName(Role role);

/// "active", "shadow", "zombie", "local-cache"; null for other kinds.
const char *KindName(std::uint32_t kind);
std::optional<std::uint32_t> KindFromName(std::string_view name);

/// The property that carries a port's kind.
extern const std::string_view kKindProperty;

/// The type word of the switch state's own entries.
inline constexpr std::uint32_t kStateType = 0x10;
/// The type word of a property that was set without one.
inline constexpr std::uint32_t kDefaultType = 0x20;

std::optional<std::uint32_t> AsNumber(Bytes value); ///< of exactly four bytes

/// The model of a sound state; its views live as long as the bytes. Of a damaged one, what can be walked.
State ParseState(Bytes bytes);

/// The path as people read it: "switch S, port P, property N", not escaped. Empty for the state itself.
std::string ShowPath(const state::StatePath &path);

/// The fault in words, with its numbers.
std::string ShowFault(const state::StateFault &fault);

} // namespace dvs::form

#endif
