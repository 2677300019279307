/* SPDX-License-Identifier: Apache-2.0 */
// Verifies a whole state and holds the texts of its faults (state_view.h). Uses the walk only. It keeps small
// copies of a load's tables, so the process-wide table is not touched.

#include <algorithm>
#include <bit>
#include <cstdio>
#include <cstring>
#include <functional>
#include <new>
#include <vector>

#include "dvsstate/names.h"
#include "dvsstate/port_table.h"
#include "dvsstate/state_view.h"
#include "dvsstate/switch_table.h"

namespace dvs::state {

namespace {

using data::Bytes;

struct FaultRow {
    const char *text;
    HYP_ReturnStatus status;
};

// In the order of StateFaultKind.
constexpr FaultRow kFaults[] = {
    {"no fault", HYP_OK},
    {"malformed buffer", HYP_BAD_PARAM}, // replaced by the buffer's own text and status
    {"switch has no switchVersion", HYP_NOT_FOUND},
    {"switchVersion is shorter than four bytes", HYP_BAD_PARAM},
    {"switch has no className", HYP_NOT_FOUND},
    {"switch has no maxPorts", HYP_NOT_FOUND},
    {"maxPorts is shorter than four bytes", HYP_BAD_PARAM},
    {"switch id is longer than 63 characters", HYP_BAD_PARAM},
    {"port kind is shorter than four bytes", HYP_BAD_PARAM},
    {"port id is too long for the switch version", HYP_BAD_PARAM},
    {"port of this id and kind is there already", HYP_EXISTS},
    {"more switches than the table holds", HYP_LIMIT_EXCEEDED},
    {"port limit of the switch exceeds the host's free ports", HYP_LIMIT_EXCEEDED},
    {"more ports than the switch or the host may have", HYP_LIMIT_EXCEEDED},
    {"no memory for finding repeated ports", HYP_NO_MEMORY},
};

const FaultRow &Row(StateFaultKind kind) {
    return kFaults[static_cast<std::size_t>(kind)];
}

/// A switch that a load would have in the table by now. A repeated id adds to the existing switch.
struct LoadedSwitch {
    std::string_view id;
    uint32_t version, maxPorts, classFlags, portNum;
};

/// The ports that a load would have in its table by now, keyed by the position of their names in the bytes.
class SeenPorts {
public:
    explicit SeenPorts(Bytes bytes) : bytes_(bytes) {}

    /// Inserts a port; HYP_EXISTS if it is already present. The names must lie in the bytes.
    HYP_ReturnStatus Insert(std::string_view switchId, std::string_view portId, uint32_t kind) {
        if (used_ * 2 >= slots_.size() && !Grow()) return HYP_NO_MEMORY;
        const std::size_t hash = std::hash<std::string_view>{}(portId) ^
                                 std::rotl(std::hash<std::string_view>{}(switchId) + kind, 1);
        const Slot wanted = {static_cast<uint32_t>(hash), OffsetOf(switchId), OffsetOf(portId), kind};
        Slot *const slot = Find(wanted.hash, [&](const Slot &other) {
            return other.hash == wanted.hash && other.kind == kind && NameAt(other.portName) == portId &&
                   NameAt(other.switchName) == switchId;
        });
        if (slot->portName != 0) return HYP_EXISTS;
        *slot = wanted;
        used_++;
        return HYP_OK;
    }

private:
    struct Slot {
        uint32_t hash;
        uint32_t switchName, portName; // 32-bit offsets: the length is a u32; 0 in a free slot
        uint32_t kind;
    };

    [[nodiscard]] uint32_t OffsetOf(std::string_view name) const {
        return static_cast<uint32_t>(reinterpret_cast<const uint8_t *>(name.data()) - bytes_.data());
    }
    [[nodiscard]] std::string_view NameAt(uint32_t offset) const {
        const char *const name = reinterpret_cast<const char *>(bytes_.data()) + offset;
        return {name, strnlen(name, data::kNameSize - 1)};
    }

    template <typename Is> Slot *Find(uint32_t hash, Is is) {
        std::size_t at = hash & (slots_.size() - 1);
        while (slots_[at].portName != 0 && !is(slots_[at]))
            at = (at + 1) & (slots_.size() - 1);
        return &slots_[at];
    }

    bool Grow() {
        constexpr std::size_t kFirstSize = 1024;
        try {
            std::vector<Slot> old(std::max(kFirstSize, slots_.size() * 2));
            old.swap(slots_);
            for (const Slot &slot : old) {
                if (slot.portName != 0) *Find(slot.hash, [](const Slot &) { return false; }) = slot;
            }
        } catch (const std::bad_alloc &) {
            return false;
        }
        return true;
    }

    Bytes bytes_;
    std::vector<Slot> slots_; // the size is a power of two; at most half of the slots are used
    std::size_t used_ = 0;
};

class Verifier {
public:
    Verifier(Bytes bytes, std::optional<uint32_t> hostMaxPorts)
        : bytes_(bytes), hostMaxPorts_(hostMaxPorts), seen_(bytes) {}
    StateVerdict Run();

private:
    void RecordFault(const StateItem &item, const StateFault &fault);
    StateFault LoadSwitch(const StateItem &item);
    StateFault LoadPort(const StateItem &item);
    [[nodiscard]] bool IsOverLimit() const;
    void Visit(const StateItem &item);

    Bytes bytes_;
    std::optional<uint32_t> hostMaxPorts_;
    StateVerdict verdict_;
    SeenPorts seen_;
    std::array<LoadedSwitch, kSwitchNum> table_{};
    std::size_t tableSize_ = 0;
    LoadedSwitch other_{}; // a switch that the table has no room for
    LoadedSwitch *current_ = &other_;
    uint32_t portNum_ = 0;       // of all switches
    bool switchValid_ = false;   // the current switch, with its contents so far
    bool holderValid_ = false;   // the current list or port
    std::size_t locatedEnd_ = 0; // end of the buffer that verdict_.located reports a checksum fault for
};

StateVerdict Verifier::Run() {
    StateView view(bytes_);
    for (StateItem item; view.Next(&item);)
        Visit(item);
    return verdict_;
}

void Verifier::Visit(const StateItem &item) {
    StateFault fault = item.fault;
    switch (item.kind) {
    case StateItemKind::Switch:
        verdict_.all.switches++;
        if (const StateFault refused = LoadSwitch(item); !fault) fault = refused;
        switchValid_ = !fault;
        break;
    case StateItemKind::Port:
        verdict_.all.ports++;
        if (!fault) fault = LoadPort(item);
        holderValid_ = !fault;
        switchValid_ = switchValid_ && holderValid_;
        if (holderValid_) verdict_.sound.ports++;
        break;
    case StateItemKind::List:
        holderValid_ = !fault;
        break;
    case StateItemKind::Property:
        verdict_.all.properties++;
        if (holderValid_) verdict_.sound.properties++;
        break;
    case StateItemKind::End:
        if (item.depth == 1 && switchValid_) verdict_.sound.switches++;
        break;
    case StateItemKind::State:
    case StateItemKind::Field:
    case StateItemKind::Other:
        break;
    }
    if (fault) RecordFault(item, fault);
}

/// Keeps the first fault. A fault inside the buffer with the recorded checksum fault replaces the location,
/// because it is more precise.
void Verifier::RecordFault(const StateItem &item, const StateFault &fault) {
    const bool first = !verdict_.first;
    if (first) verdict_.first = fault;
    if (!first && fault.offset >= locatedEnd_) return;
    verdict_.located = fault;
    const bool sumOfItem = fault.kind == StateFaultKind::Buffer &&
                           fault.buffer.kind == data::FaultKind::Checksum && fault.path == item.path;
    const std::size_t size = item.kind == StateItemKind::State ? bytes_.size() : item.entry.value.size();
    locatedEnd_ = sumOfItem ? item.buffer->BaseOffset() + size : 0;
}

StateFault Verifier::LoadSwitch(const StateItem &item) {
    const std::string_view id = item.entry.Name();
    const auto end = table_.begin() + static_cast<std::ptrdiff_t>(tableSize_);
    const auto known =
        std::find_if(table_.begin(), end, [id](const LoadedSwitch &sw) { return sw.id == id; });
    if (known != end) {
        current_ = &*known;
        return {};
    }
    const uint32_t classFlags = ClassFlags(item.sw.className.value_or(""));
    LoadedSwitch loaded{id, item.sw.version.value_or(0), item.sw.maxPorts.value_or(0), classFlags, 0};
    const bool tooLarge = hostMaxPorts_ && classFlags == 0 && *hostMaxPorts_ - portNum_ < loaded.maxPorts;
    if (hostMaxPorts_ && classFlags != 0) loaded.maxPorts = *hostMaxPorts_;
    const bool hasRoom = tableSize_ < table_.size();
    current_ = hasRoom ? &table_[tableSize_++] : &other_;
    *current_ = loaded;
    if (id.size() >= kSwitchIdSize) return {StateFaultKind::SwitchIdLong, item.entry.offset, item.path, {}};
    if (tooLarge) return {StateFaultKind::SwitchTooLarge, item.entry.offset, item.path, {}};
    if (hostMaxPorts_ && !hasRoom) return {StateFaultKind::TooManySwitches, item.entry.offset, item.path, {}};
    return {};
}

StateFault Verifier::LoadPort(const StateItem &item) {
    const auto fault = [&item](StateFaultKind kind) {
        return StateFault{kind, item.entry.offset, item.path, {}};
    };
    const std::string_view id = item.entry.Name();
    if (id.size() >= PortIdSize(current_->version)) return fault(StateFaultKind::PortIdLong);
    if (hostMaxPorts_ && IsOverLimit()) return fault(StateFaultKind::TooManyPorts);
    HYP_ReturnStatus seen = HYP_OK;
    if (item.portKind != DVS_PORT_ZOMBIE) seen = seen_.Insert(current_->id, id, item.portKind);
    if (seen == HYP_EXISTS) return fault(StateFaultKind::PortRepeated);
    if (seen != HYP_OK) return fault(StateFaultKind::NoMemory);
    current_->portNum++;
    portNum_++;
    return {};
}

bool Verifier::IsOverLimit() const {
    if ((current_->classFlags & kUnlimitedClass) == 0 && current_->portNum == current_->maxPorts) return true;
    return portNum_ == *hostMaxPorts_ || static_cast<int32_t>(current_->maxPorts) < 1;
}

} // namespace

const char *StateFault::Text() const {
    return kind == StateFaultKind::Buffer ? buffer.Text() : Row(kind).text;
}

HYP_ReturnStatus StateFault::Status() const {
    return kind == StateFaultKind::Buffer ? buffer.Status() : Row(kind).status;
}

bool StateFault::Describe(std::span<char> out) const {
    if (kind == StateFaultKind::Buffer) return buffer.Describe(out);
    const int length = std::snprintf(out.data(), out.size(), "%s", Text());
    return static_cast<std::size_t>(length) < out.size();
}

StateVerdict VerifyState(Bytes bytes, std::optional<uint32_t> hostMaxPorts) {
    return Verifier(bytes, hostMaxPorts).Run();
}

} // namespace dvs::state
