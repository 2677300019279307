/* SPDX-License-Identifier: Apache-2.0 */
// The annotated dump prints every byte exactly once, for valid and for damaged states.

#include "tools/dvsctl/verbs/hexdump.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "form/states.h"

namespace {

using namespace dvs::ctl;
using namespace dvs::form::test;

struct Collector : RangeWriter {
    void Range(const ByteRange &range) override { ranges.push_back(range); }
    void Fault(std::size_t, const std::string &text) override { faults.push_back(text); }

    std::vector<ByteRange> ranges;
    std::vector<std::string> faults;
};

// Returns success if the ranges cover the state from the first byte to the last without gap or overlap.
testing::AssertionResult Covers(const Collector &collector, const Buffer &state) {
    std::size_t at = 0;
    for (const ByteRange &range : collector.ranges) {
        if (range.offset != at)
            return testing::AssertionFailure() << range.what << " at " << range.offset << ", not " << at;
        if (range.bytes.data() != state.data() + at)
            return testing::AssertionFailure() << "wrong bytes at " << at;
        at += range.bytes.size();
    }
    if (at != state.size()) return testing::AssertionFailure() << "ends at " << at << " of " << state.size();
    return testing::AssertionSuccess();
}

Collector Dump(const Buffer &state, const DumpFilter &filter = {}) {
    Collector collector;
    (void)DumpState(state, filter, collector);
    return collector;
}

TEST(Dump, PrintsEveryByteOnce) {
    Buffer state = SmallState();
    EXPECT_TRUE(Covers(Dump(state), state));
    EXPECT_TRUE(Dump(state).faults.empty());
    state.resize((state.size() + 511) / 512 * 512);
    EXPECT_TRUE(Covers(Dump(state), state));
    EXPECT_EQ(Dump(state).ranges.back().what, "behind the state: padding of the file");
}

TEST(Dump, PrintsEveryByteOfATruncatedState) {
    const Buffer state = SmallState();
    for (std::size_t size = 0; size < state.size(); ++size) {
        const Buffer cut(state.begin(), state.begin() + static_cast<std::ptrdiff_t>(size));
        const Collector collector = Dump(cut);
        ASSERT_TRUE(Covers(collector, cut)) << size;
        ASSERT_FALSE(collector.faults.empty()) << size;
    }
}

TEST(Dump, PrintsEveryByteOfAChangedState) {
    const Buffer state = SmallState();
    for (std::size_t at = 0; at < state.size(); ++at) {
        Buffer changed = state;
        changed[at] = static_cast<std::uint8_t>(~changed[at]);
        ASSERT_TRUE(Covers(Dump(changed), changed)) << at;
        if (at % 4 != 0) continue;
        Mend(changed);
        ASSERT_TRUE(Covers(Dump(changed), changed)) << at << ", with recomputed checksums";
    }
}

TEST(Dump, MarksAWrongChecksum) {
    Buffer state = SmallState();
    state[state.size() - 20] = static_cast<std::uint8_t>(state[state.size() - 20] + 1);
    const Collector collector = Dump(state);
    EXPECT_TRUE(std::any_of(collector.ranges.begin(), collector.ranges.end(), [](const ByteRange &range) {
        return range.isWrong && range.what.find("checksum") != std::string::npos;
    }));
    EXPECT_FALSE(collector.faults.empty());
}

TEST(Dump, PrintsOneSwitchOrPort) {
    const Buffer state = SmallState();
    const auto whole = Dump(state, {"beta", {}}), port = Dump(state, {{}, "9"}),
               both = Dump(state, {"alpha", "2"});
    ASSERT_FALSE(whole.ranges.empty());
    EXPECT_EQ(whole.ranges.front().what.substr(0, 12), "switch beta:");
    ASSERT_FALSE(port.ranges.empty());
    EXPECT_EQ(port.ranges.front().what.substr(0, 14), "active port 9:");
    ASSERT_FALSE(both.ranges.empty());
    EXPECT_EQ(both.ranges.front().what.substr(0, 14), "active port 2:");
    for (const Collector *collector : {&whole, &port, &both})
        for (std::size_t i = 1; i < collector->ranges.size(); ++i)
            EXPECT_EQ(collector->ranges[i].offset,
                      collector->ranges[i - 1].offset + collector->ranges[i - 1].bytes.size());
    Collector none;
    EXPECT_FALSE(DumpState(state, {"gamma", {}}, none));
    EXPECT_FALSE(DumpState(state, {"beta", "2"}, none));
    EXPECT_TRUE(none.ranges.empty());
}

} // namespace
