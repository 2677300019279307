/* SPDX-License-Identifier: Apache-2.0 */
// Converters of beacon timeout and switch address (switch_settings.h); called through the converter table.

#include "configstore/converters/switch_settings.h"

#include <arpa/inet.h>

#include "configstore/converters/common.h"

namespace dvs::convert {

int32_t SaveBeaconTimeout(const SaveArgs &args) {
    if (args.value.size() < sizeof(int32_t)) return kFailed;
    return configstore::SetValueInt(args.parent, args.leaf, Get<int32_t>(args.value, 0));
}

int32_t LoadBeaconTimeout(const LoadArgs &args) {
    int32_t timeout = 0;
    const int32_t status = configstore::GetValueInt(args.parent, args.leaf, &timeout);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    return StoreNumber(args, timeout);
}

int32_t SaveSwitchAddress(const SaveArgs &args) {
    if (args.value.size() < sizeof(in_addr)) return kFailed;
    char text[INET_ADDRSTRLEN];
    if (!inet_ntop(AF_INET, args.value.data(), text, sizeof text)) {
        args.context.messages.Error("Failed to parse integer to Ipv4Address: %u\n", GetU32(args.value, 0));
        return kFailed;
    }
    return configstore::SetValueStr(args.parent, args.leaf, text);
}

int32_t LoadSwitchAddress(const LoadArgs &args) {
    StoreText text;
    const int32_t status = text.Read(args.parent, args.leaf);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    in_addr address;
    if (inet_pton(AF_INET, text.get(), &address) != 1) return kFailed;
    return StoreNumber(args, address.s_addr);
}

} // namespace dvs::convert
