/* SPDX-License-Identifier: Apache-2.0 */
// The read-only walk over a state: items, paths, offsets, and the verdict over sound states.

#include "dvsstate/state_view.h"

#include <gtest/gtest.h>

#include "dvsstate/state_support.h"

using namespace dvs::test;
using namespace dvs::state;

namespace {

class StateViewTest : public StateTest {};

const char *NameOf(StateItemKind kind) {
    constexpr const char *kNames[] = {"state", "switch", "field", "list", "port", "property", "other", "end"};
    return kNames[static_cast<std::size_t>(kind)];
}

std::vector<std::string> Walk(const Buffer &bytes) {
    std::vector<std::string> lines;
    StateView view(bytes);
    for (StateItem item; view.Next(&item);) {
        char path[512];
        EXPECT_TRUE(item.path.Format(path));
        EXPECT_EQ(item.depth, item.path.depth);
        lines.push_back(std::string(2 * item.depth, ' ') + NameOf(item.kind) + " " + path);
    }
    return lines;
}

TEST_F(StateViewTest, GivesEveryEntryWithItsPath) {
    DVSwitch *sw = AddSwitch("dvs");
    Append(sw->globalPropList, {"mtu", U32Value(1500)});
    AddPort(sw, "p1", DVS_PORT_ACTIVE, {{"a", "1"}, {"b", "2"}});
    AddPort(sw, "p2", DVS_PORT_SHADOW);
    const std::vector<std::string> expected = {
        "state ",
        "  switch dvs",
        "    field dvs/switchVersion",
        "    field dvs/className",
        "    field dvs/maxPorts",
        "    list dvs/globalPropList",
        "      property dvs/globalPropList/mtu",
        "    end dvs/globalPropList",
        "    list dvs/hostPropList",
        "    end dvs/hostPropList",
        "    port dvs/p1",
        "      property dvs/p1/a",
        "      property dvs/p1/b",
        "    end dvs/p1",
        "    port dvs/p2",
        "      property dvs/p2/com.orbeno.common.port.volatile.type",
        "    end dvs/p2",
        "  end dvs",
        "end ",
    };
    EXPECT_EQ(Walk(StateBytes()), expected);
}

TEST_F(StateViewTest, SaysSoundOfAWrittenState) {
    BuildExample();
    const StateVerdict verdict = VerifyState(StateBytes());
    EXPECT_FALSE(verdict.first) << verdict.first.Text();
    EXPECT_EQ(verdict.sound.switches, 2u);
    EXPECT_EQ(verdict.sound.ports, 7u);
    EXPECT_EQ(verdict.sound.properties, 12u);
    EXPECT_EQ(verdict.all.properties, 12u);
}

TEST_F(StateViewTest, RoundTrips) {
    BuildExample();
    const Buffer bytes = StateBytes();
    ASSERT_EQ(DVSState_ConfigReset(), HYP_OK);
    EXPECT_EQ(LoadState(bytes), HYP_OK);
    EXPECT_EQ(StateBytes(), bytes);
}

} // namespace
