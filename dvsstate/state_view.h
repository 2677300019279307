/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_STATE_VIEW_H
#define DVSSTATE_STATE_VIEW_H

// A read-only walk over the bytes of a whole serialized state, for display, verification, comparison, export
// and fuzzing. It allocates nothing, prints nothing, touches no table, ignores host limits and drops no
// entry. Uses dvsdata/buffer_view.h for each single buffer.
//
//     StateView view(bytes);
//     StateItem item;
//     while (view.Next(&item)) { ... item.kind, item.depth, item.path, item.entry, item.fault ... }
//
// Items come in byte order, parents before their contents:
//
//     depth 0   State       the buffer itself
//     depth 1   Switch        an entry of it, and the buffer that is its value
//     depth 2   Field           "switchVersion", "className" or "maxPorts"
//               List            "globalPropList" or "hostPropList", and its buffer
//     depth 3   Property          an entry of it
//     depth 2   Port            any other entry of a switch, and the buffer that is its value
//     depth 3   Property          an entry of it
//               End         the end marker of a State, Switch, List or Port, at that item's depth
//
// The walk continues after a fault as far as the bytes allow: into a buffer with a wrong checksum or version,
// and past a damaged value to the next entry. VerifyState checks the whole state.
//
// All offsets count from the first byte of the state.

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "dvsdata/buffer_view.h"

namespace dvs::state {

/// Names from the state down: switch id, then list name or port id (or field), then property. They point into
/// the bytes and are not escaped: they may contain any character but NUL.
struct StatePath {
    static constexpr std::size_t kMaxDepth = 3;

    std::array<std::string_view, kMaxDepth> names{};
    std::size_t depth = 0; // names in use; 0 is the state itself

    /// Writes the names, separated by slashes, into `out`, truncated to its size and NUL-terminated; false if
    /// truncated.
    bool Format(std::span<char> out) const;
    bool operator==(const StatePath &other) const = default;
};

enum class StateFaultKind : std::uint8_t {
    None,
    Buffer,          // a buffer is malformed: see `buffer`
    VersionMissing,  // a switch without "switchVersion"; at the switch
    VersionShort,    // shorter than four bytes; at the entry
    ClassMissing,    // a switch without "className"; at the switch
    MaxPortsMissing, // a switch without "maxPorts"; at the switch
    MaxPortsShort,   // shorter than four bytes; at the entry
    SwitchIdLong,    // 64 characters or more; at the switch
    PortKindShort,   // a port kind shorter than four bytes; at that property
    PortIdLong,      // 48 characters or more (16 up to switch version 6); at the port
    PortRepeated,    // a second port of the same id and kind, not zombies; at the second
    // Only with host limits:
    TooManySwitches, // the table has no room for it; at the switch
    SwitchTooLarge,  // its port limit exceeds the host's free ports; at the switch
    TooManyPorts,    // one more port than the limit of its switch or of the host; at the port
    NoMemory         // the rest of the state is not checked for repeated ports; at the port
};

/// A fault and its location.
struct StateFault {
    StateFaultKind kind = StateFaultKind::None;
    std::size_t offset = 0; // of the byte, in the whole state
    StatePath path;         // of the faulty switch, list, port or property
    data::Fault buffer;     // for kind Buffer

    explicit operator bool() const { return kind != StateFaultKind::None; }
    /// A short description of the fault; static.
    [[nodiscard]] const char *Text() const;
    /// The status with which a load rejects it; HYP_OK for None.
    [[nodiscard]] HYP_ReturnStatus Status() const;
    /// Writes the text, with the numbers of a malformed buffer, into `out`, truncated and NUL-terminated;
    /// false if truncated.
    bool Describe(std::span<char> out) const;
};

enum class StateItemKind : std::uint8_t { State, Switch, Field, List, Port, Property, Other, End };

/// The fields of a switch; absent ones (and numbers shorter than four bytes) have no value.
struct SwitchSummary {
    std::optional<std::uint32_t> version, maxPorts;
    std::optional<std::string_view> className; // up to its NUL or its end
};

struct StateItem {
    StateItemKind kind = StateItemKind::State;
    std::size_t depth = 0;
    StatePath path;
    data::EntryView entry; // all fields as stored; empty for State, and for End of it
    /// The buffer of a State, Switch, List, Port or their End: header, base offset, used size. Valid until
    /// the next item; null for other kinds.
    const data::BufferView *buffer = nullptr;
    /// True if the type word has none of the bits that a load accepts, so a load skips the entry (kind Other
    /// on depth 1 and 2).
    bool dropped = false;
    SwitchSummary sw;           // for Switch
    std::uint32_t portKind = 1; // for Port: the kind a load gives it
    /// The first fault of this switch, list, port or state in the order in which a load finds them. Excludes
    /// faults of a switch's ports (they report their own) and, for a state, of its switches.
    StateFault fault;
};

class StateView {
public:
    /// `bytes` must outlive the view and its items.
    explicit StateView(data::Bytes bytes) : bytes_(bytes) {}

    /// Returns the next item; false after the last one.
    bool Next(StateItem *item);
    /// Skips the contents of the last returned item: the next item is its End.
    void Skip();

private:
    /// A buffer on the current path.
    struct Level {
        data::BufferView view;
        data::EntryView entry;                     // the entry that holds the buffer
        std::array<std::size_t, 5> fieldOffsets{}; // of a switch's fixed entries
        bool skipped = false;
    };

    void Descend(StateItem *item, data::Bytes bytes, std::size_t offset);
    void FillSwitch(StateItem *item);
    void FillMember(StateItem *item);
    [[nodiscard]] StatePath PathTo(std::size_t depth, std::string_view name) const;

    data::Bytes bytes_;
    std::array<Level, StatePath::kMaxDepth> levels_{};
    std::size_t depth_ = 0; // number of buffers on the current path
    bool started_ = false;
};

struct StateCounts {
    std::uint32_t switches = 0, ports = 0, properties = 0;
};

struct StateVerdict {
    /// The first fault that a load into an empty table would find; None: the state is valid.
    StateFault first;
    /// The same, or the innermost fault inside it: one wrong byte breaks the checksum of every enclosing
    /// buffer, and this is the smallest of them.
    StateFault located;
    StateCounts sound; // properties of valid lists and ports; switches whose whole contents are valid
    StateCounts all;
};

/// Verifies the whole state. `hostMaxPorts` is the host-wide port limit; if given, also checks that the state
/// fits into an empty table of such a host.
[[nodiscard]] StateVerdict VerifyState(data::Bytes bytes,
                                       std::optional<std::uint32_t> hostMaxPorts = std::nullopt);

} // namespace dvs::state

#endif
