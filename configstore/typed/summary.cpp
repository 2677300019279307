/* SPDX-License-Identifier: Apache-2.0 */
// Trees as one line for people (tree.h). Types that read better in words of their own have a function in the
// table at the end; all others list their fields.

#include <algorithm>
#include <array>
#include <iterator>

#include "configstore/typed/tree.h"

namespace dvs::typed {
namespace {

std::string Join(const std::vector<std::string> &parts) {
    std::string line;
    for (const std::string &part : parts)
        line += (line.empty() ? "" : ", ") + part;
    return line;
}

std::string NumberText(const Node &node) {
    const std::string number = std::to_string(node.number);
    return *node.unit ? number + " " + node.unit : number;
}

// "100 Mbit/s" where that says all of it.
std::string RateText(const Node &node) {
    constexpr std::pair<int64_t, const char *> kSteps[] = {
        {1'000'000'000, " G"}, {1'000'000, " M"}, {1'000, " k"}};
    for (const auto &[step, letter] : kSteps) {
        if (node.number > 0 && node.number % step == 0)
            return std::to_string(node.number / step) + letter + node.unit;
    }
    return NumberText(node);
}

int64_t NumberOf(const Node &object, std::string_view name) {
    const Node *member = object.Find(name);
    return member ? member->number : 0;
}

std::string NamesOf(const Node *list) {
    std::vector<std::string> names;
    if (list) {
        for (const Node &item : list->items)
            names.push_back(item.text);
    }
    return Join(names);
}

std::string SummarizeVlan(const Node &tree) {
    const Node *ranges = tree.Find("trunk_vlan_ids");
    if (!ranges || ranges->items.empty()) {
        if (const Node *id = tree.Find("pvlan_id")) return "private VLAN " + std::to_string(id->number);
        const Node *id = tree.Find("vlan_id");
        return id ? "VLAN " + std::to_string(id->number) : "trunk without ranges";
    }
    std::string line;
    for (const Node &range : ranges->items) {
        const int64_t start = NumberOf(range, "start");
        const int64_t end = NumberOf(range, "end");
        line += (line.empty() ? "trunk " : ",") + std::to_string(start);
        if (end != start) line += "-" + std::to_string(end);
    }
    return line;
}

std::string SummarizeTeaming(const Node &tree) {
    const Node *policy = tree.Find("policy");
    std::vector<std::string> parts = {policy ? policy->text : "no policy"};
    const Node *order = tree.Find("uplink_port_order");
    const std::string active = order ? NamesOf(order->Find("active_uplink_ports")) : "";
    const std::string standby = order ? NamesOf(order->Find("standby_uplink_ports")) : "";
    if (!active.empty()) parts.push_back("active " + active);
    if (!standby.empty()) parts.push_back("standby " + standby);
    return Join(parts);
}

std::string SummarizeShaping(const Node &tree) {
    std::vector<std::string> parts;
    for (const auto &[name, words] :
         {std::pair("average_bandwidth", "average "), std::pair("peak_bandwidth", "peak "),
          std::pair("burst_size", "burst ")}) {
        if (const Node *limit = tree.Find(name)) parts.push_back(words + RateText(*limit));
    }
    return Join(parts);
}

std::string SummarizeSecurity(const Node &tree) {
    std::vector<std::string> rejected;
    for (const auto &[name, words] :
         {std::pair("allow_promiscuous", "promiscuous mode"), std::pair("allow_mac_change", "MAC changes"),
          std::pair("allow_forged_transmit", "forged transmits")}) {
        const Node *allowed = tree.Find(name);
        if (allowed && !allowed->flag) rejected.emplace_back(words);
    }
    return rejected.empty() ? "rejects nothing" : "rejects " + Join(rejected);
}

std::string SummarizePrivateVlans(const Node &tree) {
    std::vector<std::string> pairs;
    for (const Node &entry : tree.items) {
        const Node *type = entry.Find("type");
        pairs.push_back(std::to_string(NumberOf(entry, "primary_id")) + "/" +
                        std::to_string(NumberOf(entry, "secondary_id")) + (type ? " " + type->text : ""));
    }
    return pairs.empty() ? "none" : Join(pairs);
}

// "to the analyser: ports 10, 11 to uplink2".
std::string SummarizeSessions(const Node &tree) {
    std::string line;
    for (const Node &session : tree.items) {
        const Node *title = session.Find("name");
        if (!title || title->text.empty()) title = session.Find("key");
        std::vector<std::string> sources, destinations;
        const auto collect = [&session](const char *object, std::initializer_list<const char *> lists,
                                        std::vector<std::string> *out) {
            const Node *ports = session.Find(object);
            for (const char *list : lists) {
                const Node *items = ports ? ports->Find(list) : nullptr;
                if (!items) continue;
                const bool areVlans = std::string_view(list) == "vlans";
                for (const Node &item : items->items) {
                    const std::string name = areVlans ? "VLAN " + std::to_string(item.number) : item.text;
                    if (std::find(out->begin(), out->end(), name) == out->end()) out->push_back(name);
                }
            }
        };
        for (const char *source : {"source_recv_port", "source_transmit_port"})
            collect(source, {"wildcard_port_connectee_types", "port_keys", "vlans"}, &sources);
        collect("destination_port", {"port_keys", "uplink_port_names", "addresses"}, &destinations);
        const Node *enabled = session.Find("enabled");
        line += (line.empty() ? "" : "; ") + (title ? title->text : std::string("session")) + ": " +
                (sources.empty() ? "nothing" : Join(sources)) + " to " +
                (destinations.empty() ? "nowhere" : Join(destinations)) +
                (enabled && !enabled->flag ? " (disabled)" : "");
    }
    return line.empty() ? "none" : line;
}

struct Row {
    ConverterType type;
    std::string (*summarize)(const Node &tree);
};
constexpr Row kRows[] = {
    {ConverterType::kEtherswitchPrivateVlans, SummarizePrivateVlans},
    {ConverterType::kVswitchPrivateVlans, SummarizePrivateVlans},
    {ConverterType::kMirrorSessions, SummarizeSessions},
    {ConverterType::kEtherswitchTeaming, SummarizeTeaming},
    {ConverterType::kVswitchTeaming, SummarizeTeaming},
    {ConverterType::kEtherswitchPortVlan, SummarizeVlan},
    {ConverterType::kVswitchPortVlan, SummarizeVlan},
    {ConverterType::kShaping, SummarizeShaping},
    {ConverterType::kEtherswitchMacSecurity, SummarizeSecurity},
    {ConverterType::kVswitchMacSecurity, SummarizeSecurity},
};

} // namespace

std::string ToLine(const Node &node) {
    std::vector<std::string> parts;
    switch (node.kind) {
    case Node::Kind::kNull:
        return "nothing";
    case Node::Kind::kBool:
        return node.flag ? "true" : "false";
    case Node::Kind::kNumber:
        return NumberText(node);
    case Node::Kind::kText:
        return node.text;
    case Node::Kind::kList:
        if (node.items.empty()) return "none";
        for (const Node &item : node.items) {
            const bool isObject = item.kind == Node::Kind::kObject;
            parts.push_back(isObject ? "(" + ToLine(item) + ")" : ToLine(item));
        }
        return Join(parts);
    case Node::Kind::kObject:
        break;
    }
    for (const Node &item : node.items) {
        const bool isObject = item.kind == Node::Kind::kObject;
        parts.push_back(item.name + " " + (isObject ? "(" + ToLine(item) + ")" : ToLine(item)));
    }
    return Join(parts);
}

std::string Summarize(ConverterType type, const Node &tree) {
    for (const Row &row : kRows) {
        if (row.type == type) return row.summarize(tree);
    }
    return ToLine(tree);
}

} // namespace dvs::typed
