/* SPDX-License-Identifier: Apache-2.0 */
// Port VLAN policy: a head of 8 bytes and the ranges of a trunk <-> the object "vlan". Called through the
// converter table.

#include "configstore/converters/port_vlan.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/port_vlan.h"

namespace dvs::convert {
namespace {

using layout::At;
using layout::kPortVlan;

constexpr auto kFlags = At<uint16_t>(kPortVlan, "flags");
constexpr auto kVlanId = At<uint16_t>(kPortVlan, "vlan_id");
constexpr auto kRangeCount = At<uint16_t>(kPortVlan, "range_count");
constexpr auto kStart = At<uint16_t>(layout::vlan::kRange, "start");
constexpr auto kEnd = At<uint16_t>(layout::vlan::kRange, "end");
constexpr std::size_t kRangeSize = layout::vlan::kRange.size;

constexpr uint16_t kTrunk = 0x1;
constexpr uint16_t kPrivate = 0x2;

enum class Family { kEtherswitch, kVswitch };

int32_t SaveRange(configstore::Object *vlan, std::span<const uint8_t> range) {
    StoreText id;
    int32_t status = id.Generate();
    if (status) return status;
    configstore::Object *instance = nullptr;
    status = GetOrCreateSubObject(true, vlan, "trunk_vlan_ids", id.get(), &instance);
    if (status) return status;
    status = configstore::SetValueUint16(instance, "start", Get(range, kStart));
    return status ? status : configstore::SetValueUint16(instance, "end", Get(range, kEnd));
}

// Whether the value holds what a save reads of it: flags and id, for a trunk also its ranges.
bool IsWhole(std::span<const uint8_t> value) {
    if (value.size() < kVlanId.End()) return false;
    if (!(Get(value, kFlags) & kTrunk)) return true;
    return value.size() >= kPortVlan.size &&
           HoldsRecords(value, kPortVlan.size, Get(value, kRangeCount), kRangeSize);
}

int32_t SavePortVlan(const SaveArgs &args, Family family) {
    if (!IsWhole(args.value)) return kFailed;
    configstore::Object *vlan = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, nullptr, &vlan);
    if (status) return status;
    // Emptied in every case: an earlier trunk's ranges must not outlive it.
    status = configstore::SetValueEmptyList(vlan, "trunk_vlan_ids");
    if (status) return status;

    const uint16_t flags = Get(args.value, kFlags);
    if (!(flags & kTrunk)) {
        status = configstore::SetValueUint16(vlan, flags & kPrivate ? "pvlan_id" : "vlan_id",
                                             Get(args.value, kVlanId));
        // The vswitch save has never told whether the id was written.
        return family == Family::kEtherswitch ? status : 0;
    }
    const std::size_t count = Get(args.value, kRangeCount);
    for (std::size_t i = 0; i < count && !status; ++i) {
        status = SaveRange(vlan, args.value.subspan(kPortVlan.size + i * kRangeSize, kRangeSize));
    }
    return status;
}

void LoadTrunk(std::span<configstore::Object *const> ranges, std::span<uint8_t> value) {
    Put(value, kFlags, kTrunk);
    Put(value, kRangeCount, static_cast<uint16_t>(ranges.size()));
    for (std::size_t i = 0; i < ranges.size(); ++i) {
        const auto range = value.subspan(kPortVlan.size + i * kRangeSize, kRangeSize);
        uint16_t id = 0;
        if (configstore::GetValueUint16(ranges[i], "start", &id) == 0) Put(range, kStart, id);
        if (configstore::GetValueUint16(ranges[i], "end", &id) == 0) Put(range, kEnd, id);
    }
}

void LoadSingleId(configstore::Object *vlan, std::span<uint8_t> value) {
    uint16_t id = 0;
    if (configstore::GetValueUint16(vlan, "pvlan_id", &id) == 0) {
        Put(value, kFlags, kPrivate);
        Put(value, kVlanId, id);
    } else if (configstore::GetValueUint16(vlan, "vlan_id", &id) == 0) {
        Put(value, kVlanId, id);
    }
}

int32_t LoadPortVlan(const LoadArgs &args, Family family) {
    configstore::Object *vlan = nullptr;
    if (configstore::GetSubObject(args.parent, args.leaf, nullptr, &vlan) || !vlan) return 0;
    const configstore::FilterSpec *spec = nullptr;
    const int32_t status = args.context.filters->Get("trunk_vlan_ids", &spec);
    if (status) return status;
    Instances ranges;
    (void)ranges.Read(vlan, spec); // a list that cannot be read is no list

    Block block;
    if (!block.Allocate(kPortVlan.size + ranges.items().size() * kRangeSize)) {
        // The one skips the property, the other fails the load; both are relied on.
        if (family == Family::kEtherswitch) {
            args.context.messages.Error("Failed to alloc memory for ESPortVlanPolicy\n");
            return 0;
        }
        args.context.messages.Error("Failed to alloc memory for VSPortVlanPolicy\n");
        return kFailed;
    }
    if (ranges.items().empty()) {
        LoadSingleId(vlan, block.bytes());
    } else {
        LoadTrunk(ranges.items(), block.bytes());
    }
    return Store(args, block.bytes());
}

} // namespace

int32_t SaveEtherswitchPortVlan(const SaveArgs &args) {
    return SavePortVlan(args, Family::kEtherswitch);
}

int32_t LoadEtherswitchPortVlan(const LoadArgs &args) {
    return args.context.switchClass == 0 ? LoadPortVlan(args, Family::kEtherswitch) : 0;
}

int32_t SaveVswitchPortVlan(const SaveArgs &args) {
    return args.context.switchClass == 0 ? 0 : SavePortVlan(args, Family::kVswitch);
}

int32_t LoadVswitchPortVlan(const LoadArgs &args) {
    return args.context.switchClass == 0 ? 0 : LoadPortVlan(args, Family::kVswitch);
}

} // namespace dvs::convert
