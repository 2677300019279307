/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_LOADER_H
#define CONFIGSTORE_MAPS_PROP_LOADER_H

// The load side of the frame (prop_frame.h), for one object or many of a class. What does not depend on the
// object is looked up once, when the loader is made, and a sub-object that several rows lead through is
// reached once an object. The tables are writable, so a loader lives no longer than one load.

#include <array>
#include <cstdint>
#include <string_view>

#include "configstore/converters/common.h"
#include "configstore/converters/converter.h"
#include "dvs/configstore.h"

namespace dvs::config {

class PropLoader {
public:
    PropLoader(const convert::Context &context, uint32_t propClass);

    /// LoadProps with the innermost buffer of the image for its list.
    [[nodiscard]] int32_t LoadInto(data::GrowingImage *image, const char *propsName,
                                   configstore::Object *object, uint32_t serializeFlags,
                                   configstore::Object *trafficResources);
    /// LoadProps. `image` is an empty one for the properties.
    [[nodiscard]] int32_t LoadAlone(data::GrowingImage *image, const char *propsName,
                                    configstore::Object *object, DVSData *outList, uint32_t serializeFlags,
                                    configstore::Object *trafficResources);

private:
    static constexpr uint32_t kMaxRows = 48;   // prepared once; the rows behind them once an object
    static constexpr uint32_t kMaxParents = 4; // remembered; the tables have three

    struct Row {
        const DVSProp2ConfigEntry *row;
        convert::LoadFn load; // null for a type that has none
        const char *leaf;
        std::string_view key;
        uint32_t propType;
        uint32_t parent;   // the first sub-object of the path, or the object itself
        uint32_t restFrom; // the path from there on goes through row->path[restFrom] and further ones
        uint32_t depth;
    };
    struct Parent {
        const char *name; // null for the object itself
        configstore::Object *object;
        int32_t status;
        bool isReached; // in the object at hand
    };

    [[nodiscard]] Row Prepared(const DVSProp2ConfigEntry &row);
    [[nodiscard]] uint32_t ParentOf(const DVSProp2ConfigEntry &row, uint32_t depth);
    /// Runs the rows on the object, in their order, into the image's innermost buffer. The first status that
    /// is not 0 ends it.
    [[nodiscard]] int32_t LoadRows(data::GrowingImage *image, configstore::Object *object,
                                   configstore::Object *trafficResources);
    [[nodiscard]] int32_t LoadRow(const Row &row, convert::LoadArgs *args);
    [[nodiscard]] int32_t Failed(const Row &row, int32_t status) const;
    void Failed(const char *propsName) const;
    static void Reach(Parent *parent, configstore::Object *object);

    const convert::Context &context_;
    const uint32_t propClass_;
    std::array<Row, kMaxRows> rows_;
    uint32_t rowNum_ = 0;
    const DVSProp2ConfigEntry *rest_; // rows for which there was no room, up to the end row
    std::array<Parent, kMaxParents> parents_{};
    uint32_t parentNum_ = 1;
};

} // namespace dvs::config

#endif
