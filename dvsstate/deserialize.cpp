/* SPDX-License-Identifier: Apache-2.0 */
// Ports, switches and the whole switch table from serialized state. Reads nested values in place; it builds
// no lists above the property lists. Checks, the order of failures and messages match those of building a
// list for each level. Uses the readers of dvsdata, the switch table and the port table.

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>
#include <utility>

#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"
#include "dvsstate/message.h"
#include "dvsstate/names.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/port_table.h"
#include "dvsstate/switch_table.h"

using namespace dvs::state;
namespace data = dvs::data;

namespace {

/// A buffer, and its checksum if the outer buffer provided it.
struct Source {
    data::Bytes bytes;
    data::KnownSum sum;
};

Source SourceOf(const void *buf, uint32_t len) {
    return {{static_cast<const uint8_t *>(buf), buf ? len : 0}, {}};
}

Source SourceOf(const data::EntryRef &entry) {
    return {entry.value, entry.sum};
}

/// An entry's name, NUL-terminated: in place, or a copy if its field has no terminator.
class NameText {
public:
    explicit NameText(std::string_view name) : text_(name.data()) {
        if (name.size() < data::kMaxNameLen || name.data()[name.size()] == '\0') return;
        std::ranges::copy(name, copy_.begin());
        copy_[name.size()] = '\0';
        text_ = copy_.data();
    }
    NameText(const NameText &) = delete;
    NameText &operator=(const NameText &) = delete;
    operator const char *() const { return text_; }

private:
    const char *text_;
    std::array<char, data::kNameSize> copy_;
};

HYP_ReturnStatus ReadOwned(OwnedList &list, const Source &source) {
    DVSData *made = nullptr;
    const HYP_ReturnStatus status =
        data::ReadList(&made, source.bytes, std::malloc, std::free, data::kDeserializeTypeMask, source.sum,
                       data::EntryBlocks::Shared);
    if (status == HYP_OK) list.reset(made);
    return status;
}

/// Reads the u32 at the start of a value. HYP_BAD_PARAM if the value is shorter.
HYP_ReturnStatus ReadU32(data::Bytes value, uint32_t *number) {
    if (value.size() < sizeof *number) return HYP_BAD_PARAM;
    *number = data::Load32(value.data());
    return HYP_OK;
}

// ---- Ports ----

HYP_ReturnStatus AddAs(DVSwitch *sw, const char *portId, DVSData *list, DVSDataEntry *kindEntry) {
    if (!kindEntry) {
        const HYP_ReturnStatus status = DVSStatePortAdd(sw, portId, list, DVS_PORT_ACTIVE, nullptr);
        if (Prints(kError)) Message(kError, "Add active DV port %s, return %s\n", portId, Text(status));
        return status;
    }
    uint32_t kind = 0;
    HYP_ReturnStatus status = ReadU32({kindEntry->data, kindEntry->dataLen}, &kind);
    if (status != HYP_OK) return status;
    status = DVSStatePortAdd(sw, portId, list, kind, nullptr);
    Message(kError, "Deserialize DV port(type %d) %s, return %s\n", static_cast<int>(kind), portId,
            Text(status));
    (void)DVSData_Remove(list, kPortKind); // it exists
    return status;
}

HYP_ReturnStatus AddPort(DVSwitch *sw, const char *portId, const Source &source) {
    if (!sw) return HYP_NOT_FOUND;
    if (Prints(kDetail)) Message(kDetail, "Deserialize %s, %s\n", sw->switchId, portId);
    OwnedList list;
    HYP_ReturnStatus status = ReadOwned(list, source);
    if (status != HYP_OK) return status;
    status = AddAs(sw, portId, list.get(), FindEntry(list.get(), kPortKind));
    if (status == HYP_OK) (void)list.release(); // the port owns it now
    return status;
}

// ---- Switches ----

/// The fixed entries of a switch: the first entry of each name. All other entries are ports.
class FixedEntries {
public:
    explicit FixedEntries(data::InPlaceList &list);

    /// Null if there is no such entry.
    [[nodiscard]] const data::EntryRef *Find(std::string_view name) const {
        const Slot &slot = slots_[IndexOf(name)];
        return slot.present ? &slot.entry : nullptr;
    }
    [[nodiscard]] bool Holds(const data::EntryRef &entry) const {
        // No entry begins at 0, so offset 0 marks a missing one.
        return std::ranges::any_of(slots_,
                                   [&](const Slot &slot) { return slot.entry.offset == entry.offset; });
    }

private:
    struct Slot {
        bool present = false;
        data::EntryRef entry{};
    };

    static std::size_t IndexOf(std::string_view name) {
        return static_cast<std::size_t>(std::ranges::find(kFixedEntries, name) - std::begin(kFixedEntries));
    }

    std::array<Slot, std::size(kFixedEntries)> slots_;
};

FixedEntries::FixedEntries(data::InPlaceList &list) {
    std::size_t missing = slots_.size();
    for (data::EntryRef entry; missing > 0 && list.Next(&entry);) {
        const std::size_t index = IndexOf(entry.name);
        if (index == slots_.size() || slots_[index].present) continue;
        slots_[index] = {true, entry};
        missing--;
    }
    list.Rewind();
}

/// Rebuilds one switch from its buffer.
class SwitchReader {
public:
    SwitchReader(const char *switchId, data::InPlaceList &list)
        : switchId_(switchId), list_(list), fixed_(list) {}
    HYP_ReturnStatus Run();

private:
    HYP_ReturnStatus ReadSubList(const char *name, OwnedList &sub);
    HYP_ReturnStatus ReadFields();
    HYP_ReturnStatus Create();
    HYP_ReturnStatus AddPorts(DVSwitch *sw);
    void EmitRemoved(std::string_view name);

    const char *switchId_;
    data::InPlaceList &list_;
    FixedEntries fixed_;
    OwnedList hostList_, globalList_;
    uint32_t version_ = 0, maxPorts_ = 0;
    std::string_view className_;
    uint32_t removed_ = 0; // bytes of the entries removed from the list so far, for messages
};

HYP_ReturnStatus SwitchReader::Run() {
    HYP_ReturnStatus status = ReadSubList(kHostPropList, hostList_);
    if (status == HYP_OK) status = ReadSubList(kGlobalPropList, globalList_);
    if (status == HYP_OK) status = ReadFields();
    if (status != HYP_OK) return status;
    const bool create = !DVSState_SwitchFind(switchId_);
    if (create) {
        status = Create();
        if (status != HYP_OK) return status;
    }
    for (const char *name : {kClassName, kMaxPorts, kSwitchVersion})
        EmitRemoved(name);
    DVSwitch *sw = DVSState_SwitchFind(switchId_);
    if (!sw) {
        Message(kError, "DVS %s acquire failed\n", switchId_);
        return HYP_NOT_FOUND;
    }
    // The old lists live until the end of this function: the buffer may lie in one of them.
    sw->hostPropList = std::exchange(hostList_, OwnedList(sw->hostPropList)).release();
    sw->globalPropList = std::exchange(globalList_, OwnedList(sw->globalPropList)).release();
    status = AddPorts(sw);
    if (status != HYP_OK && create)
        (void)DVSStateSwitchRemove(switchId_); // report the port's failure
    Message(status == HYP_OK ? kTrace : kError, "Deserialize dvs %s return %s\n", switchId_, Text(status));
    return status;
}

HYP_ReturnStatus SwitchReader::ReadSubList(const char *name, OwnedList &sub) {
    const data::EntryRef *entry = fixed_.Find(name);
    if (!entry) return HYP_OK;
    const HYP_ReturnStatus status = ReadOwned(sub, SourceOf(*entry));
    if (status == HYP_OK) EmitRemoved(name);
    return status;
}

HYP_ReturnStatus SwitchReader::ReadFields() {
    const data::EntryRef *entry = fixed_.Find(kSwitchVersion);
    if (!entry) {
        Message(kError, "Failed to find switchVersion, status:%d\n\n", static_cast<int>(HYP_NOT_FOUND));
        return HYP_NOT_FOUND;
    }
    const HYP_ReturnStatus status = ReadU32(entry->value, &version_);
    if (status != HYP_OK) return status;
    entry = fixed_.Find(kClassName);
    if (!entry) return HYP_NOT_FOUND;
    const auto *text = reinterpret_cast<const char *>(entry->value.data());
    className_ = {text, strnlen(text, entry->value.size())};
    entry = fixed_.Find(kMaxPorts);
    return entry ? ReadU32(entry->value, &maxPorts_) : static_cast<HYP_ReturnStatus>(HYP_NOT_FOUND);
}

HYP_ReturnStatus SwitchReader::Create() {
    Message(kError, "Create DVS %s with portset %s\n", switchId_, "");
    const HYP_ReturnStatus status = DVSStateSwitchAdd(switchId_, className_, maxPorts_, version_);
    if (status != HYP_OK) {
        Message(kError, "Failed to add switch %s/%.*s/%s/%d\n", switchId_,
                static_cast<int>(className_.size()), className_.data(), "", static_cast<int>(maxPorts_));
    }
    return status;
}

HYP_ReturnStatus SwitchReader::AddPorts(DVSwitch *sw) {
    for (data::EntryRef entry; list_.Next(&entry);) {
        if (fixed_.Holds(entry)) continue;
        const HYP_ReturnStatus status = AddPort(sw, NameText(entry.name), SourceOf(entry));
        if (status != HYP_OK) return status;
    }
    return HYP_OK;
}

/// Emits the line for removing a fixed entry from the list that would have been built.
void SwitchReader::EmitRemoved(std::string_view name) {
    if (!data::Emits(data::kDetail)) return;
    uint32_t listSize = data::kMinBufferSize;
    data::InPlaceList list = list_;
    list.Rewind();
    for (data::EntryRef entry; list.Next(&entry);)
        listSize += data::EntrySize(static_cast<uint32_t>(entry.value.size()));
    const data::EntryRef &entry = *fixed_.Find(name);
    const auto dataLen = static_cast<uint32_t>(entry.value.size());
    removed_ += data::EntrySize(dataLen);
    data::EmitRemoved(name, dataLen, entry.propType, listSize - removed_);
}

HYP_ReturnStatus ReadSwitch(const char *switchId, const Source &source) {
    Message(kTrace, "Deserialize DVS %s\n", switchId);
    data::InPlaceList list;
    const HYP_ReturnStatus status =
        list.Open(source.bytes, data::kDeserializeTypeMask, source.sum, data::PartSums::Yes);
    return status == HYP_OK ? SwitchReader(switchId, list).Run() : status;
}

} // namespace

HYP_ReturnStatus DVSState_PortAddDeserialize(DVSwitch *sw, const char *portId, const void *buf,
                                             uint32_t len) {
    return AddPort(sw, portId, SourceOf(buf, len));
}

HYP_ReturnStatus DVSState_PortDeserialize(const char *switchId, const char *portId, const void *buf,
                                          uint32_t len) {
    return AddPort(DVSState_SwitchFind(switchId), portId, SourceOf(buf, len));
}

HYP_ReturnStatus DVSState_SwitchDeserialize(const char *switchId, const void *buf, uint32_t len) {
    return ReadSwitch(switchId, SourceOf(buf, len));
}

HYP_ReturnStatus DVSState_ConfigDeserialize(const void *buf, uint32_t len) {
    Message(kTrace, "DVSState_ConfigDeserialize\n");
    data::InPlaceList state;
    HYP_ReturnStatus status =
        state.Open(SourceOf(buf, len).bytes, data::kDeserializeTypeMask, {}, data::PartSums::Yes);
    if (status != HYP_OK) {
        Message(kError, "DVSState_ConfigDeserialize failed %s\n", Text(status));
        return status;
    }
    for (data::EntryRef entry; state.Next(&entry);) {
        status = ReadSwitch(NameText(entry.name), SourceOf(entry));
        if (status == HYP_OK) continue;
        Message(kError, "DVSState_SwitchDeserialize failed %s\n", Text(status));
        (void)DVSState_ConfigReset(); // report the original failure
        return status;
    }
    return HYP_OK;
}
