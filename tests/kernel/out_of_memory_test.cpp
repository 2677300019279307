/* SPDX-License-Identifier: Apache-2.0 */
// Fails each allocation of every kernel interface function in turn. Each call must return its documented
// status and no data, leak nothing, hold no lock, and leave the table empty. Also tests the one block that
// stays allocated by design.

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <functional>
#include <map>

#include <gtest/gtest.h>

#include "emulator/emulator_process.h"
#include "fault/sweep.h"
#include "kernel/failure.h"
#include "kernel/state_support.h"
#include "platform/device.h"
#include "platform/device_commands.h"

namespace dvs::test {
namespace {

using device::Command;

/// The module's replies by command. It allocates nothing while faults are armed.
std::map<Command, std::string> g_replies;

struct Row {
    const char *name;
    std::function<HYP_ReturnStatus(void **)> call;
    bool givesList = false;
};

uint32_t g_size = 0;

std::vector<Row> Rows() {
    static const std::string stateFile = [] {
        static TempDir directory;
        const std::string state = StateBuilder().Switch("tmp").Port("tmp", "p").Serialize();
        const std::string path = directory / "state";
        EXPECT_EQ(DVSFile_Write(path.c_str(), state.data(), static_cast<uint32_t>(state.size())), HYP_OK);
        return path;
    }();
    const auto list = [](void **out) { return reinterpret_cast<DVSData **>(out); };
    return {
        {"StateGet", [](void **out) { return DVSHYP_StateGet(out, &g_size); }},
        {"CmdExec", [](void **out) { return DVSHYP_CmdExec("s", "x", nullptr, 0, out, &g_size); }},
        {"PortGetByExternalId",
         [](void **out) {
             return DVSHYP_PortGetByExternalId("s", "id", reinterpret_cast<DVSHYPExternalIdResult **>(out));
         }},
        {"PersistentStateGet", [](void **out) { return DVSHYP_PersistentStateGet(out, &g_size); }},
        {"PersistentStateGetWithFile",
         [](void **out) { return DVSHYP_PersistentStateGetWithFile(out, &g_size, stateFile.c_str()); }},
        {"PersistentPortStateGet",
         [](void **out) { return DVSHYP_PersistentPortStateGet("s", "p", 9, out, &g_size); }},
        {"VendorGlobalPropList", [=](void **out) { return DVSHYP_VendorGlobalPropList("s", list(out), 16); },
         true},
        {"VendorHostPropList", [=](void **out) { return DVSHYP_VendorHostPropList("s", list(out), 16); },
         true},
        {"VendorPortPropList", [=](void **out) { return DVSHYP_VendorPortPropList("s", "p", list(out), 16); },
         true},
        {"ExtraConfigPropList", [=](void **out) { return DVSHYP_ExtraConfigPropList("s", list(out), 16); },
         true},
        {"ExtraConfigPortPropList",
         [=](void **out) { return DVSHYP_ExtraConfigPortPropList("s", "p", list(out), 16); }, true},
        {"OvlPropList", [=](void **out) { return DVSHYP_OvlPropList("s", 16, true, list(out)); }, true},
        {"OvlPropListOfNoList", [=](void **out) { return DVSHYP_OvlPropList("bare", 16, true, list(out)); },
         true},
        {"SwitchPortList",
         [](void **out) { return DVSHYP_SwitchPortList("s", reinterpret_cast<DVSHYPPortList **>(out), 1); }},
    };
}

void Serve() {
    StateBuilder state;
    state.Switch("s").Global("s", "com.orbeno.extraconfig.a", "v").Global("s", "com.vendor.a", "v");
    state.Port("s", "p", {{"com.orbeno.port.extraConfig.vnic.external.id", "id"}}).Port("s", "q");
    state.Switch("tmp").Global("tmp", "com.orbeno.common.volatile.nopersist", "x");
    state.Switch("bare");
    DVSwitch *bare = DVSState_SwitchFind("bare");
    DVSData_Free(bare->globalPropList);
    bare->globalPropList = nullptr;
    g_replies[Command::StateGet] = state.Serialize();
    g_replies[Command::GlobalPropGet] = std::string("\x6e\0\0\0", 4);
    g_replies[Command::PortStateGet] = PortData({{"com.vendor.a", "v"}, {"b.volatile.c", "v"}});
    g_replies[Command::CmdExec] = "reply";
}

void CheckLocks(fault::Child &child) {
    static MXUserRecLock *hyp = nullptr;
    static MXUserRecLock *state = nullptr;
    child.CheckLock([] { hyp = DVSwitchHYPLock(), state = DVSwitchHandleLock(); },
                    [] { DVSwitchHandleUnlock(state), DVSwitchHYPUnlock(hyp); });
}

TEST(KernelWithoutMemory, EveryOperationFailsCleanly) {
    Serve();
    for (const Row &row : Rows()) {
        fault::Options options;
        options.warmUp = true;
        options.prepare = CheckLocks;
        options.conclude = [](fault::Child &child) {
            if (!TableIsEmpty()) child.Note("table ");
        };
        const uint64_t rounds = fault::Sweep(
            "alloc:%",
            [&](fault::Child &child) {
                void *out = nullptr;
                const HYP_ReturnStatus status = row.call(&out);
                if ((status == HYP_OK) != (out != nullptr)) child.Note("out ");
                if (row.givesList)
                    DVSData_Free(static_cast<DVSData *>(out));
                else
                    DVSHYP_DataFree(out);
                return status;
            },
            [&](uint64_t k, const fault::Report &report) {
                // Serialization maps every failure to HYP_EXISTS. A failed version query is ignored.
                const bool expected = report.status == HYP_NO_MEMORY || report.status == HYP_EXISTS ||
                                      (report.status == HYP_OK && std::strstr(row.name, "Vendor"));
                EXPECT_TRUE(report.hits == 0 ? report.status == HYP_OK : expected)
                    << row.name << " " << k << ": " << std::hex << report.status;
                // State file contents that do not load stay allocated; see KernelLeaks below.
                const bool fromFile = std::strstr(row.name, "WithFile") != nullptr;
                EXPECT_LE(report.leakedBlocks, fromFile && report.hits > 0 ? 1 : 0) << row.name << " " << k;
                EXPECT_EQ(report.leakedFds, 0) << row.name << " " << k;
                EXPECT_FALSE(report.lockHeld) << row.name << " " << k;
                EXPECT_EQ(report.notes, "") << row.name << " " << k;
            },
            options);
        EXPECT_GT(rounds, 1U) << row.name;
    }
}

/// This is the only line that a command prints itself, and the only one without a newline.
TEST(KernelWithoutMemory, CmdExecReportsAFailedBufferAllocation) {
    Serve();
    g_size = 77;
    fault::Options options;
    options.warmUp = true;
    uint64_t refused = 0;
    fault::Sweep(
        "alloc:%",
        [](fault::Child &child) {
            DVSLog_SetSink(fault::Child::NoteMessage, &child);
            void *out = &child;
            const HYP_ReturnStatus status = DVSHYP_CmdExec("s", "x", nullptr, 0, &out, &g_size);
            DVSLog_SetSink(nullptr, nullptr);
            if (status != HYP_OK) child.Note(out == nullptr && g_size == 32768 ? "|null" : "|left");
            if (status == HYP_OK) DVSHYP_DataFree(out);
            return status;
        },
        [&](uint64_t, const fault::Report &report) {
            if (report.hits == 0) return;
            refused++;
            EXPECT_EQ(report.status, HYP_NO_MEMORY);
            EXPECT_EQ(report.notes, "failed to alloc buffer memory|null");
        },
        options);
    EXPECT_EQ(refused, 1U);
}

/// A fetch prints nothing and returns the size that it failed to allocate.
TEST(KernelWithoutMemory, FetchReturnsTheSizeItFailedToAllocate) {
    Serve();
    fault::Options options;
    options.warmUp = true;
    fault::Sweep(
        "alloc:%",
        [](fault::Child &child) {
            DVSLog_SetSink(fault::Child::NoteMessage, &child);
            void *out = &child;
            uint32_t outLen = 77;
            const hyp::FailureObserver observer;
            const HYP_ReturnStatus status = DVSHYP_StateGet(&out, &outLen);
            DVSLog_SetSink(nullptr, nullptr);
            if (status != HYP_OK) child.Note(out == nullptr && outLen == 32768 ? "null" : "left");
            if (observer.Last().step == hyp::Step::Allocate) child.Note(" recorded");
            if (status == HYP_OK) DVSHYP_DataFree(out);
            return status;
        },
        [&](uint64_t, const fault::Report &report) {
            if (report.hits == 0) return;
            EXPECT_EQ(report.status, HYP_NO_MEMORY);
            EXPECT_EQ(report.notes, "null recorded");
        },
        options);
}

/// Documented behaviour: state file contents that do not load stay allocated.
TEST(KernelLeaks, ContentsOfAnUnloadableStateFileStayAllocated) {
    Serve();
    const TempDir directory;
    const std::string path = directory / "state";
    const std::string contents(600, '\1');
    ASSERT_EQ(DVSFile_Write(path.c_str(), contents.data(), static_cast<uint32_t>(contents.size())), HYP_OK);
    fault::Options options;
    options.warmUp = true;
    options.prepare = CheckLocks;
    options.conclude = [](fault::Child &child) {
        if (!TableIsEmpty()) child.Note("table ");
    };
    unsigned checked = 0;
    fault::Sweep(
        "alloc:1000000",
        [&](fault::Child &child) {
            DVSLog_SetSink(fault::Child::NoteMessage, &child);
            void *out = nullptr;
            const HYP_ReturnStatus status = DVSHYP_PersistentStateGetWithFile(&out, &g_size, path.c_str());
            DVSLog_SetSink(nullptr, nullptr);
            return status;
        },
        [&](uint64_t, const fault::Report &report) {
            checked++;
            EXPECT_EQ(report.status, HYP_BAD_PARAM);
            EXPECT_EQ(report.leakedBlocks, 1);
            EXPECT_EQ(report.leakedFds, 0);
            EXPECT_FALSE(report.lockHeld);
            EXPECT_NE(report.notes.find("DVSState_ConfigDeserialize failed: "), std::string::npos)
                << report.notes;
            EXPECT_EQ(report.notes.find("table "), std::string::npos);
        },
        options);
    EXPECT_EQ(checked, 1U);
}

} // namespace
} // namespace dvs::test

extern "C" int HostDevice_Open(const char *) {
    return 1000;
}

extern "C" int HostDevice_Close(int) {
    return 0;
}

extern "C" int HostDevice_Ioctl(int, int request, void *record) {
    auto *req = static_cast<DVSHYPRequest *>(record);
    const auto found = dvs::test::g_replies.find(dvs::device::Command{request});
    if (found == dvs::test::g_replies.end()) return 0;
    const auto size = static_cast<uint32_t>(found->second.size());
    const bool executes = dvs::device::TransferOf(request) == dvs::device::Transfer::Execute;
    const uint32_t capacity = executes ? req->cmdOutLen : req->dataLen;
    if (executes)
        req->cmdOutLen = size;
    else
        req->dataLen = size;
    if (size > capacity) {
        req->status = HYP_LIMIT_EXCEEDED;
        errno = ENOSPC;
        return -1;
    }
    std::memcpy(reinterpret_cast<void *>(executes ? req->cmdOut : req->data), found->second.data(), size);
    return 0;
}
