/* SPDX-License-Identifier: Apache-2.0 */
// The stated face of the frame (prop_frame.h): the process-wide values, the sub-object functions, and SaveProp
// and LoadProps on the saver and the loader. Nothing here looks at a key.

#include "configstore/maps/prop_frame.h"

#include <time.h>

#include "configstore/log.h"
#include "configstore/maps/prop_loader.h"
#include "configstore/maps/prop_saver.h"
#include "dvsdata/growing_image.h"

uint32_t dvsSwitchClass = 0;
bool dvsWidePortRecords = false;
int64_t dvsConfigStoreTimeMs = 0;

using namespace dvs;
using config::Messages;

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
        Messages().Error("GetOrCreateSubObject for prop: %s failed, failure code: %d\n", name, status);
        return status;
    }
    if (!create) return status;
    status = configstore::CreateSubObject(parent, name, instanceId, out);
    if (status) Messages().Error("Create sub object for key: %s failed\n", name);
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
    const convert::Context context = {.switchClass = dvsSwitchClass, .wideRecords = dvsWidePortRecords};
    config::PropSaver saver(context, config::PropSaver::For::kOneProperty);
    saver.Begin(object, propClass);
    return saver.Save(key, {static_cast<const uint8_t *>(value), value ? len : 0}, propType);
}

int32_t LoadProps(const char *propsName, configstore::Object *object, DVSData *outList, uint32_t propClass,
                  uint32_t serializeFlags, configstore::Object *trafficResources) {
    convert::KnownFilters filters;
    const convert::Context context = {
        .switchClass = dvsSwitchClass, .wideRecords = dvsWidePortRecords, .filters = &filters};
    data::GrowingImage image;
    config::PropLoader loader(context, propClass);
    return loader.LoadAlone(&image, propsName, object, outList, serializeFlags, trafficResources);
}
