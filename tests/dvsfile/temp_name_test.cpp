/* SPDX-License-Identifier: Apache-2.0 */
// Temporary names are new each time and recognised exactly.

#include "dvsfile/temp_name.h"

#include <gtest/gtest.h>

#include <climits>
#include <set>
#include <string>

namespace {

using dvs::file::IsTempName;
using dvs::file::MakeTempName;
using dvs::file::TempName;

std::string Make(const std::string &base) {
    TempName name{};
    EXPECT_TRUE(MakeTempName(base, &name));
    return name.data();
}

TEST(TempName, IsRecognisedForItsOwnFileOnly) {
    const std::string name = Make("state");
    EXPECT_TRUE(name.starts_with(".state.dvs-"));
    EXPECT_TRUE(IsTempName("state", name));
    EXPECT_FALSE(IsTempName("stat", name));
    EXPECT_FALSE(IsTempName("state2", name));
    EXPECT_FALSE(IsTempName("state", name + "0"));
    EXPECT_FALSE(IsTempName("state", name.substr(0, name.size() - 1)));
    EXPECT_FALSE(IsTempName("state", name.substr(0, name.size() - 1) + "g"));
    EXPECT_FALSE(IsTempName("state", "state.tmp"));
    EXPECT_FALSE(IsTempName("state", ""));
}

TEST(TempName, IsNewEachTime) {
    std::set<std::string> names;
    for (int i = 0; i < 1000; i++)
        names.insert(Make("state"));
    EXPECT_EQ(names.size(), 1000u);
}

TEST(TempName, FitsTheLongestFileName) {
    const std::string base(NAME_MAX, 'b');
    EXPECT_LE(Make(base).size(), static_cast<std::size_t>(NAME_MAX));
    EXPECT_TRUE(IsTempName(base, Make(base)));
}

} // namespace
