/* SPDX-License-Identifier: Apache-2.0 */
// Predicts the round trip of a mirror session table (values.h). The table is predicted as a whole, because
// the ports of all sessions share an area; the changed fields then determine the rules.

#include <algorithm>
#include <cstring>
#include <stdexcept>

#include "configstore/round_trip/values.h"

namespace round_trip {
namespace {

constexpr std::size_t kHead = 20;
constexpr std::size_t kSession = 232;

struct StoredSession {
    std::vector<std::string> keys[3], uplinks; // destinations, receive and transmit sources
};

// The stored form of a session's port records after a save; *port is the place of the next record.
StoredSession Stored(const Value &value, std::size_t session, std::size_t *port, std::size_t size) {
    StoredSession stored;
    const uint32_t type = NumberAt(value, session + 116);
    for (std::size_t group = 0; group < 3; ++group) {
        for (uint32_t i = NumberAt(value, session + 216 + 4 * group); i; --i, *port += size) {
            const std::string name = TextAt(value, *port + 4, size - 4);
            const bool isDestination = group == 0;
            if (isDestination && type == 4) continue;
            if (!isDestination && type == 3) continue;
            const uint32_t kind = NumberAt(value, *port);
            if (isDestination && type == 0 && kind > 1) continue;
            const bool uplink = isDestination && (type == 2 || (type == 0 && kind == 1));
            (uplink ? stored.uplinks : stored.keys[group]).push_back(name);
        }
    }
    return stored;
}

void Put(Value *value, std::size_t at, std::size_t width, uint32_t number) {
    std::memcpy(&value->at(at), &number, width);
}
void PutText(Value *value, std::size_t at, std::size_t size, const std::string &text) {
    std::fill_n(value->begin() + static_cast<std::ptrdiff_t>(at), size, uint8_t{0});
    std::copy_n(text.begin(), std::min(size, text.size()), value->begin() + static_cast<std::ptrdiff_t>(at));
}

uint32_t LoadedFlags(uint32_t flags, uint32_t vlan) {
    return (flags & 0x24) | (flags & 1 ? 3 : 0) | (flags & 0x10 ? 0 : 0x10) | (vlan ? 8 : 0);
}
uint32_t Connectees(uint32_t bits) {
    return (bits & 0xb) | (bits & 0xb ? 4 : 0);
}

// Fills the fields of a session's record that do not depend on its ports.
void LoadFields(const Value &value, std::size_t s, Value *loaded) {
    PutText(loaded, s, 32, TextAt(value, s, 32));
    PutText(loaded, s + 32, 84, TextAt(value, s + 32, 81));
    Put(loaded, s + 120, 4, 0xffffffff);
    Put(loaded, s + 124, 4, LoadedFlags(NumberAt(value, s + 124), NumberAt(value, s + 128, 2)));
    Put(loaded, s + 130, 2, Connectees(NumberAt(value, s + 130, 2)));
    Put(loaded, s + 132, 2, Connectees(NumberAt(value, s + 132, 2)));
    Put(loaded, s + 134, 2, 0);
    Put(loaded, s + 147, 1, NumberAt(value, s + 147, 1) != 0);
    PutText(loaded, s + 148, 68, "");
}

// The port area while the sessions are written to it. A shorter name over a longer one leaves the longer
// name's end after its NUL. A name from wide records overflows a narrow record.
struct Area {
    Value bytes;
    std::size_t recordSize;

    void Place(std::size_t index, uint32_t kind, const std::string &name) {
        const std::size_t at = index * recordSize;
        Put(&bytes, at, 4, kind);
        const std::size_t length = std::min(name.size(), bytes.size() - at - 5);
        PutText(&bytes, at + 4, length + 1, name.substr(0, length));
    }
    // Writes the destinations, then both kinds of sources at the same place after them. Returns the index
    // after the destinations.
    std::size_t PlaceSession(const StoredSession &stored, std::size_t index) {
        for (const auto &name : stored.keys[0])
            Place(index++, 0, name);
        for (const auto &name : stored.uplinks)
            Place(index++, 1, name);
        for (std::size_t group = 1; group < 3; ++group) {
            for (std::size_t i = 0; i < stored.keys[group].size(); ++i)
                Place(index + i, 0, stored.keys[group][i]);
        }
        return index;
    }
};

Value Loaded(const Surroundings &around, const Value &value) {
    const std::size_t from = around.savesWide ? 52 : 36;
    const std::size_t size = around.loadsWide ? 52 : 36;
    const std::size_t count = NumberAt(value, 8);
    std::size_t port = kHead + kSession * count;
    Value loaded(value.begin(), value.begin() + static_cast<std::ptrdiff_t>(port));
    std::vector<StoredSession> sessions;
    std::size_t total = 0;
    for (std::size_t i = 0; i < count; ++i) {
        const auto &stored = sessions.emplace_back(Stored(value, kHead + kSession * i, &port, from));
        total += 3 * (stored.keys[0].size() + stored.keys[1].size() + stored.keys[2].size()) +
                 stored.uplinks.size();
    }
    Area area{Value(total * size), size};
    std::size_t next = 0;
    for (std::size_t i = 0; i < count; ++i) {
        const std::size_t s = kHead + kSession * i;
        LoadFields(value, s, &loaded);
        Put(&loaded, s + 216, 4, static_cast<uint32_t>(sessions[i].keys[2].size()));
        Put(&loaded, s + 220, 4, 0);
        Put(&loaded, s + 224, 4, 0);
        Put(&loaded, s + 228, 4, static_cast<uint32_t>(next));
        next = area.PlaceSession(sessions[i], next);
    }
    Put(&loaded, 0, 4, 0xfacebeef);
    Put(&loaded, 4, 4, 1);
    Put(&loaded, 12, 4, static_cast<uint32_t>(total));
    Put(&loaded, 16, 4, 0);
    loaded.insert(loaded.end(), area.bytes.begin(), area.bytes.end());
    return loaded;
}

struct Region {
    std::size_t offset, size;
    Rule rule;
};
constexpr Region kHeadRegions[] = {
    {0, 8, Rule::kSessionHead}, {12, 4, Rule::kPortTotal}, {16, 4, Rule::kUnusedBytes}};
constexpr Region kSessionRegions[] = {
    {0, 113, Rule::kSlotEnds},     {113, 3, Rule::kUnusedBytes},    {120, 4, Rule::kPacketLength},
    {130, 4, Rule::kConnectees},   {134, 2, Rule::kUnusedBytes},    {147, 1, Rule::kBooleanByte},
    {148, 68, Rule::kUnusedBytes}, {216, 12, Rule::kSessionGroups}, {228, 4, Rule::kSessionGroups},
};
struct FlagRule {
    uint32_t bits;
    Rule rule;
};
constexpr FlagRule kFlagRules[] = {{0x03, Rule::kNormalTraffic},
                                   {0x08, Rule::kEncapsulationVlan},
                                   {0x10, Rule::kLegacyMode},
                                   {0xffffffc0, Rule::kUnknownBits}};

// Adds the rules of the regions that differ and copies those regions to *before.
void Explain(std::size_t start, std::span<const Region> regions, const Value &after, Value *before,
             Rules *rules) {
    for (const Region &region : regions) {
        for (std::size_t at = start + region.offset; at < start + region.offset + region.size; ++at) {
            if (before->at(at) != after[at]) rules->insert(region.rule);
            before->at(at) = after[at];
        }
    }
}

} // namespace

bool MirrorSteps(const Surroundings &around, Value *value, Rules *rules) {
    if (NumberAt(*value, 8) == 0) {
        rules->insert(Rule::kEmptyIsGone);
        return false;
    }
    Value before = *value;
    *value = Loaded(around, before);
    const std::size_t ports = kHead + kSession * NumberAt(before, 8);
    Explain(0, kHeadRegions, *value, &before, rules);
    for (std::size_t s = kHead; s < ports; s += kSession) {
        const uint32_t flags = NumberAt(before, s + 124) ^ NumberAt(*value, s + 124);
        for (const FlagRule &flag : kFlagRules) {
            if (flags & flag.bits) rules->insert(flag.rule);
        }
        Put(&before, s + 124, 4, NumberAt(*value, s + 124));
        Explain(s, kSessionRegions, *value, &before, rules);
    }
    if (!std::equal(value->begin(), value->begin() + static_cast<std::ptrdiff_t>(ports), before.begin()))
        throw std::logic_error("a session changed in a field that no rule names");
    if (*value != before) rules->insert(Rule::kSessionPorts);
    return true;
}

} // namespace round_trip
