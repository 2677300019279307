/* SPDX-License-Identifier: Apache-2.0 */
// MAC security of a port: a word of what is rejected <-> the object "mac_management_policy", which says what
// is allowed. Called through the converter table.

#include "configstore/converters/mac_security.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/mac_security.h"

namespace dvs::convert {
namespace {

constexpr auto kReject = layout::At<uint32_t>(layout::kMacSecurity, "reject");

struct Permission {
    const char *name;
    uint32_t rejectBit;
};
constexpr Permission kPermissions[] = {
    {"allow_promiscuous", 0x1},
    {"allow_mac_change", 0x2},
    {"allow_forged_transmit", 0x4},
};

int32_t LoadMacSecurity(const LoadArgs &args) {
    configstore::Object *policy = nullptr;
    if (configstore::GetSubObject(args.parent, args.leaf, nullptr, &policy) || !policy) return 0;
    uint32_t reject = 0;
    for (const Permission &permission : kPermissions) {
        bool allowed = true; // what cannot be read is not rejected
        if (configstore::GetValueBool(policy, permission.name, &allowed) == 0 && !allowed)
            reject |= permission.rejectBit;
    }
    return StoreNumber(args, reject);
}

} // namespace

int32_t SaveMacSecurity(const SaveArgs &args) {
    if (args.value.size() < kReject.End()) return kFailed;
    configstore::Object *policy = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, nullptr, &policy);
    const uint32_t reject = Get(args.value, kReject);
    for (const Permission &permission : kPermissions) {
        if (status) return status;
        status = configstore::SetValueBool(policy, permission.name, !(reject & permission.rejectBit));
    }
    return status;
}

int32_t LoadEtherswitchMacSecurity(const LoadArgs &args) {
    return args.context.switchClass == 0 ? LoadMacSecurity(args) : 0;
}

int32_t LoadVswitchMacSecurity(const LoadArgs &args) {
    return args.context.switchClass == 0 ? 0 : LoadMacSecurity(args);
}

} // namespace dvs::convert
