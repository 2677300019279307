/* SPDX-License-Identifier: Apache-2.0 */
// States made by `dvsctl generate`: complete, sound, and the same for the same seed.

#include "program.h"

#include "dvs/configstore.h"

namespace {

using namespace dvs::ctl::test;

class Generate : public ProgramTest {};

TEST_F(Generate, TheSameSeedGivesTheSameBytes) {
    for (const char *name : {"a.db", "b.db"})
        ASSERT_EQ(Dvsctl({"generate", "--ports", "3", "--seed", "7", At(name)}).status, 0);
    ASSERT_EQ(Dvsctl({"generate", "--ports", "3", "--seed", "8", At("c.db")}).status, 0);
    EXPECT_EQ(Get("a.db"), Get("b.db"));
    EXPECT_NE(Get("a.db"), Get("c.db"));
    EXPECT_EQ(Dvsctl({"verify", At("a.db")}).status, 0);
}

TEST_F(Generate, UsesEveryMappedKey) {
    ASSERT_EQ(Dvsctl({"generate", "--switches", "3", "--ports", "1", At("a.db")}).status, 0);
    const std::string out = Dvsctl({"show", At("a.db")}).out;
    for (const int propClass : {DVS_PROP_CLASS_GLOBAL, DVS_PROP_CLASS_HOST, DVS_PROP_CLASS_PORT})
        for (const auto *row = GetConfigMap(propClass); row->key; ++row) {
            if (std::string_view(row->key) == "DEFAULT") continue;
            EXPECT_NE(out.find(std::string(row->key) + " "), std::string::npos) << row->key;
        }
    for (const char *name : {"  etherswitch\n", "  vswitch\n", "  cswitch\n"})
        EXPECT_NE(out.find(name), std::string::npos) << name;
    EXPECT_EQ(out.find("does not fit"), std::string::npos);
}

TEST_F(Generate, TakesAnyNumberOfSeeds) {
    for (int seed = 0; seed < 40; ++seed)
        ASSERT_EQ(Dvsctl({"generate", "--ports", "2", "--seed", std::to_string(seed), At("a.db")}).status, 0)
            << seed;
}

TEST_F(Generate, RefusesWhatIsNoNumber) {
    EXPECT_EQ(Dvsctl({"generate", "--ports", "x", At("a.db")}).status, 2);
    EXPECT_EQ(Dvsctl({"generate", "--switches", "-1", At("a.db")}).status, 2);
    EXPECT_EQ(Dvsctl({"generate", "--dry-run", At("a.db")}).status, 0);
    EXPECT_TRUE(Files().empty());
}

} // namespace
