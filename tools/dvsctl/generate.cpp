/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl generate`: states of any size for trials. What is generated is a document in the typed form, read
// like any other; the same seed gives the same bytes on every machine.

#include <algorithm>
#include <charconv>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/parse.hpp>
#include <boost/json/serialize.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvs/configstore.h"
#include "tools/dvsctl/commands.h"
#include "tools/dvsctl/envelope.h"
#include "tools/dvsctl/json_codec.h"
#include "tools/dvsctl/show.h"
#include "tools/dvsctl/source.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

// SplitMix64: small, and the same everywhere, unlike the standard library's distributions.
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
    const char *Flag() { return Below(2) ? "true" : "false"; }
    const char *OneOf(std::initializer_list<const char *> texts) {
        return texts.begin()[Below(static_cast<std::uint32_t>(texts.size()))];
    }

private:
    std::uint64_t state_;
};

struct Maker {
    std::string_view key; // behind "com.orbeno." and the family's part
    std::string (*make)(Random &r, std::uint32_t number);
};

std::string Shaping(Random &r, std::uint32_t) {
    const std::uint64_t average = r.Between(1, 100) * 8'000'000ull;
    return fmt::format(R"({{"average_bandwidth":{},"peak_bandwidth":{},"burst_size":{}}})", average,
                       average * 2, r.Between(1, 64) * 65536);
}

std::string Teaming(Random &r, std::uint32_t) {
    const bool first = r.Below(2) != 0;
    return fmt::format(R"({{"policy":"{}","reverse_policy":{},"rolling_order":{},"notify_switches":{},
        "failure_criteria":{{"check_beacon":{}}},"uplink_port_order":{{"active_uplink_ports":["uplink{}"],
        "standby_uplink_ports":["uplink{}"]}}}})",
                       r.OneOf({"LOADBALANCE_IP", "LOADBALANCE_SRCMAC", "LOADBALANCE_SRCID"}), r.Flag(),
                       r.Flag(), r.Flag(), r.Flag(), first ? 1 : 2, first ? 2 : 1);
}

std::string Vlan(Random &r, std::uint32_t) {
    const std::uint32_t start = r.Between(1, 3000);
    if (r.Below(4) != 0) return fmt::format(R"({{"vlan_id":{}}})", start);
    return fmt::format(R"({{"trunk_vlan_ids":[{{"start":{},"end":{}}}]}})", start, start + r.Below(1000));
}

std::string Security(Random &r, std::uint32_t) {
    return fmt::format(R"({{"allow_promiscuous":{},"allow_mac_change":{},"allow_forged_transmit":{}}})",
                       r.Flag(), r.Flag(), r.Flag());
}

std::string Mirror(Random &r, std::uint32_t) {
    return fmt::format(R"([{{"key":"session-1","name":"mirror","session_type":"DVPORT_MIRROR",
        "enabled":{},"sampling_rate":{},"encapsulation_vlan_id":{}}}])",
                       r.Flag(), r.Between(1, 100), r.Between(1, 4000));
}

std::string Pools(Random &r, std::uint32_t) {
    return fmt::format(R"([{{"key":"virtualMachine","allocation":{{"reservation":{},"limit":-1,
        "shares":{{"shares":{}}}}}}}])",
                       r.Below(1000), r.Between(1, 100));
}

std::string PrivateVlans(Random &r, std::uint32_t) {
    const std::uint32_t id = r.Between(100, 3000);
    return fmt::format(R"([{{"primary_id":{0},"secondary_id":{0},"type":"PROMISCUOUS"}},
        {{"primary_id":{0},"secondary_id":{1},"type":"ISOLATED"}}])",
                       id, id + 1);
}

std::string HealthCheck(Random &r, std::uint32_t) {
    return fmt::format(R"({{"enabled":{},"interval":{}}})", r.Flag(), r.Between(1, 10) * 60);
}

std::string Mtu(Random &r, std::uint32_t) {
    return r.OneOf({"1500", "9000"});
}

std::string Multicast(Random &r, std::uint32_t) {
    return r.OneOf({"\"snooping\"", "\"legacyFiltering\""});
}

std::string Truth(Random &r, std::uint32_t) {
    return r.Flag();
}

std::string Always(Random &, std::uint32_t) {
    return "true"; // false would not come back from a load as a property
}

// Keys by what stands behind the family's part, "etherswitch." or "vswitch.".
// clang-format off
constexpr Maker kMakers[] = {
    {"common.alias",               [](Random &, std::uint32_t n) { return fmt::format("\"switch-{}\"", n); }},
    {"common.version",             [](Random &, std::uint32_t) { return std::string("\"7.0.2\""); }},
    {"common.portset.mtu",         Mtu},
    {"mtu",                        Mtu},
    {"common.opaqueDvs",           Always},
    {"common.uplinkPorts",         [](Random &, std::uint32_t) { return std::string(R"(["uplink1","uplink2"])"); }},
    {"lacp",                       [](Random &r, std::uint32_t) { return fmt::format(R"([{{"key":"lag1","name":"lag1","mode":"{}","load_balance_algorithm":"SRCIP_DSTIP_VLAN","uplink_num":{}}}])", r.OneOf({"ACTIVE", "PASSIVE"}), r.Between(1, 4)); }},
    {"ipv4addr",                   [](Random &r, std::uint32_t) { return fmt::format("\"192.0.2.{}\"", r.Between(1, 254)); }},
    {"beaconTimeout",              [](Random &r, std::uint32_t) { return std::to_string(r.Between(1, 10)); }},
    {"pvlanMap",                   PrivateVlans},
    {"cdp",                        [](Random &r, std::uint32_t) { return fmt::format(R"({{"protocol":"{}","operation":"{}"}})", r.OneOf({"CDP", "LLDP"}), r.OneOf({"LISTEN", "ADVERTISE", "BOTH"})); }},
    {"mirrorSessions",             Mirror},
    {"common.portset.ovl",         [](Random &, std::uint32_t) { return std::string("false"); }},
    {"ipfix",                      [](Random &r, std::uint32_t) { return fmt::format(R"({{"idle_flow_timeout":15,"active_flow_timeout":60,"collector_address":"198.51.100.{}","collector_port":4739,"sampling_rate":{},"internal_flows_only":{},"observation_domain_id":{}}})", r.Between(1, 254), r.Below(1000), r.Flag(), r.Below(100)); }},
    {"multicastFilter",            Multicast},
    {"common.vlanmtucheck.deploy", HealthCheck},
    {"common.teamcheck.deploy",    HealthCheck},
    {"common.respools.cfg",        Pools},
    {"common.respools.list",       [](Random &, std::uint32_t) { return std::string(R"(["virtualMachine"])"); }},
    {"common.respools.sched",      Truth},
    {"common.respools.version",    [](Random &r, std::uint32_t) { return std::string(r.OneOf({"\"version2\"", "\"version3\""})); }},
    {"common.resv.threshold",      [](Random &r, std::uint32_t) { return std::to_string(r.Between(50, 90)); }},
    {"teaming",                    Teaming},
    {"common.host.portset",        [](Random &, std::uint32_t n) { return fmt::format("\"DvsPortset-{}\"", n); }},
    {"common.host.uplinkPorts",    [](Random &, std::uint32_t) { return std::string(R"(["1","2"])"); }},
    {"common.port.alias",          [](Random &r, std::uint32_t n) { return fmt::format("\"{}-{}\"", r.OneOf({"web", "db", "app"}), n); }},
    {"common.port.connectid",      [](Random &r, std::uint32_t) { return std::to_string(r.Below(2'000'000'000)); }},
    {"common.port.block",          Always},
    {"common.port.ptAllowed",      Truth},
    {"port.txUplink",              Truth},
    {"common.port.portgroupid",    [](Random &r, std::uint32_t) { return fmt::format("\"group-{}\"", r.Below(8)); }},
    {"port.teaming",               Teaming},
    {"port.teaming.policy",        Teaming},
    {"port.vlan",                  Vlan},
    {"port.ipfix",                 Always},
    {"common.port.shaper.input",   Shaping},
    {"common.port.shaper.output",  Shaping},
    {"port.security",              Security},
    {"common.port.dvfilter",       [](Random &r, std::uint32_t) { return fmt::format(R"({{"network_filters":[{{"slot_number":"{}","agent_name":"inspector","on_failure":"{}","parameters":["mode=watch"]}}]}})", r.Between(1, 12), r.OneOf({"FAIL_OPEN", "FAIL_CLOSED"})); }},
    {"common.port.respools.cfg",   Pools},
    {"common.port.backingType",    [](Random &, std::uint32_t) { return std::string("\"portgroup\""); }},
    {"port.priority",              [](Random &r, std::uint32_t) { return std::to_string(r.Below(8)); }},
    {"port.mirrorSessions",        Mirror},
    {"port.lacp",                  [](Random &r, std::uint32_t) { return fmt::format(R"({{"enabled":{},"mode":"{}"}})", r.Flag(), r.OneOf({"ACTIVE", "PASSIVE"})); }},
};
// clang-format on

struct Family {
    const char *className;
    const char *prefix, *others;
};
constexpr Family kFamilies[] = {
    {"etherswitch", "com.orbeno.etherswitch.", "com.orbeno.vswitch."},
    {"vswitch", "com.orbeno.vswitch.", "com.orbeno.etherswitch."},
    {"cswitch", "com.orbeno.vswitch.", "com.orbeno.etherswitch."},
};

// One of every key that the mapping table has for the family.
json::array PropertiesOf(const Family &family, std::uint32_t propClass, std::uint32_t number, Random &r) {
    constexpr std::string_view kCommon = "com.orbeno.";
    json::array properties;
    std::string_view previous;
    for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
        const std::string_view key = row->key;
        if (key.starts_with(family.others) || key == previous) continue;
        previous = key;
        const bool isOwn = key.starts_with(family.prefix);
        if (!isOwn && !key.starts_with(kCommon)) continue; // what stands for every other key
        const std::string_view rest =
            key.substr(isOwn ? std::string_view(family.prefix).size() : kCommon.size());
        for (const Maker &maker : kMakers) {
            if (maker.key != rest) continue;
            properties.emplace_back(
                json::object{{"name", key}, {"typed", json::parse(maker.make(r, number))}});
        }
    }
    return properties;
}

json::object MakeSwitch(std::uint32_t number, std::uint32_t ports, Random &r) {
    const Family &family = kFamilies[number % std::size(kFamilies)];
    std::string id;
    for (int i = 0; i < 16; ++i)
        id += fmt::format("{}{:02x}", i == 0 ? "" : i == 8 ? "-" : " ", r.Below(256));
    json::array list;
    json::object sw{
        {"id", id}, {"version", 8}, {"class", family.className}, {"max_ports", std::max(ports, 512u)}};
    sw["global"] = PropertiesOf(family, DVS_PROP_CLASS_GLOBAL, number, r);
    sw["host"] = PropertiesOf(family, DVS_PROP_CLASS_HOST, number, r);
    for (std::uint32_t port = 1; port <= ports; ++port)
        list.emplace_back(json::object{{"id", std::to_string(port)},
                                       {"properties", PropertiesOf(family, DVS_PROP_CLASS_PORT, port, r)}});
    sw["ports"] = std::move(list);
    return sw;
}

std::uint64_t NumberOf(const char *option, const std::optional<std::string> &text, std::uint64_t otherwise,
                       std::uint64_t most) {
    if (!text) return otherwise;
    std::uint64_t number = 0;
    const char *end = text->data() + text->size();
    const auto [stop, error] = std::from_chars(text->data(), end, number);
    if (error != std::errc() || stop != end || number > most)
        throw Error(Exit::Usage, fmt::format("{} is no number from 0 to {}", option, most)).At(*text);
    return number;
}

} // namespace

Exit RunGenerate(Context &context) {
    const Options &options = context.options;
    const auto switches = NumberOf("--switches", options.switchCount, 3, 1000);
    const auto ports = static_cast<std::uint32_t>(NumberOf("--ports", options.portCount, 16, 65536));
    Random random(NumberOf("--seed", options.seed, 1, UINT64_MAX));
    const auto to = OpenSource(options.target);
    json::array list;
    for (std::uint32_t i = 0; i < switches; ++i)
        list.emplace_back(MakeSwitch(i, ports, random));
    const auto bytes = StateFromJsonText(json::serialize(json::object{{"switches", std::move(list)}}));
    const StateCount count = CountState(ParseState(bytes));
    if (!options.dryRun) to->Write(context, bytes);
    if (options.json) {
        json::object document = Envelope("generate");
        document["to"] = ValidUtf8(to->Name());
        document["is_written"] = !options.dryRun;
        document["bytes"] = bytes.size();
        document["summary"] = CountJson(count);
        context.out.Json(std::move(document));
    } else if (!to->IsStandardOutput()) {
        context.out.Remark(fmt::format("{} {} in {}\n", options.dryRun ? "would put" : "generated",
                                       ShowCount(count), ShowName(to->Name())));
    }
    return Exit::Done;
}

} // namespace dvs::ctl
