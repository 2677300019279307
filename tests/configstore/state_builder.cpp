/* SPDX-License-Identifier: Apache-2.0 */
// State buffers for tests (state_builder.h), built with the exported list functions.

#include "configstore/state_builder.h"

#include <cstdlib>
#include <cstring>
#include <memory>

#include <gtest/gtest.h>

#include "dvs/data.h"

namespace state_builder {
namespace {

constexpr uint32_t kType = 0x10;

struct ListFree {
    void operator()(DVSData *list) const { DVSData_Free(list); }
};
using List = std::unique_ptr<DVSData, ListFree>;

List NewList() {
    DVSData *list = nullptr;
    EXPECT_EQ(HYP_OK, DVSData_Alloc(
                          &list, [](uint64_t size) { return std::malloc(size); }, std::free));
    return List(list);
}

void Append(const List &list, const std::string &name, const Bytes &value, uint32_t type = kType) {
    EXPECT_EQ(HYP_OK, DVSData_Append(list.get(), name.c_str(), value.data(),
                                     static_cast<uint32_t>(value.size()), type));
}

Bytes Serialize(const List &list) {
    void *buf = nullptr;
    uint32_t len = 0;
    EXPECT_EQ(HYP_OK, DVSData_Serialize(list.get(), &buf, &len, 9));
    const auto *bytes = static_cast<const uint8_t *>(buf);
    Bytes copy(bytes, bytes + len);
    std::free(buf);
    return copy;
}

Bytes SerializeProps(const Props &props) {
    const List list = NewList();
    for (const auto &prop : props)
        Append(list, prop.key, prop.value, prop.type);
    return Serialize(list);
}

uint32_t Number(const Bytes &value) {
    uint32_t number = 0;
    EXPECT_EQ(sizeof number, value.size());
    if (value.size() == sizeof number) std::memcpy(&number, value.data(), sizeof number);
    return number;
}

void ReadClassName(const Bytes &field, Switch *sw) {
    sw->className = reinterpret_cast<const char *>((field + Bytes{0}).data());
    sw->classField = field;
}

Switch ParseSwitch(const Prop &entry) {
    Switch sw;
    sw.id = entry.key;
    for (const auto &field : ParseList(entry.value)) {
        if (field.key == "switchVersion")
            sw.version = Number(field.value);
        else if (field.key == "className")
            ReadClassName(field.value, &sw);
        else if (field.key == "maxPorts")
            sw.maxPorts = Number(field.value);
        else if (field.key == "globalPropList")
            sw.global = ParseList(field.value);
        else if (field.key == "hostPropList")
            sw.host = ParseList(field.value);
        else
            sw.ports.push_back({field.key, ParseList(field.value)});
    }
    return sw;
}

} // namespace

Bytes U32(uint32_t number) {
    Bytes bytes(sizeof number);
    std::memcpy(bytes.data(), &number, sizeof number);
    return bytes;
}
Bytes Text(const std::string &text) {
    return Slot(text, text.size() + 1);
}
Bytes Raw(const std::string &text) {
    return {text.begin(), text.end()};
}
Bytes operator+(Bytes left, const Bytes &right) {
    left.insert(left.end(), right.begin(), right.end());
    return left;
}
Bytes Slot(const std::string &text, std::size_t size) {
    Bytes bytes = Raw(text);
    bytes.resize(size);
    return bytes;
}

Prop Version(uint32_t version) {
    return {"com.orbeno.common.version", U32(version)};
}
Prop Alias(const std::string &name) {
    return {"com.orbeno.common.alias", Text(name)};
}

Bytes State(const std::vector<Switch> &switches) {
    const List state = NewList();
    for (const auto &sw : switches) {
        const List list = NewList();
        Append(list, "switchVersion", U32(sw.version));
        Append(list, "className", Slot(sw.className, 128));
        Append(list, "maxPorts", U32(sw.maxPorts));
        Append(list, "globalPropList", SerializeProps(sw.global));
        Append(list, "hostPropList", SerializeProps(sw.host));
        for (const auto &port : sw.ports)
            Append(list, port.id, SerializeProps(port.props));
        Append(state, sw.id, Serialize(list));
    }
    return Serialize(state);
}

Props ParseList(const Bytes &buf) {
    DVSData *handle = nullptr;
    // All types, including those that a plain deserialization drops.
    const HYP_ReturnStatus status = DVSData_DeserializeWithPropType(
        &handle, buf.data(), static_cast<uint32_t>(buf.size()),
        [](uint64_t size) { return std::malloc(size); }, std::free, 0xffffffff);
    EXPECT_EQ(HYP_OK, status);
    if (status != HYP_OK) return {};
    const List list(handle);
    Props props;
    DVSDataEntry *entry = nullptr;
    while (DVSData_Next(list.get(), entry, &entry) == HYP_OK) {
        void *data = nullptr;
        const uint32_t len = DVSData_Data(entry, &data);
        const auto *bytes = static_cast<const uint8_t *>(data);
        props.push_back({DVSData_Name(entry), Bytes(bytes, bytes + len), DVSData_PropType(entry)});
    }
    return props;
}

std::vector<Switch> Parse(const Bytes &state) {
    std::vector<Switch> switches;
    for (const auto &entry : ParseList(state))
        switches.push_back(ParseSwitch(entry));
    return switches;
}

bool Has(const Props &props, const std::string &key) {
    for (const auto &prop : props)
        if (prop.key == key) return true;
    return false;
}
Prop Find(const Props &props, const std::string &key) {
    for (const auto &prop : props)
        if (prop.key == key) return prop;
    ADD_FAILURE() << "no property " << key;
    return {};
}

} // namespace state_builder
