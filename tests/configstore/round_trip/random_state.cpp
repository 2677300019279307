/* SPDX-License-Identifier: Apache-2.0 */
// Random valid states (random_state.h), built from the library's records of its values.

#include "configstore/round_trip/random_state.h"

#include <algorithm>
#include <map>
#include <set>

#include "configstore/layouts/registry.h"
#include "configstore/round_trip/keys.h"
#include "configstore/round_trip/values.h"

namespace round_trip {

using state_builder::Port;
using state_builder::Prop;
using state_builder::Props;
using state_builder::Switch;
using state_builder::Text;
using state_builder::U32;
using value_generator::Generator;

namespace {

constexpr uint32_t kVersions[] = {4, 5, 6, 7, 8, 9, 10, 11, 12, 100, 107, 112};
constexpr uint32_t kTypes[] = {0x10, 0x10, 0x10, 0x10, 0x18, 0x20, 0x30, 0x01};
constexpr uint32_t kOtherTypes[] = {0x10, 0x18, 0x20, 0x28, 0x08, 0x04, 0x02};

void Set(Value *value, std::size_t at, uint8_t byte) {
    if (at < value->size()) (*value)[at] = byte;
}
// Sets a byte after the NUL of the last slot's text, if there is room.
void DirtySlot(Value *value, std::size_t slot) {
    if (value->size() < 4 + slot) return;
    const std::size_t at = value->size() - slot;
    if (TextAt(*value, at, slot).size() < slot - 1) value->back() = 'x';
}

// Unusual but valid values: unused bytes, unknown numbers and texts.
void Dirty(dvs::ConverterType type, Value *value) {
    using enum dvs::ConverterType;
    switch (type) {
    case kNumber:
    case kMtu:
        return value->push_back(1);
    case kText:
        value->insert(value->end(), {'x', 0});
        return;
    case kBoolByte:
    case kPortLacp:
        return Set(value, 0, 7);
    case kEtherswitchPrivateVlans:
    case kVswitchPrivateVlans:
        return Set(value, 5, 1);
    case kIpfix:
        Set(value, 31, 0);
        return Set(value, 20, 9);
    case kTrafficResources:
        return Set(value, 4 + 210, 1);
    case kUplinkKeys:
        return DirtySlot(value, 48);
    case kEtherswitchTeaming:
    case kVswitchTeaming:
        Set(value, 0, 77);
        return Set(value, 6, 1);
    case kOverlayFlag:
    case kBoolText:
    case kPortBlocked:
        return value->assign({'n', 'o'});
    case kUplinkNames:
        return DirtySlot(value, 81);
    case kTxUplink:
        return value->assign({'o', 'd', 'd'});
    case kEtherswitchPortVlan:
    case kVswitchPortVlan:
        return Set(value, 4, 1);
    case kEtherswitchMacSecurity:
    case kVswitchMacSecurity:
        return Set(value, 1, 1);
    case kFilters:
        return Set(value, 4 + 48, 5);
    case kPassthrough:
        return Set(value, 0, 1);
    case kPortIpfix:
        return value->assign({'o', 'f', 'f', 0});
    default:
        return;
    }
}

Value ValueOf(const Key &key, uint32_t propClass, bool isWide, Generator *random) {
    const auto *record = dvs::layout::RecordOf(propClass, key.name, isWide);
    Value value = random->Sound(*record);
    while (!HasDistinctKeys(key.type, value))
        value = random->Sound(*record);
    if (random->OneIn(3)) Dirty(key.type, &value);
    return value;
}

void Shuffle(Props *props, Generator *random) {
    for (std::size_t i = props->size(); i > 1; --i)
        std::swap((*props)[i - 1], (*props)[random->Below(i)]);
}

constexpr const char *kOtherNames[] = {"com.orbeno.extraconfig.", "com.orbeno.port.extraConfig.", "com.acme.",
                                       "net."};

// About two thirds of the keys, each place once except places that keep the last value, and a few keys
// without a row.
Props RandomList(uint32_t propClass, bool isWide, Generator *random) {
    std::map<std::string, std::vector<const Key *>> places;
    for (const Key &key : KeysOf(propClass))
        places[key.place].push_back(&key);
    Props props;
    for (const auto &[place, keys] : places) {
        if (place == "version" || random->OneIn(3)) continue;
        const bool mixes = place == "vlan" || place == "teaming" || place == "sessions";
        const std::size_t first = random->Below(keys.size());
        for (std::size_t i = 0; i < keys.size(); ++i) {
            const Key &key = *keys[(first + i) % keys.size()];
            if (i > 0 && (mixes || random->OneIn(2))) break;
            props.push_back({key.name, ValueOf(key, propClass, isWide, random),
                             kTypes[random->Below(std::size(kTypes))]});
        }
    }
    for (int i = 0; i < 6; ++i) {
        std::string name = kOtherNames[random->Below(std::size(kOtherNames))] + std::to_string(propClass) +
                           std::to_string(i);
        if (random->OneIn(3)) name += ".ruleset";
        Value value = Text(random->Text(20));
        if (random->OneIn(2)) value.push_back('x');
        props.push_back({name, value, kOtherTypes[random->Below(std::size(kOtherTypes))]});
    }
    Shuffle(&props, random);
    return props;
}

Value UplinkKeys(std::initializer_list<std::string> ports) {
    Value value = U32(static_cast<uint32_t>(ports.size()));
    for (const std::string &port : ports)
        value = state_builder::operator+(value, state_builder::Slot(port, 48));
    return value;
}

} // namespace

Switch RandomSwitch(const std::string &id, const std::string &className, Generator *random) {
    Switch sw{.id = id, .className = className, .global = {}, .host = {}, .ports = {}};
    const uint32_t stated = kVersions[random->Below(std::size(kVersions))];
    sw.version = random->OneIn(3) ? kVersions[random->Below(std::size(kVersions))] : stated;
    const bool isWide = sw.version > 99;
    sw.global = RandomList(0, isWide, random);
    sw.global.push_back({"com.orbeno.common.version", U32(stated), 0x10});
    sw.host = RandomList(1, isWide, random);
    for (Prop &prop : sw.host) {
        if (prop.key == "com.orbeno.common.host.uplinkPorts") prop.value = UplinkKeys({"1", "nine", "2"});
        if (prop.key == "com.orbeno.common.host.uplinkPorts" && random->OneIn(3)) prop.value = U32(0);
    }
    for (const char *port : {"2", "10", "1", "third", "4"})
        sw.ports.push_back({port, RandomList(2, isWide, random)});
    sw.ports.push_back({"empty", {}});
    const Prop shadow = {"com.orbeno.common.port.volatile.type", U32(2)};
    sw.ports.push_back({"shadow", {shadow, {"com.orbeno.common.port.alias", Text("behind")}}});
    sw.ports.push_back({"10", {{"com.orbeno.common.port.alias", Text("shadow of 10")}, shadow}});
    return sw;
}

} // namespace round_trip
