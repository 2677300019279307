/* SPDX-License-Identifier: Apache-2.0 */
// The load side of the frame (prop_loader.h). It knows rows, paths and types; what a value looks like is the
// converters' business.

#include "configstore/maps/prop_loader.h"

#include <cstring>
#include <span>

#include "configstore/converters/table.h"
#include "configstore/log.h"
#include "configstore/maps/prop_frame.h"
#include "dvsdata/growing_image.h"
#include "dvsdata/list_internal.h"

namespace dvs::config {
namespace {

constexpr uint32_t kPropTypeState = 0x10;
constexpr const char *kPortResourcePoolsKey = "com.orbeno.common.port.respools.cfg";
constexpr const char *kTrafficResourcesLeaf = "traffic_resources";

} // namespace

PropLoader::PropLoader(const convert::Context &context, uint32_t propClass)
    : context_(context), propClass_(propClass), rest_(GetConfigMap(static_cast<int>(KnownClass(propClass)))) {
    for (; rest_->key && rowNum_ < kMaxRows; ++rest_)
        rows_[rowNum_++] = Prepared(*rest_);
}

PropLoader::Row PropLoader::Prepared(const DVSProp2ConfigEntry &row) {
    const uint32_t depth = DepthOf(row);
    const auto *converter = convert::ConverterFor(ConverterTypeOf(row));
    const uint32_t parent = ParentOf(row, depth);
    return {.row = &row,
            .load = converter ? converter->load : nullptr,
            .leaf = LeafOf(row, depth),
            .key = row.key,
            .propType = row.loadPropType,
            .parent = parent,
            .restFrom = parent > 0 ? 1U : 0U,
            .depth = depth};
}

uint32_t PropLoader::ParentOf(const DVSProp2ConfigEntry &row, uint32_t depth) {
    if (depth < 2) return 0;
    for (uint32_t i = 1; i < parentNum_; ++i) {
        if (std::strcmp(parents_[i].name, row.path[0]) == 0) return i;
    }
    if (parentNum_ == kMaxParents) return 0;
    parents_[parentNum_].name = row.path[0];
    return parentNum_++;
}

int32_t PropLoader::LoadRows(data::GrowingImage *image, configstore::Object *object,
                             configstore::Object *trafficResources) {
    parents_[0] = {nullptr, object, 0, true};
    for (uint32_t i = 1; i < parentNum_; ++i)
        parents_[i].isReached = false;
    convert::LoadArgs args = {context_, object, object, image, nullptr, {}, 0, propClass_};
    for (const Row &row : std::span(rows_.data(), rowNum_)) {
        if (const int32_t status = LoadRow(row, &args)) return status;
    }
    for (const auto *row = rest_; row->key; ++row) {
        if (const int32_t status = LoadRow(Prepared(*row), &args)) return status;
    }
    if (propClass_ != DVS_PROP_CLASS_PORT || !trafficResources) return 0;
    args.parent = trafficResources;
    args.leaf = kTrafficResourcesLeaf;
    args.key = kPortResourcePoolsKey;
    args.propType = kPropTypeState;
    return convert::ConverterFor(ConverterType::kTrafficResources)->load(args);
}

// As GetSubObjectByPath without creating, then the converter.
inline int32_t PropLoader::LoadRow(const Row &row, convert::LoadArgs *args) {
    Parent &parent = parents_[row.parent];
    if (!parent.isReached) Reach(&parent, args->root);
    int32_t status = parent.status;
    args->parent = parent.object;
    if (status == 0 && row.restFrom + 1 < row.depth)
        status = GetSubObjectByPath(row.row->path + row.restFrom, row.depth - row.restFrom, parent.object,
                                    &args->parent, false);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    args->leaf = row.leaf;
    args->key = row.key;
    args->propType = row.propType;
    status = row.load ? row.load(*args) : kFailed;
    return status ? Failed(row, status) : 0;
}

void PropLoader::Reach(Parent *parent, configstore::Object *object) {
    parent->status = GetOrCreateSubObject(false, object, parent->name, nullptr, &parent->object);
    parent->isReached = true;
}

int32_t PropLoader::Failed(const Row &row, int32_t status) const {
    context_.messages.Error("Faild to load prop: %s, key: %s, type:%d from configstore, rc: %d\n", row.row->key,
                            row.leaf, static_cast<int>(row.row->converterType), status);
    return status;
}

int32_t PropLoader::LoadInto(data::GrowingImage *image, const char *propsName, configstore::Object *object,
                             uint32_t serializeFlags, configstore::Object *trafficResources) {
    context_.messages.Trace("LoadProps: %s\n", propsName);
    int32_t status = image->BeginNested(propsName, kPropTypeState) == HYP_OK ? 0 : kFailed;
    if (status == 0) {
        status = LoadRows(image, object, trafficResources);
        if (status == 0)
            status = static_cast<int32_t>(
                image->EndNested(serializeFlags, data::GrowingImage::Adding::kUpdate));
        else
            image->DropNested();
    }
    if (status) Failed(propsName);
    return status;
}

int32_t PropLoader::LoadAlone(data::GrowingImage *image, const char *propsName, configstore::Object *object,
                              DVSData *outList, uint32_t serializeFlags,
                              configstore::Object *trafficResources) {
    context_.messages.Trace("LoadProps: %s\n", propsName);
    int32_t status = image->BeginBuffer() == HYP_OK ? 0 : kFailed;
    if (status == 0) status = LoadRows(image, object, trafficResources);
    if (status == 0) status = static_cast<int32_t>(image->EndBuffer(serializeFlags));
    if (status == 0) {
        const data::Bytes props = image->Finished();
        status = static_cast<int32_t>(DVSData_Update(
            outList, propsName, props.data(), static_cast<uint32_t>(props.size()), kPropTypeState));
    }
    if (status) Failed(propsName);
    return status;
}

void PropLoader::Failed(const char *propsName) const {
    context_.messages.Error("Load dvs props from configstore failed, props type:%s\n", propsName);
}

} // namespace dvs::config
