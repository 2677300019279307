/* SPDX-License-Identifier: Apache-2.0 */
#ifndef BENCH_PORT_SETTINGS_H
#define BENCH_PORT_SETTINGS_H

// Two kinds of ports for store_bench, of twelve settings each: what a host mostly has, and the settings whose
// values are records that converters take apart.

#include <cstdint>
#include <string>
#include <vector>

namespace store_bench {

struct Setting {
    const char *key;
    std::string value;
    uint32_t type = 0x20;
};

struct PortKind {
    const char *name;
    std::vector<Setting> (*settings)(int port, int version);
};

inline constexpr std::size_t kSettingsOfAPort = 12;

/// Texts, numbers, flags and small records. `version` makes one setting differ.
std::vector<Setting> UsualSettings(int port, int version);

/// A VLAN trunk, a teaming policy, shaping both ways, MAC security, filters, link aggregation, a mirror
/// session, and what such a port has besides.
std::vector<Setting> StructuredSettings(int port, int version);

inline constexpr PortKind kPortKinds[] = {{"usual", UsualSettings}, {"structured", StructuredSettings}};

} // namespace store_bench

#endif
