/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_ROUND_TRIP_RULES_H
#define TESTS_CONFIGSTORE_ROUND_TRIP_RULES_H

// The rules that describe how a save and a load change a state. Each has a name, and docs/config-store.md has
// a row for each name ("What a round trip changes"). The model (model.h) says where each applies; a ledger
// counts them, so that a test finds rules that never apply.

#include <cstdint>
#include <map>
#include <span>
#include <string>
#include <vector>

namespace round_trip {

enum class Rule : uint8_t {
    kRowOrder,
    kTypeWord,
    kUntypedIsDropped,
    kSwitchesById,
    kClassNameIsText,
    kHostLimit,
    kVersionIsTheProperty,
    kPortsAreActive,
    kOnePortOfAnId,
    kUnnamedIsUnknown,
    kLastOneSaved,
    kMtuUnderEveryKey,
    kKeyOfTheFamily,
    kPrivateVlanKey,
    kOverlayVersion,
    kBooleanText,
    kBooleanByte,
    kPassthrough,
    kIpfixOff,
    kTextEnds,
    kSlotEnds,
    kBytesBehindNumber,
    kUnusedBytes,
    kUnknownBits,
    kEmptyIsGone,
    kAddressEnds,
    kHealthCheckOff,
    kNoVswitchPolicy,
    kExplicitPolicies,
    kNamelessPolicy,
    kFoundCriteria,
    kLostCriteria,
    kTransmitUplink,
    kVlanFields,
    kEmptyTrunk,
    kPriorityVlan,
    kShapingRange,
    kFilterNumbers,
    kFilterFailure,
    kFilterPlaces,
    kPoolsOfTheSwitch,
    kPacketLength,
    kNormalTraffic,
    kLegacyMode,
    kEncapsulationVlan,
    kConnectees,
    kSessionGroups,
    kSessionPorts,
    kSessionHead,
    kPortTotal,
    kPortOtherData,
    kCount,
};

/// The rule's name in the documentation.
const char *NameOf(Rule rule);

/// How often each rule applied.
class Ledger {
public:
    void Note(Rule rule) { ++count_[rule]; }
    void Add(const Ledger &other);
    /// The names of the rules that never applied.
    [[nodiscard]] std::vector<std::string> Idle() const;

private:
    std::map<Rule, uint64_t> count_;
};

} // namespace round_trip

#endif
