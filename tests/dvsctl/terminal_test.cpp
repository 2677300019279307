/* SPDX-License-Identifier: Apache-2.0 */
// On a terminal, the program uses colour and a pager unless variables turn them off. Elsewhere it uses
// neither.

#include <gtest/gtest.h>

#include <string>

#include "program.h"

namespace {

using namespace dvs::ctl::test;

class Terminal : public ProgramTest {
protected:
    void SetUp() override {
        ProgramTest::SetUp();
        PutState("a.db", SmallState());
    }
};

bool HasColour(const std::string &text) {
    return text.find("\x1b[") != std::string::npos;
}

TEST_F(Terminal, ColourIsForTerminalsOnly) {
    EXPECT_TRUE(HasColour(RunInTerminal({"show", At("a.db")}, {"PAGER="}).out));
    EXPECT_FALSE(HasColour(Dvsctl({"show", At("a.db")}).out));
    EXPECT_FALSE(HasColour(RunInTerminal({"show", At("a.db"), "--json"}, {"PAGER="}).out));
}

TEST_F(Terminal, NoColorIsHonoured) {
    EXPECT_FALSE(HasColour(RunInTerminal({"show", At("a.db")}, {"PAGER=", "NO_COLOR=1"}).out));
    EXPECT_TRUE(HasColour(RunInTerminal({"show", At("a.db")}, {"PAGER=", "NO_COLOR="}).out));
    EXPECT_FALSE(HasColour(RunInTerminal({"show", At("none.db")}, {"NO_COLOR=1"}).out));
    EXPECT_TRUE(HasColour(RunInTerminal({"show", At("none.db")}, {}).out)) << "errors have colour too";
}

TEST_F(Terminal, LongOutputGoesThroughThePager) {
    const std::vector<std::string> pager = {"PAGER=sed s/^/paged:/"};
    EXPECT_EQ(RunInTerminal({"show", At("a.db")}, pager, 10).out.find("paged:"), 0u);
    EXPECT_EQ(RunInTerminal({"show", At("a.db")}, pager, 500).out.find("paged:"), std::string::npos)
        << "output that fits needs no pager";
    EXPECT_EQ(RunInTerminal({"show", At("a.db"), "--no-pager"}, pager, 10).out.find("paged:"),
              std::string::npos);
    EXPECT_EQ(RunProgram({.args = {"show", At("a.db")}, .environment = pager}).out.find("paged:"),
              std::string::npos);
}

TEST_F(Terminal, MissingPagerIsIgnored) {
    const Result result = RunInTerminal({"show", At("a.db")}, {"PAGER=/no/such/pager", "NO_COLOR=1"}, 10);
    EXPECT_EQ(result.status, 0);
    EXPECT_NE(result.out.find("switch beta"), std::string::npos);
}

TEST_F(Terminal, QuittingThePagerEarlyIsNotAFailure) {
    EXPECT_EQ(RunInTerminal({"hexdump", At("a.db")}, {"PAGER=head -n 1"}, 10).status, 0);
}

TEST_F(Terminal, InterruptsGoToThePagerWhileItRuns) {
    // The shell that runs the pager is a child of the program, so it gets the signal as after Ctrl-C.
    const Result result =
        RunInTerminal({"show", At("a.db")}, {"PAGER=kill -INT $PPID; sed s/^/paged:/", "NO_COLOR=1"}, 10);
    EXPECT_EQ(result.status, 0);
    EXPECT_NE(result.out.find("paged:switch beta"), std::string::npos) << result.out;
}

TEST_F(Terminal, PagerKeepsTheExitStatus) {
    Put("b.json", "{\"switches\": []}");
    EXPECT_EQ(RunInTerminal({"diff", At("a.db"), "json:" + At("b.json"), "--columns", "name"},
                            {"PAGER=tail -n 1"}, 2)
                  .status,
              1);
}

} // namespace
