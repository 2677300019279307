/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_SAVER_H
#define CONFIGSTORE_MAPS_PROP_SAVER_H

// The save side of the frame (prop_frame.h). A whole save makes one saver for each switch: rows come out of an
// index, a path that the property before had as well is not walked again, and the clock is read once an
// object. The mapping tables must stay as they are while such a saver lives. SaveProp makes one for a single
// property, which does without.

#include <array>
#include <cstdint>
#include <optional>
#include <span>

#include "configstore/converters/converter.h"
#include "configstore/maps/prop_lookup.h"
#include "platform/configstore.h"

namespace dvs::config {

class PropSaver {
public:
    /// For how many properties a saver is made.
    enum class For : bool { kOneProperty, kManyProperties };

    PropSaver(const convert::Context &context, For what) : context_(context), for_(what) {}

    /// The properties that follow are of this class and go into this object, which must not change otherwise
    /// until End.
    void Begin(configstore::Object *object, uint32_t propClass);
    [[nodiscard]] int32_t Save(const char *key, std::span<const uint8_t> value, uint32_t propType);
    /// Adds the time since Begin to dvsConfigStoreTimeMs.
    void End();

private:
    [[nodiscard]] RowIndex::Found Find(const char *key);
    [[nodiscard]] int32_t ParentOf(const RowIndex::Found &found, configstore::Object **parent);
    [[nodiscard]] int32_t Convert(const DVSProp2ConfigEntry &row, const convert::SaveArgs &args) const;
    [[nodiscard]] int32_t Failed(const char *key, int32_t status) const;

    static constexpr uint32_t kClassNum = 3;

    const convert::Context &context_;
    const For for_;
    std::array<std::optional<RowIndex>, kClassNum> indexes_; // by class, made when they are needed
    configstore::Object *object_ = nullptr;
    uint32_t propClass_ = 0;
    int64_t startMs_ = 0;
    uint8_t lastRoute_ = RowIndex::kOtherRoute; // to the sub-object of `object_` that was reached last
    const char *lastName_ = nullptr;
    configstore::Object *lastParent_ = nullptr;
};

} // namespace dvs::config

#endif
