/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_ROUND_TRIP_RULES_H
#define TESTS_CONFIGSTORE_ROUND_TRIP_RULES_H

// The rules by which a state changes when it is saved into the store and loaded back: each has a name, and
// docs/config-store.md has a row for each name ("What a round trip changes"). The model (model.h) says which
// of them apply where; a ledger counts, so that a rule that nothing ever meets is found.

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

/// The name that the documentation has.
const char *NameOf(Rule rule);

/// How often each rule applied.
class Ledger {
public:
    void Note(Rule rule) { ++count_[rule]; }
    void Add(const Ledger &other);
    /// The names of the rules that never did.
    [[nodiscard]] std::vector<std::string> Idle() const;

private:
    std::map<Rule, uint64_t> count_;
};

} // namespace round_trip

#endif
