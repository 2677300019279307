/* SPDX-License-Identifier: Apache-2.0 */
// Loading switches from the config store into one state buffer. Exported (dvs/configstore.h); stands on the
// property frame, which rebuilds the properties of one store object, and on switch_object.h.

#include "configstore/load.h"

#include <array>
#include <bit>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <functional>
#include <optional>
#include <string_view>
#include <vector>

#include "configstore/converters/common.h"
#include "configstore/converters/switch_version.h"
#include "configstore/log.h"
#include "configstore/maps/prop_frame.h"
#include "configstore/maps/prop_loader.h"
#include "configstore/switch_object.h"
#include "dvs/configstore.h"
#include "dvsdata/emit.h"
#include "dvsdata/growing_image.h"
#include "dvsdata/list_internal.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/versions.h"
#include "platform/status_text.h"

namespace {

using namespace dvs::config;
using dvs::convert::Instances;
using dvs::convert::StoreText;
using dvs::convert::StoreTexts;
using dvs::data::GrowingImage;
using dvs::state::NewList;
using dvs::state::OwnedList;

constexpr uint32_t kStateType = 0x10;        // of every entry of a state and of a switch
constexpr std::size_t kUsualPortSize = 2304; // in a state; for the block's first size only
constexpr uint32_t kStateVersion = 9;        // what a whole state is serialized with

// What is read of a switch object before its properties.
struct SwitchFields {
    StoreText uuid;
    StoreText forwardingClass;
    int32_t maxPorts = 0;
    uint32_t version = 0;
};

int32_t Reported(const char *format, int32_t status) {
    if (status) LogError(format, status);
    return status;
}

int32_t ReadFields(configstore::Object *object, SwitchFields *fields) {
    if (const int32_t status = Reported("Failed to get uuid, rc: %d\n", fields->uuid.Read(object, "uuid")))
        return status;
    LogTrace("Loading switch:%s\n", fields->uuid.get());
    configstore::Object *product = nullptr;
    if (const int32_t status = Reported("Failed to get product obj, rc: %d\n",
                                        configstore::GetSubObject(object, "product", "", &product)))
        return status;
    if (const int32_t status = Reported("Failed to get forwarding_class, rc: %d\n",
                                        fields->forwardingClass.Read(product, "forwarding_class")))
        return status;
    return Reported("Failed to get max_ports, rc: %d\n",
                    configstore::GetValueInt(object, "max_ports", &fields->maxPorts));
}

int32_t FailedSwitch(const SwitchFields &fields, uint32_t cause) {
    LogTrace("Load dvs: %s from configstore failed, error: %s\n", fields.uuid.get(),
             HYP_ReturnStatusToString(cause));
    return kFailed;
}

// What a state, or a switch of it, is built as: one image, written once. Or lists in lists, which know what
// to do with entries of one name, and report their work.
struct Target {
    DVSData *list; // or
    GrowingImage *image;

    [[nodiscard]] HYP_ReturnStatus Append(const char *name, const void *data, std::size_t size) const {
        const auto len = static_cast<uint32_t>(size);
        if (!image) return DVSData_Append(list, name, data, len, kStateType);
        image->Append(name, {static_cast<const uint8_t *>(data), len}, kStateType);
        return HYP_OK;
    }
    [[nodiscard]] int32_t AppendProps(const char *name, configstore::Object *object, uint32_t propClass,
                                      uint32_t version) const {
        return image ? PropLoader(propClass).LoadInto(image, name, object, version, nullptr)
                     : LoadProps(name, object, list, propClass, version, nullptr);
    }
    /// `loader` is one of ports.
    [[nodiscard]] int32_t AppendPort(const char *key, configstore::Object *port, uint32_t version,
                                     configstore::Object *resources, PropLoader *loader) const {
        return image ? loader->LoadInto(image, key, port, version, resources)
                     : LoadProps(key, port, list, DVS_PROP_CLASS_PORT, version, resources);
    }
};

// The entries that a switch has beside its ports.
constexpr const char *kVersionEntry = "switchVersion";
constexpr const char *kClassEntry = "className";
constexpr const char *kMaxPortsEntry = "maxPorts";
constexpr const char *kGlobalEntry = "globalPropList";
constexpr const char *kHostEntry = "hostPropList";
constexpr std::array kOwnEntries = {kVersionEntry, kClassEntry, kMaxPortsEntry, kGlobalEntry, kHostEntry};

// The three entries that every switch list begins with.
HYP_ReturnStatus AppendFields(const Target &target, const SwitchFields &fields) {
    const char *className = fields.forwardingClass.get();
    HYP_ReturnStatus status = target.Append(kVersionEntry, &fields.version, sizeof fields.version);
    if (status == HYP_OK) status = target.Append(kClassEntry, className, std::strlen(className) + 1);
    if (status == HYP_OK) status = target.Append(kMaxPortsEntry, &fields.maxPorts, sizeof fields.maxPorts);
    return status;
}

// Whether all entries of a switch have names of their own, as far as hashes tell; a list would replace an
// entry by its namesake.
class EntryNames {
public:
    explicit EntryNames(std::size_t ports) noexcept {
        try {
            hashes_.reserve(ports + kOwnEntries.size());
            seen_.resize(std::bit_ceil(hashes_.capacity() * 2)); // 0 is nothing
        } catch (const std::exception &) {
            isSound_ = false;
        }
        for (const char *name : kOwnEntries)
            Add(name);
    }
    void Add(std::string_view name) {
        isSound_ = isSound_ && name.size() <= dvs::data::kMaxNameLen && hashes_.size() < hashes_.capacity();
        if (isSound_) hashes_.push_back(std::hash<std::string_view>()(name));
    }
    // One after the other at the end: in between, the ports would push the table out of the cache.
    [[nodiscard]] bool AreUnique() {
        for (std::size_t i = 0; isSound_ && i < hashes_.size(); ++i)
            isSound_ = Insert(hashes_[i]);
        return isSound_;
    }

private:
    // Ids that were chosen to fall together must not take long: the lists' way is one for them, too.
    static constexpr std::size_t kMostSteps = 64;

    bool Insert(std::size_t hash) {
        const auto rest = static_cast<uint32_t>(hash >> 32 | 1);
        const std::size_t mask = seen_.size() - 1;
        std::size_t at = hash & mask;
        for (std::size_t steps = 0; steps < kMostSteps; ++steps, at = (at + 1) & mask) {
            if (seen_[at] == rest) return false;
            if (seen_[at] != 0) continue;
            seen_[at] = rest;
            return true;
        }
        return false;
    }

    std::vector<std::size_t> hashes_;
    std::vector<uint32_t> seen_; // the halves of them that their places do not tell
    bool isSound_ = true;
};

bool IsUplink(const char *key, const StoreTexts &uplinkKeys) {
    const auto uplinks = uplinkKeys.items();
    // The function only reads; C's const does not reach through two pointers.
    return StringExistInArray(key, const_cast<const char **>(uplinks.data()),
                              static_cast<uint32_t>(uplinks.size()));
}

constexpr std::size_t kAhead = 2; // ports that are announced before it is their turn

// Has the processor fetch what a handle leads to. Only a hint, and nothing where handles are no addresses.
void Announce(const configstore::Object *object) {
    constexpr std::size_t kLine = 64;
    const auto *const at = reinterpret_cast<const char *>(object);
    __builtin_prefetch(at);
    __builtin_prefetch(at + kLine);
}

// The store's "not found" ends the walk over the ports without failing the switch, wherever it comes from:
// that of an absent list cannot be told from that of a port that lacks something.
int32_t LoadPorts(configstore::Object *object, const Target &target, uint32_t version) {
    Instances ports;
    int32_t status = ports.Read(object, "ports");
    if (status && status != configstore::NOT_FOUND) return status;
    configstore::Object *resources = nullptr;
    status = configstore::GetSubObject(object, "resource_management", "", &resources);
    if (status && status != configstore::NOT_FOUND) return status;
    if (status) resources = nullptr;
    StoreTexts uplinkKeys;
    status = uplinkKeys.Read(object, "uplink_port_keys");
    EntryNames names(target.image ? ports.items().size() : 0);
    if (target.image) target.image->Expect(ports.items().size() * kUsualPortSize);
    PropLoader loader(DVS_PROP_CLASS_PORT);
    const auto items = ports.items();
    for (std::size_t i = 0; i < items.size(); ++i) {
        auto *const port = items[i];
        if (i + kAhead < items.size()) Announce(items[i + kAhead]);
        StoreText key;
        status = key.Read(port, "key");
        if (status == 0 && target.image) names.Add(key.get());
        if (status == 0) {
            auto *const shared = IsUplink(key.get(), uplinkKeys) ? resources : nullptr;
            status = target.AppendPort(key.get(), port, version, shared, &loader);
        }
        if (!status) continue;
        // An image cannot take back what it has of the port that ended the walk; a list never gets it.
        if (target.image) target.image->GiveUp();
        break;
    }
    if (target.image && !names.AreUnique()) target.image->GiveUp();
    return status == configstore::NOT_FOUND ? 0 : status;
}

int32_t LoadProperties(configstore::Object *object, const Target &target, uint32_t version) {
    int32_t status = target.AppendProps(kGlobalEntry, object, DVS_PROP_CLASS_GLOBAL, version);
    if (!status) status = target.AppendProps(kHostEntry, object, DVS_PROP_CLASS_HOST, version);
    return status ? status : LoadPorts(object, target, version);
}

// Names the switch being loaded to the converters for as long as it is.
class LoadedSwitch {
public:
    explicit LoadedSwitch(configstore::Object *object) { dvsLoadedSwitch = object; }
    ~LoadedSwitch() { dvsLoadedSwitch = nullptr; }
    LoadedSwitch(const LoadedSwitch &) = delete;
    LoadedSwitch &operator=(const LoadedSwitch &) = delete;
};

int32_t LoadSwitch(configstore::Object *object, const Target &state) {
    SwitchFields fields;
    if (const int32_t status = ReadFields(object, &fields)) return status;
    OwnedList list;
    if (state.image) {
        state.image->BeginEntry(fields.uuid.get(), kStateType);
        state.image->BeginBuffer();
    } else if (const HYP_ReturnStatus status = NewList(list)) {
        return FailedSwitch(fields, status);
    }
    const Target target = {list.get(), state.image};
    const LoadedSwitch loaded(object);
    dvsSwitchClass = SwitchClassOf(fields.forwardingClass.get());
    if (const int32_t status = dvs::convert::ReadSwitchVersion(object, &fields.version))
        return FailedSwitch(fields, static_cast<uint32_t>(status));
    dvsWidePortRecords = dvs::state::HasWidePortRecords(fields.version);
    if (const HYP_ReturnStatus status = AppendFields(target, fields)) return FailedSwitch(fields, status);
    if (const int32_t status = LoadProperties(object, target, fields.version)) return status;
    if (state.image) {
        dvs::data::EmitOldVersion(fields.version);
        state.image->EndBuffer();
        state.image->EndEntry();
        return 0;
    }

    void *buf = nullptr;
    uint32_t len = 0;
    HYP_ReturnStatus status = DVSData_Serialize(list.get(), &buf, &len, fields.version);
    if (status == HYP_OK) status = DVSData_Append(state.list, fields.uuid.get(), buf, len, kStateType);
    std::free(buf);
    return status == HYP_OK ? 0 : FailedSwitch(fields, status);
}

// The result of a load that a switch has ended: that of reading its "uuid" once more, which is 0 as a rule.
// Callers test the buffer as well as the result, and rely on this.
int32_t EndedBy(configstore::Object *object) {
    StoreText uuid;
    const int32_t status = uuid.Read(object, "uuid");
    if (status == 0) LogError("Failed to load buf of switch: %s from configstore\n", uuid.get());
    return status;
}

// The load's result; nothing where the image has given up on switches that can all be rebuilt.
std::optional<int32_t> LoadAsImage(const RootObjects &objects, void **out, uint32_t *outLen) {
    GrowingImage image;
    image.BeginBuffer();
    for (auto *object : objects.items()) {
        if (LoadSwitch(object, {nullptr, &image})) return EndedBy(object);
    }
    image.EndBuffer();
    if (image.GaveUp()) return std::nullopt;
    image.HandOver(out, outLen);
    return 0;
}

enum class Saying { kAll, kSaid }; // whether the same has been gone through before, and reported

int32_t LoadAsLists(const RootObjects &objects, Saying saying, void **out, uint32_t *outLen) {
    OwnedList state;
    if (NewList(state) != HYP_OK) return kFailed;
    for (auto *object : objects.items()) {
        std::optional<AlreadyReported> quiet;
        if (saying == Saying::kSaid) quiet.emplace();
        const int32_t failed = LoadSwitch(object, {state.get(), nullptr});
        quiet.reset();
        if (failed) return EndedBy(object);
    }
    void *buf = nullptr;
    uint32_t len = 0;
    const HYP_ReturnStatus status = DVSData_Serialize(state.get(), &buf, &len, kStateVersion);
    if (status == HYP_OK) {
        *out = buf;
        *outLen = len;
    }
    return static_cast<int32_t>(status);
}

int32_t LoadAll(const RootObjects &objects, void **out, uint32_t *outLen) {
    // Whoever follows the work in the log is shown the lists.
    if (Tracing() || dvs::data::Emits(dvs::data::kTrace))
        return LoadAsLists(objects, Saying::kAll, out, outLen);
    const auto status = LoadAsImage(objects, out, outLen);
    return status ? *status : LoadAsLists(objects, Saying::kSaid, out, outLen);
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
        if (status) LogError("Failed to get dvs desired user config instances\n");
        if (status) return status;
    }
    if (const int32_t status = currentObjects.ListCurrent(store, filter.get())) {
        LogError("Failed to get dvs instances\n");
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
