/* SPDX-License-Identifier: Apache-2.0 */
// Full round trips through the embedded store: saves a state, checks it, loads it back, and compares each
// field and property with the model's prediction (model.h). The states are the examples, states of `dvsctl
// generate` for each class of switch, and random ones. DVS_ROAD_SEEDS sets the number of random states.

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>

#include <gtest/gtest.h>

#include "configstore/round_trip/model.h"
#include "configstore/round_trip/random_state.h"
#include "dvs/dvs.h"
#include "emulator/emulator_process.h"

using namespace round_trip;
using dvs::test::CountFromEnvironment;
using dvs::test::RunProgram;
using state_builder::Bytes;
using state_builder::Switch;

namespace {

constexpr const char *kDvsctl = DVS_BINARY_DIR "/bin/dvsctl";
constexpr uint32_t kHostLimit = 65536; // the embedded platform's
constexpr const char *kClasses[] = {"etherswitch", "vswitch",      "cswitch",
                                    "ovlvswitch",  "stub-vswitch", "acme-switch"};

void Silence(int, const char *, void *) {}

class WholeRoad : public testing::Test {
protected:
    WholeRoad() {
        setenv("DVS_CONFIGSTORE", ":memory:", 1);
        unsetenv("DVS_EMULATOR");
        unsetenv("DVS_MAX_PORTS");
        DVSLog_SetSink(Silence, nullptr);
    }
    ~WholeRoad() override { DVSLog_SetSink(nullptr, nullptr); }

    static Bytes File(const std::string &path) {
        std::ifstream file(path, std::ios::binary);
        return Bytes(std::istreambuf_iterator<char>(file), {});
    }
    // A state from dvsctl, which takes the file name last.
    Bytes FromDvsctl(std::vector<std::string> arguments) {
        const std::string path = directory_ / "state.db";
        std::filesystem::remove(path);
        arguments.insert(arguments.begin(), kDvsctl);
        arguments.push_back("file:" + path);
        const auto run = RunProgram(arguments);
        EXPECT_EQ(run.status, 0) << run.err;
        return File(path);
    }
    Bytes Example(const char *name) {
        return FromDvsctl({"copy", std::string("json:" DVS_SOURCE_DIR "/examples/") + name});
    }
    Bytes Generated(unsigned seed) {
        return FromDvsctl({"generate", "--switches", "6", "--ports", "5", "--seed", std::to_string(seed)});
    }
    static Bytes Random(unsigned seed, const std::vector<std::string> &classes) {
        value_generator::Generator random(seed);
        std::vector<Switch> switches;
        for (const std::string &name : classes) {
            const std::string id = std::to_string(random.Below(1000)) + " of " + name;
            switches.push_back(RandomSwitch(id, name, &random));
        }
        return state_builder::State(switches);
    }

    /// Saves and loads; the loaded state must match the model.
    void Travel(const Bytes &state) {
        ASSERT_FALSE(state.empty());
        const auto expected = AfterRoundTrip(state_builder::Parse(state), kHostLimit, &ledger_);
        ASSERT_EQ(
            DVSState_SaveBufToConfigStoreChecked(state.data(), static_cast<uint32_t>(state.size()), nullptr),
            0);
        void *buf = nullptr;
        uint32_t len = 0;
        ASSERT_EQ(DVSState_LoadFromConfigStoreAsBuf(&buf, &len, false), 0);
        ASSERT_NE(buf, nullptr);
        const auto *bytes = static_cast<const uint8_t *>(buf);
        const auto actual = state_builder::Parse({bytes, bytes + len});
        std::free(buf);
        for (const std::string &line : Differences(expected, actual))
            ADD_FAILURE() << line;
    }

    Ledger ledger_;

private:
    dvs::test::TempDir directory_;
};

std::set<std::string> ClassesOf(const Bytes &state) {
    std::set<std::string> classes;
    for (const Switch &sw : state_builder::Parse(state))
        classes.insert(sw.className);
    return classes;
}

TEST_F(WholeRoad, OfTheExampleSites) {
    Travel(Example("site.json"));
    Travel(Example("site-basic.json"));
}

TEST_F(WholeRoad, OfGeneratedStatesOfEachClass) {
    for (unsigned seed = 1; seed <= 3; ++seed) {
        const Bytes state = Generated(seed);
        const auto classes = ClassesOf(state);
        for (const char *name : {"etherswitch", "vswitch", "cswitch"})
            EXPECT_TRUE(classes.contains(name)) << name;
        Travel(state);
    }
}

class WholeRoadOf : public WholeRoad, public testing::WithParamInterface<const char *> {};
INSTANTIATE_TEST_SUITE_P(EachClass, WholeRoadOf, testing::ValuesIn(kClasses));

TEST_P(WholeRoadOf, RandomStates) {
    const unsigned seeds = CountFromEnvironment("DVS_ROAD_SEEDS", 20);
    for (unsigned seed = 0; seed < seeds && !HasFailure(); ++seed) {
        SCOPED_TRACE("seed " + std::to_string(seed));
        Travel(Random(seed, {GetParam()}));
    }
}

TEST_F(WholeRoad, SaveOverAnotherStateKeepsNothingOfIt) {
    for (unsigned seed = 0; seed < 5 && !HasFailure(); ++seed)
        Travel(Random(seed, {kClasses[seed % 3], kClasses[(seed + 1) % 3]}));
}

TEST_F(WholeRoad, AppliesEveryRule) {
    Travel(Example("site.json"));
    Travel(Generated(1));
    for (unsigned seed = 0; seed < 30 && !HasFailure(); ++seed)
        Travel(Random(seed, {kClasses[seed % std::size(kClasses)], "vswitch"}));
    EXPECT_EQ(ledger_.Idle(), std::vector<std::string>{});
}

} // namespace
