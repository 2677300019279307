/* SPDX-License-Identifier: Apache-2.0 */
// Tables align their columns and print only the requested ones.

#include "tools/dvsctl/cli/table.h"

#include <gtest/gtest.h>

#include "tools/dvsctl/cli/error.h"
#include "tools/dvsctl/cli/options.h"

namespace {

using namespace dvs::ctl;

constexpr Column kColumns[] = {{"name", false, true}, {"size", true, true}, {"extra"}};

std::string Render(const Options &options) {
    testing::internal::CaptureStdout();
    Output out;
    Table table(kColumns, options);
    table.Add({{"a"}, {"1"}, {"x"}});
    table.Add({{"Zürich"}, {"1000"}, {""}});
    table.Write(out);
    out.Finish();
    return testing::internal::GetCapturedStdout();
}

TEST(Table, AlignsByVisibleWidth) {
    EXPECT_EQ(Render({}), "NAME    SIZE\n"
                          "a          1\n"
                          "Zürich  1000\n");
}

TEST(Table, PrintsTheRequestedColumnsInOrder) {
    Options options;
    options.columns = "extra,name";
    EXPECT_EQ(Render(options), "EXTRA  NAME\n"
                               "x      a\n"
                               "       Zürich\n");
}

TEST(Table, CanOmitHeadings) {
    Options options;
    options.noHeadings = true;
    options.columns = "size";
    EXPECT_EQ(Render(options), "   1\n1000\n");
}

TEST(Table, RejectsAnUnknownColumn) {
    for (const char *columns : {"nmae", "", "name,", ",name", "name,,size"}) {
        Options options;
        options.columns = columns;
        try {
            Render(options);
            ADD_FAILURE() << columns;
        } catch (const Error &error) {
            EXPECT_EQ(error.kind, ErrorKind::Usage);
            EXPECT_EQ(error.why, "the columns are name, size, extra");
        }
        testing::internal::GetCapturedStdout();
    }
}

} // namespace
