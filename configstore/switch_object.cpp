/* SPDX-License-Identifier: Apache-2.0 */
// The store object of a switch (switch_object.h), and the tables of what a rewrite clears out of it.

#include "configstore/switch_object.h"

#include <cstring>

#include "configstore/converters/common.h"
#include "configstore/log.h"
#include "configstore/maps/prop_frame.h"

// clang-format off
const char *UNUSED_PRIMITIVE_PROPS[] = {
    "name",
    "portset_name",
    "max_ports",
    "is_opaque",
    "switch_address",
    "uplink_port_keys",
    "uplink_port_names",
    "uplink_port_groupKeys",
    "ovl_enabled",
    nullptr
};
const char *UNUSED_SINGLETON_PROPS[] = {
    "settings",
    "resource_management",
    "product",
    "data",
    nullptr
};
const char *UNUSED_NON_SINGLETON_PROPS[] = {
    "ports",
    "uplink_ports",
    "hypnic_ports",
    "vtep_ports",
    "health_checks",
    nullptr
};
// clang-format on

namespace dvs::config {
namespace {

bool Failed(int32_t status) {
    return status && status != configstore::NOT_FOUND;
}

int32_t DeleteInstances(configstore::Object *object, const char *list) {
    convert::Filter filter;
    const int32_t status = filter.Create(list);
    return status ? status : configstore::DeleteSubObjectInstances(object, filter.get());
}

// What is not there need not be cleared.
int32_t ClearObsolete(configstore::Object *object) {
    for (const char **name = UNUSED_PRIMITIVE_PROPS; *name; ++name) {
        const int32_t status = configstore::RemoveValue(object, *name);
        if (Failed(status)) return status;
    }
    for (const char **name = UNUSED_SINGLETON_PROPS; *name; ++name) {
        const int32_t status = configstore::DeleteSubObject(object, *name, "");
        if (Failed(status)) return status;
    }
    for (const char **name = UNUSED_NON_SINGLETON_PROPS; *name; ++name) {
        const int32_t status = DeleteInstances(object, *name);
        if (Failed(status)) return status;
    }
    return 0;
}

} // namespace

int32_t StoreHandle::Open() {
    const int32_t status = configstore::GetStore(&store_);
    if (status == 0 && store_) return 0;
    Messages().Error("Get store failed\n");
    return status ? status : kFailed;
}

int32_t RootObjects::ListCurrent(configstore::Store *store, const configstore::FilterSpec *filter) {
    return configstore::GetInstances(store, filter, &objects_, &count_);
}

int32_t RootObjects::ListDesired(configstore::Store *store) {
    return configstore::GetDesiredUserConfigInstances(store, kKey, kGroup, kComponent, &objects_, &count_);
}

uint32_t SwitchClassOf(const char *className) {
    if (std::strcmp(className, "vswitch") == 0) return 1;
    if (std::strcmp(className, "cswitch") == 0) return 2;
    return 0;
}

int32_t FetchForRewrite(configstore::Store *store, const char *switchId, RootObject *object) {
    const int64_t start = dvsConfigStoreNowMs();
    const int32_t found = configstore::Get(store, kKey, kGroup, kComponent, switchId, object->out());
    int32_t created = 0;
    if (found == configstore::NOT_FOUND)
        created = configstore::CreateObject(kKey, kGroup, kComponent, switchId, "{}", object->out());
    dvsConfigStoreTimeMs += dvsConfigStoreNowMs() - start;

    if (Failed(found) || created) Messages().Error("Get/Create dvs_switch:%s failed\n", switchId);
    if (Failed(found)) return found; // an object that cannot be read must not be overwritten
    if (created) return kFailed;
    return found == 0 ? ClearObsolete(object->get()) : 0;
}

int32_t SaveIdentity(configstore::Object *object, DVSwitch *sw) {
    if (const int32_t status = configstore::SetValueStr(object, "name", DVS_SwitchName(sw))) return status;
    return configstore::SetValueStr(object, "uuid", DVS_SwitchId(sw));
}

int32_t SaveMaxPorts(configstore::Object *object, DVSwitch *sw) {
    return configstore::SetValueInt(object, "max_ports", static_cast<int32_t>(DVS_GetMaxPorts(sw)));
}

} // namespace dvs::config
