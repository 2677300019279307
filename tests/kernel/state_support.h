/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_KERNEL_STATE_SUPPORT_H
#define TESTS_KERNEL_STATE_SUPPORT_H

// States for the fake module to serve, built in the process's own table. The table is emptied afterwards.

#include <string>
#include <vector>

#include "dvs/dvs.h"
#include "emulator/hyp_support.h"

namespace dvs::test {

/// True when the switch table holds nothing.
bool TableIsEmpty();

/// One entry of a property list.
struct Entry {
    std::string name;
    std::string value;
    uint32_t type;
    bool operator==(const Entry &) const = default;
};

/// A list's entries in order.
std::vector<Entry> Entries(DVSData *list);

/// Their names only.
std::vector<std::string> EntryNames(DVSData *list);

class StateBuilder {
public:
    StateBuilder();
    StateBuilder &Switch(const std::string &id, const std::string &className = "vswitch",
                         uint32_t version = 110);
    StateBuilder &Global(const std::string &id, const std::string &name, const std::string &value,
                         uint32_t type = 16);
    StateBuilder &Host(const std::string &id, const std::string &name, const std::string &value,
                       uint32_t type = 16);
    StateBuilder &Port(const std::string &id, const std::string &port, const Pairs &pairs = {},
                       uint32_t kind = 1);

    /// The state, or the state of one switch. Empties the table.
    std::string Serialize();
};

/// Keeps a serialized state loaded in the table while it lives.
class LoadedState {
public:
    explicit LoadedState(const std::string &state);
    ~LoadedState();
    HYP_ReturnStatus status;

    std::vector<std::string> Switches() const;
    std::vector<std::string> Ports(const char *sw) const;
    std::vector<std::string> GlobalNames(const char *sw) const;
    std::vector<std::string> HostNames(const char *sw) const;
    std::vector<std::string> PortDataNames(const char *sw, const char *port) const;
};

} // namespace dvs::test

#endif
