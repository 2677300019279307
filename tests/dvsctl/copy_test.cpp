/* SPDX-License-Identifier: Apache-2.0 */
// Copies: bytes round-trip, writes are atomic, and dry runs change nothing.

#include <gtest/gtest.h>

#include <string>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>

#include "program.h"

namespace {

using namespace dvs::ctl::test;

class Copy : public ProgramTest {
protected:
    void SetUp() override {
        ProgramTest::SetUp();
        PutState("a.db", SmallState());
    }
    [[nodiscard]] std::string JsonAt(std::string_view name) const { return "json:" + At(name); }
};

TEST_F(Copy, RoundTripsThroughJson) {
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), JsonAt("a.json")}).status, 0);
    EXPECT_EQ(Dvsctl({"copy", JsonAt("a.json"), At("b.db")}).status, 0);
    EXPECT_EQ(Get("b.db"), Get("a.db"));
    EXPECT_EQ(Dvsctl({"copy", JsonAt("a.json"), JsonAt("b.json")}).status, 0);
    EXPECT_EQ(Get("b.json"), Get("a.json"));
}

TEST_F(Copy, RoundTripsTheExampleThroughAStateFile) {
    const std::string example = std::string("json:") + DVS_SOURCE_DIR + "/examples/site-basic.json";
    EXPECT_EQ(Dvsctl({"copy", example, At("site.db")}).status, 0);
    EXPECT_EQ(Dvsctl({"verify", At("site.db")}).status, 0);
    EXPECT_EQ(Dvsctl({"copy", At("site.db"), JsonAt("site.json")}).status, 0);
    EXPECT_EQ(Dvsctl({"copy", JsonAt("site.json"), At("again.db")}).status, 0);
    EXPECT_EQ(Get("again.db"), Get("site.db"));
    EXPECT_EQ(Dvsctl({"diff", example, At("again.db"), "--order"}).status, 0);
}

TEST_F(Copy, ReadsAndWritesStandardStreams) {
    const Result out = Dvsctl({"copy", At("a.db"), "json:-"});
    EXPECT_EQ(out.status, 0);
    EXPECT_EQ(Json(out).at("schema_version"), 1);
    const Result in = RunProgram({.args = {"copy", "json:-", At("b.db")}, .input = out.out});
    EXPECT_EQ(in.status, 0) << in.err;
    EXPECT_EQ(Get("b.db"), Get("a.db"));
}

TEST_F(Copy, KeepsUnspecifiedBytesBetweenFiles) {
    Buffer state = SmallState();
    state[10] = 7; // the reserved field
    PutState("odd.db", state);
    EXPECT_EQ(Dvsctl({"copy", At("odd.db"), At("b.db")}).status, 0);
    EXPECT_EQ(Get("b.db"), Get("odd.db"));
}

TEST_F(Copy, ReportsItsResult) {
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), At("b.db")}).out,
              "copied 2 switches, 4 ports, 8 properties from file:" + At("a.db") + " to file:" + At("b.db") +
                  "\n");
    const auto json = Json(Dvsctl({"copy", At("a.db"), At("b.db"), "--json"}));
    EXPECT_EQ(json.at("is_written"), true);
    EXPECT_EQ(json.at("summary").at("ports"), 4);
}

TEST_F(Copy, CreatesFilesForTheOwnerOnly) {
    for (const std::string &target : {At("b.db"), JsonAt("b.json")}) {
        ASSERT_EQ(Dvsctl({"copy", At("a.db"), target}).status, 0);
        struct stat info {};
        ASSERT_EQ(stat(target.substr(target.find('/')).c_str(), &info), 0);
        EXPECT_EQ(info.st_mode & 0777u, 0600u) << target;
    }
    EXPECT_EQ(Files(), (std::vector<std::string>{"a.db", "b.db", "b.json"})) << "no temporary file is left";
}

TEST_F(Copy, DryRunChangesNothing) {
    const Result create = Dvsctl({"copy", At("a.db"), At("b.db"), "--dry-run"});
    EXPECT_EQ(create.status, 0);
    EXPECT_EQ(create.out.find("would create file:" + At("b.db") + "\n+ switch alpha: "), 0u) << create.out;
    EXPECT_EQ(Files(), std::vector<std::string>{"a.db"});

    PutState("b.db", dvs::form::EncodeList(std::vector{MakeSwitch("beta", {}, {}, {})}));
    const std::string before = Get("b.db");
    const Result change = Dvsctl({"copy", At("a.db"), At("b.db"), "--dry-run"});
    EXPECT_NE(change.out.find("would change file:" + At("b.db") + ": 2 added, 2 changed\n"),
              std::string::npos)
        << change.out;
    EXPECT_NE(change.out.find("+ port 9: active, 1 property"), std::string::npos) << change.out;
    EXPECT_EQ(Get("b.db"), before);

    EXPECT_NE(Dvsctl({"copy", At("a.db"), At("a.db"), "--dry-run"}).out.find("would change nothing"),
              std::string::npos);
    Put("text.db", "no state");
    EXPECT_NE(Dvsctl({"copy", At("a.db"), At("text.db"), "--dry-run"}).out.find("which holds no sound state"),
              std::string::npos);
    const auto json = Json(Dvsctl({"copy", At("a.db"), At("b.db"), "--dry-run", "--json"}));
    EXPECT_EQ(json.at("is_written"), false);
    EXPECT_EQ(json.at("target_exists"), true);
    EXPECT_EQ(json.at("changes").as_array().size(), 4u);
}

TEST_F(Copy, DryRunRejectsWhatTheCopyRejects) {
    Put("bad.json", "{");
    EXPECT_EQ(Dvsctl({"copy", JsonAt("bad.json"), At("b.db"), "--dry-run"}).status, 6);
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), At("a.db"), "--dry-run", "--no-replace"}).status, 1);
}

TEST_F(Copy, DryRunRejectsUnwritableTargets) {
    ASSERT_EQ(mkdir(At("directory").c_str(), 0700), 0);
    for (const std::string &target :
         {At("none/b.db"), JsonAt("none/b.json"), At("a.db/below"), At("directory"), JsonAt("directory")}) {
        for (const std::vector<std::string> &more : {std::vector<std::string>{}, {"--dry-run"}}) {
            std::vector<std::string> args = {"copy", At("a.db"), target};
            args.insert(args.end(), more.begin(), more.end());
            const Result result = Dvsctl(args);
            EXPECT_EQ(result.status, 1) << target << result.out;
            EXPECT_EQ(result.out, "") << target;
        }
    }
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), At("directory/b.db"), "--dry-run"}).status, 0);
    ASSERT_EQ(symlink("directory/c.db", At("link.db").c_str()), 0);
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), At("link.db"), "--dry-run"}).status, 0);
    EXPECT_EQ(Files(), (std::vector<std::string>{"a.db", "directory", "link.db"}));
}

TEST_F(Copy, ReportsAnObstacleAtTheTarget) {
    ASSERT_EQ(mkdir(At("directory").c_str(), 0700), 0);
    ASSERT_EQ(mkfifo(At("fifo").c_str(), 0600), 0);
    const std::pair<std::string, std::string> places[] = {{At("directory"), "it is a directory"},
                                                          {JsonAt("directory"), "it is a directory"},
                                                          {At("fifo"), "it is a FIFO"},
                                                          {"/dev/null", "it is a device"}};
    for (const auto &[target, reason] : places) {
        const Result result = Dvsctl({"copy", At("a.db"), target});
        EXPECT_EQ(result.status, 1) << target;
        EXPECT_NE(result.err.find("why:    " + reason), std::string::npos) << result.err;
    }
}

TEST_F(Copy, NoReplaceKeepsAnExistingTarget) {
    Put("b.db", "precious");
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), At("b.db"), "--no-replace"}).status, 1);
    EXPECT_EQ(Get("b.db"), "precious");
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), At("c.db"), "--no-replace"}).status, 0);
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), At("b.db"), "--may-exist"}).status, 0);
    EXPECT_EQ(Get("b.db"), Get("a.db"));
}

TEST_F(Copy, AbsentSourceKeepsTheTarget) {
    const std::string before = Get("a.db");
    EXPECT_EQ(Dvsctl({"copy", At("none.db"), At("a.db")}).status, 1);
    EXPECT_EQ(Dvsctl({"copy", At("none.db"), At("a.db"), "--if-exists"}).status, 0);
    EXPECT_EQ(Json(Dvsctl({"copy", At("none.db"), At("a.db"), "--if-exists", "--json"})).at("is_written"),
              false);
    EXPECT_EQ(Get("a.db"), before);
}

TEST_F(Copy, DamagedSourceKeepsTheTarget) {
    std::string damaged = Get("a.db");
    damaged[300] = static_cast<char>(damaged[300] + 1);
    Put("bad.db", damaged);
    const std::string before = Get("a.db");
    const Result result = Dvsctl({"copy", At("bad.db"), At("a.db")});
    EXPECT_EQ(result.status, 6);
    EXPECT_NE(result.err.find("where:"), std::string::npos) << result.err;
    EXPECT_EQ(Get("a.db"), before);
    EXPECT_EQ(Dvsctl({"copy", At("bad.db"), JsonAt("bad.json")}).status, 6);
    EXPECT_EQ(Files(), (std::vector<std::string>{"a.db", "bad.db"}));
}

TEST_F(Copy, FailedWriteKeepsTheTarget) {
    ASSERT_EQ(mkdir(At("directory").c_str(), 0700), 0);
    for (const std::string &target :
         {At("directory"), JsonAt("directory"), At("a.db/below"), JsonAt("none/b.json"),
          std::string("/dev/null"), std::string("json:/dev/full")}) {
        const Result result = Dvsctl({"copy", At("a.db"), target});
        EXPECT_EQ(result.status, 1) << target << result.err;
        EXPECT_NE(result.err.find("cannot write"), std::string::npos) << result.err;
    }
    EXPECT_EQ(Files(), (std::vector<std::string>{"a.db", "directory"}));
}

TEST_F(Copy, WritesThroughALinkAndKeepsIt) {
    PutState("real.db", dvs::form::EncodeList({}));
    ASSERT_EQ(symlink("real.db", At("link.db").c_str()), 0);
    ASSERT_EQ(Dvsctl({"copy", At("a.db"), At("link.db")}).status, 0);
    struct stat info {};
    ASSERT_EQ(lstat(At("link.db").c_str(), &info), 0);
    EXPECT_TRUE(S_ISLNK(info.st_mode));
    EXPECT_EQ(Get("real.db"), Get("a.db"));
}

TEST_F(Copy, FailsAsBusyWhileAnotherWriterHoldsTheLock) {
    const int directory = open(At("").c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    ASSERT_EQ(flock(directory, LOCK_EX), 0);
    for (const std::string &target : {At("b.db"), JsonAt("b.json")}) {
        const Result result = Dvsctl({"copy", At("a.db"), target, "--timeout", "0.2"});
        EXPECT_EQ(result.status, 8) << result.err;
        EXPECT_NE(result.err.find("--timeout"), std::string::npos) << "the error suggests a fix";
    }
    close(directory);
    EXPECT_EQ(Files(), std::vector<std::string>{"a.db"});
}

} // namespace
