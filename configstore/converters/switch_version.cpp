/* SPDX-License-Identifier: Apache-2.0 */
// The switch's version between text and number (switch_version.h).

#include "configstore/converters/switch_version.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/switch_version.h"

namespace dvs::convert {

int32_t ReadSwitchVersion(configstore::Object *switchObject, uint32_t *version) {
    configstore::Object *product = nullptr;
    int32_t status = configstore::GetSubObject(switchObject, "product", "", &product);
    if (status) {
        config::LogError("Failed to get product obj, rc: %d\n", status);
        return status;
    }
    StoreText text;
    status = text.Read(product, "version");
    if (status) {
        config::LogError("Failed to get version obj, rc: %d\n", status);
        return status;
    }
    bool overlay = false;
    if (configstore::GetValueBool(switchObject, "ovl_enabled", &overlay)) {
        config::LogTrace("Unabled to get ovl_enabled\n");
        overlay = false;
    }
    const uint32_t number = layout::VersionNumber(text.get(), overlay);
    if (number == 0) {
        config::LogError("Unknown vds version %s\n", text.get());
        return kFailed;
    }
    *version = number;
    return 0;
}

int32_t SaveSwitchVersion(const SaveArgs &args) {
    if (args.value.size() < sizeof(uint32_t)) return kFailed;
    const char *text = layout::VersionText(GetU32(args.value, 0));
    if (!text) {
        // The message has a place for a text that cannot be there: the number has none.
        config::LogError("Unknow version : %s\n", "(null)");
        return kFailed;
    }
    return configstore::SetValueStr(args.parent, args.leaf, text);
}

int32_t LoadSwitchVersion(const LoadArgs &args) {
    uint32_t version = 0;
    if (const int32_t status = ReadSwitchVersion(args.root, &version)) return status;
    return StoreNumber(args, version);
}

} // namespace dvs::convert
