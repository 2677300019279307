/* SPDX-License-Identifier: Apache-2.0 */
// The exported mapping tables: their layout and the invariants of every row. prop_rows_test.cpp lists the
// rows.

#include <algorithm>
#include <set>
#include <string>
#include <tuple>
#include <vector>

#include <gtest/gtest.h>

#include "configstore/converters/table.h"
#include "dvs/configstore.h"

namespace {

std::vector<DVSProp2ConfigEntry *> Rows(int kind) {
    std::vector<DVSProp2ConfigEntry *> rows;
    for (auto *row = GetConfigMap(kind); row->key; ++row)
        rows.push_back(row);
    return rows;
}

TEST(PropTables, AreSelectedByClass) {
    EXPECT_EQ(dvsGlobalProp2Config, GetConfigMap(DVS_PROP_CLASS_GLOBAL));
    EXPECT_EQ(dvsHostProp2Config, GetConfigMap(DVS_PROP_CLASS_HOST));
    EXPECT_EQ(dvsPortProp2Config, GetConfigMap(DVS_PROP_CLASS_PORT));
    dvsConfigMaps[1] = dvsPortProp2Config; // writable, and read on each call
    EXPECT_EQ(dvsPortProp2Config, GetConfigMap(DVS_PROP_CLASS_HOST));
    dvsConfigMaps[1] = dvsHostProp2Config;
}

TEST(PropTables, HaveTheirNumberOfRows) {
    EXPECT_EQ(29u, Rows(0).size());
    EXPECT_EQ(3u, Rows(1).size());
    EXPECT_EQ(24u, Rows(2).size());
}

TEST(PropTables, EndInADefaultRowAndTheEndRow) {
    for (int kind = 0; kind < 3; ++kind) {
        const auto *last = Rows(kind).back();
        EXPECT_STREQ("DEFAULT", last->key);
        EXPECT_STREQ("data", last->path[0]);
        EXPECT_EQ(1u, last->depth);
        EXPECT_EQ(kind == 2 ? 33u : 22u, last->converterType);
        const auto *end = last + 1;
        EXPECT_EQ(nullptr, end->key);
        EXPECT_EQ(0u, end->depth);
        EXPECT_EQ(37u, end->converterType);
        EXPECT_EQ(0u, end->loadPropType);
        EXPECT_EQ(0u, end->reserved);
    }
}

TEST(PropTables, RowsAreWellFormed) {
    for (int kind = 0; kind < 3; ++kind) {
        for (const auto *row : Rows(kind)) {
            SCOPED_TRACE(row->key);
            EXPECT_GE(row->depth, 1u);
            EXPECT_LE(row->depth, 3u);
            EXPECT_EQ(16u, row->loadPropType);
            EXPECT_EQ(0u, row->reserved);
            EXPECT_NE(nullptr, dvs::convert::ConverterFor(dvs::ConverterTypeOf(*row)));
            for (uint32_t slot = 0; slot < 5; ++slot) {
                const std::string name = row->path[slot];
                EXPECT_EQ(slot < row->depth, !name.empty());
                const auto *bytes = row->path[slot];
                EXPECT_TRUE(std::all_of(bytes + name.size(), bytes + 128, [](char c) { return c == 0; }));
            }
        }
    }
}

TEST(PropTables, KeysAreUniqueExceptTheRepeatedRow) {
    for (int kind = 0; kind < 3; ++kind) {
        std::set<std::string> keys;
        std::vector<std::string> repeated;
        for (const auto *row : Rows(kind))
            if (!keys.insert(row->key).second) repeated.emplace_back(row->key);
        if (kind == 0)
            EXPECT_EQ(std::vector<std::string>{"com.orbeno.etherswitch.multicastFilter"}, repeated);
        else
            EXPECT_TRUE(repeated.empty());
    }
}

TEST(PropTables, HaveAConverterForEveryTypeButOne) {
    using dvs::ConverterType;
    using dvs::convert::ConverterFor;
    for (ConverterType type{}; type < ConverterType::kEnd; type = Next(type))
        EXPECT_EQ(type == ConverterType::kUnassigned, ConverterFor(type) == nullptr)
            << static_cast<uint32_t>(type);
    EXPECT_EQ(nullptr, ConverterFor(ConverterType::kEnd));
    EXPECT_EQ(nullptr, ConverterFor(ConverterType{0xffffffff}));
}

} // namespace
