/* SPDX-License-Identifier: Apache-2.0 */
// The save side of the frame (prop_saver.h). It knows rows, paths and types; what a value looks like is the
// converters' business.

#include "configstore/maps/prop_saver.h"

#include <cstring>

#include "configstore/converters/table.h"
#include "configstore/maps/prop_frame.h"

namespace dvs::config {
namespace {

ConverterType DefaultType(uint32_t knownClass) {
    return knownClass == DVS_PROP_CLASS_PORT ? ConverterType::kPortDefault : ConverterType::kSwitchDefault;
}

} // namespace

void PropSaver::Begin(configstore::Object *object, uint32_t propClass) {
    object_ = object;
    propClass_ = propClass;
    lastRoute_ = RowIndex::kOtherRoute;
    if (for_ == For::kManyProperties) startMs_ = dvsConfigStoreNowMs();
}

void PropSaver::End() {
    dvsConfigStoreTimeMs += dvsConfigStoreNowMs() - startMs_;
}

int32_t PropSaver::Save(const char *key, std::span<const uint8_t> value, uint32_t propType) {
    const RowIndex::Found found = Find(key);
    if (!found.row) {
        context_.messages.Error("Unknow prop: %s\n", key);
        return Failed(key, kFailed);
    }
    const auto &row = *found.row;
    if (context_.messages.Traces()) context_.messages.Trace("Compare %s : %s success\n", key, row.key);
    configstore::Object *parent = object_;
    if (const int32_t status = ParentOf(found, &parent)) {
        context_.messages.Error("Failed to get/create sub object for dvs prop:%s stop and return\n", key);
        return Failed(key, status);
    }
    const convert::SaveArgs args = {context_, object_, parent,     LeafOf(row, DepthOf(row)),
                                    value,    key,     propClass_, propType};
    if (for_ == For::kManyProperties) return Convert(row, args);
    // The stated readings of the clock: right before and after the converter.
    const int64_t start = dvsConfigStoreNowMs();
    const int32_t status = Convert(row, args);
    dvsConfigStoreTimeMs += dvsConfigStoreNowMs() - start;
    return status;
}

RowIndex::Found PropSaver::Find(const char *key) {
    const uint32_t known = KnownClass(propClass_);
    if (for_ == For::kOneProperty)
        return {FindRow(GetConfigMap(static_cast<int>(known)), key, DefaultType(known)), RowIndex::kOtherRoute};
    auto &index = indexes_[known];
    if (!index) index.emplace(GetConfigMap(static_cast<int>(known)), DefaultType(known));
    return index->Find(key);
}

int32_t PropSaver::ParentOf(const RowIndex::Found &found, configstore::Object **parent) {
    const auto &row = *found.row;
    if (found.route == RowIndex::kOtherRoute) {
        // A row that writes the remembered sub-object itself might make another of it.
        if (lastRoute_ != RowIndex::kOtherRoute && DepthOf(row) <= 1 &&
            std::strcmp(lastName_, row.path[0]) == 0)
            lastRoute_ = RowIndex::kOtherRoute;
        return GetSubObjectByPath(row.path, DepthOf(row), object_, parent, true);
    }
    if (found.route == lastRoute_) {
        *parent = lastParent_;
        return 0;
    }
    const int32_t status = GetSubObjectByPath(row.path, DepthOf(row), object_, parent, true);
    lastRoute_ = status ? RowIndex::kOtherRoute : found.route;
    lastName_ = row.path[0];
    lastParent_ = *parent;
    return status;
}

int32_t PropSaver::Convert(const DVSProp2ConfigEntry &row, const convert::SaveArgs &args) const {
    const auto *converter = convert::ConverterFor(ConverterTypeOf(row));
    if (!converter) context_.messages.Error("Unknow prop type: %d\n", static_cast<int>(row.converterType));
    const int32_t status = converter ? converter->save(args) : kFailed;
    return status ? Failed(args.key, status) : 0;
}

int32_t PropSaver::Failed(const char *key, int32_t status) const {
    context_.messages.Error("Set prop: %s failed\n", key);
    return status;
}

} // namespace dvs::config
