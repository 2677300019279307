/* SPDX-License-Identifier: Apache-2.0 */
// The switch table: adds, removes and finds switches, gives access to their fields, and holds the table's
// lock. Uses the record (switch_record.h), the port table to remove a switch's ports, and the host for the
// port limit.

#include "dvsstate/switch_table.h"

#include <algorithm>
#include <atomic>
#include <cstring>
#include <iterator>

#include "dvsstate/message.h"
#include "dvsstate/names.h"
#include "dvsstate/owned_list.h"
#include "dvsstate/port_table.h"
#include "dvsstate/switch_record.h"
#include "dvsstate/uuid_text.h"
#include "platform/kit.h"
#include "platform/runtime.h"

uint32_t uwMaxNumActivePortsSystemWide = 0;

namespace dvs::state {

std::array<DVSwitch *, kSwitchNum> dvsSwitchTable{};

namespace {

constexpr char kLockName[] = "dvsstate";
constexpr uint32_t kLockRank = 0xfeffffff;
constexpr char kKitSignature[] = "dvsstate";
constexpr uint32_t kKitVersion = 21;

/// Created once, on first use, by the host's runtime, which makes concurrent creation safe.
constinit MXUserRecLock *g_lock = nullptr;

struct SwitchClass {
    std::string_view name;
    uint32_t flags;
};

// Classes without a limit of their own; every other class has no flags.
constexpr SwitchClass kClasses[] = {
    // name            flags
    {"ovlvswitch", kUnlimitedClass | kOverlayClass},
    {"etherswitch", kUnlimitedClass},
    {"stub-vswitch", kUnlimitedClass},
    {"cswitch", kUnlimitedClass},
    {"vswitch", kUnlimitedClass},
};

struct VersionRange {
    uint32_t first, last;
};

constexpr VersionRange kVersions[] = {{4, 12}, {100, 100}, {107, 112}};

bool IsSupported(uint32_t version) {
    return std::ranges::any_of(kVersions, [version](const VersionRange &range) {
        return version >= range.first && version <= range.last;
    });
}

/// Copies the text into a field of `size` bytes: truncated, NUL-terminated, padded with zeros.
void CopyText(char *field, std::size_t size, std::string_view text) {
    const std::size_t length = std::min(text.size(), size - 1);
    std::memcpy(field, text.data(), length);
    std::memset(field + length, 0, size - length);
}

/// Finds a free slot and fills it. The table is unchanged on failure.
HYP_ReturnStatus InsertSwitch(const char *switchId, std::string_view className, uint32_t classFlags,
                              uint32_t maxPorts, uint32_t version) {
    const StateLock lock;
    if (FindSlot(switchId) != dvsSwitchTable.end()) return HYP_EXISTS;
    const auto slot = std::ranges::find(dvsSwitchTable, nullptr);
    if (slot == dvsSwitchTable.end()) return HYP_LIMIT_EXCEEDED;
    DVSwitch *sw = nullptr;
    const HYP_ReturnStatus status = NewSwitch(uwMaxNumActivePortsSystemWide, &sw);
    if (status != HYP_OK) return status;
    CopyText(sw->switchId, sizeof sw->switchId, switchId);
    CopyText(sw->className, sizeof sw->className, className);
    sw->classFlags = classFlags;
    sw->maxPorts = sw->newMaxPorts = maxPorts;
    sw->version = version;
    *slot = sw;
    return HYP_OK;
}

} // namespace

HYP_ReturnStatus ReadHostLimit(const char *switchId) {
    HYP_ReturnStatus status = KIT_CheckSig(kKitSignature, kKitVersion);
    if (status != HYP_OK) {
        Message(kError, "DVSState_SwitchAdd %s, KIT signature check failed. Error: %s\n", switchId,
                Text(status));
        return status;
    }
    status = KIT_Get(KIT_NODE_net_maxPortsSystemWide, nullptr, &uwMaxNumActivePortsSystemWide,
                     sizeof uwMaxNumActivePortsSystemWide);
    if (status != HYP_OK) {
        Message(kError, "DVSState_SwitchAdd %s, failed to get max ports systemwide. Error: %s\n", switchId,
                Text(status));
    }
    return status;
}

uint32_t ClassFlags(std::string_view className) {
    const auto *row = std::ranges::find(kClasses, className, &SwitchClass::name);
    return row == std::end(kClasses) ? 0 : row->flags;
}

HYP_ReturnStatus DVSStateSwitchAdd(const char *switchId, std::string_view className, uint32_t maxPorts,
                                   uint32_t version) {
    if (uwMaxNumActivePortsSystemWide == 0) {
        const HYP_ReturnStatus status = ReadHostLimit(switchId);
        if (status != HYP_OK) return status;
    }
    if (std::strlen(switchId) >= kSwitchIdSize) {
        Message(kError, "DVSState_SwitchAdd %s, id length too long\n", switchId);
        return HYP_BAD_PARAM;
    }
    const uint32_t classFlags = ClassFlags(className);
    if (classFlags != 0) {
        maxPorts = uwMaxNumActivePortsSystemWide;
    } else if (uwMaxNumActivePortsSystemWide - numPortsInUseHostWide < maxPorts) {
        Message(kError, "DVSState_SwitchAdd %s, failed with maxPorts exceed %d.\n", switchId,
                static_cast<int>(maxPorts));
        return HYP_LIMIT_EXCEEDED;
    }
    Message(kTrace, "DVSState_SwitchAdd %s, %.*s, %d\n", switchId, static_cast<int>(className.size()),
            className.data(), static_cast<int>(maxPorts));
    const HYP_ReturnStatus status = InsertSwitch(switchId, className, classFlags, maxPorts, version);
    if (status != HYP_OK)
        Message(kError, "DVSState_SwitchAdd failed DVS:%s Error: %s\n", switchId, Text(status));
    return status;
}

HYP_ReturnStatus DVSStateSwitchRemove(const char *switchId) {
    Message(kTrace, "DVSState_SwitchRemove %s\n", switchId);
    const auto slot = FindSlot(switchId);
    if (slot == dvsSwitchTable.end()) {
        Message(kError, "DVSState_SwitchRemove DVSID %s, statue %s\n", switchId, Text(HYP_NOT_FOUND));
        return HYP_NOT_FOUND;
    }
    // Known quirk, kept: if a port cannot be removed, the switch stays and the result is success.
    if (!RemoveAllPorts(*slot)) return HYP_OK;
    FreeSwitch(*slot);
    *slot = nullptr;
    return HYP_OK;
}

std::array<DVSwitch *, kSwitchNum>::iterator FindSlot(std::string_view switchId) {
    return std::ranges::find_if(dvsSwitchTable,
                                [switchId](const DVSwitch *sw) { return sw && switchId == sw->switchId; });
}

} // namespace dvs::state

using namespace dvs::state;

MXUserRecLock *DVSwitchHandleLock(void) {
    MXUserRecLock *lock = std::atomic_ref(g_lock).load(std::memory_order_acquire);
    if (!lock) lock = MXUser_CreateSingletonRecLockInt(&g_lock, kLockName, kLockRank);
    if (lock) MXUser_AcquireRecLock(lock);
    return lock;
}

void DVSwitchHandleUnlock(MXUserRecLock *lock) {
    if (lock) MXUser_ReleaseRecLock(lock);
}

HYP_ReturnStatus DVSState_SwitchAdd(const char *switchId, const char *className, uint32_t maxPorts,
                                    uint32_t version) {
    return DVSStateSwitchAdd(switchId, className, maxPorts, version);
}

HYP_ReturnStatus DVSState_SwitchRemove(const char *switchId) {
    const StateLock lock;
    return DVSStateSwitchRemove(switchId);
}

DVSwitch *DVSState_SwitchFind(const char *switchId) {
    const StateLock lock;
    const auto slot = FindSlot(switchId);
    return slot == dvsSwitchTable.end() ? nullptr : *slot;
}

DVSwitch *DVSState_SwitchFindByUUID(const uint8_t uuid[16]) {
    return DVSState_SwitchFind(UuidText(uuid).data());
}

DVSwitch *DVSState_SwitchFindByAlias(const char *alias) {
    const StateLock lock;
    const auto slot = std::ranges::find_if(dvsSwitchTable, [alias](const DVSwitch *sw) {
        DVSDataEntry *entry = sw ? FindEntry(sw->globalPropList, kSwitchAlias) : nullptr;
        return entry && TextOf(entry) == alias;
    });
    return slot == dvsSwitchTable.end() ? nullptr : *slot;
}

void DVSState_SwitchForEach(DVSSwitchForEachFn callback, void *arg) {
    const StateLock lock;
    // Read each slot when its turn comes: a callback may remove switches.
    for (DVSwitch *const &slot : dvsSwitchTable) {
        if (slot && callback(slot, arg)) return;
    }
}

HYP_ReturnStatus DVSState_SwitchSetVersion(const char *switchId, uint32_t version) {
    if (!IsSupported(version)) {
        Message(kError, "DVS version not support %u\n", version);
        return HYP_NOT_SUPPORTED;
    }
    DVSwitch *sw = DVSState_SwitchFind(switchId);
    if (!sw) return HYP_NOT_FOUND;
    Message(kError, "Set DVS %s version from %u to %u\n", switchId, sw->version, version);
    sw->version = version;
    return HYP_OK;
}

const char *DVS_SwitchId(DVSwitch *sw) {
    return sw->switchId;
}

const char *DVS_ClassName(DVSwitch *sw) {
    return sw->className;
}

const char *DVS_SwitchName(DVSwitch *sw) {
    DVSDataEntry *entry = nullptr;
    if (DVSState_GlobalPropLookup(sw->switchId, kSwitchAlias, &entry) != HYP_OK) return kUnknown;
    void *data = nullptr;
    DVSData_Data(entry, &data);
    return static_cast<const char *>(data);
}

void DVS_SetClassName(DVSwitch *sw, const char *className) {
    CopyText(sw->className, sizeof sw->className, className);
}

uint32_t DVS_Version(DVSwitch *sw) {
    return sw->version;
}

uint32_t DVS_GetMaxPorts(DVSwitch *sw) {
    return sw->maxPorts;
}

uint32_t DVS_GetNewMaxPorts(DVSwitch *sw) {
    return sw->newMaxPorts;
}

uint32_t DVS_UpdateMaxPorts(DVSwitch *sw) {
    return sw->maxPorts = sw->newMaxPorts;
}
