/* SPDX-License-Identifier: Apache-2.0 */
// Differences that the comparison reports, and those that it ignores.

#include "tools/dvsctl/verbs/changes.h"

#include <gtest/gtest.h>

#include <string>

#include "form/states.h"
#include "tools/dvsctl/cli/options.h"
#include "tools/dvsctl/cli/output.h"

namespace {

using namespace dvs::ctl;
using namespace dvs::form::test;

Buffer StateOf(std::vector<NewEntry> switches) {
    return EncodeList(switches);
}

std::string Listing(const Buffer &a, const Buffer &b, const CompareOptions &options = {}) {
    const State before = ParseState(a), after = ParseState(b);
    testing::internal::CaptureStdout();
    Output out;
    WriteChanges(Compare(before, after, options), {}, out);
    out.Finish();
    return testing::internal::GetCapturedStdout();
}

const std::vector<NewEntry> kNone;
const NewEntry kP = MakeProperty("p", Number(1)), kQ = MakeProperty("q", Text("text"));
const NewEntry kShadow = MakeProperty("com.orbeno.common.port.volatile.type", Number(2), 0x10);

Buffer WithGlobal(std::vector<NewEntry> global) {
    return StateOf({MakeSwitch("s", std::move(global), {}, {})});
}
Buffer WithPorts(std::vector<NewEntry> ports) {
    return StateOf({MakeSwitch("s", {}, {}, std::move(ports))});
}

TEST(Compare, FindsNothingBetweenEqualStates) {
    EXPECT_EQ(Listing(SmallState(), SmallState()), "");
}

TEST(Compare, ReportsProperties) {
    EXPECT_EQ(Listing(WithGlobal({kP, kQ}),
                      WithGlobal({MakeProperty("p", Number(2)), MakeProperty("r", Raw("\1"))})),
              "switch s\n"
              "  global\n"
              "    ~ p: 1 -> 2\n"
              "    - q: \"text\"\n"
              "    + r: 01 (1 byte)\n");
}

TEST(Compare, ReportsTypes) {
    const Buffer a = WithGlobal({kP}), b = WithGlobal({MakeProperty("p", Number(1), 0x10)});
    EXPECT_EQ(Listing(a, b), "switch s\n  global\n    ~ p: 1 (type 0x20 -> 0x10)\n");
    EXPECT_EQ(Listing(a, b, {.ignoreTypes = true}), "");
}

TEST(Compare, ShowsLongValuesWhereTheyDiffer) {
    std::string x(300, 'x'), y = x;
    y.back() = 'y';
    const std::string text =
        Listing(WithGlobal({MakeProperty("p", Text(x))}), WithGlobal({MakeProperty("p", Text(y))}));
    EXPECT_NE(text.find(y), std::string::npos) << text;
}

TEST(Compare, ReportsMissingSwitchesAsAWhole) {
    const Buffer a = StateOf({MakeSwitch("s", {kP}, {}, {MakeList("1", kNone)})}),
                 b = StateOf({MakeSwitch("t", {}, {}, {})});
    EXPECT_EQ(Listing(a, b), "- switch s: etherswitch, 1 port, 1 property\n"
                             "+ switch t: etherswitch, 0 ports, 0 properties\n");
}

TEST(Compare, ReportsFieldsAndMissingLists) {
    const Buffer a = StateOf({MakeSwitch("s", {}, {}, {}, 8)}),
                 b = StateOf({MakeSwitch("s", {}, {}, {}, 10, "vswitch")});
    EXPECT_EQ(Listing(a, b), "switch s\n  ~ version: 8 -> 10\n  ~ class: etherswitch -> vswitch\n");
    Buffer classField(128, 0);
    const Buffer bare = StateOf({MakeList("s", {{"switchVersion", 0x10, Number(8)},
                                                {"className", 0x10, Text("etherswitch")},
                                                {"maxPorts", 0x10, Number(512)}})});
    EXPECT_EQ(Listing(a, bare), "switch s\n  - list global: 0 properties\n  - list host: 0 properties\n")
        << "padding of a class name is not a difference";
}

TEST(Compare, MatchesPortsByIdAndKind) {
    const NewEntry active = MakeList("1", {kP}), shadow = MakeList("1", {kP, kShadow});
    EXPECT_EQ(Listing(WithPorts({active, shadow}), WithPorts({shadow, active})), "");
    EXPECT_EQ(Listing(WithPorts({active, shadow}), WithPorts({active})),
              "switch s\n  - port 1: shadow, 2 properties\n");
    EXPECT_EQ(Listing(WithPorts({active}), WithPorts({shadow})),
              "switch s\n  ~ port 1: active, 1 property -> shadow, 2 properties\n");
    EXPECT_EQ(Listing(WithPorts({active}), WithPorts({MakeList("1", {kQ})})),
              "switch s\n  port 1 (active)\n    - p: 1\n    + q: \"text\"\n");
}

TEST(Compare, MatchesDuplicatesInOrder) {
    const NewEntry p2 = MakeProperty("p", Number(2));
    EXPECT_EQ(Listing(WithGlobal({kP, p2}), WithGlobal({kP, kQ, p2})),
              "switch s\n  global\n    + q: \"text\"\n");
    EXPECT_EQ(Listing(WithGlobal({kP, p2}), WithGlobal({kP})), "switch s\n  global\n    - p: 2\n");
}

TEST(Compare, IgnoresOrderByDefault) {
    const Buffer a = WithGlobal({kP, kQ}), b = WithGlobal({kQ, kP});
    EXPECT_EQ(Listing(a, b), "");
    EXPECT_EQ(Listing(a, b, {.order = true}), "switch s\n  global\n    % the order differs\n");
    const Buffer s = StateOf({MakeSwitch("s", {}, {}, {}), MakeSwitch("t", {}, {}, {})});
    const Buffer t = StateOf({MakeSwitch("t", {}, {}, {}), MakeSwitch("s", {}, {}, {})});
    EXPECT_EQ(Listing(s, t), "");
    EXPECT_NE(Listing(s, t, {.order = true}), "");
    const NewEntry one = MakeList("1", kNone), two = MakeList("2", kNone);
    EXPECT_EQ(Listing(WithPorts({one, two}), WithPorts({two, one})), "");
    EXPECT_NE(Listing(WithPorts({one, two}), WithPorts({two, one}), {.order = true}), "");
}

TEST(Compare, PrintsEachHeadingOnce) {
    const Buffer a = StateOf({MakeSwitch("s", {kP}, {kP}, {MakeList("1", {kP}), MakeList("2", {kP})})});
    const Buffer b = StateOf(
        {MakeSwitch("s", {kQ}, {kQ}, {MakeList("1", {kQ}), MakeList("2", {kQ}), MakeList("3", kNone)})});
    EXPECT_EQ(Listing(a, b), "switch s\n"
                             "  global\n    - p: 1\n    + q: \"text\"\n"
                             "  host\n    - p: 1\n    + q: \"text\"\n"
                             "  port 1 (active)\n    - p: 1\n    + q: \"text\"\n"
                             "  port 2 (active)\n    - p: 1\n    + q: \"text\"\n"
                             "  + port 3: active, 0 properties\n");
}

TEST(Compare, EscapesItsOutput) {
    const std::string text =
        Listing(WithGlobal({}), WithGlobal({MakeProperty("\x1b[2J", Text("a\x1b[2Jb"))}));
    EXPECT_EQ(text.find('\x1b'), std::string::npos) << text;
}

TEST(Compare, SummarizesInOneLine) {
    const Buffer a = WithGlobal({kP, kQ}), b = WithGlobal({MakeProperty("p", Number(2))});
    const State before = ParseState(a), after = ParseState(b);
    EXPECT_EQ(ShowChangeCount(Compare(before, after, {})), "1 removed, 1 changed");
    EXPECT_EQ(ShowChangeCount({}), "no differences");
}

} // namespace
