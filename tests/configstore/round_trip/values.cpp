/* SPDX-License-Identifier: Apache-2.0 */
// The steps of a round trip for each value (values.h). A table names the steps of each converter type. A step
// may change the value; its rule counts if it does.

#include "configstore/round_trip/values.h"

#include <algorithm>
#include <cstring>

namespace round_trip {

using dvs::ConverterType;
using enum dvs::ConverterType;


uint32_t NumberAt(const Value &value, std::size_t at, std::size_t width) {
    uint32_t number = 0;
    for (std::size_t i = 0; i < width; ++i)
        number |= uint32_t{value.at(at + i)} << (8 * i);
    return number;
}

std::string TextAt(const Value &value, std::size_t at, std::size_t most) {
    const std::size_t end = std::min(value.size(), at + most);
    std::string text;
    for (; at < end && value[at]; ++at)
        text += static_cast<char>(value[at]);
    return text;
}

namespace {

void PutNumber(Value *value, std::size_t at, uint32_t number, std::size_t width = 4) {
    for (std::size_t i = 0; i < width; ++i)
        value->at(at + i) = static_cast<uint8_t>(number >> (8 * i));
}
void Clear(Value *value, std::size_t at, std::size_t size) {
    std::fill_n(value->begin() + static_cast<std::ptrdiff_t>(at), size, uint8_t{0});
}
// Clears a slot's bytes after the NUL of its text.
void ClearTail(Value *value, std::size_t at, std::size_t size) {
    const std::size_t text = TextAt(*value, at, size).size();
    Clear(value, at + text, size - text);
}
bool Starts(const Value &value, const char *text) {
    const std::size_t size = std::strlen(text) + 1;
    return value.size() >= size && std::memcmp(value.data(), text, size) == 0;
}
void Become(Value *value, const char *bytes, std::size_t size) {
    value->assign(bytes, bytes + size);
}

using Apply = bool (*)(Value *value, const Surroundings &around);

bool CutNumber(Value *value, const Surroundings &) {
    value->resize(4);
    return true;
}
bool CutText(Value *value, const Surroundings &) {
    value->resize(TextAt(*value, 0, value->size()).size());
    value->push_back(0);
    return true;
}
template <std::size_t... At> bool BoolAt(Value *value, const Surroundings &) {
    ((value->at(At) = value->at(At) != 0), ...);
    return true;
}
template <std::size_t At, std::size_t Size> bool ClearAt(Value *value, const Surroundings &) {
    Clear(value, At, Size);
    return true;
}
template <std::size_t At, uint32_t Bits> bool KeepBits(Value *value, const Surroundings &) {
    PutNumber(value, At, NumberAt(*value, At) & Bits);
    return true;
}

// "true" has its NUL, and in most properties an extra byte; "false" has none.
template <std::size_t TrueSize> bool TrueOrFalse(Value *value, const Surroundings &) {
    if (Starts(*value, "true"))
        Become(value, "true\0f", TrueSize);
    else
        Become(value, "false", 5);
    return true;
}
bool OnlyTwoIsAllowed(Value *value, const Surroundings &) {
    PutNumber(value, 0, NumberAt(*value, 0) == 2 ? 2 : 0);
    return true;
}
bool IsEnabled(Value *value, const Surroundings &) {
    return Starts(*value, "enabled");
}
bool EightBytes(Value *value, const Surroundings &) {
    value->resize(8);
    return true;
}

bool HasCount(Value *value, const Surroundings &) {
    return NumberAt(*value, 0) != 0;
}
template <std::size_t Slot> bool ClearSlots(Value *value, const Surroundings &) {
    for (std::size_t at = 4; at + Slot <= value->size(); at += Slot)
        ClearTail(value, at, Slot);
    return true;
}

bool VersionOfText(Value *value, const Surroundings &around) {
    uint32_t number = NumberAt(*value, 0);
    if (number > 100) number -= 100;
    if (around.isOverlay && number >= 7 && number <= 12) number += 100;
    PutNumber(value, 0, number);
    return true;
}

bool HasPrivateVlans(Value *value, const Surroundings &) {
    return value->size() >= 8;
}
bool WholePrivateVlans(Value *value, const Surroundings &) {
    value->resize(value->size() / 8 * 8);
    for (std::size_t at = 0; at < value->size(); at += 8)
        Clear(value, at + 5, 3);
    return true;
}

bool Ipv4Alone(Value *value, const Surroundings &) {
    if (!value->at(31)) Clear(value, 12, 12);
    return true;
}

bool PoolTexts(Value *value, const Surroundings &) {
    for (std::size_t at = 4; at < value->size(); at += 212)
        ClearTail(value, at, 128);
    return true;
}
bool PoolGaps(Value *value, const Surroundings &) {
    for (std::size_t at = 4; at < value->size(); at += 212) {
        Clear(value, at + 128, 1);
        Clear(value, at + 133, 67);
        Clear(value, at + 208, 4);
    }
    return true;
}
bool GroupTexts(Value *value, const Surroundings &) {
    for (std::size_t at = 4; at < value->size(); at += 93) {
        ClearTail(value, at, 65);
        ClearTail(value, at + 65, 16);
    }
    return true;
}

bool SwapExplicit(Value *value, const Surroundings &) {
    const uint32_t policy = NumberAt(*value, 0);
    if (policy == 4 || policy == 5) PutNumber(value, 0, 9 - policy);
    return true;
}
bool NamedPolicy(Value *value, const Surroundings &) {
    if (NumberAt(*value, 0) > 5) PutNumber(value, 0, 0);
    return true;
}
bool CriteriaFound(Value *value, const Surroundings &) {
    PutNumber(value, 4, NumberAt(*value, 4) | 0x200);
    return true;
}
bool UplinkSlots(Value *value, const Surroundings &) {
    const std::size_t used = NumberAt(*value, 16) + NumberAt(*value, 20);
    for (std::size_t i = 0; i < 32; ++i) {
        if (i < used)
            ClearTail(value, 24 + 81 * i, 81);
        else
            Clear(value, 24 + 81 * i, 81);
    }
    return true;
}

bool AlwaysOrNormal(Value *value, const Surroundings &) {
    const bool isAlways = Starts(*value, "always");
    Become(value, isAlways ? "always" : "normal", 7);
    return true;
}

// A trunk has ranges and no id; all others have an id and no ranges.
bool OneKindOfVlan(Value *value, const Surroundings &) {
    const uint32_t flags = NumberAt(*value, 0, 2);
    PutNumber(value, 0, flags & 1 ? 1 : flags & 2, 2);
    if (flags & 1) {
        PutNumber(value, 2, 0, 2);
        value->resize(8 + 4 * NumberAt(*value, 6, 2));
    } else {
        PutNumber(value, 6, 0, 2);
        value->resize(8);
    }
    return true;
}
bool TrunkOfNothing(Value *value, const Surroundings &) {
    if (NumberAt(*value, 0, 2) == 1 && NumberAt(*value, 6, 2) == 0) PutNumber(value, 0, 0, 2);
    return true;
}

// The store keeps bits as a signed 64-bit number; higher bits are lost.
bool BitsFit(Value *value, const Surroundings &) {
    for (std::size_t at = 0; at < 24; at += 8) {
        uint64_t bytes = 0;
        std::memcpy(&bytes, &value->at(at), 8);
        const auto bits = static_cast<int64_t>(bytes * 8) / 8;
        std::memcpy(&value->at(at), &bits, 8);
    }
    return true;
}

// Calls `visit` with the place of each filter and the number of its parameters.
template <class Visit> void EachFilter(const Value &value, Visit visit) {
    std::size_t at = 4;
    for (uint32_t i = 0; i < NumberAt(value, 0); ++i) {
        const uint32_t parameters = NumberAt(value, at + 44);
        visit(at, parameters);
        at += 52 + 260 * std::size_t{parameters};
    }
}
bool FilterTexts(Value *value, const Surroundings &) {
    EachFilter(*value, [&](std::size_t at, uint32_t parameters) {
        ClearTail(value, at + 4, 40);
        for (uint32_t p = 0; p < parameters; ++p)
            ClearTail(value, at + 56 + 260 * std::size_t{p}, 256);
    });
    return true;
}
bool OpenOrClosed(Value *value, const Surroundings &) {
    EachFilter(*value,
               [&](std::size_t at, uint32_t) { PutNumber(value, at + 48, NumberAt(*value, at + 48) == 1); });
    return true;
}
bool NumberedFromZero(Value *value, const Surroundings &) {
    EachFilter(*value, [&](std::size_t at, uint32_t parameters) {
        for (uint32_t p = 0; p < parameters; ++p)
            PutNumber(value, at + 52 + 260 * std::size_t{p}, p);
    });
    return true;
}
// The n-th filter follows the heads of the filters before it and overwrites their parameters.
bool OneBehindTheOther(Value *value, const Surroundings &) {
    Value placed(value->size(), 0);
    const auto copy = [&](std::size_t from, std::size_t to, std::size_t size) {
        std::copy_n(value->begin() + static_cast<std::ptrdiff_t>(from), size,
                    placed.begin() + static_cast<std::ptrdiff_t>(to));
    };
    // Copies only the text and its NUL: the rest of the field keeps the bytes of the filter before.
    const auto text = [&](std::size_t from, std::size_t to, std::size_t most) {
        copy(from, to, TextAt(*value, from, most).size() + 1);
    };
    copy(0, 0, 4);
    std::size_t to = 4;
    EachFilter(*value, [&](std::size_t at, uint32_t parameters) {
        copy(at, to, 4);
        text(at + 4, to + 4, 40);
        copy(at + 44, to + 44, 8);
        for (std::size_t p = 0; p < parameters; ++p) {
            copy(at + 52 + 260 * p, to + 52 + 260 * p, 4);
            text(at + 56 + 260 * p, to + 56 + 260 * p, 256);
        }
        to += 52;
    });
    *value = placed;
    return true;
}

struct Step {
    Rule rule;
    Apply apply;
};
const std::vector<Step> kNumberSteps = {{Rule::kBytesBehindNumber, CutNumber}};
const std::vector<Step> kTruth = {{Rule::kBooleanText, TrueOrFalse<6>}};
const std::vector<Step> kTeaming = {{Rule::kExplicitPolicies, SwapExplicit},
                                    {Rule::kNamelessPolicy, NamedPolicy},
                                    {Rule::kUnknownBits, KeepBits<4, 0x2a0>},
                                    {Rule::kFoundCriteria, CriteriaFound},
                                    {Rule::kLostCriteria, ClearAt<8, 4>},
                                    {Rule::kUnknownBits, KeepBits<12, 0x3e>},
                                    {Rule::kSlotEnds, UplinkSlots}};
const std::vector<Step> kVlan = {{Rule::kUnusedBytes, ClearAt<4, 2>},
                                 {Rule::kVlanFields, OneKindOfVlan},
                                 {Rule::kEmptyTrunk, TrunkOfNothing}};
const std::vector<Step> kSecurity = {{Rule::kUnknownBits, KeepBits<0, 7>}};
const std::vector<Step> kPrivateVlans = {{Rule::kEmptyIsGone, HasPrivateVlans},
                                         {Rule::kUnusedBytes, WholePrivateVlans}};

// The steps by converter type, in order of the types.
const std::map<ConverterType, std::vector<Step>> kSteps = {
    {kNumber, kNumberSteps},
    {kText, {{Rule::kTextEnds, CutText}}},
    {kBeaconTimeout, kNumberSteps},
    {kBoolByte, {{Rule::kBooleanByte, BoolAt<0>}}},
    {kBoolText, kTruth},
    {kSwitchAddress, kNumberSteps},
    {kEtherswitchPrivateVlans, kPrivateVlans},
    {kVswitchPrivateVlans, kPrivateVlans},
    {kLinkDiscovery, {}},
    {kIpfix, {{Rule::kBooleanByte, BoolAt<30, 31>}, {Rule::kAddressEnds, Ipv4Alone}}},
    {kHealthCheck, {{Rule::kHealthCheckOff, ClearAt<0, 1>}}},
    {kTrafficResources,
     {{Rule::kEmptyIsGone, HasCount}, {Rule::kSlotEnds, PoolTexts}, {Rule::kUnusedBytes, PoolGaps}}},
    {kPoolKeys, {{Rule::kEmptyIsGone, HasCount}, {Rule::kSlotEnds, ClearSlots<200>}}},
    {kUplinkKeys, {{Rule::kEmptyIsGone, HasCount}, {Rule::kSlotEnds, ClearSlots<48>}}},
    {kSwitchVersion, {{Rule::kOverlayVersion, VersionOfText}}},
    {kLacpGroups, {{Rule::kEmptyIsGone, HasCount}, {Rule::kSlotEnds, GroupTexts}}},
    {kEtherswitchTeaming, kTeaming},
    {kVswitchTeaming, kTeaming},
    {kOverlayFlag, {{Rule::kBooleanText, TrueOrFalse<5>}}},
    {kUplinkNames, {{Rule::kEmptyIsGone, HasCount}, {Rule::kSlotEnds, ClearSlots<81>}}},
    {kMtu, kNumberSteps},
    {kTxUplink, {{Rule::kTransmitUplink, AlwaysOrNormal}}},
    {kEtherswitchPortVlan, kVlan},
    {kVswitchPortVlan, kVlan},
    {kShaping, {{Rule::kShapingRange, BitsFit}}},
    {kEtherswitchMacSecurity, kSecurity},
    {kVswitchMacSecurity, kSecurity},
    {kFilters,
     {{Rule::kFilterFailure, OpenOrClosed},
      {Rule::kFilterNumbers, NumberedFromZero},
      {Rule::kSlotEnds, FilterTexts},
      {Rule::kFilterPlaces, OneBehindTheOther}}},
    {kPortBlocked, kTruth},
    {kPassthrough, {{Rule::kPassthrough, OnlyTwoIsAllowed}}},
    {kPortIpfix, {{Rule::kIpfixOff, IsEnabled}, {Rule::kTextEnds, EightBytes}}},
    {kPortLacp, {{Rule::kBooleanByte, BoolAt<0>}, {Rule::kUnusedBytes, ClearAt<1, 3>}}},
};

} // namespace

bool RunSteps(ConverterType type, const Surroundings &around, Value *value, Rules *rules) {
    if (type == kMirrorSessions) return MirrorSteps(around, value, rules);
    for (const Step &step : kSteps.at(type)) {
        const Value before = *value;
        const bool goesOn = step.apply(value, around);
        if (!goesOn || *value != before) rules->insert(step.rule);
        if (!goesOn) return false;
    }
    return true;
}

bool HasDistinctKeys(ConverterType type, const Value &value) {
    std::set<std::string> keys = {""};
    std::size_t count = 1;
    const auto add = [&](const std::string &key) {
        ++count;
        keys.insert(key);
    };
    const auto table = [&](std::size_t head, std::size_t entries, std::size_t entry, std::size_t key,
                           std::size_t most) {
        for (std::size_t i = 0; i < entries; ++i)
            add(TextAt(value, head + entry * i + key, most));
    };
    if (type == kMirrorSessions) table(20, NumberAt(value, 8), 232, 0, 32);
    if (type == kTrafficResources) table(4, NumberAt(value, 0), 212, 0, 128);
    if (type == kLacpGroups) table(4, NumberAt(value, 0), 93, 65, 16);
    if (type == kFilters)
        EachFilter(value, [&](std::size_t at, uint32_t) { add(std::to_string(NumberAt(value, at))); });
    return keys.size() == count;
}

} // namespace round_trip
