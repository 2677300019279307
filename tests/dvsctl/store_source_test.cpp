/* SPDX-License-Identifier: Apache-2.0 */
// store: and store-desired: as sources of show, verify, diff and copy.

#include "store_fixture.h"

namespace {

using namespace dvs::ctl::test;

using dvs::form::EncodeList;
using dvs::form::NewEntry;

using StoreSource = StoreProgram;

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool kMemoryCounts = false; // a sanitizer's own bookkeeping dominates
#else
constexpr bool kMemoryCounts = true;
#endif

TEST_F(StoreSource, ReadOfAMissingStoreFailsAndCreatesNone) {
    for (const char *verb : {"show", "verify"}) {
        const Result result = Ctl({verb, "store:"});
        EXPECT_EQ(result.status, 7);
        EXPECT_NE(result.err.find(store_), std::string::npos) << result.err;
    }
    EXPECT_EQ(Ctl({"copy", "store:", At("out.db")}).status, 7);
    EXPECT_EQ(Ctl({"show", "store:", "--if-exists", "-q"}).status, 0);
    EXPECT_EQ(Files(), std::vector<std::string>{"site.db"});
}

TEST_F(StoreSource, CopySavesAndLoads) {
    Save();
    EXPECT_EQ(Ctl({"verify", "store:"}).status, 0);
    ASSERT_EQ(Ctl({"copy", "store:", At("back.db")}).status, 0);
    // A state loaded from a store saves and loads again unchanged.
    EXPECT_EQ(Ctl({"copy", At("back.db"), "store:"}).status, 0);
    const Result same = Ctl({"diff", "store:", At("back.db")});
    EXPECT_EQ(same.status, 0) << same.out;
    EXPECT_EQ(Files(), (std::vector<std::string>{"back.db", "site.db", "store.db"}));
}

TEST_F(StoreSource, PathNamesAnotherStore) {
    Save();
    ASSERT_EQ(Ctl({"copy", At("site.db"), "store:" + At("other.db")}).status, 0);
    EXPECT_EQ(Ctl({"diff", "store:", "store:" + At("other.db")}).status, 0);
    EXPECT_EQ(Ctl({"store", "delete", "beta", "--store", At("other.db")}).status, 0);
    EXPECT_EQ(Ctl({"diff", "store:", "store:" + At("other.db")}).status, 1);
    EXPECT_EQ(Ctl({"show", "store::memory:"}).status, 2);
}

TEST_F(StoreSource, ShowPrintsTypedFieldsAndBytesOnRequest) {
    Save();
    const Result typed = Ctl({"show", "store:", "--switch", "alpha"});
    EXPECT_EQ(typed.status, 0);
    EXPECT_NE(typed.out.find("\"7.0.2\""), std::string::npos) << typed.out; // version 8 by its name
    EXPECT_EQ(Ctl({"show", "store:", "--switch", "alpha", "--raw"}).out.find("\"7.0.2\""), std::string::npos);
    const auto document = Json(Ctl({"show", "store:", "--json"}));
    bool found = false;
    for (const auto &property : document.at("switches").at(0).at("global").as_array())
        if (property.at("name") == "com.orbeno.common.version") {
            found = true;
            EXPECT_EQ(property.at("typed"), "7.0.2");
            EXPECT_EQ(property.at("value"), 8);
        }
    EXPECT_TRUE(found);
}

TEST_F(StoreSource, DryRunCreatesNoStore) {
    const Result planned = Ctl({"copy", At("site.db"), "store:", "--dry-run"});
    EXPECT_EQ(planned.status, 0);
    EXPECT_NE(planned.out.find("+ switch alpha"), std::string::npos) << planned.out;
    EXPECT_EQ(Files(), std::vector<std::string>{"site.db"});
}

TEST_F(StoreSource, DryRunShowsTheChangesAndKeepsTheFile) {
    Save();
    PutState("changed.db", Site("db"));
    const std::string before = Get("store.db");
    const auto plan = Json(Ctl({"copy", At("changed.db"), "store:", "--dry-run", "--json"}));
    ASSERT_EQ(plan.at("changes").as_array().size(), 1u);
    EXPECT_EQ(plan.at("is_written"), false);
    EXPECT_EQ(Get("store.db"), before);
    EXPECT_NE(Ctl({"copy", At("site.db"), "store:", "--dry-run"}).out.find("would change nothing"),
              std::string::npos);
    EXPECT_EQ(Get("store.db"), before);
}

TEST_F(StoreSource, SwitchOptionSavesOneSwitchOnly) {
    Save();
    ASSERT_EQ(Ctl({"store", "delete", "beta"}).status, 0);
    PutState("changed.db", Site("db"));
    ASSERT_EQ(Ctl({"copy", At("changed.db"), "store:", "--switch", "storage"}).status, 0); // by alias
    EXPECT_NE(Document("beta").find("storage"), std::string::npos);
    EXPECT_NE(Document("alpha").find("\"web\""), std::string::npos);
}

TEST_F(StoreSource, SwitchMissingInTheSourceFailsAndDeletesNothing) {
    Save();
    const std::string before = Get("store.db");
    EXPECT_EQ(Ctl({"copy", At("site.db"), "store:", "--switch", "gamma"}).status, 4);
    EXPECT_EQ(Ctl({"show", "store:", "--switch", "gamma"}).status, 4);
    EXPECT_EQ(Get("store.db"), before);
}

TEST_F(StoreSource, NoReplaceChecksTheStoresSwitches) {
    EXPECT_EQ(Ctl({"copy", At("site.db"), "store:", "--switch", "alpha", "--no-replace"}).status, 0);
    EXPECT_EQ(Ctl({"copy", At("site.db"), "store:", "--switch", "beta", "--no-replace"}).status, 0);
    EXPECT_EQ(Ctl({"copy", At("site.db"), "store:", "--switch", "beta", "--no-replace"}).status, 1);
    EXPECT_EQ(Ctl({"copy", At("site.db"), "store:", "--no-replace"}).status, 1);
}

TEST_F(StoreSource, RejectsADamagedStateAndKeepsTheStore) {
    Save();
    const std::string before = Get("store.db");
    std::string damaged = Get("site.db");
    damaged[damaged.find("production")] ^= 1;
    Put("damaged.db", damaged);
    EXPECT_EQ(Ctl({"copy", At("damaged.db"), "store:"}).status, 6);
    Put("short.db", Get("site.db").substr(0, 512));
    EXPECT_EQ(Ctl({"copy", At("short.db"), "store:"}).status, 6);
    EXPECT_EQ(Get("store.db"), before);
}

TEST_F(StoreSource, RejectsAValueThatTheStoreCannotExpress) {
    Save();
    const std::string before = Document();
    // A version is a number of four bytes.
    PutState("bad.db", EncodeList(std::vector<NewEntry>{MakeSwitch(
                           "alpha", {MakeProperty("com.orbeno.common.version", Raw("x"), 0x10)}, {}, {})}));
    for (const bool dry : {true, false}) {
        std::vector<std::string> args = {"copy", At("bad.db"), "store:"};
        if (dry) args.push_back("--dry-run");
        const Result refused = Ctl(args);
        EXPECT_EQ(refused.status, 6) << refused.err;
        EXPECT_NE(refused.err.find("cause:"), std::string::npos) << refused.err;
    }
    EXPECT_EQ(Document(), before);
}

TEST_F(StoreSource, DesiredIsReadSeparatelyAndNotWritten) {
    Save();
    const Result uneven = Ctl({"show", "store-desired:"});
    EXPECT_EQ(uneven.status, 7);
    EXPECT_NE(uneven.err.find("0 objects"), std::string::npos) << uneven.err;
    for (const char *name : {"alpha", "beta"}) {
        Put("document.json", Document(name));
        ASSERT_EQ(Ctl({"store", "import", "--layer", "desired", At("document.json")}).status, 0);
    }
    EXPECT_EQ(Ctl({"diff", "store:", "store-desired:"}).status, 0);
    EXPECT_EQ(Ctl({"copy", At("site.db"), "store-desired:"}).status, 2);
    EXPECT_EQ(Ctl({"copy", At("site.db"), "store-desired:", "--dry-run"}).status, 2);
}

TEST_F(StoreSource, SaveThatMakesTheStoreUnloadableSuggestsAFix) {
    PutState("bare.db", EncodeList(std::vector<NewEntry>{MakeSwitch("bare one", {}, {}, {})}));
    for (const char *mode : {"--dry-run", "--may-exist"}) {
        const Result saved = Ctl({"copy", At("bare.db"), "store:", mode, "--quiet"});
        EXPECT_EQ(saved.status, 0);
        EXPECT_NE(saved.err.find("warning: "), std::string::npos) << saved.err;
        EXPECT_NE(saved.err.find("switch bare one has no property com.orbeno.common.version"),
                  std::string::npos)
            << saved.err;
        EXPECT_NE(saved.err.find("dvsctl kernel prop set 'bare one' com.orbeno.common.version 8 --as number"),
                  std::string::npos)
            << saved.err;
    }
    EXPECT_EQ(Ctl({"show", "store:"}).status, 7);
    const auto document = Json(Ctl({"copy", At("bare.db"), "store:", "--json"}));
    ASSERT_EQ(document.at("warnings").as_array().size(), 1u);
    EXPECT_EQ(document.at("is_written"), true);
    EXPECT_FALSE(document.at("warnings").at(0).as_object().contains("status"));
    Save();
    EXPECT_EQ(Ctl({"show", "store:"}).status, 0);
    EXPECT_FALSE(Json(Ctl({"copy", At("site.db"), "store:", "--json"})).as_object().contains("warnings"));
}

TEST_F(StoreSource, LoadWithoutABufferIsAFailure) {
    Save();
    std::string document = Document();
    const std::size_t at = document.find("\"forwarding_class\"");
    document.replace(document.rfind('{', at), document.find('}', at) + 1 - document.rfind('{', at), "{}");
    Put("document.json", document);
    ASSERT_EQ(Ctl({"store", "import", At("document.json")}).status, 0);
    for (const char *verb : {"show", "verify"}) {
        const Result failed = Ctl({verb, "store:"});
        EXPECT_EQ(failed.status, 7) << failed.out;
        EXPECT_NE(failed.err.find("forwarding_class"), std::string::npos) << failed.err;
    }
    EXPECT_EQ(Ctl({"copy", "store:", At("out.db")}).status, 7);
}

// This bounds the memory of a save with a host's maximum number of ports.
TEST_F(StoreSource, CopyMemoryIsAFewTimesTheStatesSize) {
    const long idle = Ctl({"--version"}).peakKilobytes;
    const char *const ports = kMemoryCounts ? "2048" : "64";
    ASSERT_EQ(Ctl({"generate", At("large.db"), "--switches", "1", "--ports", ports}).status, 0);
    for (int save = 0; save < 2; ++save) { // the second one has documents to replace
        const Result copied = Ctl({"copy", At("large.db"), "store:"});
        ASSERT_EQ(copied.status, 0) << copied.err;
        const auto size = static_cast<long>(Get("large.db").size() / 1024);
        if (kMemoryCounts) {
            EXPECT_LT(copied.peakKilobytes, idle + 11 * size / 2);
        }
    }
}

// Traces are for --verbose: a load that is followed builds every list apart.
TEST_F(StoreSource, LibraryTracesOnlyOnRequest) {
    const Result quiet = Ctl({"copy", At("site.db"), "store:"});
    EXPECT_EQ(quiet.err.find("SaveDVS"), std::string::npos) << quiet.err;
    const Result verbose = Ctl({"copy", At("site.db"), "store:", "--verbose"});
    EXPECT_NE(verbose.err.find("libdvs: SaveDVS: production"), std::string::npos) << verbose.err;
    EXPECT_NE(verbose.err.find("libdvs: Loading switch:alpha"), std::string::npos) << verbose.err;
}

} // namespace
