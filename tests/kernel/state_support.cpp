/* SPDX-License-Identifier: Apache-2.0 */
// Building and reading states for the kernel interface's tests.

#include "kernel/state_support.h"

#include <cstdlib>

#include <gtest/gtest.h>

namespace dvs::test {

bool TableIsEmpty() {
    bool empty = true;
    DVSState_SwitchForEach([](DVSwitch *, void *arg) { return *static_cast<bool *>(arg) = false, true; },
                           &empty);
    return empty;
}

std::vector<Entry> Entries(DVSData *list) {
    std::vector<Entry> entries;
    DVSDataEntry *entry = nullptr;
    while (DVSData_Next(list, entry, &entry) == HYP_OK) {
        void *data = nullptr;
        const uint32_t size = DVSData_Data(entry, &data);
        entries.push_back({DVSData_Name(entry), std::string(static_cast<const char *>(data), size),
                           DVSData_PropType(entry)});
    }
    return entries;
}

std::vector<std::string> EntryNames(DVSData *list) {
    std::vector<std::string> names;
    if (!list) return names;
    for (const Entry &entry : Entries(list))
        names.push_back(entry.name);
    return names;
}

StateBuilder::StateBuilder() {
    EXPECT_TRUE(TableIsEmpty());
}

StateBuilder &StateBuilder::Switch(const std::string &id, const std::string &className, uint32_t version) {
    EXPECT_EQ(DVSState_SwitchAdd(id.c_str(), className.c_str(), 0, version), HYP_OK);
    return *this;
}

StateBuilder &StateBuilder::Global(const std::string &id, const std::string &name, const std::string &value,
                                   uint32_t type) {
    DVSwitch *sw = DVSState_SwitchFind(id.c_str());
    EXPECT_EQ(DVSData_Append(sw->globalPropList, name.c_str(), value.data(),
                             static_cast<uint32_t>(value.size()), type),
              HYP_OK);
    return *this;
}

StateBuilder &StateBuilder::Host(const std::string &id, const std::string &name, const std::string &value,
                                 uint32_t type) {
    DVSwitch *sw = DVSState_SwitchFind(id.c_str());
    EXPECT_EQ(DVSData_Append(sw->hostPropList, name.c_str(), value.data(),
                             static_cast<uint32_t>(value.size()), type),
              HYP_OK);
    return *this;
}

StateBuilder &StateBuilder::Port(const std::string &id, const std::string &port, const Pairs &pairs,
                                 uint32_t kind) {
    const std::string data = PortData(pairs, kind);
    EXPECT_EQ(
        DVSState_PortDeserialize(id.c_str(), port.c_str(), data.data(), static_cast<uint32_t>(data.size())),
        HYP_OK);
    return *this;
}

std::string StateBuilder::Serialize() {
    void *out = nullptr;
    uint32_t size = 0;
    EXPECT_EQ(DVSState_ConfigSerialize(&out, &size), HYP_OK);
    std::string state(static_cast<const char *>(out), size);
    std::free(out);
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
    return state;
}

LoadedState::LoadedState(const std::string &state) {
    EXPECT_TRUE(TableIsEmpty());
    status = DVSState_ConfigDeserialize(state.data(), static_cast<uint32_t>(state.size()));
}

LoadedState::~LoadedState() {
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
}

std::vector<std::string> LoadedState::Switches() const {
    std::vector<std::string> ids;
    DVSState_SwitchForEach(
        [](DVSwitch *sw, void *arg) {
            static_cast<std::vector<std::string> *>(arg)->emplace_back(DVS_SwitchId(sw));
            return false;
        },
        &ids);
    return ids;
}

std::vector<std::string> LoadedState::Ports(const char *sw) const {
    std::vector<std::string> ids;
    DVSState_PortForEach(
        DVSState_SwitchFind(sw),
        [](DVSPort *port, void *arg) {
            static_cast<std::vector<std::string> *>(arg)->emplace_back(DVS_PortId(port));
            return false;
        },
        &ids);
    return ids;
}

std::vector<std::string> LoadedState::GlobalNames(const char *sw) const {
    return EntryNames(DVSState_SwitchFind(sw)->globalPropList);
}

std::vector<std::string> LoadedState::HostNames(const char *sw) const {
    return EntryNames(DVSState_SwitchFind(sw)->hostPropList);
}

std::vector<std::string> LoadedState::PortDataNames(const char *sw, const char *port) const {
    return EntryNames(DVSState_PortFind(sw, port)->portData);
}

} // namespace dvs::test
