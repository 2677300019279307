/* SPDX-License-Identifier: Apache-2.0 */
// The switch table: limits, classes, versions, finding and walking switches, and every message of these.

#include <cstring>
#include <thread>

#include "dvsstate/state_support.h"
#include "dvsstate/switch_table.h"
#include "platform/embedded/host_limits.h"
#include "platform/runtime.h"

using namespace dvs::test;

namespace {

class SwitchTable : public StateTest {};

using Lines = std::vector<std::string>;

TEST_F(SwitchTable, AcceptsAnIdOf63CharactersAndRejects64) {
    StateMessages messages(0);
    EXPECT_EQ(DVSState_SwitchAdd(std::string(63, 'a').c_str(), "vswitch", 1, 9), HYP_OK);
    EXPECT_TRUE(messages.All().empty());
    const std::string tooLong(64, 'a');
    EXPECT_EQ(DVSState_SwitchAdd(tooLong.c_str(), "vswitch", 1, 9), HYP_BAD_PARAM);
    EXPECT_EQ(messages.Take(), Lines{"DVSState_SwitchAdd " + tooLong + ", id length too long\n"});
}

TEST_F(SwitchTable, RejectsThe33rdSwitchAndADuplicateId) {
    for (int i = 0; i < 32; i++)
        AddSwitch("dvs" + std::to_string(i));
    StateMessages messages(0);
    EXPECT_EQ(DVSState_SwitchAdd("one more", "vswitch", 1, 9), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(messages.Take(), Lines{"DVSState_SwitchAdd failed DVS:one more Error: Limit exceeded\n"});
    EXPECT_EQ(DVSState_SwitchAdd("dvs31", "vswitch", 1, 9), HYP_EXISTS);
    EXPECT_EQ(messages.Take(), Lines{"DVSState_SwitchAdd failed DVS:dvs31 Error: Already exists\n"});
}

TEST_F(SwitchTable, FillsTheFirstFreeSlot) {
    for (const char *id : {"a", "b", "c"})
        AddSwitch(id);
    EXPECT_EQ(DVSState_SwitchRemove("b"), HYP_OK);
    AddSwitch("d");
    EXPECT_EQ(SwitchIds(), (Lines{"a", "d", "c"}));
}

TEST_F(SwitchTable, SetsTheHostsLimitAndFlagsOfTheFiveClasses) {
    SetHostPorts(100);
    const struct {
        const char *name;
        std::uint32_t flags, maxPorts;
    } kClasses[] = {
        {"ovlvswitch", 3, 100}, {"etherswitch", 1, 100}, {"stub-vswitch", 1, 100}, {"cswitch", 1, 100},
        {"vswitch", 1, 100},    {"vswitch2", 0, 10},     {"vswitc", 0, 10},        {"", 0, 10},
    };
    for (const auto &row : kClasses) {
        ASSERT_EQ(DVSState_SwitchAdd(row.name, row.name, 10, 9), HYP_OK);
        DVSwitch *sw = DVSState_SwitchFind(row.name);
        EXPECT_EQ(sw->classFlags, row.flags) << row.name;
        EXPECT_EQ(sw->maxPorts, row.maxPorts) << row.name;
        EXPECT_EQ(sw->newMaxPorts, row.maxPorts) << row.name;
    }
}

TEST_F(SwitchTable, RejectsALimitAboveTheHostsFreePorts) {
    SetHostPorts(10);
    AddPort(AddSwitch("first"), "p");
    StateMessages messages(0);
    EXPECT_EQ(DVSState_SwitchAdd("second", "other", 10, 9), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(messages.Take(), Lines{"DVSState_SwitchAdd second, failed with maxPorts exceed 10.\n"});
    EXPECT_EQ(DVSState_SwitchAdd("second", "other", 9, 9), HYP_OK);
}

TEST_F(SwitchTable, StartsASwitchEmpty) {
    SetHostPorts(70);
    StateMessages messages(1);
    ASSERT_EQ(DVSState_SwitchAdd("dvs", std::string(200, 'c').c_str(), 5, 77), HYP_OK);
    EXPECT_EQ(messages.Take(), Lines{"DVSState_SwitchAdd dvs, " + std::string(200, 'c') + ", 5\n"});
    DVSwitch *sw = DVSState_SwitchFind("dvs");
    EXPECT_STREQ(DVS_SwitchId(sw), "dvs");
    EXPECT_EQ(DVS_ClassName(sw), std::string(127, 'c'));
    EXPECT_EQ(DVS_Version(sw), 77u);
    EXPECT_EQ(DVS_GetMaxPorts(sw), 5u);
    EXPECT_EQ(sw->numPorts, 0u);
    EXPECT_EQ(sw->globalPropList->serialSize, 16u);
    EXPECT_EQ(sw->hostPropList->serialSize, 16u);
    for (std::uint32_t slot = 0; slot < 70; slot++) {
        EXPECT_EQ(sw->ports[slot], nullptr);
        EXPECT_FALSE(BitVector_IsSet(sw->portBitmap, slot));
    }
}

TEST_F(SwitchTable, AppliesThePendingLimitOnRequest) {
    DVSwitch *sw = AddLimitedSwitch("dvs", 4);
    sw->newMaxPorts = 7;
    EXPECT_EQ(DVS_GetMaxPorts(sw), 4u);
    EXPECT_EQ(DVS_GetNewMaxPorts(sw), 7u);
    EXPECT_EQ(DVS_UpdateMaxPorts(sw), 7u);
    EXPECT_EQ(DVS_GetMaxPorts(sw), 7u);
}

TEST_F(SwitchTable, TruncatesAClassNameAndClearsTheRest) {
    DVSwitch *sw = AddSwitch("dvs");
    DVS_SetClassName(sw, std::string(300, 'x').c_str());
    EXPECT_EQ(DVS_ClassName(sw), std::string(127, 'x'));
    DVS_SetClassName(sw, "short");
    EXPECT_EQ(std::string(sw->className, 128), std::string("short") + std::string(123, '\0'));
}

TEST_F(SwitchTable, AcceptsSupportedVersionsOnly) {
    AddSwitch("dvs", 1);
    for (const std::uint32_t version : {4u, 5u, 12u, 100u, 107u, 112u}) {
        EXPECT_EQ(DVSState_SwitchSetVersion("dvs", version), HYP_OK);
        EXPECT_EQ(DVS_Version(DVSState_SwitchFind("dvs")), version);
    }
    for (const std::uint32_t version : {0u, 3u, 13u, 99u, 101u, 106u, 113u, 0xffffffffu})
        EXPECT_EQ(DVSState_SwitchSetVersion("dvs", version), HYP_NOT_SUPPORTED);
    EXPECT_EQ(DVS_Version(DVSState_SwitchFind("dvs")), 112u);
    EXPECT_EQ(DVSState_SwitchSetVersion("absent", 9), HYP_NOT_FOUND);
}

TEST_F(SwitchTable, PrintsTheVersionItSets) {
    AddSwitch("dvs", 9);
    StateMessages messages(0);
    (void)DVSState_SwitchSetVersion("dvs", 12);
    (void)DVSState_SwitchSetVersion("dvs", 99);
    EXPECT_EQ(messages.Take(), (Lines{"Set DVS dvs version from 9 to 12\n", "DVS version not support 99\n"}));
}

TEST_F(SwitchTable, NamesASwitchByItsAliasOrUnknown) {
    DVSwitch *sw = AddSwitch("dvs");
    EXPECT_STREQ(DVS_SwitchName(sw), "unknown");
    Append(sw->globalPropList, {"com.orbeno.common.alias", "no terminator"});
    EXPECT_STREQ(DVS_SwitchName(sw), "no terminator");
    DVSData_Free(sw->globalPropList);
    sw->globalPropList = nullptr;
    EXPECT_STREQ(DVS_SwitchName(sw), "unknown");
}

TEST_F(SwitchTable, FindsByIdAliasAndUuid) {
    DVSwitch *first = AddSwitch("first");
    DVSwitch *second = AddSwitch("00 01 02 03 04 05 06 07-08 09 0a 0b 0c 0d 0e 0f");
    Append(first->globalPropList, {"com.orbeno.common.alias", "alias"});
    Append(second->globalPropList, {"com.orbeno.common.alias", std::string("alias\0more", 10)});
    EXPECT_EQ(DVSState_SwitchFind("first"), first);
    EXPECT_EQ(DVSState_SwitchFind("First"), nullptr);
    EXPECT_EQ(DVSState_SwitchFindByAlias("alias"), first);
    EXPECT_EQ(DVSState_SwitchFindByAlias("alia"), nullptr);
    EXPECT_EQ(DVSState_SwitchFindByAlias("alias2"), nullptr);
    EXPECT_EQ(DVSState_SwitchRemove("first"), HYP_OK);
    EXPECT_EQ(DVSState_SwitchFindByAlias("alias"), second);
    std::uint8_t uuid[16];
    for (std::uint8_t i = 0; i < 16; i++)
        uuid[i] = i;
    EXPECT_EQ(DVSState_SwitchFindByUUID(uuid), second);
    uuid[0] = 0xff;
    EXPECT_EQ(DVSState_SwitchFindByUUID(uuid), nullptr);
}

TEST_F(SwitchTable, WalksUntilTheCallbackStops) {
    for (const char *id : {"a", "b", "c"})
        AddSwitch(id);
    std::string seen;
    DVSState_SwitchForEach(
        [](DVSwitch *sw, void *arg) {
            *static_cast<std::string *>(arg) += DVS_SwitchId(sw);
            return std::strcmp(DVS_SwitchId(sw), "b") == 0;
        },
        &seen);
    EXPECT_EQ(seen, "ab");
}

TEST_F(SwitchTable, SurvivesACallbackThatRemovesSwitches) {
    for (const char *id : {"a", "b", "c"})
        AddSwitch(id);
    DVSState_SwitchForEach(
        [](DVSwitch *, void *) {
            (void)DVSState_SwitchRemove("a");
            (void)DVSState_SwitchRemove("b");
            return false;
        },
        nullptr);
    EXPECT_EQ(SwitchIds(), Lines{"c"});
}

TEST_F(SwitchTable, RemovesASwitchWithItsPorts) {
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "p");
    AddPort(sw, "p", DVS_PORT_SHADOW);
    EXPECT_EQ(HostPortCount(), 2u);
    StateMessages messages(1);
    EXPECT_EQ(DVSState_SwitchRemove("dvs"), HYP_OK);
    EXPECT_EQ(messages.Take(), (Lines{"DVSState_SwitchRemove dvs\n", "DVSState_PortRemove dvs, p\n",
                                      "DVSState_PortRemove dvs, p\n"}));
    EXPECT_EQ(HostPortCount(), 0u);
    EXPECT_EQ(DVSState_SwitchRemove("dvs"), HYP_NOT_FOUND);
    EXPECT_EQ(messages.Take(),
              (Lines{"DVSState_SwitchRemove dvs\n", "DVSState_SwitchRemove DVSID dvs, statue Not found\n"}));
}

TEST_F(SwitchTable, ReadsTheHostsLimitOnceAtTheFirstAdd) {
    SetHostPorts(12);
    EXPECT_EQ(uwMaxNumActivePortsSystemWide, 0u);
    AddSwitch("first");
    EXPECT_EQ(uwMaxNumActivePortsSystemWide, 12u);
    SetHostPorts(50);
    EXPECT_EQ(AddSwitch("second")->maxPorts, 12u);
}

TEST_F(SwitchTable, FailsWhenTheHostsLimitIsUnreadable) {
    setenv("DVS_MAX_PORTS", "many", 1);
    StateMessages messages(0);
    EXPECT_EQ(DVSState_SwitchAdd("dvs", "vswitch", 1, 9), HYP_BAD_PARAM);
    EXPECT_EQ(messages.Take(),
              Lines{"DVSState_SwitchAdd dvs, failed to get max ports systemwide. Error: Bad parameter\n"});
    unsetenv("DVS_MAX_PORTS");
    EXPECT_EQ(DVSState_SwitchAdd("dvs", "vswitch", 1, 9), HYP_OK);
}

TEST_F(SwitchTable, LockIsRecursiveAndReleasingANullLockIsANoOp) {
    MXUserRecLock *outer = DVSwitchHandleLock();
    MXUserRecLock *inner = DVSwitchHandleLock();
    EXPECT_NE(outer, nullptr);
    EXPECT_EQ(outer, inner);
    DVSwitchHandleUnlock(inner);
    DVSwitchHandleUnlock(outer);
    DVSwitchHandleUnlock(nullptr);
}

TEST_F(SwitchTable, SupportsLookupsAndChangesFromSeveralThreads) {
    AddSwitch("stays");
    std::vector<std::thread> threads;
    for (int worker = 0; worker < 4; worker++) {
        threads.emplace_back([worker] {
            const std::string id = "worker" + std::to_string(worker);
            for (int round = 0; round < 50; round++) {
                EXPECT_EQ(DVSState_SwitchAdd(id.c_str(), "vswitch", 1, 9), HYP_OK);
                EXPECT_NE(DVSState_SwitchFind("stays"), nullptr);
                EXPECT_EQ(DVSState_SwitchFindByAlias("nobody"), nullptr);
                EXPECT_EQ(DVSState_SwitchRemove(id.c_str()), HYP_OK);
            }
        });
    }
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(SwitchIds(), Lines{"stays"});
}

TEST_F(SwitchTable, ChangesToOneSwitchAreSafeUnderTheHeldLock) {
    AddSwitch("dvs");
    std::vector<std::thread> threads;
    for (int worker = 0; worker < 4; worker++) {
        threads.emplace_back([worker] {
            for (int round = 0; round < 50; round++) {
                const std::string id = std::to_string(worker) + "-" + std::to_string(round);
                const dvs::state::StateLock lock;
                EXPECT_EQ(TryAddPort(DVSState_SwitchFind("dvs"), id), HYP_OK);
                EXPECT_NE(DVSState_PortFind("dvs", id.c_str()), nullptr);
                EXPECT_TRUE(round % 2 || DVSState_PortRemove("dvs", id.c_str()) == HYP_OK);
            }
        });
    }
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(PortsOf(DVSState_SwitchFind("dvs")).size(), 100u);
}

} // namespace
