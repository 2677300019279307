/* SPDX-License-Identifier: Apache-2.0 */
// Tests the number and every byte of the record of each command, and the search by external id.

#include <cerrno>
#include <cstring>
#include <functional>

#include <gtest/gtest.h>

#include "emulator/hyp_support.h"
#include "kernel/fake_device.h"
#include "kernel/state_support.h"

namespace dvs::test {
namespace {

const char kValue[] = "value";

struct CommandRow {
    const char *name;
    int number; // a literal, so that the test detects a renumbered command
    std::function<HYP_ReturnStatus()> call;
    std::string record; // without the addresses and length of a receive buffer
    bool fetches;
};

HYP_ReturnStatus Fetched(const Bytes &bytes) {
    EXPECT_EQ(bytes.text, bytes.status == HYP_OK ? "reply" : "");
    return bytes.status;
}

std::string Names(const char *sw, const char *port = "", const char *prop = "") {
    return RecordBytes().Text(0, sw).Text(64, port).Text(112, prop).Bytes();
}

std::string Value(const char *sw, const char *port, const char *prop, uint32_t type) {
    return RecordBytes()
        .Text(0, sw)
        .Text(64, port)
        .Text(112, prop)
        .Word(248, type)
        .Word(260, 5)
        .Address(264, kValue)
        .Bytes();
}

std::vector<CommandRow> Rows() {
    return {
        {"StateInit", 0, [] { return DVSHYP_StateInit(kValue, 5); }, Value("", "", "", 0), false},
        {"StateCleanup", 1, DVSHYP_StateCleanup, Names(""), false},
        {"StateSanitize", 2, DVSHYP_StateSanitize, Names(""), false},
        {"StateGet", 3, [] { return Fetched(Fetch(DVSHYP_StateGet)); }, Names(""), true},
        {"SwitchAdd", 4, [] { return DVSHYP_SwitchAdd("s", "class", 77, 110); },
         RecordBytes().Text(0, "s").Text(112, "class").Word(240, 77).Word(244, 110).Bytes(), false},
        {"SwitchRemove", 5, [] { return DVSHYP_SwitchRemove("s"); }, Names("s"), false},
        {"SwitchAssociate", 6, [] { return DVSHYP_SwitchAssociate("s"); }, Names("s"), false},
        {"SwitchDissociate", 7, [] { return DVSHYP_SwitchDissociate("s"); }, Names("s"), false},
        {"GlobalPropGet", 8, [] { return Fetched(Fetch(DVSHYP_GlobalPropGet, "s", "k")); },
         Names("s", "", "k"), true},
        {"GlobalPropSet", 9, [] { return DVSHYP_GlobalPropSet("s", "k", kValue, 5, 0x18); },
         Value("s", "", "k", 0x18), false},
        {"GlobalPropClear", 10, [] { return DVSHYP_GlobalPropClear("s", "k"); }, Names("s", "", "k"), false},
        {"HostPropGet", 11, [] { return Fetched(Fetch(DVSHYP_HostPropGet, "s", "k")); }, Names("s", "", "k"),
         true},
        {"HostPropSet", 12, [] { return DVSHYP_HostPropSet("s", "k", kValue, 5, 0x20); },
         Value("s", "", "k", 0x20), false},
        {"HostPropClear", 13, [] { return DVSHYP_HostPropClear("s", "k"); }, Names("s", "", "k"), false},
        {"SwitchPropClear", 13, [] { return DVSHYPSwitchPropClear("s", "k", 13); }, Names("s", "", "k"),
         false},
        {"PortAdd", 14, [] { return DVSHYP_PortAdd("s", "p", kValue, 5); }, Value("s", "p", "", 0), false},
        {"PortRemove", 15, [] { return DVSHYP_PortRemove("s", "p"); }, Names("s", "p"), false},
        {"PortDataGet", 16, [] { return Fetched(Fetch(DVSHYP_PortDataGet, "s", "p", "k")); },
         Names("s", "p", "k"), true},
        {"PortDataSet", 17, [] { return DVSHYP_PortDataSet("s", "p", "k", kValue, 5, 16); },
         Value("s", "p", "k", 16), false},
        {"PortDataClear", 18, [] { return DVSHYP_PortDataClear("s", "p", "k"); }, Names("s", "p", "k"),
         false},
        {"PortStateGet", 19, [] { return Fetched(Fetch(DVSHYP_PortStateGet, "s", "p")); }, Names("s", "p"),
         true},
        {"PortFind", 20, [] { return DVSHYP_PortFind("s", "p"); }, Names("s", "p"), false},
        {"SwitchSetMaxPorts", 21, [] { return DVSHYP_SwitchSetMaxPorts("s", 9); },
         RecordBytes().Text(0, "s").Word(240, 9).Bytes(), false},
        {"SwitchSetVersion", 22, [] { return DVSHYP_SwitchSetVersion("s", 112); },
         RecordBytes().Text(0, "s").Word(244, 112).Bytes(), false},
        {"UplinkDataSet", 26, [] { return DVSHYP_UplinkDataSet("s", "p", 3, kValue, 5, 16); },
         Value("s", "p", "3", 16), false},
        {"UplinkDataGet", 27, [] { return Fetched(Fetch(DVSHYP_UplinkDataGet, "s", "p", -1)); },
         Names("s", "p", "-1"), true},
        {"SmartNICGlobalPropGet", 29, [] { return Fetched(Fetch(DVSHYP_SmartNICGlobalPropGet, "s", "k")); },
         Names("s", "", "k"), true},
        {"SmartNICHostPropGet", 30, [] { return Fetched(Fetch(DVSHYP_SmartNICHostPropGet, "s", "k")); },
         Names("s", "", "k"), true},
        {"SmartNICPortDataGet", 31, [] { return Fetched(Fetch(DVSHYP_SmartNICPortDataGet, "s", "p", "k")); },
         Names("s", "p", "k"), true},
    };
}

/// A receive buffer's address differs from run to run; its first size does not.
std::string WithoutReceiveBuffer(std::string record) {
    EXPECT_EQ(std::memcmp(record.data() + 260, "\x00\x80\x00\x00", 4), 0);
    EXPECT_NE(record.substr(264, 8), std::string(8, '\0'));
    return record.replace(260, 12, 12, '\0');
}

class Commands : public testing::Test, protected FakeDeviceTest {};

TEST_F(Commands, EachSendsItsNumberAndEveryByteOfItsRecord) {
    for (const CommandRow &row : Rows()) {
        device.Reset();
        device.replies.clear();
        if (row.fetches) device.replies[Command{row.number}] = "reply";
        EXPECT_EQ(row.call(), HYP_OK) << row.name;
        ASSERT_EQ(device.calls.size(), 1U) << row.name;
        const DeviceCall &call = device.calls[0];
        EXPECT_EQ(call.request, row.number) << row.name;
        EXPECT_EQ(row.fetches ? WithoutReceiveBuffer(call.record) : call.record, row.record) << row.name;
    }
}

TEST_F(Commands, EachReturnsTheModulesStatus) {
    for (const CommandRow &row : Rows()) {
        device.script = {{EINVAL, 0x0bad0042, -1, {}}};
        EXPECT_EQ(row.call(), 0x0bad0042U) << row.name;
    }
}

TEST_F(Commands, SwitchAddTruncatesClassNamesTo127Characters) {
    EXPECT_EQ(DVSHYP_SwitchAdd("s", std::string(200, 'c').c_str(), 0, 0), HYP_OK);
    EXPECT_EQ(device.calls.at(0).record, Names("s", "", std::string(127, 'c').c_str()));
}

TEST_F(Commands, UplinkDataGetSendsANegativeNumberAsText) {
    device.replies[Command::UplinkDataGet] = "reply";
    EXPECT_EQ(FetchUplink("s", "p", -1).text, "reply");
    EXPECT_STREQ(device.calls.at(0).record.data() + 112, "-1");
}

class ExternalId : public testing::Test, protected FakeDeviceTest {
protected:
    static constexpr const char *kVnic = "com.orbeno.port.extraConfig.vnic.external.id";
    static constexpr const char *kHypnic = "com.orbeno.port.extraConfig.hypnic.external.id";

    void Serve(const std::vector<std::pair<std::string, Pairs>> &ports) {
        StateBuilder state;
        state.Switch("s1");
        for (const auto &[id, pairs] : ports)
            state.Port("s1", id, pairs);
        device.replies[Command::StateGet] = state.Serialize();
    }

    /// The matching port's id, or the status as text.
    std::string Find(const std::string &externalId, const char *sw = "s1") {
        DVSHYPExternalIdResult *result = nullptr;
        const HYP_ReturnStatus status = DVSHYP_PortGetByExternalId(sw, externalId.c_str(), &result);
        EXPECT_TRUE(TableIsEmpty());
        if (status != HYP_OK) {
            EXPECT_EQ(result, nullptr);
            return "status " + std::to_string(status);
        }
        EXPECT_EQ(result->externalId, externalId);
        const std::string found = result->portId;
        DVSHYP_DataFree(result);
        return found;
    }
};

TEST_F(ExternalId, IdsOf128CharactersDoNotTouchTheDevice) {
    Serve({});
    EXPECT_EQ(Find(std::string(128, 'i')), "status " + std::to_string(HYP_BAD_PARAM));
    EXPECT_TRUE(device.openedPaths.empty());
    EXPECT_EQ(Find(std::string(127, 'i')), "");
}

TEST_F(ExternalId, FirstStoredPrefixWins) {
    Serve({{"p1", {{kVnic, "abc"}}}, {"p2", {{kVnic, "abcd"}}}});
    EXPECT_EQ(Find("abcd"), "p1");
    Serve({{"p1", {{kVnic, "abcd"}}}, {"p2", {{kVnic, "abc"}}}});
    EXPECT_EQ(Find("abcd"), "p1");
    EXPECT_EQ(Find("abc"), "p2");
    EXPECT_EQ(Find("ab"), "");
}

TEST_F(ExternalId, ReturnsAnEmptyResultWithoutEitherKey) {
    Serve({{"p1", {{"other", "abc"}}}, {"p2", {}}});
    EXPECT_EQ(Find("abc"), "");
}

TEST_F(ExternalId, VirtualAdaptersKeyTakesPrecedence) {
    Serve({{"p1", {{kHypnic, "abc"}, {kVnic, "xyz"}}}, {"p2", {{kHypnic, "abc"}}}});
    EXPECT_EQ(Find("abc"), "p2");
    EXPECT_EQ(Find("xyz"), "p1");
}

TEST_F(ExternalId, EmptyStoredIdMatchesEverything) {
    Serve({{"p1", {{kVnic, std::string("\0abc", 4)}}}, {"p2", {{kVnic, "abc"}}}});
    EXPECT_EQ(Find("abc"), "p1");
    EXPECT_EQ(Find(""), "p1");
}

TEST_F(ExternalId, UnterminatedStoredIdEndsWithItsValue) {
    Serve({{"p1", {{kVnic, "abc"}}}});
    EXPECT_EQ(Find("abcdef"), "p1");
    Serve({{"p1", {{kVnic, std::string("ab\0zz", 5)}}}});
    EXPECT_EQ(Find("abc"), "p1");
}

TEST_F(ExternalId, ReturnsNotFoundForAnUnknownSwitch) {
    Serve({});
    EXPECT_EQ(Find("abc", "s2"), "status " + std::to_string(HYP_NOT_FOUND));
}

TEST_F(ExternalId, ReturnsFailuresOfFetchAndLoad) {
    device.always[Command::StateGet] = {EPERM, 0x0bad0042, -1, {}};
    EXPECT_EQ(Find("abc"), "status " + std::to_string(0x0bad0042));
    device.replies[Command::StateGet] = "no state at all, but more than sixteen bytes";
    EXPECT_EQ(Find("abc"), "status " + std::to_string(HYP_BAD_PARAM));
}

} // namespace
} // namespace dvs::test
