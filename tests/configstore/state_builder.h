/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_STATE_BUILDER_H
#define TESTS_CONFIGSTORE_STATE_BUILDER_H

// Converts plain descriptions to state buffers and back, for tests of saving and loading.

#include <cstdint>
#include <string>
#include <vector>

namespace state_builder {

using Bytes = std::vector<uint8_t>;

Bytes U32(uint32_t number);
/// The text with its NUL.
Bytes Text(const std::string &text);
/// The text without a NUL.
Bytes Raw(const std::string &text);
Bytes operator+(Bytes left, const Bytes &right);
/// Padded with zeroes to `size`.
Bytes Slot(const std::string &text, std::size_t size);

struct Prop {
    std::string key;
    Bytes value;
    uint32_t type = 0x10;
    bool operator==(const Prop &) const = default;
};
using Props = std::vector<Prop>;

struct Port {
    std::string id;
    Props props;
    bool operator==(const Port &) const = default;
};

struct Switch {
    std::string id;
    std::string className = "etherswitch";
    uint32_t version = 9;
    uint32_t maxPorts = 64;
    Props global, host;
    std::vector<Port> ports;
    Bytes classField = {}; ///< the class name's whole field; filled in by Parse only
};

/// The version property, without which no saved switch can be loaded.
Prop Version(uint32_t version = 9);
Prop Alias(const std::string &name);

/// A state buffer of these switches.
Bytes State(const std::vector<Switch> &switches);
/// The switches of a state buffer; fails the test if the buffer is malformed.
std::vector<Switch> Parse(const Bytes &state);
/// The entries of one serialized list.
Props ParseList(const Bytes &list);

/// The property of this key; if absent, fails the test and returns an empty one.
Prop Find(const Props &props, const std::string &key);
bool Has(const Props &props, const std::string &key);

} // namespace state_builder

#endif
