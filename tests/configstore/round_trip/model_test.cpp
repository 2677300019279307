/* SPDX-License-Identifier: Apache-2.0 */
// Tests the model of a round trip: it covers every key, names a rule for every change, and its rules are in
// the documentation.

#include <fstream>
#include <set>
#include <sstream>

#include <gtest/gtest.h>

#include "configstore/round_trip/keys.h"
#include "configstore/round_trip/model.h"
#include "dvs/configstore.h"

using namespace round_trip;
using state_builder::Prop;
using state_builder::Props;
using state_builder::Switch;
using state_builder::Text;
using state_builder::U32;

namespace {

// The model has its own names for places in the store; keys must share a place exactly as in the tables.
TEST(RoundTripKeys, MatchTheTablesInOrder) {
    for (const uint32_t propClass : {0u, 1u, 2u}) {
        std::vector<std::string> rows;
        std::map<std::string, std::set<std::string>> keysOfPath, keysOfPlace;
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            if (std::string(row->key) == "DEFAULT") continue;
            std::string path;
            for (uint32_t i = 0; i < row->depth; ++i)
                path += std::string("/") + row->path[i];
            const bool isRepeated = keysOfPath[path].contains(row->key);
            // The keys themselves name the instances of this list.
            keysOfPath[path == "/health_checks" ? path + row->key : path].insert(row->key);
            if (!isRepeated) rows.push_back(row->key + std::string(" ") + std::to_string(row->converterType));
        }
        std::erase_if(keysOfPath, [](const auto &each) { return each.second.empty(); });
        std::vector<std::string> known;
        for (const Key &key : KeysOf(propClass)) {
            known.push_back(key.name + std::string(" ") + std::to_string(static_cast<uint32_t>(key.type)));
            keysOfPlace[key.place].insert(key.name);
        }
        EXPECT_EQ(rows, known);
        std::set<std::set<std::string>> groups, knownGroups;
        for (const auto &[path, keys] : keysOfPath)
            groups.insert(keys);
        for (const auto &[place, keys] : keysOfPlace)
            knownGroups.insert(keys);
        EXPECT_EQ(groups, knownGroups);
    }
}

// Every row of the table of changes names at least one rule; every rule has a row.
TEST(RoundTripRules, MatchTheDocumentation) {
    std::ifstream file(DVS_SOURCE_DIR "/docs/config-store.md");
    std::string line;
    bool isInside = false;
    std::set<std::string> documented;
    while (std::getline(file, line)) {
        if (line.starts_with("## ")) isInside = line == "## What a round trip changes";
        // The table ends at the first line that is not a row.
        if (documented.size() && !line.starts_with("| ")) isInside = false;
        if (!isInside || !line.starts_with("| ") || line.starts_with("| rule ")) continue;
        const std::string cell = line.substr(0, line.find('|', 1));
        std::size_t names = 0;
        for (std::size_t at = cell.find('`'); at != std::string::npos; at = cell.find('`', at + 1), ++names) {
            const std::size_t end = cell.find('`', at + 1);
            EXPECT_TRUE(documented.insert(cell.substr(at + 1, end - at - 1)).second) << line;
            at = end;
        }
        EXPECT_GT(names, 0u) << line;
    }
    std::set<std::string> known;
    for (int i = 0; i < static_cast<int>(Rule::kCount); ++i)
        known.insert(NameOf(static_cast<Rule>(i)));
    EXPECT_EQ(documented, known);
}

TEST(RoundTripModel, NamesARuleForEveryChange) {
    const Props before = {{"a", U32(1)}, {"b", U32(2)}, {"c", U32(3)}};
    ListFate fate;
    fate.kept = {{before[0], {0}, {}}, {{"b", U32(9)}, {1}, {Rule::kTextEnds}}};
    fate.gone = {{2, Rule::kEmptyIsGone}};
    EXPECT_EQ(Unexplained(before, fate), std::vector<std::string>{});
    fate.kept[1].rules.clear();
    EXPECT_EQ(Unexplained(before, fate), std::vector<std::string>{"b changes without a rule"});
    fate.kept[1] = {before[1], {1}, {Rule::kTextEnds}};
    EXPECT_EQ(Unexplained(before, fate), std::vector<std::string>{"b has a rule and does not change"});
    fate.kept.pop_back();
    EXPECT_EQ(Unexplained(before, fate), std::vector<std::string>{"b is passed over"});
    fate.kept.push_back({before[1], {1}, {}});
    fate.gone.push_back({1, Rule::kEmptyIsGone});
    EXPECT_EQ(Unexplained(before, fate), std::vector<std::string>{"b is gone and is not"});
    fate.gone.pop_back();
    fate.kept.push_back({{"d", U32(4)}, {}, {}});
    EXPECT_EQ(Unexplained(before, fate), std::vector<std::string>{"d changes without a rule"});
}

TEST(RoundTripModel, NamesEachDifference) {
    Switch sw{
        .id = "x", .global = {state_builder::Alias("a"), {"b", Text("b")}}, .host = {}, .ports = {{"1", {}}}};
    EXPECT_TRUE(Differences({sw}, {sw}).empty());
    const auto lines = [&](auto change) {
        Switch other = sw;
        change(other);
        return Differences({sw}, {other}).size();
    };
    EXPECT_EQ(lines([](Switch &s) { s.id = "y"; }), 1u);
    EXPECT_EQ(lines([](Switch &s) { ++s.version; }), 1u);
    EXPECT_EQ(lines([](Switch &s) { ++s.maxPorts; }), 1u);
    EXPECT_EQ(lines([](Switch &s) { s.className = "z"; }), 1u);
    EXPECT_EQ(lines([](Switch &s) { s.classField.push_back(0); }), 1u);
    EXPECT_EQ(lines([](Switch &s) { s.global[1].type = 0; }), 1u);
    EXPECT_EQ(lines([](Switch &s) { s.global[1].value.push_back(0); }), 1u);
    EXPECT_EQ(lines([](Switch &s) { std::swap(s.global[0], s.global[1]); }), 2u);
    EXPECT_EQ(lines([](Switch &s) { s.global.pop_back(); }), 1u);
    EXPECT_EQ(lines([](Switch &s) { s.host.push_back({"h", U32(0)}); }), 1u);
    EXPECT_EQ(lines([](Switch &s) { s.ports[0].id = "2"; }), 1u);
    EXPECT_EQ(lines([](Switch &s) { s.ports[0].props.push_back({"p", U32(0)}); }), 1u);
    EXPECT_EQ(lines([](Switch &s) { s.ports.clear(); }), 1u);
    EXPECT_EQ(Differences({sw}, {}).size(), 1u);
}

TEST(RoundTripModel, RejectsCasesItDoesNotCover) {
    const ListContext etherswitch{{"etherswitch", 9, 9, false}, 2, {}, nullptr};
    const ListContext vswitch{{"vswitch", 9, 9, false}, 2, {}, nullptr};
    const Value vlan(8);
    const Props both = {{"com.orbeno.etherswitch.port.vlan", vlan}, {"com.orbeno.vswitch.port.vlan", vlan}};
    EXPECT_THROW(FateOf(vswitch, both), std::logic_error);
    EXPECT_NO_THROW(FateOf(etherswitch, both)); // which saves only one of them
    Ledger ledger;
    EXPECT_THROW(AfterRoundTrip({{.id = "x", .global = {}, .host = {}, .ports = {}}}, 64, &ledger),
                 std::logic_error);
}

TEST(RoundTripLedger, ListsTheRulesThatNeverApplied) {
    Ledger ledger;
    EXPECT_EQ(ledger.Idle().size(), static_cast<std::size_t>(Rule::kCount));
    ledger.Note(Rule::kIpfixOff);
    Ledger other;
    other.Note(Rule::kTypeWord);
    ledger.Add(other);
    EXPECT_EQ(ledger.Idle().size(), static_cast<std::size_t>(Rule::kCount) - 2);
}

} // namespace
