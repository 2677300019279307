/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_SAVER_H
#define CONFIGSTORE_MAPS_PROP_SAVER_H

// SaveProp (prop_frame.h) for the many properties of many objects, with the same results: rows come out of an
// index, a path that the property before had as well is not walked again, and the clock is read once an
// object. For the save, which makes one for each switch: the mapping tables must stay as they are while a
// saver lives.

#include <cstdint>

#include "configstore/maps/prop_lookup.h"
#include "platform/configstore.h"

namespace dvs::config {

class PropSaver {
public:
    /// The properties that follow are of this class and go into this object, which must not change otherwise
    /// until End.
    void Begin(configstore::Object *object, uint32_t propClass);
    [[nodiscard]] int32_t Save(const char *key, const void *value, uint32_t len, uint32_t propType);
    /// Adds the time since Begin to dvsConfigStoreTimeMs.
    void End();

private:
    [[nodiscard]] int32_t ParentOf(const RowIndex::Found &found, configstore::Object **parent);

    static constexpr uint32_t kClassNum = 3;

    RowIndex indexes_[kClassNum];
    RowIndex *index_ = nullptr;
    configstore::Object *object_ = nullptr;
    uint32_t propClass_ = 0;
    int64_t startMs_ = 0;
    uint8_t lastWay_ = RowIndex::kOtherWay; // to the sub-object of `object_` that was reached last
    const char *lastName_ = nullptr;
    configstore::Object *lastParent_ = nullptr;
};

} // namespace dvs::config

#endif
