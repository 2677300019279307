/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_FRAME_FIXTURE_H
#define TESTS_CONFIGSTORE_FRAME_FIXTURE_H

// A store object for saving and loading properties through the frame and the store double.

#include <cstdlib>
#include <memory>
#include <string>

#include <gtest/gtest.h>

#include "configstore/fake_store.h"
#include "configstore/maps/prop_frame.h"
#include "configstore/state_builder.h"
#include "dvs/log.h"

struct FrameTest : testing::Test {
    FrameTest() {
        fake_store::Reset();
        dvsSwitchClass = 0;
        dvsWidePortRecords = false;
        DVSLog_SetSink(&FrameTest::Note, this);
        EXPECT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "sw", "{}", &object));
    }
    ~FrameTest() override {
        configstore::DestroyObject(object);
        EXPECT_EQ(0, fake_store::OpenHandles());
        DVSLog_SetSink(nullptr, nullptr);
    }
    FrameTest(const FrameTest &) = delete;
    FrameTest &operator=(const FrameTest &) = delete;

    static void Note(int level, const char *text, void *self) {
        auto *test = static_cast<FrameTest *>(self);
        if (level == 0) test->errors += text;
        test->messages += text;
    }

    /// Saves from a block of exactly the value's size, so that a sanitizer reports an overread.
    int32_t Save(const std::string &key, const state_builder::Bytes &value,
                 uint32_t propClass = DVS_PROP_CLASS_GLOBAL, uint32_t propType = 0x10) {
        const std::unique_ptr<uint8_t, decltype(&std::free)> block(
            static_cast<uint8_t *>(std::malloc(value.size() + value.empty())), &std::free);
        std::copy(value.begin(), value.end(), block.get());
        return SaveProp(object, key.c_str(), value.empty() ? nullptr : block.get(),
                        static_cast<uint32_t>(value.size()), propClass, propType);
    }

    /// All properties that LoadProps returns; empty, with `status` set, on failure.
    state_builder::Props Load(uint32_t propClass = DVS_PROP_CLASS_GLOBAL,
                              configstore::Object *resources = nullptr) {
        DVSData *list = nullptr;
        EXPECT_EQ(HYP_OK, DVSData_Alloc(
                              &list, [](uint64_t size) { return std::malloc(size); }, std::free));
        status = LoadProps("props", object, list, propClass, 9, resources);
        state_builder::Props props;
        DVSDataEntry *entry = nullptr;
        if (DVSData_Lookup(list, "props", &entry) == HYP_OK) {
            EXPECT_EQ(0x10u, DVSData_PropType(entry));
            void *data = nullptr;
            const uint32_t len = DVSData_Data(entry, &data);
            const auto *bytes = static_cast<const uint8_t *>(data);
            props = state_builder::ParseList({bytes, bytes + len});
        }
        EXPECT_EQ(status == 0, entry != nullptr);
        DVSData_Free(list);
        return props;
    }

    /// The object's content, one line per value.
    std::string Content() const { return fake_store::Dump(object); }

    /// The sub-object of this name, created if absent.
    configstore::Object *Sub(configstore::Object *parent, const char *name, const char *id = "") const {
        configstore::Object *sub = nullptr;
        EXPECT_EQ(0, GetOrCreateSubObject(true, parent, name, id, &sub));
        return sub;
    }

    /// The members of every switch object that converters of structured settings read.
    void MakeSwitch(const char *className = "etherswitch", const char *version = "7.0.3") const {
        configstore::Object *product = Sub(object, "product");
        EXPECT_EQ(0, configstore::SetValueStr(product, "forwarding_class", className));
        EXPECT_EQ(0, configstore::SetValueStr(product, "version", version));
    }

    configstore::Object *object = nullptr;
    int32_t status = 0;
    std::string errors, messages;
};

#endif
