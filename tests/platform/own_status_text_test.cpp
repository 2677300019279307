/* SPDX-License-Identifier: Apache-2.0 */
// A program with its own status texts (platform/status_text.h); the rest comes from the static archives.

#include "platform/status_text.h"

#include <gtest/gtest.h>

#include <string>

#include "dvs/log.h"
#include "dvs/state.h"

extern "C" const char *HYP_ReturnStatusToString(HYP_ReturnStatus status) {
    return status == HYP_EXISTS ? "there is one already" : "something else";
}

namespace {

TEST(OwnStatusText, AppearsInMessages) {
    std::string text;
    DVSLog_SetSink([](int, const char *message, void *arg) { *static_cast<std::string *>(arg) += message; },
                   &text);
    dvs_debug = 0;
    EXPECT_EQ(DVSState_SwitchAdd("s", "vswitch", 8, 4), HYP_OK);
    EXPECT_EQ(DVSState_SwitchAdd("s", "vswitch", 8, 4), HYP_EXISTS);
    DVSLog_SetSink(nullptr, nullptr);
    EXPECT_EQ(text, "DVSState_SwitchAdd failed DVS:s Error: there is one already\n");
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
}

} // namespace
