/* SPDX-License-Identifier: Apache-2.0 */
// The names of the rules of a round trip (rules.h).

#include "configstore/round_trip/rules.h"

#include <iterator>

namespace round_trip {
namespace {

struct Row {
    Rule rule;
    const char *name;
};

// In the order of the enumeration.
constexpr Row kRows[] = {
    {Rule::kRowOrder, "row-order"},
    {Rule::kTypeWord, "type-word"},
    {Rule::kUntypedIsDropped, "untyped-is-dropped"},
    {Rule::kSwitchesById, "switches-by-id"},
    {Rule::kClassNameIsText, "class-name-is-text"},
    {Rule::kHostLimit, "host-limit"},
    {Rule::kVersionIsTheProperty, "version-is-the-property"},
    {Rule::kPortsAreActive, "ports-are-active"},
    {Rule::kOnePortOfAnId, "one-port-of-an-id"},
    {Rule::kUnnamedIsUnknown, "unnamed-is-unknown"},
    {Rule::kLastOneSaved, "last-one-saved"},
    {Rule::kMtuUnderEveryKey, "mtu-under-every-key"},
    {Rule::kKeyOfTheFamily, "key-of-the-family"},
    {Rule::kPrivateVlanKey, "private-vlan-key"},
    {Rule::kOverlayVersion, "overlay-version"},
    {Rule::kBooleanText, "boolean-text"},
    {Rule::kBooleanByte, "boolean-byte"},
    {Rule::kPassthrough, "passthrough"},
    {Rule::kIpfixOff, "ipfix-off"},
    {Rule::kTextEnds, "text-ends"},
    {Rule::kSlotEnds, "slot-ends"},
    {Rule::kBytesBehindNumber, "bytes-behind-number"},
    {Rule::kUnusedBytes, "unused-bytes"},
    {Rule::kUnknownBits, "unknown-bits"},
    {Rule::kEmptyIsGone, "empty-is-gone"},
    {Rule::kAddressEnds, "address-ends"},
    {Rule::kHealthCheckOff, "health-check-off"},
    {Rule::kNoVswitchPolicy, "no-vswitch-policy"},
    {Rule::kExplicitPolicies, "explicit-policies"},
    {Rule::kNamelessPolicy, "nameless-policy"},
    {Rule::kFoundCriteria, "found-criteria"},
    {Rule::kLostCriteria, "lost-criteria"},
    {Rule::kTransmitUplink, "transmit-uplink"},
    {Rule::kVlanFields, "vlan-fields"},
    {Rule::kEmptyTrunk, "empty-trunk"},
    {Rule::kPriorityVlan, "priority-vlan"},
    {Rule::kShapingRange, "shaping-range"},
    {Rule::kFilterNumbers, "filter-numbers"},
    {Rule::kFilterFailure, "filter-failure"},
    {Rule::kFilterPlaces, "filter-places"},
    {Rule::kPoolsOfTheSwitch, "pools-of-the-switch"},
    {Rule::kPacketLength, "packet-length"},
    {Rule::kNormalTraffic, "normal-traffic"},
    {Rule::kLegacyMode, "legacy-mode"},
    {Rule::kEncapsulationVlan, "encapsulation-vlan"},
    {Rule::kConnectees, "connectees"},
    {Rule::kSessionGroups, "session-groups"},
    {Rule::kSessionPorts, "session-ports"},
    {Rule::kSessionHead, "session-head"},
    {Rule::kPortTotal, "port-total"},
    {Rule::kPortOtherData, "port-other-data"},
};

constexpr bool InOrder() {
    for (std::size_t i = 0; i < std::size(kRows); ++i) {
        if (kRows[i].rule != static_cast<Rule>(i)) return false;
    }
    return std::size(kRows) == static_cast<std::size_t>(Rule::kCount);
}
static_assert(InOrder());

} // namespace

const char *NameOf(Rule rule) {
    return kRows[static_cast<std::size_t>(rule)].name;
}

void Ledger::Add(const Ledger &other) {
    for (const auto &[rule, count] : other.count_)
        count_[rule] += count;
}

std::vector<std::string> Ledger::Idle() const {
    std::vector<std::string> idle;
    for (const Row &row : kRows) {
        if (!count_.contains(row.rule)) idle.emplace_back(row.name);
    }
    return idle;
}

} // namespace round_trip
