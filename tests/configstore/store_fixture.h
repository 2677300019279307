/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_STORE_FIXTURE_H
#define TESTS_CONFIGSTORE_STORE_FIXTURE_H

// A fixture for whole saves and loads with the store double.

#include <cstdlib>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "configstore/fake_store.h"
#include "configstore/lock_count.h"
#include "configstore/maps/prop_frame.h"
#include "configstore/state_builder.h"
#include "dvs/configstore.h"
#include "dvs/log.h"
#include "dvs/state.h"

struct StoreTest : testing::Test {
    StoreTest() {
        fake_store::Reset();
        dvsconfigstore_debug = 10;
        DVSLog_SetSink(&StoreTest::Note, this);
    }
    ~StoreTest() override {
        EXPECT_EQ(0, fake_store::OpenHandles());
        EXPECT_EQ(0, lock_count::Held());
        DVSLog_SetSink(nullptr, nullptr);
    }
    StoreTest(const StoreTest &) = delete;
    StoreTest &operator=(const StoreTest &) = delete;

    static void Note(int level, const char *text, void *self) {
        auto *test = static_cast<StoreTest *>(self);
        if (level == -1)
            test->system.emplace_back(text);
        else
            test->messages += text;
    }
    [[nodiscard]] bool Said(const std::string &text) const {
        return messages.find(text) != std::string::npos;
    }

    static int32_t SaveBytes(const state_builder::Bytes &buf, const char *id = nullptr) {
        return DVSState_SaveBufToConfigStore_ByInstance(buf.data(), static_cast<uint32_t>(buf.size()), id);
    }
    static int32_t SaveChecked(const state_builder::Bytes &buf, const char *id = nullptr) {
        return DVSState_SaveBufToConfigStoreChecked(buf.data(), static_cast<uint32_t>(buf.size()), id);
    }
    static int32_t Save(const std::vector<state_builder::Switch> &switches, const char *id = nullptr) {
        return SaveBytes(state_builder::State(switches), id);
    }
    /// The loaded switches; empty without a buffer.
    std::vector<state_builder::Switch> Load(bool desired = false) {
        void *buf = nullptr;
        uint32_t len = 0;
        status = DVSState_LoadFromConfigStoreAsBuf(&buf, &len, desired);
        gotBuffer = buf != nullptr;
        if (!buf) return {};
        const auto *bytes = static_cast<const uint8_t *>(buf);
        auto switches = state_builder::Parse({bytes, bytes + len});
        std::free(buf);
        return switches;
    }
    static int SwitchesInTable() {
        int count = 0;
        DVSState_SwitchForEach([](DVSwitch *, void *arg) { return ++*static_cast<int *>(arg), false; },
                               &count);
        return count;
    }
    /// Releases the lock and the table that those early returns keep.
    static void ReleaseKeptLock() {
        EXPECT_EQ(1, lock_count::Held());
        EXPECT_EQ(HYP_OK, DVSState_ConfigReset());
        MXUserRecLock *lock = DVSwitchHandleLock();
        DVSwitchHandleUnlock(lock);
        DVSwitchHandleUnlock(lock);
    }

    int32_t status = 0;
    bool gotBuffer = false;
    std::string messages;            // the library's messages of all levels
    std::vector<std::string> system; // the lines sent to syslog
};

#endif
