/* SPDX-License-Identifier: Apache-2.0 */
// Ports of a switch: limits, kinds, slots, and every message of adding and removing them.

#include "dvsstate/port_table.h"

#include "dvsstate/state_support.h"
#include "platform/runtime.h"

using namespace dvs::test;
using dvs::state::DVSStatePortAdd;
using dvs::state::DVSStatePortRemove;

namespace {

class PortTable : public StateTest {};

using Lines = std::vector<std::string>;

TEST_F(PortTable, LimitsIdLengthByTheSwitchVersion) {
    DVSwitch *old = AddSwitch("old", 6);
    EXPECT_EQ(TryAddPort(old, std::string(16, 'p')), HYP_BAD_PARAM);
    EXPECT_EQ(TryAddPort(old, std::string(15, 'p')), HYP_OK);
    DVSwitch *recent = AddSwitch("recent", 7);
    EXPECT_EQ(TryAddPort(recent, std::string(47, 'p')), HYP_OK);
    StateMessages messages(0);
    EXPECT_EQ(TryAddPort(recent, std::string(48, 'p')), HYP_BAD_PARAM);
    EXPECT_EQ(messages.Take(), Lines{"DVSStatePortAdd " + std::string(48, 'p') + ", id length too long\n"});
    EXPECT_EQ(PortsOf(recent), Lines{std::string(47, 'p') + "/1"});
}

TEST_F(PortTable, AllowsAnIdOncePerKindAndReturnsTheFirst) {
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "other");
    DVSPort *first = AddPort(sw, "p");
    EXPECT_EQ(TryAddPort(sw, "p", DVS_PORT_SHADOW), HYP_OK);
    StateMessages messages(0);
    DVSPort *existing = nullptr;
    EXPECT_EQ(TryAddPort(sw, "p", DVS_PORT_ACTIVE, &existing), HYP_EXISTS);
    EXPECT_EQ(existing, first);
    // The message swaps slot and kind. Both are 1 above; a shadow port shows the swap.
    EXPECT_EQ(TryAddPort(sw, "p", DVS_PORT_SHADOW), HYP_EXISTS);
    EXPECT_EQ(messages.Take(), (Lines{"DVSStatePortAdd port p type 1[1] exists.\n",
                                      "DVSStatePortAdd port p type 2[2] exists.\n"}));
    EXPECT_EQ(TryAddPort(sw, "other", DVS_PORT_ACTIVE), HYP_EXISTS);
}

TEST_F(PortTable, MessageSwapsSlotAndKind) {
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "p", DVS_PORT_LOCAL_CACHE);
    StateMessages messages(0);
    EXPECT_EQ(TryAddPort(sw, "p", DVS_PORT_LOCAL_CACHE), HYP_EXISTS);
    EXPECT_EQ(messages.Take(), Lines{"DVSStatePortAdd port p type 0[4] exists.\n"});
}

TEST_F(PortTable, AllowsZombiesToRepeatAnId) {
    DVSwitch *sw = AddSwitch("dvs");
    DVSPort *first = AddPort(sw, "z", DVS_PORT_ZOMBIE);
    DVSPort *second = AddPort(sw, "z", DVS_PORT_ZOMBIE);
    EXPECT_EQ(DVSState_PortFindZombie("dvs", "z"), first);
    EXPECT_EQ(DVSState_PortRemoveZombie("dvs", "z"), HYP_OK);
    EXPECT_EQ(DVSState_PortFindZombie("dvs", "z"), second);
}

TEST_F(PortTable, EnforcesTheSwitchsLimit) {
    DVSwitch *sw = AddLimitedSwitch("dvs", 2);
    AddPort(sw, "a");
    AddPort(sw, "a", DVS_PORT_SHADOW);
    StateMessages messages(0);
    EXPECT_EQ(TryAddPort(sw, "b"), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(messages.Take(), Lines{"DVSStatePortAdd dvs, switch has already used up max num ports (2)\n"});
}

TEST_F(PortTable, EnforcesTheHostsLimitForEverySwitch) {
    SetHostPorts(3);
    DVSwitch *first = AddSwitch("first");
    DVSwitch *second = AddLimitedSwitch("second", 2);
    AddPort(first, "a");
    AddPort(first, "b");
    AddPort(second, "a");
    StateMessages messages(0);
    EXPECT_EQ(TryAddPort(first, "c"), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(TryAddPort(second, "c"), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(messages.Take(),
              (Lines{"DVSStatePortAdd first, host has already used up max num ports (3)\n",
                     "DVSStatePortAdd second, host has already used up max num ports (3)\n"}));
}

TEST_F(PortTable, RejectsPortsOnALimitBelowOne) {
    DVSwitch *sw = AddSwitch("dvs");
    StateMessages messages(0);
    for (const std::uint32_t limit : {0u, 0x80000000u}) {
        sw->maxPorts = limit;
        EXPECT_EQ(TryAddPort(sw, "p"), HYP_LIMIT_EXCEEDED);
        EXPECT_EQ(messages.Take(), Lines{"DVSStatePortAdd limit exceeded for port p \n"});
    }
}

TEST_F(PortTable, ScansUpToTheLimitWithinTheRecord) {
    SetHostPorts(4);
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "a");
    AddPort(sw, "b");
    sw->maxPorts = 1;
    StateMessages messages(0);
    EXPECT_EQ(TryAddPort(sw, "b"), HYP_LIMIT_EXCEEDED); // the existing one is beyond the limit
    EXPECT_EQ(messages.Take(), Lines{"DVSStatePortAdd limit exceeded for port b \n"});
    sw->maxPorts = 1000;
    uwMaxNumActivePortsSystemWide = 1000;
    AddPort(sw, "c");
    AddPort(sw, "d");
    EXPECT_EQ(TryAddPort(sw, "e"), HYP_LIMIT_EXCEEDED); // four slots, regardless of the limits
    uwMaxNumActivePortsSystemWide = 4;
}

TEST_F(PortTable, RejectsMissingSwitchAndMissingData) {
    StateMessages messages(0);
    EXPECT_EQ(DVSState_PortAdd("absent", "p", nullptr), HYP_NOT_FOUND);
    EXPECT_EQ(DVSState_PortRemove("absent", "p"), HYP_NOT_FOUND);
    EXPECT_EQ(messages.Take(), (Lines{"Error: sw is NULL.\n", "Null DVS handle\n"}));
    AddSwitch("dvs");
    EXPECT_EQ(DVSState_PortAdd("dvs", "p", nullptr), HYP_BAD_PARAM);
    EXPECT_EQ(messages.Take(), Lines{"DVSStatePortAdd data is NULL when adding port p \n"});
}

TEST_F(PortTable, KeepsPortsOfOtherKindsWhenRemoving) {
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "p", DVS_PORT_SHADOW);
    EXPECT_EQ(DVSState_PortRemove("dvs", "p"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSState_PortRemoveZombie("dvs", "p"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSState_LocalCachePortRemove("dvs", "p"), HYP_NOT_FOUND);
    EXPECT_EQ(PortsOf(sw), Lines{"p/2"});
    EXPECT_EQ(DVSState_PortRemoveShadow("dvs", "p"), HYP_OK);
    EXPECT_TRUE(PortsOf(sw).empty());
}

TEST_F(PortTable, FillsTheFirstFreeSlotAndTracesAddAndRemove) {
    DVSwitch *sw = AddSwitch("dvs");
    for (const char *id : {"a", "b", "c"})
        AddPort(sw, id);
    StateMessages messages(1);
    EXPECT_EQ(DVSState_PortRemove("dvs", "b"), HYP_OK);
    EXPECT_EQ(sw->ports[1], nullptr);
    EXPECT_FALSE(BitVector_IsSet(sw->portBitmap, 1));
    EXPECT_EQ(sw->numPorts, 2u);
    EXPECT_EQ(DVSState_LocalCachePortAdd("dvs", "d", HeapList()), HYP_OK);
    EXPECT_EQ(messages.Take(), (Lines{"DVSState_PortRemove dvs, b\n", "DVSStatePortAdd dvs, d\n"}));
    EXPECT_EQ(PortsOf(sw), (Lines{"a/1", "d/4", "c/1"}));
    EXPECT_EQ(sw->ports[1]->owner, sw);
}

TEST_F(PortTable, AddsShadowPortsFromSerializedData) {
    DVSwitch *sw = AddSwitch("dvs");
    const Buffer bytes = SerializedOf({{"name", "value"}});
    StateMessages messages(1);
    EXPECT_EQ(DVSState_PortAddShadow("dvs", "p", bytes.data(), static_cast<std::uint32_t>(bytes.size())),
              HYP_OK);
    EXPECT_EQ(messages.Take(), (Lines{"DVSState_PortAddShadow dvs, p\n", "DVSStatePortAdd dvs, p\n"}));
    EXPECT_EQ(ContentOf(DVSState_PortFindShadow("dvs", "p")->portData), (Props{{"name", "value"}}));
    EXPECT_EQ(DVSState_PortAddShadow("dvs", "p", bytes.data(), static_cast<std::uint32_t>(bytes.size())),
              HYP_EXISTS);
    EXPECT_EQ(DVSState_PortAddShadow("absent", "p", bytes.data(), 10), HYP_BAD_PARAM);
    EXPECT_EQ(DVSState_PortAddShadow("absent", "p", bytes.data(), static_cast<std::uint32_t>(bytes.size())),
              HYP_NOT_FOUND);
    EXPECT_EQ(PortsOf(sw), Lines{"p/2"});
}

TEST_F(PortTable, WalkEndsAtASetBitWithoutAPort) {
    DVSwitch *sw = AddSwitch("dvs");
    for (const char *id : {"a", "b", "c"})
        AddPort(sw, id);
    DVSPort *hidden = std::exchange(sw->ports[1], nullptr);
    EXPECT_EQ(PortsOf(sw), Lines{"a/1"});
    EXPECT_EQ(DVSState_PortFind("dvs", "c"), nullptr);
    EXPECT_EQ(DVSState_PortRemove("dvs", "c"), HYP_NOT_FOUND);
    sw->ports[1] = hidden;
    EXPECT_NE(DVSState_PortFind("dvs", "c"), nullptr);
}

// From 64 used slots, lookups use an index. Results must not change.
TEST_F(PortTable, GivesTheSameResultsWithAnIndex) {
    SetHostPorts(300);
    DVSwitch *sw = AddSwitch("dvs");
    for (int i = 0; i < 299; i++)
        AddPort(sw, "p" + std::to_string(i));
    for (int i = 0; i < 299; i++)
        ASSERT_EQ(DVSState_PortFind("dvs", ("p" + std::to_string(i)).c_str()), sw->ports[i]);
    EXPECT_EQ(DVSState_PortFind("dvs", "p299"), nullptr);
    EXPECT_EQ(TryAddPort(sw, "p298"), HYP_EXISTS);
    EXPECT_EQ(DVSState_PortRemove("dvs", "p7"), HYP_OK);
    EXPECT_EQ(DVSState_PortRemove("dvs", "p5"), HYP_OK);
    AddPort(sw, "p298", DVS_PORT_SHADOW);
    EXPECT_EQ(sw->ports[5]->portType, 2u);
    sw->ports[5]->portType = DVS_PORT_ACTIVE; // callers may do this: now it precedes the other of that id
    EXPECT_EQ(DVSState_PortFind("dvs", "p298"), sw->ports[5]);
    sw->ports[5]->portType = 0;
    EXPECT_EQ(DVSState_PortFind("dvs", "p298"), sw->ports[298]);
    EXPECT_EQ(DVSState_FindPortByIDAndType(sw, "p298", 0), sw->ports[5]);
    sw->maxPorts = 298;
    EXPECT_EQ(TryAddPort(sw, "p298"), HYP_OK); // the first one is now beyond the limit
    EXPECT_STREQ(DVS_PortId(sw->ports[7]), "p298");
    EXPECT_EQ(TryAddPort(sw, "more"), HYP_LIMIT_EXCEEDED);
}

} // namespace
