/* SPDX-License-Identifier: Apache-2.0 */
// Finding ports by id, switch UUID and alias, with and without the fallback to local-cache ports.

#include "dvsstate/state_support.h"

using namespace dvs::test;

namespace {

class PortFind : public StateTest {};

const std::string kUuidId = "00 01 02 03 04 05 06 07-08 09 0a 0b 0c 0d 0e 0f";
constexpr std::uint8_t kUuid[16] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15};

Props Alias(const std::string &alias) {
    return {{"com.orbeno.common.port.alias", alias}};
}

TEST_F(PortFind, FallsBackToALocalCachePortByIdButNotByAlias) {
    DVSwitch *sw = AddSwitch("dvs");
    Append(sw->globalPropList, {"com.orbeno.common.alias", "sw"});
    DVSPort *cached = AddPort(sw, "p", DVS_PORT_LOCAL_CACHE, Alias("al"));
    EXPECT_EQ(DVSState_PortFind("dvs", "p"), cached);
    EXPECT_EQ(DVSState_PortFindOnDVSwitch(sw, "p"), cached);
    EXPECT_EQ(DVSState_LocalCachePortFind("dvs", "p"), cached);
    EXPECT_EQ(DVSState_PortFindByAliasOnDVS(sw, "al"), cached);
    EXPECT_EQ(DVSState_PortFindByAlias("sw", "al"), nullptr);
    DVSPort *active = AddPort(sw, "p", DVS_PORT_ACTIVE, Alias("al"));
    EXPECT_EQ(DVSState_PortFind("dvs", "p"), active);
    EXPECT_EQ(DVSState_PortFindByAliasOnDVS(sw, "al"), active);
    EXPECT_EQ(DVSState_PortFindByAlias("sw", "al"), active);
}

TEST_F(PortFind, KeepsKindsApart) {
    DVSwitch *sw = AddSwitch("dvs");
    Append(sw->globalPropList, {"com.orbeno.common.alias", "sw"});
    DVSPort *shadow = AddPort(sw, "p", DVS_PORT_SHADOW, Alias("al"));
    DVSPort *zombie = AddPort(sw, "p", DVS_PORT_ZOMBIE, Alias("al"));
    EXPECT_EQ(DVSState_PortFind("dvs", "p"), nullptr);
    EXPECT_EQ(DVSState_PortFindShadow("dvs", "p"), shadow);
    EXPECT_EQ(DVSState_PortFindZombie("dvs", "p"), zombie);
    EXPECT_EQ(DVSState_FindPortByIDAndType(sw, "p", 3), zombie);
    EXPECT_EQ(DVSState_PortFindByAliasType(sw, "al", 3), zombie);
    EXPECT_EQ(DVSState_PortFindShadowByAlias("sw", "al"), shadow);
}

TEST_F(PortFind, FindsASwitchWhoseIdIsTheUuidsText) {
    DVSwitch *sw = AddSwitch(kUuidId);
    EXPECT_EQ(DVSState_PortFindByUUID(kUuid, "p"), nullptr);
    DVSPort *cached = AddPort(sw, "p", DVS_PORT_LOCAL_CACHE);
    EXPECT_EQ(DVSState_PortFindByUUID(kUuid, "p"), cached);
    DVSPort *active = AddPort(sw, "p");
    EXPECT_EQ(DVSState_PortFindByUUID(kUuid, "p"), active);
    EXPECT_EQ(DVSState_PortFindShadowByUUID(kUuid, "p"), nullptr);
    DVSPort *shadow = AddPort(sw, "p", DVS_PORT_SHADOW);
    EXPECT_EQ(DVSState_PortFindShadowByUUID(kUuid, "p"), shadow);
}

TEST_F(PortFind, ReturnsNullWithoutASwitch) {
    EXPECT_EQ(DVSState_PortFind("absent", "p"), nullptr);
    EXPECT_EQ(DVSState_PortFindShadow("absent", "p"), nullptr);
    EXPECT_EQ(DVSState_PortFindByUUID(kUuid, "p"), nullptr);
    EXPECT_EQ(DVSState_PortFindByAlias("absent", "p"), nullptr);
    EXPECT_EQ(DVSState_PortFindByAliasOnDVS(nullptr, "p"), nullptr);
    DVSState_PortForEach(nullptr, nullptr, nullptr);
}

TEST_F(PortFind, FindsTheFirstAliasInSlotOrderAsText) {
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "other", DVS_PORT_ACTIVE, Alias("al2"));
    DVSPort *first = AddPort(sw, "b", DVS_PORT_ACTIVE, Alias(std::string("al\0x", 4)));
    AddPort(sw, "a", DVS_PORT_ACTIVE, Alias("al"));
    EXPECT_EQ(DVSState_PortFindByAliasType(sw, "al", DVS_PORT_ACTIVE), first);
    EXPECT_EQ(DVSState_PortFindByAliasType(sw, "absent", DVS_PORT_ACTIVE), nullptr);
}

TEST_F(PortFind, NamesAPortByItsAliasOrUnknown) {
    DVSwitch *sw = AddSwitch("dvs");
    EXPECT_STREQ(DVS_PortAlias(AddPort(sw, "a")), "unknown");
    EXPECT_STREQ(DVS_PortAlias(AddPort(sw, "b", DVS_PORT_ACTIVE, Alias("web"))), "web");
}

// Callers can change slots. A set bit without a port ends every walk, with and without an index.
TEST_F(PortFind, PortWhoseSlotACallerEmptiedIsNotFound) {
    for (const int ports : {4, 200}) {
        const std::string id = "dvs" + std::to_string(ports);
        DVSwitch *sw = AddSwitch(id);
        for (int i = 0; i < ports; ++i)
            AddPort(sw, "p" + std::to_string(i));
        for (const int emptied : {0, ports / 2, ports - 1}) {
            const std::string portId = "p" + std::to_string(emptied);
            DVSPort *port = std::exchange(sw->ports[emptied], nullptr);
            ASSERT_NE(port, nullptr);
            EXPECT_EQ(DVSState_PortFind(id.c_str(), portId.c_str()), nullptr) << ports;
            EXPECT_EQ(DVSState_PortRemove(id.c_str(), portId.c_str()), HYP_NOT_FOUND) << ports;
            sw->ports[emptied] = port;
            EXPECT_EQ(DVSState_PortFind(id.c_str(), portId.c_str()), port) << ports;
        }
    }
}

TEST_F(PortFind, WalksUntilTheCallbackStopsAndMayRemove) {
    DVSwitch *sw = AddSwitch("dvs");
    for (const char *id : {"a", "b", "c"})
        AddPort(sw, id);
    DVSState_PortForEach(
        sw,
        [](DVSPort *port, void *) {
            const std::string id = DVS_PortId(port);
            EXPECT_EQ(DVSState_PortRemove("dvs", id.c_str()), HYP_OK);
            return id == "b";
        },
        nullptr);
    EXPECT_EQ(PortsOf(sw), std::vector<std::string>{"c/1"});
}

} // namespace
