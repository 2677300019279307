/* SPDX-License-Identifier: Apache-2.0 */
// The output of the read-only verbs: the tree, the table, the report, the differences, and their JSON.

#include <gtest/gtest.h>

#include <string>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>

#include "program.h"

namespace {

using namespace dvs::ctl::test;

class Verbs : public ProgramTest {
protected:
    void SetUp() override {
        ProgramTest::SetUp();
        PutState("a.db", SmallState());
    }
};

TEST_F(Verbs, ShowPrintsAnAlignedTree) {
    EXPECT_EQ(Dvsctl({"show", At("a.db")}).out,
              "file:" + At("a.db") + ": 2 switches, 4 ports, 8 properties\n" +
                  R"(NAME                                      TYPE  SIZE  VALUE
switch alpha                                          "production", 3 ports, 7 properties
  version                                 0x10     4  8
  class                                   0x10   128  etherswitch
  max_ports                               0x10     4  512
  global                                              2 properties
    com.orbeno.common.alias               0x10    11  "production"
    x.mtu                                 0x20     4  9000
  host                                                1 property
    x.host                                0x20     2  "h"
  port 1                                              "web-1", active, 2 properties
    com.orbeno.common.port.alias          0x20     6  "web-1"
    x.blob                                0x20     3  01 02 00 (3 bytes)
  port 2                                              active, 0 properties
  port 1                                              shadow, 2 properties
    x.note                                0x20    12  "shadow of 1"
    com.orbeno.common.port.volatile.type  0x10     4  2
switch beta                                           1 port, 1 property
  version                                 0x10     4  10
  class                                   0x10   128  vswitch
  max_ports                               0x10     4  512
  global                                              0 properties
  host                                                0 properties
  port 9                                              active, 1 property
    x.mtu                                 0x20     4  1500
)");
}

TEST_F(Verbs, ShowFindsSwitchesAndPortsByIdAndAlias) {
    const std::string byId = Dvsctl({"show", At("a.db"), "--switch", "alpha", "--port", "1"}).out;
    EXPECT_NE(byId.find("shadow of 1"), std::string::npos);
    EXPECT_EQ(byId.find("x.mtu"), std::string::npos);
    const Result byAlias = Dvsctl({"show", At("a.db"), "--switch", "production", "--port", "web-1"});
    EXPECT_EQ(byAlias.status, 0);
    EXPECT_NE(byAlias.out.find("x.blob"), std::string::npos);
    EXPECT_EQ(byAlias.out.find("shadow of 1"), std::string::npos);
    EXPECT_NE(byAlias.out.find("switch alpha"), std::string::npos);
    EXPECT_NE(byAlias.out.find("\"production\""), std::string::npos)
        << "the alias is always shown";
    EXPECT_EQ(Dvsctl({"show", At("a.db"), "--switch", "beta", "--port", "1"}).status, 4);
    EXPECT_EQ(Dvsctl({"show", At("a.db"), "--switch", ""}).status, 4) << "no alias is not an empty alias";
}

TEST_F(Verbs, ShowFiltersPropertiesByPattern) {
    EXPECT_EQ(
        Dvsctl({"show", At("a.db"), "--props", "*.mtu", "--columns", "switch,port,list,name,value"}).out,
        "SWITCH  PORT  LIST    NAME   VALUE\n"
        "alpha         global  x.mtu  9000\n"
        "beta    9     port    x.mtu  1500\n");
}

TEST_F(Verbs, ShowOfNothingSucceedsWhenAllowed) {
    EXPECT_EQ(Dvsctl({"show", At("a.db"), "--switch", "x", "--if-exists", "-q"}).out, "");
    const auto filtered = Json(Dvsctl({"show", At("a.db"), "--switch", "x", "--if-exists", "--json"}));
    EXPECT_EQ(filtered.at("switches"), boost::json::array());
    const auto absent = Dvsctl({"show", At("none.db"), "--if-exists", "--json"});
    EXPECT_EQ(absent.status, 0);
    EXPECT_EQ(Json(absent).at("switches"), boost::json::array());
}

TEST_F(Verbs, ShowAsJsonIsValidInput) {
    const Result shown = Dvsctl({"show", At("a.db"), "--json"});
    EXPECT_EQ(Json(shown).at("switches").at(0).at("ports").at(2).at("kind"), "shadow");
    Put("shown.json", shown.out);
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), "json:" + At("shown.json"), "--order"}).status, 0);
}

TEST_F(Verbs, ShowWorksOnAnEmptyState) {
    PutState("empty.db", dvs::form::EncodeList({}));
    EXPECT_EQ(Dvsctl({"show", At("empty.db")}).out,
              "file:" + At("empty.db") + ": 0 switches, 0 ports, 0 properties\n");
    EXPECT_EQ(Json(Dvsctl({"show", At("empty.db"), "--json"})).at("switches"), boost::json::array());
}

TEST_F(Verbs, VerifyCountsValidEntries) {
    const Result result = Dvsctl({"verify", At("a.db")});
    EXPECT_EQ(result.status, 0);
    const auto size = std::to_string(Get("a.db").size());
    EXPECT_EQ(result.out,
              "file:" + At("a.db") + ": sound, 2 switches, 4 ports, 8 properties in " + size + " bytes\n");
    const auto json = Json(Dvsctl({"verify", At("a.db"), "--json"}));
    EXPECT_EQ(json.at("is_sound"), true);
    EXPECT_EQ(json.at("sound").at("properties"), 8);
    EXPECT_FALSE(json.as_object().contains("error"));
}

TEST_F(Verbs, VerifyWarnsOfTooManySwitches) {
    std::vector<dvs::form::NewEntry> switches;
    for (int i = 0; i < 32; ++i)
        switches.push_back(MakeSwitch("s" + std::to_string(i), {}, {}, {}));
    switches.push_back(MakeSwitch("s0", {}, {}, {})); // a duplicate of the first one
    PutState("full.db", dvs::form::EncodeList(switches));
    EXPECT_EQ(Dvsctl({"verify", At("full.db")}).err, "");
    switches.push_back(MakeSwitch("one too many", {}, {}, {}));
    PutState("over.db", dvs::form::EncodeList(switches));
    const Result result = Dvsctl({"verify", At("over.db")});
    EXPECT_EQ(result.status, 0) << "its bytes are valid";
    EXPECT_NE(result.err.find("warning: no host loads this state"), std::string::npos) << result.err;
    EXPECT_EQ(Json(Dvsctl({"verify", At("over.db"), "--json"})).at("warnings").as_array().size(), 1u);
}

TEST_F(Verbs, VerifyNamesTheInnermostFault) {
    Buffer state = SmallState();
    const std::string text = "shadow of 1";
    const auto at = std::search(state.begin(), state.end(), text.begin(), text.end());
    *at = 'S';
    PutState("bad.db", state);
    const Result result = Dvsctl({"verify", At("bad.db")});
    EXPECT_EQ(result.status, 6);
    EXPECT_NE(result.out.find("where:  switch alpha, port 1, byte offset"), std::string::npos) << result.out;
    EXPECT_NE(result.out.find("checksum does not match"), std::string::npos);
    EXPECT_NE(result.out.find("a load stops at byte 4 already"), std::string::npos);
    EXPECT_NE(result.out.find("sound:  1 of 2 switches, 3 of 4 ports, 6 of 8 properties"), std::string::npos)
        << result.out;
    const auto json = Json(Dvsctl({"verify", At("bad.db"), "--json"}));
    EXPECT_EQ(json.at("is_sound"), false);
    EXPECT_EQ(json.at("sound").at("ports"), 3);
    EXPECT_EQ(json.at("error").at("status"), 6);
    EXPECT_EQ(json.at("error").at("path"), "switch alpha, port 1");
    EXPECT_GT(json.at("error").at("offset").as_int64(), 0);
}

TEST_F(Verbs, VerifyChecksTheFileToo) {
    const Buffer state = SmallState();
    Put("raw.db", {reinterpret_cast<const char *>(state.data()), state.size()});
    const Result result = Dvsctl({"verify", At("raw.db")});
    EXPECT_EQ(result.status, 6);
    EXPECT_NE(result.out.find("is no multiple of 512"), std::string::npos) << result.out;
    Put("empty.db", "");
    EXPECT_EQ(Dvsctl({"verify", At("empty.db")}).status, 6);
    EXPECT_NE(Dvsctl({"verify", At("empty.db")}).out.find("the file is empty"), std::string::npos);
}

TEST_F(Verbs, DiffPrintsDifferences) {
    Put("b.json",
        R"({"switches": [{"id": "beta", "version": 10, "class": "vswitch", "max_ports": 512, "global": [],
        "host": [], "ports": [{"id": "9", "properties": [{"name": "x.mtu", "value": 9000}]}]}]})");
    const Result result = Dvsctl({"diff", At("a.db"), "json:" + At("b.json")});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "--- file:" + At("a.db") + "\n+++ json:" + At("b.json") +
                              "\n- switch alpha: etherswitch, 3 ports, 7 properties\n"
                              "switch beta\n"
                              "  port 9 (active)\n"
                              "    ~ x.mtu: 1500 -> 9000\n"
                              "1 removed, 1 changed\n");
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), "json:" + At("b.json"), "--columns",
                      "change,what,switch,port,name,before,after"})
                  .out,
              "CHANGE   WHAT      SWITCH  PORT  NAME   BEFORE                              AFTER\n"
              "removed  switch    alpha         alpha  etherswitch, 3 ports, 7 properties\n"
              "changed  property  beta    9     x.mtu  1500                                9000\n");
    const auto json = Json(Dvsctl({"diff", At("a.db"), "json:" + At("b.json"), "--json"}));
    EXPECT_EQ(json.at("is_same"), false);
    EXPECT_EQ(json.at("changes").at(1).at("before"), 1500);
    EXPECT_EQ(json.at("changes").at(1).at("after"), 9000);
    EXPECT_EQ(json.at("changes").at(1).at("name"), "x.mtu");
}

TEST_F(Verbs, DiffOfEqualStatesIsEmpty) {
    const Result result = Dvsctl({"diff", At("a.db"), At("a.db"), "--json"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(Json(result).at("is_same"), true);
    EXPECT_EQ(Json(result).at("changes"), boost::json::array());
}

TEST_F(Verbs, DiffFilters) {
    Put("b.json", R"({"switches": []})");
    const std::string b = "json:" + At("b.json");
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), b, "--switch", "beta"}).status, 1)
        << "a switch on one side only is a difference";
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), b, "--switch", "gamma"}).status, 4)
        << "a switch on neither side is an error";
    EXPECT_EQ(Dvsctl({"diff", b, At("a.db"), "--switch", "beta"}).status, 1);
    EXPECT_EQ(Dvsctl({"diff", b, b, "--switch", "gamma", "--if-exists"}).status, 0);
}

TEST_F(Verbs, HexdumpAnnotatesEveryByte) {
    const Result result = Dvsctl({"hexdump", At("a.db")});
    EXPECT_EQ(result.status, 0);
    for (const char *part :
         {"buffer: total length", "switch alpha: entry of", "field switchVersion: entry of 148 bytes",
          "value 8\n", "shadow port 1: entry of", "value \"shadow of 1\"", "end marker",
          "padding of the file"})
        EXPECT_NE(result.out.find(part), std::string::npos) << part;
    const auto json = Json(Dvsctl({"hexdump", At("a.db"), "--json"}));
    std::int64_t at = 0;
    for (const auto &range : json.at("ranges").as_array()) {
        EXPECT_EQ(range.at("offset"), at);
        at += range.at("size").as_int64();
    }
    EXPECT_EQ(at, static_cast<std::int64_t>(Get("a.db").size()));
}

TEST_F(Verbs, HexdumpFindsSwitchesAndPortsByIdAndAlias) {
    const std::string byId = Dvsctl({"hexdump", At("a.db"), "--switch", "alpha", "--port", "2"}).out;
    EXPECT_NE(byId.find("active port 2: entry of"), std::string::npos);
    EXPECT_EQ(byId.find("port 1"), std::string::npos);
    EXPECT_EQ(Dvsctl({"hexdump", At("a.db"), "--switch", "production", "--port", "2"}).out, byId);
    EXPECT_NE(Dvsctl({"hexdump", At("a.db"), "--port", "web-1"}).out.find("active port 1: entry of"),
              std::string::npos);
    EXPECT_EQ(Dvsctl({"hexdump", At("a.db"), "--switch", "gamma"}).status, 4);
    EXPECT_EQ(Dvsctl({"hexdump", At("a.db"), "--switch", "gamma", "--if-exists"}).out, "");
}

TEST_F(Verbs, HexdumpContinuesAfterAFault) {
    Put("cut.db", Get("a.db").substr(0, 700));
    const Result result = Dvsctl({"hexdump", At("cut.db")});
    EXPECT_EQ(result.status, 6);
    EXPECT_NE(result.out.find("!! total length in the header exceeds the buffer"), std::string::npos)
        << result.out;
    EXPECT_NE(result.out.find("damaged: "), std::string::npos);
    Put("tiny.db", "\x01\x02\x03");
    EXPECT_NE(Dvsctl({"hexdump", At("tiny.db")}).out.find("01 02 03"), std::string::npos);
}

} // namespace
