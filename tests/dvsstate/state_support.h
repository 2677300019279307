/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSSTATE_STATE_SUPPORT_H
#define TESTS_DVSSTATE_STATE_SUPPORT_H

// Helpers of the switch state's tests: switches and ports made in one line, whole states as bytes, captured
// messages. ctest runs each test in a process of its own; the fixture empties the table for those who run a
// whole program.

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "dvs/state.h"
#include "dvsdata/list_support.h"

namespace dvs::test {

constexpr std::uint32_t kVersion = 9;

/// Starts and ends with an empty table and a host limit that was not read yet. Suites are named by
/// `using SwitchTable = dvs::test::StateTest;`.
class StateTest : public testing::Test {
protected:
    StateTest();
    ~StateTest() override;
};

/// Sets the host-wide limit before the first switch reads it.
void SetHostPorts(std::uint32_t ports);

/// A switch of class "vswitch" that must be accepted.
DVSwitch *AddSwitch(const std::string &id, std::uint32_t version = kVersion);
/// One held to `maxPorts`.
DVSwitch *AddLimitedSwitch(const std::string &id, std::uint32_t maxPorts, std::uint32_t version = kVersion);

/// A list on the process heap.
DVSData *HeapList(const Props &props = {});
/// A port that must be accepted.
DVSPort *AddPort(DVSwitch *sw, const std::string &id, std::uint32_t kind = DVS_PORT_ACTIVE,
                 const Props &props = {});
HYP_ReturnStatus TryAddPort(DVSwitch *sw, const std::string &id, std::uint32_t kind = DVS_PORT_ACTIVE,
                            DVSPort **existing = nullptr);
/// The ids of a switch's ports in slot order, each with its kind: "p1/1".
std::vector<std::string> PortsOf(DVSwitch *sw);
std::vector<std::string> SwitchIds();
std::uint32_t HostPortCount();

/// What a serialization hands out, which must succeed.
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

/// Collects messages of the switch state and of property lists, at debug levels of their own, while it lives.
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
