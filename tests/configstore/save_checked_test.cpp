/* SPDX-License-Identifier: Apache-2.0 */
// The checked save: a rejected buffer leaves store and switch table unchanged.

#include "configstore/store_fixture.h"

using namespace state_builder;

namespace {

Switch Small(const std::string &id, const std::string &name = "name") {
    Switch sw;
    sw.id = id;
    sw.global = {Alias(name), Version()};
    sw.ports = {{"p1", {{"com.orbeno.common.port.alias", Text("x")}}}};
    return sw;
}

struct SaveCheckedTest : StoreTest {
    SaveCheckedTest() {
        EXPECT_EQ(0, Save({Small("a", "old"), Small("b", "old")}));
        before = fake_store::Dump();
        EXPECT_EQ(HYP_OK, DVSState_SwitchAdd("mine", "vswitch", 8, 9));
        messages.clear();
    }
    ~SaveCheckedTest() override { EXPECT_EQ(HYP_OK, DVSState_ConfigReset()); }
    void ExpectRefused(const Bytes &buf, uint32_t expected) {
        for (const char *id : {static_cast<const char *>(nullptr), "a"}) {
            EXPECT_EQ(static_cast<int32_t>(expected), SaveChecked(buf, id));
            EXPECT_EQ(before, fake_store::Dump());
            EXPECT_NE(nullptr, DVSState_SwitchFind("mine")) << "the table must not change";
        }
    }
    std::string before;
};

TEST_F(SaveCheckedTest, SavesAValidBuffer) {
    ASSERT_EQ(0, SaveChecked(State({Small("a", "new")})));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#a/name = \"new\"\n"));
    EXPECT_EQ(std::string::npos, fake_store::Dump().find("#b"));
}

TEST_F(SaveCheckedTest, SavesOneSwitchOfAValidBuffer) {
    ASSERT_EQ(0, SaveChecked(State({Small("a", "new")}), "a"));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#a/name = \"new\"\n"));
    EXPECT_NE(std::string::npos, fake_store::Dump().find("#b/name = \"old\"\n"));
}

TEST_F(SaveCheckedTest, RejectsADamagedBuffer) {
    Bytes damaged = State({Small("a")});
    damaged[200] ^= 1;
    ExpectRefused(damaged, HYP_BAD_CHECKSUM);
    EXPECT_TRUE(Said("State is not saved to configstore: ")) << messages;
}

TEST_F(SaveCheckedTest, RejectsABufferTruncatedAtAnyLength) {
    const Bytes whole = State({Small("a")});
    for (std::size_t size = 0; size < whole.size(); size += 7) {
        const Bytes cut(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
        EXPECT_EQ(static_cast<int32_t>(HYP_BAD_PARAM), SaveChecked(cut)) << size;
    }
    EXPECT_EQ(before, fake_store::Dump());
    EXPECT_EQ(static_cast<int32_t>(HYP_BAD_PARAM),
              DVSState_SaveBufToConfigStoreChecked(nullptr, 100, nullptr));
    EXPECT_EQ(before, fake_store::Dump());
}

TEST_F(SaveCheckedTest, RejectsABufferThatIsDamagedDeepInside) {
    // Only the innermost checksum is wrong, so the value of a port is not a valid buffer.
    Switch sw = Small("a");
    Bytes state = State({sw});
    const std::string needle = "com.orbeno.common.port.alias";
    const auto at = std::search(state.begin(), state.end(), needle.begin(), needle.end());
    ASSERT_NE(state.end(), at);
    *(at + 60) = 'x'; // after the name's NUL: covered by the checksums of port, switch and state
    ExpectRefused(state, HYP_BAD_CHECKSUM);
}

TEST_F(SaveCheckedTest, RejectsMoreSwitchesThanTheTableHolds) {
    std::vector<Switch> many;
    for (int i = 0; i < 33; ++i)
        many.push_back(Small("s" + std::to_string(i)));
    ExpectRefused(State(many), HYP_LIMIT_EXCEEDED);
    many.pop_back();
    EXPECT_EQ(0, SaveChecked(State(many)));
}

TEST_F(SaveCheckedTest, RejectsMorePortsThanTheHostAllows) {
    uwMaxNumActivePortsSystemWide = 4;
    Switch sw = Small("a");
    for (int i = 2; i <= 5; ++i)
        sw.ports.push_back({"p" + std::to_string(i), {}});
    EXPECT_EQ(static_cast<int32_t>(HYP_LIMIT_EXCEEDED), SaveChecked(State({sw})));
    EXPECT_EQ(before, fake_store::Dump());
    sw.ports.pop_back();
    EXPECT_EQ(0, SaveChecked(State({sw})));
    uwMaxNumActivePortsSystemWide = 65536;
}

TEST_F(SaveCheckedTest, RejectsDuplicatePorts) {
    Switch sw = Small("a");
    sw.ports.push_back(sw.ports[0]);
    ExpectRefused(State({sw}), HYP_EXISTS);
}

TEST_F(SaveCheckedTest, RejectsASwitchIdThatIsTooLong) {
    ExpectRefused(State({Small(std::string(64, 'x'))}), HYP_BAD_PARAM);
}

TEST_F(SaveCheckedTest, ReturnsAFailureOfTheStore) {
    fake_store::FailFunction("Set", configstore::SCHEMA_VIOLATION);
    EXPECT_EQ(4, SaveChecked(State({Small("a", "new")})));
    EXPECT_EQ(before, fake_store::Dump());
}

TEST_F(SaveCheckedTest, ReadsTheHostsLimitIfUnread) {
    uwMaxNumActivePortsSystemWide = 0;
    setenv("DVS_MAX_PORTS", "no number", 1);
    ExpectRefused(State({Small("a")}), HYP_BAD_PARAM);
    EXPECT_EQ(0u, uwMaxNumActivePortsSystemWide);
    setenv("DVS_MAX_PORTS", "65536", 1);
    EXPECT_EQ(0, SaveChecked(State({Small("a")})));
    EXPECT_EQ(65536u, uwMaxNumActivePortsSystemWide);
    unsetenv("DVS_MAX_PORTS");
}

} // namespace
