/* SPDX-License-Identifier: Apache-2.0 */
// Host and global properties and port data: one set of tests for both families, and every message.

#include "dvsstate/state_support.h"

using namespace dvs::test;

namespace {

using Lines = std::vector<std::string>;

struct Family {
    const char *name;
    DVSData *DVSwitch::*list;
    decltype(&DVSState_HostPropSet) set;
    decltype(&DVSState_HostPropClear) clear;
    decltype(&DVSState_HostPropLookup) lookup;
    decltype(&DVSState_HostPropRead) read;
    decltype(&DVSState_HostPropIsSet) isSet;
    decltype(&DVSState_HostPropForEach) forEach;
};

constexpr Family kFamilies[] = {
    {"HostProp", &DVSwitch::hostPropList, DVSState_HostPropSet, DVSState_HostPropClear,
     DVSState_HostPropLookup, DVSState_HostPropRead, DVSState_HostPropIsSet, DVSState_HostPropForEach},
    {"GlobalProp", &DVSwitch::globalPropList, DVSState_GlobalPropSet, DVSState_GlobalPropClear,
     DVSState_GlobalPropLookup, DVSState_GlobalPropRead, DVSState_GlobalPropIsSet,
     DVSState_GlobalPropForEach},
};

class SwitchProperties : public StateTest, public testing::WithParamInterface<Family> {
protected:
    Family on_ = GetParam();
    DVSwitch *sw_ = AddSwitch("dvs");
    DVSData *List() const { return sw_->*on_.list; }
};

INSTANTIATE_TEST_SUITE_P(Families, SwitchProperties, testing::ValuesIn(kFamilies),
                         [](const auto &family) { return family.param.name; });

TEST_P(SwitchProperties, RejectMissingValuesBeforeAnyOtherCheck) {
    StateMessages messages(9);
    EXPECT_EQ(on_.set("absent", "a", "x", 0, 0), HYP_FAILURE);
    EXPECT_EQ(on_.set("dvs", "a", "x", 0, 0), HYP_FAILURE);
    EXPECT_EQ(on_.set("dvs", "a", nullptr, 4, 0), HYP_FAILURE);
    EXPECT_TRUE(messages.All().empty());
    EXPECT_EQ(List()->serialSize, 16u);
}

TEST_P(SwitchProperties, NeedTheSwitch) {
    DVSDataEntry *entry = nullptr;
    EXPECT_EQ(on_.set("absent", "a", "x", 1, 0), HYP_NOT_FOUND);
    EXPECT_EQ(on_.clear("absent", "a"), HYP_NOT_FOUND);
    EXPECT_EQ(on_.lookup("absent", "a", &entry), HYP_NOT_FOUND);
}

TEST_P(SwitchProperties, AreSetReadAndCleared) {
    EXPECT_EQ(on_.set("dvs", "a", "value", 5, 0x18), HYP_OK);
    EXPECT_EQ(ContentOf(List()), (Props{{"a", "value", 0x18}}));
    DVSDataEntry *entry = nullptr;
    EXPECT_EQ(on_.lookup("dvs", "a", &entry), HYP_OK);
    EXPECT_EQ(entry, List()->head);
    void *data = nullptr;
    std::uint32_t len = 0;
    EXPECT_EQ(on_.read(sw_, "a", &data, &len), HYP_OK);
    EXPECT_EQ(data, entry->data);
    EXPECT_EQ(len, 5u);
    EXPECT_TRUE(on_.isSet(sw_, "a"));
    EXPECT_EQ(on_.clear("dvs", "a"), HYP_OK);
    EXPECT_FALSE(on_.isSet(sw_, "a"));
    EXPECT_EQ(on_.clear("dvs", "a"), HYP_NOT_FOUND);
    EXPECT_EQ(on_.read(sw_, "a", &data, &len), HYP_NOT_FOUND);
}

TEST_P(SwitchProperties, ReadWithoutALengthReturnsTheAddress) {
    EXPECT_EQ(on_.set("dvs", "a", "value", 5, 0), HYP_OK);
    void *data = nullptr;
    EXPECT_EQ(on_.read(sw_, "a", &data, nullptr), HYP_OK);
    EXPECT_EQ(data, List()->head->data);
}

TEST_P(SwitchProperties, KeepTheirPlaceOnlyAtTheSameLength) {
    EXPECT_EQ(on_.set("dvs", "a", "1234", 4, 0x18), HYP_OK);
    EXPECT_EQ(on_.set("dvs", "b", "1234", 4, 0x18), HYP_OK);
    EXPECT_EQ(on_.set("dvs", "a", "5678", 4, 0), HYP_OK);
    EXPECT_EQ(ContentOf(List()), (Props{{"a", "5678", 0x20}, {"b", "1234", 0x18}}));
    EXPECT_EQ(on_.set("dvs", "a", "56789", 5, 0x18), HYP_OK);
    EXPECT_EQ(ContentOf(List()), (Props{{"b", "1234", 0x18}, {"a", "56789", 0x18}}));
}

TEST_P(SwitchProperties, CompleteWalkReturnsNotFoundAndAStoppedOneTrue) {
    for (const char *name : {"a", "b", "c"})
        EXPECT_EQ(on_.set("dvs", name, "x", 1, 0), HYP_OK);
    int calls = 0;
    const auto count = [](DVSDataEntry *, void *arg) { return ++*static_cast<int *>(arg) == 5; };
    EXPECT_EQ(on_.forEach(sw_, count, &calls), HYP_NOT_FOUND);
    EXPECT_EQ(calls, 3);
    EXPECT_EQ(on_.forEach(sw_, count, &calls), 1u);
    EXPECT_EQ(calls, 5);
}

TEST_P(SwitchProperties, AreAbsentWithoutAListUntilOneIsSet) {
    DVSData_Free(List());
    sw_->*on_.list = nullptr;
    DVSDataEntry *entry = nullptr;
    void *data = nullptr;
    EXPECT_EQ(on_.clear("dvs", "a"), HYP_NOT_FOUND);
    EXPECT_EQ(on_.lookup("dvs", "a", &entry), HYP_NOT_FOUND);
    EXPECT_EQ(on_.read(sw_, "a", &data, nullptr), HYP_NOT_FOUND);
    EXPECT_FALSE(on_.isSet(sw_, "a"));
    EXPECT_EQ(on_.forEach(sw_, nullptr, nullptr), HYP_NOT_FOUND);
    EXPECT_EQ(on_.set("dvs", "a", "x", 0xfffffff0, 0), HYP_BAD_PARAM);
    EXPECT_EQ(List(), nullptr);
    EXPECT_EQ(on_.set("dvs", "a", "x", 1, 0), HYP_OK);
    EXPECT_EQ(ContentOf(List()), (Props{{"a", "x", 0x20}}));
}

TEST_P(SwitchProperties, TraceEachOperation) {
    const std::string prefix = std::string("DVSState_") + on_.name;
    StateMessages messages(2);
    DVSDataEntry *entry = nullptr;
    void *data = nullptr;
    (void)on_.set("dvs", "a", "x", 1, 0);
    (void)on_.lookup("dvs", "a", &entry);
    (void)on_.read(sw_, "a", &data, nullptr);
    (void)on_.isSet(sw_, "a");
    (void)on_.clear("dvs", "a");
    EXPECT_EQ(messages.Take(),
              (Lines{prefix + "Set dvs, a\n", prefix + "Lookup dvs, a\n", prefix + "Read dvs, a\n",
                     prefix + "IsSet dvs: a\n", prefix + "Clear dvs, a\n"}));
    dvs_debug = 1;
    (void)on_.set("dvs", "a", "x", 1, 0);
    (void)on_.lookup("dvs", "a", &entry);
    (void)on_.read(sw_, "a", &data, nullptr);
    (void)on_.isSet(sw_, "a");
    EXPECT_EQ(messages.Take(), Lines{prefix + "Set dvs, a\n"});
}

class PortData : public StateTest {
protected:
    DVSPort *port_ = AddPort(AddSwitch("dvs"), "p", DVS_PORT_SHADOW);
};

TEST_F(PortData, IsSetReadAndCleared) {
    void *data = nullptr;
    std::uint32_t len = 0;
    EXPECT_EQ(DVSState_PortDataSet(port_, "a", "value", 5, 0x18), HYP_OK);
    EXPECT_EQ(DVSState_PortDataGet(port_, "a", &data, &len), HYP_OK);
    EXPECT_EQ(std::string(static_cast<char *>(data), len), "value");
    data = nullptr;
    EXPECT_EQ(DVSState_PortDataRead(port_, "a", &data, nullptr), HYP_OK);
    EXPECT_EQ(data, port_->portData->head->data);
    EXPECT_EQ(DVSState_PortDataForEach(
                  port_, [](DVSDataEntry *, void *) { return true; }, nullptr),
              1u);
    EXPECT_EQ(DVSState_PortDataClear(port_, "a"), HYP_OK);
    EXPECT_EQ(DVSState_PortDataRead(port_, "a", &data, &len), HYP_NOT_FOUND);
    EXPECT_EQ(DVSState_PortDataForEach(
                  port_, [](DVSDataEntry *, void *) { return true; }, nullptr),
              HYP_NOT_FOUND);
}

TEST_F(PortData, FailuresPrintTheCommonMessage) {
    StateMessages messages(1);
    const std::string failed =
        "DVSStatePortDataCommon failed to set/get data switch dvs,port p, data a type 2\n";
    void *data = nullptr;
    std::uint32_t len = 0;
    EXPECT_EQ(DVSState_PortDataClear(port_, "a"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSState_PortDataGet(port_, "a", &data, &len), HYP_NOT_FOUND);
    EXPECT_EQ(DVSState_PortDataSet(port_, "a", "x", 0, 0), HYP_FAILURE);
    EXPECT_EQ(DVSState_PortDataSet(port_, "a", nullptr, 1, 0), HYP_FAILURE);
    EXPECT_EQ(messages.Take(), Lines(4, failed));
    EXPECT_EQ(DVSState_PortDataRead(port_, "a", &data, &len), HYP_NOT_FOUND);
    EXPECT_TRUE(messages.All().empty());
    EXPECT_EQ(port_->portData->serialSize, 16u);
}

TEST_F(PortData, OperationsAreTraced) {
    StateMessages messages(2);
    void *data = nullptr;
    std::uint32_t len = 0;
    (void)DVSState_PortDataSet(port_, "a", "x", 1, 0);
    (void)DVSState_PortDataGet(port_, "a", &data, &len);
    (void)DVSState_PortDataClear(port_, "a");
    EXPECT_EQ(messages.Take(), (Lines{"DVSState_PortDataSet dvs, p, a\n", "DVSState_PortDataGet dvs, p, a\n",
                                      "DVSState_PortDataClear dvs, p, a\n"}));
}

} // namespace
