/* SPDX-License-Identifier: Apache-2.0 */
// The switch's version between text and number (switch_version.h).

#include "configstore/converters/switch_version.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/switch_version.h"

namespace dvs::convert {

void TraceNoOverlayFlag(const config::Messages &messages) {
    messages.Trace("Unabled to get ovl_enabled\n");
}

int32_t ReadSwitchVersion(const config::Messages &messages, configstore::Object *switchObject,
                          SwitchVersion *version) {
    configstore::Object *product = nullptr;
    int32_t status = configstore::GetSubObject(switchObject, "product", "", &product);
    if (status) {
        messages.Error("Failed to get product obj, rc: %d\n", status);
        return status;
    }
    StoreText text;
    status = text.Read(product, "version");
    if (status) {
        messages.Error("Failed to get version obj, rc: %d\n", status);
        return status;
    }
    bool overlay = false;
    const bool hasFlag = configstore::GetValueBool(switchObject, "ovl_enabled", &overlay) == 0;
    if (!hasFlag) TraceNoOverlayFlag(messages);
    const uint32_t number = layout::VersionNumber(text.get(), hasFlag && overlay);
    if (number == 0) {
        messages.Error("Unknown vds version %s\n", text.get());
        return kFailed;
    }
    *version = {number, hasFlag};
    return 0;
}

int32_t SaveSwitchVersion(const SaveArgs &args) {
    if (args.value.size() < sizeof(uint32_t)) return kFailed;
    const char *text = layout::VersionText(GetU32(args.value, 0));
    if (!text) {
        // The message has a place for a text that cannot be there: the number has none.
        args.context.messages.Error("Unknow version : %s\n", "(null)");
        return kFailed;
    }
    return configstore::SetValueStr(args.parent, args.leaf, text);
}

int32_t LoadSwitchVersion(const LoadArgs &args) {
    SwitchVersion version = {};
    if (const int32_t status = ReadSwitchVersion(args.context.messages, args.root, &version)) return status;
    return StoreNumber(args, version.number);
}

} // namespace dvs::convert
