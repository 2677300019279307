/* SPDX-License-Identifier: Apache-2.0 */
// LACP policy of a port: one small record <-> the object "lacp_policy". Called through the converter table.

#include "configstore/converters/port_lacp.h"

#include "configstore/converters/common.h"
#include "configstore/converters/lacp_groups.h"
#include "configstore/layouts/lacp.h"

namespace dvs::convert {
namespace {

constexpr auto kEnabled = layout::At<uint8_t>(layout::kPortLacp, "enabled");
constexpr auto kMode = layout::At<uint32_t>(layout::kPortLacp, "mode");

} // namespace

int32_t SavePortLacp(const SaveArgs &args) {
    if (args.value.size() < kMode.End()) return kFailed;
    configstore::Object *policy = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, nullptr, &policy);
    if (status) return status;
    status = configstore::SetValueBool(policy, "enabled", Get(args.value, kEnabled) != 0);
    if (status) return status;
    return configstore::SetValueStr(policy, "mode",
                                    EnumText(Texts(layout::lacp::kModes), Get(args.value, kMode)));
}

int32_t LoadPortLacp(const LoadArgs &args) {
    configstore::Object *policy = nullptr;
    if (configstore::GetSubObject(args.parent, args.leaf, nullptr, &policy) || !policy) return 0;
    bool enabled = false;
    int32_t status = configstore::GetValueBool(policy, "enabled", &enabled);
    if (status) return status;
    StoreText mode;
    status = mode.Read(policy, "mode");
    if (status) return status;
    uint8_t record[layout::kPortLacp.size] = {};
    const std::span<uint8_t> value(record);
    Put(value, kEnabled, enabled);
    Put(value, kMode, LacpModeOf(args.context, mode.get()));
    return Store(args, value);
}

} // namespace dvs::convert
