/* SPDX-License-Identifier: Apache-2.0 */
// Saves switches to the config store: a state buffer is loaded into the switch table, and every switch of it
// becomes one store object, all in one transaction. Uses the property frame for each property and
// switch_object.h for the object around them.

#include "configstore/save.h"

#include <memory>
#include <new>

#include <syslog.h>

#include "configstore/converters/common.h"
#include "configstore/log.h"
#include "configstore/maps/prop_frame.h"
#include "configstore/maps/prop_saver.h"
#include "configstore/scratch_table.h"
#include "configstore/switch_object.h"
#include "dvs/configstore.h"
#include "dvs/state.h"
#include "dvsstate/versions.h"

namespace {

using namespace dvs::config;

// What the walk over the switches carries along. On the heap, because running out of memory here has a message
// and a result of its own.
struct SaveContext {
    int32_t status;
    configstore::Store *store;
    Messages messages;
};

// One list of properties of one class into one object.
int32_t SaveList(PropSaver *saver, DVSData *list, configstore::Object *object, uint32_t propClass,
                 const auto &trace) {
    int32_t status = 0;
    saver->Begin(object, propClass);
    DVSDataEntry *entry = nullptr;
    while (status == 0 && list && DVSData_Next(list, entry, &entry) == HYP_OK) {
        void *value = nullptr;
        const uint32_t len = DVSData_Data(entry, &value);
        const char *key = DVSData_Name(entry);
        trace(key);
        status = saver->Save(key, {static_cast<const uint8_t *>(value), len}, DVSData_PropType(entry));
    }
    saver->End();
    return status;
}

struct PortRun {
    configstore::Object *switchObject;
    PropSaver *saver;
    int32_t status;
};

bool SavePort(DVSPort *port, void *arg) {
    auto *run = static_cast<PortRun *>(arg);
    configstore::Object *object = nullptr;
    run->status = GetOrCreateSubObject(true, run->switchObject, "ports", DVS_PortId(port), &object);
    if (run->status == 0)
        run->status = SaveList(run->saver, port->portData, object, DVS_PROP_CLASS_PORT, [](const char *) {});
    return run->status != 0;
}

int32_t SaveForwardingClass(configstore::Object *object, DVSwitch *sw) {
    configstore::Object *product = nullptr;
    if (const int32_t status = GetOrCreateSubObject(true, object, "product", "", &product)) return status;
    return configstore::SetValueStr(product, "forwarding_class", DVS_ClassName(sw));
}

int32_t FillObject(configstore::Object *object, DVSwitch *sw, const dvs::convert::Context &context) {
    const Messages &messages = context.messages;
    if (const int32_t status = SaveForwardingClass(object, sw)) return status;
    if (const int32_t status = SaveMaxPorts(object, sw)) return status;
    messages.Trace("SaveDVS: %s\n", DVS_SwitchName(sw));
    if (const int32_t status = SaveIdentity(object, sw)) return status;
    PropSaver saver(context, PropSaver::For::kManyProperties);
    const auto traceGlobal = [&](const char *key) {
        if (messages.Traces()) messages.Trace("SaveGlobalProp: %s\n", key);
    };
    const auto traceHost = [&](const char *key) {
        if (messages.Traces()) messages.Trace("SaveHostProp: %s\n", key);
    };
    if (const int32_t status =
            SaveList(&saver, sw->globalPropList, object, DVS_PROP_CLASS_GLOBAL, traceGlobal))
        return status;
    if (const int32_t status = SaveList(&saver, sw->hostPropList, object, DVS_PROP_CLASS_HOST, traceHost))
        return status;
    PortRun ports = {object, &saver, 0};
    DVSState_PortForEach(sw, SavePort, &ports);
    return ports.status;
}

int32_t WriteObject(configstore::Store *store, configstore::Object *object) {
    const int64_t start = dvsConfigStoreNowMs();
    const int32_t status = configstore::Set(store, object, kSource);
    dvsConfigStoreTimeMs += dvsConfigStoreNowMs() - start;
    return status;
}

// The walk's callback: true ends it.
bool SaveSwitch(DVSwitch *sw, void *arg) {
    auto *context = static_cast<SaveContext *>(arg);
    dvsWidePortRecords = dvs::state::HasWidePortRecords(DVS_Version(sw));
    dvsSwitchClass = SwitchClassOf(DVS_ClassName(sw));
    RootObject object;
    context->status = FetchForRewrite(context->store, DVS_SwitchId(sw), &object);
    if (!object.get()) return true;
    const dvs::convert::Context conversion = {
        .switchClass = dvsSwitchClass, .wideRecords = dvsWidePortRecords, .messages = context->messages};
    if (context->status == 0) context->status = FillObject(object.get(), sw, conversion);
    if (context->status == 0) context->status = WriteObject(context->store, object.get());
    if (context->status) context->messages.Error("Failed to save dvs: %s to configstore\n", DVS_SwitchId(sw));
    return context->status != 0;
}

// The objects that the store holds before the save: all of them, or the one of `switchId`.
class Existing {
public:
    [[nodiscard]] int32_t Collect(configstore::Store *store, const char *switchId) {
        return switchId ? CollectOne(store, switchId) : CollectAll(store);
    }
    // Deletes those whose switch the table lacks.
    [[nodiscard]] int32_t DeleteStale(configstore::Store *store) const {
        if (one_.get()) return DeleteIfStale(store, one_.get());
        for (auto *object : all_.items()) {
            if (const int32_t status = DeleteIfStale(store, object)) return status;
        }
        return 0;
    }

private:
    int32_t CollectOne(configstore::Store *store, const char *switchId) {
        const int32_t status = configstore::Get(store, kKey, kGroup, kComponent, switchId, one_.out());
        return status == configstore::NOT_FOUND ? 0 : status;
    }
    int32_t CollectAll(configstore::Store *store) {
        if (const int32_t status = filter_.Create()) return status;
        const int64_t start = dvsConfigStoreNowMs();
        const int32_t status = all_.ListCurrent(store, filter_.get());
        LogSystem(LOG_DEBUG, "DVSState_SaveBufToConfigStore_ByInstance GetInstances time: %lldms",
                  static_cast<long long>(dvsConfigStoreNowMs() - start));
        return status;
    }
    static int32_t DeleteIfStale(configstore::Store *store, configstore::Object *object) {
        dvs::convert::StoreText uuid;
        if (const int32_t status = uuid.Read(object, "uuid")) return status;
        if (DVSState_SwitchFind(uuid.get())) return 0;
        return configstore::Delete(store, kKey, kGroup, kComponent, uuid.get());
    }

    RootObjects all_;
    RootObject one_;
    SwitchFilter filter_;
};

int32_t SaveSwitches(configstore::Store *store, const char *switchId) {
    const Messages messages;
    const std::unique_ptr<SaveContext> context(new (std::nothrow) SaveContext{0, store, messages});
    if (!context) {
        messages.Error("Failed to alloc memory for DVSUplinkPorts\n");
        return kFailed;
    }
    if (!switchId)
        DVSState_SwitchForEach(SaveSwitch, context.get());
    else if (DVSwitch *sw = DVSState_SwitchFind(switchId))
        (void)SaveSwitch(sw, context.get());
    if (context->status) messages.Error("Failed to save dvs to configstore\n");
    return context->status;
}

void ReportTime(const char *format) {
    LogSystem(LOG_DEBUG, format, static_cast<long long>(dvsConfigStoreTimeMs));
    dvsConfigStoreTimeMs = 0;
}

// Everything between a begun transaction and its end, which it brings about.
int32_t RunTransaction(configstore::Store *store, const char *switchId, Existing *existing) {
    Messages().Trace("Ready to save dvs list\n");
    int32_t status = existing->Collect(store, switchId);
    if (status == 0) status = SaveSwitches(store, switchId);
    if (status == 0) status = existing->DeleteStale(store);
    if (status == 0) {
        status = configstore::CommitTransaction(store);
        ReportTime("End DVSState_SaveBufToConfigStore_ByInstance, configStore time: %lldms");
    }
    if (status) {
        (void)configstore::CancelTransaction(store); // the failure being reported is the one before it
        ReportTime("End DVSState_SaveBufToConfigStore_ByInstance with error, configStore time: %lldms");
    }
    return status;
}

// The first step of every save. A status other than 0 refuses the buffer.
int32_t LoadIntoTable(ScratchTable *table, const void *buf, uint32_t len, const char *switchId,
                      Unloadable policy) {
    const HYP_ReturnStatus loaded = table->Load(buf, len);
    if (loaded != HYP_OK && policy == Unloadable::IsRefused) return static_cast<int32_t>(loaded);
    LogSystem(LOG_DEBUG, "Start DVSState_SaveBufToConfigStore_ByInstance, swId:[%s]",
              switchId ? switchId : "");
    dvsConfigStoreTimeMs = 0;
    return 0;
}

int32_t SaveBuffer(configstore::Store *store, const void *buf, uint32_t len, const char *switchId,
                   Unloadable policy) {
    Existing existing; // declared before the table: its objects are released after the unlock
    ScratchTable table;
    if (const int32_t status = LoadIntoTable(&table, buf, len, switchId, policy)) return status;
    if (const int32_t status = configstore::BeginTransaction(store)) return status;
    return RunTransaction(store, switchId, &existing);
}

} // namespace

int32_t dvs::config::SaveState(configstore::Store *store, const void *buf, uint32_t len,
                               const char *switchId) {
    return SaveBuffer(store, buf, len, switchId, Unloadable::CountsAsEmpty);
}

int32_t dvs::config::SaveStateChecked(configstore::Store *store, const void *buf, uint32_t len,
                                      const char *switchId) {
    const HYP_ReturnStatus status = VerifyState(buf, len);
    if (status != HYP_OK) return static_cast<int32_t>(status);
    return SaveBuffer(store, buf, len, switchId, Unloadable::IsRefused);
}

int32_t dvs::config::SaveToHostStore(const void *buf, uint32_t len, const char *switchId, Unloadable policy) {
    StoreHandle store;
    Existing existing;
    ScratchTable table;
    if (const int32_t status = LoadIntoTable(&table, buf, len, switchId, policy)) return status;
    if (store.Open()) {
        table.Keep();
        return kFailed;
    }
    if (const int32_t status = configstore::BeginTransaction(store.get())) {
        table.Keep();
        store.Keep();
        return status;
    }
    return RunTransaction(store.get(), switchId, &existing);
}

int32_t DVSState_SaveBufToConfigStore_ByInstance(const void *buf, uint32_t len, const char *switchId) {
    return SaveToHostStore(buf, len, switchId, Unloadable::CountsAsEmpty);
}

int32_t DVSState_SaveBufToConfigStore(const void *buf, uint32_t len) {
    return DVSState_SaveBufToConfigStore_ByInstance(buf, len, nullptr);
}
