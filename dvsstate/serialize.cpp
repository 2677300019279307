/* SPDX-License-Identifier: Apache-2.0 */
// Serializes ports, switches and the whole switch table. A state nests three levels of lists. Sizes are known
// beforehand, so every value is written once, to its place in the final block, and summed once. Messages and
// failures match, in order, those of building a list for each level. Uses the image writer of dvsdata.

#include <cstdlib>
#include <cstring>

#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"
#include "dvsstate/message.h"
#include "dvsstate/names.h"
#include "dvsstate/output_block.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/port_table.h"
#include "dvsstate/switch_table.h"

using namespace dvs::state;
namespace data = dvs::data;

namespace {

// ---- Sizes. 64 bits, because they sum many 32-bit sizes. ----

uint64_t EntrySize(uint64_t valueSize) {
    return (valueSize + data::kMinEntryRoom + 3) & ~uint64_t{3};
}

/// True if a value of this size fits in an entry, whose size is 32 bits wide.
bool FitsEntry(uint64_t valueSize) {
    return EntrySize(valueSize) <= UINT32_MAX - data::kImageOffset;
}

data::Filter FilterOf(uint32_t version) {
    return version == kFilteredVersion ? data::Filter::WithoutTypes(kFilteredTypes) : data::Filter::None();
}

/// The size of a switch's list as a buffer. Unlike data::SerializedSize it emits no messages.
uint32_t ListSize(const DVSData *list, uint32_t version) {
    if (version != kFilteredVersion) return list->serialSize;
    uint32_t size = data::kMinBufferSize;
    uint32_t remaining = list->serialSize - data::kHeaderSize;
    for (const DVSDataEntry *entry = list->head; entry && entry->serialSize < remaining;
         entry = entry->next) {
        if ((entry->propType & kFilteredTypes) == 0) size += entry->serialSize;
        remaining -= entry->serialSize;
    }
    return size;
}

/// True if the port's kind must be added to its serialized data.
bool LacksKind(DVSPort *port) {
    return port->portType != DVS_PORT_ACTIVE && !FindEntry(port->portData, kPortKind);
}

uint64_t PortSize(DVSPort *port) {
    return uint64_t{port->portData->serialSize} + (LacksKind(port) ? EntrySize(sizeof port->portType) : 0);
}

uint64_t SwitchSize(DVSwitch *sw) {
    uint64_t size = data::kMinBufferSize + EntrySize(sizeof sw->version) + EntrySize(sizeof sw->className) +
                    EntrySize(sizeof sw->newMaxPorts);
    for (const DVSData *list : {sw->globalPropList, sw->hostPropList})
        if (list) size += EntrySize(ListSize(list, sw->version));
    WalkPorts(sw, [&size](DVSPort *port) {
        if (port->portType != 0) size += EntrySize(PortSize(port));
        return false;
    });
    return size;
}

// ---- Writing ----

data::Bytes BytesOf(const void *value, std::size_t size) {
    return {static_cast<const uint8_t *>(value), size};
}

/// Emits the lines of the list that a level would have been built in.
class ListLines {
public:
    void Add(std::string_view name, uint64_t valueSize) {
        const auto dataLen = static_cast<uint32_t>(valueSize);
        data::EmitAdding(name, dataLen, size_);
        size_ += data::EntrySize(dataLen);
        data::EmitAdded(name, size_);
    }
    static void Write(std::string_view name, uint64_t valueSize) {
        const auto dataLen = static_cast<uint32_t>(valueSize);
        data::EmitWriting(name, dataLen, data::EntrySize(dataLen));
    }

private:
    uint32_t size_ = data::kMinBufferSize;
};

void EmitBufferStart(uint32_t version, uint64_t size) {
    data::EmitOldVersion(version);
    data::EmitBufferSize(static_cast<uint32_t>(size));
}

HYP_ReturnStatus WritePort(data::ImageWriter &writer, DVSPort *port, uint64_t size) {
    const auto bufSize = static_cast<uint32_t>(size);
    if (!LacksKind(port)) return writer.List(port->portData, data::Filter::None(), bufSize);
    const data::ImageWriter::Extra kind{kPortKind, kStatePropType,
                                        BytesOf(&port->portType, sizeof port->portType)};
    return writer.List(port->portData, data::Filter::None(), bufSize, &kind);
}

/// Writes one switch as a buffer.
class SwitchWriter {
public:
    SwitchWriter(data::ImageWriter &writer, DVSwitch *sw, uint64_t size)
        : writer_(writer), sw_(sw), size_(size) {}
    /// Emits the messages that come before any failure.
    static void EmitStart(const DVSwitch *sw);
    /// Returns HYP_LIMIT_EXCEEDED at the end if there is no room for the buffer.
    HYP_ReturnStatus Run(bool hasRoom);

private:
    void AddField(std::string_view name, data::Bytes value);
    void AddFields();
    HYP_ReturnStatus AddList(const char *name, const char *what, const DVSData *list);
    HYP_ReturnStatus WriteList(const char *name, const DVSData *list);
    HYP_ReturnStatus AddPort(DVSPort *port);
    HYP_ReturnStatus AddPorts();
    void EmitWholeList() const;

    data::ImageWriter &writer_;
    DVSwitch *sw_;
    uint64_t size_;
    ListLines lines_;
};

void SwitchWriter::EmitStart(const DVSwitch *sw) {
    Message(kTrace, "DVSState_SwitchSerialize %s\n", sw->switchId);
    data::EmitAllocating();
}

HYP_ReturnStatus SwitchWriter::Run(bool hasRoom) {
    data::EmitAllocated(data::kMinBufferSize);
    writer_.BeginBuffer();
    AddFields();
    HYP_ReturnStatus status = AddList(kGlobalPropList, "global property list", sw_->globalPropList);
    if (status == HYP_OK) status = AddList(kHostPropList, "host property list", sw_->hostPropList);
    if (status == HYP_OK) {
        Message(kTrace, "Add DVS(%s) property list succesfully\n", sw_->switchId);
        status = AddPorts();
    }
    if (status == HYP_OK) {
        EmitBufferStart(sw_->version, size_);
        if (hasRoom && size_ <= UINT32_MAX)
            EmitWholeList();
        else
            status = HYP_LIMIT_EXCEEDED;
        writer_.EndBuffer();
    }
    Message(kTrace, "DVSState_SwitchDeserialize dvs %s return %s\n", sw_->switchId, Text(status));
    return status;
}

void SwitchWriter::AddField(std::string_view name, data::Bytes value) {
    lines_.Add(name, value.size());
    writer_.Entry(name, kStatePropType, value);
}

void SwitchWriter::AddFields() {
    // Callers can write into the record: write nothing after the name's NUL.
    char className[sizeof sw_->className] = {};
    std::memcpy(className, sw_->className, strnlen(sw_->className, sizeof className));
    AddField(kSwitchVersion, BytesOf(&sw_->version, sizeof sw_->version));
    AddField(kClassName, BytesOf(className, sizeof className));
    AddField(kMaxPorts, BytesOf(&sw_->newMaxPorts, sizeof sw_->newMaxPorts));
}

HYP_ReturnStatus SwitchWriter::AddList(const char *name, const char *what, const DVSData *list) {
    if (!list) return HYP_OK;
    const HYP_ReturnStatus status = WriteList(name, list);
    if (status != HYP_OK) {
        Message(kError, "Failed to add switch %s %s, return %s\n", sw_->switchId, what, Text(status));
        // Known quirk, kept: also printed on failure.
        Message(kTrace, "Add DVS(%s) property list succesfully\n", sw_->switchId);
    }
    return status;
}

HYP_ReturnStatus SwitchWriter::WriteList(const char *name, const DVSData *list) {
    const data::Filter filter = FilterOf(sw_->version);
    if (filter.IsNone()) data::EmitOldVersion(sw_->version);
    const uint32_t size = data::SerializedSize(list, filter);
    data::EmitBufferSize(size);
    writer_.BeginEntry(name, kStatePropType, size);
    const HYP_ReturnStatus status = writer_.List(list, filter, size);
    if (status != HYP_OK) return status;
    if (!FitsEntry(size)) return HYP_BAD_PARAM;
    writer_.EndEntry();
    lines_.Add(name, size);
    return HYP_OK;
}

HYP_ReturnStatus SwitchWriter::AddPort(DVSPort *port) {
    Message(kDetail, "DVSState_PortSerialize %s\n", port->portId);
    const uint64_t size = PortSize(port);
    EmitBufferStart(sw_->version, size);
    writer_.BeginEntry(port->portId, kStatePropType, static_cast<uint32_t>(size));
    const HYP_ReturnStatus status = WritePort(writer_, port, size);
    if (status != HYP_OK) return status;
    if (!FitsEntry(size)) return HYP_BAD_PARAM;
    writer_.EndEntry();
    lines_.Add(port->portId, size);
    return HYP_OK;
}

HYP_ReturnStatus SwitchWriter::AddPorts() {
    HYP_ReturnStatus status = HYP_OK;
    WalkPorts(sw_, [&](DVSPort *port) {
        if (port->portType != 0) status = AddPort(port);
        return status != HYP_OK;
    });
    return status;
}

/// Emits the lines for serializing the switch's own list, after all its entries are written.
void SwitchWriter::EmitWholeList() const {
    if (!data::Emits(data::kDetail)) return;
    ListLines::Write(kSwitchVersion, sizeof sw_->version);
    ListLines::Write(kClassName, sizeof sw_->className);
    ListLines::Write(kMaxPorts, sizeof sw_->newMaxPorts);
    if (sw_->globalPropList) ListLines::Write(kGlobalPropList, ListSize(sw_->globalPropList, sw_->version));
    if (sw_->hostPropList) ListLines::Write(kHostPropList, ListSize(sw_->hostPropList, sw_->version));
    WalkPorts(sw_, [](DVSPort *port) {
        if (port->portType != 0) ListLines::Write(port->portId, PortSize(port));
        return false;
    });
}

// ---- The whole table. The caller holds the lock. ----

HYP_ReturnStatus SwitchFailed(const DVSwitch *sw, HYP_ReturnStatus status) {
    Message(kError, "DVSStateConfigSerializeCB DVS %s failed %s\n", sw->switchId, Text(status));
    return HYP_EXISTS; // regardless of the actual failure
}

using SwitchSizes = std::array<uint64_t, kSwitchNum>;

HYP_ReturnStatus WriteSwitches(data::ImageWriter &writer, const SwitchSizes &sizes) {
    ListLines lines;
    writer.BeginBuffer();
    for (std::size_t slot = 0; slot < kSwitchNum; slot++) {
        DVSwitch *sw = dvsSwitchTable[slot];
        if (!sw) continue;
        writer.BeginEntry(sw->switchId, kStatePropType, static_cast<uint32_t>(sizes[slot]));
        SwitchWriter::EmitStart(sw);
        HYP_ReturnStatus status = SwitchWriter(writer, sw, sizes[slot]).Run(true);
        if (status == HYP_OK && !FitsEntry(sizes[slot])) status = HYP_BAD_PARAM;
        if (status != HYP_OK) return SwitchFailed(sw, status);
        writer.EndEntry();
        lines.Add(sw->switchId, sizes[slot]);
    }
    writer.EndBuffer();
    return HYP_OK;
}

void EmitWholeState(const SwitchSizes &sizes) {
    if (!data::Emits(data::kDetail)) return;
    for (std::size_t slot = 0; slot < kSwitchNum; slot++)
        if (dvsSwitchTable[slot]) ListLines::Write(dvsSwitchTable[slot]->switchId, sizes[slot]);
}

HYP_ReturnStatus StateListFailed(HYP_ReturnStatus status) {
    Message(kError, "DVSState_ConfigSerialize, alloc failed\n");
    return status;
}

HYP_ReturnStatus SerializeTable(void **buf, uint32_t *len) {
    data::EmitAllocating();
    SwitchSizes sizes{};
    uint64_t stateSize = data::kMinBufferSize;
    for (std::size_t slot = 0; slot < kSwitchNum; slot++) {
        if (!dvsSwitchTable[slot]) continue;
        sizes[slot] = SwitchSize(dvsSwitchTable[slot]);
        stateSize += EntrySize(sizes[slot]);
    }
    OutputBlock block(buf, len, StateAlloc, std::free);
    HYP_ReturnStatus status = block.Reserve(stateSize);
    if (status != HYP_OK) return StateListFailed(status);
    data::EmitAllocated(data::kMinBufferSize);
    data::ImageWriter writer(block.Bytes());
    status = WriteSwitches(writer, sizes);
    if (status != HYP_OK) return status;
    EmitBufferStart(kStateVersion, stateSize);
    if (!block.HasRoom()) return HYP_LIMIT_EXCEEDED;
    EmitWholeState(sizes);
    block.HandOver();
    return HYP_OK;
}

/// Serializes a table with duplicate ids, which a swap can create. By the rules of a list update, the later
/// switch takes the earlier one's place in the state, so the state is built as a list.
HYP_ReturnStatus SerializeDuplicates(void **buf, uint32_t *len) {
    OwnedList state;
    const HYP_ReturnStatus status = NewList(state);
    if (status != HYP_OK) return StateListFailed(status);
    for (DVSwitch *sw : dvsSwitchTable) {
        if (!sw) continue;
        void *nested = nullptr;
        uint32_t nestedLen = 0;
        HYP_ReturnStatus added = DVSState_SwitchSerialize(sw, &nested, &nestedLen);
        if (added == HYP_OK)
            added = DVSData_Update(state.get(), sw->switchId, nested, nestedLen, kStatePropType);
        std::free(nested);
        if (added != HYP_OK) return SwitchFailed(sw, added);
    }
    return DVSData_Serialize(state.get(), buf, len, kStateVersion);
}

bool HasDuplicateIds() {
    for (auto slot = dvsSwitchTable.begin(); slot != dvsSwitchTable.end(); ++slot)
        if (*slot && FindSlot((*slot)->switchId) != slot) return true;
    return false;
}

} // namespace

HYP_ReturnStatus DVSState_PortSerialize(DVSPort *port, void **buf, uint32_t *len) {
    Message(kDetail, "DVSState_PortSerialize %s\n", port->portId);
    DVSData *list = port->portData;
    if (!LacksKind(port)) return DVSData_Serialize(list, buf, len, port->owner->version);
    const uint64_t size = PortSize(port);
    EmitBufferStart(port->owner->version, size);
    OutputBlock block(buf, len, list->allocFn, list->freeFn);
    HYP_ReturnStatus status = block.Reserve(size);
    if (status != HYP_OK) return status;
    if (!block.HasRoom()) return HYP_LIMIT_EXCEEDED;
    data::ImageWriter writer(block.Bytes());
    status = WritePort(writer, port, size);
    if (status == HYP_OK) block.HandOver();
    return status;
}

HYP_ReturnStatus DVSState_SwitchSerialize(DVSwitch *sw, void **buf, uint32_t *len) {
    SwitchWriter::EmitStart(sw);
    const uint64_t size = SwitchSize(sw);
    OutputBlock block(buf, len, StateAlloc, std::free);
    HYP_ReturnStatus status = block.Reserve(size);
    if (status != HYP_OK) return status;
    data::ImageWriter writer(block.Bytes());
    status = SwitchWriter(writer, sw, size).Run(block.HasRoom());
    if (status == HYP_OK) block.HandOver();
    return status;
}

HYP_ReturnStatus DVSState_ConfigSerialize(void **buf, uint32_t *len) {
    Message(kTrace, "DVSState_ConfigSerialize\n");
    const StateLock lock;
    return HasDuplicateIds() ? SerializeDuplicates(buf, len) : SerializeTable(buf, len);
}
