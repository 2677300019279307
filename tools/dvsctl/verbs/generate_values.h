/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_VERBS_GENERATE_VALUES_H
#define DVSCTL_VERBS_GENERATE_VALUES_H

// The property values of `dvsctl generate`: for every mapped key a row that says who has it and draws its
// typed form. What the values of one switch have to agree on (uplinks, VLANs, pools) is drawn first and kept
// with it.

#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <vector>

#include <boost/json/array.hpp>
#include <boost/json/value.hpp>

namespace dvs::ctl {

/// SplitMix64: small, and the same on every machine, unlike the standard library's distributions.
class Random {
public:
    explicit Random(std::uint64_t seed) : state_(seed) {}
    std::uint64_t Next() {
        std::uint64_t z = (state_ += 0x9e3779b97f4a7c15);
        z = (z ^ (z >> 30)) * 0xbf58476d1ce4e5b9;
        z = (z ^ (z >> 27)) * 0x94d049bb133111eb;
        return z ^ (z >> 31);
    }
    std::uint32_t Below(std::uint32_t bound) { return static_cast<std::uint32_t>(Next() % bound); }
    std::uint32_t Between(std::uint32_t low, std::uint32_t high) { return low + Below(high - low + 1); }
    bool Percent(std::uint32_t chance) { return Below(100) < chance; }
    const char *OneOf(std::initializer_list<const char *> texts) {
        return texts.begin()[Below(static_cast<std::uint32_t>(texts.size()))];
    }

private:
    std::uint64_t state_;
};

/// What a switch is, and what its values agree on.
struct SwitchPlan {
    std::uint32_t number = 0; ///< of the switch, from 0
    std::string_view className;
    std::uint32_t version = 0;
    std::string versionText;              ///< as the store has it
    std::vector<std::string> ports;       ///< ids; the first are the uplinks'
    std::uint32_t uplinks = 0;            ///< number of uplink ports
    std::vector<std::string> uplinkNames; ///< of the uplinks and of the link aggregation group's
    std::uint32_t mtu = 0;
    boost::json::array pools;                ///< typed form; the uplinks carry the same
    std::vector<std::uint32_t> privateVlans; ///< primary ids; the secondary ones are the next two
};

/// Class and version of what is generated without an option that says otherwise: by turns.
struct SwitchSort {
    std::string_view className;
    std::uint32_t version;
};
SwitchSort SortOf(std::uint32_t number);

/// "7.0.2" of 8; empty for a number that no switch has.
std::string VersionText(std::uint32_t version);

SwitchPlan PlanSwitch(Random &random, std::uint32_t number, SwitchSort sort, std::uint32_t ports);

/// One property in its typed form.
struct TypedProperty {
    std::string_view name;
    boost::json::value typed;
};

/// The properties of a switch's own lists, all that its class and version have.
std::vector<TypedProperty> DrawSwitchProperties(Random &random, const SwitchPlan &plan,
                                                std::uint32_t propClass);

/// The properties of a port, by its place in the plan. Not every port has everything; over eight ports
/// behind the uplinks every key is there.
std::vector<TypedProperty> DrawPortProperties(Random &random, const SwitchPlan &plan, std::uint32_t port);

/// What one may write for a mapped key, the same each time. Of a key without a row, null.
boost::json::value ExampleOf(std::string_view key);

} // namespace dvs::ctl

#endif
