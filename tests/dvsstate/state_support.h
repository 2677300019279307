/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSSTATE_STATE_SUPPORT_H
#define TESTS_DVSSTATE_STATE_SUPPORT_H

// Helpers of the switch state's tests: switches and ports made in one line, whole states as bytes, captured
// messages. ctest runs each test in its own process; the fixture empties the table for runs of a whole
// program.

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "dvs/state.h"
#include "dvsdata/list_support.h"

namespace dvs::test {

constexpr std::uint32_t kVersion = 9;

/// Starts and ends with an empty table and an unread host limit. Name a suite with
/// `using SwitchTable = dvs::test::StateTest;`.
class StateTest : public testing::Test {
protected:
    StateTest();
    ~StateTest() override;
};

/// Sets the host-wide limit before the first switch reads it.
void SetHostPorts(std::uint32_t ports);

/// Adds a switch of class "vswitch"; the add must succeed.
DVSwitch *AddSwitch(const std::string &id, std::uint32_t version = kVersion);
/// The same, limited to `maxPorts`.
DVSwitch *AddLimitedSwitch(const std::string &id, std::uint32_t maxPorts, std::uint32_t version = kVersion);

/// A list on the process heap.
DVSData *HeapList(const Props &props = {});
/// Adds a port; the add must succeed.
DVSPort *AddPort(DVSwitch *sw, const std::string &id, std::uint32_t kind = DVS_PORT_ACTIVE,
                 const Props &props = {});
HYP_ReturnStatus TryAddPort(DVSwitch *sw, const std::string &id, std::uint32_t kind = DVS_PORT_ACTIVE,
                            DVSPort **existing = nullptr);
/// The ids of a switch's ports in slot order, each with its kind: "p1/1".
std::vector<std::string> PortsOf(DVSwitch *sw);
std::vector<std::string> SwitchIds();
std::uint32_t HostPortCount();

/// The result of a serialization; it must succeed.
Buffer StateBytes();
Buffer SwitchBytes(DVSwitch *sw);
Buffer PortBytes(DVSPort *port);
HYP_ReturnStatus LoadState(std::span<const std::uint8_t> bytes);

/// A switch buffer with the three fields and any further entries.
Props SwitchProps(std::uint32_t version = kVersion, const std::string &className = "vswitch",
                  std::uint32_t maxPorts = 64);
std::string AsText(const Buffer &buffer);

/// Two switches of different classes, seven ports of every kind, properties of several types.
void BuildExample();

/// Collects the messages of the switch state and of property lists, each at its own level, while it lives.
class StateMessages {
public:
    explicit StateMessages(std::int32_t stateLevel, std::int32_t dataLevel = -1);
    ~StateMessages();
    StateMessages(const StateMessages &) = delete;
    StateMessages &operator=(const StateMessages &) = delete;

    const std::vector<std::string> &All() const { return texts_; }
    std::vector<std::string> Take() { return std::exchange(texts_, {}); }

private:
    std::vector<std::string> texts_;
};

} // namespace dvs::test

#endif
