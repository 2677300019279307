/* SPDX-License-Identifier: Apache-2.0 */
// Tests how long the lock "dvshyp" is held. It is taken after the module's state is fetched and released
// after the table is empty again, on every path. Functions that need no table do not take it. The runtime's
// lock functions are wrapped at link time.

#include <cerrno>
#include <functional>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "emulator/emulator_process.h"
#include "kernel/fake_device.h"
#include "kernel/state_support.h"
#include "platform/runtime.h"

extern "C" {
void __real_MXUser_AcquireRecLock(MXUserRecLock *lock);
void __real_MXUser_ReleaseRecLock(MXUserRecLock *lock);
void __wrap_MXUser_AcquireRecLock(MXUserRecLock *lock);
void __wrap_MXUser_ReleaseRecLock(MXUserRecLock *lock);
}

namespace dvs::test {
namespace {

using Strings = std::vector<std::string>;

/// The calls that the wrapped functions record while `watching`.
struct Watch {
    bool watching = false;
    MXUserRecLock *hyp = nullptr;
    int depth = 0;
    Strings events;

    void Note(const std::string &what) {
        watching = false; // reading the table takes the other lock
        const std::string calls = " after call " + std::to_string(FakeDevice::Get().calls.size());
        events.push_back(what + calls + (TableIsEmpty() ? ", table empty" : ", table in use"));
        watching = true;
    }
    void Acquired(const MXUserRecLock *lock) {
        if (!watching) return;
        if (lock != hyp) {
            if (depth == 0) events.emplace_back("dvsstate alone");
        } else if (depth++ == 0) {
            Note("taken");
        }
    }
    void Releasing(const MXUserRecLock *lock) {
        if (watching && lock == hyp && --depth == 0) Note("given up");
    }
};

Watch g_watch;

class LockSpan : public testing::Test, protected FakeDeviceTest {
protected:
    LockSpan() {
        g_watch = {};
        g_watch.hyp = DVSwitchHYPLock();
        DVSwitchHYPUnlock(g_watch.hyp);
        StateBuilder state;
        state.Switch("s").Global("s", "com.vendor.a", "v").Port("s", "p", {{"a", "1"}}).Switch("t");
        state.Global("t", "com.orbeno.common.volatile.nopersist", "x");
        device.replies[Command::StateGet] = state.Serialize();
        device.replies[Command::PortStateGet] = PortData({{"com.vendor.a", "v"}});
    }

    Strings EventsOf(const std::function<HYP_ReturnStatus()> &call, HYP_ReturnStatus expected) {
        device.calls.clear();
        g_watch.events.clear();
        g_watch.watching = true;
        EXPECT_EQ(call(), expected);
        g_watch.watching = false;
        EXPECT_EQ(g_watch.depth, 0);
        return g_watch.events;
    }

    /// The lock is taken once, before the load, and released once, with the table empty.
    static Strings Span(int calls = 1) {
        return {"taken after call 1, table empty",
                "given up after call " + std::to_string(calls) + ", table empty"};
    }

    const TempDir directory_;
    const std::string path_ = directory_ / "state";
    DVSData *list_ = nullptr;
    void *out_ = nullptr;
    uint32_t outLen_ = 0;

    HYP_ReturnStatus Free(HYP_ReturnStatus status) {
        DVSData_Free(std::exchange(list_, nullptr));
        DVSHYP_DataFree(std::exchange(out_, nullptr));
        return status;
    }
    HYP_ReturnStatus FindId(const char *sw, const std::string &id) {
        auto **const result = reinterpret_cast<DVSHYPExternalIdResult **>(&out_);
        return Free(DVSHYP_PortGetByExternalId(sw, id.c_str(), result));
    }
    HYP_ReturnStatus Ports(const char *sw) {
        return Free(DVSHYP_SwitchPortList(sw, reinterpret_cast<DVSHYPPortList **>(&out_), 1));
    }
    HYP_ReturnStatus Persist(const char *stateFile) {
        return Free(DVSHYP_PersistentStateGetWithFile(&out_, &outLen_, stateFile));
    }

    struct Row {
        const char *name;
        std::function<HYP_ReturnStatus(const char *sw)> call;
        int calls; // device calls when the switch exists
    };
    std::vector<Row> Rows() {
        return {
            {"PortGetByExternalId", [&](const char *sw) { return FindId(sw, "id"); }, 1},
            {"SwitchPortList", [&](const char *sw) { return Ports(sw); }, 1},
            {"VendorGlobal",
             [&](const char *sw) { return Free(DVSHYP_VendorGlobalPropList(sw, &list_, 16)); }, 2},
            {"VendorHost", [&](const char *sw) { return Free(DVSHYP_VendorHostPropList(sw, &list_, 16)); },
             2},
            {"ExtraConfig", [&](const char *sw) { return Free(DVSHYP_ExtraConfigPropList(sw, &list_, 16)); },
             1},
            {"Overlay", [&](const char *sw) { return Free(DVSHYP_OvlPropList(sw, 16, true, &list_)); }, 1},
        };
    }
};

TEST_F(LockSpan, OfEachQueryLastsFromLoadToEmptyTable) {
    for (const Row &row : Rows()) {
        EXPECT_EQ(EventsOf([&] { return row.call("s"); }, HYP_OK), Span(row.calls)) << row.name;
        EXPECT_EQ(EventsOf([&] { return row.call("unknown"); }, HYP_NOT_FOUND), Span()) << row.name;
    }
}

TEST_F(LockSpan, OfARetrievalIsTheSameOnEveryPath) {
    EXPECT_EQ(EventsOf([&] { return Persist(nullptr); }, HYP_OK), Span());
    EXPECT_EQ(EventsOf([&] { return Persist(path_.c_str()); }, HYP_NOT_FOUND), Span());
    const std::string stored = StateBuilder().Switch("t").Switch("other").Serialize();
    ASSERT_EQ(DVSFile_Write(path_.c_str(), stored.data(), static_cast<uint32_t>(stored.size())), HYP_OK);
    EXPECT_EQ(EventsOf([&] { return Persist(path_.c_str()); }, HYP_OK), Span());
}

TEST_F(LockSpan, EndsWhenTheStateDoesNotLoad) {
    device.replies[Command::StateGet] = std::string(64, '\x7f');
    for (const Row &row : Rows())
        EXPECT_EQ(EventsOf([&] { return row.call("s"); }, HYP_BAD_PARAM), Span()) << row.name;
    EXPECT_EQ(EventsOf([&] { return Persist(nullptr); }, HYP_BAD_PARAM), Span());
}

TEST_F(LockSpan, DoesNotBeginWithoutAState) {
    device.always[Command::StateGet] = {EPERM, 0x0bad0042, -1, {}};
    device.replies.erase(Command::StateGet);
    for (const Row &row : Rows())
        EXPECT_EQ(EventsOf([&] { return row.call("s"); }, 0x0bad0042), Strings{}) << row.name;
    EXPECT_EQ(EventsOf([&] { return Persist(nullptr); }, 0x0bad0042), Strings{});
    EXPECT_EQ(EventsOf([&] { return FindId("s", std::string(128, 'i')); }, HYP_BAD_PARAM), Strings{});
}

TEST_F(LockSpan, IsEmptyForCallsWithoutATable) {
    const std::function<HYP_ReturnStatus()> calls[] = {
        [&] { return Free(DVSHYP_VendorPortPropList("s", "p", &list_, 16)); },
        [&] { return Free(DVSHYP_ExtraConfigPortPropList("s", "p", &list_, 16)); },
        [&] { return Free(DVSHYP_PersistentPortStateGet("s", "p", 9, &out_, &outLen_)); },
        [&] { return Free(DVSHYP_StateGet(&out_, &outLen_)); },
        [] { return DVSHYP_SwitchRemove("s"); },
    };
    for (const auto &call : calls)
        EXPECT_EQ(EventsOf(call, HYP_OK), Strings{});
}

} // namespace
} // namespace dvs::test

void __wrap_MXUser_AcquireRecLock(MXUserRecLock *lock) {
    __real_MXUser_AcquireRecLock(lock);
    dvs::test::g_watch.Acquired(lock);
}

void __wrap_MXUser_ReleaseRecLock(MXUserRecLock *lock) {
    dvs::test::g_watch.Releasing(lock);
    __real_MXUser_ReleaseRecLock(lock);
}
