/* SPDX-License-Identifier: Apache-2.0 */
// What `dvsctl generate` draws (generate_values.h). Draws stand in braces, never side by side as arguments of
// a call: compilers evaluate those in different orders, and the same seed must give the same bytes
// everywhere.

#include "tools/dvsctl/verbs/generate_values.h"

#include <algorithm>
#include <iterator>
#include <set>

#include <boost/json/object.hpp>
#include <fmt/format.h>

#include "configstore/typed/typed_value.h"
#include "dvs/configstore.h"
#include "dvsdata/format.h"
#include "dvsstate/versions.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

constexpr std::uint32_t kFirstOverlayVersion = 100;
constexpr std::uint32_t kGuestPeriod = 8;          // over so many guest ports every key is there, or over all

// The first three have a key of every row between them.
constexpr SwitchSort kSorts[] = {
    {"etherswitch", 8}, {"vswitch", 110}, {"cswitch", 100},     {"ovlvswitch", 107},  {"etherswitch", 5},
    {"vswitch", 7},     {"cswitch", 12},  {"etherswitch", 112}, {"stub-vswitch", 9},  {"vswitch", 109},
    {"cswitch", 108},   {"vswitch", 11},  {"etherswitch", 10},  {"etherswitch", 111}, {"cswitch", 6},
};

struct Draw {
    Random &r;
    const SwitchPlan &sw;
    std::uint32_t port = 0; // its place, from 0
};

json::array Texts(const std::vector<std::string> &texts) {
    json::array list;
    for (const std::string &text : texts)
        list.emplace_back(text);
    return list;
}

std::vector<std::string> Shuffled(Random &r, std::vector<std::string> texts) {
    for (std::size_t i = texts.size(); i > 1; --i)
        std::swap(texts[i - 1], texts[r.Below(static_cast<std::uint32_t>(i))]);
    return texts;
}

json::value Text(std::string_view text) {
    return json::value(text);
}

json::value Truth(const Draw &d) {
    return d.r.Below(2) != 0;
}

json::value Alias(const Draw &d) {
    return Text(
        fmt::format("{}-{}", d.r.OneOf({"production", "storage", "backup", "edge", "lab"}), d.sw.number));
}

json::value Mtu(const Draw &d) {
    return d.sw.mtu;
}

json::value LacpGroups(const Draw &d) {
    json::array groups;
    for (std::uint32_t i = 0, count = d.r.Between(1, 3); i < count; ++i) {
        const std::string name = fmt::format("lag{}", i + 1);
        groups.push_back(
            json::object{{"key", name},
                         {"name", name},
                         {"mode", d.r.OneOf({"ACTIVE", "PASSIVE"})},
                         {"load_balance_algorithm",
                          d.r.OneOf({"SRCIP_DSTIP_VLAN", "SRCMAC_DSTMAC", "SRCIP_DSTIP", "DSTMAC", "VLAN"})},
                         {"uplink_num", d.r.Between(1, 4)}});
    }
    return groups;
}

json::value PrivateVlans(const Draw &d) {
    json::array pairs;
    for (const std::uint32_t id : d.sw.privateVlans) {
        const auto add = [&](std::uint32_t secondary, const char *type) {
            pairs.push_back(json::object{{"primary_id", id}, {"secondary_id", secondary}, {"type", type}});
        };
        add(id, "PROMISCUOUS");
        add(id + 1, "ISOLATED");
        if (d.r.Below(2)) add(id + 2, "COMMUNITY");
    }
    return pairs;
}

json::value LinkDiscovery(const Draw &d) {
    return json::object{{"protocol", d.r.OneOf({"CDP", "LLDP"})},
                        {"operation", d.r.OneOf({"NONE", "LISTEN", "ADVERTISE", "BOTH"})}};
}

std::string Ipv6(Random &r) {
    return fmt::format("2001:0db8:0000:0000:0000:0000:0000:{:04x}", r.Between(1, 65535));
}

std::string Ipv4(Random &r) {
    return fmt::format("198.51.100.{}", r.Between(1, 254));
}

// Some ports of the switch, by their keys.
json::array SomePorts(const Draw &d, std::uint32_t most) {
    json::array keys;
    const auto ports = static_cast<std::uint32_t>(d.sw.ports.size());
    if (ports == 0) return keys;
    const std::uint32_t first = d.r.Below(ports);
    for (std::uint32_t i = 0, count = std::min(ports, d.r.Between(1, most)); i < count; ++i)
        keys.emplace_back(d.sw.ports[(first + i) % ports]);
    return keys;
}

json::value Source(const Draw &d, const std::string &type) {
    if (type == "REMOTE_MIRROR_DEST") return json::object{{"vlans", json::array{d.r.Between(1, 4094)}}};
    json::object source{{"port_keys", SomePorts(d, 3)}};
    if (d.r.Percent(20))
        source["wildcard_port_connectee_types"] =
            json::array{d.r.OneOf({"VM_VNIC", "PNIC", "HOST_HYP_VNIC"})};
    return source;
}

json::value Destination(const Draw &d, const std::string &type) {
    const json::array uplink{d.r.Percent(50) ? json::string(d.sw.uplinkNames.front())
                                             : json::string(d.sw.uplinkNames.back())};
    if (type == "REMOTE_MIRROR_SOURCE") return json::object{{"uplink_port_names", uplink}};
    if (type == "ENCAPSULATED_REMOTE_MIRROR_SOURCE") {
        const std::string address = d.r.Percent(30) ? Ipv6(d.r) : Ipv4(d.r);
        return json::object{{"addresses", json::array{json::string(address)}}};
    }
    json::object destination{{"port_keys", SomePorts(d, 2)}};
    if (type == "MIXED_DEST_MIRROR") destination["uplink_port_names"] = uplink;
    return destination;
}

json::value MirrorSessions(const Draw &d) {
    json::array sessions;
    for (std::uint32_t i = 0, count = d.r.Between(1, 3); i < count; ++i) {
        const std::string type = d.r.OneOf({"MIXED_DEST_MIRROR", "DVPORT_MIRROR", "REMOTE_MIRROR_SOURCE",
                                            "REMOTE_MIRROR_DEST", "ENCAPSULATED_REMOTE_MIRROR_SOURCE"});
        json::object session{
            {"key", fmt::format("session-{}", i + 1)},
            {"name", d.r.OneOf({"to the analyser", "to the recorder", "intrusion detection"})},
            {"session_type", type},
            {"enabled", d.r.Percent(80)},
            {"strip_original_vlan", Truth(d)},
            {"normal_traffic_allowed", Truth(d)},
            {"encapsulation_vlan_id", d.r.Percent(50) ? 0 : d.r.Between(1, 4094)},
            {"sampling_rate", d.r.Between(1, 100)}};
        if (type == "ENCAPSULATED_REMOTE_MIRROR_SOURCE") {
            session["encap_type"] = d.r.OneOf({"GRE", "ERSPAN2", "ERSPAN3"});
            session["erspan_id"] = d.r.Below(1024);
            session["erspan_COS"] = d.r.Below(8);
        }
        if (d.r.Percent(20)) session["mirrored_packet_length"] = d.r.Between(1, 24) * 64;
        session["destination_port"] = Destination(d, type);
        if (d.r.Percent(80)) session["source_recv_port"] = Source(d, type);
        if (d.r.Percent(50)) session["source_transmit_port"] = Source(d, type);
        sessions.push_back(std::move(session));
    }
    return sessions;
}

json::value Ipfix(const Draw &d) {
    const std::string collector = d.r.Percent(25) ? Ipv6(d.r) : Ipv4(d.r);
    return json::object{{"idle_flow_timeout", d.r.Between(1, 8) * 15},
                        {"active_flow_timeout", d.r.Between(1, 10) * 60},
                        {"collector_address", collector},
                        {"collector_port", d.r.Percent(80) ? 4739 : 2055},
                        {"sampling_rate", d.r.Percent(50) ? 0 : d.r.Between(1, 1000)},
                        {"internal_flows_only", Truth(d)},
                        {"observation_domain_id", d.r.Below(1000)}};
}

json::value HealthCheck(const Draw &d) {
    return json::object{{"enabled", Truth(d)}, {"interval", d.r.Between(1, 10) * 60}};
}

json::value PoolKeys(const Draw &d) {
    json::array keys;
    for (const json::value &pool : d.sw.pools)
        keys.push_back(pool.at("key"));
    return keys;
}

json::value Teaming(const Draw &d) {
    auto uplinks = Shuffled(d.r, d.sw.uplinkNames);
    const std::uint32_t active = d.r.Between(1, static_cast<std::uint32_t>(uplinks.size()));
    const std::uint32_t standby = d.r.Below(static_cast<std::uint32_t>(uplinks.size()) - active + 1);
    const auto at = [&](std::uint32_t i) { return uplinks.begin() + static_cast<std::ptrdiff_t>(i); };
    return json::object{
        {"policy", d.r.OneOf({"LOADBALANCE_IP", "LOADBALANCE_SRCMAC", "LOADBALANCE_SRCID",
                              "LOADBALANCE_LOADBASED", "FAILOVER_EXPLICIT"})},
        {"reverse_policy", Truth(d)},
        {"rolling_order", Truth(d)},
        {"notify_switches", Truth(d)},
        {"best_effort", d.r.Percent(10)},
        {"shotgun", d.r.Percent(5)},
        {"failure_criteria", json::object{{"check_beacon", Truth(d)},
                                          {"lc_link_state", Truth(d)},
                                          {"full_duplex", d.r.Percent(10)},
                                          {"percentage", d.r.Percent(10) ? d.r.Between(1, 50) : 0},
                                          {"speed", d.r.Percent(10) ? d.r.Between(1, 200) : 0}}},
        {"uplink_port_order",
         json::object{{"active_uplink_ports", Texts({at(0), at(active)})},
                      {"standby_uplink_ports", Texts({at(active), at(active + standby)})}}}};
}

std::vector<std::string> FirstPorts(const SwitchPlan &sw) {
    return {sw.ports.begin(), sw.ports.begin() + static_cast<std::ptrdiff_t>(sw.uplinks)};
}

bool IsUplink(const Draw &d) {
    return d.port < d.sw.uplinks;
}

json::value PortAlias(const Draw &d) {
    if (IsUplink(d)) return Text(fmt::format("nic-{}", d.port + 1));
    return Text(fmt::format("{}-{}", d.r.OneOf({"web", "db", "app", "mail", "build"}), d.port + 1));
}

json::value PortGroup(const Draw &d) {
    return Text(IsUplink(d) ? "uplinks" : fmt::format("group-{}", d.r.Below(8)));
}

json::value Vlan(const Draw &d) {
    if (IsUplink(d)) {
        const json::object everything{{"start", 0}, {"end", 4094}};
        return json::object{{"trunk_vlan_ids", json::array{everything}}};
    }
    const std::uint32_t roll = d.r.Below(100);
    if (roll < 60) return json::object{{"vlan_id", roll < 5 ? 0 : d.r.Between(1, 4094)}};
    if (roll < 75) {
        const std::uint32_t which = d.r.Below(static_cast<std::uint32_t>(d.sw.privateVlans.size()));
        return json::object{{"pvlan_id", d.sw.privateVlans[which] + d.r.Below(2)}};
    }
    json::array ranges;
    std::uint32_t start = d.r.Between(1, 400);
    for (std::uint32_t i = 0, count = d.r.Between(1, 5); i < count; ++i) {
        const std::uint32_t end = d.r.Percent(30) ? start : start + d.r.Below(300);
        ranges.push_back(json::object{{"start", start}, {"end", end}});
        start = end + d.r.Between(2, 300);
    }
    return json::object{{"trunk_vlan_ids", ranges}};
}

json::value Shaping(const Draw &d) {
    const std::uint64_t average = d.r.Between(1, 100) * 8'000'000ull;
    return json::object{{"average_bandwidth", average},
                        {"peak_bandwidth", average * d.r.Between(1, 4)},
                        {"burst_size", d.r.Between(1, 64) * 65536ull}};
}

json::value Security(const Draw &d) {
    return json::object{
        {"allow_promiscuous", Truth(d)}, {"allow_mac_change", Truth(d)}, {"allow_forged_transmit", Truth(d)}};
}

json::value Filters(const Draw &d) {
    json::array filters;
    std::uint32_t slot = d.r.Below(4);
    for (std::uint32_t i = 0, count = d.r.Between(1, 3); i < count; ++i, slot += d.r.Between(1, 3)) {
        json::array parameters;
        for (std::uint32_t p = 0, most = d.r.Below(3); p < most; ++p)
            parameters.emplace_back(fmt::format("rule-{}=watch", d.r.Below(100)));
        filters.push_back(json::object{{"slot_number", std::to_string(slot)},
                                       {"agent_name", d.r.OneOf({"inspector", "firewall", "meter"})},
                                       {"on_failure", d.r.OneOf({"FAIL_OPEN", "FAIL_CLOSED"})},
                                       {"parameters", parameters}});
    }
    return json::object{{"network_filters", filters}};
}

json::value PortLacp(const Draw &d) {
    return json::object{{"enabled", Truth(d)}, {"mode", d.r.OneOf({"ACTIVE", "PASSIVE"})}};
}

enum class Who { Switch, Anybody, Uplinks, Guests };

struct Row {
    std::string_view key;
    Who who;
    std::uint32_t chance; // in percent, of a port that is not due for it
    json::value (*make)(const Draw &d);
};

// clang-format off
constexpr Row kRows[] = {
    // key                                     who            chance make
    {"com.orbeno.common.alias",                Who::Switch,      0, Alias},
    {"com.orbeno.common.version",              Who::Switch,      0, [](const Draw &d) -> json::value { return Text(d.sw.versionText); }},
    {"com.orbeno.common.portset.mtu",          Who::Switch,      0, Mtu},
    {"com.orbeno.vswitch.mtu",                 Who::Switch,      0, Mtu},
    {"com.orbeno.etherswitch.mtu",             Who::Switch,      0, Mtu},
    {"com.orbeno.common.opaqueDvs",            Who::Switch,      0, [](const Draw &d) -> json::value { return d.r.Percent(15); }},
    {"com.orbeno.common.uplinkPorts",          Who::Switch,      0, [](const Draw &d) -> json::value { return Texts(d.sw.uplinkNames); }},
    {"com.orbeno.etherswitch.lacp",            Who::Switch,      0, LacpGroups},
    {"com.orbeno.etherswitch.ipv4addr",        Who::Switch,      0, [](const Draw &d) -> json::value { return Text(fmt::format("192.0.2.{}", d.r.Between(1, 254))); }},
    {"com.orbeno.etherswitch.beaconTimeout",   Who::Switch,      0, [](const Draw &d) -> json::value { return d.r.Between(1, 10); }},
    {"com.orbeno.etherswitch.pvlanMap",        Who::Switch,      0, PrivateVlans},
    {"com.orbeno.vswitch.pvlanMap",            Who::Switch,      0, PrivateVlans},
    {"com.orbeno.etherswitch.cdp",             Who::Switch,      0, LinkDiscovery},
    {"com.orbeno.etherswitch.mirrorSessions",  Who::Switch,      0, MirrorSessions},
    {"com.orbeno.vswitch.mirrorSessions",      Who::Switch,      0, MirrorSessions},
    {"com.orbeno.common.portset.ovl",          Who::Switch,      0, [](const Draw &d) -> json::value { return d.sw.version >= kFirstOverlayVersion; }},
    {"com.orbeno.etherswitch.ipfix",           Who::Switch,      0, Ipfix},
    {"com.orbeno.etherswitch.multicastFilter", Who::Switch,      0, [](const Draw &d) -> json::value { return d.r.OneOf({"snooping", "legacyFiltering"}); }},
    {"com.orbeno.vswitch.multicastFilter",     Who::Switch,      0, [](const Draw &d) -> json::value { return d.r.OneOf({"snooping", "legacyFiltering"}); }},
    {"com.orbeno.common.vlanmtucheck.deploy",  Who::Switch,      0, HealthCheck},
    {"com.orbeno.common.teamcheck.deploy",     Who::Switch,      0, HealthCheck},
    {"com.orbeno.common.respools.cfg",         Who::Switch,      0, [](const Draw &d) -> json::value { return d.sw.pools; }},
    {"com.orbeno.common.respools.list",        Who::Switch,      0, PoolKeys},
    {"com.orbeno.common.respools.sched",       Who::Switch,      0, Truth},
    {"com.orbeno.common.respools.version",     Who::Switch,      0, [](const Draw &d) -> json::value { return d.r.OneOf({"version2", "version3"}); }},
    {"com.orbeno.common.resv.threshold",       Who::Switch,      0, [](const Draw &d) -> json::value { return d.r.Between(50, 90); }},
    {"com.orbeno.vswitch.teaming",             Who::Switch,      0, Teaming},
    {"com.orbeno.common.host.portset",         Who::Switch,      0, [](const Draw &d) -> json::value { return Text(fmt::format("DvsPortset-{}", d.sw.number)); }},
    {"com.orbeno.common.host.uplinkPorts",     Who::Switch,      0, [](const Draw &d) -> json::value { return Texts(FirstPorts(d.sw)); }},
    {"com.orbeno.common.port.alias",           Who::Anybody,    80, PortAlias},
    {"com.orbeno.common.port.connectid",       Who::Guests,     90, [](const Draw &d) -> json::value { return d.r.Below(2'000'000'000); }},
    {"com.orbeno.common.port.block",           Who::Guests,     10, Truth},
    {"com.orbeno.common.port.ptAllowed",       Who::Anybody,    20, Truth},
    {"com.orbeno.etherswitch.port.txUplink",   Who::Guests,     10, Truth},
    {"com.orbeno.vswitch.port.txUplink",       Who::Guests,     10, Truth},
    {"com.orbeno.common.port.portgroupid",     Who::Anybody,    95, PortGroup},
    {"com.orbeno.etherswitch.port.teaming",    Who::Guests,     70, Teaming},
    {"com.orbeno.vswitch.port.teaming.policy", Who::Guests,     70, Teaming},
    {"com.orbeno.etherswitch.port.vlan",       Who::Anybody,    95, Vlan},
    {"com.orbeno.vswitch.port.vlan",           Who::Anybody,    95, Vlan},
    {"com.orbeno.etherswitch.port.ipfix",      Who::Guests,     30, [](const Draw &) -> json::value { return true; }}, // false is kept by leaving it out
    {"com.orbeno.common.port.shaper.input",    Who::Guests,     50, Shaping},
    {"com.orbeno.common.port.shaper.output",   Who::Guests,     50, Shaping},
    {"com.orbeno.etherswitch.port.security",   Who::Anybody,    85, Security},
    {"com.orbeno.vswitch.port.security",       Who::Anybody,    85, Security},
    {"com.orbeno.common.port.dvfilter",        Who::Guests,     20, Filters},
    {"com.orbeno.common.port.respools.cfg",    Who::Uplinks,   100, [](const Draw &d) -> json::value { return d.sw.pools; }},
    {"com.orbeno.common.port.backingType",     Who::Guests,     50, [](const Draw &d) -> json::value { return d.r.OneOf({"portgroup", "network", "none"}); }},
    {"com.orbeno.vswitch.port.priority",       Who::Guests,     30, [](const Draw &d) -> json::value { return d.r.Below(8); }},
    {"com.orbeno.vswitch.port.mirrorSessions", Who::Guests,      5, MirrorSessions},
    {"com.orbeno.etherswitch.port.mirrorSessions", Who::Guests,  5, MirrorSessions},
    {"com.orbeno.etherswitch.port.lacp",       Who::Uplinks,   100, PortLacp},
};
// clang-format on

// The family whose keys the loads of a switch fill, by class; the private VLAN map goes by the version too,
// and a cswitch has no frame size of its own.
bool HasKey(const SwitchPlan &sw, std::string_view key) {
    const bool isCswitch = sw.className == "cswitch";
    const bool isVswitchKey = key.starts_with("com.orbeno.vswitch.");
    if (key.ends_with(".pvlanMap")) return isVswitchKey == (isCswitch || state::IsOverlayVersion(sw.version));
    if (key == "com.orbeno.common.host.uplinkPorts") return sw.uplinks > 0;
    const bool isVswitch = isCswitch || sw.className == "vswitch";
    if (isVswitchKey) return isVswitch && !(isCswitch && key == "com.orbeno.vswitch.mtu");
    return !(isVswitch && key.starts_with("com.orbeno.etherswitch."));
}

// A rotation over the guests makes sure of every key; beyond that it is the chance.
bool IsGiven(const Row &row, const Draw &d) {
    if (row.who == Who::Switch) return true;
    const bool isLucky = d.r.Percent(row.chance);
    if (IsUplink(d)) return row.who != Who::Guests && isLucky;
    const auto turn = static_cast<std::uint32_t>(&row - kRows);
    const auto guests = static_cast<std::uint32_t>(d.sw.ports.size()) - d.sw.uplinks;
    const bool isDue = (d.port - d.sw.uplinks + turn) % std::min(kGuestPeriod, guests) == 0;
    return row.who != Who::Uplinks && (isDue || isLucky);
}

// In the order of the mapping table, which is the one a load gives.
std::vector<TypedProperty> Properties(const Draw &d, std::uint32_t propClass) {
    std::vector<TypedProperty> properties;
    std::set<std::string_view> seen; // one key has two rows
    for (const auto *mapped = GetConfigMap(static_cast<int>(propClass)); mapped->key; ++mapped) {
        const std::string_view key = mapped->key;
        const auto row = std::ranges::find(kRows, key, &Row::key);
        if (row == std::end(kRows) || !HasKey(d.sw, key) || !seen.insert(key).second) continue;
        if (IsGiven(*row, d)) properties.push_back({key, row->make(d)});
    }
    return properties;
}

// Ports of overlay switches have ids of another kind, too long for a narrow port record.
std::string PortId(Random &r, const SwitchPlan &sw, std::uint32_t port) {
    if (sw.version < kFirstOverlayVersion || port < sw.uplinks) return std::to_string(port + 1);
    const std::uint32_t parts[] = {r.Below(0x10000), r.Below(0x10000), r.Below(0x10000)};
    return fmt::format("{:08x}-{:04x}-{:04x}-{:04x}-{:012x}", port + 1, parts[0], parts[1], parts[2],
                       sw.number);
}

json::array Pools(Random &r) {
    constexpr const char *kKeys[] = {"management", "virtualMachine", "storage", "backup", "replication"};
    json::array pools;
    for (std::uint32_t i = 0, count = r.Between(1, std::size(kKeys)); i < count; ++i) {
        const std::int64_t limit = r.Percent(50) ? -1 : std::int64_t{r.Between(1000, 10000)};
        const json::object allocation{{"reservation", r.Below(1000)},
                                      {"limit", limit},
                                      {"shares", json::object{{"shares", r.Between(1, 4) * 25}}}};
        pools.push_back(json::object{{"key", kKeys[i]}, {"allocation", allocation}});
    }
    return pools;
}

} // namespace

SwitchSort SortOf(std::uint32_t number) {
    return kSorts[number % std::size(kSorts)];
}

std::string VersionText(std::uint32_t version) {
    std::uint8_t bytes[sizeof version];
    data::Store32(bytes, version);
    return typed::Describe(DVS_PROP_CLASS_GLOBAL, "com.orbeno.common.version", bytes).tree.text;
}

SwitchPlan PlanSwitch(Random &random, std::uint32_t number, SwitchSort sort, std::uint32_t ports) {
    SwitchPlan plan;
    plan.number = number;
    plan.className = sort.className;
    plan.version = sort.version;
    plan.versionText = VersionText(sort.version);
    plan.uplinks = std::min(2 + number % 3, std::max(ports, 2u) - 1); // of two ports or more one is a guest
    plan.uplinks = std::min(plan.uplinks, ports);
    for (std::uint32_t i = 0; i < ports; ++i)
        plan.ports.push_back(PortId(random, plan, i));
    for (std::uint32_t i = 0; i < std::max(plan.uplinks, 2u); ++i)
        plan.uplinkNames.push_back(fmt::format("uplink{}", i + 1));
    for (std::uint32_t i = 0, members = random.Below(3); i < members; ++i)
        plan.uplinkNames.push_back(fmt::format("lag1-{}", i));
    constexpr std::uint32_t kMtus[] = {1500, 9000, 1600};
    plan.mtu = kMtus[random.Below(std::size(kMtus))];
    plan.pools = Pools(random);
    for (std::uint32_t i = 0, count = random.Between(1, 4); i < count; ++i)
        plan.privateVlans.push_back(200 + 10 * i + 1000 * random.Below(3));
    std::ranges::sort(plan.privateVlans);
    plan.privateVlans.erase(std::unique(plan.privateVlans.begin(), plan.privateVlans.end()),
                            plan.privateVlans.end());
    return plan;
}

std::vector<TypedProperty> DrawSwitchProperties(Random &random, const SwitchPlan &plan,
                                                std::uint32_t propClass) {
    return Properties({random, plan}, propClass);
}

json::value ExampleOf(std::string_view key) {
    constexpr std::uint32_t kPorts = 12, kGuest = 4;
    Random random(2);
    const auto row = std::ranges::find(kRows, key, &Row::key);
    if (row == std::end(kRows)) return nullptr;
    return row->make({random, PlanSwitch(random, 0, SortOf(0), kPorts), kGuest});
}

std::vector<TypedProperty> DrawPortProperties(Random &random, const SwitchPlan &plan, std::uint32_t port) {
    return Properties({random, plan, port}, DVS_PROP_CLASS_PORT);
}

} // namespace dvs::ctl
