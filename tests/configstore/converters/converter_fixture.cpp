/* SPDX-License-Identifier: Apache-2.0 */
// The fixture of the converter tests (converter_fixture.h).

#include "configstore/converters/converter_fixture.h"

#include <cstdlib>
#include <cstring>
#include <memory>
#include <sstream>

#include "dvs/data.h"
#include "dvs/log.h"

namespace converter_test {

Bytes &Bytes::Number(uint64_t number, std::size_t size) {
    for (std::size_t i = 0; i < size; ++i)
        push_back(static_cast<uint8_t>(number >> (8 * i)));
    return *this;
}
Bytes &Bytes::Text(const std::string &text, std::size_t slot) {
    const std::size_t length = std::min(text.size(), slot);
    insert(end(), text.begin(), text.begin() + static_cast<std::ptrdiff_t>(length));
    return Zeros(slot - length);
}
Bytes &Bytes::Zeros(std::size_t count) {
    resize(size() + count);
    return *this;
}
Bytes &Bytes::Add(const std::vector<uint8_t> &more) {
    insert(end(), more.begin(), more.end());
    return *this;
}

namespace {

void Collect(int level, const char *text, void *arg) {
    if (level == 0) *static_cast<std::string *>(arg) += text;
}

struct ListFree {
    void operator()(DVSData *list) const { DVSData_Free(list); }
};
using List = std::unique_ptr<DVSData, ListFree>;

void *Allocate(uint64_t size) {
    return std::malloc(size);
}

} // namespace

ConverterTest::ConverterTest() {
    fake_store::Reset();
    EXPECT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "id", "{}", &object));
    DVSLog_SetSink(Collect, &messages);
    BecomeSwitch("etherswitch");
}

ConverterTest::~ConverterTest() {
    DVSLog_SetSink(nullptr, nullptr);
    configstore::DestroyObject(object);
    EXPECT_EQ(0, fake_store::OpenHandles());
}

void ConverterTest::BecomeSwitch(const char *className, const char *version, bool overlay) {
    dvsSwitchClass = std::strcmp(className, "vswitch") == 0   ? 1
                     : std::strcmp(className, "cswitch") == 0 ? 2
                                                              : 0;
    dvsWidePortRecords = overlay || std::strcmp(version, "OVL 1.0") == 0;
    configstore::Object *product = Sub("product");
    EXPECT_EQ(0, configstore::SetValueStr(product, "forwarding_class", className));
    EXPECT_EQ(0, configstore::SetValueStr(product, "version", version));
    EXPECT_EQ(0, configstore::SetValueBool(object, "ovl_enabled", overlay));
}

int32_t ConverterTest::Save(uint32_t propClass, const std::string &key, const std::vector<uint8_t> &value) {
    // A null block for an empty value, as a list returns it.
    const std::unique_ptr<uint8_t[]> block(value.empty() ? nullptr : new uint8_t[value.size()]);
    if (block) std::memcpy(block.get(), value.data(), value.size());
    return SaveProp(object, key.c_str(), block.get(), static_cast<uint32_t>(value.size()), propClass, 0x20);
}

Properties ConverterTest::Load(uint32_t propClass, configstore::Object *trafficResources) {
    Properties properties;
    DVSData *handle = nullptr;
    EXPECT_EQ(HYP_OK, DVSData_Alloc(&handle, Allocate, std::free));
    const List outer(handle);
    loadStatus = LoadProps("props", object, handle, propClass, 9, trafficResources);
    DVSDataEntry *entry = nullptr;
    if (DVSData_Lookup(handle, "props", &entry) != HYP_OK) return properties;
    DVSData *innerHandle = nullptr;
    EXPECT_EQ(HYP_OK, DVSData_Deserialize(&innerHandle, entry->data, entry->dataLen, Allocate, std::free));
    const List inner(innerHandle);
    for (const DVSDataEntry *each = innerHandle->head; each; each = each->next) {
        // Unmapped properties keep their saved type.
        if (std::strcmp(each->name, "DEFAULT") != 0) {
            EXPECT_EQ(16u, each->propType) << each->name;
        }
        properties[each->name].assign(each->data, each->data + each->dataLen);
    }
    return properties;
}

std::optional<std::vector<uint8_t>> ConverterTest::LoadOne(uint32_t propClass, const std::string &key) {
    const Properties properties = Load(propClass);
    const auto found = properties.find(key);
    if (found == properties.end()) return std::nullopt;
    return found->second;
}

std::string ConverterTest::Dump() const {
    std::istringstream lines(fake_store::Dump(object));
    std::string kept;
    for (std::string line; std::getline(lines, line);) {
        if (line == " {}" || line.starts_with("/product") || line.starts_with("/ovl_enabled")) continue;
        kept += line + "\n";
    }
    return kept;
}

configstore::Object *ConverterTest::Sub(const std::string &path) {
    configstore::Object *current = object;
    std::istringstream names(path);
    for (std::string name; std::getline(names, name, '/');) {
        std::string id;
        if (const auto bracket = name.find('['); bracket != std::string::npos) {
            id = name.substr(bracket + 1, name.size() - bracket - 2);
            name.resize(bracket);
        }
        configstore::Object *next = nullptr;
        EXPECT_EQ(0, GetOrCreateSubObject(true, current, name.c_str(), id.c_str(), &next)) << path;
        current = next;
    }
    return current;
}

} // namespace converter_test
