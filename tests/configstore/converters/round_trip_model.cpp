/* SPDX-License-Identifier: Apache-2.0 */
// The model of a round trip (round_trip_model.h).

#include "configstore/converters/round_trip_model.h"

#include <cstring>
#include <set>

namespace converter_test {
namespace {

using Value = std::vector<uint8_t>;
using Maybe = std::optional<Value>;

uint64_t N(const Value &value, std::size_t at, std::size_t width) {
    uint64_t number = 0;
    for (std::size_t i = 0; i < width; ++i)
        number |= uint64_t{value.at(at + i)} << (8 * i);
    return number;
}
uint32_t N4(const Value &value, std::size_t at) {
    return static_cast<uint32_t>(N(value, at, 4));
}
uint16_t N2(const Value &value, std::size_t at) {
    return static_cast<uint16_t>(N(value, at, 2));
}
std::string T(const Value &value, std::size_t at) {
    return reinterpret_cast<const char *>(value.data()) + at;
}
bool Starts(const Value &value, const char *text) {
    const std::size_t size = std::strlen(text) + 1;
    return value.size() >= size && std::memcmp(value.data(), text, size) == 0;
}

Maybe FirstFour(const Value &value) {
    return Value(value.begin(), value.begin() + 4);
}
Maybe Same(const Value &value) {
    return value;
}

Maybe Slots(const Value &value, std::size_t slot) {
    const uint32_t count = N4(value, 0);
    if (count == 0) return {};
    Bytes result = Bytes().U32(count);
    for (uint32_t i = 0; i < count; ++i)
        result.Text(T(value, 4 + i * slot), slot);
    return result;
}

Maybe Flag(bool flag, const char *whenTrue, std::size_t trueSize, const char *whenFalse) {
    if (flag) return Value(whenTrue, whenTrue + trueSize);
    return Value(whenFalse, whenFalse + std::strlen(whenFalse));
}

Maybe PrivateVlans(const Value &value) {
    Bytes result;
    for (std::size_t at = 0; at + 8 <= value.size(); at += 8) {
        result.U16(N2(value, at)).U16(N2(value, at + 2)).U8(value[at + 4]).Zeros(3);
    }
    return result.empty() ? Maybe() : result;
}

Maybe Ipfix(const Value &value) {
    Value result(value);
    const bool ipv6 = value[31] != 0;
    // An IPv6 address that reads like an IPv4 one is still written with colons.
    if (!ipv6) std::fill(result.begin() + 12, result.begin() + 24, 0);
    return result;
}

Maybe Pools(const Value &value) {
    const uint32_t count = N4(value, 0);
    if (count == 0) return {};
    Bytes result = Bytes().U32(count);
    for (std::size_t at = 4; at < value.size(); at += 212) {
        result.Text(T(value, at), 128).Zeros(1).U32(N4(value, at + 129)).Zeros(67);
        result.U32(N4(value, at + 200)).U32(N4(value, at + 204)).Zeros(4);
    }
    return result;
}

Maybe Groups(const Value &value) {
    return N4(value, 0) ? Maybe(value) : Maybe();
}

Maybe Teaming(const Value &value) {
    const uint32_t policy = N4(value, 0);
    const uint32_t active = N4(value, 16);
    const uint32_t standby = N4(value, 20);
    Bytes result = Bytes().U32(policy == 4 ? 5 : policy == 5 ? 4 : policy > 5 ? 0 : policy);
    result.U32((N4(value, 4) & 0xa0) | 0x200).Zeros(4).U32(N4(value, 12) & 0x3e).U32(active).U32(standby);
    for (uint32_t i = 0; i < active + standby; ++i)
        result.Text(T(value, 24 + 81 * i), 81);
    return result.Zeros(2616 - result.size());
}

Maybe Vlan(const Value &value) {
    const uint16_t flags = N2(value, 0);
    const uint16_t count = N2(value, 6);
    if (!(flags & 1)) return Bytes().U16(flags & 2).U16(N2(value, 2)).U32(0);
    if (count == 0) return Bytes().Zeros(8);
    Bytes result = Bytes().U16(1).U32(0).U16(count);
    result.insert(result.end(), value.begin() + 8, value.begin() + 8 + 4 * count);
    return result;
}

Maybe Shaping(const Value &value) {
    Bytes result;
    for (std::size_t at = 0; at < 24; at += 8) {
        result.U64(static_cast<uint64_t>(static_cast<int64_t>(N(value, at, 8) * 8) / 8));
    }
    return result;
}

Maybe FilterList(const Value &value) {
    const uint32_t count = N4(value, 0);
    Value result(value.size(), 0);
    const auto put = [&](std::size_t at, uint32_t number) { std::memcpy(&result[at], &number, 4); };
    const auto text = [&](std::size_t at, const std::string &s) {
        std::memcpy(&result[at], s.c_str(), s.size() + 1);
    };
    put(0, count);
    std::size_t from = 4;
    for (std::size_t i = 0, to = 4; i < count; ++i, to += 52) {
        const uint32_t parameters = N4(value, from + 44);
        put(to, N4(value, from));
        text(to + 4, T(value, from + 4));
        put(to + 44, parameters);
        put(to + 48, N4(value, from + 48) == 1);
        for (uint32_t p = 0; p < parameters; ++p) {
            put(to + 52 + 260 * p, p);
            text(to + 52 + 260 * p + 4, T(value, from + 52 + 260 * p + 4));
        }
        from += 52 + 260 * parameters;
    }
    return result;
}

struct StoredSession {
    std::vector<std::string> keys[3], uplinks; // destinations, receive and transmit sources
};

// What a save leaves of a session's port records.
StoredSession Stored(const Value &value, std::size_t session, std::size_t *port, std::size_t size) {
    StoredSession stored;
    const uint32_t type = N4(value, session + 116);
    for (std::size_t group = 0; group < 3; ++group) {
        for (uint32_t i = N4(value, session + 216 + 4 * group); i; --i, *port += size) {
            const std::string name = T(value, *port + 4);
            const bool isDestination = group == 0;
            if (isDestination && type == 4) continue;
            if (!isDestination && type == 3) continue;
            const bool uplink = isDestination && (type == 2 || (type == 0 && N4(value, *port) == 1));
            if (uplink) stored.uplinks.push_back(name);
            if (!uplink) stored.keys[group].push_back(name);
        }
    }
    return stored;
}

uint16_t Connectees(uint16_t bits) {
    return static_cast<uint16_t>((bits & 0xb) | (bits & 0xb ? 4 : 0));
}

Maybe Mirror(const Value &value, std::size_t size) {
    const uint32_t count = N4(value, 8);
    if (count == 0) return {};
    Bytes sessions;
    std::vector<std::pair<uint32_t, std::string>> area;
    std::size_t port = 20 + 232 * std::size_t{count};
    std::size_t next = 0;
    std::size_t total = 0;
    const auto place = [&](std::size_t index, uint32_t kind, const std::string &name) {
        if (area.size() <= index) area.resize(index + 1);
        // A shorter name over a longer one leaves the longer one's end behind its NUL.
        std::string &bytes = area[index].second;
        area[index].first = kind;
        bytes.resize(std::max(bytes.size(), name.size() + 1));
        std::memcpy(bytes.data(), name.c_str(), name.size() + 1);
    };
    for (uint32_t i = 0; i < count; ++i) {
        const std::size_t s = 20 + 232 * std::size_t{i};
        const StoredSession stored = Stored(value, s, &port, size);
        const std::size_t keys = stored.keys[0].size() + stored.keys[1].size() + stored.keys[2].size();
        total += 3 * keys + stored.uplinks.size();
        const uint32_t flags = N4(value, s + 124);
        const uint16_t vlan = N2(value, s + 128);
        const uint32_t loaded =
            (flags & 0x24) | (flags & 1 ? 3 : 0) | (flags & 0x10 ? 0 : 0x10) | (vlan ? 8 : 0);
        sessions.Text(T(value, s), 32)
            .Text(T(value, s + 32), 84)
            .U32(N4(value, s + 116))
            .U32(0xffffffff)
            .U32(loaded);
        sessions.U16(vlan).U16(Connectees(N2(value, s + 130))).U16(Connectees(N2(value, s + 132))).Zeros(2);
        sessions.U32(N4(value, s + 136)).U32(N4(value, s + 140)).U16(N2(value, s + 144)).U8(value[s + 146]);
        sessions.U8(value[s + 147] != 0).Zeros(68);
        sessions.U32(static_cast<uint32_t>(stored.keys[2].size())).Zeros(8).U32(static_cast<uint32_t>(next));
        std::size_t index = next;
        for (const auto &name : stored.keys[0])
            place(index++, 0, name);
        for (const auto &name : stored.uplinks)
            place(index++, 1, name);
        next = index;
        for (std::size_t group = 1; group < 3; ++group) {
            index = next;
            for (const auto &name : stored.keys[group])
                place(index++, 0, name);
        }
    }
    Bytes result =
        Bytes().U32(0xfacebeef).U32(1).U32(count).U32(static_cast<uint32_t>(total)).U32(0).Add(sessions);
    for (const auto &[kind, name] : area)
        result.U32(kind).Text(name, size - 4);
    return result.Zeros((total - area.size()) * size);
}

std::string Choose(bool etherswitch, const char *etherswitchKey, const char *vswitchKey) {
    return etherswitch ? etherswitchKey : vswitchKey;
}

Properties One(const std::string &key, const Maybe &value) {
    return value ? Properties{{key, *value}} : Properties{};
}

// The value under the key that the switch's family loads, whichever of the two it was saved under.
Properties Family(const ModelSwitch &sw, const char *etherswitchKey, const char *vswitchKey,
                  const Maybe &value) {
    return One(Choose(sw.IsEtherswitch(), etherswitchKey, vswitchKey), value);
}

Properties Mtu(const ModelSwitch &sw, const Value &value) {
    Properties result = One("com.orbeno.common.portset.mtu", FirstFour(value));
    if (sw.IsEtherswitch()) result["com.orbeno.etherswitch.mtu"] = *FirstFour(value);
    if (std::string(sw.className) == "vswitch") result["com.orbeno.vswitch.mtu"] = *FirstFour(value);
    return result;
}

Properties TextOf(const ModelSwitch &sw, const std::string &key, const Value &value) {
    const std::string text = T(value, 0);
    const Maybe loaded = Value(text.c_str(), text.c_str() + text.size() + 1);
    if (key.find("multicastFilter") == std::string::npos) return One(key, loaded);
    return Family(sw, "com.orbeno.etherswitch.multicastFilter", "com.orbeno.vswitch.multicastFilter", loaded);
}

// The priority stands inside the VLAN policy, so a port that has the one loads the other as VLAN 0.
Properties Priority(const ModelSwitch &sw, const std::string &key, const Value &value) {
    return {{key, *FirstFour(value)},
            {Choose(sw.IsEtherswitch(), "com.orbeno.etherswitch.port.vlan", "com.orbeno.vswitch.port.vlan"),
             Bytes().Zeros(8)}};
}

Properties SmallValue(const ModelSwitch &sw, const std::string &key, uint32_t type, const Value &value) {
    switch (type) {
    case 0:
    case 2:
    case 5:
        if (key == "com.orbeno.vswitch.port.priority") return Priority(sw, key, value);
        return One(key, FirstFour(value));
    case 1:
        return TextOf(sw, key, value);
    case 3:
        return One(key, Value{static_cast<uint8_t>(value[0] != 0)});
    case 4:
    case 31:
        return One(key, Flag(Starts(value, "true"), "true\0f", 6, "false"));
    case 19:
        return One(key, Flag(Starts(value, "true"), "true", 5, "false"));
    case 14:
        return One(key, Slots(value, 48));
    case 15:
        return One(key,
                   Bytes().U32(N4(value, 0) >= 107 && !sw.overlay                      ? N4(value, 0) - 100
                               : sw.overlay && N4(value, 0) >= 7 && N4(value, 0) <= 12 ? N4(value, 0) + 100
                                                                                       : N4(value, 0)));
    case 20:
        return One(key, Slots(value, 81));
    case 21:
        return Mtu(sw, value);
    case 32:
        return One(key, Bytes().U32(N4(value, 0) == 2 ? 2 : 0));
    case 34:
        return Starts(value, "enabled") ? One(key, Value(value.begin(), value.begin() + 8)) : Properties{};
    default:
        return {};
    }
}

Properties PortPolicy(const ModelSwitch &sw, const std::string &key, uint32_t type, const Value &value) {
    switch (type) {
    case 23:
        return Family(sw, "com.orbeno.etherswitch.port.txUplink", "com.orbeno.vswitch.port.txUplink",
                      Bytes().Text(Starts(value, "always") ? "always" : "normal", 7));
    case 24:
    case 25:
        if (type == 25 && sw.IsEtherswitch()) return {};
        return Family(sw, "com.orbeno.etherswitch.port.vlan", "com.orbeno.vswitch.port.vlan", Vlan(value));
    case 26:
        return One(key, Shaping(value));
    case 27:
    case 28:
        return Family(sw, "com.orbeno.etherswitch.port.security", "com.orbeno.vswitch.port.security",
                      Bytes().U32(N4(value, 0) & 7));
    case 29:
        return One(key, FilterList(value));
    case 35:
        return One(key, Bytes().U32(value[0] != 0).U32(N4(value, 4)));
    default:
        return {}; // 36: kept nowhere
    }
}

Properties SwitchSetting(const ModelSwitch &sw, const std::string &key, uint32_t type, const Value &value) {
    const bool isCswitch = std::string(sw.className) == "cswitch";
    const bool isOverlay = sw.overlay && sw.version[0] >= '7' && sw.version[0] <= '8';
    switch (type) {
    case 6:
    case 7:
        return One(Choose(!isCswitch && !isOverlay, "com.orbeno.etherswitch.pvlanMap",
                          "com.orbeno.vswitch.pvlanMap"),
                   PrivateVlans(value));
    case 8:
        return One(key, Same(value));
    case 10:
        return One(key, Ipfix(value));
    case 11:
        return One(key, Bytes().U8(0).U32(N4(value, 1)));
    case 12:
        return One(key, Pools(value));
    case 13:
        return One(key, Slots(value, 200));
    case 16:
        return One(key, Groups(value));
    default:
        return {};
    }
}

Properties Shared(const ModelSwitch &sw, uint32_t propClass, uint32_t type, const Value &value) {
    if (type == 9) {
        const Maybe table = Mirror(value, sw.IsWide() ? 52 : 36);
        return propClass == kPort ? Family(sw, "com.orbeno.etherswitch.port.mirrorSessions",
                                           "com.orbeno.vswitch.port.mirrorSessions", table)
                                  : Family(sw, "com.orbeno.etherswitch.mirrorSessions",
                                           "com.orbeno.vswitch.mirrorSessions", table);
    }
    if (type == 18 && sw.IsEtherswitch()) return {};
    return propClass == kPort ? Family(sw, "com.orbeno.etherswitch.port.teaming",
                                       "com.orbeno.vswitch.port.teaming.policy", Teaming(value))
                              : One("com.orbeno.vswitch.teaming", Teaming(value));
}

} // namespace

bool ModelSwitch::IsEtherswitch() const {
    const std::string name = className;
    return name != "vswitch" && name != "cswitch";
}

bool ModelSwitch::IsWide() const {
    return overlay || std::string(version) == "OVL 1.0";
}

Properties Predict(const ModelSwitch &sw, uint32_t propClass, const std::string &key, uint32_t type,
                   const Value &value) {
    if (type == 9 || type == 17 || type == 18) return Shared(sw, propClass, type, value);
    for (auto *family : {SmallValue, PortPolicy, SwitchSetting}) {
        Properties result = family(sw, key, type, value);
        if (!result.empty()) return result;
    }
    return {};
}

bool HasDistinctKeys(uint32_t type, const Value &value) {
    std::set<std::string> keys;
    std::size_t count = 0;
    const auto add = [&](const std::string &key) {
        ++count;
        if (!key.empty()) keys.insert(key);
    };
    if (type == 9) {
        for (uint32_t i = 0; i < N4(value, 8); ++i)
            add(T(value, 20 + 232 * i));
    } else if (type == 12) {
        for (uint32_t i = 0; i < N4(value, 0); ++i)
            add(T(value, 4 + 212 * i));
    } else if (type == 16) {
        for (uint32_t i = 0; i < N4(value, 0); ++i)
            add(T(value, 4 + 93 * i + 65));
    } else if (type == 29) {
        std::size_t at = 4;
        for (uint32_t i = 0; i < N4(value, 0); ++i) {
            add(std::to_string(N4(value, at)));
            at += 52 + 260 * std::size_t{N4(value, at + 44)};
        }
    }
    return keys.size() == count;
}

} // namespace converter_test
