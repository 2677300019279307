/* SPDX-License-Identifier: Apache-2.0 */
// Loading ports, switches and states: what is accepted, merged and rejected, and every message.

#include <algorithm>

#include "dvsstate/state_support.h"

using namespace dvs::test;

namespace {

class StateDeserialize : public StateTest {};

using Lines = std::vector<std::string>;

const std::string kKind = "com.orbeno.common.port.volatile.type";

Prop Nested(const std::string &name, const Props &props) {
    return {name, AsText(SerializedOf(props)), 0x10};
}

/// A switch's properties, followed by `more`.
Props With(Props props, const Props &more) {
    props.insert(props.end(), more.begin(), more.end());
    return props;
}

/// The fixed fields except one.
Props Without(const std::string &name) {
    Props props = SwitchProps();
    std::erase_if(props, [&](const Prop &prop) { return prop.name == name; });
    return props;
}

HYP_ReturnStatus LoadSwitch(const std::string &id, const Props &props) {
    const ExactBlock block(SerializedOf(props));
    return DVSState_SwitchDeserialize(id.c_str(), block.data(), block.size());
}

HYP_ReturnStatus LoadPort(DVSwitch *sw, const std::string &id, const Props &props) {
    const ExactBlock block(SerializedOf(props));
    return DVSState_PortAddDeserialize(sw, id.c_str(), block.data(), block.size());
}

TEST_F(StateDeserialize, RestoresAShadowPortWithoutItsKindProperty) {
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "p");
    AddPort(sw, "p", DVS_PORT_SHADOW, {{"a", "1"}});
    const Buffer bytes = StateBytes();
    ASSERT_EQ(DVSState_ConfigReset(), HYP_OK);
    EXPECT_EQ(LoadState(bytes), HYP_OK);
    EXPECT_EQ(PortsOf(DVSState_SwitchFind("dvs")), (Lines{"p/1", "p/2"}));
    EXPECT_EQ(ContentOf(DVSState_PortFindShadow("dvs", "p")->portData), (Props{{"a", "1"}}));
}

TEST_F(StateDeserialize, TruncatesUnterminatedNamesAndRejectsThemAsIds) {
    const std::string name(127, 'n');
    const auto without = [&](Buffer buffer) {
        const auto field = std::search(buffer.begin(), buffer.end(), name.begin(), name.end());
        field[127] = 'n';
        Mend(&buffer);
        return ExactBlock(buffer);
    };
    const ExactBlock sw = without(SerializedOf(With(SwitchProps(), {Nested(name, {})})));
    StateMessages messages(0);
    EXPECT_EQ(DVSState_SwitchDeserialize("dvs", sw.data(), sw.size()), HYP_BAD_PARAM);
    EXPECT_TRUE(std::ranges::count(messages.Take(), "DVSStatePortAdd " + name + ", id length too long\n"));
    const ExactBlock state = without(SerializedOf({Nested(name, SwitchProps())}));
    EXPECT_EQ(DVSState_ConfigDeserialize(state.data(), state.size()), HYP_BAD_PARAM);
    EXPECT_TRUE(std::ranges::count(messages.Take(), "DVSState_SwitchAdd " + name + ", id length too long\n"));
}

TEST_F(StateDeserialize, AcceptsPortsOfAnyKindAndPrintsEach) {
    DVSwitch *sw = AddSwitch("dvs");
    StateMessages messages(0);
    EXPECT_EQ(LoadPort(sw, "a", {}), HYP_OK);
    EXPECT_EQ(LoadPort(sw, "a", {}), HYP_EXISTS);
    EXPECT_EQ(LoadPort(sw, "z", {{kKind, U32Value(3)}}), HYP_OK);
    EXPECT_EQ(LoadPort(sw, "z", {{kKind, U32Value(3)}}), HYP_OK);
    EXPECT_EQ(LoadPort(sw, "odd", {{kKind, U32Value(77) + "more"}}), HYP_OK); // kept unchanged
    EXPECT_EQ(messages.Take(),
              (Lines{"Add active DV port a, return Success\n", "DVSStatePortAdd port a type 0[1] exists.\n",
                     "Add active DV port a, return Already exists\n",
                     "Deserialize DV port(type 3) z, return Success\n",
                     "Deserialize DV port(type 3) z, return Success\n",
                     "Deserialize DV port(type 77) odd, return Success\n"}));
    EXPECT_EQ(PortsOf(sw), (Lines{"a/1", "z/3", "z/3", "odd/77"}));
}

TEST_F(StateDeserialize, RejectsAPortKindOfLessThanFourBytes) {
    DVSwitch *sw = AddSwitch("dvs");
    EXPECT_EQ(LoadPort(sw, "p", {{kKind, "\1\0\0"}}), HYP_BAD_PARAM);
    EXPECT_TRUE(PortsOf(sw).empty());
}

TEST_F(StateDeserialize, PortNeedsSwitchAndValidData) {
    const Buffer bytes = SerializedOf({});
    EXPECT_EQ(DVSState_PortDeserialize("absent", "p", bytes.data(), 16), HYP_NOT_FOUND);
    AddSwitch("dvs");
    EXPECT_EQ(DVSState_PortDeserialize("dvs", "p", bytes.data(), 15), HYP_BAD_PARAM);
    EXPECT_EQ(DVSState_PortDeserialize("dvs", "p", nullptr, 16), HYP_BAD_PARAM);
    StateMessages messages(2);
    EXPECT_EQ(DVSState_PortDeserialize("dvs", "p", bytes.data(), 16), HYP_OK);
    EXPECT_EQ(messages.Take(), (Lines{"Deserialize dvs, p\n", "DVSStatePortAdd dvs, p\n",
                                      "Add active DV port p, return Success\n"}));
}

TEST_F(StateDeserialize, CreatesASwitchFromItsFields) {
    StateMessages messages(1);
    EXPECT_EQ(LoadSwitch("dvs", With(SwitchProps(12, "other", 5),
                                     {Nested("hostPropList", {{"h", "1"}}), Nested("p", {})})),
              HYP_OK);
    EXPECT_EQ(messages.Take(),
              (Lines{"Deserialize DVS dvs\n", "Create DVS dvs with portset \n",
                     "DVSState_SwitchAdd dvs, other, 5\n", "DVSStatePortAdd dvs, p\n",
                     "Add active DV port p, return Success\n", "Deserialize dvs dvs return Success\n"}));
    DVSwitch *sw = DVSState_SwitchFind("dvs");
    EXPECT_EQ(sw->version, 12u);
    EXPECT_EQ(sw->maxPorts, 5u);
    EXPECT_STREQ(sw->className, "other");
    EXPECT_EQ(sw->globalPropList, nullptr); // absent in the buffer: the switch has none
    EXPECT_EQ(ContentOf(sw->hostPropList), (Props{{"h", "1"}}));
}

TEST_F(StateDeserialize, RejectsASwitchWithoutAField) {
    StateMessages messages(0);
    EXPECT_EQ(LoadSwitch("dvs", Without("switchVersion")), HYP_NOT_FOUND);
    EXPECT_EQ(messages.Take(), Lines{"Failed to find switchVersion, status:195887107\n\n"});
    EXPECT_EQ(LoadSwitch("dvs", Without("className")), HYP_NOT_FOUND);
    EXPECT_EQ(LoadSwitch("dvs", Without("maxPorts")), HYP_NOT_FOUND);
    EXPECT_TRUE(messages.All().empty());
    EXPECT_TRUE(SwitchIds().empty());
}

TEST_F(StateDeserialize, RejectsFieldsThatAreTooShort) {
    for (const std::size_t field : {0u, 2u}) {
        Props props = SwitchProps();
        props[field].value.resize(3);
        EXPECT_EQ(LoadSwitch("dvs", props), HYP_BAD_PARAM);
    }
    EXPECT_TRUE(SwitchIds().empty());
}

TEST_F(StateDeserialize, ClassNameEndsWithItsValue) {
    Props props = SwitchProps();
    props[1].value = "cswitch";
    EXPECT_EQ(LoadSwitch("dvs", props), HYP_OK);
    EXPECT_EQ(DVSState_SwitchFind("dvs")->classFlags, 1u);
    props[1].value = std::string(200, 'c');
    EXPECT_EQ(LoadSwitch("long", props), HYP_OK);
    EXPECT_EQ(DVS_ClassName(DVSState_SwitchFind("long")), std::string(127, 'c'));
    props[1].value.clear();
    EXPECT_EQ(LoadSwitch("none", props), HYP_OK);
}

TEST_F(StateDeserialize, ExistingSwitchKeepsVersionAndClassAndGetsNewLists) {
    DVSwitch *sw = AddSwitch("dvs", 9);
    Append(sw->globalPropList, {"old", "1"});
    Append(sw->hostPropList, {"old", "1"});
    AddPort(sw, "a");
    EXPECT_EQ(LoadSwitch("dvs", With(SwitchProps(12, "other", 3),
                                     {Nested("globalPropList", {{"new", "2"}}), Nested("b", {})})),
              HYP_OK);
    EXPECT_EQ(sw->version, 9u);
    EXPECT_STREQ(sw->className, "vswitch");
    EXPECT_EQ(ContentOf(sw->globalPropList), (Props{{"new", "2"}}));
    EXPECT_EQ(sw->hostPropList, nullptr);
    EXPECT_EQ(PortsOf(sw), (Lines{"a/1", "b/1"}));
}

TEST_F(StateDeserialize, PortFailureRemovesOnlyASwitchThatItCreated) {
    const Props props = With(SwitchProps(), {Nested("p", {}), Nested("p", {})});
    StateMessages messages(0);
    EXPECT_EQ(LoadSwitch("dvs", props), HYP_EXISTS);
    EXPECT_EQ(messages.Take().back(), "Deserialize dvs dvs return Already exists\n");
    EXPECT_TRUE(SwitchIds().empty());
    DVSwitch *sw = AddSwitch("dvs");
    EXPECT_EQ(LoadSwitch("dvs", props), HYP_EXISTS);
    EXPECT_EQ(PortsOf(sw), Lines{"p/1"});
}

TEST_F(StateDeserialize, FailingSwitchEmptiesTheWholeTable) {
    AddSwitch("before");
    const Buffer state =
        SerializedOf({Nested("good", SwitchProps()),
                      Nested("bad", With(SwitchProps(), {Nested("p", {}), Nested("p", {})}))});
    StateMessages messages(0);
    EXPECT_EQ(LoadState(state), HYP_EXISTS);
    EXPECT_EQ(messages.Take().back(), "DVSState_SwitchDeserialize failed Already exists\n");
    EXPECT_TRUE(SwitchIds().empty());
}

TEST_F(StateDeserialize, InvalidBufferKeepsTheTable) {
    AddSwitch("before");
    Buffer state = SerializedOf({Nested("good", SwitchProps())});
    state[200] ^= 1;
    StateMessages messages(0);
    EXPECT_EQ(LoadState(state), HYP_BAD_CHECKSUM);
    EXPECT_EQ(messages.Take(), Lines{"DVSState_ConfigDeserialize failed Bad checksum\n"});
    EXPECT_EQ(DVSState_ConfigDeserialize(nullptr, 0), HYP_BAD_PARAM);
    EXPECT_EQ(SwitchIds(), Lines{"before"});
}

TEST_F(StateDeserialize, StateAddsToTheTable) {
    AddSwitch("before");
    EXPECT_EQ(
        LoadState(SerializedOf({Nested("more", SwitchProps()), Nested("before", SwitchProps(12, "x", 1))})),
        HYP_OK);
    EXPECT_EQ(SwitchIds(), (Lines{"before", "more"}));
}

TEST_F(StateDeserialize, SwitchIdOf64CharactersIsNotTruncated) {
    const std::string id(64, 'i');
    StateMessages messages(0);
    EXPECT_EQ(LoadState(SerializedOf({Nested(id, SwitchProps())})), HYP_BAD_PARAM);
    const Lines texts = messages.Take();
    ASSERT_GE(texts.size(), 3u);
    EXPECT_EQ(texts[1], "DVSState_SwitchAdd " + id + ", id length too long\n");
    EXPECT_EQ(texts[2], "Failed to add switch " + id + "/vswitch//64\n");
}

TEST_F(StateDeserialize, OnlyTheFirstEntryOfAFixedNameIsFixed) {
    EXPECT_EQ(LoadSwitch("dvs", With(SwitchProps(),
                                     {Nested("hostPropList", {{"h", "1"}}),
                                      Nested("hostPropList", {{"second", "1"}}), Nested("className", {})})),
              HYP_OK);
    EXPECT_EQ(PortsOf(DVSState_SwitchFind("dvs")), (Lines{"hostPropList/1", "className/1"}));
}

TEST_F(StateDeserialize, EntriesOfUnknownTypesAreDropped) {
    Props props = With(SwitchProps(), {Nested("p", {}), Nested("q", {{"kept", "1"}, {"dropped", "1", 3}})});
    props[3].type = 1;
    EXPECT_EQ(LoadSwitch("dvs", props), HYP_OK);
    DVSwitch *sw = DVSState_SwitchFind("dvs");
    EXPECT_EQ(PortsOf(sw), Lines{"q/1"});
    EXPECT_EQ(ContentOf(sw->ports[0]->portData), (Props{{"kept", "1"}}));
    props = SwitchProps();
    props[0].type = 2;
    EXPECT_EQ(LoadSwitch("other", props), HYP_NOT_FOUND); // its version entry is dropped
}

TEST_F(StateDeserialize, ChecksTheHostListBeforeTheGlobalOne) {
    Props props =
        With(SwitchProps(), {{"globalPropList", "short", 0x10}, Nested("hostPropList", {{"a", "1"}})});
    props[4].value[60] ^= 1;
    EXPECT_EQ(LoadSwitch("dvs", props), HYP_BAD_CHECKSUM);
    props[4].value[60] ^= 1;
    EXPECT_EQ(LoadSwitch("dvs", props), HYP_BAD_PARAM);
}

TEST_F(StateDeserialize, BufferMayLieInAListThatItReplaces) {
    DVSwitch *sw = AddSwitch("dvs");
    const Buffer buffer =
        SerializedOf(With(SwitchProps(), {Nested("globalPropList", {{"new", "2"}}), Nested("p", {})}));
    Append(sw->globalPropList, {"holder", AsText(buffer)});
    const DVSDataEntry *holder = sw->globalPropList->head;
    EXPECT_EQ(DVSState_SwitchDeserialize("dvs", holder->data, holder->dataLen), HYP_OK);
    EXPECT_EQ(ContentOf(sw->globalPropList), (Props{{"new", "2"}}));
    EXPECT_EQ(PortsOf(sw), Lines{"p/1"});
}

} // namespace
