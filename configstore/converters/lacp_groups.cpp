/* SPDX-License-Identifier: Apache-2.0 */
// Link aggregation groups: a count and entries of 93 bytes <-> the instances of "lacp_groups". Called through
// the converter table; port_lacp.cpp shares the table of modes.

#include "configstore/converters/lacp_groups.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/lacp.h"

const char *LACP_MODE_2_CAHRS[] = {"NONE", "ACTIVE", "PASSIVE", nullptr};
const char *LACP_LB_POLICY_SCHEMA[] = {
    "NONE",
    "DSTMAC",
    "SRCMAC",
    "SRCMAC_DSTMAC",
    "DSTIP",
    "SRCIP",
    "SRCIP_DSTIP",
    "VLAN",
    "DSTIP_VLAN",
    "SRCIP_VLAN",
    "SRCIP_DSTIP_VLAN",
    "DSTPORT",
    "SRCPORT",
    "SRCPORT_DSTPORT",
    "DSTIP_DSTPORT",
    "SRCIP_SRCPORT",
    "SRCIP_DSTIP_SRCPORT_DSTPORT",
    "DSTIP_DSTPORT_VLAN",
    "SRCIP_SRCPORT_VLAN",
    "SRCIP_DSTIP_SRCPORT_DSTPORT_VLAN",
    "SRCID",
    nullptr,
};

namespace dvs::convert {
namespace {

static_assert(std::size(LACP_MODE_2_CAHRS) == layout::lacp::kModes.textCount);
static_assert(std::size(LACP_LB_POLICY_SCHEMA) == layout::lacp::kAlgorithms.textCount);

using layout::AreaOf;
using layout::At;
using layout::lacp::kGroup;

constexpr auto kCount = At<uint32_t>(layout::kLacpTable, "count");
constexpr auto kName = AreaOf(kGroup, "name");
constexpr auto kKey = AreaOf(kGroup, "key");
constexpr auto kMode = At<uint32_t>(kGroup, "mode");
constexpr auto kAlgorithm = At<uint32_t>(kGroup, "load_balance_algorithm");
constexpr auto kUplinkNum = At<uint32_t>(kGroup, "uplink_num");

constexpr std::size_t kHeadSize = layout::kLacpTable.size;
static_assert(kCount.offset == 0 && kHeadSize == kCount.End());
constexpr uint32_t kUnknown = 0xFFFFFFFF;

// `bytes` starts at the group and runs to the value's end: a text that lacks its NUL ends there.
int32_t SaveGroup(const SaveArgs &args, std::span<const uint8_t> bytes) {
    const Text key(bytes.subspan(kKey.offset));
    if (!key.get()) return kFailed;
    configstore::Object *group = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, key.get(), &group);
    if (status) return status;
    status = SetText(group, "name", bytes.subspan(kName.offset));
    if (status) return status;
    status = configstore::SetValueStr(group, "mode", EnumText(LACP_MODE_2_CAHRS, Get(bytes, kMode)));
    if (status) return status;
    status = configstore::SetValueStr(group, "load_balance_algorithm",
                                      EnumText(LACP_LB_POLICY_SCHEMA, Get(bytes, kAlgorithm)));
    if (status) return status;
    return configstore::SetValueUint32(group, "uplink_num", Get(bytes, kUplinkNum));
}

uint32_t AlgorithmOf(const Context &context, const char *text) {
    const auto index = EnumIndex(LACP_LB_POLICY_SCHEMA, text);
    if (!index) context.messages.Error("Unknown lacp lb policy %s\n", text);
    return index.value_or(kUnknown);
}

int32_t LoadGroup(const Context &context, configstore::Object *group, std::span<uint8_t> entry) {
    StoreText text;
    if (text.Read(group, "name") == 0) CopyBounded(entry.subspan(kName.offset, kName.size), text.get());
    if (text.Read(group, "key") == 0) CopyBounded(entry.subspan(kKey.offset, kKey.size), text.get());
    if (text.Read(group, "mode") == 0) Put(entry, kMode, LacpModeOf(context, text.get()));
    if (text.Read(group, "load_balance_algorithm") == 0) Put(entry, kAlgorithm, AlgorithmOf(context, text.get()));
    uint32_t uplinks = 0;
    const int32_t status = configstore::GetValueUint32(group, "uplink_num", &uplinks);
    if (status == 0) Put(entry, kUplinkNum, uplinks);
    return status;
}

} // namespace

uint32_t LacpModeOf(const Context &context, const char *text) {
    const auto index = EnumIndex(LACP_MODE_2_CAHRS, text);
    if (!index) context.messages.Error("Unknown lacp mode %s\n", text);
    return index.value_or(kUnknown);
}

int32_t SaveLacpGroups(const SaveArgs &args) {
    const auto count = CountOf(args.value, kGroup.size);
    if (!count) return kFailed;
    int32_t status = 0;
    for (std::size_t i = 0; i < *count && !status; ++i) {
        status = SaveGroup(args, args.value.subspan(kHeadSize + i * kGroup.size));
    }
    return status;
}

int32_t LoadLacpGroups(const LoadArgs &args) {
    Instances groups;
    int32_t status = groups.Read(args.parent, args.leaf);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    if (groups.items().empty()) return 0;
    Block block;
    if (!block.Allocate(kHeadSize + groups.items().size() * kGroup.size)) {
        args.context.messages.Error("Failed to alloc memory for LACPTable\n");
        return kFailed;
    }
    Put(block.bytes(), kCount, static_cast<uint32_t>(groups.items().size()));
    std::size_t at = kHeadSize;
    for (configstore::Object *group : groups.items()) {
        status = LoadGroup(args.context, group, block.bytes().subspan(at, kGroup.size));
        if (status) return status;
        at += kGroup.size;
    }
    return Store(args, block.bytes());
}

} // namespace dvs::convert
