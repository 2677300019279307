/* SPDX-License-Identifier: Apache-2.0 */
// Saves and loads random valid values of every key on switches of every kind, and compares the result with
// the model of a round trip. DVS_ROUND_TRIPS sets the number of values per key and switch.

#include <cstdlib>

#include "configstore/converters/converter_fixture.h"
#include "configstore/layouts/registry.h"
#include "configstore/layouts/value_generator.h"
#include "configstore/round_trip/model.h"

using namespace converter_test;

namespace {

struct KindOfSwitch {
    const char *className, *version;
    uint32_t number; // the version number with the overlay flag
    bool isOverlay;
};
constexpr KindOfSwitch kSwitches[] = {
    {"etherswitch", "7.0.3", 9, false},  {"vswitch", "6.5.0", 5, false},     {"cswitch", "8.0.0", 10, false},
    {"etherswitch", "8.0.3", 112, true}, {"vswitch", "OVL 1.0", 100, false}, {"cswitch", "7.0.0", 107, true},
};
constexpr uint32_t kVersions[] = {4, 5, 6, 7, 8, 9, 10, 11, 12, 100, 107, 108, 109, 110, 111, 112};

int Count(const char *variable, int otherwise) {
    const char *text = std::getenv(variable);
    return text ? std::atoi(text) : otherwise;
}

struct RoundTrip : ConverterTest {
    RoundTrip() { dvsconfigstore_debug = -1; }
    ~RoundTrip() override { dvsconfigstore_debug = 10; }

    // The class, the version and the overlay flag exist in the object before the save, so they load too.
    Properties LoadTested(uint32_t propClass, const std::string &key) {
        Properties loaded = Load(propClass);
        for (const char *always : {"com.orbeno.common.version", "com.orbeno.common.portset.ovl"}) {
            if (key != always) loaded.erase(always);
        }
        return loaded;
    }

    static Properties Expected(const KindOfSwitch &sw, uint32_t propClass, const char *key,
                               const std::vector<uint8_t> &value) {
        round_trip::ListContext context{
            {sw.className, sw.number, sw.number, sw.isOverlay}, propClass, {}, {}};
        const state_builder::Props before = {{key, value}};
        const auto fate = FateOf(context, before);
        for (const std::string &wrong : Unexplained(before, fate))
            ADD_FAILURE() << wrong;
        Properties after;
        for (const auto &prop : fate.After())
            after[prop.key] = prop.value;
        return after;
    }

    void Check(const KindOfSwitch &sw, uint32_t propClass, const DVSProp2ConfigEntry &row,
               const std::vector<uint8_t> &value) {
        fake_store::Reset();
        configstore::DestroyObject(object);
        ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "id", "{}", &object));
        BecomeSwitch(sw.className, sw.version, sw.isOverlay);
        ASSERT_EQ(0, Save(propClass, row.key, value)) << row.key;
        ASSERT_EQ(Expected(sw, propClass, row.key, value), LoadTested(propClass, row.key))
            << row.key << " on " << sw.className << " " << sw.version;
        ASSERT_EQ(0, loadStatus) << row.key;
    }
};

TEST_F(RoundTrip, ValidValuesMatchTheModel) {
    value_generator::Generator generator(20261121);
    const int count = Count("DVS_ROUND_TRIPS", 30);
    for (const KindOfSwitch &sw : kSwitches) {
        for (const uint32_t propClass : {kGlobal, kHost, kPort}) {
            for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
                if (std::string(row->key) == "DEFAULT") continue;
                const auto *record = dvs::layout::RecordOf(propClass, row->key, sw.number > 99);
                ASSERT_NE(nullptr, record) << row->key;
                for (int i = 0; i < count; ++i) {
                    auto value = generator.Sound(*record);
                    if (dvs::ConverterTypeOf(*row) == dvs::ConverterType::kSwitchVersion)
                        value = Bytes().U32(kVersions[generator.Below(std::size(kVersions))]);
                    if (!round_trip::HasDistinctKeys(dvs::ConverterTypeOf(*row), value)) continue;
                    Check(sw, propClass, *row, value);
                    if (HasFatalFailure()) return;
                }
            }
        }
    }
}

} // namespace
