/* SPDX-License-Identifier: Apache-2.0 */
// The program as a whole: help, version, usage, exit statuses, JSON for everything, failing output.

#include <gtest/gtest.h>

#include <cstdlib>
#include <sstream>
#include <string>

#include <boost/json/object.hpp>

#include "program.h"
#include "tools/dvsctl/cli/command.h"

namespace {

using namespace dvs::ctl::test;

class Program : public ProgramTest {
protected:
    void SetUp() override {
        ProgramTest::SetUp();
        PutState("a.db", SmallState());
        Put("text.db", "no state at all");
    }
};

TEST_F(Program, PrintsItsVersion) {
    const Result result = Dvsctl({"--version"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out, "dvsctl 1.0.0\n");
    EXPECT_EQ(Json(Dvsctl({"--version", "--json"})).at("version"), "1.0.0");
}

TEST_F(Program, PrintsHelpForEveryVerb) {
    const Result overview = Dvsctl({"--help"});
    EXPECT_EQ(overview.status, 0);
    EXPECT_EQ(Dvsctl({"-h"}).out, overview.out);
    for (const dvs::ctl::Command &command : dvs::ctl::Commands()) {
        EXPECT_NE(overview.out.find(command.name), std::string::npos);
        std::vector<std::string> words;
        std::istringstream name(command.name); // some names have two words
        for (std::string word; name >> word;)
            words.push_back(word);
        words.emplace_back("--help");
        const Result help = Dvsctl(words);
        EXPECT_EQ(help.status, 0) << command.name;
        EXPECT_EQ(help.out.find("Usage: dvsctl " + std::string(command.name)), 0u);
        EXPECT_NE(help.out.find("Examples:\n  dvsctl "), std::string::npos) << command.name;
        for (const dvs::ctl::OptionRow &row : command.options) {
            const std::string option = row.name;
            EXPECT_NE(help.out.find(option.substr(option.rfind(',') + 1)), std::string::npos)
                << command.name << " " << option;
        }
    }
    EXPECT_EQ(Json(Dvsctl({"show", "--help", "--json"})).at("schema_version"), 1);
}

TEST_F(Program, RejectsWrongUsage) {
    const std::vector<std::vector<std::string>> wrong = {
        {},
        {"shwo"},
        {"show"},
        {"show", At("a.db"), At("a.db")},
        {"show", At("a.db"), "--nonsense"},
        {"show", At("a.db"), "--switch"},
        {"show", "stor:x"},
        {"show", "file:"},
        {"show", "json:"},
        {"show", ""},
        {"show", At("a.db"), "--columns", "nmae"},
        {"show", At("a.db"), "--timeout", "soon"},
        {"show", At("a.db"), "--timeout", "-1"},
        {"show", At("a.db"), "--timeout", ""},
        {"show", At("a.db"), "--timeout", "nan"},
        {"show", At("a.db"), "--quiet", "--verbose"},
        {"verify", At("a.db"), "--dry-run"},
        {"diff", At("a.db")},
        {"diff", At("a.db"), "stor:x"},
        {"diff", "json:-", "json:-"},
        {"copy", At("a.db")},
        {"copy", At("a.db"), At("b.db"), "--may-exist", "--no-replace"},
    };
    for (const auto &args : wrong) {
        std::string line;
        for (const std::string &arg : args)
            line += arg + " ";
        const Result result = Dvsctl(args);
        EXPECT_EQ(result.status, 2) << line;
        EXPECT_EQ(result.out, "") << line;
        EXPECT_EQ(result.err.find("dvsctl: "), 0u) << line << result.err;
    }
}

TEST_F(Program, SuggestsSimilarNames) {
    EXPECT_NE(Dvsctl({"shwo", "x"}).err.find("\"show\" was meant"), std::string::npos);
    EXPECT_NE(Dvsctl({"show", "stor:x"}).err.find("file:stor:x"), std::string::npos);
    EXPECT_EQ(Dvsctl({"show", "xyzzy:x"}).err.find("json:-\n"), std::string::npos);
}

TEST_F(Program, AcceptsOptionsAnywhere) {
    const std::string expected = Dvsctl({"show", At("a.db"), "--json"}).out;
    EXPECT_EQ(Dvsctl({"--json", "show", At("a.db")}).out, expected);
    EXPECT_EQ(Dvsctl({"show", "--json", At("a.db")}).out, expected);
    EXPECT_EQ(Dvsctl({"show", "--timeout=5", "--json", "file:" + At("a.db")}).out, expected);
}

TEST_F(Program, ExitStatusesDistinguishErrors) {
    EXPECT_EQ(Dvsctl({"show", At("a.db")}).status, 0);
    EXPECT_EQ(Dvsctl({"show", At("absent.db")}).status, 1);
    EXPECT_EQ(Dvsctl({"show", At("a.db"), "--switch", "gamma"}).status, 4);
    EXPECT_EQ(Dvsctl({"show", At("a.db"), "--port", "77"}).status, 4);
    EXPECT_EQ(Dvsctl({"show", At("a.db"), "--props", "none.*"}).status, 4);
    EXPECT_EQ(Dvsctl({"show", At("text.db")}).status, 6);
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), At("a.db")}).status, 0);
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), At("text.db")}).status, 6);
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), At("absent.db")}).status, 9) << "1 means different";
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), At("absent.db"), "--if-exists"}).status, 1);
    EXPECT_EQ(RunProgram({.args = {"show", "json:-", "--timeout", "0.1"}, .openInput = true}).status, 3);
}

TEST_F(Program, ErrorsStateWhatWhereWhyAndTheFix) {
    const Result result = Dvsctl({"show", At("absent.db")});
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(result.err, "dvsctl: cannot read the state\n"
                          "  in:     file:" +
                              At("absent.db") +
                              "\n"
                              "  why:    it does not exist\n"
                              "  next:   check the name; with --if-exists an absent source is no error\n");
}

TEST_F(Program, PrintsErrorsAsJsonToo) {
    const std::vector<std::pair<std::vector<std::string>, int>> cases = {
        {{"show", At("absent.db")}, 1},
        {{"show"}, 2},
        {{"shwo"}, 2},
        {{"show", At("a.db"), "--switch", "x"}, 4},
        {{"verify", At("text.db")}, 6},
        {{"hexdump", At("text.db")}, 6},
        {{"copy", At("a.db"), "json:-"}, 2},
        {{"diff", At("a.db"), At("absent.db")}, 9},
        {{"copy", At("text.db"), At("b.db")}, 6},
    };
    for (auto [args, status] : cases) {
        args.push_back("--json");
        const Result result = Dvsctl(args);
        EXPECT_EQ(result.status, status);
        EXPECT_EQ(result.err, "");
        const auto document = Json(result).as_object();
        EXPECT_EQ(document.at("schema_version"), 1);
        EXPECT_EQ(document.at("error").at("status"), status);
        EXPECT_TRUE(document.at("error").at("what").is_string());
    }
}

TEST_F(Program, QuietPrintsOnlyResultsAndErrors) {
    EXPECT_EQ(Dvsctl({"verify", At("a.db"), "-q"}).out, "");
    EXPECT_EQ(Dvsctl({"copy", At("a.db"), At("b.db"), "-q"}).out, "");
    EXPECT_EQ(Dvsctl({"diff", At("a.db"), At("b.db"), "-q"}).out, "");
    EXPECT_NE(Dvsctl({"show", At("a.db"), "-q"}).out, "");
    EXPECT_NE(Dvsctl({"show", At("absent.db"), "-q"}).err, "");
}

TEST_F(Program, VerboseShowsTheLibrarysMessages) {
    const Result result = Dvsctl({"copy", At("a.db"), At("no/such/directory.db"), "--verbose"});
    EXPECT_EQ(result.status, 1);
    EXPECT_NE(result.err.find("libdvs: failed to open dvsfile"), std::string::npos) << result.err;
}

TEST_F(Program, ErrorsQuoteLibraryMessagesAsTheCause) {
    const Result result = Dvsctl({"copy", At("a.db"), At("no/such/directory.db")});
    EXPECT_EQ(result.status, 1);
    EXPECT_NE(result.err.find("  cause:  failed to open dvsfile " + At("no/such/directory.db")),
              std::string::npos)
        << result.err;
    EXPECT_EQ(result.err.find("libdvs:"), std::string::npos);
}

TEST_F(Program, FailsWhenItsOutputFails) {
    for (const char *verb : {"show", "verify", "hexdump"}) {
        const Result full = RunProgram({.args = {verb, At("a.db")}, .outPath = "/dev/full"});
        EXPECT_EQ(full.status, 1) << verb;
        EXPECT_NE(full.err.find("No space left"), std::string::npos) << full.err;
        EXPECT_EQ(RunProgram({.args = {verb, At("a.db")}, .outPath = "-"}).status, 1) << verb;
        EXPECT_EQ(RunProgram({.args = {verb, At("a.db"), "--json"}, .outPath = "/dev/full"}).status, 1)
            << verb;
    }
    EXPECT_EQ(RunProgram({.args = {"--help"}, .outPath = "/dev/full"}).status, 1);
    EXPECT_EQ(RunProgram({.args = {"--version"}, .outPath = "/dev/full"}).status, 1);
    EXPECT_EQ(RunProgram({.args = {"diff", At("a.db"), At("a.db")}, .outPath = "/dev/full"}).status, 9);
    EXPECT_EQ(RunProgram({.args = {"copy", At("a.db"), "json:-"}, .outPath = "/dev/full"}).status, 1);
}

TEST_F(Program, FailedOutputOfAnErrorKeepsTheStatus) {
    const Result result = RunProgram({.args = {"show", At("absent.db"), "--json"}, .outPath = "/dev/full"});
    EXPECT_EQ(result.status, 1);
    EXPECT_NE(result.err.find("does not exist"), std::string::npos)
        << "the message still goes to standard error";
}

TEST_F(Program, ClosedOutputIsNeverReusedForAFile) {
    // With descriptor 1 free, the next open would get it, and results would be written into the state.
    const std::string before = Get("a.db");
    EXPECT_EQ(RunProgram({.args = {"copy", At("a.db"), At("b.db")}, .outPath = "-"}).status, 1);
    EXPECT_EQ(Get("a.db"), before);
    EXPECT_EQ(Get("b.db"), before) << "the copy itself succeeds";
}

TEST_F(Program, EscapesArgumentsInErrors) {
    const Result result = Dvsctl({"show", "\x1b[2Jx"});
    EXPECT_EQ(result.err.find('\x1b'), std::string::npos);
    EXPECT_NE(result.err.find("\\x1b[2Jx"), std::string::npos);
    const Result json = Dvsctl({"show", "\xff\x1b", "--json"});
    EXPECT_EQ(Json(json).at("error").at("source"), "file:\xef\xbf\xbd\x1b");
    EXPECT_EQ(json.out.find('\x1b'), std::string::npos);
}

} // namespace
