/* SPDX-License-Identifier: Apache-2.0 */
// The ports of store_bench (port_settings.h).

#include "bench/port_settings.h"

#include <initializer_list>

namespace store_bench {
namespace {

template <typename Number> std::string Bytes(Number value) {
    return std::string(reinterpret_cast<const char *>(&value), sizeof value);
}
template <typename Number> std::string All(std::initializer_list<Number> values) {
    std::string bytes;
    for (const Number value : values)
        bytes += Bytes(value);
    return bytes;
}
std::string Text(const std::string &text) {
    return text + '\0';
}
std::string Slot(std::string text, std::size_t size) {
    text.resize(size);
    return text;
}

std::string Shaping(uint64_t average) {
    return All<uint64_t>({average, 2 * average, 100000});
}

std::string Trunk(int port) {
    const auto first = static_cast<uint16_t>(port % 1000 + 1);
    std::string ranges = All<uint16_t>({1, 0, 0, 4});
    for (uint16_t i = 0; i < 4; ++i)
        ranges += All<uint16_t>(
            {static_cast<uint16_t>(first + 100 * i), static_cast<uint16_t>(first + 100 * i + 9)});
    return ranges;
}

std::string Teaming() {
    std::string value = All<uint32_t>({3, 0x80, 0, 0x22, 2, 1});
    for (const char *name : {"uplink1", "uplink2", "uplink3"})
        value += Slot(name, 81);
    return Slot(value, 2616);
}

std::string Filters(int port) {
    std::string value =
        All<uint32_t>({1, static_cast<uint32_t>(port % 12)}) + Slot("inspector", 40) + All<uint32_t>({2, 1});
    for (uint32_t i = 0; i < 2; ++i)
        value += Bytes(i) + Slot("mode=" + std::to_string(i), 256);
    return value;
}

std::string MirrorSession(int port) {
    std::string session = Slot("session-" + std::to_string(port), 32) + Slot("to the analyser", 84);
    session += All<uint32_t>({1, 0xffffffff, 0x04}) + All<uint16_t>({900, 1, 1, 0}) + All<uint32_t>({1, 0});
    session = Slot(session, 216) + All<uint32_t>({1, 1, 1, 0});
    std::string value = All<uint32_t>({0xfacebeef, 1, 1, 3, 0}) + session;
    for (const int other : {port, port + 1, port + 2})
        value += Slot(Bytes(uint32_t{0}) + std::to_string(other), 36);
    return value;
}

std::string ConnectionId(int port, int version) {
    return Bytes(static_cast<uint32_t>(1000 + port + version));
}

} // namespace

std::vector<Setting> UsualSettings(int port, int version) {
    const std::string number = std::to_string(port);
    return {
        {"com.orbeno.common.port.alias", Text("port number " + number)},
        {"com.orbeno.common.port.connectid", ConnectionId(port, version)},
        {"com.orbeno.common.port.block", Text("false")},
        {"com.orbeno.common.port.ptAllowed", Bytes(uint32_t{2})},
        {"com.orbeno.etherswitch.port.txUplink", Text("normal")},
        {"com.orbeno.common.port.portgroupid", Text("portgroup-" + std::to_string(port % 16))},
        {"com.orbeno.etherswitch.port.vlan", All<uint16_t>({0, static_cast<uint16_t>(port % 100 + 1), 0, 0})},
        {"com.orbeno.etherswitch.port.ipfix", Text("enabled")},
        {"com.orbeno.common.port.shaper.input", Shaping(1000000)},
        {"com.orbeno.etherswitch.port.security", Bytes(uint32_t{5})},
        {"com.orbeno.common.port.backingType", Text("regular")},
        {"com.orbeno.port.extraConfig.note", Text("set by the site's tools, change " + number), 0x00},
    };
}

std::vector<Setting> StructuredSettings(int port, int version) {
    return {
        {"com.orbeno.common.port.alias", Text("port number " + std::to_string(port))},
        {"com.orbeno.common.port.connectid", ConnectionId(port, version)},
        {"com.orbeno.etherswitch.port.txUplink", Text("always")},
        {"com.orbeno.etherswitch.port.teaming", Teaming()},
        {"com.orbeno.etherswitch.port.vlan", Trunk(port)},
        {"com.orbeno.etherswitch.port.ipfix", Text("enabled")},
        {"com.orbeno.common.port.shaper.input", Shaping(1000000)},
        {"com.orbeno.common.port.shaper.output", Shaping(3000000)},
        {"com.orbeno.etherswitch.port.security", Bytes(uint32_t{5})},
        {"com.orbeno.common.port.dvfilter", Filters(port)},
        {"com.orbeno.etherswitch.port.mirrorSessions", MirrorSession(port)},
        {"com.orbeno.etherswitch.port.lacp", All<uint32_t>({1, 1})},
    };
}

} // namespace store_bench
