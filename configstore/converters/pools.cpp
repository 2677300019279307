/* SPDX-License-Identifier: Apache-2.0 */
// Network resource pools of a switch: their configuration <-> the instances of "traffic_resources", and the
// list of their keys <-> the texts of "network_resource_pool_keys". Called through the converter table;
// LoadProps gives the configuration to ports as well.

#include "configstore/converters/pools.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/pools.h"

namespace dvs::convert {
namespace {

using layout::AreaOf;
using layout::At;
using layout::pools::kPool;
using layout::pools::kPoolKey;

constexpr auto kCount = At<uint32_t>(layout::kPoolConfig, "count");
constexpr auto kKey = AreaOf(kPool, "key");
constexpr auto kReservation = At<uint32_t>(kPool, "reservation");
constexpr auto kShares = At<uint32_t>(kPool, "shares");
constexpr auto kLimit = At<int32_t>(kPool, "limit");
constexpr auto kListKey = AreaOf(kPoolKey, "key");

constexpr std::size_t kHeadSize = layout::kPoolConfig.size;
static_assert(kCount.offset == 0 && kHeadSize == kCount.End());

// `bytes` starts at the pool and runs to the value's end: a text that lacks its NUL ends there.
int32_t SavePool(const SaveArgs &args, std::span<const uint8_t> bytes) {
    const Text key(bytes.subspan(kKey.offset));
    if (!key.get()) return kFailed;
    configstore::Object *pool = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, key.get(), &pool);
    if (status) return status;
    configstore::Object *allocation = nullptr;
    status = GetOrCreateSubObject(true, pool, "allocation", nullptr, &allocation);
    if (status) return status;
    status = configstore::SetValueUint32(allocation, "reservation", Get(bytes, kReservation));
    if (status) return status;
    configstore::Object *shares = nullptr;
    status = GetOrCreateSubObject(true, allocation, "shares", nullptr, &shares);
    if (status) return status;
    status = configstore::SetValueUint32(shares, "shares", Get(bytes, kShares));
    return status ? status : configstore::SetValueInt(allocation, "limit", Get(bytes, kLimit));
}

// What cannot be read stays 0.
void LoadPool(configstore::Object *pool, std::span<uint8_t> entry) {
    StoreText key;
    if (key.Read(pool, "key") == 0) CopyBounded(entry.subspan(kKey.offset, kKey.size), key.get());
    configstore::Object *allocation = nullptr;
    if (configstore::GetSubObject(pool, "allocation", nullptr, &allocation) || !allocation) return;
    int32_t limit = 0;
    if (configstore::GetValueInt(allocation, "limit", &limit) == 0) Put(entry, kLimit, limit);
    LoadNumber(allocation, "reservation", entry, kReservation);
    configstore::Object *shares = nullptr;
    if (configstore::GetSubObject(allocation, "shares", nullptr, &shares) || !shares) return;
    LoadNumber(shares, "shares", entry, kShares);
}

} // namespace

int32_t SaveTrafficResources(const SaveArgs &args) {
    const auto count = CountOf(args.value, kPool.size);
    if (!count) return kFailed;
    int32_t status = 0;
    for (std::size_t i = 0; i < *count && !status; ++i) {
        status = SavePool(args, args.value.subspan(kHeadSize + i * kPool.size));
    }
    return status;
}

int32_t LoadTrafficResources(const LoadArgs &args) {
    Instances pools;
    const int32_t status = pools.Read(args.parent, args.leaf);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    if (pools.items().empty()) return 0;
    Block block;
    if (!block.Allocate(kHeadSize + pools.items().size() * kPool.size)) {
        args.context.messages.Error("Failed to alloc memory for DVSPropResPoolsCfg\n");
        return kFailed;
    }
    Put(block.bytes(), kCount, static_cast<uint32_t>(pools.items().size()));
    std::size_t at = kHeadSize;
    for (configstore::Object *pool : pools.items()) {
        LoadPool(pool, block.bytes().subspan(at, kPool.size));
        at += kPool.size;
    }
    return Store(args, block.bytes());
}

int32_t SavePoolKeys(const SaveArgs &args) {
    const auto count = CountOf(args.value, kPoolKey.size);
    if (!count) return kFailed;
    if (*count == 0) return 0; // an earlier list stays
    (void)configstore::SetValueEmptyList(args.parent,
                                         args.leaf); // a list that cannot be emptied fails its appends
    int32_t status = 0;
    for (std::size_t i = 0; i < *count && !status; ++i) {
        const auto key = args.value.subspan(kHeadSize + i * kPoolKey.size + kListKey.offset);
        status = AppendText(args.parent, args.leaf, key);
    }
    return status;
}

int32_t LoadPoolKeys(const LoadArgs &args) {
    StoreTexts keys;
    const int32_t status = keys.Read(args.parent, args.leaf);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    if (keys.items().empty()) return 0;
    Block block;
    if (!block.Allocate(kHeadSize + keys.items().size() * kPoolKey.size)) {
        args.context.messages.Error("Failed to alloc memory for DVSPropResPoolsList\n");
        return 0; // the load goes on without the list
    }
    Put(block.bytes(), kCount, static_cast<uint32_t>(keys.items().size()));
    std::size_t at = kHeadSize;
    for (const char *key : keys.items()) {
        CopyBounded(block.bytes().subspan(at + kListKey.offset, kListKey.size), key);
        at += kPoolKey.size;
    }
    return Store(args, block.bytes());
}

} // namespace dvs::convert
