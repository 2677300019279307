/* SPDX-License-Identifier: Apache-2.0 */
// A program with its own system-information interface: it defines all of platform/kit.h and takes the rest
// from the static archives.

#include "platform/kit.h"

#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "dvs/log.h"
#include "dvs/state.h"

namespace {

HYP_ReturnStatus g_signatureStatus;
HYP_ReturnStatus g_getStatus;
uint32_t g_version;

} // namespace

extern "C" HYP_ReturnStatus KIT_CheckSig(const char *, uint32_t version) {
    g_version = version;
    return g_signatureStatus;
}

extern "C" HYP_ReturnStatus KIT_Get(uint32_t node, const void *instanceArgs, void *value, uint32_t size) {
    const uint32_t ports = 77;
    if (node != KIT_NODE_net_maxPortsSystemWide || instanceArgs || size != sizeof ports) return HYP_BAD_PARAM;
    if (g_getStatus == HYP_OK) std::memcpy(value, &ports, size);
    return g_getStatus;
}

namespace {

class OwnKit : public testing::Test {
protected:
    void SetUp() override {
        g_signatureStatus = g_getStatus = HYP_OK;
        dvs_debug = 0;
        DVSLog_SetSink(
            [](int, const char *message, void *arg) { *static_cast<std::string *>(arg) += message; }, &said_);
    }
    void TearDown() override {
        DVSLog_SetSink(nullptr, nullptr);
        (void)DVSState_ConfigReset();
    }

    std::string said_;
};

// The limit is read once per process. ctest runs each test in its own process; for runs of the whole program,
// the failing reads come first.

TEST_F(OwnKit, FailedSignatureCheckFailsTheFirstAdd) {
    g_signatureStatus = HYP_NOT_SUPPORTED;
    EXPECT_EQ(DVSState_SwitchAdd("s", "vswitch", 8, 4), HYP_NOT_SUPPORTED);
    EXPECT_EQ(g_version, 21u);
    EXPECT_EQ(said_, "DVSState_SwitchAdd s, KIT signature check failed. Error: Not supported\n");
    EXPECT_EQ(uwMaxNumActivePortsSystemWide, 0u);
}

TEST_F(OwnKit, FailedReadFailsTheFirstAdd) {
    g_getStatus = HYP_FAILURE;
    EXPECT_EQ(DVSState_SwitchAdd("s", "vswitch", 8, 4), HYP_FAILURE);
    EXPECT_EQ(said_, "DVSState_SwitchAdd s, failed to get max ports systemwide. Error: Failure\n");
}

TEST_F(OwnKit, IsReadBeforeTheIdIsChecked) {
    g_getStatus = HYP_FAILURE;
    EXPECT_EQ(DVSState_SwitchAdd(std::string(64, 'i').c_str(), "vswitch", 8, 4), HYP_FAILURE);
}

TEST_F(OwnKit, ProvidesThePortLimit) {
    ASSERT_EQ(DVSState_SwitchAdd("s", "vswitch", 8, 4), HYP_OK);
    EXPECT_EQ(uwMaxNumActivePortsSystemWide, 77u);
    EXPECT_EQ(DVS_GetMaxPorts(DVSState_SwitchFind("s")), 77u);
}

} // namespace
