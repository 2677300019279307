/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_STATE_VIEW_H
#define DVSSTATE_STATE_VIEW_H

// A read-only walk over the bytes of a whole serialized state, for everything that looks without loading:
// displays, verification, comparison, export, fuzzing. It allocates nothing, prints nothing, touches no
// table, obeys no host's limits and drops no entry. Stands on dvsdata/buffer_view.h for each single buffer;
// knows nobody above it.
//
//     StateView view(bytes);
//     StateItem item;
//     while (view.Next(&item)) { ... item.kind, item.depth, item.path, item.entry, item.fault ... }
//
// Items come in the order of the bytes, parents before what they hold:
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
// The walk goes on behind a fault as far as the bytes allow: over a wrong checksum or version into the
// buffer, behind a damaged value to the next entry. VerifyState gives the verdict over the whole.
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

/// Names from the state down: switch id, then list name or port id (or field), then property. Lent from the
/// bytes, not escaped: they may hold any character but NUL.
struct StatePath {
    static constexpr std::size_t kMaxDepth = 3;

    std::array<std::string_view, kMaxDepth> names{};
    std::size_t depth = 0; // names in use; 0 is the state itself

    /// Writes the names with a slash between them into `out`, cut to its size and ended by NUL; false when
    /// cut.
    bool Format(std::span<char> out) const;
    bool operator==(const StatePath &other) const = default;
};

enum class StateFaultKind : std::uint8_t {
    None,
    Buffer,          // a buffer is malformed: see `buffer`
    VersionMissing,  // a switch without "switchVersion"; at the switch
    VersionShort,    // of less than four bytes; at the entry
    ClassMissing,    // a switch without "className"; at the switch
    MaxPortsMissing, // a switch without "maxPorts"; at the switch
    MaxPortsShort,   // of less than four bytes; at the entry
    SwitchIdLong,    // 64 characters or more; at the switch
    PortKindShort,   // a port kind of less than four bytes; at that property
    PortIdLong,      // 48 characters or more (16 up to switch version 6); at the port
    PortRepeated,    // a second port of the same id and kind, not zombies; at the second
    // Only where host limits are asked for:
    TooManySwitches, // the table has no room for it; at the switch
    SwitchTooLarge,  // its port limit exceeds the host's free ports; at the switch
    TooManyPorts,    // one more port than the limit of its switch or of the host; at the port
    NoMemory         // the rest of the state is not searched for repeated ports; at the port
};

/// What is wrong and where.
struct StateFault {
    StateFaultKind kind = StateFaultKind::None;
    std::size_t offset = 0; // of the byte, in the whole state
    StatePath path;         // of the switch, list, port or property that is faulty
    data::Fault buffer;     // for Buffer

    explicit operator bool() const { return kind != StateFaultKind::None; }
    /// What is wrong, in a few words; static.
    [[nodiscard]] const char *Text() const;
    /// The status a load refuses with; HYP_OK for None.
    [[nodiscard]] HYP_ReturnStatus Status() const;
    /// Writes the text, with the numbers of a malformed buffer, into `out`, cut and ended by NUL; false when
    /// cut.
    bool Describe(std::span<char> out) const;
};

enum class StateItemKind : std::uint8_t { State, Switch, Field, List, Port, Property, Other, End };

/// The fields of a switch; absent ones (and numbers of less than four bytes) have no value.
struct SwitchSummary {
    std::optional<std::uint32_t> version, maxPorts;
    std::optional<std::string_view> className; // up to its NUL or its end
};

struct StateItem {
    StateItemKind kind = StateItemKind::State;
    std::size_t depth = 0;
    StatePath path;
    data::EntryView entry; // all fields as they stand; empty for State, and for End of it
    /// The buffer of a State, Switch, List, Port or their End: header, base offset, used size. Lent until the
    /// next item; null for other kinds.
    const data::BufferView *buffer = nullptr;
    /// Its type word has none of the bits that a load asks for, which therefore passes over it (kind Other on
    /// depth 1 and 2: what it might have been does not matter).
    bool dropped = false;
    SwitchSummary sw;           // for Switch
    std::uint32_t portKind = 1; // for Port: what a load makes of it
    /// The first fault of this switch, list, port or state in the order in which a load finds them, but for
    /// what is wrong with its ports (which have their own) and, in a state, with its switches.
    StateFault fault;
};

class StateView {
public:
    /// `bytes` must outlive the view and its items.
    explicit StateView(data::Bytes bytes) : bytes_(bytes) {}

    /// The next item; false behind the last one.
    bool Next(StateItem *item);
    /// Passes over what the item given last holds: the next one is its End.
    void Skip();

private:
    /// A buffer being walked.
    struct Level {
        data::BufferView view;
        data::EntryView entry;                     // whose value it is
        std::array<std::size_t, 5> fieldOffsets{}; // of a switch's fixed entries
        bool skipped = false;
    };

    void Descend(StateItem *item, data::Bytes bytes, std::size_t offset);
    void GiveSwitch(StateItem *item);
    void GiveMember(StateItem *item);
    [[nodiscard]] StatePath PathTo(std::size_t depth, std::string_view name) const;

    data::Bytes bytes_;
    std::array<Level, StatePath::kMaxDepth> levels_{};
    std::size_t depth_ = 0; // buffers being walked
    bool started_ = false;
};

struct StateCounts {
    std::uint32_t switches = 0, ports = 0, properties = 0;
};

struct StateVerdict {
    /// What a load into an empty table would stumble over first; None: the state is sound.
    StateFault first;
    /// The same, or the innermost fault inside it: one wrong byte spoils the checksum of every buffer around
    /// it, and this is the smallest of them.
    StateFault located;
    StateCounts sound; // properties: of sound lists and ports; switches: with everything they hold
    StateCounts all;
};

/// Judges the whole state. With `hostMaxPorts`, which is the host-wide port limit, also whether the state
/// fits into an empty table of such a host.
[[nodiscard]] StateVerdict VerifyState(data::Bytes bytes,
                                       std::optional<std::uint32_t> hostMaxPorts = std::nullopt);

} // namespace dvs::state

#endif
