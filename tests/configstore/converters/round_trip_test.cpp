/* SPDX-License-Identifier: Apache-2.0 */
// Random sound values of every key, saved and loaded on switches of every kind, against an independent model.
// DVS_ROUND_TRIPS sets how many values each key gets on each switch.

#include <cstdlib>

#include "configstore/converters/round_trip_model.h"
#include "configstore/layouts/registry.h"
#include "configstore/layouts/value_generator.h"

using namespace converter_test;

namespace {

constexpr ModelSwitch kSwitches[] = {
    {"etherswitch", "7.0.3", false}, {"vswitch", "6.5.0", false},   {"cswitch", "8.0.0", false},
    {"etherswitch", "8.0.3", true},  {"vswitch", "OVL 1.0", false}, {"cswitch", "7.0.0", true},
};
constexpr uint32_t kVersions[] = {4, 5, 6, 7, 8, 9, 10, 11, 12, 100, 107, 108, 109, 110, 111, 112};

int Count(const char *variable, int otherwise) {
    const char *text = std::getenv(variable);
    return text ? std::atoi(text) : otherwise;
}

struct RoundTrip : ConverterTest {
    RoundTrip() { dvsconfigstore_debug = -1; }
    ~RoundTrip() override { dvsconfigstore_debug = 10; }

    // The class, the version and the overlay flag are in the object before anything is saved, so they load as
    // well.
    Properties LoadTested(uint32_t propClass, const std::string &key) {
        Properties loaded = Load(propClass);
        for (const char *always : {"com.orbeno.common.version", "com.orbeno.common.portset.ovl"}) {
            if (key != always) loaded.erase(always);
        }
        return loaded;
    }

    void Check(const ModelSwitch &sw, uint32_t propClass, const DVSProp2ConfigEntry &row,
               const std::vector<uint8_t> &value) {
        fake_store::Reset();
        configstore::DestroyObject(object);
        ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "id", "{}", &object));
        BecomeSwitch(sw.className, sw.version, sw.overlay);
        const bool isOverlayFlag = row.converterType == 19;
        ASSERT_EQ(0, Save(propClass, row.key, value)) << row.key;
        ModelSwitch after = sw;
        if (isOverlayFlag) after.overlay = value.size() >= 5 && value[0] == 't';
        ASSERT_EQ(Predict(after, propClass, row.key, row.converterType, value),
                  LoadTested(propClass, row.key))
            << row.key << " on " << sw.className << " " << sw.version;
        ASSERT_EQ(0, loadStatus) << row.key;
    }
};

TEST_F(RoundTrip, SoundValuesComeBackAsTheModelSays) {
    value_generator::Generator generator(20261121);
    const int count = Count("DVS_ROUND_TRIPS", 30);
    for (const ModelSwitch &sw : kSwitches) {
        for (const uint32_t propClass : {kGlobal, kHost, kPort}) {
            for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
                if (std::string(row->key) == "DEFAULT") continue;
                const auto *record = dvs::layout::RecordOf(propClass, row->key, sw.IsWide());
                ASSERT_NE(nullptr, record) << row->key;
                for (int i = 0; i < count; ++i) {
                    auto value = generator.Sound(*record);
                    if (row->converterType == 15)
                        value = Bytes().U32(kVersions[generator.Below(std::size(kVersions))]);
                    if (!HasDistinctKeys(row->converterType, value)) continue;
                    Check(sw, propClass, *row, value);
                    if (HasFatalFailure()) return;
                }
            }
        }
    }
}

} // namespace
