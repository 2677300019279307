/* SPDX-License-Identifier: Apache-2.0 */
// The switch's version between text and number (switch_version.h).

#include "configstore/converters/switch_version.h"

#include "configstore/converters/common.h"

namespace dvs::convert {
namespace {

struct VersionRow {
    const char *text;
    uint32_t number;
    uint32_t overlayNumber; // the number with "ovl_enabled" set
};

constexpr VersionRow kVersions[] = {
    {"6.0.0", 4, 4},      //
    {"6.5.0", 5, 5},      //
    {"6.6.0", 6, 6},      //
    {"7.0.0", 7, 107},    //
    {"7.0.2", 8, 108},    //
    {"7.0.3", 9, 109},    //
    {"8.0.0", 10, 110},   //
    {"8.0.2", 11, 111},   //
    {"8.0.3", 12, 112},   //
    {"OVL 1.0", 100, 100} //
};

const char *VersionText(uint32_t number) {
    for (const auto &row : kVersions) {
        if (row.number == number || row.overlayNumber == number) return row.text;
    }
    return nullptr;
}

} // namespace

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
    for (const auto &row : kVersions) {
        if (std::strcmp(row.text, text.get()) != 0) continue;
        *version = overlay ? row.overlayNumber : row.number;
        return 0;
    }
    config::LogError("Unknown vds version %s\n", text.get());
    return kFailed;
}

int32_t SaveSwitchVersion(const SaveArgs &args) {
    if (args.value.size() < sizeof(uint32_t)) return kFailed;
    const char *text = VersionText(GetU32(args.value, 0));
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
