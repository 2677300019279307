/* SPDX-License-Identifier: Apache-2.0 */
// Upgrade from an older host's state file: copies the identity of its switches into the store, or into a plain
// list.

#include "configstore/upgrade.h"

#include <cstdlib>
#include <memory>
#include <new>

#include <syslog.h>

#include "configstore/converters/common.h"
#include "configstore/log.h"
#include "configstore/scratch_table.h"
#include "configstore/switch_object.h"
#include "dvs/file.h"
#include "dvs/state.h"

namespace {

using namespace dvs::config;

constexpr const char *kStateFile = "/etc/orbeno/dvsdata.db";

// A state file's contents. The block can begin before them, for their alignment.
class FileBuffer {
public:
    FileBuffer() = default;
    ~FileBuffer() {
        if (contents_) std::free(static_cast<uint8_t *>(contents_) - offset_);
    }
    FileBuffer(const FileBuffer &) = delete;
    FileBuffer &operator=(const FileBuffer &) = delete;
    [[nodiscard]] HYP_ReturnStatus Read(const char *path) {
        void *contents = nullptr;
        const HYP_ReturnStatus status = DVSFile_ReadClassical(path, &contents, &size_, &offset_);
        if (status == HYP_OK) contents_ = contents;
        return status;
    }
    void LoadIntoTable() const { (void)DVSState_ConfigDeserialize(contents_, size_); }
    void LeaveAllocated() { contents_ = nullptr; }

private:
    void *contents_ = nullptr;
    uint32_t size_ = 0;
    uint32_t offset_ = 0;
};

struct UpgradeContext {
    int32_t status;
    configstore::Store *store;
};

// Writes the object only where there is a port set's name to write.
int32_t SaveBasics(configstore::Store *store, DVSwitch *sw, configstore::Object *object) {
    if (const int32_t status = SaveMaxPorts(object, sw)) return status;
    Messages().Error("SaveDVS: %s\n", DVS_SwitchName(sw)); // prints from level 0 on, unlike the save's
    if (const int32_t status = SaveIdentity(object, sw)) return status;
    void *value = nullptr;
    uint32_t len = 0;
    if (DVSState_HostPropRead(sw, kPortsetKey, &value, &len) != HYP_OK) return 0;
    const dvs::convert::Text name({static_cast<const uint8_t *>(value), len});
    if (!name.get()) return kFailed;
    if (const int32_t status = configstore::SetValueStr(object, "portset_name", name.get())) return status;
    return configstore::Set(store, object, kSource);
}

// The walk's callback: true ends it.
bool SaveBasicSwitch(DVSwitch *sw, void *arg) {
    auto *context = static_cast<UpgradeContext *>(arg);
    RootObject object;
    context->status = FetchForRewrite(context->store, DVS_SwitchId(sw), &object);
    if (!object.get()) return true;
    if (context->status == 0) context->status = SaveBasics(context->store, sw, object.get());
    if (context->status) Messages().Error("Failed to save dvs: %s to configstore\n", DVS_SwitchId(sw));
    return context->status != 0;
}

int32_t RunTransaction(configstore::Store *store) {
    const std::unique_ptr<UpgradeContext> context(new (std::nothrow) UpgradeContext{0, store});
    int32_t status = kFailed;
    if (!context) {
        Messages().Error("Failed to alloc memory for DVS\n");
    } else {
        DVSState_SwitchForEach(SaveBasicSwitch, context.get());
        status = context->status;
        if (status) Messages().Error("Failed to save dvs to configstore\n");
    }
    if (status == 0) status = configstore::CommitTransaction(store);
    if (status)
        (void)configstore::CancelTransaction(store); // the failure being reported is the one before it
    return status;
}

// Loads the file into the table. False, after a message to syslog, for a file that is empty or cannot be read:
// then there is nothing to carry over.
bool LoadFile(const char *stateFile, FileBuffer *file) {
    const HYP_ReturnStatus read = file->Read(stateFile);
    (void)DVSState_ConfigReset();
    if (read == HYP_FILE_EMPTY)
        LogSystem(LOG_DEBUG, "File is empty, skip load");
    else if (read != HYP_OK)
        LogSystem(LOG_INFO, "Failed to read DVS config from sticky-bit file.");
    else
        file->LoadIntoTable();
    return read == HYP_OK;
}

bool ListSwitch(DVSwitch *sw, void *arg) {
    auto *info = static_cast<DvsBasicInfo *>(arg);
    void *portset = nullptr;
    uint32_t len = 0;
    if (DVSState_HostPropRead(sw, kPortsetKey, &portset, &len) != HYP_OK) portset = nullptr;
    info->entries[info->count++] = {DVS_SwitchId(sw), DVS_SwitchName(sw), static_cast<const char *>(portset)};
    return false;
}

} // namespace

int32_t dvs::config::UpgradeFromFile(configstore::Store *store, const char *stateFile) {
    FileBuffer file;
    ScratchTable table;
    if (!LoadFile(stateFile, &file)) return 0;
    if (const int32_t status = configstore::BeginTransaction(store)) return status;
    return RunTransaction(store);
}

int32_t RetrieveUpgradeInfoFrom(const char *stateFile) {
    FileBuffer file;
    StoreHandle store;
    ScratchTable table;
    if (!LoadFile(stateFile, &file)) return 0;
    // As in the save, these two paths keep the lock and the loaded table.
    if (store.Open()) {
        table.Keep();
        return kFailed;
    }
    if (const int32_t status = configstore::BeginTransaction(store.get())) {
        table.Keep();
        return status;
    }
    return RunTransaction(store.get());
}

DvsBasicInfo BasicInfoFrom(const char *stateFile) {
    DvsBasicInfo info = {};
    FileBuffer file;
    if (file.Read(stateFile) != HYP_OK) return info;
    (void)DVSState_ConfigReset();
    file.LoadIntoTable();
    DVSState_SwitchForEach(ListSwitch, &info);
    file.LeaveAllocated(); // stated; nothing points into it
    return info;
}

int32_t DVSState_RetrieveDVSUpgradeInfo(void) {
    return RetrieveUpgradeInfoFrom(kStateFile);
}

DvsBasicInfo GetDvsBasicInfoFromFileHyp(void) {
    return BasicInfoFrom(kStateFile);
}
