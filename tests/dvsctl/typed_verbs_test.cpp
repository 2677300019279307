/* SPDX-License-Identifier: Apache-2.0 */
// Known properties in typed form: the real program shows, compares and copies them.

#include "program.h"

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>

#include "form/states.h"

namespace {

using namespace dvs::ctl::test;
using namespace std::string_literals;

constexpr const char *kSite = R"({"switches": [{"id": "s", "version": 8, "class": "etherswitch",
  "max_ports": 8, "global": [], "host": [], "ports": [{"id": "7", "properties": [
  {"name": "com.orbeno.etherswitch.port.vlan", "typed": {"trunk_vlan_ids": [{"start": 1, "end": 10},
    {"start": 20, "end": 30}]}},
  {"name": "com.orbeno.common.port.shaper.input", "typed": {"average_bandwidth": 1000000,
    "peak_bandwidth": 2000000, "burst_size": 80000}},
  {"name": "com.orbeno.etherswitch.port.teaming", "typed": {"policy": "LOADBALANCE_SRCID",
    "notify_switches": true, "uplink_port_order": {"active_uplink_ports": ["uplink1"],
    "standby_uplink_ports": ["uplink2"]}}}
]}]}]})";

class Typed : public ProgramTest {
protected:
    void SetUp() override {
        ProgramTest::SetUp();
        Put("site.json", kSite);
        ASSERT_EQ(Dvsctl({"copy", "json:" + At("site.json"), At("site.db")}).status, 0);
    }
    // The example site, with one text replaced, as a state file.
    void Edited(const std::string &before, const std::string &after) const {
        std::string text = kSite;
        text.replace(text.find(before), before.size(), after);
        Put("edited.json", text);
        ASSERT_EQ(Dvsctl({"copy", "json:" + At("edited.json"), At("edited.db")}).status, 0);
    }
    static bool Has(const std::string &text, std::string_view part) {
        return text.find(part) != std::string::npos;
    }
};

TEST_F(Typed, ShowPrintsMeanings) {
    const std::string out = Dvsctl({"show", At("site.db")}).out;
    EXPECT_TRUE(Has(out, "trunk 1-10,20-30")) << out;
    EXPECT_TRUE(Has(out, "average 1 Mbit/s, peak 2 Mbit/s")) << out;
    EXPECT_TRUE(Has(out, "LOADBALANCE_SRCID, active uplink1, standby uplink2")) << out;
    EXPECT_TRUE(Has(out, "notify_switches")) << out;
}

TEST_F(Typed, ShowPrintsBytesOnRequest) {
    const std::string out = Dvsctl({"show", At("site.db"), "--raw"}).out;
    EXPECT_FALSE(Has(out, "trunk"));
    EXPECT_TRUE(Has(out, "01 00 00 00 00 00 02 00 01 00 0a 00 14 00 1e 00")) << out;
}

TEST_F(Typed, ShowPrintsTheReasonWithDamagedBytes) {
    PutState(
        "broken.db",
        EncodeList(std::vector<dvs::form::NewEntry>{MakeSwitch(
            "s", {}, {},
            {MakeList("7", {MakeProperty("com.orbeno.etherswitch.port.vlan", Raw("\x01\0\x02"s), 0x10)})})}));
    const Result text = Dvsctl({"show", At("broken.db")});
    EXPECT_EQ(text.status, 0);
    EXPECT_TRUE(Has(text.out, "01 00 02")) << text.out;
    EXPECT_TRUE(Has(text.out, "does not fit: at byte 3")) << text.out;
}

TEST_F(Typed, ShowInJsonIsAValidSource) {
    const Result shown = Dvsctl({"show", At("site.db"), "--json"});
    const auto document = Json(shown);
    const auto &property = document.at("switches").at(0).at("ports").at(0).at("properties").at(0);
    EXPECT_TRUE(property.at("value").is_object());
    EXPECT_EQ(property.at("typed").at("trunk_vlan_ids").at(1).at("end"), 30);
    EXPECT_EQ(property.at("summary"), "trunk 1-10,20-30");
    Put("shown.json", shown.out);
    EXPECT_EQ(Dvsctl({"diff", At("site.db"), "json:" + At("shown.json")}).status, 0);
}

TEST_F(Typed, CopiesRoundTripByteForByte) {
    for (const bool raw : {false, true}) {
        std::vector<std::string> args = {"copy", At("site.db"), "json:" + At("back.json")};
        if (raw) args.emplace_back("--raw");
        ASSERT_EQ(Dvsctl(args).status, 0);
        EXPECT_EQ(Has(Get("back.json"), "\"typed\""), !raw);
        ASSERT_EQ(Dvsctl({"copy", "json:" + At("back.json"), At("back.db")}).status, 0);
        EXPECT_EQ(Get("back.db"), Get("site.db"));
    }
}

TEST_F(Typed, ExampleSiteIsTypedAndRoundTrips) {
    const std::string example = "json:" DVS_SOURCE_DIR "/examples/site.json";
    ASSERT_EQ(Dvsctl({"copy", example, At("example.db")}).status, 0);
    ASSERT_EQ(Dvsctl({"copy", At("example.db"), "json:" + At("typed.json")}).status, 0);
    EXPECT_FALSE(Has(Get("typed.json"), "base64"));
    const std::string out = Dvsctl({"show", At("example.db")}).out;
    for (const char *part : {"200/201 ISOLATED", "trunk 0-4094", "VLAN 100", "mode ACTIVE", "FAIL_OPEN",
                             "REMOTE_MIRROR_SOURCE", "collector_address 198.51.100.7", "interval 60"})
        EXPECT_TRUE(Has(out, part)) << part;
    EXPECT_FALSE(Has(out, "does not fit"));
    ASSERT_EQ(Dvsctl({"copy", At("example.db"), "json:" + At("back.json")}).status, 0);
    ASSERT_EQ(Dvsctl({"copy", "json:" + At("back.json"), At("back.db")}).status, 0);
    EXPECT_EQ(Get("back.db"), Get("example.db"));
}

TEST_F(Typed, DiffComparesFieldByField) {
    Edited("\"notify_switches\": true", "\"notify_switches\": false");
    const Result diff = Dvsctl({"diff", At("site.db"), At("edited.db")});
    EXPECT_EQ(diff.status, 1);
    EXPECT_TRUE(Has(diff.out, "~ notify_switches: true -> false")) << diff.out;
    EXPECT_FALSE(Has(diff.out, "reverse_policy")) << diff.out;
}

TEST_F(Typed, DiffNamesTheRecordsFieldIfMeaningsAreEqual) {
    for (const auto &[name, reserved] : {std::pair("a.db", "\0\0"s), std::pair("b.db", "\1\0"s)})
        PutState(name, EncodeList(std::vector<dvs::form::NewEntry>{MakeSwitch(
                           "s", {}, {},
                           {MakeList("7", {MakeProperty("com.orbeno.etherswitch.port.vlan",
                                                        Raw("\0\0\x64\0"s + reserved + "\0\0"s), 0x10)})})}));
    const Result diff = Dvsctl({"diff", At("a.db"), At("b.db")});
    EXPECT_EQ(diff.status, 1);
    EXPECT_TRUE(Has(diff.out, "port.vlan: VLAN 100\n")) << diff.out;
    EXPECT_TRUE(Has(diff.out, "~ reserved of the record: ")) << diff.out;
}

TEST_F(Typed, DiffNamesTheSizeIfNothingElseDiffers) {
    for (const auto &[name, value] : {std::pair("a.db", "true\0"s), std::pair("b.db", "true\0f"s)})
        PutState(name,
                 EncodeList(std::vector<dvs::form::NewEntry>{MakeSwitch(
                     "s", {}, {},
                     {MakeList("7", {MakeProperty("com.orbeno.common.port.block", Raw(value), 0x10)})})}));
    const Result diff = Dvsctl({"diff", At("a.db"), At("b.db")});
    EXPECT_EQ(diff.status, 1);
    EXPECT_TRUE(Has(diff.out, "com.orbeno.common.port.block: true\n")) << diff.out;
    EXPECT_TRUE(Has(diff.out, "~ size of the record: 5 -> 6 bytes")) << diff.out;
}

TEST_F(Typed, DiffPrintsBothMeanings) {
    Edited("{\"start\": 20, \"end\": 30}", "{\"start\": 40, \"end\": 40}");
    const std::string out = Dvsctl({"diff", At("site.db"), At("edited.db")}).out;
    EXPECT_TRUE(Has(out, "trunk 1-10,20-30 -> trunk 1-10,40")) << out;
    EXPECT_TRUE(Has(out, "~ trunk_vlan_ids[1].start: 20 -> 40")) << out;
    const std::string table =
        Dvsctl({"diff", At("site.db"), At("edited.db"), "--columns", "before,after"}).out;
    EXPECT_TRUE(Has(table, "trunk 1-10,40")) << table;
    const std::string raw = Dvsctl({"diff", At("site.db"), At("edited.db"), "--raw"}).out;
    EXPECT_FALSE(Has(raw, "trunk")) << raw;
    const auto change = Json(Dvsctl({"diff", At("site.db"), At("edited.db"), "--json"})).at("changes").at(0);
    EXPECT_EQ(change.at("typed_after").at("trunk_vlan_ids").at(1).at("start"), 40);
    EXPECT_TRUE(change.at("before").is_object());
}

TEST_F(Typed, RejectedFieldIsNamedAndNothingIsWritten) {
    std::string text = kSite;
    text.replace(text.find("1000000"), 7, "\"1M\"");
    Put("wrong.json", text);
    const Result result = Dvsctl({"copy", "json:" + At("wrong.json"), At("wrong.db"), "--json"});
    EXPECT_EQ(result.status, 6);
    const auto error = Json(result).at("error");
    EXPECT_EQ(error.at("path"), "$.switches[0].ports[0].properties[1].typed.average_bandwidth");
    EXPECT_EQ(error.at("field"), "average_bandwidth");
    EXPECT_EQ(Get("site.db").empty(), false);
    EXPECT_EQ(Dvsctl({"show", At("wrong.db")}).status, 1);
}

} // namespace
