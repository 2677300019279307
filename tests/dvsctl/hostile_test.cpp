/* SPDX-License-Identifier: Apache-2.0 */
// Hostile input: documents, state files, names and file kinds. Each fails with a status and a reason, and
// nothing is written.

#include <gtest/gtest.h>

#include <random>
#include <string>

#include <sys/stat.h>

#include "program.h"

namespace {

using namespace dvs::ctl::test;

class Hostile : public ProgramTest {};

TEST_F(Hostile, DocumentsAreRejectedWithTheirPlace) {
    const std::pair<std::string, std::string> documents[] = {
        {"", "it is empty"},
        {"{", "line 1, column 2"},
        {std::string(1'000'000, '['), "levels deep"},
        {R"({"switches": [], "switches": []})", "$.switches, line 1, column 27"},
        {R"({"switches": [{"id": "s", "global": [{"name": "n", "value": 1, "value": 2}]}]})",
         "$.switches[0].global[0].value"},
        {R"({"switches": [{"id": "s", "ports": [{"id": "1", "properties": [{"name": "n", "value": 1e400}]}]}]})",
         "$.switches[0].ports[0].properties[0].value"},
        {"{\"switches\": [{\"id\": \"\xff\"}]}", "$.switches[0].id"},
        {R"({"switches": [{"id": "s", "class": "vswitch", "max_ports": 4}]})",
         "switch s"}, // lacks its version
        {R"({"switches": [{"id": "s", "version": {"hex": "08"}, "class": "v", "max_ports": 4}]})",
         "switch s"},
    };
    for (const auto &[document, place] : documents) {
        Put("bad.json", document);
        for (const char *verb : {"show", "copy"}) {
            std::vector<std::string> args = {verb, "json:" + At("bad.json")};
            if (args[0] == "copy") args.push_back(At("out.db"));
            const Result result = Dvsctl(args);
            EXPECT_EQ(result.status, 6) << document.substr(0, 80) << result.err;
            EXPECT_NE(result.err.find(place), std::string::npos) << result.err;
            EXPECT_EQ(result.out, "");
        }
    }
    EXPECT_EQ(Files(), std::vector<std::string>{"bad.json"});
}

TEST_F(Hostile, RandomDocumentsNeverCrash) {
    const std::string good =
        RunProgram({.args = {"copy", "json:" DVS_SOURCE_DIR "/examples/site-basic.json", "json:-"}}).out;
    ASSERT_FALSE(good.empty());
    std::mt19937 random(7);
    const std::string spice = "{}[]\",:0123456789eE.-+\\u\x01\xff";
    for (int round = 0; round < 60; ++round) {
        std::string bad = good;
        for (int i = 0; i < 3; ++i)
            bad[random() % bad.size()] = spice[random() % spice.size()];
        if (round % 3 == 0) bad.resize(random() % bad.size());
        const Result result = RunProgram({.args = {"verify", "json:-"}, .input = bad});
        EXPECT_TRUE(result.status == 0 || result.status == 6) << result.status << result.err;
    }
}

TEST_F(Hostile, TruncatedOrChangedStateFilesNeverCrash) {
    Buffer state = SmallState();
    std::mt19937 random(8);
    for (int round = 0; round < 60; ++round) {
        Buffer bad = state;
        for (int i = 0; i < 2; ++i)
            bad[random() % bad.size()] = static_cast<std::uint8_t>(random());
        if (round % 2) Mend(bad);
        if (round % 5 == 0) bad.resize(random() % bad.size());
        PutState("bad.db", bad);
        const char *verb = round % 3 == 0 ? "show" : round % 3 == 1 ? "verify" : "hexdump";
        const Result result = Dvsctl({verb, At("bad.db")});
        EXPECT_TRUE(result.status == 0 || result.status == 6) << verb << result.status << result.err;
    }
}

TEST_F(Hostile, NamesAndValuesAreEscapedForTheTerminal) {
    const std::string evil = "\x1b]0;owned\x07\xc2\x9b"
                             "2J\xe2\x80\xae\x7f\r";
    PutState("evil.db",
             dvs::form::EncodeList(std::vector{MakeSwitch(
                 evil, {MakeProperty("com.orbeno.common.alias", Text(evil)), MakeProperty(evil, Text(evil))},
                 {}, {MakeList(evil, {MakeProperty(evil, Text("x"))})}, 8, evil)}));
    PutState("other.db", dvs::form::EncodeList(std::vector{MakeSwitch(evil, {}, {}, {})}));
    const std::string path = At("evil.db");
    for (const std::vector<std::string> &args :
         std::vector<std::vector<std::string>>{{"show", path},
                                               {"show", path, "--full"},
                                               {"show", path, "--json"},
                                               {"verify", path},
                                               {"hexdump", path},
                                               {"hexdump", path, "--json"},
                                               {"diff", path, At("other.db")},
                                               {"diff", path, At("other.db"), "--json"},
                                               {"copy", path, "json:-"},
                                               {"copy", path, At("other.db"), "--dry-run"},
                                               {"show", path, "--switch", evil + "x"}}) {
        const Result result = Dvsctl(args);
        for (const std::string *text : {&result.out, &result.err}) {
            for (const char c : *text)
                EXPECT_FALSE((static_cast<unsigned char>(c) < 0x20 && c != '\n') || c == 0x7f) << args[0];
            EXPECT_EQ(text->find("\xc2\x9b"), std::string::npos) << args[0];
            EXPECT_EQ(text->find("\xe2\x80\xae"), std::string::npos) << args[0];
        }
    }
}

TEST_F(Hostile, PathsThatAreNotFilesDoNotHang) {
    ASSERT_EQ(mkfifo(At("fifo").c_str(), 0600), 0);
    ASSERT_EQ(mkdir(At("directory").c_str(), 0700), 0);
    for (const char *verb : {"show", "verify", "hexdump"}) {
        EXPECT_EQ(Dvsctl({verb, At("fifo")}).status, 1) << verb;
        EXPECT_NE(Dvsctl({verb, At("fifo")}).err.find("it is a FIFO"), std::string::npos) << verb;
        EXPECT_NE(Dvsctl({verb, At("directory")}).err.find("it is a directory"), std::string::npos) << verb;
        EXPECT_NE(Dvsctl({verb, "/dev/zero"}).err.find("it is a device"), std::string::npos) << verb;
        EXPECT_EQ(Dvsctl({verb, "json:/dev/zero"}).status, 1) << verb;
        // Documents may come through a pipe: the wait for its writer is limited.
        EXPECT_EQ(Dvsctl({verb, "json:" + At("fifo"), "--timeout", "0.1"}).status, 3) << verb;
    }
}

TEST_F(Hostile, JsonDocumentNamedAsAStateFileIsRecognised) {
    Put("site.json", "{\"switches\": []}");
    for (const char *verb : {"show", "verify"}) {
        const Result result = Dvsctl({verb, At("site.json")});
        EXPECT_EQ(result.status, 6);
        EXPECT_NE((result.out + result.err).find("write json:" + At("site.json")), std::string::npos) << verb;
    }
}

} // namespace
