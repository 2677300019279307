/* SPDX-License-Identifier: Apache-2.0 */
// Health check deployment: a packed record of 5 bytes <-> an instance of "health_checks". Called through the
// converter table.

#include "configstore/converters/health_check.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/health_check.h"

namespace dvs::convert {
namespace {

constexpr auto kEnabled = layout::At<uint8_t>(layout::kHealthCheck, "enabled");
constexpr auto kInterval = layout::At<uint32_t>(layout::kHealthCheck, "interval");

} // namespace

const char *HealthCheckInstance(const char *key) {
    if (std::strcmp(key, "com.orbeno.common.vlanmtucheck.deploy") == 0) return "VLAN_MTU";
    if (std::strcmp(key, "com.orbeno.common.teamcheck.deploy") == 0) return "TEAMING";
    return nullptr;
}

int32_t SaveHealthCheck(const SaveArgs &args) {
    const char *id = HealthCheckInstance(args.key);
    if (!id) {
        args.context.messages.Error("Unknown health check type %s\n", args.key);
        return kFailed;
    }
    if (args.value.size() < layout::kHealthCheck.size) return kFailed;
    configstore::Object *check = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, id, &check);
    if (status) return status;
    // "enable" here and "enabled" in the load: whoever else writes this object writes the other name.
    status = configstore::SetValueBool(check, "enable", Get(args.value, kEnabled) != 0);
    return status ? status : configstore::SetValueUint32(check, "interval", Get(args.value, kInterval));
}

int32_t LoadHealthCheck(const LoadArgs &args) {
    const char *id = HealthCheckInstance(args.key.data());
    if (!id) return kFailed;
    configstore::Object *check = nullptr;
    const int32_t status = configstore::GetSubObject(args.parent, args.leaf, id, &check);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    Block block;
    if (!block.Allocate(layout::kHealthCheck.size)) {
        args.context.messages.Error("Failed to alloc memory for DVSHealthchkDeploy\n");
        return kFailed;
    }
    bool enabled = false;
    if (configstore::GetValueBool(check, "enabled", &enabled) == 0) Put(block.bytes(), kEnabled, enabled);
    LoadNumber(check, "interval", block.bytes(), kInterval);
    return Store(args, block.bytes());
}

} // namespace dvs::convert
