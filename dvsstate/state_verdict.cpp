/* SPDX-License-Identifier: Apache-2.0 */
// The verdict over a whole state, and the words for its faults (state_view.h). Stands on the walk alone; the
// tables of a load are kept here in small, so that nothing is allocated and the process-wide table stays
// untouched.

#include <algorithm>
#include <bitset>
#include <cstdio>
#include <iterator>
#include <utility>

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
    {"malformed buffer", HYP_BAD_PARAM}, // the buffer's own text and status stand in for these
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
};

const FaultRow &Row(StateFaultKind kind) {
    return kFaults[static_cast<std::size_t>(kind)];
}

/// What a load would have in the table by now. An id that comes again adds to the switch that is there.
struct LoadedSwitch {
    std::string_view id;
    uint32_t version, maxPorts, classFlags, portNum;
};

/// Calls visit(entry) for the entries of a buffer as far as they hang together, until it returns false. For
/// going back over what was judged before: nothing is summed again.
template <typename Visit> void WalkAgain(Bytes buffer, std::size_t base, Visit visit) {
    std::size_t offset = data::kHeaderSize;
    while (offset + data::kEntryFixedSize <= buffer.size()) {
        const Bytes rest = buffer.subspan(offset);
        const uint32_t size = data::Load32(rest.data() + data::kEntrySizeOffset);
        const uint32_t dataLen = data::Load32(rest.data() + data::kDataLenOffset);
        if (size > rest.size() || dataLen > size || size - dataLen < data::kMinEntryRoom) return;
        data::EntryView entry;
        entry.offset = base + offset;
        entry.propType = data::Load32(rest.data() + data::kPropTypeOffset);
        entry.nameField = rest.subspan(data::kNameOffset, data::kNameSize);
        entry.value = rest.subspan(data::kEntryFixedSize, dataLen);
        if ((entry.propType & data::kDeserializeTypeMask) != 0 && !visit(entry)) return;
        offset += size;
    }
}

uint32_t KindOf(const data::EntryView &port) {
    uint32_t kind = DVS_PORT_ACTIVE;
    WalkAgain(port.value, port.ValueOffset(), [&](const data::EntryView &entry) {
        if (entry.Name() != kPortKind) return true;
        if (entry.value.size() >= sizeof kind) kind = data::Load32(entry.value.data());
        return false;
    });
    return kind;
}

/// The ports seen so far, by hash and with room for doubt: only where it says "maybe" is a port looked for
/// among those before it, so that a state of many ports costs about one pass.
class SeenPorts {
public:
    /// False when the port was certainly not there; it is from now on.
    bool Insert(std::string_view switchId, std::string_view portId, uint32_t kind) {
        uint64_t hash = kind;
        for (const std::string_view text : {switchId, std::string_view("/"), portId}) {
            for (const char c : text)
                hash = (hash ^ static_cast<unsigned char>(c)) * 0x100000001b3;
        }
        hash ^= hash >> 29;
        const bool first = Test(static_cast<std::size_t>(hash));
        return Test(static_cast<std::size_t>(hash >> 32)) && first;
    }

private:
    static constexpr std::size_t kBits = std::size_t{1} << 19;

    bool Test(std::size_t hash) {
        const bool was = bits_[hash % kBits];
        bits_.set(hash % kBits);
        return was;
    }

    std::bitset<kBits> bits_;
};

class Judge {
public:
    Judge(Bytes bytes, std::optional<uint32_t> hostMaxPorts) : bytes_(bytes), hostMaxPorts_(hostMaxPorts) {}
    StateVerdict Run();

private:
    void Blame(const StateItem &item, const StateFault &fault);
    StateFault LoadSwitch(const StateItem &item);
    StateFault LoadPort(const StateItem &item);
    [[nodiscard]] bool IsOverLimit() const;
    [[nodiscard]] bool IsRepeated(const StateItem &item) const;
    void Take(const StateItem &item);

    Bytes bytes_;
    std::optional<uint32_t> hostMaxPorts_;
    StateVerdict verdict_;
    SeenPorts seen_;
    std::array<LoadedSwitch, kSwitchNum> table_{};
    std::size_t tableSize_ = 0;
    LoadedSwitch other_{}; // one that the table has no room for
    LoadedSwitch *current_ = &other_;
    uint32_t portNum_ = 0;       // of all switches
    bool switchSound_ = false;   // the switch being walked, with all it has held so far
    bool holderSound_ = false;   // the list or port being walked
    std::size_t locatedEnd_ = 0; // of the buffer whose checksum verdict_.located is about
};

StateVerdict Judge::Run() {
    StateView view(bytes_);
    for (StateItem item; view.Next(&item);)
        Take(item);
    return verdict_;
}

void Judge::Take(const StateItem &item) {
    StateFault fault = item.fault;
    switch (item.kind) {
    case StateItemKind::Switch:
        verdict_.all.switches++;
        if (const StateFault refused = LoadSwitch(item); !fault) fault = refused;
        switchSound_ = !fault;
        break;
    case StateItemKind::Port:
        verdict_.all.ports++;
        if (!fault) fault = LoadPort(item);
        holderSound_ = !fault;
        switchSound_ = switchSound_ && holderSound_;
        if (holderSound_) verdict_.sound.ports++;
        break;
    case StateItemKind::List:
        holderSound_ = !fault;
        break;
    case StateItemKind::Property:
        verdict_.all.properties++;
        if (holderSound_) verdict_.sound.properties++;
        break;
    case StateItemKind::End:
        if (item.depth == 1 && switchSound_) verdict_.sound.switches++;
        break;
    case StateItemKind::State:
    case StateItemKind::Field:
    case StateItemKind::Other:
        break;
    }
    if (fault) Blame(item, fault);
}

/// The first fault counts. One inside the buffer whose checksum is blamed so far says more precisely where it
/// is.
void Judge::Blame(const StateItem &item, const StateFault &fault) {
    const bool first = !verdict_.first;
    if (first) verdict_.first = fault;
    if (!first && fault.offset >= locatedEnd_) return;
    verdict_.located = fault;
    const bool sumOfItem = fault.kind == StateFaultKind::Buffer &&
                           fault.buffer.kind == data::FaultKind::Checksum && fault.path == item.path;
    const std::size_t size = item.kind == StateItemKind::State ? bytes_.size() : item.entry.value.size();
    locatedEnd_ = sumOfItem ? item.buffer->BaseOffset() + size : 0;
}

StateFault Judge::LoadSwitch(const StateItem &item) {
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

StateFault Judge::LoadPort(const StateItem &item) {
    const auto fault = [&item](StateFaultKind kind) {
        return StateFault{kind, item.entry.offset, item.path, {}};
    };
    const std::string_view id = item.entry.Name();
    if (id.size() >= PortIdSize(current_->version)) return fault(StateFaultKind::PortIdLong);
    if (hostMaxPorts_ && IsOverLimit()) return fault(StateFaultKind::TooManyPorts);
    if (item.portKind != DVS_PORT_ZOMBIE && seen_.Insert(current_->id, id, item.portKind) && IsRepeated(item))
        return fault(StateFaultKind::PortRepeated);
    current_->portNum++;
    portNum_++;
    return {};
}

bool Judge::IsOverLimit() const {
    if ((current_->classFlags & kUnlimitedClass) == 0 && current_->portNum == current_->maxPorts) return true;
    return portNum_ == *hostMaxPorts_ || static_cast<int32_t>(current_->maxPorts) < 1;
}

bool Judge::IsRepeated(const StateItem &item) const {
    bool found = false;
    WalkAgain(bytes_, 0, [&](const data::EntryView &sw) {
        if (sw.offset > item.entry.offset) return false;
        if (sw.Name() != item.path.names[0]) return true;
        std::array<bool, std::size(kFixedEntries)> have{};
        WalkAgain(sw.value, sw.ValueOffset(), [&](const data::EntryView &port) {
            if (port.offset >= item.entry.offset) return false;
            const auto fixed = std::ranges::find(kFixedEntries, port.Name());
            if (fixed != std::end(kFixedEntries) &&
                !std::exchange(have[static_cast<std::size_t>(fixed - std::begin(kFixedEntries))], true))
                return true;
            found = port.Name() == item.entry.Name() && KindOf(port) == item.portKind;
            return !found;
        });
        return !found;
    });
    return found;
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
    return Judge(bytes, hostMaxPorts).Run();
}

} // namespace dvs::state
