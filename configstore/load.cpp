/* SPDX-License-Identifier: Apache-2.0 */
// Loads switches from the config store into one state buffer, which is written front to back. The property
// frame rebuilds the properties of each store object.

#include "configstore/load.h"

#include <cstring>

#include "configstore/converters/common.h"
#include "configstore/converters/switch_version.h"
#include "configstore/log.h"
#include "configstore/maps/prop_frame.h"
#include "configstore/maps/prop_loader.h"
#include "configstore/switch_object.h"
#include "dvs/configstore.h"
#include "dvsdata/growing_image.h"
#include "dvsstate/versions.h"
#include "platform/status_text.h"

namespace {

using namespace dvs::config;
using dvs::convert::Instances;
using dvs::convert::StoreText;
using dvs::convert::StoreTexts;
using dvs::data::GrowingImage;

constexpr uint32_t kStateType = 0x10;        // of every entry of a state and of a switch
constexpr std::size_t kUsualPortSize = 2304; // in a state; for the block's first size only
constexpr uint32_t kStateVersion = 9;        // what a whole state is serialized with

// What is read of a switch object before its properties.
struct SwitchFields {
    StoreText uuid;
    StoreText forwardingClass;
    int32_t maxPorts = 0;
    dvs::convert::SwitchVersion version = {};
};

int32_t ReadFields(const Messages &messages, configstore::Object *object, SwitchFields *fields) {
    const auto reported = [&](const char *format, int32_t status) {
        if (status) messages.Error(format, status);
        return status;
    };
    if (const int32_t status = reported("Failed to get uuid, rc: %d\n", fields->uuid.Read(object, "uuid")))
        return status;
    messages.Trace("Loading switch:%s\n", fields->uuid.get());
    configstore::Object *product = nullptr;
    if (const int32_t status = reported("Failed to get product obj, rc: %d\n",
                                        configstore::GetSubObject(object, "product", "", &product)))
        return status;
    if (const int32_t status = reported("Failed to get forwarding_class, rc: %d\n",
                                        fields->forwardingClass.Read(product, "forwarding_class")))
        return status;
    return reported("Failed to get max_ports, rc: %d\n",
                    configstore::GetValueInt(object, "max_ports", &fields->maxPorts));
}

// The three entries that every switch list begins with.
HYP_ReturnStatus AppendFields(GrowingImage *image, const SwitchFields &fields) {
    const auto append = [&](const char *name, const void *data, std::size_t size) {
        return image->Append(name, {static_cast<const uint8_t *>(data), size}, kStateType);
    };
    const char *className = fields.forwardingClass.get();
    const uint32_t version = fields.version.number;
    HYP_ReturnStatus status = append("switchVersion", &version, sizeof version);
    if (status == HYP_OK) status = append("className", className, std::strlen(className) + 1);
    if (status == HYP_OK) status = append("maxPorts", &fields.maxPorts, sizeof fields.maxPorts);
    return status;
}

bool IsUplink(const char *key, const StoreTexts &uplinkKeys) {
    const auto uplinks = uplinkKeys.items();
    // The function only reads; C's const does not reach through two pointers.
    return StringExistInArray(key, const_cast<const char **>(uplinks.data()),
                              static_cast<uint32_t>(uplinks.size()));
}

constexpr std::size_t kPrefetchDistance = 2; // in ports

// A hint without effect where handles are no addresses.
void Prefetch(const configstore::Object *object) {
    constexpr std::size_t kLine = 64;
    const auto *const at = reinterpret_cast<const char *>(object);
    __builtin_prefetch(at);
    __builtin_prefetch(at + kLine);
}

// One switch being loaded into an entry of the image.
class SwitchLoad {
public:
    SwitchLoad(configstore::Object *object, GrowingImage *image) : object_(object), image_(image) {}
    [[nodiscard]] int32_t Run();

private:
    [[nodiscard]] int32_t LoadProperties();
    [[nodiscard]] int32_t LoadList(const char *name, uint32_t propClass);
    [[nodiscard]] int32_t LoadPorts();
    [[nodiscard]] int32_t Failed(uint32_t cause) const;

    configstore::Object *const object_;
    GrowingImage *const image_;
    SwitchFields fields_;
    dvs::convert::KnownFilters filters_;
    dvs::convert::Context context_ = {.filters = &filters_};
};

int32_t SwitchLoad::Failed(uint32_t cause) const {
    context_.messages.Trace("Load dvs: %s from configstore failed, error: %s\n", fields_.uuid.get(),
                            HYP_ReturnStatusToString(cause));
    return kFailed;
}

int32_t SwitchLoad::Run() {
    if (const int32_t status = ReadFields(context_.messages, object_, &fields_)) return status;
    if (const HYP_ReturnStatus status = image_->BeginNested(fields_.uuid.get(), kStateType))
        return Failed(status);
    dvsSwitchClass = context_.switchClass = SwitchClassOf(fields_.forwardingClass.get());
    if (const int32_t status =
            dvs::convert::ReadSwitchVersion(context_.messages, object_, &fields_.version))
        return Failed(static_cast<uint32_t>(status));
    const uint32_t version = fields_.version.number;
    dvsWidePortRecords = context_.wideRecords = dvs::state::HasWidePortRecords(version);
    context_.loaded = &fields_.version;
    if (const HYP_ReturnStatus status = AppendFields(image_, fields_)) return Failed(status);
    if (const int32_t status = LoadProperties()) return status;
    const HYP_ReturnStatus status = image_->EndNested(version, GrowingImage::Adding::kAppend);
    return status == HYP_OK ? 0 : Failed(status);
}

int32_t SwitchLoad::LoadProperties() {
    int32_t status = LoadList("globalPropList", DVS_PROP_CLASS_GLOBAL);
    if (!status) status = LoadList("hostPropList", DVS_PROP_CLASS_HOST);
    return status ? status : LoadPorts();
}

int32_t SwitchLoad::LoadList(const char *name, uint32_t propClass) {
    PropLoader loader(context_, propClass);
    return loader.LoadInto(image_, name, object_, fields_.version.number, nullptr);
}

// The store's "not found" ends the walk over the ports without failing the switch, wherever it comes from:
// that of an absent list cannot be told from that of a port that lacks something.
int32_t SwitchLoad::LoadPorts() {
    Instances ports;
    int32_t status = ports.Read(object_, "ports");
    if (status && status != configstore::NOT_FOUND) return status;
    configstore::Object *resources = nullptr;
    status = configstore::GetSubObject(object_, "resource_management", "", &resources);
    if (status && status != configstore::NOT_FOUND) return status;
    if (status) resources = nullptr;
    StoreTexts uplinkKeys;
    status = uplinkKeys.Read(object_, "uplink_port_keys");
    const auto items = ports.items();
    image_->Expect(items.size() * kUsualPortSize);
    PropLoader loader(context_, DVS_PROP_CLASS_PORT);
    for (std::size_t i = 0; i < items.size(); ++i) {
        if (i + kPrefetchDistance < items.size()) Prefetch(items[i + kPrefetchDistance]);
        StoreText key;
        status = key.Read(items[i], "key");
        if (status) break;
        auto *const shared = IsUplink(key.get(), uplinkKeys) ? resources : nullptr;
        status = loader.LoadInto(image_, key.get(), items[i], fields_.version.number, shared);
        if (status) break;
    }
    return status == configstore::NOT_FOUND ? 0 : status;
}

// The result of a load that a switch has ended: that of reading its "uuid" once more, which is 0 as a rule.
// Callers test the buffer as well as the result, and rely on this.
int32_t EndedBy(configstore::Object *object) {
    StoreText uuid;
    const int32_t status = uuid.Read(object, "uuid");
    if (status == 0)
        Messages().Error("Failed to load buf of switch: %s from configstore\n", uuid.get());
    return status;
}

int32_t LoadAll(const RootObjects &objects, void **out, uint32_t *outLen) {
    GrowingImage image;
    if (image.BeginBuffer() != HYP_OK) return kFailed;
    for (auto *object : objects.items()) {
        if (SwitchLoad(object, &image).Run()) return EndedBy(object);
    }
    const HYP_ReturnStatus status = image.EndBuffer(kStateVersion);
    if (status == HYP_OK) image.HandOver(out, outLen);
    return static_cast<int32_t>(status);
}

int32_t CopyPortsetName(configstore::Object *from, configstore::Object *to) {
    StoreText name;
    return name.Read(from, "portset_name") ? 0 : configstore::SetValueStr(to, "portset_name", name.get());
}

// The port set's name is this host's, so only the current layer has it. The two lists are matched by
// position.
int32_t CompleteDesired(const RootObjects &desired, const RootObjects &current) {
    if (desired.items().size() != current.items().size()) return kFailed;
    for (std::size_t i = 0; i < desired.items().size(); ++i) {
        if (const int32_t status = CopyPortsetName(current.items()[i], desired.items()[i])) return status;
    }
    return 0;
}

} // namespace

int32_t dvs::config::LoadState(configstore::Store *store, bool desired, void **out, uint32_t *outLen) {
    SwitchFilter filter;
    if (const int32_t status = filter.Create()) return status;
    RootObjects desiredObjects;
    RootObjects currentObjects;
    if (desired) {
        const int32_t status = desiredObjects.ListDesired(store);
        if (status) Messages().Error("Failed to get dvs desired user config instances\n");
        if (status) return status;
    }
    if (const int32_t status = currentObjects.ListCurrent(store, filter.get())) {
        Messages().Error("Failed to get dvs instances\n");
        return status;
    }
    if (!desired) return LoadAll(currentObjects, out, outLen);
    const int32_t status = CompleteDesired(desiredObjects, currentObjects);
    return status ? status : LoadAll(desiredObjects, out, outLen);
}

int32_t DVSState_LoadFromConfigStoreAsBuf(void **out, uint32_t *outLen, bool desired) {
    StoreHandle store;
    if (const int32_t status = store.Open()) return status;
    return LoadState(store.get(), desired, out, outLen);
}

bool StringExistInArray(const char *s, const char **array, uint32_t n) {
    if (!s || !array) return false;
    for (uint32_t i = 0; i < n; ++i) {
        if (array[i] && std::strcmp(s, array[i]) == 0) return true;
    }
    return false;
}
