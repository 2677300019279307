/* SPDX-License-Identifier: Apache-2.0 */
// The read-only walk over a state: items, paths, offsets, and verification of valid states.

#include "dvsstate/state_view.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <optional>

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

TEST_F(StateViewTest, ReturnsEveryEntryWithItsPath) {
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

TEST_F(StateViewTest, AcceptsAWrittenState) {
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

std::string Described(const StateFault &fault) {
    char path[256], text[256];
    EXPECT_TRUE(fault.path.Format(path));
    EXPECT_TRUE(fault.Describe(text));
    return std::string(path) + " @" + std::to_string(fault.offset) + ": " + text;
}

/// The value of the entry at this path, and where it starts.
std::size_t ValueOffset(const Buffer &bytes, std::initializer_list<std::string_view> names) {
    StateView view(bytes);
    for (StateItem item; view.Next(&item);) {
        if (item.kind == StateItemKind::End || item.path.depth != names.size()) continue;
        if (std::equal(names.begin(), names.end(), item.path.names.begin())) return item.entry.ValueOffset();
    }
    ADD_FAILURE() << "no such entry";
    return 0;
}

TEST_F(StateViewTest, ReportsTheSmallestBufferAroundAWrongByte) {
    BuildExample();
    Buffer bytes = StateBytes();
    bytes[ValueOffset(bytes, {"second", "2"}) + 40] ^= 1;
    const StateVerdict verdict = VerifyState(bytes);
    EXPECT_EQ(verdict.first.Status(), HYP_BAD_CHECKSUM);
    EXPECT_EQ(verdict.first.path.depth, 0u);
    EXPECT_EQ(verdict.first.offset, 4u);
    EXPECT_EQ(verdict.located.path.depth, 2u);
    EXPECT_EQ(verdict.located.path.names[1], "2");
    EXPECT_EQ(verdict.located.offset, ValueOffset(bytes, {"second", "2"}) + 4);
    EXPECT_EQ(verdict.sound.switches, 1u);
    EXPECT_EQ(verdict.all.switches, 2u);
    EXPECT_EQ(verdict.sound.ports, 6u);
    EXPECT_EQ(verdict.all.ports, 7u);
}

Prop Nested(const std::string &name, const Props &props) {
    return {name, AsText(SerializedOf(props)), 0x10};
}

Props SwitchWith(const Props &more) {
    Props props = SwitchProps();
    props.insert(props.end(), more.begin(), more.end());
    return props;
}

std::string FirstOf(const Props &state, std::optional<std::uint32_t> host = std::nullopt) {
    return Described(VerifyState(SerializedOf(state), host).first);
}

TEST_F(StateViewTest, ReportsWhatALoadWouldRejectAndWhere) {
    const std::string kind = "com.orbeno.common.port.volatile.type";
    EXPECT_EQ(FirstOf({Nested("s", {})}), "s @12: switch has no switchVersion");
    EXPECT_EQ(FirstOf({Nested("s", {{"switchVersion", "123", 0x10}})}),
              "s/switchVersion @164: switchVersion is shorter than four bytes");
    EXPECT_EQ(FirstOf({Nested("s", {{"switchVersion", "1234", 0x10}})}), "s @12: switch has no className");
    EXPECT_EQ(FirstOf({{"s", "short", 0x10}}),
              "s @157: fewer bytes than a header and an end marker (5 bytes, at least 16 needed)");
    EXPECT_EQ(FirstOf({Nested(std::string(64, 'i'), SwitchProps())}),
              std::string(64, 'i') + " @12: switch id is longer than 63 characters");
    EXPECT_EQ(FirstOf({Nested("s", SwitchWith({Nested("p", {{kind, "12"}})}))}),
              "s/p/" + kind + " @884: port kind is shorter than four bytes");
    EXPECT_EQ(FirstOf({Nested("s", SwitchWith({Nested(std::string(48, 'p'), {})}))}),
              "s/" + std::string(48, 'p') + " @732: port id is too long for the switch version");
    EXPECT_EQ(FirstOf({Nested("s", SwitchWith({Nested("p", {}), Nested("q", {}), Nested("p", {})}))}),
              "s/p @1052: port of this id and kind is there already");
    EXPECT_EQ(
        FirstOf({Nested("s", SwitchWith({Nested("p", {})})), Nested("s", SwitchWith({Nested("p", {})}))}),
        "s/p @1620: port of this id and kind is there already");
}

TEST_F(StateViewTest, ReportsTheOneRepeatedPortAmongMany) {
    const std::string kind = "com.orbeno.common.port.volatile.type";
    Props ports;
    for (int i = 0; i < 3000; i++)
        ports.push_back(Nested(std::to_string(i), {}));
    ports.push_back(
        Nested("1500", {{kind, U32Value(DVS_PORT_SHADOW), 0x10}})); // a different kind is a different port
    const Props twice = {Nested("s", SwitchWith(ports)), Nested("t", SwitchWith(ports))};
    EXPECT_EQ(VerifyState(SerializedOf(twice)).first.Status(), HYP_OK);
    ports.push_back(Nested("1500", {{kind, U32Value(DVS_PORT_SHADOW), 0x10}}));
    const auto state = SerializedOf({Nested("s", SwitchWith(ports))});
    const StateVerdict verdict = VerifyState(state);
    EXPECT_EQ(verdict.first.kind, StateFaultKind::PortRepeated);
    EXPECT_EQ(verdict.first.path.names[1], "1500");
    EXPECT_EQ(verdict.all.ports, 3002u);
    EXPECT_EQ(verdict.sound.ports, 3001u);
}

TEST_F(StateViewTest, ChecksTheHostsLimitsOnlyOnRequest) {
    const Props full = {Nested("s", SwitchWith({Nested("p", {}), Nested("q", {})}))};
    EXPECT_EQ(FirstOf(full, 1), "s/q @892: more ports than the switch or the host may have");
    EXPECT_EQ(FirstOf(full, 2), " @0: no fault");
    EXPECT_EQ(FirstOf(full), " @0: no fault");
    EXPECT_EQ(FirstOf({Nested("s", SwitchProps(9, "other", 5))}, 4),
              "s @12: port limit of the switch exceeds the host's free ports");
    Props many;
    for (int i = 0; i < 33; i++)
        many.push_back(Nested("s" + std::to_string(i), SwitchProps()));
    const auto state = SerializedOf(many); // the result's names point into it
    const StateVerdict verdict = VerifyState(state, 100);
    EXPECT_STREQ(verdict.first.Text(), "more switches than the table holds");
    EXPECT_EQ(verdict.first.Status(), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(verdict.first.path.names[0], "s32");
    EXPECT_EQ(VerifyState(state).first.Status(), HYP_OK);
}

TEST_F(StateViewTest, ReturnsFieldsKindsAndDroppedEntries) {
    Props props =
        SwitchWith({Nested("p", {{"com.orbeno.common.port.volatile.type", U32Value(3)}}), Nested("q", {})});
    props.back().type = 1;
    const Buffer bytes = SerializedOf({Nested("s", props)});
    StateView view(bytes);
    int others = 0, ports = 0;
    for (StateItem item; view.Next(&item);) {
        if (item.kind == StateItemKind::Switch) {
            EXPECT_EQ(item.sw.version, kVersion);
            EXPECT_EQ(item.sw.maxPorts, 64u);
            EXPECT_EQ(item.sw.className, "vswitch");
        } else if (item.kind == StateItemKind::Port) {
            ports++;
            EXPECT_EQ(item.portKind, 3u);
        } else if (item.kind == StateItemKind::Other) {
            others++;
            EXPECT_TRUE(item.dropped);
            EXPECT_EQ(item.path.names[1], "q");
        }
    }
    EXPECT_EQ(ports, 1);
    EXPECT_EQ(others, 1);
}

TEST_F(StateViewTest, SkipsTheContentsOfAnItem) {
    BuildExample();
    const Buffer bytes = StateBytes();
    StateView view(bytes);
    int items = 0;
    for (StateItem item; view.Next(&item); items++)
        if (item.kind == StateItemKind::Switch) view.Skip();
    EXPECT_EQ(items, 6); // the state, two switches, and the end of each
}

TEST_F(StateViewTest, TruncatesTextsToTheAvailableRoom) {
    StatePath path;
    path.names = {"switch", "port"};
    path.depth = 2;
    char room[8];
    EXPECT_FALSE(path.Format(room));
    EXPECT_STREQ(room, "switch/");
    EXPECT_FALSE(path.Format({}));
    const StateFault fault{StateFaultKind::PortIdLong, 0, path, {}};
    EXPECT_FALSE(fault.Describe(room));
    EXPECT_STREQ(room, "port id");
}

} // namespace
