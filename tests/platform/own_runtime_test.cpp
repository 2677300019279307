/* SPDX-License-Identifier: Apache-2.0 */
// A program with its own host runtime: it defines all of platform/runtime.h and takes the rest from the
// static archives. Linking is the first half of the test.

#include "platform/runtime.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "dvs/file.h"
#include "dvs/hyp.h"
#include "dvs/state.h"

struct MXUserRecLock {
    std::recursive_mutex mutex;
    std::string name;
    uint32_t rank = 0;
};
struct BitVector {
    std::vector<bool> bits;
};

namespace {

std::string g_logged;
uint32_t g_logLevel;
int g_held;
int g_created;
bool g_bitsStay = false; // clearing a bit has no effect
uint32_t g_bitsAsked;

} // namespace

extern "C" {

MXUserRecLock *MXUser_CreateSingletonRecLockInt(MXUserRecLock **storage, const char *name, uint32_t rank) {
    static std::vector<std::unique_ptr<MXUserRecLock>> all;
    g_created++;
    if (*storage) return *storage;
    all.push_back(std::make_unique<MXUserRecLock>());
    all.back()->name = name;
    all.back()->rank = rank;
    return *storage = all.back().get();
}
void MXUser_AcquireRecLock(MXUserRecLock *lock) {
    lock->mutex.lock();
    g_held++;
}
void MXUser_ReleaseRecLock(MXUserRecLock *lock) {
    g_held--;
    lock->mutex.unlock();
}

BitVector *BitVector_Alloc(uint32_t bits) {
    g_bitsAsked = bits;
    return new BitVector{std::vector<bool>(bits)};
}
void BitVector_Free(BitVector *vector) {
    delete vector;
}
void BitVector_SetBit(BitVector *vector, uint32_t bit) {
    vector->bits[bit] = true;
}
void BitVector_ClearBit(BitVector *vector, uint32_t bit) {
    if (!g_bitsStay) vector->bits[bit] = false;
}
bool BitVector_IsSet(const BitVector *vector, uint32_t bit) {
    return vector->bits[bit];
}
bool BitVector_NextBit(const BitVector *vector, uint32_t start, bool value, uint32_t *pos) {
    for (uint32_t i = start; i < vector->bits.size(); i++) {
        if (vector->bits[i] != value) continue;
        *pos = i;
        return true;
    }
    return false;
}

char *Str_SafeAsprintf(size_t *length, const char *format, ...) {
    char text[1024];
    va_list args;
    va_start(args, format);
    const int needed = std::vsnprintf(text, sizeof text, format, args);
    va_end(args);
    if (length) *length = static_cast<size_t>(needed);
    return strdup(text);
}
char *Str_Strcpy(char *dst, const char *src, size_t) {
    return std::strcpy(dst, src);
}
const char *Err_Errno2String(int) {
    return "this host's own words";
}
void LogV(uint32_t level, const char *format, va_list args) {
    char text[1024];
    std::vsnprintf(text, sizeof text, format, args);
    g_logLevel = level;
    g_logged = text;
}

} // extern "C"

namespace {

TEST(OwnRuntime, ReceivesTheLogAndProvidesErrorTexts) {
    void *buf = nullptr;
    uint32_t len = 0, alignOffset = 0;
    EXPECT_EQ(DVSFile_Read("/nowhere/state", &buf, &len, &alignOffset), HYP_NOT_FOUND);
    EXPECT_EQ(g_logged, "failed to open dvsfile /nowhere/state for read, error: this host's own words\n");
    EXPECT_EQ(g_logLevel, 2u);
}

TEST(OwnRuntime, ProvidesTheLocks) {
    MXUserRecLock *lock = DVSwitchHandleLock();
    ASSERT_NE(lock, nullptr);
    EXPECT_EQ(lock->name, "dvsstate");
    EXPECT_EQ(lock->rank, 0xfeffffffu);
    EXPECT_EQ(g_held, 1);
    DVSwitchHandleUnlock(lock);
    EXPECT_EQ(g_held, 0);
}

TEST(OwnRuntime, ProvidesTheKernelInterfacesLock) {
    MXUserRecLock *lock = DVSwitchHYPLock();
    ASSERT_NE(lock, nullptr);
    EXPECT_EQ(lock->name, "dvshyp");
    EXPECT_EQ(lock->rank, 0xfefffffeu);
    EXPECT_EQ(g_held, 1);
    DVSwitchHYPUnlock(lock);
    DVSwitchHYPUnlock(nullptr);
    EXPECT_EQ(g_held, 0);
}

TEST(OwnRuntime, CreatesEachLockOnFirstUseOnly) {
    DVSwitchHandleUnlock(DVSwitchHandleLock());
    DVSwitchHYPUnlock(DVSwitchHYPLock());
    g_created = 0;
    for (int i = 0; i < 3; i++) {
        DVSwitchHandleUnlock(DVSwitchHandleLock());
        DVSwitchHYPUnlock(DVSwitchHYPLock());
        EXPECT_EQ(DVSState_SwitchFind("absent"), nullptr);
    }
    EXPECT_EQ(g_created, 0);
}

TEST(OwnRuntime, ProvidesTheBitVectors) {
    ASSERT_EQ(DVSState_SwitchAdd("s", "vswitch", 8, 4), HYP_OK);
    EXPECT_EQ(g_bitsAsked, uwMaxNumActivePortsSystemWide);
    EXPECT_EQ(DVSState_SwitchRemove("s"), HYP_OK);
    EXPECT_EQ(g_held, 0);
}

DVSData *NewData() {
    DVSData *data = nullptr;
    EXPECT_EQ(DVSData_Alloc(&data, std::malloc, std::free), HYP_OK);
    return data;
}

// A port lookup starts at the first marked slot and ends at a marked slot without a port. If clearing a bit
// has no effect, only the first port can be removed.
TEST(OwnRuntime, StuckBitsKeepASwitchWithItsOtherPorts) {
    ASSERT_EQ(DVSState_SwitchAdd("s", "vswitch", 8, 9), HYP_OK);
    for (int i = 0; i < 100; i++)
        ASSERT_EQ(DVSState_PortAdd("s", ("p" + std::to_string(i)).c_str(), NewData()), HYP_OK);
    g_bitsStay = true;
    EXPECT_EQ(DVSState_SwitchRemove("s"), HYP_OK);
    g_bitsStay = false;
    DVSwitch *sw = DVSState_SwitchFind("s");
    ASSERT_NE(sw, nullptr);
    EXPECT_EQ(sw->numPorts, 99u);
    EXPECT_EQ(sw->ports[0], nullptr);
    EXPECT_STREQ(DVS_PortId(sw->ports[1]), "p1");
    EXPECT_EQ(g_held, 0);

    BitVector_ClearBit(sw->portBitmap, 0);
    EXPECT_EQ(DVSState_PortFind("s", "p99"), sw->ports[99]);
    EXPECT_EQ(DVSState_PortAdd("s", "again", NewData()), HYP_OK);
    EXPECT_EQ(DVSState_PortFind("s", "again"), sw->ports[0]);
    EXPECT_EQ(DVSState_PortFind("s", "p99"), sw->ports[99]);
    EXPECT_EQ(DVSState_SwitchRemove("s"), HYP_OK);
    EXPECT_EQ(DVSState_SwitchFind("s"), nullptr);
}

TEST(OwnRuntime, StuckBitsStillRemoveASwitchOfOnePort) {
    ASSERT_EQ(DVSState_SwitchAdd("s", "vswitch", 8, 9), HYP_OK);
    ASSERT_EQ(DVSState_PortAdd("s", "p", NewData()), HYP_OK);
    g_bitsStay = true;
    EXPECT_EQ(DVSState_SwitchRemove("s"), HYP_OK);
    g_bitsStay = false;
    EXPECT_EQ(DVSState_SwitchFind("s"), nullptr);
}

} // namespace
