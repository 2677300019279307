/* SPDX-License-Identifier: Apache-2.0 */
// Reset, strip, swap and free over the whole table.

#include <cstring>
#include <utility>

#include "dvsstate/state_support.h"

using namespace dvs::test;

namespace {

using Lines = std::vector<std::string>;

class SwitchSwap : public StateTest {
protected:
    void MarkNotPersisted(const char *id, const std::string &flag = "\1") {
        Append(DVSState_SwitchFind(id)->globalPropList, {"com.orbeno.common.volatile.nopersist", flag});
    }
    bool Strip(bool park) { return DVSState_StripDvsWithNoPersistFlag(parked_, ids_, park); }
    void Update() { DVSState_UpdateGlobalSwsArray(parked_, ids_); }
    Lines Parked() const {
        Lines ids;
        for (DVSwitch *sw : parked_)
            ids.emplace_back(sw ? sw->switchId : "-");
        while (!ids.empty() && ids.back() == "-")
            ids.pop_back();
        return ids;
    }

    DVSwitch *parked_[32] = {};
    char ids_[32][64] = {};
};

TEST_F(SwitchSwap, ResetRemovesEverySwitch) {
    BuildExample();
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
    EXPECT_TRUE(SwitchIds().empty());
    EXPECT_EQ(HostPortCount(), 0u);
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
}

TEST_F(SwitchSwap, StripWithoutParkingOnlyRemoves) {
    for (const char *id : {"a", "b", "c"})
        AddSwitch(id);
    MarkNotPersisted("b");
    parked_[5] = DVSState_SwitchFind("a");
    EXPECT_FALSE(Strip(false));
    EXPECT_EQ(SwitchIds(), (Lines{"a", "c"}));
    EXPECT_STREQ(ids_[0], "b");
    EXPECT_TRUE(Parked().empty());
}

TEST_F(SwitchSwap, StripWithParkingEmptiesTheTable) {
    for (const char *id : {"a", "b", "c"})
        AddSwitch(id);
    MarkNotPersisted("a");
    MarkNotPersisted("c", std::string("\7\0", 2));
    EXPECT_TRUE(Strip(true));
    EXPECT_TRUE(SwitchIds().empty());
    EXPECT_EQ(Parked(), (Lines{"-", "b"}));
    EXPECT_STREQ(ids_[0], "a");
    EXPECT_STREQ(ids_[1], "c");
    EXPECT_STREQ(ids_[2], "");
    DVSState_FreeDVSArray(parked_);
}

TEST_F(SwitchSwap, EmptyOrZeroFlagIsNotSet) {
    for (const char *id : {"a", "b", "c"})
        AddSwitch(id);
    MarkNotPersisted("a", "");
    MarkNotPersisted("b", std::string("\0\1", 2));
    DVSData_Free(std::exchange(DVSState_SwitchFind("c")->globalPropList, nullptr));
    EXPECT_FALSE(Strip(true));
    EXPECT_EQ(SwitchIds(), (Lines{"a", "b", "c"}));
}

TEST_F(SwitchSwap, StoredCopiesReplaceRemovedSwitches) {
    for (const char *id : {"a", "b", "c"})
        AddSwitch(id);
    MarkNotPersisted("a");
    MarkNotPersisted("c");
    ASSERT_TRUE(Strip(true));
    for (const char *id : {"other", "c", "a"})
        AddSwitch(id, 12); // the stored state
    Update();
    EXPECT_EQ(SwitchIds(), (Lines{"a", "b", "c"}));
    EXPECT_EQ(DVSState_SwitchFind("a")->version, 12u);
    EXPECT_EQ(DVSState_SwitchFind("b")->version, kVersion);
    EXPECT_EQ(Parked(), Lines{"other"});
    // Freeing the leftover switches empties the table too.
    DVSState_FreeDVSArray(parked_);
    EXPECT_TRUE(SwitchIds().empty());
}

TEST_F(SwitchSwap, SwitchStaysInPlaceWhenNoSlotRemains) {
    for (int i = 0; i < 32; i++)
        AddSwitch("p" + std::to_string(i));
    MarkNotPersisted("p3");
    ASSERT_TRUE(Strip(true));
    AddSwitch("p3");
    AddSwitch("x");
    std::strcpy(ids_[1], "x");
    Update();
    EXPECT_EQ(SwitchIds().size(), 32u);
    EXPECT_EQ(Parked(), (Lines{"-", "x"}));
    DVSState_FreeDVSArray(parked_);
}

TEST_F(SwitchSwap, UnterminatedRowsAreReadToTheirEnd) {
    AddSwitch(std::string(63, 'a'));
    std::memset(ids_[0], 'a', sizeof ids_[0]);
    Update();
    EXPECT_TRUE(SwitchIds().empty());
    EXPECT_EQ(Parked(), Lines{std::string(63, 'a')});
    DVSState_FreeDVSArray(parked_);
}

TEST_F(SwitchSwap, FreeEmptiesTableAndArray) {
    AddPort(AddSwitch("parked"), "p");
    Update(); // matches no id, so it swaps the arrays
    AddPort(AddSwitch("global"), "p");
    EXPECT_EQ(Parked(), Lines{"parked"});
    DVSState_FreeDVSArray(parked_);
    EXPECT_TRUE(SwitchIds().empty());
    EXPECT_EQ(HostPortCount(), 0u);
}

} // namespace
