/* SPDX-License-Identifier: Apache-2.0 */
// Saves values of every length from 0 to 300 for every row and loads the result. Each value lies in a block
// of exactly its size, so that a sanitizer reports any overread. DVS_LENGTH_FILLS sets the number of contents
// per length.

#include <random>

#include "configstore/frame_fixture.h"

using namespace state_builder;

namespace {

constexpr std::size_t kMaxLength = 300;

struct PropLengths : FrameTest {
    PropLengths() {
        dvsconfigstore_debug = -1;
        if (const char *text = std::getenv("DVS_LENGTH_FILLS")) fills = std::atoi(text);
    }
    ~PropLengths() override { dvsconfigstore_debug = 10; }

    Bytes Fill(std::size_t length, int fill) {
        Bytes value(length, 0xff);
        if (fill == 0) return value;
        // Mostly small numbers, which are valid counts, lengths and indexes; sometimes a large one.
        for (auto &byte : value) {
            const auto number = random();
            byte = static_cast<uint8_t>(number % 8 < 5 ? 0 : number % 8 < 7 ? number / 8 % 4 : number / 8);
        }
        return value;
    }

    void SaveAndLoad(const std::string &key, const Bytes &value, uint32_t propClass, uint32_t propType) {
        fake_store::Reset();
        configstore::DestroyObject(object);
        ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "sw", "{}", &object));
        const int32_t saved = Save(key, value, propClass, propType);
        // The store treats a list with an empty key as a single object without instances.
        EXPECT_TRUE(saved == 0 || saved == -1 || saved == configstore::BAD_PARAMETER ||
                    saved == configstore::SCHEMA_VIOLATION)
            << key << " " << saved;
        if (propClass != DVS_PROP_CLASS_PORT) MakeSwitch();
        (void)Load(propClass);
    }

    void EveryRow(uint32_t propClass) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            for (std::size_t length = 0; length <= kMaxLength; ++length) {
                for (int fill = 0; fill < fills; ++fill) {
                    dvsSwitchClass = static_cast<uint32_t>((length + static_cast<std::size_t>(fill)) % 3);
                    dvsWidePortRecords = length % 2 != 0;
                    SaveAndLoad(row->key, Fill(length, fill), propClass, static_cast<uint32_t>(length * 8));
                    if (HasFatalFailure()) return;
                }
            }
        }
    }

    int fills = 2;
    std::mt19937 random{20250711};
};

TEST_F(PropLengths, OfEveryGlobalRow) {
    EveryRow(DVS_PROP_CLASS_GLOBAL);
}

TEST_F(PropLengths, OfEveryHostRow) {
    EveryRow(DVS_PROP_CLASS_HOST);
}

TEST_F(PropLengths, OfEveryPortRow) {
    EveryRow(DVS_PROP_CLASS_PORT);
}

} // namespace
