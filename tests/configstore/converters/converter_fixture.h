/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_CONVERTERS_CONVERTER_FIXTURE_H
#define TESTS_CONFIGSTORE_CONVERTERS_CONVERTER_FIXTURE_H

// What the tests of converters share: an object of the store double, values built field by field, a save of
// one property and a load of all, through the frame as everybody calls it.

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

/// A switch's or port's object of its own. Everything handed out is back when the test ends.
class ConverterTest : public testing::Test {
protected:
    ConverterTest();
    ~ConverterTest() override;

    /// The class code by the class's name, the object's "product" as a save leaves it, and the width of port
    /// records.
    void BecomeSwitch(const char *className, const char *version = "7.0.3", bool overlay = false);

    /// SaveProp of a copy of the value in a block of just its size.
    int32_t Save(uint32_t propClass, const std::string &key, const std::vector<uint8_t> &value);

    /// LoadProps; the status is kept in loadStatus. Every property must have the type 16.
    Properties Load(uint32_t propClass, configstore::Object *trafficResources = nullptr);
    /// The one property of a load; empty and absent are told apart.
    std::optional<std::vector<uint8_t>> LoadOne(uint32_t propClass, const std::string &key);

    /// The object's members as text, without those that BecomeSwitch made.
    [[nodiscard]] std::string Dump() const;

    /// A sub-object on the way from the root, created where it is absent. "name[id]" is an instance.
    configstore::Object *Sub(const std::string &path);

    configstore::Object *object = nullptr;
    int32_t loadStatus = 0;
    std::string messages; // what would have been printed so far
};

} // namespace converter_test

#endif
