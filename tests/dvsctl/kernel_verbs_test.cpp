/* SPDX-License-Identifier: Apache-2.0 */
// Every verb about the switching module: its effect, its errors, and that a dry run changes nothing.

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>

#include "kernel_fixture.h"

namespace {

using namespace dvs::ctl::test;
using Words = std::vector<std::string>;

constexpr const char *kMtu = "com.orbeno.common.portset.mtu";
constexpr const char *kVlan = "com.orbeno.etherswitch.port.vlan";

/// A changing verb: arguments that succeed, and arguments that fail.
struct ChangeRow {
    Words good;
    Words bad;
    int status; ///< of the failing arguments
};

const ChangeRow kChanges[] = {
    {{"switch", "add", "new", "--class", "portset", "--max-ports", "5", "--switch-version", "8"},
     {"switch", "add", "alpha", "--class", "portset", "--max-ports", "5", "--switch-version", "8"},
     1},
    {{"switch", "remove", "alpha"}, {"switch", "remove", "none"}, 4},
    {{"switch", "set-version", "alpha", "12"}, {"switch", "set-version", "alpha", "33"}, 1},
    {{"switch", "set-max-ports", "alpha", "600"}, {"switch", "set-max-ports", "none", "600"}, 4},
    {{"prop", "set", "alpha", "x.new", "text"}, {"prop", "set", "none", "x.new", "text"}, 4},
    {{"prop", "set", "alpha", "x.new", "text", "--host"}, {"prop", "set", "none", "x.new", "t", "--host"}, 4},
    {{"prop", "set", "alpha", "x.new", "t", "--port", "1"},
     {"prop", "set", "alpha", "x.new", "t", "--port", "77"},
     4},
    {{"prop", "clear", "alpha", "x.mtu"}, {"prop", "clear", "alpha", "x.none"}, 4},
    {{"prop", "clear", "alpha", "x.host", "--host"}, {"prop", "clear", "alpha", "x.mtu", "--host"}, 4},
    {{"prop", "clear", "alpha", "x.blob", "--port", "1"},
     {"prop", "clear", "alpha", "x.no", "--port", "1"},
     4},
    {{"port", "add", "alpha", "77"}, {"port", "add", "alpha", "2"}, 1},
    {{"port", "remove", "alpha", "2"}, {"port", "remove", "alpha", "77"}, 4},
    {{"state", "cleanup"}, {"state", "cleanup", "more"}, 2},
};

Words Plus(Words words, const Words &more) {
    words.insert(words.end(), more.begin(), more.end());
    return words;
}

class KernelVerbs : public KernelTest {};

TEST_F(KernelVerbs, EveryChangeIsMadeAndReported) {
    for (const ChangeRow &row : kChanges) {
        ASSERT_EQ(Kernel({"copy", At("start.db"), "kernel:"}).status, 0);
        const std::string before = Everything();
        const Result result = Verb(Plus(row.good, {"--json"}));
        EXPECT_EQ(result.status, 0) << row.good[0] << ' ' << row.good[1] << result.err << result.out;
        EXPECT_EQ(Json(result).at("is_changed"), true);
        EXPECT_NE(Everything(), before) << row.good[0] << ' ' << row.good[1];
    }
}

TEST_F(KernelVerbs, DryRunShowsTheChangeAndMakesNone) {
    const std::string before = Everything();
    for (const ChangeRow &row : kChanges) {
        const Result result = Verb(Plus(row.good, {"--json", "--dry-run"}));
        EXPECT_EQ(result.status, 0) << row.good[0] << ' ' << row.good[1] << result.out;
        EXPECT_FALSE(Json(result).at("changes").as_array().empty()) << result.out;
        EXPECT_EQ(Json(result).at("is_changed"), false);
        EXPECT_EQ(Everything(), before) << row.good[0] << ' ' << row.good[1];
    }
}

TEST_F(KernelVerbs, FailuresReturnTheirStatusAndChangeNothing) {
    const std::string before = Everything();
    for (const ChangeRow &row : kChanges) {
        for (const Words &extra : {Words{}, Words{"--dry-run"}}) {
            const Result result = Verb(Plus(row.bad, Plus(extra, {"--json"})));
            EXPECT_EQ(result.status, row.status) << row.bad[0] << ' ' << row.bad[1] << result.out;
            EXPECT_EQ(Json(result).at("error").at("status"), row.status);
        }
        EXPECT_EQ(Everything(), before) << row.bad[0] << ' ' << row.bad[1];
    }
}

TEST_F(KernelVerbs, ProgramsVersionOptionIsNotTheSwitchsVersion) {
    const std::string before = Everything();
    for (const Words &words : {Words{"--version", "9"}, Words{"9", "--version"}, Words{"--version"}}) {
        const Result result =
            Verb(Plus({"switch", "add", "new", "--class", "vswitch", "--max-ports", "8"}, words));
        EXPECT_EQ(result.status, 2);
        EXPECT_NE(result.err.find("--switch-version"), std::string::npos) << result.err;
    }
    EXPECT_EQ(Everything(), before);
}

TEST_F(KernelVerbs, MayExistAndIfExistsTolerateExistingAndMissing) {
    const Words add = {"switch", "add", "alpha", "--class", "x", "--max-ports", "5", "--switch-version", "8"};
    EXPECT_EQ(Json(Verb(Plus(add, {"--may-exist", "--json"}))).at("was_there"), true);
    EXPECT_EQ(Verb({"port", "add", "alpha", "2", "--may-exist"}).status, 0);
    EXPECT_EQ(Json(Verb({"switch", "remove", "none", "--if-exists", "--json"})).at("was_there"), false);
    EXPECT_EQ(Verb({"port", "remove", "alpha", "77", "--if-exists"}).status, 0);
    EXPECT_EQ(Verb({"prop", "clear", "alpha", "x.none", "--if-exists"}).status, 0);
    const Result absent = Verb({"prop", "get", "alpha", "x.none", "--if-exists", "--json"});
    EXPECT_EQ(absent.status, 0);
    EXPECT_FALSE(Json(absent).as_object().contains("value"));
}

TEST_F(KernelVerbs, WarnsOfAMissingVersionPropertyWithTheFixingCommand) {
    Words add = {"switch", "add", "it's", "--class", "portset", "--max-ports", "5", "--switch-version", "8"};
    const Result added = Verb(add);
    EXPECT_EQ(added.status, 0);
    EXPECT_NE(added.err.find("warning: switch it's has no property com.orbeno.common.version"),
              std::string::npos)
        << added.err;
    const Result saved = Kernel({"copy", "kernel:", "store:"});
    EXPECT_NE(saved.err.find("warning: "), std::string::npos) << saved.err;
    EXPECT_EQ(Kernel({"show", "store:"}).status, 7);

    // The suggested command, quoted for a shell.
    const std::string mend = "dvsctl kernel prop set 'it'\"'\"'s' com.orbeno.common.version 8 --as number";
    EXPECT_NE(added.err.find(mend), std::string::npos) << added.err;
    for (const char *id : {"it's", "alpha", "beta"})
        ASSERT_EQ(Verb({"prop", "set", id, "com.orbeno.common.version", "8", "--as", "number"}).status, 0);
    const Result again = Kernel({"copy", "kernel:", "store:"});
    EXPECT_EQ(again.err, "");
    EXPECT_EQ(Kernel({"show", "store:"}).status, 0);

    const Result cleared = Verb({"prop", "clear", "it's", "com.orbeno.common.version", "--json"});
    EXPECT_EQ(Json(cleared).at("warnings").as_array().size(), 1u);
    add.insert(add.end(), {"--may-exist", "--json"}); // unchanged
    EXPECT_FALSE(Json(Verb(add)).as_object().contains("warnings"));
}

TEST_F(KernelVerbs, AssociationsAreMadeAndRemoved) {
    const std::string before = Everything();
    EXPECT_EQ(Verb({"switch", "associate", "alpha", "--dry-run"}).status, 0);
    EXPECT_EQ(Verb({"exec", "", "stats"}).out.find(" associated"), std::string::npos);
    EXPECT_EQ(Verb({"switch", "associate", "alpha"}).status, 0);
    EXPECT_NE(Verb({"exec", "", "stats"}).out.find(" associated"), std::string::npos);
    EXPECT_EQ(Verb({"switch", "dissociate", "alpha"}).status, 0);
    EXPECT_EQ(Verb({"exec", "", "stats"}).out.find(" associated"), std::string::npos);
    EXPECT_EQ(Verb({"switch", "associate", "none"}).status, 4);
    EXPECT_EQ(Verb({"switch", "dissociate", "none", "--dry-run"}).status, 4);
    EXPECT_EQ(Everything(), before);
}

TEST_F(KernelVerbs, SanitizeRemovesLeftoverPorts) {
    ASSERT_EQ(Verb({"port", "add", "alpha", "8", "--kind", "zombie"}).status, 0);
    const Result plan = Verb({"state", "sanitize", "--dry-run", "--json"});
    EXPECT_EQ(Json(plan).at("changes").at(0).at("port"), "8");
    EXPECT_EQ(Verb({"state", "sanitize"}).status, 0);
    EXPECT_EQ(Verb({"ports", "alpha", "--kind", "zombie"}).out, "");
}

TEST_F(KernelVerbs, AcceptsAliasesAsIds) {
    EXPECT_EQ(Verb({"prop", "get", "production", "x.mtu"}).out, "9000\n");
    EXPECT_EQ(Json(Verb({"prop", "set", "production", "x.n", "t", "--port", "web-1", "--json"})).at("port"),
              "1");
    EXPECT_EQ(Verb({"port", "add", "production", "78"}).status, 0);
    EXPECT_EQ(Verb({"port", "find", "alpha", "78"}).status, 0);
    EXPECT_EQ(Verb({"exec", "production", "ports"}).status, 0);
}

TEST_F(KernelVerbs, RejectsNamesThatWouldBeTruncated) {
    const std::string before = Everything();
    EXPECT_EQ(Verb({"switch", "remove", std::string(64, 's')}).status, 2);
    EXPECT_EQ(Verb({"port", "remove", "alpha", std::string(48, 'p')}).status, 2);
    EXPECT_EQ(Verb({"prop", "set", "alpha", std::string(128, 'n'), "t"}).status, 2);
    EXPECT_EQ(Verb({"exec", "", std::string(128, 'c')}).status, 2);
    EXPECT_EQ(Verb({"find-external-id", "alpha", std::string(128, 'e')}).status, 2);
    EXPECT_EQ(Everything(), before);
}

TEST_F(KernelVerbs, AcceptsValuesInEveryForm) {
    const struct {
        Words words;
        const char *hex;
    } rows[] = {
        {{"hello"}, "68656c6c6f00"},
        {{"1500", "--as", "text"}, "3135303000"},
        {{"1500", "--as", "number"}, "dc050000"},
        {{"0xff", "--as", "number"}, "ff000000"},
        {{"01 ff", "--as", "hex"}, "01ff"},
        {{R"({"hex": "01ff00"})"}, "01ff00"},
        {{"@" + At("bytes")}, "00f0"},
        {{"--file", At("bytes")}, "00f0"},
        {{"--file", At("json"), "--as", "json"}, "0102"},
    };
    Put("bytes", std::string("\0\xf0", 2));
    Put("json", R"({"hex": "0102"})");
    for (const auto &row : rows) {
        EXPECT_EQ(Verb(Plus({"prop", "set", "alpha", "x.value"}, row.words)).status, 0) << row.hex;
        const Result raw = Verb({"prop", "get", "alpha", "x.value", "--raw"});
        EXPECT_EQ(dvs::form::ToHexDigits(dvs::form::AsBytes(raw.out)), row.hex);
    }
    EXPECT_EQ(Verb({"prop", "set", "alpha", "x.value", "--file", "-"}, "\x07").status, 0);
    EXPECT_EQ(Verb({"prop", "get", "alpha", "x.value", "--raw"}).out, "\x07");
}

TEST_F(KernelVerbs, KnownPropertiesAcceptTheStoresValues) {
    EXPECT_EQ(Verb({"prop", "set", "alpha", kMtu, "1500"}).status, 0);
    EXPECT_EQ(Json(Verb({"prop", "get", "alpha", kMtu, "--json"})).at("value"), 1500);
    EXPECT_EQ(Verb({"prop", "set", "alpha", kVlan, R"({"vlan_id": 100})", "--port", "1"}).status, 0);
    EXPECT_EQ(Verb({"prop", "get", "alpha", kVlan, "--port", "1"}).out.find("VLAN 100"), 0u);
    const Result wrong = Verb({"prop", "set", "alpha", kVlan, R"({"vlan": 100})", "--port", "1", "--json"});
    EXPECT_EQ(wrong.status, 6);
    EXPECT_EQ(Json(wrong).at("error").at("field"), "vlan");
    EXPECT_EQ(Verb({"prop", "set", "alpha", kMtu, "large"}).status, 6);
}

TEST_F(KernelVerbs, RejectsValuesOfAmbiguousForm) {
    const std::string before = Everything();
    for (const Words &words :
         {Words{"1500"}, Words{""}, Words{}, Words{"a", "--file", "b"}, Words{"a", "--as", "number"},
          Words{"a", "--as", "octal"}, Words{"0g", "--as", "hex"}, Words{"a", "--type", "x"},
          Words{"a", "--host", "--global"}})
        EXPECT_EQ(Verb(Plus({"prop", "set", "alpha", "x.value"}, words)).status, 2);
    EXPECT_EQ(Verb({"prop", "set", "alpha", "x.value", "{\"hex\": "}).status, 6);
    EXPECT_NE(Verb({"prop", "set", "alpha", "x.value", "@" + At("none")}).status, 0);
    EXPECT_EQ(Everything(), before);
}

TEST_F(KernelVerbs, SetsTheRequestedType) {
    ASSERT_EQ(Verb({"prop", "set", "alpha", "x.typed", "t", "--type", "0x18"}).status, 0);
    const Result listed = Verb({"vendor-props", "alpha", "--type", "0x18", "--json"});
    EXPECT_EQ(Json(listed).at("properties").at(0).at("name"), "x.typed");
}

TEST_F(KernelVerbs, SmartNicOptionAppliesToEveryList) {
    EXPECT_EQ(Verb({"prop", "get", "alpha", "x.mtu", "--smartnic"}).out, "9000\n");
    EXPECT_EQ(Verb({"prop", "get", "alpha", "x.host", "--host", "--smartnic"}).out, "\"h\"\n");
    EXPECT_EQ(Verb({"prop", "get", "alpha", "x.blob", "--port", "1", "--smartnic", "--raw"}).out,
              std::string("\1\2\0", 3));
    const std::string stats = Verb({"exec", "", "stats"}).out;
    for (const char *command : {"command 29 1\n", "command 30 1\n", "command 31 1\n"})
        EXPECT_NE(stats.find(command), std::string::npos) << stats;
    EXPECT_EQ(Verb({"prop", "get", "alpha", "x.none", "--smartnic"}).status, 4);
}

TEST_F(KernelVerbs, AcceptsPortsAsJsonOrSerializedData) {
    const std::string json = R"({"kind": "shadow", "properties": [{"name": "x.a", "value": "b"}]})";
    ASSERT_EQ(Verb({"port", "add", "alpha", "70", "--file", "-"}, json).status, 0);
    EXPECT_NE(Verb({"ports", "alpha", "--kind", "shadow"}).out.find("70"), std::string::npos);
    Put("list", Verb({"port", "state", "alpha", "1", "--raw"}).out);
    ASSERT_EQ(Verb({"port", "add", "alpha", "71", "--file", At("list")}).status, 0);
    EXPECT_EQ(Verb({"port", "state", "alpha", "71"}).out, Verb({"port", "state", "alpha", "1"}).out);
    Put("bad", "not a list");
    EXPECT_EQ(Verb({"port", "add", "alpha", "72", "--file", At("bad")}).status, 6);
    EXPECT_EQ(Verb({"port", "add", "alpha", "72", "--file", "-"}, R"({"ports": 1})").status, 6);
    EXPECT_EQ(Verb({"port", "find", "alpha", "72"}).status, 4);
}

TEST_F(KernelVerbs, ShowsModulePropertiesInTypedFormToo) {
    const std::string vlan = "com.orbeno.etherswitch.port.vlan",
                      security = "com.orbeno.etherswitch.port.security";
    ASSERT_EQ(Verb({"prop", "set", "alpha", vlan, R"({"vlan_id": 100})", "--port", "1"}).status, 0);
    ASSERT_EQ(Verb({"prop", "set", "alpha", security, "00", "--as", "hex", "--port", "1"}).status, 0);
    const boost::json::value one = Json(Verb({"prop", "get", "alpha", vlan, "--port", "1", "--json"}));
    EXPECT_EQ(one.at("value").at("hex"), "0000640000000000");
    EXPECT_EQ(one.at("typed").at("vlan_id"), 100);
    EXPECT_EQ(one.at("summary"), "VLAN 100");
    const boost::json::value bad = Json(Verb({"prop", "get", "alpha", security, "--port", "1", "--json"}));
    EXPECT_FALSE(bad.as_object().contains("typed"));
    EXPECT_NE(bad.at("damage").as_string().size(), 0U);

    const Result state = Verb({"port", "state", "alpha", "1"});
    EXPECT_NE(state.out.find("VLAN 100"), std::string::npos) << state.out;
    EXPECT_NE(state.out.find("(does not fit: "), std::string::npos) << state.out;
    bool found = false;
    const boost::json::value list = Json(Verb({"port", "state", "alpha", "1", "--json"}));
    for (const boost::json::value &property : list.at("properties").as_array()) {
        if (property.at("name").as_string() != vlan) continue;
        found = true;
        EXPECT_EQ(property.at("typed"), one.at("typed"));
    }
    EXPECT_TRUE(found);
}

TEST_F(KernelVerbs, PortStateListsPropertiesWithOrWithoutVolatileOnes) {
    ASSERT_EQ(Verb({"prop", "set", "alpha", "x.volatile.y", "z", "--port", "1"}).status, 0);
    EXPECT_NE(Verb({"port", "state", "alpha", "1"}).out.find("x.volatile.y"), std::string::npos);
    const Result kept = Verb({"port", "state", "alpha", "1", "--persistent"});
    EXPECT_EQ(kept.out.find("x.volatile.y"), std::string::npos);
    EXPECT_NE(kept.out.find("x.blob"), std::string::npos);
    EXPECT_EQ(Verb({"port", "state", "alpha", "1", "--columns", "name", "--no-headings"}).out,
              "com.orbeno.common.port.alias\nx.blob\nx.volatile.y\n");
    EXPECT_EQ(Verb({"port", "state", "alpha", "77"}).status, 4);
}

TEST_F(KernelVerbs, UplinkDataIsKeptPerNumber) {
    EXPECT_EQ(Verb({"uplink", "set", "alpha", "1", "0", "7", "--as", "number", "--dry-run"}).status, 0);
    EXPECT_EQ(Verb({"uplink", "get", "alpha", "1", "0"}).status, 4);
    EXPECT_EQ(Verb({"uplink", "set", "alpha", "1", "0", "7", "--as", "number"}).status, 0);
    EXPECT_EQ(Verb({"uplink", "set", "alpha", "1", "--", "-1", "below"}).status, 0);
    EXPECT_EQ(Verb({"uplink", "get", "alpha", "1", "0"}).out, "7\n");
    const auto below = Json(Verb({"uplink", "get", "alpha", "1", "--json", "--", "-1"}));
    EXPECT_EQ(below.at("uplink"), -1);
    EXPECT_EQ(below.at("value"), "below");
    EXPECT_EQ(Verb({"uplink", "set", "alpha", "77", "0", "x"}).status, 4);
    EXPECT_EQ(Verb({"uplink", "get", "alpha", "1", "one"}).status, 2);
}

TEST_F(KernelVerbs, PortsAreListedByKind) {
    EXPECT_EQ(Verb({"ports", "alpha", "--columns", "port,kind", "--no-headings"}).out,
              "1  active\n2  active\n1  shadow\n");
    EXPECT_EQ(Json(Verb({"ports", "alpha", "--json"})).at("ports").as_array().size(), 3u);
    EXPECT_EQ(Json(Verb({"ports", "alpha", "--kind", "zombie", "--json"})).at("ports"), boost::json::array());
    EXPECT_EQ(Verb({"ports", "none"}).status, 4);
    EXPECT_EQ(Verb({"ports", "alpha", "--kind", "odd"}).status, 2);
}

TEST_F(KernelVerbs, FindsPortsByExternalId) {
    const char *key = "com.orbeno.port.extraConfig.vnic.external.id";
    ASSERT_EQ(Verb({"prop", "set", "alpha", key, "vm-7", "--as", "text", "--port", "2"}).status, 0);
    EXPECT_EQ(Verb({"find-external-id", "alpha", "vm-7"}).out, "2\n");
    EXPECT_EQ(Json(Verb({"find-external-id", "alpha", "vm-7", "--json"})).at("port"), "2");
    EXPECT_EQ(Verb({"find-external-id", "alpha", "other"}).status, 4);
    EXPECT_EQ(Verb({"find-external-id", "none", "vm-7"}).status, 4);
    EXPECT_EQ(Json(Verb({"find-external-id", "alpha", "x", "--if-exists", "--json"})).at("is_there"), false);
}

TEST_F(KernelVerbs, QueriesFilterTheLists) {
    const auto names = [&](Words words) {
        return Verb(Plus(std::move(words), {"--columns", "name", "--no-headings"})).out;
    };
    ASSERT_EQ(Verb({"prop", "set", "alpha", "com.orbeno.extraconfig.a", "b"}).status, 0);
    ASSERT_EQ(Verb({"prop", "set", "alpha", "com.orbeno.port.extraConfig.c", "d", "--port", "1"}).status, 0);
    ASSERT_EQ(Verb({"prop", "set", "alpha", "com.orbeno.ovl.e", "f", "--host"}).status, 0);
    EXPECT_EQ(names({"vendor-props", "alpha"}), "x.mtu\n");
    EXPECT_EQ(names({"vendor-props", "alpha", "--host"}), "x.host\ncom.orbeno.ovl.e\n");
    EXPECT_EQ(names({"vendor-props", "alpha", "--port", "1"}), "x.blob\n");
    EXPECT_EQ(names({"extra-props", "alpha"}), "com.orbeno.extraconfig.a\n");
    EXPECT_EQ(names({"extra-props", "alpha", "--port", "1"}), "com.orbeno.port.extraConfig.c\n");
    EXPECT_EQ(names({"overlay-props", "alpha"}), "");
    EXPECT_EQ(names({"overlay-props", "alpha", "--host"}), "com.orbeno.ovl.e\n");
    EXPECT_EQ(Json(Verb({"overlay-props", "alpha", "--json"})).at("properties"), boost::json::array());
    for (const char *verb : {"vendor-props", "extra-props", "overlay-props"})
        EXPECT_EQ(Verb({verb, "none"}).status, 4);
    EXPECT_EQ(Verb({"vendor-props", "alpha", "--port", "77"}).status, 4);
}

TEST_F(KernelVerbs, TextCommandsPassThrough) {
    EXPECT_NE(Verb({"exec", "", "help"}).out.find("stats"), std::string::npos);
    EXPECT_TRUE(Json(Verb({"exec", "", "stats", "--json"})).as_object().contains("reply"));
    EXPECT_EQ(Verb({"exec", "", "no such command"}).status, 1);
    EXPECT_EQ(Verb({"exec", "", "fault command=3,status=0x0bad0014", "--dry-run"}).status, 0);
    EXPECT_EQ(Kernel({"verify", "kernel:"}).status, 0);
}

TEST_F(KernelVerbs, HelpNamesEveryVerbWithExamples) {
    const std::string overview = Kernel({"--help"}).out;
    for (const char *verb : {"kernel switch add", "kernel prop set", "kernel exec", "kernel state cleanup"})
        EXPECT_NE(overview.find(verb), std::string::npos) << verb;
    const Result help = Verb({"prop", "set", "--help"});
    EXPECT_EQ(help.status, 0);
    EXPECT_NE(help.out.find("Examples:\n  dvsctl kernel prop set"), std::string::npos) << help.out;
}

} // namespace
