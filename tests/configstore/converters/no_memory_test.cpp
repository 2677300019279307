/* SPDX-License-Identifier: Apache-2.0 */
// Loads that cannot allocate their value: each prints its own message, and all but two fail. The program is
// linked with --wrap=calloc, the function that allocates values.

#include <cstdlib>

#include "configstore/converters/converter_fixture.h"

namespace {

bool g_noMemory = false;

} // namespace

extern "C" {
void *__real_calloc(std::size_t count, std::size_t size);
void *__wrap_calloc(std::size_t count, std::size_t size);
void *__wrap_calloc(std::size_t count, std::size_t size) {
    return g_noMemory ? nullptr : __real_calloc(count, size);
}
}

using namespace converter_test;

namespace {

struct NoMemory : ConverterTest {};

TEST_F(NoMemory, FailsOrSkipsWithTheMessageOfItsFamily) {
    const Bytes session = Bytes().Text("k", 116).U32(1).U32(0xffffffff).Zeros(108);
    const Bytes table = Bytes().U32(0xfacebeef).U32(1).U32(1).Zeros(8).Add(session);
    const Bytes vlan = Bytes().U16(0).U16(7).U32(0);
    const Bytes pvlans = Bytes().U16(1).U16(2).U8(3).Zeros(3);
    const struct {
        uint32_t propClass;
        const char *key, *className;
        Bytes value;
        const char *message;
        int32_t expected;
    } rows[] = {
        {kPort, "com.orbeno.etherswitch.port.vlan", "etherswitch", vlan, "ESPortVlanPolicy", 0},
        {kPort, "com.orbeno.vswitch.port.vlan", "vswitch", vlan, "VSPortVlanPolicy", -1},
        {kPort, "com.orbeno.common.port.dvfilter", "etherswitch", Bytes().U32(0), "DVFilterConfig", -1},
        {kGlobal, "com.orbeno.etherswitch.pvlanMap", "etherswitch", pvlans, "ESPvlanMapEntry", -1},
        {kGlobal, "com.orbeno.vswitch.pvlanMap", "cswitch", pvlans, "VSPvlanMapEntry", -1},
        {kGlobal, "com.orbeno.etherswitch.mirrorSessions", "etherswitch", table, "DVMirrorSessionTable", -1},
        {kGlobal, "com.orbeno.etherswitch.lacp", "etherswitch",
         Bytes().U32(1).Text("n", 65).Text("k", 16).Zeros(12), "LACPTable", -1},
        {kGlobal, "com.orbeno.common.teamcheck.deploy", "etherswitch", Bytes().Zeros(5), "DVSHealthchkDeploy",
         -1},
        {kGlobal, "com.orbeno.common.respools.cfg", "etherswitch", Bytes().U32(1).Text("k", 212),
         "DVSPropResPoolsCfg", -1},
        {kGlobal, "com.orbeno.common.respools.list", "etherswitch", Bytes().U32(1).Text("k", 200),
         "DVSPropResPoolsList", 0},
        {kHost, "com.orbeno.common.host.uplinkPorts", "etherswitch", Bytes().U32(1).Text("k", 48),
         "DVSUplinkPortIds", -1},
        {kGlobal, "com.orbeno.common.uplinkPorts", "etherswitch", Bytes().U32(1).Text("k", 81),
         "DVSUplinkPorts", -1},
    };
    for (const auto &row : rows) {
        configstore::DestroyObject(object);
        ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "id", "{}", &object));
        BecomeSwitch(row.className);
        ASSERT_EQ(0, Save(row.propClass, row.key, row.value)) << row.key;
        EXPECT_TRUE(Load(row.propClass).contains(row.key)) << row.key;
        messages.clear();
        g_noMemory = true;
        const Properties loaded = Load(row.propClass);
        g_noMemory = false;
        EXPECT_FALSE(loaded.contains(row.key)) << row.key;
        EXPECT_EQ(row.expected, loadStatus) << row.key;
        EXPECT_NE(std::string::npos,
                  messages.find(std::string("Failed to alloc memory for ") + row.message + "\n"))
            << messages;
    }
}

} // namespace
