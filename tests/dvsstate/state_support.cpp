/* SPDX-License-Identifier: Apache-2.0 */
// Helpers declared in state_support.h, built on the exported interface and the port table's worker.

#include "dvsstate/state_support.h"

#include <cstdlib>
#include <cstring>

#include "dvs/log.h"
#include "dvsstate/port_table.h"
#include "platform/embedded/host_limits.h"

namespace dvs::test {

StateTest::StateTest() {
    SetHostPorts(0);
    uwMaxNumActivePortsSystemWide = 0;
}

StateTest::~StateTest() {
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
    EXPECT_EQ(HostPortCount(), 0u);
}

void SetHostPorts(std::uint32_t ports) {
    DVSHost_SetMaxPorts(ports);
}

DVSwitch *AddSwitch(const std::string &id, std::uint32_t version) {
    EXPECT_EQ(DVSState_SwitchAdd(id.c_str(), "vswitch", 1, version), HYP_OK);
    return DVSState_SwitchFind(id.c_str());
}

DVSwitch *AddLimitedSwitch(const std::string &id, std::uint32_t maxPorts, std::uint32_t version) {
    EXPECT_EQ(DVSState_SwitchAdd(id.c_str(), "other", maxPorts, version), HYP_OK);
    return DVSState_SwitchFind(id.c_str());
}

DVSData *HeapList(const Props &props) {
    DVSData *list = nullptr;
    EXPECT_EQ(DVSData_Alloc(&list, std::malloc, std::free), HYP_OK);
    for (const Prop &prop : props)
        Append(list, prop);
    return list;
}

DVSPort *AddPort(DVSwitch *sw, const std::string &id, std::uint32_t kind, const Props &props) {
    DVSPort *port = nullptr;
    EXPECT_EQ(state::DVSStatePortAdd(sw, id.c_str(), HeapList(props), kind, &port), HYP_OK);
    return port;
}

HYP_ReturnStatus TryAddPort(DVSwitch *sw, const std::string &id, std::uint32_t kind, DVSPort **existing) {
    DVSData *list = HeapList();
    const HYP_ReturnStatus status = state::DVSStatePortAdd(sw, id.c_str(), list, kind, existing);
    if (status != HYP_OK) DVSData_Free(list);
    return status;
}

std::vector<std::string> PortsOf(DVSwitch *sw) {
    std::vector<std::string> ports;
    DVSState_PortForEach(
        sw,
        [](DVSPort *port, void *arg) {
            static_cast<std::vector<std::string> *>(arg)->push_back(std::string(DVS_PortId(port)) + "/" +
                                                                    std::to_string(port->portType));
            return false;
        },
        &ports);
    return ports;
}

std::vector<std::string> SwitchIds() {
    std::vector<std::string> ids;
    DVSState_SwitchForEach(
        [](DVSwitch *sw, void *arg) {
            static_cast<std::vector<std::string> *>(arg)->emplace_back(DVS_SwitchId(sw));
            return false;
        },
        &ids);
    return ids;
}

std::uint32_t HostPortCount() {
    return state::numPortsInUseHostWide;
}

namespace {

Buffer Taken(HYP_ReturnStatus status, void *buf, std::uint32_t len) {
    EXPECT_EQ(status, HYP_OK);
    if (!buf) return {};
    const auto *bytes = static_cast<const std::uint8_t *>(buf);
    Buffer copy(bytes, bytes + len);
    std::free(buf);
    return copy;
}

} // namespace

Buffer StateBytes() {
    void *buf = nullptr;
    std::uint32_t len = 0;
    const HYP_ReturnStatus status = DVSState_ConfigSerialize(&buf, &len);
    return Taken(status, buf, len);
}

Buffer SwitchBytes(DVSwitch *sw) {
    void *buf = nullptr;
    std::uint32_t len = 0;
    const HYP_ReturnStatus status = DVSState_SwitchSerialize(sw, &buf, &len);
    return Taken(status, buf, len);
}

Buffer PortBytes(DVSPort *port) {
    void *buf = nullptr;
    std::uint32_t len = 0;
    const HYP_ReturnStatus status = DVSState_PortSerialize(port, &buf, &len);
    return Taken(status, buf, len);
}

HYP_ReturnStatus LoadState(std::span<const std::uint8_t> bytes) {
    const ExactBlock block(bytes);
    return DVSState_ConfigDeserialize(block.data(), block.size());
}

Props SwitchProps(std::uint32_t version, const std::string &className, std::uint32_t maxPorts) {
    std::string classField = className;
    classField.resize(128);
    return {{"switchVersion", U32Value(version), 0x10},
            {"className", classField, 0x10},
            {"maxPorts", U32Value(maxPorts), 0x10}};
}

std::string AsText(const Buffer &buffer) {
    return {buffer.begin(), buffer.end()};
}

void BuildExample() {
    DVSwitch *first = AddSwitch("50 1e 3c 2d 44 7a 10 9b-c8 5d 21 66 90 0f ab 77", 12);
    Append(first->globalPropList, {"com.orbeno.common.alias", std::string("dvs-prod\0", 9)});
    Append(first->globalPropList, {"com.orbeno.etherswitch.mtu", U32Value(9000), 0x24});
    Append(first->hostPropList, {"com.orbeno.common.host.portset", std::string("DvsPortset-0\0", 13), 0x18});
    AddPort(
        first, "100", DVS_PORT_ACTIVE,
        {{"com.orbeno.common.port.alias", std::string("uplink1\0", 8)}, {"com.orbeno.opaque", "\1\2\3", 8}});
    AddPort(first, "101", DVS_PORT_SHADOW, {{"com.orbeno.common.port.alias", std::string("web\0", 4)}});
    AddPort(first, "102", DVS_PORT_ZOMBIE);
    AddPort(first, "102", DVS_PORT_ZOMBIE, {{"second", "x"}});
    AddPort(first, "103", DVS_PORT_LOCAL_CACHE);
    DVSwitch *second = AddLimitedSwitch("second", 8, 100);
    AddPort(second, "1");
    AddPort(second, "2", DVS_PORT_ACTIVE, {{"empty", ""}});
}

StateMessages::StateMessages(std::int32_t stateLevel, std::int32_t dataLevel) {
    dvs_debug = stateLevel;
    dvsdata_debug = dataLevel;
    DVSLog_SetSink([](int, const char *text,
                      void *arg) { static_cast<StateMessages *>(arg)->texts_.emplace_back(text); },
                   this);
}

StateMessages::~StateMessages() {
    DVSLog_SetSink(nullptr, nullptr);
    dvs_debug = dvsdata_debug = -1;
}

} // namespace dvs::test
