/* SPDX-License-Identifier: Apache-2.0 */
// Written state buffers: layout, kinds, filters, messages.

#include <cstring>

#include "dvsstate/state_support.h"
#include "dvsdata/buffer_view.h"

using namespace dvs::test;

namespace {

class StateSerialize : public StateTest {};

using Lines = std::vector<std::string>;

Props EntriesOf(std::span<const std::uint8_t> bytes) {
    Props props;
    dvs::data::BufferView view(bytes);
    for (dvs::data::EntryView entry; view.Next(&entry);)
        props.push_back(
            {std::string(entry.Name()), {entry.value.begin(), entry.value.end()}, entry.propType});
    EXPECT_TRUE(view.AtEnd());
    return props;
}

Props EntriesOf(const std::string &text) {
    return EntriesOf(std::span(reinterpret_cast<const std::uint8_t *>(text.data()), text.size()));
}

Lines NamesOf(const Props &props) {
    Lines names;
    for (const Prop &prop : props)
        names.push_back(prop.name);
    return names;
}

TEST_F(StateSerialize, EmptyTableIs16BytesAndLoadsAsEmpty) {
    const Buffer bytes = StateBytes();
    EXPECT_EQ(bytes, (Buffer{16, 0, 0, 0, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0, 0, 0}));
    EXPECT_EQ(LoadState(bytes), HYP_OK);
    EXPECT_TRUE(SwitchIds().empty());
}

TEST_F(StateSerialize, SwitchHoldsFiveFixedEntriesAndItsPorts) {
    DVSwitch *sw = AddSwitch("dvs", 12);
    sw->newMaxPorts = 77;
    Append(sw->globalPropList, {"g", "1"});
    AddPort(sw, "p", DVS_PORT_ACTIVE, {{"x", "y"}});
    AddPort(sw, "p", DVS_PORT_SHADOW);
    const Props entries = EntriesOf(SwitchBytes(sw));
    EXPECT_EQ(NamesOf(entries),
              (Lines{"switchVersion", "className", "maxPorts", "globalPropList", "hostPropList", "p", "p"}));
    for (const Prop &entry : entries)
        EXPECT_EQ(entry.type, 0x10u);
    EXPECT_EQ(entries[0].value, U32Value(12));
    EXPECT_EQ(entries[1].value, std::string("vswitch") + std::string(121, '\0'));
    EXPECT_EQ(entries[2].value, U32Value(77)); // the pending limit
    EXPECT_EQ(EntriesOf(entries[3].value), (Props{{"g", "1"}}));
    EXPECT_EQ(EntriesOf(entries[4].value), Props{});
    EXPECT_EQ(EntriesOf(entries[5].value), (Props{{"x", "y"}}));
    EXPECT_EQ(EntriesOf(entries[6].value),
              (Props{{"com.orbeno.common.port.volatile.type", U32Value(2), 0x10}}));
}

TEST_F(StateSerialize, StateListsSwitchesInSlotOrder) {
    for (const char *id : {"b", "a"})
        AddSwitch(id);
    const Props entries = EntriesOf(StateBytes());
    EXPECT_EQ(NamesOf(entries), (Lines{"b", "a"}));
    EXPECT_EQ(entries[0].type, 0x10u);
    EXPECT_EQ(entries[0].value, AsText(SwitchBytes(DVSState_SwitchFind("b"))));
}

TEST_F(StateSerialize, AddsTheKindToTheOutputOnly) {
    DVSwitch *sw = AddSwitch("dvs");
    DVSPort *port = AddPort(sw, "p", DVS_PORT_ZOMBIE, {{"a", "1"}});
    EXPECT_EQ(EntriesOf(PortBytes(port)),
              (Props{{"a", "1"}, {"com.orbeno.common.port.volatile.type", U32Value(3), 0x10}}));
    EXPECT_EQ(ContentOf(port->portData), (Props{{"a", "1"}}));
    Append(port->portData,
           {"com.orbeno.common.port.volatile.type", U32Value(9), 0x20}); // already present: unchanged
    EXPECT_EQ(EntriesOf(PortBytes(port)), ContentOf(port->portData));
    port->portType = DVS_PORT_ACTIVE;
    EXPECT_EQ(EntriesOf(PortBytes(port)), ContentOf(port->portData));
}

TEST_F(StateSerialize, OmitsPortsOfKind0AndAbsentLists) {
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "a")->portType = 0;
    AddPort(sw, "b");
    DVSData_Free(std::exchange(sw->globalPropList, nullptr));
    DVSData_Free(std::exchange(sw->hostPropList, nullptr));
    EXPECT_EQ(NamesOf(EntriesOf(SwitchBytes(sw))), (Lines{"switchVersion", "className", "maxPorts", "b"}));
}

TEST_F(StateSerialize, PortsEndAtASetBitWithoutAPort) {
    DVSwitch *sw = AddSwitch("dvs");
    for (const char *id : {"a", "b", "c"})
        AddPort(sw, id);
    DVSPort *hidden = std::exchange(sw->ports[1], nullptr);
    EXPECT_EQ(EntriesOf(SwitchBytes(sw)).size(), 6u);
    sw->ports[1] = hidden;
}

TEST_F(StateSerialize, Version99OmitsFilteredTypesOfTheSwitchsLists) {
    DVSwitch *sw = AddSwitch("dvs", 99);
    const Props all = {{"default", "1", 0x20},    {"24", "1", 0x24}, {"40", "1", 0x40},
                       {"10", "1", 0x10},         {"18", "1", 0x18}, {"04", "1", 0x04},
                       {"high", "1", 0x80000010}, {"0", "1", 0}};
    for (const Prop &prop : all)
        Append(sw->globalPropList, prop), Append(sw->hostPropList, prop);
    AddPort(sw, "p", DVS_PORT_ACTIVE, all);
    const Props kept = {{"10", "1", 0x10}, {"18", "1", 0x18}, {"0", "1", 0}};
    const Props entries = EntriesOf(SwitchBytes(sw));
    EXPECT_EQ(EntriesOf(entries[3].value), kept);
    EXPECT_EQ(EntriesOf(entries[4].value), kept);
    EXPECT_EQ(EntriesOf(entries[5].value), all); // port data is never filtered
}

TEST_F(StateSerialize, ZeroesBytesAfterTheClassName) {
    DVSwitch *sw = AddSwitch("dvs");
    std::memset(sw->className, 'x', sizeof sw->className);
    std::strcpy(sw->className, "mine");
    EXPECT_EQ(EntriesOf(SwitchBytes(sw))[1].value, std::string("mine") + std::string(124, '\0'));
}

TEST_F(StateSerialize, PrintsItsMessages) {
    AddPort(AddSwitch("dvs"), "p");
    StateMessages messages(2);
    (void)StateBytes();
    EXPECT_EQ(messages.Take(),
              (Lines{"DVSState_ConfigSerialize\n", "DVSState_SwitchSerialize dvs\n",
                     "Add DVS(dvs) property list succesfully\n", "DVSState_PortSerialize p\n",
                     "DVSState_SwitchDeserialize dvs dvs return Success\n"}));
}

TEST_F(StateSerialize, FailsWithExistsForAnySwitchFailure) {
    DVSwitch *sw = AddSwitch("dvs");
    sw->hostPropList->serialSize += 4;
    StateMessages messages(1);
    void *buf = nullptr;
    std::uint32_t len = 0;
    EXPECT_EQ(DVSState_SwitchSerialize(sw, &buf, &len), HYP_LIMIT_EXCEEDED);
    messages.Take();
    EXPECT_EQ(DVSState_ConfigSerialize(&buf, &len), HYP_EXISTS);
    EXPECT_EQ(buf, nullptr);
    EXPECT_EQ(messages.Take(), (Lines{"DVSState_ConfigSerialize\n", "DVSState_SwitchSerialize dvs\n",
                                      "Failed to add switch dvs host property list, return Limit exceeded\n",
                                      "Add DVS(dvs) property list succesfully\n",
                                      "DVSState_SwitchDeserialize dvs dvs return Limit exceeded\n",
                                      "DVSStateConfigSerializeCB DVS dvs failed Limit exceeded\n"}));
    sw->hostPropList->serialSize -= 4;
    sw->globalPropList->serialSize += 4;
    EXPECT_EQ(DVSState_SwitchSerialize(sw, &buf, &len), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(messages.Take(),
              (Lines{"DVSState_SwitchSerialize dvs\n",
                     "Failed to add switch dvs global property list, return Limit exceeded\n",
                     "Add DVS(dvs) property list succesfully\n",
                     "DVSState_SwitchDeserialize dvs dvs return Limit exceeded\n"}));
    sw->globalPropList->serialSize -= 4;
}

TEST_F(StateSerialize, WritesIntoTheCallersBufferWhenItIsLargeEnough) {
    BuildExample();
    const Buffer expected = StateBytes();
    Buffer given(expected.size());
    void *buf = given.data();
    auto len = static_cast<std::uint32_t>(given.size());
    EXPECT_EQ(DVSState_ConfigSerialize(&buf, &len), HYP_OK);
    EXPECT_EQ(given, expected);
    len--;
    EXPECT_EQ(DVSState_ConfigSerialize(&buf, &len), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(len, given.size() - 1);
}

TEST_F(StateSerialize, RejectsASizeThatNoBufferCanHave) {
    DVSwitch *sw = AddSwitch("dvs");
    AddPort(sw, "a")->portData->serialSize = 0xffffff00;
    void *buf = nullptr;
    std::uint32_t len = 0;
    EXPECT_EQ(DVSState_SwitchSerialize(sw, &buf, &len), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(buf, nullptr);
    sw->ports[0]->portData->serialSize = 16;
}

TEST_F(StateSerialize, LargeStatesRoundTrip) {
    const std::string value(20000, 'v');
    for (const char *id : {"a", "b"}) {
        DVSwitch *sw = AddSwitch(id);
        for (int i = 0; i < 130; i++)
            AddPort(sw, "p" + std::to_string(i), DVS_PORT_ACTIVE, {{"v", value}});
    }
    const Buffer bytes = StateBytes();
    EXPECT_GT(bytes.size(), 5u << 20);
    ASSERT_EQ(DVSState_ConfigReset(), HYP_OK);
    EXPECT_EQ(LoadState(bytes), HYP_OK);
    EXPECT_EQ(StateBytes(), bytes);
}

} // namespace
