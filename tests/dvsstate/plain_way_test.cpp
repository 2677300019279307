/* SPDX-License-Identifier: Apache-2.0 */
// Compares states written and read in one pass with the level-by-level reference: the bytes, results,
// messages and their order, and the resulting table must be equal.

#include <cstdlib>
#include <random>

#include "dvsstate/level_by_level.h"
#include "dvsstate/state_support.h"

using namespace dvs::test;

namespace {

class PlainWay : public StateTest {};

struct Outcome {
    HYP_ReturnStatus status = HYP_OK;
    Buffer bytes;
    std::vector<std::string> messages;
    bool operator==(const Outcome &) const = default;
};

template <typename Serialize> Outcome Written(Serialize serialize, std::uint32_t room = 0) {
    Outcome outcome;
    StateMessages messages(9, 9);
    Buffer given(room);
    void *buf = room ? given.data() : nullptr;
    std::uint32_t len = room;
    outcome.status = serialize(&buf, &len);
    if (buf && outcome.status == HYP_OK) {
        const auto *bytes = static_cast<const std::uint8_t *>(buf);
        outcome.bytes.assign(bytes, bytes + len);
    } else {
        EXPECT_EQ(len, room);
        EXPECT_EQ(buf, room ? given.data() : nullptr);
    }
    if (!room) std::free(buf);
    outcome.messages = messages.Take();
    return outcome;
}

void ExpectSame(const Outcome &fast, const Outcome &plain) {
    EXPECT_EQ(fast.status, plain.status);
    EXPECT_TRUE(fast.bytes == plain.bytes);
    EXPECT_EQ(fast.messages, plain.messages);
}

void ExpectWrittenAlike(std::uint32_t room = 0) {
    ExpectSame(Written(DVSState_ConfigSerialize, room), Written(plain::ConfigSerialize, room));
    for (const std::string &id : SwitchIds()) {
        DVSwitch *sw = DVSState_SwitchFind(id.c_str());
        ExpectSame(
            Written([sw](void **b, std::uint32_t *l) { return DVSState_SwitchSerialize(sw, b, l); }, room),
            Written([sw](void **b, std::uint32_t *l) { return plain::SwitchSerialize(sw, b, l); }, room));
        DVSState_PortForEach(
            sw,
            [](DVSPort *port, void *arg) {
                const std::uint32_t size = *static_cast<std::uint32_t *>(arg);
                ExpectSame(
                    Written([port](void **b, std::uint32_t *l) { return DVSState_PortSerialize(port, b, l); },
                            size),
                    Written([port](void **b, std::uint32_t *l) { return plain::PortSerialize(port, b, l); },
                            size));
                return false;
            },
            &room);
    }
}

TEST_F(PlainWay, WritesTheExampleAlike) {
    BuildExample();
    ExpectWrittenAlike();
}

TEST_F(PlainWay, WritesAnEmptyTableAlike) {
    ExpectWrittenAlike();
}

TEST_F(PlainWay, WritesIntoTheCallersBufferAlike) {
    BuildExample();
    for (const std::uint32_t room : {1u, 16u, 300u, 1000u, 100000u})
        ExpectWrittenAlike(room);
}

TEST_F(PlainWay, WritesFilteredVersionsAndOldVersionsAlike) {
    BuildExample();
    for (const std::uint32_t version : {0u, 3u, 4u, 99u, 112u}) {
        for (const std::string &id : SwitchIds())
            DVSState_SwitchFind(id.c_str())->version = version;
        ExpectWrittenAlike();
    }
}

TEST_F(PlainWay, WritesDetachedListsAndHiddenPortsAlike) {
    BuildExample();
    DVSwitch *sw = DVSState_SwitchFind("second");
    DVSData_Free(sw->globalPropList);
    sw->globalPropList = nullptr;
    DVSState_PortFind("second", "1")->portType = 0;
    ExpectWrittenAlike();
}

TEST_F(PlainWay, RejectsInconsistentListsAlike) {
    BuildExample();
    DVSwitch *sw = DVSState_SwitchFind("second");
    for (DVSData *list : {sw->globalPropList, sw->hostPropList, DVSState_PortFind("second", "2")->portData}) {
        for (const std::uint32_t by : {4u, 148u, static_cast<std::uint32_t>(-4)}) {
            list->serialSize += by;
            ExpectWrittenAlike();
            list->serialSize -= by;
        }
    }
}

TEST_F(PlainWay, WritesTwoSwitchesOfOneIdAlike) {
    BuildExample();
    AddSwitch("third");
    DVSwitch *sw = DVSState_SwitchFind("third");
    for (const std::size_t size : {0u, 10u}) {
        Append(sw->globalPropList, {"more", std::string(size, 'x')});
        std::strcpy(sw->switchId, "second");
        ExpectSame(Written(DVSState_ConfigSerialize), Written(plain::ConfigSerialize));
        std::strcpy(sw->switchId, "third");
    }
}

} // namespace
