/* SPDX-License-Identifier: Apache-2.0 */
// The sources of the port limit in their order of precedence, and the values that each rejects.

#include "platform/kit.h"

#include <gtest/gtest.h>

#include <cstdlib>

#include "platform/embedded/host_limits.h"

namespace {

constexpr const char *kVariable = "DVS_MAX_PORTS";

class Kit : public testing::Test {
protected:
    void SetUp() override {
        unsetenv(kVariable);
        unsetenv("DVS_EMULATOR");
        DVSHost_SetMaxPorts(0);
    }
    void TearDown() override { SetUp(); }

    HYP_ReturnStatus Get() {
        return KIT_Get(KIT_NODE_net_maxPortsSystemWide, nullptr, &ports_, sizeof ports_);
    }

    uint32_t ports_ = 4711;
};

TEST_F(Kit, ReturnsTheDefaultWhenNothingIsSet) {
    EXPECT_EQ(Get(), HYP_OK);
    EXPECT_EQ(ports_, 65536u);
}

TEST_F(Kit, EnvironmentOverridesTheDefault) {
    setenv(kVariable, "512", 1);
    EXPECT_EQ(Get(), HYP_OK);
    EXPECT_EQ(ports_, 512u);
}

TEST_F(Kit, ProgramOverridesTheEnvironment) {
    setenv(kVariable, "512", 1);
    DVSHost_SetMaxPorts(7);
    EXPECT_EQ(Get(), HYP_OK);
    EXPECT_EQ(ports_, 7u);
    DVSHost_SetMaxPorts(0);
    EXPECT_EQ(Get(), HYP_OK);
    EXPECT_EQ(ports_, 512u);
}

TEST_F(Kit, ProgramOverridesAMalformedEnvironment) {
    setenv(kVariable, "many", 1);
    DVSHost_SetMaxPorts(7);
    EXPECT_EQ(Get(), HYP_OK);
}

TEST_F(Kit, AcceptsTheWholeRange) {
    setenv(kVariable, "1", 1);
    EXPECT_EQ(Get(), HYP_OK);
    EXPECT_EQ(ports_, 1u);
    setenv(kVariable, "4294967295", 1);
    EXPECT_EQ(Get(), HYP_OK);
    EXPECT_EQ(ports_, 4294967295u);
}

TEST_F(Kit, RejectsMalformedValues) {
    for (const char *text : {"", "0", "abc", "12x", "x12", "-1", "+1", " 12", "12 ", "4294967296", "0x10",
                             "1e3", "99999999999999999999", "12\n"}) {
        setenv(kVariable, text, 1);
        EXPECT_EQ(Get(), HYP_BAD_PARAM) << '"' << text << '"';
        EXPECT_EQ(ports_, 4711u) << "a failure must not change the value";
    }
}

TEST_F(Kit, RejectsOtherNodesAndWidths) {
    EXPECT_EQ(KIT_Get(2, nullptr, &ports_, sizeof ports_), HYP_NOT_FOUND);
    EXPECT_EQ(KIT_Get(KIT_NODE_net_maxPortsSystemWide, nullptr, &ports_, 8), HYP_BAD_PARAM);
    EXPECT_EQ(KIT_Get(KIT_NODE_net_maxPortsSystemWide, nullptr, nullptr, sizeof ports_), HYP_BAD_PARAM);
}

TEST_F(Kit, ChecksTheVersion) {
    EXPECT_EQ(KIT_CheckSig("any", 21), HYP_OK);
    EXPECT_EQ(KIT_CheckSig("any", 20), HYP_NOT_SUPPORTED);
    EXPECT_EQ(KIT_CheckSig(nullptr, 21), HYP_BAD_PARAM);
}

} // namespace
