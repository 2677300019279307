/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_MAPS_PROP_FRAME_H
#define CONFIGSTORE_MAPS_PROP_FRAME_H

// The frame around every converter: finds a property's row in the mapping tables (dvs/configstore.h), walks
// the row's path through the store's objects and runs the converter that the table of
// configstore/converters/table.h holds under the row's type. Called by the save and the load above it; the
// converters use its two sub-object functions.
//
// Statuses are the store's (platform/configstore.h) or -1 for a failure of the library's own. Nothing here
// locks. SaveProp and LoadProps read the process-wide values below at their entry; whole saves and loads set
// the first two for each switch. Callers run one save or load at a time.

#include <cstdint>
#include <type_traits>

#include "dvs/configstore.h"
#include "dvs/data.h"
#include "platform/configstore.h"

namespace dvs::config {

/// The library's own failure: a value the store cannot express, an unknown row, or no memory.
inline constexpr int32_t kFailed = -1;

} // namespace dvs::config

/// The class of the switch at hand: 1 for "vswitch", 2 for "cswitch", 0 for every other class name.
extern uint32_t dvsSwitchClass;

/// Whether the switch at hand has a version above 99, hence the wide port records of mirror sessions. Set for
/// saves and for loads.
extern bool dvsWidePortRecords;

/// Milliseconds spent in converter and store calls. SaveProp adds to it, the save resets and reports it.
extern int64_t dvsConfigStoreTimeMs;

/// The monotonic clock in milliseconds, as the accumulator counts them.
int64_t dvsConfigStoreNowMs();

/// The class whose table serves `propClass`.
[[nodiscard]] inline uint32_t KnownClass(uint32_t propClass) {
    const bool known = propClass == DVS_PROP_CLASS_HOST || propClass == DVS_PROP_CLASS_PORT;
    return known ? propClass : uint32_t{DVS_PROP_CLASS_GLOBAL};
}

/// How many names of a row's path count. The tables are writable: the depth may have been set to anything.
[[nodiscard]] inline uint32_t DepthOf(const DVSProp2ConfigEntry &row) {
    constexpr uint32_t kMaxDepth = std::extent_v<decltype(DVSProp2ConfigEntry::path)>;
    return row.depth < kMaxDepth ? row.depth : kMaxDepth;
}
/// The last of them.
[[nodiscard]] inline const char *LeafOf(const DVSProp2ConfigEntry &row, uint32_t depth) {
    return row.path[depth > 1 ? depth - 1 : 0];
}

/// Reaches the sub-object `name` of `parent`, creating it where it is absent and `create` is set.
/// instanceId  null or empty for a singleton, else the id within the list of instances.
/// out         null unless the result is 0; lent by `parent`'s root object.
/// Returns 0, 6 for absent (and not created), or the failing store call's status after a message.
[[nodiscard]] int32_t GetOrCreateSubObject(bool create, configstore::Object *parent, const char *name,
                                           const char *instanceId, configstore::Object **out);

/// Walks path[0] to path[depth - 2] down from `object`; *out is the object that holds the leaf path[depth -
/// 1], which is `object` itself for a depth of 0 or 1. Returns the first status that is not 0.
[[nodiscard]] int32_t GetSubObjectByPath(const char (*path)[128], uint32_t depth, configstore::Object *object,
                                         configstore::Object **out, bool create);

/// Writes one property into `object`: the switch's (classes 0 and 1) or the port's (class 2).
/// value, len  the property's bytes as the list keeps them; value may be null when len is 0.
/// propClass   DVS_PROP_CLASS_*; any other value counts as global.
/// propType    the property's own type word; only the DEFAULT rows look at it.
/// Returns 0, the first failing store call's status (what was written before it stays), or -1 for a value
/// that the store cannot express, an unknown key or an unknown converter type.
[[nodiscard]] int32_t SaveProp(configstore::Object *object, const char *key, const void *value, uint32_t len,
                               uint32_t propClass, uint32_t propType);

/// Rebuilds every mapped property of `object` into a fresh list and stores that list, serialized, in
/// `outList` as one property `propsName` of type 16. `trafficResources`, used for class 2 only and possibly
/// null, is the switch's "resource_management" object; a class of neither host nor port counts as global. On
/// any failure `outList` is as it was.
[[nodiscard]] int32_t LoadProps(const char *propsName, configstore::Object *object, DVSData *outList,
                                uint32_t propClass, uint32_t serializeFlags,
                                configstore::Object *trafficResources);

#endif
