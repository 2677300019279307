/* SPDX-License-Identifier: Apache-2.0 */
// Private VLAN maps: entries, type texts, and which key a switch's map is loaded under.

#include "configstore/converters/private_vlan.h"

#include "configstore/converters/converter_fixture.h"

using namespace converter_test;

namespace {

constexpr const char *kEtherswitch = "com.orbeno.etherswitch.pvlanMap";
constexpr const char *kVswitch = "com.orbeno.vswitch.pvlanMap";

Bytes Entry(uint16_t primary, uint16_t secondary, uint8_t type) {
    return Bytes().U16(primary).U16(secondary).U8(type).Zeros(3);
}

struct PrivateVlan : ConverterTest {};

TEST_F(PrivateVlan, SavesAndLoadsEveryTypeUnderBothKeys) {
    const Bytes value = Bytes().Add(Entry(10, 10, 1)).Add(Entry(10, 11, 2)).Add(Entry(10, 0xffff, 3));
    for (const char *key : {kEtherswitch, kVswitch}) {
        ASSERT_EQ(0, Save(kGlobal, key, value));
        EXPECT_NE(std::string::npos, Dump().find("/primary_id = 10\n"));
        EXPECT_NE(std::string::npos, Dump().find("/secondary_id = 65535\n"));
        EXPECT_NE(std::string::npos, Dump().find("/type = \"PROMISCUOUS\"\n"));
        EXPECT_NE(std::string::npos, Dump().find("/type = \"ISOLATED\"\n"));
        EXPECT_NE(std::string::npos, Dump().find("/type = \"COMMUNITY\"\n"));
        BecomeSwitch(key == kVswitch ? "cswitch" : "etherswitch");
        const Properties loaded = Load(kGlobal);
        EXPECT_EQ(value, loaded.at(key));
        EXPECT_FALSE(loaded.contains(key == kVswitch ? kEtherswitch : kVswitch));
    }
}

TEST_F(PrivateVlan, ClassAndVersionSelectTheKey) {
    const struct {
        const char *className, *version;
        bool overlay;
        const char *key;
    } rows[] = {
        {"cswitch", "6.5.0", false, kVswitch},          {"etherswitch", "7.0.3", true, kVswitch},
        {"etherswitch", "7.0.3", false, kEtherswitch},  {"etherswitch", "OVL 1.0", false, kEtherswitch},
        {"etherswitch", "OVL 1.0", true, kEtherswitch}, {"etherswitch", "7.0.0", true, kVswitch},
        {"etherswitch", "6.6.0", true, kEtherswitch},   {"vswitch", "6.5.0", false, kEtherswitch},
        {"vswitch", "8.0.3", true, kVswitch},           {"cswitchX", "6.5.0", false, kEtherswitch},
    };
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Entry(1, 2, 3)));
    for (const auto &row : rows) {
        BecomeSwitch(row.className, row.version, row.overlay);
        const Properties loaded = Load(kGlobal);
        EXPECT_TRUE(loaded.contains(row.key)) << row.className << row.version;
        EXPECT_FALSE(loaded.contains(row.key == kVswitch ? kEtherswitch : kVswitch))
            << row.className << row.version;
    }
}

TEST_F(PrivateVlan, IncompleteEntriesAreIgnored) {
    for (std::size_t length = 0; length < 8; ++length) {
        ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Bytes().Zeros(length))) << length;
        EXPECT_EQ("/settings {}\n/settings/pvlans = []\n", Dump()) << length;
        EXPECT_FALSE(LoadOne(kGlobal, kEtherswitch));
        EXPECT_EQ(0, loadStatus);
    }
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Entry(1, 2, 3).U32(0x01010101)));
    EXPECT_EQ(Entry(1, 2, 3), LoadOne(kGlobal, kEtherswitch));
}

TEST_F(PrivateVlan, StoreRejectsATypeWithoutText) {
    for (const uint8_t type : std::initializer_list<uint8_t>{0, 4, 5, 255}) {
        EXPECT_EQ(configstore::BAD_PARAMETER,
                  Save(kGlobal, kEtherswitch, Bytes().Add(Entry(1, 2, 3)).Add(Entry(3, 4, type))));
        EXPECT_NE(std::string::npos, Dump().find("/type = \"COMMUNITY\"\n")) << "earlier entries stay";
    }
}

TEST_F(PrivateVlan, TypeTextsAreMatchedExactly) {
    configstore::Object *entry = Sub("settings/pvlans[a]");
    ASSERT_EQ(0, configstore::SetValueUint16(entry, "primary_id", 1));
    ASSERT_EQ(0, configstore::SetValueUint16(entry, "secondary_id", 2));
    for (const char *text : {"isolated", "ISOLATED ", "", "PROMISCUOUSLY"}) {
        ASSERT_EQ(0, configstore::SetValueStr(entry, "type", text));
        EXPECT_FALSE(LoadOne(kGlobal, kEtherswitch));
        EXPECT_EQ(-1, loadStatus);
        EXPECT_NE(std::string::npos, messages.find(std::string("Unknown PvlanType ") + text + "\n"));
    }
}

TEST_F(PrivateVlan, MissingFieldsFailTheLoadWithTheirStatus) {
    for (const char *missing : {"primary_id", "secondary_id", "type"}) {
        ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Entry(1, 2, 3)));
        const std::string dump = Dump();
        const std::string id = dump.substr(dump.find('[') + 1, dump.find(']') - dump.find('[') - 1);
        ASSERT_EQ(0, configstore::RemoveValue(Sub("settings/pvlans[" + id + "]"), missing));
        EXPECT_FALSE(LoadOne(kGlobal, kEtherswitch));
        EXPECT_EQ(configstore::NOT_FOUND, loadStatus) << missing;
    }
}

// Loads the row alone: in a load of all rows, the version's row fails first.
TEST_F(PrivateVlan, SwitchWithoutClassOrVersionDoesNotLoad) {
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Entry(1, 2, 3)));
    const auto load = [&] {
        const dvs::convert::Context context;
        return dvs::convert::LoadPrivateVlans(
            {context, object, Sub("settings"), nullptr, "pvlans", kEtherswitch, 16, kGlobal});
    };
    ASSERT_EQ(0, configstore::SetValueStr(Sub("product"), "version", "7.0.1"));
    EXPECT_EQ(-1, load());
    ASSERT_EQ(0, configstore::RemoveValue(Sub("product"), "version"));
    EXPECT_EQ(-1, load()) << "regardless of the version reader's status";
    ASSERT_EQ(0, configstore::RemoveValue(Sub("product"), "forwarding_class"));
    EXPECT_EQ(configstore::NOT_FOUND, load());
    EXPECT_NE(std::string::npos, messages.find("Failed to get forwarding_class, rc: 6\n"));
    ASSERT_EQ(0, configstore::DeleteSubObject(object, "product", ""));
    EXPECT_EQ(configstore::NOT_FOUND, load());
    EXPECT_NE(std::string::npos, messages.find("Failed to get product obj, rc: 6\n"));
    (void)Load(kGlobal);
    EXPECT_EQ(configstore::NOT_FOUND, loadStatus);
}

} // namespace
