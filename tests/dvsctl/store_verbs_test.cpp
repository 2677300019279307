/* SPDX-License-Identifier: Apache-2.0 */
// dvsctl store list, export, import, delete, history, restore, backup, upgrade and check; dvsctl schema.

#include <sys/stat.h>

#include "store_fixture.h"

namespace {

using namespace dvs::ctl::test;

using StoreVerbs = StoreProgram;

TEST_F(StoreVerbs, FailWithoutAStoreAndCreateNone) {
    const std::vector<std::vector<std::string>> verbs = {
        {"store", "list"},          {"store", "export", "alpha"},
        {"store", "history"},       {"store", "delete", "alpha"},
        {"store", "check"},         {"store", "restore", "--revision", "1"},
        {"store", "backup", "b.db"}};
    for (const auto &verb : verbs) {
        const Result result = Ctl(verb);
        EXPECT_EQ(result.status, 7) << verb[1];
        EXPECT_NE(result.err.find("there is no config store"), std::string::npos) << result.err;
    }
    EXPECT_EQ(Json(Ctl({"store", "list", "--if-exists", "--json"})).at("objects"), boost::json::array());
    EXPECT_EQ(Files(), std::vector<std::string>{"site.db"});
}

TEST_F(StoreVerbs, ListPrintsATableOrADocument) {
    Save();
    const auto document = Json(Ctl({"store", "list", "--json"}));
    ASSERT_EQ(document.at("objects").as_array().size(), 2u);
    const auto &first = document.at("objects").at(0);
    EXPECT_EQ(first.at("switch"), "alpha");
    EXPECT_EQ(first.at("name"), "production");
    EXPECT_EQ(first.at("layer"), "current");
    EXPECT_EQ(first.at("revision"), 1);
    EXPECT_EQ(Ctl({"store", "list", "--columns", "switch,name,revision", "--no-headings"}).out,
              "alpha  production  1\nbeta   storage     1\n");
    EXPECT_EQ(Ctl({"store", "list", "--layer", "desired", "--json"}).status, 0);
    EXPECT_EQ(Ctl({"store", "list", "--layer", "x"}).status, 2);
}

TEST_F(StoreVerbs, ExportedDocumentImportsUnchanged) {
    Save();
    ASSERT_EQ(Ctl({"store", "export", "production", At("alpha.json")}).status, 0);
    EXPECT_EQ(Get("alpha.json"), Document());
    EXPECT_NE(Ctl({"store", "import", "--dry-run", At("alpha.json")}).out.find("would change nothing"),
              std::string::npos);
    EXPECT_EQ(Ctl({"store", "import", At("alpha.json"), "--no-replace"}).status, 1);
    EXPECT_EQ(Ctl({"store", "import", At("alpha.json")}).status, 0);
    EXPECT_EQ(Get("alpha.json"), Document());
    EXPECT_EQ(Ctl({"store", "export", "gamma"}).status, 4);
}

struct BadDocument {
    const char *what, *text, *named;
};

TEST_F(StoreVerbs, ImportRejectsWithTheFieldAndStoresNothing) {
    Save();
    const std::string before = Get("store.db");
    const BadDocument cases[] = {
        {"unknown member", R"({"uuid": "alpha", "settings": {"max_mtuu": 1}})", "field settings/max_mtuu"},
        {"unknown member of an instance", R"({"uuid": "alpha", "ports": {"7": {"nmae": "a"}}})",
         "field ports[7]/nmae"},
        {"NUL in a text", R"({"uuid": "alpha", "product": {"version": "7\u0000"}})", "field product/version"},
        {"NUL in a text of a list", R"({"uuid": "alpha", "uplink_port_keys": ["7", "8\u0000"]})",
         "field uplink_port_keys"},
        {"NUL in a name", R"({"uuid": "alpha", "settings": {"max\u0000": 1}})", "field settings/max\\x00"},
        {"NUL in an id", R"({"uuid": "alpha", "ports": {"7\u0000": {}}})", "field ports"},
        {"not UTF-8", "{\"uuid\": \"alpha\", \"name\": \"a\xff\"}", "it is not UTF-8"},
        {"type", R"({"uuid": "alpha", "max_ports": "many"})", "max_ports"},
        {"range", R"({"uuid": "alpha", "settings": {"max_mtu": -1}})", "settings/max_mtu"},
        {"duplicate key", R"({"uuid": "alpha", "name": "a", "name": "b"})", "name"},
        {"no JSON", R"({"uuid": "alpha")", "document.json"},
        {"no object", R"([])", "document.json"},
        {"no id", R"({"name": "a"})", "uuid"},
    };
    for (const BadDocument &bad : cases) {
        Put("document.json", bad.text);
        const Result refused = Ctl({"store", "import", At("document.json")});
        EXPECT_EQ(refused.status, 6) << bad.what;
        EXPECT_NE(refused.err.find(bad.named), std::string::npos) << bad.what << ":\n" << refused.err;
        EXPECT_NE(refused.err.find("document.json"), std::string::npos) << bad.what;
    }
    Put("document.json", std::string(100000, '[') + std::string(100000, ']'));
    EXPECT_EQ(Ctl({"store", "import", At("document.json")}).status, 6);
    EXPECT_EQ(Get("store.db"), before);
}

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool kMemoryCounts = false; // a sanitizer's own bookkeeping dominates
#else
constexpr bool kMemoryCounts = true;
#endif

// Applies even to documents with very little text per value.
TEST_F(StoreVerbs, ImportRejectsWithinTenTimesTheDocumentsSize) {
    constexpr std::size_t size = kMemoryCounts ? 2'000'000 : 100'000;
    const long idle = Dvsctl({"store", "import", At("none.json")}).peakKilobytes;
    std::string ids = R"({"uuid": "alpha", "ports": {"p": {})";
    std::string numbers = R"({"uuid": "alpha", "uplink_port_keys": [0)",
                unknown = R"({"uuid": "alpha", "new": [[])";
    for (int i = 0; ids.size() < size; ++i)
        ids += ",\"" + std::to_string(i) + "\":{}";
    while (numbers.size() < size)
        numbers += ",0", unknown += ",[]";
    for (const std::string &document : {ids + ",\"x\":1}}", numbers + "]}", unknown + "]}"}) {
        Put("document.json", document);
        const Result refused = Ctl({"store", "import", At("document.json")});
        EXPECT_EQ(refused.status, 6) << refused.out << refused.err;
        if (kMemoryCounts) {
            EXPECT_LE(refused.peakKilobytes - idle, static_cast<long>(document.size() / 100))
                << document.substr(0, 60);
        }
    }
}

TEST_F(StoreVerbs, ImportWarnsIfTheStoreNoLongerLoads) {
    Save();
    const BadDocument cases[] = {
        {"no id", R"({"name": "a"})", "Failed to get uuid"},
        {"no class", R"({"uuid": "beta"})", "Failed to get product obj"},
        {"port id",
         R"({"uuid": "beta", "max_ports": 1, "product": {"version": "7.0.2", "forwarding_class": "x"},
         "ports": {"a123456789a123456789a123456789a123456789a123456789a123456789a123456789": {"name": "a"}}})",
         "port id is too long"},
    };
    for (const BadDocument &bad : cases) {
        Put("document.json", bad.text);
        const Result imported = Ctl({"store", "import", At("document.json"), "--switch", "beta", "--quiet"});
        EXPECT_EQ(imported.status, 0) << imported.err;
        EXPECT_NE(imported.err.find("warning: as it is saved now, the config store cannot be loaded"),
                  std::string::npos)
            << bad.what << ": " << imported.err;
        EXPECT_NE(imported.err.find(bad.named), std::string::npos) << bad.what << ": " << imported.err;
        EXPECT_NE(Ctl({"verify", "store:"}).status, 0) << bad.what;
        // The desired layer alone is not a state.
        EXPECT_EQ(Ctl({"store", "import", At("document.json"), "--switch", "beta", "--layer", "desired"}).err,
                  "");
    }
    ASSERT_EQ(Ctl({"store", "restore", "--revision", "1"}).status, 0);
    Put("document.json", Document());
    EXPECT_EQ(Ctl({"store", "import", At("document.json")}).err, "");
    EXPECT_EQ(Ctl({"store", "import", At("document.json"), "--switch", "alpha"}).err, "");
    const Result other = Ctl({"store", "import", At("document.json"), "--switch", "gamma", "--dry-run"});
    EXPECT_NE(other.err.find("warning: the document of switch gamma says that it is switch alpha"),
              std::string::npos)
        << other.err;
}

TEST_F(StoreVerbs, DeletedSwitchIsInHistoryAndCanBeRestored) {
    Save();
    const std::string before = Get("store.db"), document = Document();
    EXPECT_NE(Ctl({"store", "delete", "production", "--dry-run"}).out.find("- switch alpha"),
              std::string::npos);
    EXPECT_EQ(Get("store.db"), before);
    ASSERT_EQ(Ctl({"store", "delete", "production"}).status, 0);
    EXPECT_EQ(Ctl({"store", "delete", "production"}).status, 4);
    EXPECT_EQ(Ctl({"store", "delete", "production", "--if-exists"}).status, 0);
    const auto events = Json(Ctl({"store", "history", "alpha", "--json"})).at("events").as_array();
    ASSERT_EQ(events.size(), 2u);
    EXPECT_EQ(events[0].at("event"), "deleted");
    EXPECT_EQ(events[1].at("event"), "added");
    ASSERT_EQ(Ctl({"store", "restore", "production", "--revision", "1"}).status, 0);
    EXPECT_EQ(Document(), document);
}

TEST_F(StoreVerbs, RestoresOneSwitchOrAllInOneRevision) {
    Save();
    SaveChange("db");                                      // 2
    ASSERT_EQ(Ctl({"store", "delete", "beta"}).status, 0); // 3
    const std::string before = Get("store.db");
    const auto plan = Json(Ctl({"store", "restore", "--revision", "1", "--dry-run", "--json"}));
    EXPECT_EQ(plan.at("changes").as_array().size(), 2u);
    EXPECT_EQ(plan.at("is_done"), false);
    EXPECT_EQ(Get("store.db"), before);
    ASSERT_EQ(Ctl({"store", "restore", "--revision", "1"}).status, 0);
    EXPECT_EQ(Revision(), 4); // one transaction for both
    EXPECT_NE(Document("alpha").find("\"web\""), std::string::npos);
    EXPECT_NE(Document("beta").find("storage"), std::string::npos);
    ASSERT_EQ(Ctl({"store", "restore", "alpha", "--revision", "2"}).status, 0);
    EXPECT_NE(Document("alpha").find("\"db\""), std::string::npos);
    EXPECT_EQ(Ctl({"store", "restore", "--revision", "99"}).status, 1);
    EXPECT_EQ(Ctl({"store", "restore", "alpha", "--revision", "0"}).status, 4);
    EXPECT_EQ(Ctl({"store", "restore"}).status, 2);
    EXPECT_EQ(Ctl({"store", "restore", "--revision", "x"}).status, 2);
}

TEST_F(StoreVerbs, SwitchIsAnOperandOrAnOption) {
    Save();
    SaveChange("db");
    for (const char *verb : {"history", "restore"}) {
        const auto run = [&](std::vector<std::string> which) {
            std::vector<std::string> args = {"store", verb, "--json"};
            if (std::string_view(verb) == "restore")
                args.insert(args.end(), {"--dry-run", "--revision", "1"});
            args.insert(args.end(), which.begin(), which.end());
            return Ctl(args);
        };
        const Result operand = run({"production"});
        EXPECT_EQ(operand.status, 0);
        EXPECT_EQ(run({"--switch", "production"}).out, operand.out);
        EXPECT_EQ(run({"production", "--switch", "production"}).out, operand.out);
        EXPECT_NE(run({}).out, "");
        EXPECT_EQ(run({"storage", "--switch", "production"}).status, 2);
        EXPECT_EQ(run({"--switch", "none"}).status, 4);
    }
}

TEST_F(StoreVerbs, BackupIsACompleteStoreAndReplacesNothingByDefault) {
    Save();
    ASSERT_EQ(Ctl({"store", "backup", At("copy.db"), "--dry-run"}).status, 0);
    EXPECT_EQ(Files(), (std::vector<std::string>{"site.db", "store.db"}));
    ASSERT_EQ(Ctl({"store", "backup", At("copy.db")}).status, 0);
    struct stat info {};
    ASSERT_EQ(stat(At("copy.db").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777u, 0600u);
    EXPECT_EQ(Ctl({"diff", "store:", "store:" + At("copy.db")}).status, 0);
    SaveChange("db");
    const std::string first = Get("copy.db");
    EXPECT_EQ(Ctl({"store", "backup", At("copy.db")}).status, 1);
    EXPECT_EQ(Get("copy.db"), first);
    EXPECT_EQ(Ctl({"store", "backup", At("copy.db"), "--may-exist"}).status, 0);
    EXPECT_EQ(Ctl({"diff", "store:", "store:" + At("copy.db")}).status, 0);
    EXPECT_EQ(Ctl({"store", "backup", At("no/such/dir.db")}).status, 7);
}

TEST_F(StoreVerbs, UpgradeKeepsOnlySwitchesWithAPortSet) {
    ASSERT_EQ(Ctl({"store", "upgrade", At("site.db"), "--dry-run"}).status, 0);
    EXPECT_EQ(Files(), std::vector<std::string>{"site.db"});
    ASSERT_EQ(Ctl({"store", "upgrade", At("site.db")}).status, 0);
    EXPECT_EQ(Json(Ctl({"store", "list", "--json"})).at("objects").as_array().size(), 1u);
    EXPECT_NE(Document("alpha").find("DvsPortset-0"), std::string::npos);
    Put("damaged.db", Get("site.db").substr(0, 512));
    EXPECT_EQ(Ctl({"store", "upgrade", At("damaged.db")}).status, 6);
    EXPECT_EQ(Ctl({"store", "upgrade", At("none.db")}).status, 1);
}

TEST_F(StoreVerbs, SchemaPrintsAllOrExplainsAField) {
    EXPECT_NO_THROW((void)Json({0, Dvsctl({"schema"}).out, ""}).at("properties"));
    const std::string vlan = Dvsctl({"schema", "ports.settings.vlan"}).out;
    EXPECT_NE(vlan.find("vlan_id"), std::string::npos);
    EXPECT_EQ(Dvsctl({"schema", "ports.7.settings.vlan"}).status, 0); // with an instance's id too
    // The path as an error message names it.
    EXPECT_NE(Dvsctl({"schema", "ports[a/b]/settings/vlan"}).out.find("private VLAN"), std::string::npos);
    EXPECT_EQ(Dvsctl({"schema", "ports[7]"}).status, 0);
    EXPECT_EQ(Dvsctl({"schema", "ports[7"}).status, 4);
    EXPECT_EQ(Json(Dvsctl({"schema", "settings.max_mtu", "--json"})).at("type"), "integer");
    EXPECT_EQ(Dvsctl({"schema", "settings.nothing"}).status, 4);
}

} // namespace
