/* SPDX-License-Identifier: Apache-2.0 */
#ifndef BENCH_PORT_SETTINGS_H
#define BENCH_PORT_SETTINGS_H

// Two kinds of ports for store_bench, with twelve settings each: typical settings, and settings whose values
// are records that need converters.

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

/// Texts, numbers, flags and small records. One setting depends on `version`.
std::vector<Setting> UsualSettings(int port, int version);

/// A VLAN trunk, a teaming policy, shaping in both directions, MAC security, filters, link aggregation, a
/// mirror session, and the usual settings of such a port.
std::vector<Setting> StructuredSettings(int port, int version);

inline constexpr PortKind kPortKinds[] = {{"usual", UsualSettings}, {"structured", StructuredSettings}};

} // namespace store_bench

#endif
