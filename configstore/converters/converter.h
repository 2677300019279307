/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_CONVERTER_H
#define CONFIGSTORE_CONVERTERS_CONVERTER_H

// What a converter is: the pair of functions that carries one kind of setting between its binary value in a
// property list and typed fields of the config store. The frame (configstore/maps/prop_frame.h) walks the
// row's path, then calls the pair that the converter table holds under the row's type. A converter gets
// everything it needs from its arguments: the process-wide values of the family are read once, where an
// exported or stated function is entered.

#include <cstdint>
#include <span>
#include <string_view>

#include "configstore/log.h"
#include "dvs/data.h"
#include "platform/configstore.h"

namespace dvs::data {
class GrowingImage;
}

namespace dvs::convert {

class KnownFilters;

/// A switch's version, and whether its object has the overlay flag that the version was read with.
struct SwitchVersion {
    uint32_t number;
    bool hasOverlayFlag;
};

/// What holds for all properties of a conversion: the save or load of one switch, or one call of SaveProp or
/// LoadProps.
struct Context {
    uint32_t switchClass = 0;              // 1 "vswitch", 2 "cswitch", 0 every other class name
    bool wideRecords = false;              // port records of mirror sessions are the wide ones
    const SwitchVersion *loaded = nullptr; // of the switch being loaded; null where no whole load is under way
    KnownFilters *filters = nullptr;       // of this load; null in a save
    config::Messages messages = {};
};

struct SaveArgs {
    const Context &context;
    configstore::Object *root;      // the object the frame was given: the switch's, or the port's for class 2
    configstore::Object *parent;    // where the path walk ended: the object that holds the leaf
    const char *leaf;               // last name of the row's path
    std::span<const uint8_t> value; // the property's bytes; shorter than the fields read means -1, nothing read
    const char *key;                // the property's key
    uint32_t propClass;             // DVS_PROP_CLASS_*
    uint32_t propType;              // the property's own type word
};

struct LoadArgs {
    const Context &context;
    configstore::Object *root;     // as above
    configstore::Object *parent;   // as above, reached without creating anything
    dvs::data::GrowingImage *list; // the list under construction: the image's innermost buffer
    const char *leaf;
    std::string_view key; // the row's key; a NUL follows
    uint32_t propType;    // the row's load property type
    uint32_t propClass;   // DVS_PROP_CLASS_*: whose list is being built
};

// 0, a store status (at the first store call that fails; what was written stays), or -1 for a value that the
// store cannot express.
using SaveFn = int32_t (*)(const SaveArgs &args);

// 0 with at most one Store of args.key, 0 with none when the leaf is absent or the row is not for this class
// of switch, or a status that ends the load. A status from Store is passed on as it is.
using LoadFn = int32_t (*)(const LoadArgs &args);

struct Converter {
    SaveFn save;
    LoadFn load;
};

} // namespace dvs::convert

#endif
