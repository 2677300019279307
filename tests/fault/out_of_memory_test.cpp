/* SPDX-License-Identifier: Apache-2.0 */
// Fails each allocation of every exported operation of property lists, switch state and state file in turn.
// The operation must return a documented status, leak nothing, hold no lock and change nothing it must not
// change. The table has one row per operation; a test compares the rows with the list of exported names.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <set>
#include <string>
#include <vector>

#include <unistd.h>

#include "dvs/data.h"
#include "dvs/file.h"
#include "dvs/log.h"
#include "dvs/state.h"
#include "fault/sweep.h"
#include "platform/embedded/host_limits.h"

namespace {

using fault::Child;

constexpr uint32_t kFieldType = 0x10;
constexpr uint32_t kPropType = 0x20;
constexpr uint32_t kVersion = 9;
constexpr const char *kSwitch = "00 11 22 33 44 55 66 77-88 99 aa bb cc dd ee ff";
constexpr uint8_t kUuid[16] = {0x00, 0x11, 0x22, 0x33, 0x44, 0x55, 0x66, 0x77,
                               0x88, 0x99, 0xaa, 0xbb, 0xcc, 0xdd, 0xee, 0xff};
constexpr const char *kAlias = "com.orbeno.common.alias";
constexpr const char *kPortAlias = "com.orbeno.common.port.alias";
constexpr const char *kKind = "com.orbeno.common.port.volatile.type";
constexpr const char *kNoPersist = "com.orbeno.common.volatile.nopersist";

void *HeapAlloc(uint64_t size) {
    return std::malloc(size);
}
void HeapFree(void *block) {
    std::free(block);
}

struct Bytes {
    void *data = nullptr;
    uint32_t len = 0;
    void Drop() {
        std::free(data);
        *this = {};
    }
};

// The data that the operations use: created before a round's fault is armed, released after the round.
struct World {
    DVSData *list = nullptr; // long enough to have a name index
    DVSwitch *sw = nullptr;
    DVSPort *port = nullptr;
    Bytes listBytes, stateBytes, switchBytes, portBytes;
    HYP_ReturnStatus status = HYP_OK;
    DVSwitch *parked[32] = {};
    char removed[32][64] = {};
};
World g_world;
std::string g_path;

void Must(bool holds) {
    if (!holds) _exit(4);
}

DVSData *MakeList(uint32_t kind = DVS_PORT_ACTIVE) {
    DVSData *list = nullptr;
    Must(DVSData_Alloc(&list, HeapAlloc, HeapFree) == HYP_OK);
    if (kind != DVS_PORT_ACTIVE) Must(DVSData_Append(list, kKind, &kind, sizeof kind, kFieldType) == HYP_OK);
    Must(DVSData_Append(list, kPortAlias, "port", 5, kPropType) == HYP_OK);
    return list;
}

Bytes ListBytes(DVSData *list) {
    Bytes bytes;
    Must(DVSData_Serialize(list, &bytes.data, &bytes.len, kVersion) == HYP_OK);
    return bytes;
}

void Prepare(Child &) {
    DVSHost_SetMaxPorts(64);
    World &w = g_world;
    w = {};
    Must(DVSState_SwitchAdd(kSwitch, "vswitch", 0, kVersion) == HYP_OK);
    w.sw = DVSState_SwitchFind(kSwitch);
    Must(DVSState_GlobalPropSet(kSwitch, kAlias, "switch", 7, kPropType) == HYP_OK);
    Must(DVSState_HostPropSet(kSwitch, "host", "value", 6, kPropType) == HYP_OK);
    Must(DVSState_PortAdd(kSwitch, "active", MakeList()) == HYP_OK);
    w.port = DVSState_PortFind(kSwitch, "active");
    for (const uint32_t kind : {DVS_PORT_SHADOW, DVS_PORT_ZOMBIE, DVS_PORT_LOCAL_CACHE}) {
        DVSData *data = MakeList(kind);
        Bytes bytes = ListBytes(data);
        Must(DVSState_PortAddDeserialize(w.sw, "other", bytes.data, bytes.len) == HYP_OK);
        bytes.Drop();
        DVSData_Free(data);
    }
    Must(DVSState_PortSerialize(w.port, &w.portBytes.data, &w.portBytes.len) == HYP_OK);
    Must(DVSState_SwitchSerialize(w.sw, &w.switchBytes.data, &w.switchBytes.len) == HYP_OK);
    Must(DVSState_ConfigSerialize(&w.stateBytes.data, &w.stateBytes.len) == HYP_OK);
    Must(DVSData_Alloc(&w.list, HeapAlloc, HeapFree) == HYP_OK);
    for (uint32_t i = 0; i < 40; i++) {
        const std::string name = "property." + std::to_string(i);
        Must(DVSData_Append(w.list, name.c_str(), &i, sizeof i, i % 2 ? kPropType : kFieldType) == HYP_OK);
    }
    w.listBytes = ListBytes(w.list);
    Must(DVSFile_Write(g_path.c_str(), w.stateBytes.data, w.stateBytes.len) == HYP_OK);
}

bool Same(const Bytes &a, const Bytes &b) {
    return a.len == b.len && std::memcmp(a.data, b.data, a.len) == 0;
}

/// Notes the changes that a failed operation made.
void NoteChanges(Child &child) {
    Bytes list = ListBytes(g_world.list), state;
    Must(DVSState_ConfigSerialize(&state.data, &state.len) == HYP_OK);
    if (!Same(list, g_world.listBytes)) child.Note("list changed ");
    if (!Same(state, g_world.stateBytes)) child.Note(state.len == 16 ? "table emptied " : "state changed ");
    list.Drop();
    state.Drop();
}

void Conclude(Child &child) {
    if (g_world.status != HYP_OK) NoteChanges(child);
    child.CheckLock([] { DVSwitchHandleUnlock(DVSwitchHandleLock()); }, [] {});
    if (DVSState_ConfigReset() != HYP_OK) child.Note("reset failed ");
    DVSData_Free(g_world.list);
    for (Bytes *bytes : {&g_world.listBytes, &g_world.stateBytes, &g_world.switchBytes, &g_world.portBytes})
        bytes->Drop();
}

bool OnData(const char *, const void *, uint32_t, uint32_t, void *) {
    return false;
}
bool OnEntry(DVSDataEntry *, void *) {
    return false;
}
bool OnPort(DVSPort *, void *) {
    return false;
}
bool OnSwitch(DVSwitch *, void *) {
    return false;
}

/// Runs an operation that returns a buffer, and frees the buffer.
template <typename Work> HYP_ReturnStatus WithOut(Work work) {
    void *buf = nullptr;
    uint32_t len = 0;
    const HYP_ReturnStatus status = work(&buf, &len);
    std::free(buf);
    return status;
}

template <typename Work> HYP_ReturnStatus WithNewList(Work work) {
    DVSData *list = nullptr;
    const HYP_ReturnStatus status = work(&list);
    if (status == HYP_OK) DVSData_Free(list);
    return status;
}

/// Adds a port with an existing list; the caller keeps the list when the add fails.
HYP_ReturnStatus AddPort(Child &child, decltype(&DVSState_PortAdd) add) {
    DVSData *data = nullptr;
    child.Unfaulted([&data] { data = MakeList(); });
    const HYP_ReturnStatus status = add(kSwitch, "new", data);
    if (status != HYP_OK) DVSData_Free(data);
    return status;
}

HYP_ReturnStatus Read(decltype(&DVSFile_Read) read) {
    void *buf = nullptr;
    uint32_t len = 0, alignOffset = 0;
    const HYP_ReturnStatus status = read(g_path.c_str(), &buf, &len, &alignOffset);
    if (status == HYP_OK) std::free(static_cast<char *>(buf) - alignOffset);
    return status;
}

struct Row {
    const char *name;
    HYP_ReturnStatus (*run)(Child &);
    std::vector<HYP_ReturnStatus> onFault = {}; // empty: the operation does not allocate
    const char *mayChange = "";                 // what a failed operation may change
};

#define DO(expression) [](Child &) -> HYP_ReturnStatus { return expression; }
#define CALL(expression) [](Child &) -> HYP_ReturnStatus { return (void)(expression), HYP_OK; }
#define STATE g_world.stateBytes.data, g_world.stateBytes.len

const std::vector<HYP_ReturnStatus> kNoMemory = {HYP_NO_MEMORY};
const std::vector<HYP_ReturnStatus> kExists = {HYP_EXISTS, HYP_NO_MEMORY};
// Failures of optional allocations are ignored: an index, the scan for stale files.
const std::vector<HYP_ReturnStatus> kFine = {HYP_OK};

// clang-format off
const std::vector<Row> kRows = {
    // property lists; for a value of another length, the old entry is removed first
    {"DVSData_Alloc", DO(WithNewList([](DVSData **l) { return DVSData_Alloc(l, HeapAlloc, HeapFree); })), kNoMemory},
    {"DVSData_Free", CALL((DVSData_Free(g_world.list), g_world.list = nullptr, DVSData_Free(g_world.list)))},
    {"DVSData_Append", DO(DVSData_Append(g_world.list, "new", "value", 6, kPropType)), kNoMemory},
    {"DVSData_Update", DO(DVSData_Update(g_world.list, "property.7", "longer value", 13, kPropType)), kNoMemory, "list changed "},
    {"DVSData_UpdateProp", DO(DVSData_UpdateProp(g_world.list, "property.7", "longer value", 13)), kNoMemory, "list changed "},
    {"DVSDataRemove", [](Child &) -> HYP_ReturnStatus { uint32_t type; return DVSDataRemove(g_world.list, "property.7", &type); }},
    {"DVSData_Remove", DO(DVSData_Remove(g_world.list, "property.8"))},
    {"DVSData_Lookup", [](Child &) -> HYP_ReturnStatus { DVSDataEntry *e; return DVSData_Lookup(g_world.list, "property.39", &e); }},
    {"DVSData_Next", [](Child &) -> HYP_ReturnStatus { DVSDataEntry *e; return DVSData_Next(g_world.list, nullptr, &e); }},
    {"DVSData_ForEach", CALL(DVSData_ForEach(g_world.list, OnData, nullptr))},
    {"DVSData_Name", CALL(DVSData_Name(g_world.list->head))},
    {"DVSData_PropType", CALL(DVSData_PropType(g_world.list->head))},
    {"DVSData_Data", [](Child &) -> HYP_ReturnStatus { void *d; return DVSData_Data(g_world.list->head, &d), HYP_OK; }},
    {"DVSData_IsSamePropType", CALL(DVSData_IsSamePropType(g_world.list->head, kPropType))},
    {"DVSData_FreeAssocData", CALL(DVSData_FreeAssocData(g_world.list, nullptr))},
    {"DVSData_GetMemFreeFn", [](Child &) -> HYP_ReturnStatus { DVSDataFreeFn f; return DVSData_GetMemFreeFn(g_world.list, &f), HYP_OK; }},
    {"DVSData_SerializedSize", CALL(DVSData_SerializedSize(g_world.list, kVersion))},
    {"DVSData_SerializedSizeExNamedProp", CALL(DVSData_SerializedSizeExNamedProp(g_world.list, kVersion, "property"))},
    {"DVSData_Serialize", DO(WithOut([](void **b, uint32_t *l) { return DVSData_Serialize(g_world.list, b, l, kVersion); })), kNoMemory},
    {"DVSData_SerializeExNamedProp", DO(WithOut([](void **b, uint32_t *l) { return DVSData_SerializeExNamedProp(g_world.list, b, l, kVersion, "property.1"); })), kNoMemory},
    {"DVSData_SerializeExTypeProp", DO(WithOut([](void **b, uint32_t *l) { return DVSData_SerializeExTypeProp(g_world.list, b, l, kFieldType); })), kNoMemory},
    {"DVSData_SerializeEntry", DO(WithOut([](void **b, uint32_t *l) { return DVSData_SerializeEntry(g_world.list, "property.7", b, l); })), kNoMemory},
    {"DVSData_DeserializeWithPropType", DO(WithNewList([](DVSData **l) { return DVSData_DeserializeWithPropType(l, STATE, HeapAlloc, HeapFree, kFieldType); })), kNoMemory},
    {"DVSData_Deserialize", DO(WithNewList([](DVSData **l) { return DVSData_Deserialize(l, g_world.listBytes.data, g_world.listBytes.len, HeapAlloc, HeapFree); })), kNoMemory},
    {"DVSData_DeserializeGetPropVal", [](Child &) -> HYP_ReturnStatus { uint32_t v; return DVSData_DeserializeGetPropVal(g_world.listBytes.data, g_world.listBytes.len, "property.9", &v, sizeof v); }},
    // the switch table
    {"DVSwitchHandleLock", CALL(DVSwitchHandleUnlock(DVSwitchHandleLock()))},
    {"DVSwitchHandleUnlock", CALL(DVSwitchHandleUnlock(nullptr))},
    {"DVSState_SwitchAdd", DO(DVSState_SwitchAdd("new", "vswitch", 0, kVersion)), kNoMemory},
    {"DVSState_SwitchRemove", DO(DVSState_SwitchRemove(kSwitch))},
    {"DVSState_SwitchFind", CALL(DVSState_SwitchFind(kSwitch))},
    {"DVSState_SwitchFindByUUID", CALL(DVSState_SwitchFindByUUID(kUuid))},
    {"DVSState_SwitchFindByAlias", CALL(DVSState_SwitchFindByAlias("switch"))},
    {"DVSState_SwitchForEach", CALL(DVSState_SwitchForEach(OnSwitch, nullptr))},
    {"DVSState_SwitchSetVersion", DO(DVSState_SwitchSetVersion(kSwitch, 10))},
    {"DVS_SwitchId", CALL(DVS_SwitchId(g_world.sw))},
    {"DVS_ClassName", CALL(DVS_ClassName(g_world.sw))},
    {"DVS_SwitchName", CALL(DVS_SwitchName(g_world.sw))},
    {"DVS_SetClassName", CALL(DVS_SetClassName(g_world.sw, "cswitch"))},
    {"DVS_Version", CALL(DVS_Version(g_world.sw))},
    {"DVS_GetMaxPorts", CALL(DVS_GetMaxPorts(g_world.sw))},
    {"DVS_GetNewMaxPorts", CALL(DVS_GetNewMaxPorts(g_world.sw))},
    {"DVS_UpdateMaxPorts", CALL(DVS_UpdateMaxPorts(g_world.sw))},
    // ports
    {"DVSState_PortAdd", [](Child &c) { return AddPort(c, DVSState_PortAdd); }, kNoMemory},
    {"DVSState_LocalCachePortAdd", [](Child &c) { return AddPort(c, DVSState_LocalCachePortAdd); }, kNoMemory},
    {"DVSState_PortAddShadow", DO(DVSState_PortAddShadow(kSwitch, "new", g_world.portBytes.data, g_world.portBytes.len)), kNoMemory},
    {"DVSState_PortRemove", DO(DVSState_PortRemove(kSwitch, "active"))},
    {"DVSState_PortRemoveShadow", DO(DVSState_PortRemoveShadow(kSwitch, "other"))},
    {"DVSState_PortRemoveZombie", DO(DVSState_PortRemoveZombie(kSwitch, "other"))},
    {"DVSState_LocalCachePortRemove", DO(DVSState_LocalCachePortRemove(kSwitch, "other"))},
    {"DVSState_FindPortByIDAndType", CALL(DVSState_FindPortByIDAndType(g_world.sw, "other", DVS_PORT_ZOMBIE))},
    {"DVSState_PortFindOnDVSwitch", CALL(DVSState_PortFindOnDVSwitch(g_world.sw, "active"))},
    {"DVSState_PortFind", CALL(DVSState_PortFind(kSwitch, "active"))},
    {"DVSState_PortFindShadow", CALL(DVSState_PortFindShadow(kSwitch, "other"))},
    {"DVSState_PortFindZombie", CALL(DVSState_PortFindZombie(kSwitch, "other"))},
    {"DVSState_LocalCachePortFind", CALL(DVSState_LocalCachePortFind(kSwitch, "other"))},
    {"DVSState_PortFindByUUID", CALL(DVSState_PortFindByUUID(kUuid, "active"))},
    {"DVSState_PortFindShadowByUUID", CALL(DVSState_PortFindShadowByUUID(kUuid, "other"))},
    {"DVSState_PortFindByAliasType", CALL(DVSState_PortFindByAliasType(g_world.sw, "port", DVS_PORT_SHADOW))},
    {"DVSState_PortFindByAliasOnDVS", CALL(DVSState_PortFindByAliasOnDVS(g_world.sw, "port"))},
    {"DVSState_PortFindByAlias", CALL(DVSState_PortFindByAlias("switch", "port"))},
    {"DVSState_PortFindShadowByAlias", CALL(DVSState_PortFindShadowByAlias("switch", "port"))},
    {"DVSState_PortForEach", CALL(DVSState_PortForEach(g_world.sw, OnPort, nullptr))},
    {"DVS_PortId", CALL(DVS_PortId(g_world.port))},
    {"DVS_PortAlias", CALL(DVS_PortAlias(g_world.port))},
    // properties
    {"DVSState_HostPropSet", DO(DVSState_HostPropSet(kSwitch, "host", "longer value", 13, kPropType)), kNoMemory, "state changed "},
    {"DVSState_HostPropClear", DO(DVSState_HostPropClear(kSwitch, "host"))},
    {"DVSState_HostPropLookup", [](Child &) -> HYP_ReturnStatus { DVSDataEntry *e; return DVSState_HostPropLookup(kSwitch, "host", &e); }},
    {"DVSState_HostPropRead", [](Child &) -> HYP_ReturnStatus { void *d; return DVSState_HostPropRead(g_world.sw, "host", &d, nullptr); }},
    {"DVSState_HostPropIsSet", CALL(DVSState_HostPropIsSet(g_world.sw, "host"))},
    {"DVSState_HostPropForEach", CALL(DVSState_HostPropForEach(g_world.sw, OnEntry, nullptr))},
    {"DVSState_GlobalPropSet", DO(DVSState_GlobalPropSet(kSwitch, "global", "value", 6, kPropType)), kNoMemory},
    {"DVSState_GlobalPropClear", DO(DVSState_GlobalPropClear(kSwitch, kAlias))},
    {"DVSState_GlobalPropLookup", [](Child &) -> HYP_ReturnStatus { DVSDataEntry *e; return DVSState_GlobalPropLookup(kSwitch, kAlias, &e); }},
    {"DVSState_GlobalPropRead", [](Child &) -> HYP_ReturnStatus { void *d; return DVSState_GlobalPropRead(g_world.sw, kAlias, &d, nullptr); }},
    {"DVSState_GlobalPropIsSet", CALL(DVSState_GlobalPropIsSet(g_world.sw, kAlias))},
    {"DVSState_GlobalPropForEach", CALL(DVSState_GlobalPropForEach(g_world.sw, OnEntry, nullptr))},
    {"DVSState_PortDataGet", [](Child &) -> HYP_ReturnStatus { void *d; uint32_t l; return DVSState_PortDataGet(g_world.port, kPortAlias, &d, &l); }},
    {"DVSState_PortDataSet", DO(DVSState_PortDataSet(g_world.port, kPortAlias, "longer value", 13, kPropType)), kNoMemory, "state changed "},
    {"DVSState_PortDataClear", DO(DVSState_PortDataClear(g_world.port, kPortAlias))},
    {"DVSState_PortDataRead", [](Child &) -> HYP_ReturnStatus { void *d; return DVSState_PortDataRead(g_world.port, kPortAlias, &d, nullptr); }},
    {"DVSState_PortDataForEach", CALL(DVSState_PortDataForEach(g_world.port, OnEntry, nullptr))},
    // serialization
    {"DVSState_PortSerialize", DO(WithOut([](void **b, uint32_t *l) { return DVSState_PortSerialize(g_world.port, b, l); })), kNoMemory},
    {"DVSState_SwitchSerialize", DO(WithOut([](void **b, uint32_t *l) { return DVSState_SwitchSerialize(g_world.sw, b, l); })), kNoMemory},
    {"DVSState_ConfigSerialize", DO(WithOut([](void **b, uint32_t *l) { return DVSState_ConfigSerialize(b, l); })), kExists},
    {"DVSState_PortAddDeserialize", DO(DVSState_PortAddDeserialize(g_world.sw, "new", g_world.portBytes.data, g_world.portBytes.len)), kNoMemory},
    {"DVSState_PortDeserialize", DO(DVSState_PortDeserialize(kSwitch, "new", g_world.portBytes.data, g_world.portBytes.len)), kNoMemory},
    {"DVSState_SwitchDeserialize", DO(DVSState_SwitchDeserialize("new", g_world.switchBytes.data, g_world.switchBytes.len)), kNoMemory},
    {"DVSState_ConfigDeserialize", [](Child &c) -> HYP_ReturnStatus { c.Unfaulted([] { Must(DVSState_ConfigReset() == HYP_OK); }); return DVSState_ConfigDeserialize(STATE); }, kNoMemory, "table emptied "},
    {"DVSState_ConfigReset", DO(DVSState_ConfigReset())},
    {"DVSState_StripDvsWithNoPersistFlag", [](Child &c) -> HYP_ReturnStatus {
        c.Unfaulted([] { Must(DVSState_SwitchAdd("volatile", "vswitch", 0, kVersion) == HYP_OK && DVSState_GlobalPropSet("volatile", kNoPersist, "\1", 1, kPropType) == HYP_OK); });
        const bool parked = DVSState_StripDvsWithNoPersistFlag(g_world.parked, g_world.removed, true);
        c.Unfaulted([] { DVSState_FreeDVSArray(g_world.parked); });
        return parked ? HYP_OK : HYP_FAILURE; }},
    {"DVSState_UpdateGlobalSwsArray", CALL((DVSState_UpdateGlobalSwsArray(g_world.parked, g_world.removed), DVSState_UpdateGlobalSwsArray(g_world.parked, g_world.removed)))},
    {"DVSState_FreeDVSArray", CALL(DVSState_FreeDVSArray(g_world.parked))},
    // the state file
    {"DVSFile_WriteClassical", DO(DVSFile_WriteClassical(g_path.c_str(), STATE, false)), kNoMemory},
    {"DVSFile_Write", DO(DVSFile_Write(g_path.c_str(), STATE)), kNoMemory},
    {"DVSFile_ReadClassical", DO(Read(DVSFile_ReadClassical)), kNoMemory},
    {"DVSFile_Read", DO(Read(DVSFile_Read)), kNoMemory},
    {"DVSFile_WriteDurable", DO(DVSFile_WriteDurable(g_path.c_str(), STATE)), kFine},
};
// clang-format on

class StateFileDir : public testing::Test {
protected:
    void SetUp() override {
        char name[] = "/tmp/dvs-memory-XXXXXX";
        dir_ = mkdtemp(name);
        g_path = dir_ + "/state";
    }
    void TearDown() override { std::filesystem::remove_all(dir_); }
    std::string dir_;
};

class OutOfMemory : public StateFileDir, public testing::WithParamInterface<std::size_t> {};

TEST_P(OutOfMemory, FailsCleanly) {
    const Row &row = kRows[GetParam()];
    fault::Options options;
    options.prepare = Prepare;
    options.conclude = Conclude;
    options.warmUp = true;
    const uint64_t rounds = fault::Sweep(
        "alloc:%", [&row](Child &child) { return g_world.status = row.run(child); },
        [&row](uint64_t, const fault::Report &report) {
            EXPECT_EQ(report.leakedBlocks, 0);
            EXPECT_EQ(report.leakedFds, 0);
            EXPECT_FALSE(report.lockHeld);
            if (report.hits == 0) {
                EXPECT_EQ(report.status, HYP_OK);
                return;
            }
            // The failed allocation may also have been an optional one.
            EXPECT_TRUE(report.status == HYP_OK || std::ranges::count(row.onFault, report.status) == 1)
                << std::hex << report.status;
            if (report.status != HYP_OK) {
                EXPECT_EQ(report.notes, row.mayChange);
            }
        },
        options);
    if (row.onFault.empty()) {
        EXPECT_EQ(rounds, 1u) << "an unexpected allocation";
    } else {
        EXPECT_GT(rounds, 1u) << "the row expects an allocation";
    }
}

INSTANTIATE_TEST_SUITE_P(Of, OutOfMemory, testing::Range(std::size_t{0}, kRows.size()),
                         [](const auto &row) { return std::string(kRows[row.param].name); });

/// The error message of an operation that runs out of memory; the same for each allocation.
void ExpectSaid(HYP_ReturnStatus (*run)(Child &), const std::string &text) {
    fault::Options options;
    options.prepare = Prepare;
    options.conclude = Conclude;
    options.warmUp = true;
    const uint64_t rounds = fault::Sweep(
        "alloc:%",
        [run](Child &child) {
            dvs_debug = 0;
            DVSLog_SetSink(Child::NoteMessage, &child);
            g_world.status = run(child);
            DVSLog_SetSink(nullptr, nullptr);
            dvs_debug = -1;
            return g_world.status;
        },
        [&text](uint64_t, const fault::Report &report) {
            EXPECT_EQ(report.notes, report.hits == 0 ? "" : text);
        },
        options);
    EXPECT_GT(rounds, 1u);
}

class OutOfMemoryMessages : public StateFileDir {};

TEST_F(OutOfMemoryMessages, NameThePortThatCouldNotBeAdded) {
    ExpectSaid([](Child &c) { return AddPort(c, DVSState_PortAdd); },
               "DVSStatePortAdd: failed to allocate port new\n");
}

TEST_F(OutOfMemoryMessages, NameTheSwitchThatCouldNotBeAdded) {
    ExpectSaid(DO(DVSState_SwitchAdd("new", "vswitch", 0, kVersion)),
               "DVSState_SwitchAdd failed DVS:new Error: Out of memory\n");
}

TEST(OutOfMemoryTable, HasEveryExportedOperationOfTheseFamilies) {
    std::set<std::string> rows;
    for (const Row &row : kRows)
        EXPECT_TRUE(rows.insert(row.name).second) << row.name << " has two rows";
    std::ifstream symbols(DVS_SOURCE_DIR "/dvs.symbols");
    std::size_t found = 0;
    for (std::string name; std::getline(symbols, name);) {
        const bool ofTheseFamilies = name.starts_with("DVSData") || name.starts_with("DVS_") ||
                                     name.starts_with("DVSFile_") || name.starts_with("DVSwitchHandle") ||
                                     name.starts_with("DVSState_");
        const bool ofTheStore =
            name.find("ConfigStore") != std::string::npos || name == "DVSState_RetrieveDVSUpgradeInfo";
        if (!ofTheseFamilies || ofTheStore) continue;
        found++;
        EXPECT_TRUE(rows.contains(name)) << name;
    }
    EXPECT_EQ(found, rows.size());
}

} // namespace
