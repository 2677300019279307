/* SPDX-License-Identifier: Apache-2.0 */
// Values read by their records: every byte has its field, and the first fault its place.

#include "configstore/layouts/walk.h"

#include <gtest/gtest.h>

#include <vector>

#include "configstore/layouts/registry.h"
#include "configstore/layouts/value_generator.h"

using namespace dvs;
using namespace dvs::layout;

namespace {

using Bytes = std::vector<uint8_t>;

std::vector<std::string> Lines(const Record &record, const Bytes &value) {
    std::vector<std::string> lines;
    const Fault fault = Walk(record, value, [&](const Item &item) {
        lines.push_back(std::to_string(item.offset) + " " + item.path + " " + TextOf(item));
    });
    if (fault.found) lines.push_back(std::to_string(fault.offset) + " !! " + fault.what);
    return lines;
}

using List = std::vector<std::string>;

TEST(Walk, NamesEveryFieldWithItsText) {
    EXPECT_EQ((List{"0 flags 0x1 trunk", "2 vlan_id 0", "4 reserved 00 00", "6 range_count 1",
                    "8 ranges[0].start 1", "10 ranges[0].end 10", "12 (behind the record) ff"}),
              Lines(kPortVlan, {1, 0, 0, 0, 0, 0, 1, 0, 1, 0, 10, 0, 0xff}));
    EXPECT_EQ((List{"0 protocol 1 LLDP", "1 operation 7 (no name)"}), Lines(kLinkDiscovery, {1, 7}));
    EXPECT_EQ((List{"0 value -2"}), Lines(kSignedNumber, {0xfe, 0xff, 0xff, 0xff}));
    EXPECT_EQ((List{"0 address 10.0.0.1"}), Lines(kIpv4Value, {10, 0, 0, 1}));
    EXPECT_EQ((List{"0 value true"}), Lines(kBoolByte, {2}));
    EXPECT_EQ((List{"0 value false"}), Lines(kBoolByte, {0}));
    EXPECT_EQ((List{"0 text \"a\\x22\\x5c\\x1b\""}), Lines(kTextValue, {'a', '"', '\\', 0x1b, 0, 'x'}));
    EXPECT_EQ((List{"0 text \"ab\" without NUL"}), Lines(kTextValue, {'a', 'b'}));
    EXPECT_EQ((List{"0 bytes 01 02"}), Lines(kOpaqueValue, {1, 2}));
    Bytes ipfix(36, 0);
    ipfix[8] = 0xfe;
    ipfix[23] = 1;
    EXPECT_EQ("8 collector_address fe00::1", Lines(kIpfix, ipfix)[2]);
    ipfix[23] = 0;
    EXPECT_EQ("8 collector_address 254.0.0.0", Lines(kIpfix, ipfix)[2]);
    EXPECT_EQ("0 magic 0xfacebeef", Lines(kMirrorTableNarrow, {0xef, 0xbe, 0xce, 0xfa})[0]);
    EXPECT_NE(std::string::npos, Lines(kOpaqueValue, Bytes(40))[0].find(" ..."));
}

TEST(Walk, SaysWhereTheValueEnds) {
    EXPECT_EQ((List{"0 flags 0x0", "3 !! ends inside vlan_id"}), Lines(kPortVlan, {0, 0, 1}));
    EXPECT_EQ("12 !! ranges is said to have 2 elements, 4 bytes are left for them",
              Lines(kPortVlan, {1, 0, 0, 0, 0, 0, 2, 0, 1, 0, 10, 0}).back());
    EXPECT_EQ("0 !! ends inside policy", Lines(kTeamingPolicy, {}).back());
}

TEST(Walk, SoundValuesHaveNoFaultAndNoByteWithoutField) {
    value_generator::Generator generator(1);
    for (ConverterType type{}; type < ConverterType::kEnd; type = Next(type)) {
        const TypeInfo *info = FindType(type);
        if (!info) continue;
        for (const Record *record : {info->record, info->wide}) {
            for (int i = 0; i < 20; ++i) {
                const Bytes value = generator.Sound(*record);
                std::size_t next = 0;
                const Fault fault = Walk(*record, value, [&](const Item &item) {
                    EXPECT_EQ(next, item.offset) << record->name << " " << item.path;
                    EXPECT_NE(nullptr, item.field) << record->name;
                    EXPECT_NE("", TextOf(item) + "x");
                    next = item.offset + item.bytes.size();
                });
                EXPECT_FALSE(fault.found) << record->name << ": " << fault.what;
                EXPECT_EQ(value.size(), next) << record->name;
                EXPECT_FALSE(Check(*record, value).found) << record->name << Check(*record, value).what;
            }
        }
    }
}

TEST(Walk, LyingValuesStayInside) {
    value_generator::Generator generator(2);
    for (int i = 0; i < 3000; ++i) {
        const TypeInfo *info = FindType(ConverterType{static_cast<uint32_t>(generator.Below(37))});
        if (!info) continue;
        const Bytes value = generator.Lying(*info->wide);
        const Bytes exact(value); // a block of just its size
        std::size_t end = 0;
        const Fault fault = Check(*info->wide, exact);
        (void)Walk(*info->wide, exact, [&](const Item &item) {
            EXPECT_LE(item.offset + item.bytes.size(), exact.size());
            end = item.offset + item.bytes.size();
            (void)TextOf(item);
        });
        EXPECT_LE(fault.offset, exact.size());
        if (!fault.found) {
            EXPECT_EQ(exact.size(), end) << info->name;
        }
    }
}

TEST(Check, FindsNumbersWithoutName) {
    EXPECT_TRUE(Check(kLinkDiscovery, Bytes{2, 0}).found);
    EXPECT_EQ("operation is 4, which has no name", Check(kLinkDiscovery, Bytes{0, 4}).what);
    EXPECT_EQ(1u, Check(kLinkDiscovery, Bytes{0, 4}).offset);
    EXPECT_FALSE(Check(kLinkDiscovery, Bytes{1, 3}).found);
}

} // namespace
