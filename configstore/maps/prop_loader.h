/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_LOADER_H
#define CONFIGSTORE_MAPS_PROP_LOADER_H

// The load side of the frame (prop_frame.h), for one object or many of a class: what does not depend on the
// object is looked up once, when the loader is made, and a sub-object that several rows lead through is
// reached once an object. The tables are writable, so a loader is good for one load and no longer.

#include <array>
#include <cstdint>
#include <string_view>

#include "configstore/converters/common.h"
#include "configstore/converters/converter.h"
#include "dvs/configstore.h"

namespace dvs::config {

class PropLoader {
public:
    explicit PropLoader(uint32_t propClass);

    /// Runs the rows on `object`, in their order, into the list or the innermost buffer of the image; the
    /// other one is null. `trafficResources` as for LoadProps. The first status that is not 0 ends it.
    [[nodiscard]] int32_t LoadRows(configstore::Object *object, DVSData *list, data::GrowingImage *image,
                                   configstore::Object *trafficResources);

    /// LoadProps as an entry of the image's innermost buffer. On a failure, and when the image has given up,
    /// the image is of no use any more.
    [[nodiscard]] int32_t LoadInto(data::GrowingImage *image, const char *propsName,
                                   configstore::Object *object, uint32_t serializeFlags,
                                   configstore::Object *trafficResources);

private:
    static constexpr uint32_t kMaxRows = 48;   // that are prepared; longer tables take longer
    static constexpr uint32_t kMaxParents = 4; // that are remembered; the tables have three

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
    [[nodiscard]] int32_t LoadRow(const Row &row, convert::LoadArgs *args);
    [[nodiscard]] static int32_t FailedToLoad(const Row &row, int32_t status);
    static void Reach(Parent *parent, configstore::Object *object);

    const uint32_t propClass_;
    std::array<Row, kMaxRows> rows_;
    uint32_t rowNum_ = 0;
    const DVSProp2ConfigEntry *rest_; // rows for which there was no room, up to the end row
    std::array<Parent, kMaxParents> parents_{};
    uint32_t parentNum_ = 1;
    convert::KnownFilters filters_;
};

} // namespace dvs::config

#endif
