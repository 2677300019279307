/* SPDX-License-Identifier: Apache-2.0 */
// The frame around every converter (prop_frame.h). It knows rows, paths and types; what a value looks like is
// the converters' business, so nothing here looks at a key.

#include "configstore/maps/prop_frame.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <iterator>

#include <time.h>

#include "configstore/converters/converter.h"
#include "configstore/converters/table.h"
#include "configstore/log.h"
#include "configstore/maps/prop_loader.h"
#include "configstore/maps/prop_lookup.h"
#include "configstore/maps/prop_saver.h"
#include "dvsdata/list_internal.h"
#include "dvsstate/owned_list.h"

uint32_t dvsSwitchClass = 0;
bool dvsWidePortRecords = false;
configstore::Object *dvsLoadedSwitch = nullptr;
int64_t dvsConfigStoreTimeMs = 0;

namespace {

using dvs::ConverterType;
using dvs::config::kFailed;
using dvs::config::LogError;
using dvs::config::LogTrace;
using dvs::config::Tracing;
using dvs::convert::ConverterFor;

constexpr uint32_t kPropTypeState = 0x10;

const char *Leaf(const DVSProp2ConfigEntry &row) {
    return LeafOf(row, DepthOf(row));
}

std::span<const uint8_t> Bytes(const void *value, uint32_t len) {
    return {static_cast<const uint8_t *>(value), value ? len : 0};
}

ConverterType DefaultType(uint32_t propClass) {
    return propClass == DVS_PROP_CLASS_PORT ? ConverterType::kPortDefault : ConverterType::kSwitchDefault;
}

int32_t FailedToSet(const char *key, int32_t status) {
    LogError("Set prop: %s failed\n", key);
    return status;
}

int32_t UnknownKey(const char *key) {
    LogError("Unknow prop: %s\n", key);
    return FailedToSet(key, kFailed);
}

int32_t FailedToReach(const char *key, int32_t status) {
    LogError("Failed to get/create sub object for dvs prop:%s stop and return\n", key);
    return FailedToSet(key, status);
}

int32_t RunSave(const DVSProp2ConfigEntry &row, const dvs::convert::SaveArgs &args) {
    const auto *converter = ConverterFor(dvs::ConverterTypeOf(row));
    if (!converter) LogError("Unknow prop type: %d\n", static_cast<int>(row.converterType));
    const int32_t status = converter ? converter->save(args) : kFailed;
    return status ? FailedToSet(args.key, status) : 0;
}

int32_t BuildProps(const char *propsName, configstore::Object *object, DVSData *outList, uint32_t propClass,
                   uint32_t serializeFlags, configstore::Object *trafficResources) {
    dvs::state::OwnedList list;
    if (dvs::state::NewList(list) != HYP_OK) return kFailed;
    dvs::config::PropLoader loader(propClass);
    if (const int32_t status = loader.LoadRows(object, list.get(), nullptr, trafficResources)) return status;
    void *buf = nullptr;
    uint32_t len = 0;
    HYP_ReturnStatus status = DVSData_Serialize(list.get(), &buf, &len, serializeFlags);
    if (status == HYP_OK) status = DVSData_Update(outList, propsName, buf, len, kPropTypeState);
    std::free(buf);
    return static_cast<int32_t>(status);
}

} // namespace

int64_t dvsConfigStoreNowMs() {
    timespec now;
    clock_gettime(CLOCK_MONOTONIC, &now);
    return int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1'000'000;
}

int32_t GetOrCreateSubObject(bool create, configstore::Object *parent, const char *name,
                             const char *instanceId, configstore::Object **out) {
    *out = nullptr;
    int32_t status = configstore::GetSubObject(parent, name, instanceId, out);
    if (status == configstore::OK) return status;
    if (status != configstore::NOT_FOUND) {
        LogError("GetOrCreateSubObject for prop: %s failed, failure code: %d\n", name, status);
        return status;
    }
    if (!create) return status;
    status = configstore::CreateSubObject(parent, name, instanceId, out);
    if (status) LogError("Create sub object for key: %s failed\n", name);
    return status;
}

int32_t GetSubObjectByPath(const char (*path)[128], uint32_t depth, configstore::Object *object,
                           configstore::Object **out, bool create) {
    configstore::Object *current = object;
    for (uint32_t level = 0; level + 1 < depth; ++level) {
        configstore::Object *next = nullptr;
        if (const int32_t status = GetOrCreateSubObject(create, current, path[level], nullptr, &next))
            return status;
        current = next;
    }
    *out = current;
    return 0;
}

int32_t SaveProp(configstore::Object *object, const char *key, const void *value, uint32_t len,
                 uint32_t propClass, uint32_t propType) {
    const uint32_t known = KnownClass(propClass);
    const auto *row = dvs::config::FindRow(GetConfigMap(static_cast<int>(known)), key, DefaultType(known));
    if (!row) return UnknownKey(key);
    if (Tracing()) LogTrace("Compare %s : %s success\n", key, row->key);

    configstore::Object *parent = object;
    if (const int32_t status = GetSubObjectByPath(row->path, DepthOf(*row), object, &parent, true))
        return FailedToReach(key, status);
    const int64_t start = dvsConfigStoreNowMs();
    const int32_t status =
        RunSave(*row, {object, parent, Leaf(*row), Bytes(value, len), key, propClass, propType});
    dvsConfigStoreTimeMs += dvsConfigStoreNowMs() - start;
    return status;
}

int32_t LoadProps(const char *propsName, configstore::Object *object, DVSData *outList, uint32_t propClass,
                  uint32_t serializeFlags, configstore::Object *trafficResources) {
    LogTrace("LoadProps: %s\n", propsName);
    const int32_t status =
        BuildProps(propsName, object, outList, propClass, serializeFlags, trafficResources);
    if (status) LogError("Load dvs props from configstore failed, props type:%s\n", propsName);
    return status;
}

namespace dvs::config {

void PropSaver::Begin(configstore::Object *object, uint32_t propClass) {
    object_ = object;
    propClass_ = propClass;
    lastWay_ = RowIndex::kOtherWay;
    index_ = &indexes_[propClass];
    if (!index_->IsBuilt()) index_->Build(GetConfigMap(static_cast<int>(propClass)), DefaultType(propClass));
    startMs_ = dvsConfigStoreNowMs();
}

int32_t PropSaver::Save(const char *key, const void *value, uint32_t len, uint32_t propType) {
    const RowIndex::Found found = index_->Find(key);
    if (!found.row) return UnknownKey(key);
    if (Tracing()) LogTrace("Compare %s : %s success\n", key, found.row->key);
    configstore::Object *parent = object_;
    if (const int32_t status = ParentOf(found, &parent)) return FailedToReach(key, status);
    return RunSave(*found.row,
                   {object_, parent, Leaf(*found.row), Bytes(value, len), key, propClass_, propType});
}

int32_t PropSaver::ParentOf(const RowIndex::Found &found, configstore::Object **parent) {
    const auto &row = *found.row;
    if (found.way == RowIndex::kOtherWay) {
        // A row that writes the remembered sub-object itself might make another of it.
        if (lastWay_ != RowIndex::kOtherWay && DepthOf(row) <= 1 && std::strcmp(lastName_, row.path[0]) == 0)
            lastWay_ = RowIndex::kOtherWay;
        return GetSubObjectByPath(row.path, DepthOf(row), object_, parent, true);
    }
    if (found.way == lastWay_) {
        *parent = lastParent_;
        return 0;
    }
    const int32_t status = GetSubObjectByPath(row.path, DepthOf(row), object_, parent, true);
    lastWay_ = status ? RowIndex::kOtherWay : found.way;
    lastName_ = row.path[0];
    lastParent_ = *parent;
    return status;
}

void PropSaver::End() {
    dvsConfigStoreTimeMs += dvsConfigStoreNowMs() - startMs_;
}

} // namespace dvs::config
