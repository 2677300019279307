/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_SWITCH_OBJECT_H
#define CONFIGSTORE_SWITCH_OBJECT_H

// The store object of a switch for the save, the load and the upgrade: its address, how it is fetched for
// rewriting, and owners for stores and objects. converters/common.h has the smaller owners.

#include <cstdint>
#include <span>

#include "configstore/maps/prop_frame.h"
#include "dvs/state.h"
#include "platform/configstore.h"

namespace dvs::config {

// Address of every switch object; the instance id is the switch's id.
inline constexpr const char *kKey = "switches";
inline constexpr const char *kGroup = "network_vds";
inline constexpr const char *kComponent = "qel";

/// Layer that saves write: the current configuration.
inline constexpr const char *kSource = "EXTERNAL";

/// Host property with the name of the switch's port set.
inline constexpr const char *kPortsetKey = "com.orbeno.common.host.portset";

class StoreHandle {
public:
    StoreHandle() = default;
    ~StoreHandle() {
        if (store_) configstore::DestroyStore(store_);
    }
    StoreHandle(const StoreHandle &) = delete;
    StoreHandle &operator=(const StoreHandle &) = delete;
    /// 0 with a store, or a status other than 0 after the family's message; -1 for success without a store.
    [[nodiscard]] int32_t Open();
    [[nodiscard]] configstore::Store *get() const { return store_; }
    /// Leaves the store open.
    void Keep() { store_ = nullptr; }

private:
    configstore::Store *store_ = nullptr;
};

/// One root object.
class RootObject {
public:
    RootObject() = default;
    ~RootObject() {
        if (object_) configstore::DestroyObject(object_);
    }
    RootObject(const RootObject &) = delete;
    RootObject &operator=(const RootObject &) = delete;
    [[nodiscard]] configstore::Object *get() const { return object_; }
    /// Where a store call puts the object; only while there is none.
    [[nodiscard]] configstore::Object **out() { return &object_; }

private:
    configstore::Object *object_ = nullptr;
};

/// Root objects as the store lists them.
class RootObjects {
public:
    RootObjects() = default;
    ~RootObjects() {
        if (objects_) configstore::DestroyObjects(objects_, count_);
    }
    RootObjects(const RootObjects &) = delete;
    RootObjects &operator=(const RootObjects &) = delete;
    [[nodiscard]] int32_t ListCurrent(configstore::Store *store, const configstore::FilterSpec *filter);
    [[nodiscard]] int32_t ListDesired(configstore::Store *store);
    [[nodiscard]] std::span<configstore::Object *const> items() const {
        if (!objects_ || count_ < 1) return {};
        return {objects_, static_cast<std::size_t>(count_)};
    }

private:
    configstore::Object **objects_ = nullptr;
    int32_t count_ = 0;
};

/// A filter spec on all switch objects.
class SwitchFilter {
public:
    SwitchFilter() = default;
    ~SwitchFilter() {
        if (spec_) configstore::DestroyFilterSpecObject(spec_);
    }
    SwitchFilter(const SwitchFilter &) = delete;
    SwitchFilter &operator=(const SwitchFilter &) = delete;
    [[nodiscard]] int32_t Create() {
        return configstore::CreateFilterSpecObject(kKey, kGroup, kComponent, "", &spec_);
    }
    [[nodiscard]] const configstore::FilterSpec *get() const { return spec_; }

private:
    configstore::FilterSpec *spec_ = nullptr;
};

/// The class code that the converters go by: 1 for "vswitch", 2 for "cswitch", else 0.
[[nodiscard]] uint32_t SwitchClassOf(const char *className);

/// Fetches the switch's object, emptied of what this library writes, or makes a new one. On failure a message
/// says so; -1 when it cannot be created, else the status of the call that failed.
[[nodiscard]] int32_t FetchForRewrite(configstore::Store *store, const char *switchId, RootObject *object);

/// Writes "name" and "uuid".
[[nodiscard]] int32_t SaveIdentity(configstore::Object *object, DVSwitch *sw);

/// Writes "max_ports".
[[nodiscard]] int32_t SaveMaxPorts(configstore::Object *object, DVSwitch *sw);

} // namespace dvs::config

#endif
