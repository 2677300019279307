/* SPDX-License-Identifier: Apache-2.0 */
// Converters of the DEFAULT rows (unmapped.h); called through the converter table.
//
// Instances are named by the property key, which reads back as their "key". Only opaque switch-wide
// properties stand under ids that say nothing (the host's under the key all the same) and carry a "key" of
// their own.

#include "configstore/converters/unmapped.h"

#include <string_view>

#include "configstore/converters/common.h"

namespace dvs::convert {
namespace {

constexpr uint32_t kBitOpaque = 0x08;
constexpr uint32_t kBitState = 0x10; // what vendors' properties carry too
constexpr uint32_t kTypeText = 0x10;
constexpr uint32_t kTypeOpaque = 0x18;

int32_t DataObject(const SaveArgs &args, configstore::Object **data) {
    return GetOrCreateSubObject(true, args.parent, args.leaf, "", data);
}

int32_t SaveInstanceText(const SaveArgs &args, configstore::Object *data, const char *list) {
    const Text text(args.value);
    if (!text.get()) return kFailed;
    configstore::Object *instance = nullptr;
    if (const int32_t status = configstore::CreateSubObject(data, list, args.key, &instance)) return status;
    return configstore::SetValueStr(instance, "value", text.get());
}

int32_t SaveInstanceBytes(const SaveArgs &args, configstore::Object *data, const char *list,
                          configstore::Object **instance) {
    if (const int32_t status = configstore::CreateSubObject(data, list, args.key, instance)) return status;
    return configstore::SetValueBinary(*instance, "opaque_data", args.value.data(),
                                       static_cast<uint32_t>(args.value.size()));
}

int32_t SaveOther(const SaveArgs &args, configstore::Object *data, configstore::Object **instance) {
    if (const int32_t status = SaveInstanceBytes(args, data, "other_data", instance)) return status;
    return configstore::SetValueUint32(*instance, "prop_type", args.propType);
}

// An opaque property under an id that says nothing of its key.
int32_t SaveOpaque(const SaveArgs &args, configstore::Object *data, const char *list, const char *id) {
    configstore::Object *instance = nullptr;
    if (const int32_t status = configstore::CreateSubObject(data, list, id, &instance)) return status;
    if (const int32_t status = configstore::SetValueStr(instance, "key", args.key)) return status;
    return configstore::SetValueBinary(instance, "opaque_data", args.value.data(),
                                       static_cast<uint32_t>(args.value.size()));
}

int32_t SaveOtherOfClass(const SaveArgs &args, configstore::Object *data, uint32_t propClass) {
    configstore::Object *instance = nullptr;
    if (const int32_t status = SaveOther(args, data, &instance)) return status;
    return configstore::SetValueUint32(instance, "dvs_config_type", propClass);
}

int32_t SaveGlobal(const SaveArgs &args, configstore::Object *data) {
    if (args.propType & kBitOpaque) {
        StoreText id;
        (void)id.Generate(); // without an id the store decides what becomes of the instance
        return SaveOpaque(args, data, "dvs_opaque_data", id.get());
    }
    if (std::string_view(args.key).find("com.orbeno.extraconfig") != std::string_view::npos)
        return SaveInstanceText(args, data, "extra_config");
    if (args.propType & kBitState) return SaveInstanceText(args, data, "vendor_specific_config");
    return SaveOtherOfClass(args, data, DVS_PROP_CLASS_GLOBAL);
}

int32_t SaveHost(const SaveArgs &args, configstore::Object *data) {
    if (args.propType & kBitOpaque) {
        StoreText id; // generated, and not used: the key is the host's id
        if (const int32_t status = id.Generate()) return status;
        return SaveOpaque(args, data, "host_opaque_data", args.key);
    }
    if (args.propType & kBitState) return SaveInstanceText(args, data, "vendor_specific_host_member_config");
    return SaveOtherOfClass(args, data, DVS_PROP_CLASS_HOST);
}

// --- Load. ---

// One entry under the key that the instance names, with a type of its own.
int32_t LoadInstanceText(const LoadArgs &args, configstore::Object *instance) {
    StoreText key;
    StoreText value;
    if (const int32_t status = key.Read(instance, "key")) return status;
    if (const int32_t status = value.Read(instance, "value")) return status;
    return StoreAs(args, key.get(), value.bytes(), kTypeText);
}

int32_t LoadInstanceBytes(const LoadArgs &args, configstore::Object *instance, uint32_t propType) {
    StoreText key;
    StoreBytes value;
    if (const int32_t status = key.Read(instance, "key")) return status;
    if (const int32_t status = value.Read(instance, "opaque_data")) return status;
    return StoreAs(args, key.get(), value.bytes(), propType);
}

int32_t LoadInstanceOpaque(const LoadArgs &args, configstore::Object *instance) {
    return LoadInstanceBytes(args, instance, kTypeOpaque);
}

int32_t LoadInstanceRuleset(const LoadArgs &args, configstore::Object *instance) {
    return LoadInstanceBytes(args, instance, kTypeText);
}

int32_t LoadInstanceOther(const LoadArgs &args, configstore::Object *instance) {
    uint32_t propClass = 0;
    const int32_t status = configstore::GetValueUint32(instance, "dvs_config_type", &propClass);
    if (status || propClass != args.propClass) return status;
    uint32_t propType = 0;
    (void)configstore::GetValueUint32(instance, "prop_type", &propType);
    return LoadInstanceBytes(args, instance, propType);
}

using InstanceLoader = int32_t (*)(const LoadArgs &args, configstore::Object *instance);

struct ListRow {
    const char *list;
    InstanceLoader load; // null: the list is looked at, and none of it comes back
};

constexpr ListRow kGlobalLists[] = {
    {"vendor_specific_config", LoadInstanceText}, //
    {"dvs_opaque_data", LoadInstanceOpaque},      //
    {"extra_config", LoadInstanceText},           //
    {"other_data", LoadInstanceOther}             //
};
constexpr ListRow kHostLists[] = {
    {"vendor_specific_host_member_config", LoadInstanceText}, //
    {"host_opaque_data", LoadInstanceOpaque},                 //
    {"other_data", LoadInstanceOther}                         //
};
constexpr ListRow kPortLists[] = {
    {"ruleset_data", LoadInstanceRuleset},      //
    {"opaque_data", LoadInstanceOpaque},        //
    {"extra_config", LoadInstanceText},         //
    {"vendor_specific_data", LoadInstanceText}, //
    {"other_data", nullptr}                     //
};

int32_t LoadList(const LoadArgs &args, configstore::Object *data, const ListRow &row) {
    Instances instances;
    const int32_t status = instances.Read(args, data, row.list);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    if (!row.load) return 0;
    for (auto *instance : instances.items()) {
        if (const int32_t failed = row.load(args, instance)) return failed;
    }
    return 0;
}

// Like LoadList, for lists of which whatever can be read is taken and nothing fails the load.
void LoadWhatReads(const LoadArgs &args, configstore::Object *data, const ListRow &row) {
    Instances instances;
    if (instances.Read(args, data, row.list)) return;
    for (auto *instance : instances.items())
        (void)row.load(args, instance);
}

} // namespace

int32_t SaveUnmappedSwitchProp(const SaveArgs &args) {
    configstore::Object *data = nullptr;
    const int32_t status = DataObject(args, &data);
    if (status || !data) return status;
    return args.propClass == DVS_PROP_CLASS_HOST ? SaveHost(args, data) : SaveGlobal(args, data);
}

int32_t LoadUnmappedSwitchProps(const LoadArgs &args) {
    configstore::Object *data = nullptr;
    const int32_t status = configstore::GetSubObject(args.parent, args.leaf, "", &data);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    const std::span<const ListRow> lists =
        args.propClass == DVS_PROP_CLASS_HOST ? std::span<const ListRow>(kHostLists) : kGlobalLists;
    for (const auto &row : lists)
        LoadWhatReads(args, data, row);
    return 0;
}

int32_t SaveUnmappedPortProp(const SaveArgs &args) {
    configstore::Object *data = nullptr;
    const int32_t status = DataObject(args, &data);
    if (status || !data) return status;
    const std::string_view key(args.key);
    configstore::Object *instance = nullptr;
    if (key.ends_with(".ruleset")) return SaveInstanceBytes(args, data, "ruleset_data", &instance);
    if ((args.propType & kBitOpaque) && (args.propType & kBitState))
        return SaveInstanceBytes(args, data, "opaque_data", &instance);
    if (args.propType & kBitState) return SaveInstanceText(args, data, "vendor_specific_data");
    if (key.starts_with("com.orbeno.port.extraConfig")) return SaveInstanceText(args, data, "extra_config");
    return SaveOther(args, data, &instance);
}

int32_t LoadUnmappedPortProps(const LoadArgs &args) {
    configstore::Object *data = nullptr;
    const int32_t status = configstore::GetSubObject(args.parent, args.leaf, "", &data);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    for (const auto &row : kPortLists) {
        if (const int32_t failed = LoadList(args, data, row)) return failed;
    }
    return 0;
}

} // namespace dvs::convert
