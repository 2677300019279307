/* SPDX-License-Identifier: Apache-2.0 */
// A switch address that cannot be formatted, which requires a failing system function. The program is linked
// with --wrap=inet_ntop.

#include <arpa/inet.h>

#include "configstore/converters/converter_fixture.h"

namespace {

bool g_fails = false;

} // namespace

extern "C" {
const char *__real_inet_ntop(int family, const void *address, char *text, socklen_t size);
const char *__wrap_inet_ntop(int family, const void *address, char *text, socklen_t size);
const char *__wrap_inet_ntop(int family, const void *address, char *text, socklen_t size) {
    return g_fails ? nullptr : __real_inet_ntop(family, address, text, size);
}
}

using namespace converter_test;

namespace {

struct SwitchAddress : ConverterTest {};

TEST_F(SwitchAddress, ReturnsMinusOneWithItsNumberIfFormattingFails) {
    const Bytes value = Bytes().U8(10).U8(0).U8(0).U8(1);
    g_fails = true;
    EXPECT_EQ(-1, Save(kGlobal, "com.orbeno.etherswitch.ipv4addr", value));
    g_fails = false;
    EXPECT_EQ("Failed to parse integer to Ipv4Address: 16777226\n"
              "Set prop: com.orbeno.etherswitch.ipv4addr failed\n",
              messages);
    EXPECT_EQ("", Dump());
    EXPECT_EQ(0, Save(kGlobal, "com.orbeno.etherswitch.ipv4addr", value));
    EXPECT_EQ("/switch_address = \"10.0.0.1\"\n", Dump());
}

} // namespace
