/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_CONVERTERS_CONVERTER_FIXTURE_H
#define TESTS_CONFIGSTORE_CONVERTERS_CONVERTER_FIXTURE_H

// Helpers of the converter tests: an object of the store double, values built field by field, a save of one
// property and a load of all properties through the public frame.

#include <gtest/gtest.h>

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "configstore/fake_store.h"
#include "configstore/maps/prop_frame.h"
#include "dvs/configstore.h"

namespace converter_test {

inline constexpr uint32_t kGlobal = DVS_PROP_CLASS_GLOBAL;
inline constexpr uint32_t kHost = DVS_PROP_CLASS_HOST;
inline constexpr uint32_t kPort = DVS_PROP_CLASS_PORT;

/// A value under construction, little-endian.
class Bytes : public std::vector<uint8_t> {
public:
    using std::vector<uint8_t>::vector;
    Bytes &U8(uint8_t number) { return Number(number, 1); }
    Bytes &U16(uint16_t number) { return Number(number, 2); }
    Bytes &U32(uint32_t number) { return Number(number, 4); }
    Bytes &U64(uint64_t number) { return Number(number, 8); }
    /// The text in a slot of `size` bytes, filled up with zeros; without NUL where it fills the slot.
    Bytes &Text(const std::string &text, std::size_t size);
    Bytes &Zeros(std::size_t size);
    Bytes &Add(const std::vector<uint8_t> &more);

private:
    Bytes &Number(uint64_t number, std::size_t size);
};

using Properties = std::map<std::string, std::vector<uint8_t>>;

/// A separate switch or port object. Checks at the end of the test that all handles are released.
class ConverterTest : public testing::Test {
protected:
    ConverterTest();
    ~ConverterTest() override;

    /// Sets the class code from the class name, the object's "product" as after a save, and the port record
    /// width.
    void BecomeSwitch(const char *className, const char *version = "7.0.3", bool overlay = false);

    /// Calls SaveProp with a copy of the value in a block of exactly its size.
    int32_t Save(uint32_t propClass, const std::string &key, const std::vector<uint8_t> &value);

    /// Calls LoadProps and keeps its status in loadStatus. Every property must have type 16.
    Properties Load(uint32_t propClass, configstore::Object *trafficResources = nullptr);
    /// The only property of a load; distinguishes empty from absent.
    std::optional<std::vector<uint8_t>> LoadOne(uint32_t propClass, const std::string &key);

    /// The object's members as text, without those that BecomeSwitch made.
    [[nodiscard]] std::string Dump() const;

    /// The sub-object at a path from the root; absent objects are created. "name[id]" is an instance.
    configstore::Object *Sub(const std::string &path);

    configstore::Object *object = nullptr;
    int32_t loadStatus = 0;
    std::string messages; // the messages so far
};

} // namespace converter_test

#endif
