/* SPDX-License-Identifier: Apache-2.0 */
// The name filters of property lists. Each entry is filtered independently.

#include <cstdlib>

#include <gtest/gtest.h>

#include "dvs/hyp.h"
#include "kernel/state_support.h"

namespace dvs::test {
namespace {

class Filters : public testing::Test {
protected:
    Filters() { EXPECT_EQ(DVSData_Alloc(&list, HeapAlloc, std::free), HYP_OK); }
    ~Filters() override { DVSData_Free(list); }

    void Add(const char *name, uint32_t type = 16, const char *value = "v") {
        EXPECT_EQ(DVSData_Append(list, name, value, 1, type), HYP_OK);
    }
    std::vector<std::string> Names() { return EntryNames(list); }

    using Strings = std::vector<std::string>;
    DVSData *list = nullptr;
};

TEST_F(Filters, VolatileMatchesInTheMiddleButNotAtTheEnd) {
    Add("a.volatile.b");
    Add("a.volatile");
    Add(".volatile.");
    Add("volatile.b");
    EXPECT_EQ(DVSHYPStripNamedProp(list, ".volatile."), HYP_NOT_FOUND);
    EXPECT_EQ(Names(), (Strings{"a.volatile", "volatile.b"}));
}

TEST_F(Filters, StripRemovesRunsHeadAndTail) {
    for (const char *name : {"x1", "x2", "keep1", "x3", "x4", "keep2", "x5"})
        Add(name);
    EXPECT_EQ(DVSHYPStripNamedProp(list, "x"), HYP_NOT_FOUND);
    EXPECT_EQ(Names(), (Strings{"keep1", "keep2"}));
    Add("after");
    EXPECT_EQ(Names(), (Strings{"keep1", "keep2", "after"}));
    EXPECT_EQ(DVSHYPStripNamedProp(list, ""), HYP_NOT_FOUND);
    EXPECT_EQ(Names(), Strings{});
}

TEST_F(Filters, EmptyListEndsAtOnce) {
    EXPECT_EQ(DVSHYPStripNamedProp(list, "x"), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYPStripNamedPropForType(list, "x", nullptr, 16), HYP_NOT_FOUND);
    EXPECT_EQ(DVSHYPExtractNamedPropForType(list, "x", 16), HYP_NOT_FOUND);
}

TEST_F(Filters, StripForTypeRemovesOtherTypesUnlessTheyAreKept) {
    Add("a", 32);
    Add("kept", 32);
    Add("b", 16);
    Add("needle.c", 16);
    Add("needle.kept", 16);
    const char *keep[] = {"none", "kept", "needle.kept", nullptr};
    EXPECT_EQ(DVSHYPStripNamedPropForType(list, "needle", keep, 16), HYP_NOT_FOUND);
    EXPECT_EQ(Names(), (Strings{"kept", "b", "needle.kept"}));
    EXPECT_EQ(DVSHYPStripNamedPropForType(list, "needle", nullptr, 16), HYP_NOT_FOUND);
    EXPECT_EQ(Names(), Strings{"b"});
}

TEST_F(Filters, IgnoreTheTwoLowBitsOfTheType) {
    Add("a", 17);
    Add("b", 19);
    Add("c", 0x80000010);
    Add("d", 20);
    EXPECT_EQ(DVSHYPStripNamedPropForType(list, "needle", nullptr, 16), HYP_NOT_FOUND);
    EXPECT_EQ(Names(), (Strings{"a", "b", "c"}));
}

TEST_F(Filters, KeepNamesByTheirWholeText) {
    Add("kept.more", 32);
    Add("kep", 32);
    const char *keep[] = {"kept", nullptr};
    EXPECT_EQ(DVSHYPStripNamedPropForType(list, "needle", keep, 16), HYP_NOT_FOUND);
    EXPECT_EQ(Names(), Strings{});
}

TEST_F(Filters, ExtractKeepsNamedEntriesOfTheType) {
    Add("needle.a", 16);
    Add("needle.b", 32);
    Add("c", 16);
    Add("x.needle", 16);
    EXPECT_EQ(DVSHYPExtractNamedPropForType(list, "needle", 16), HYP_NOT_FOUND);
    EXPECT_EQ(Names(), (Strings{"needle.a", "x.needle"}));
}

TEST_F(Filters, DuplicatesAreFilteredOneByOne) {
    Add("n", 16, "1");
    Add("n", 32, "2");
    Add("n", 16, "3");
    EXPECT_EQ(DVSHYPStripNamedPropForType(list, "needle", nullptr, 16), HYP_NOT_FOUND);
    EXPECT_EQ(Entries(list), (std::vector<Entry>{{"n", "1", 16}, {"n", "3", 16}}));
    EXPECT_EQ(DVSData_SerializedSize(list, 9), 16U + 2 * 144);
}

} // namespace
} // namespace dvs::test
