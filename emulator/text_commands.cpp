/* SPDX-License-Identifier: Apache-2.0 */
// Text commands, for people and scripts that watch and control the module, in one table. Replies are lines of
// text; switch and port names are escaped.

#include <algorithm>
#include <array>
#include <cstring>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "emulator/module.h"
#include "emulator/reply_value.h"

namespace dvs::emulator {

/// The arguments of a text command.
struct Module::TextArguments {
    const Call &call;
    std::string_view rest;          // the text after the name
    std::vector<std::string> words; // the same, split at spaces; "…" keeps spaces together
};

struct TextCommandTable {
    using Handler = HYP_ReturnStatus (Module::*)(const Module::TextArguments &, std::string *);
    struct Row {
        std::string_view name;
        std::string_view arguments;
        std::string_view help;
        Handler handler;
    };
    static constexpr std::array kRows = {
        Row{"help", "", "list the text commands", &Module::TextHelp},
        Row{"stats", "", "counts of commands, switches and ports", &Module::TextStats},
        Row{"ports", "[SWITCH]", "a switch's ports: id, kind, connection id, link", &Module::TextPorts},
        Row{"event", "[SWITCH] PORT up|down", "set a port's link up or down", &Module::TextEvent},
        Row{"save", "", "save the state to the state file", &Module::TextSave},
        Row{"fault", "SPEC|list|clear", "inject faults: failed, delayed or dropped commands",
            &Module::TextFault},
    };
};

namespace {

constexpr std::string_view kKinds[] = {"none", "active", "shadow", "zombie", "local-cache"};

/// Formats a name for a reply: quoted, with everything but plain printing characters escaped.
std::string Quoted(std::string_view text) {
    static constexpr char kHex[] = "0123456789abcdef";
    std::string quoted = "\"";
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x20 || byte >= 0x7f || c == '"' || c == '\\') {
            quoted += "\\x";
            quoted += kHex[byte >> 4];
            quoted += kHex[byte & 15];
        } else {
            quoted += c;
        }
    }
    return quoted + '"';
}

std::string_view SkipBlanks(std::string_view text) {
    text.remove_prefix(std::min(text.find_first_not_of(' '), text.size()));
    return text;
}

std::vector<std::string> Split(std::string_view text) {
    std::vector<std::string> words;
    for (text = SkipBlanks(text); !text.empty(); text = SkipBlanks(text)) {
        const bool quoted = text.front() == '"';
        if (quoted) text.remove_prefix(1);
        const std::size_t size = std::min(text.find(quoted ? '"' : ' '), text.size());
        words.emplace_back(text.substr(0, size));
        text.remove_prefix(std::min(size + 1, text.size()));
    }
    return words;
}

/// Switch ids often contain spaces, so all words except the last `behind` form one id. Without any, uses the
/// record's.
std::string SwitchOf(const Call &call, const std::vector<std::string> &words, std::size_t behind) {
    if (words.size() <= behind) return call.record.switchName;
    std::string id = words[0];
    for (std::size_t i = 1; i + behind < words.size(); i++)
        id += ' ' + words[i];
    return id;
}

std::string_view KindName(uint32_t kind) {
    return kind < std::size(kKinds) ? kKinds[kind] : "unknown";
}

uint32_t ConnectionId(DVSPort *port) {
    void *value = nullptr;
    uint32_t size = 0;
    uint32_t id = 0;
    if (DVSState_PortDataRead(port, kConnectionIdProp, &value, &size) == HYP_OK && size >= sizeof id)
        std::memcpy(&id, value, sizeof id);
    return id;
}

/// The arguments of a walk: the extra data, and the reply to append to.
struct Listing {
    Extras *extras;
    std::string *reply;
};

bool ListSwitch(DVSwitch *sw, void *arg) {
    auto *listing = static_cast<Listing *>(arg);
    const auto extras = listing->extras->find(std::string_view(DVS_SwitchId(sw)));
    const bool associated = extras != listing->extras->end() && extras->second.associated;
    *listing->reply += "switch " + Quoted(DVS_SwitchId(sw)) + " class " + Quoted(DVS_ClassName(sw)) +
                       " version " + std::to_string(DVS_Version(sw)) + " max-ports " +
                       std::to_string(DVS_GetNewMaxPorts(sw)) + " ports " + std::to_string(sw->numPorts) +
                       (associated ? " associated\n" : " dissociated\n");
    return false;
}

bool ListPort(DVSPort *port, void *arg) {
    auto *listing = static_cast<Listing *>(arg);
    const auto sw = listing->extras->find(std::string_view(DVS_SwitchId(port->owner)));
    bool up = false;
    if (sw != listing->extras->end()) {
        const auto extras = sw->second.ports.find(std::string_view(DVS_PortId(port)));
        up = extras != sw->second.ports.end() && extras->second.linkUp;
    }
    *listing->reply += "port " + Quoted(DVS_PortId(port)) + " kind ";
    *listing->reply += KindName(port->portType);
    *listing->reply +=
        " connection " + std::to_string(ConnectionId(port)) + (up ? " link up\n" : " link down\n");
    return false;
}

using Ids = std::unordered_set<uint32_t>;

bool CollectConnectionId(DVSPort *port, void *arg) {
    static_cast<Ids *>(arg)->insert(ConnectionId(port));
    return false;
}

bool CollectConnectionIds(DVSwitch *sw, void *arg) {
    DVSState_PortForEach(sw, CollectConnectionId, arg);
    return false;
}

bool CountSwitch(DVSwitch *sw, void *arg) {
    auto *counts = static_cast<std::pair<uint32_t, uint32_t> *>(arg);
    counts->first++;
    counts->second += sw->numPorts;
    return false;
}

} // namespace

HYP_ReturnStatus Module::CmdExec(const Call &call, Answer *answer) {
    const std::string_view text = SkipBlanks(call.record.cmd);
    const std::size_t nameSize = std::min(text.find(' '), text.size());
    const std::string_view rest = SkipBlanks(text.substr(nameSize));
    std::string reply;
    HYP_ReturnStatus status = HYP_NOT_SUPPORTED;
    for (const TextCommandTable::Row &row : TextCommandTable::kRows) {
        if (row.name != text.substr(0, nameSize)) continue;
        status = (this->*row.handler)({call, rest, Split(rest)}, &reply);
        break;
    }
    if (status != HYP_OK) return status;
    answer->cmdOutLen = static_cast<uint32_t>(reply.size());
    if (answer->cmdOutLen > call.record.cmdOutLen) return HYP_LIMIT_EXCEEDED;
    void *copy = std::malloc(reply.size() + 1);
    if (!copy) return HYP_NO_MEMORY;
    std::memcpy(copy, reply.data(), reply.size());
    answer->payload = {static_cast<const char *>(copy), answer->cmdOutLen, Block(copy)};
    return HYP_OK;
}

HYP_ReturnStatus Module::TextHelp(const TextArguments &, std::string *reply) {
    for (const TextCommandTable::Row &row : TextCommandTable::kRows) {
        std::string usage = std::string(row.name) + ' ' + std::string(row.arguments);
        usage.resize(std::max<std::size_t>(usage.size() + 1, 30), ' ');
        *reply += usage + std::string(row.help) + '\n';
    }
    return HYP_OK;
}

HYP_ReturnStatus Module::TextStats(const TextArguments &, std::string *reply) {
    std::pair<uint32_t, uint32_t> counts{0, 0};
    DVSState_SwitchForEach(CountSwitch, &counts);
    *reply += "switches " + std::to_string(counts.first) + "\nports " + std::to_string(counts.second) +
              "\nport-limit " + std::to_string(uwMaxNumActivePortsSystemWide) + "\nrefused " +
              std::to_string(counters_.refused) + "\nsaves " + std::to_string(counters_.saves) + "\n";
    for (std::size_t number = 0; number < counters_.calls.size(); number++) {
        const uint64_t calls = counters_.calls[number];
        if (calls) *reply += "command " + std::to_string(number) + ' ' + std::to_string(calls) + '\n';
    }
    Listing listing{&extras_, reply};
    DVSState_SwitchForEach(ListSwitch, &listing);
    return HYP_OK;
}

HYP_ReturnStatus Module::TextPorts(const TextArguments &arguments, std::string *reply) {
    DVSwitch *sw = DVSState_SwitchFind(SwitchOf(arguments.call, arguments.words, 0).c_str());
    if (!sw) return HYP_NOT_FOUND;
    Listing listing{&extras_, reply};
    DVSState_PortForEach(sw, ListPort, &listing);
    return HYP_OK;
}

HYP_ReturnStatus Module::TextEvent(const TextArguments &arguments, std::string *) {
    const auto &words = arguments.words;
    if (words.size() < 2 || (words.back() != "up" && words.back() != "down")) return HYP_BAD_PARAM;
    DVSPort *port =
        DVSState_PortFind(SwitchOf(arguments.call, words, 2).c_str(), words[words.size() - 2].c_str());
    if (!port) return HYP_NOT_FOUND;
    const HYP_ReturnStatus status = words.back() == "up" ? LinkUp(port) : LinkDown(port);
    fetchedState_.reset();
    return status == HYP_OK && sync_ ? SaveState() : status;
}

/// Returns an unused number: agents assign some themselves, and a loaded state contains others.
uint32_t Module::NextConnectionId() {
    Ids taken{0}; // 0 is none
    DVSState_SwitchForEach(CollectConnectionIds, &taken);
    while (taken.contains(++lastConnectionId_)) {
    }
    return lastConnectionId_;
}

/// A link that comes up gets a connection number, unless the agent has already assigned one.
HYP_ReturnStatus Module::LinkUp(DVSPort *port) {
    PortExtras &extras = ExtrasOf(port);
    extras.linkUp = true;
    if (ConnectionId(port) != 0) return HYP_OK;
    const uint32_t id = NextConnectionId();
    const HYP_ReturnStatus status = DVSState_PortDataSet(port, kConnectionIdProp, &id, sizeof id, 0);
    extras.assignedConnectionId = status == HYP_OK;
    return status;
}

HYP_ReturnStatus Module::LinkDown(DVSPort *port) {
    PortExtras &extras = ExtrasOf(port);
    extras.linkUp = false;
    if (!extras.assignedConnectionId) return HYP_OK;
    extras.assignedConnectionId = false;
    const HYP_ReturnStatus status = DVSState_PortDataClear(port, kConnectionIdProp);
    // The agent may have cleared it.
    return status == HYP_NOT_FOUND ? static_cast<HYP_ReturnStatus>(HYP_OK) : status;
}

HYP_ReturnStatus Module::TextSave(const TextArguments &, std::string *reply) {
    if (stateFile_.empty()) return HYP_BAD_PARAM;
    const HYP_ReturnStatus status = SaveState();
    if (status == HYP_OK) *reply = "saved\n";
    return status;
}

HYP_ReturnStatus Module::TextFault(const TextArguments &arguments, std::string *reply) {
    if (arguments.rest == "clear") {
        faults_.Clear();
        return HYP_OK;
    }
    if (arguments.rest == "list") {
        for (const Fault &fault : faults_.All())
            *reply += fault.text + " seen " + std::to_string(fault.seen) + '\n';
        return HYP_OK;
    }
    std::string why;
    return faults_.Add(arguments.rest, &why) ? HYP_OK : HYP_BAD_PARAM;
}

} // namespace dvs::emulator
