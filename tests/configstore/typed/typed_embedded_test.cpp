/* SPDX-License-Identifier: Apache-2.0 */
// Typed values over the objects of the embedded store, as the tools use them: no database is opened.

#include <gtest/gtest.h>

#include <cstdlib>

#include "configstore/layouts/registry.h"
#include "configstore/layouts/value_generator.h"
#include "configstore/typed/typed_value.h"
#include "dvs/log.h"

using dvs::ConverterType;
using dvs::typed::Build;
using dvs::typed::Built;
using dvs::typed::Describe;
using dvs::typed::Node;
using dvs::typed::State;
using dvs::typed::View;

namespace {

struct TypedEmbedded : testing::Test {
    TypedEmbedded() {
        setenv("DVS_CONFIGSTORE", "/nowhere/at/all.db", 1);
        DVSLog_SetSink([](int, const char *text, void *arg) { *static_cast<std::string *>(arg) += text; },
                       &messages);
    }
    ~TypedEmbedded() override { DVSLog_SetSink(nullptr, nullptr); }
    std::string messages;
};

// Sound values are shown. What is shown as exact builds the same bytes; what is not says why, and builds what
// is shown.
TEST_F(TypedEmbedded, SoundValuesAreShownAndBuiltAgain) {
    value_generator::Generator generator(99);
    int exact = 0;
    for (uint32_t propClass = 0; propClass <= 2; ++propClass) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            const auto *record = dvs::layout::RecordOf(propClass, row->key, false);
            const auto type = dvs::ConverterTypeOf(*row);
            if (!record || type == ConverterType::kSwitchVersion) continue; // few numbers are versions
            for (int i = 0; i < 10; ++i) {
                const auto value = generator.Sound(*record);
                const View view = Describe(propClass, row->key, value);
                // Instances need an id each, which random texts do not always give.
                if (view.state == State::kDamaged && record->parts.size() == 1) continue;
                if (view.state == State::kDamaged && type == ConverterType::kMirrorSessions) continue;
                ASSERT_EQ(State::kTyped, view.state) << row->key << ": " << view.reason;
                EXPECT_NE(view.exact, !view.differences.empty()) << row->key;
                if (!view.exact) continue;
                ++exact;
                const Built built = Build(propClass, row->key, view.tree);
                ASSERT_TRUE(built.ok) << row->key << " " << built.field << " " << built.reason;
                ASSERT_EQ(value, built.bytes) << row->key;
                EXPECT_TRUE(built.differences.empty()) << row->key << built.differences[0];
            }
        }
    }
    EXPECT_GT(exact, 50);
    EXPECT_EQ("", messages);
}

// The count of ranges has 16 bits. So many instances want a store with an index.
TEST_F(TypedEmbedded, SaysInAFewWordsWhatReadsBackOtherwise) {
    const auto number = [](int64_t value, const char *name) {
        Node node;
        node.kind = Node::Kind::kNumber;
        node.number = value;
        node.name = name;
        return node;
    };
    Node range;
    range.kind = Node::Kind::kObject;
    range.items = {number(1, "start"), number(10, "end")};
    Node ranges;
    ranges.kind = Node::Kind::kList;
    ranges.name = "trunk_vlan_ids";
    ranges.items.assign(65536, range);
    Node vlan;
    vlan.kind = Node::Kind::kObject;
    vlan.items = {std::move(ranges)};
    const Built built = Build(DVS_PROP_CLASS_PORT, "com.orbeno.etherswitch.port.vlan", vlan);
    ASSERT_EQ(1u, built.differences.size());
    EXPECT_EQ(0u, built.differences[0].find("trunk_vlan_ids: 65536 elements reads back as "));
    EXPECT_LT(built.differences[0].size(), 100u);
}

TEST_F(TypedEmbedded, NoBytesMakeItFail) {
    value_generator::Generator generator(100);
    for (int i = 0; i < 2000; ++i) {
        const uint32_t propClass = static_cast<uint32_t>(generator.Below(3));
        const auto *row = GetConfigMap(static_cast<int>(propClass));
        for (uint64_t skip = generator.Below(30); skip && row[1].key; --skip)
            ++row;
        const auto *record = dvs::layout::RecordOf(propClass, row->key, true);
        if (!record) continue;
        const View view = Describe(propClass, row->key, generator.Lying(*record), {100});
        EXPECT_EQ(view.state == State::kDamaged, !view.reason.empty()) << row->key;
        EXPECT_NE(State::kUnmapped, view.state) << row->key;
    }
    EXPECT_EQ("", messages);
}

} // namespace
