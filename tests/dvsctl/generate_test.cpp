/* SPDX-License-Identifier: Apache-2.0 */
// States from `dvsctl generate`: complete, valid, varied, and reproducible by seed.

#include "program.h"

#include <set>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>

#include "dvs/configstore.h"

namespace {

using namespace dvs::ctl::test;
namespace json = boost::json;

class Generate : public ProgramTest {
protected:
    json::array Switches(std::vector<std::string> args) {
        args.insert(args.begin(), "generate");
        args.push_back(At("a.db"));
        EXPECT_EQ(Dvsctl(args).status, 0);
        return Json(Dvsctl({"show", At("a.db"), "--json"})).at("switches").as_array();
    }
};

std::set<std::string> Names(const json::value &list) {
    std::set<std::string> names;
    for (const json::value &property : list.as_array()) {
        EXPECT_FALSE(property.as_object().contains("damage")) << property;
        names.emplace(property.at("name").as_string());
    }
    return names;
}

std::set<std::string> NamesOfPorts(const json::value &sw) {
    std::set<std::string> names;
    for (const json::value &port : sw.at("ports").as_array())
        names.merge(Names(port.at("properties")));
    return names;
}

// Selects by name: the common keys and those of the class's family. A cswitch has no frame size key.
std::set<std::string> MappedKeys(int propClass, std::string_view className) {
    const bool isVswitch = className == "vswitch" || className == "cswitch";
    const std::string_view others = isVswitch ? "com.orbeno.etherswitch." : "com.orbeno.vswitch.";
    std::set<std::string> keys;
    for (const auto *row = GetConfigMap(propClass); row->key; ++row) {
        const std::string_view key = row->key;
        if (key == "DEFAULT" || key.starts_with(others)) continue;
        if (className == "cswitch" && key == "com.orbeno.vswitch.mtu") continue;
        keys.emplace(key);
    }
    return keys;
}

void ExpectAll(const std::set<std::string> &found, const std::set<std::string> &wanted,
               const json::value &of) {
    for (const std::string &key : wanted)
        EXPECT_TRUE(found.contains(key)) << key << " is missing in a switch of class " << of;
}

TEST_F(Generate, SameSeedGivesTheSameBytes) {
    for (const char *name : {"a.db", "b.db"})
        ASSERT_EQ(Dvsctl({"generate", "--ports", "3", "--seed", "7", At(name)}).status, 0);
    ASSERT_EQ(Dvsctl({"generate", "--ports", "3", "--seed", "8", At("c.db")}).status, 0);
    EXPECT_EQ(Get("a.db"), Get("b.db"));
    EXPECT_NE(Get("a.db"), Get("c.db"));
    EXPECT_EQ(Dvsctl({"verify", At("a.db")}).status, 0);
}

// The bytes from one compiler; the others must agree. Update it when the generator draws different values.
TEST_F(Generate, BytesAreTheSameWithEveryCompiler) {
    ASSERT_EQ(Dvsctl({"generate", "--switches", "15", "--ports", "24", "--seed", "7", At("a.db")}).status, 0);
    std::uint64_t hash = 0xcbf29ce484222325;
    for (const char c : Get("a.db"))
        hash = (hash ^ static_cast<unsigned char>(c)) * 0x100000001b3;
    EXPECT_EQ(hash, 12289001475230931003u);
}

TEST_F(Generate, EverySwitchHasEveryMappedKeyOfItsClass) {
    for (const char *ports : {"2", "3", "4", "5", "9", "12"}) {
        std::set<std::string> classes;
        for (const json::value &sw : Switches({"--ports", ports, "--seed", ports})) {
            const std::string className(sw.at("class").as_string());
            classes.insert(className);
            ExpectAll(Names(sw.at("global")), MappedKeys(DVS_PROP_CLASS_GLOBAL, className), sw.at("class"));
            ExpectAll(Names(sw.at("host")), MappedKeys(DVS_PROP_CLASS_HOST, className), sw.at("class"));
            ExpectAll(NamesOfPorts(sw), MappedKeys(DVS_PROP_CLASS_PORT, className), sw.at("class"));
        }
        EXPECT_EQ(classes, (std::set<std::string>{"etherswitch", "vswitch", "cswitch"}));
    }
}

TEST_F(Generate, TwoSwitchesOfTwoPortsCoverEveryMappedKey) {
    std::set<std::string> found;
    for (const json::value &sw : Switches({"--switches", "2", "--ports", "2"})) {
        found.merge(Names(sw.at("global")));
        found.merge(Names(sw.at("host")));
        found.merge(NamesOfPorts(sw));
    }
    for (const int propClass : {DVS_PROP_CLASS_GLOBAL, DVS_PROP_CLASS_HOST, DVS_PROP_CLASS_PORT}) {
        for (const auto *row = GetConfigMap(propClass); row->key; ++row)
            EXPECT_TRUE(found.contains(row->key) || std::string_view(row->key) == "DEFAULT") << row->key;
    }
}

TEST_F(Generate, ClassesVersionsAndKindsVary) {
    std::set<std::string> classes, kinds;
    std::set<std::int64_t> versions;
    std::size_t unnamed = 0;
    for (const json::value &sw : Switches({"--switches", "15"})) {
        classes.emplace(sw.at("class").as_string());
        versions.insert(sw.at("version").as_int64());
        for (const json::value &port : sw.at("ports").as_array()) {
            kinds.emplace(port.at("kind").as_string());
            unnamed += Names(port.at("properties")).contains("com.orbeno.common.port.alias") ? 0 : 1;
        }
    }
    EXPECT_EQ(classes,
              (std::set<std::string>{"cswitch", "etherswitch", "ovlvswitch", "stub-vswitch", "vswitch"}));
    EXPECT_EQ(versions.size(), 15U);
    EXPECT_EQ(kinds, (std::set<std::string>{"active", "local-cache", "shadow", "zombie"}));
    EXPECT_GT(unnamed, 0U);
}

TEST_F(Generate, AcceptsOneClassAndVersionForAll) {
    for (const json::value &sw : Switches({"--class", "vswitch", "--switch-version", "8"})) {
        EXPECT_EQ(sw.at("class"), "vswitch");
        EXPECT_EQ(sw.at("version"), 8);
    }
    EXPECT_EQ(Dvsctl({"generate", "--class", "aswitch", At("b.db")}).status, 2);
    EXPECT_EQ(Dvsctl({"generate", "--switch-version", "13", At("b.db")}).status, 2);
}

TEST_F(Generate, StoreAcceptsEveryGeneratedState) {
    for (int seed = 0; seed < 5; ++seed)
        ASSERT_EQ(Dvsctl({"generate", "--switches", "32", "--ports", "9", "--seed", std::to_string(seed),
                          "store:" + At("store.db")})
                      .status,
                  0)
            << seed;
}

TEST_F(Generate, AcceptsAnySeed) {
    for (int seed = 0; seed < 40; ++seed)
        ASSERT_EQ(Dvsctl({"generate", "--ports", "5", "--seed", std::to_string(seed), At("a.db")}).status, 0)
            << seed;
}

TEST_F(Generate, AcceptsZeroPortsAndZeroSwitches) {
    EXPECT_EQ(Switches({"--ports", "0"}).size(), 3U);
    EXPECT_TRUE(Switches({"--switches", "0"}).empty());
}

TEST_F(Generate, DryRunShowsWhatWouldBeWritten) {
    const Result fresh = Dvsctl({"generate", "--dry-run", At("a.db")});
    EXPECT_EQ(fresh.status, 0);
    EXPECT_NE(fresh.out.find("would create"), std::string::npos) << fresh.out;
    EXPECT_NE(fresh.out.find("+ switch "), std::string::npos) << fresh.out;
    EXPECT_TRUE(Files().empty());

    ASSERT_EQ(Dvsctl({"generate", At("a.db")}).status, 0);
    const std::string before = Get("a.db");
    const json::value plan = Json(Dvsctl({"generate", "--dry-run", "--json", "--seed", "2", At("a.db")}));
    EXPECT_EQ(plan.at("command"), "generate");
    EXPECT_EQ(plan.at("is_written"), false);
    EXPECT_EQ(plan.at("changes").as_array().size(), 6U); // three switches removed, three added
    EXPECT_NE(Dvsctl({"generate", "--dry-run", At("a.db")}).out.find("would change nothing"),
              std::string::npos);
    EXPECT_EQ(Get("a.db"), before);
}

TEST_F(Generate, ReplacesOnlyWithPermission) {
    ASSERT_EQ(Dvsctl({"generate", "--no-replace", At("a.db")}).status, 0);
    const std::string before = Get("a.db");
    EXPECT_EQ(Dvsctl({"generate", "--no-replace", "--seed", "2", At("a.db")}).status, 1);
    EXPECT_EQ(Get("a.db"), before);
}

TEST_F(Generate, RejectsInvalidNumbers) {
    EXPECT_EQ(Dvsctl({"generate", "--ports", "x", At("a.db")}).status, 2);
    EXPECT_EQ(Dvsctl({"generate", "--switches", "-1", At("a.db")}).status, 2);
    EXPECT_EQ(Dvsctl({"generate", "--switches", "33", At("a.db")}).status, 2);
    EXPECT_TRUE(Files().empty());
}

} // namespace
