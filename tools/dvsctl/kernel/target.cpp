/* SPDX-License-Identifier: Apache-2.0 */
// Names on their way into the request record, and what it means when the module does not know them.

#include "tools/dvsctl/kernel/target.h"

#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvs/hyp.h"
#include "form/json/codec.h"
#include "tools/dvsctl/sources/source.h"
#include "tools/dvsctl/verbs/version_warning.h"

namespace dvs::ctl {

namespace {

// In the order of DVS_PROP_CLASS_*.
constexpr const char *kLists[] = {"global", "host", "port"};

/// The live state; empty when the module does not tell it.
LoadedState LookAtModule(Context &context) {
    LoadedState loaded;
    Answer answer = FetchFromDevice(context, DVSHYP_StateGet);
    if (answer.status != HYP_OK || state::VerifyState(answer.bytes).first) return loaded;
    loaded.raw.bytes = std::move(answer.bytes);
    loaded.state = ParseState(loaded.raw.bytes);
    return loaded;
}

// Finds by id, else by alias. Null when nothing, or more than one thing, has that alias.
template <typename Item, typename IsCandidate>
const Item *FindNamed(const std::vector<Item> &items, const std::string &name, IsCandidate isCandidate) {
    const Item *byAlias = nullptr;
    std::size_t numAlike = 0;
    for (const Item &item : items) {
        if (!isCandidate(item)) continue;
        if (item.name == name) return &item;
        if (item.alias != name) continue;
        byAlias = &item;
        ++numAlike;
    }
    return numAlike == 1 ? byAlias : nullptr;
}

} // namespace

const char *ListName(int list) {
    return kLists[list];
}

std::string ShowTarget(const Target &target) {
    std::string text;
    if (!target.property.empty())
        text = target.list == DVS_PROP_CLASS_PORT
                   ? fmt::format("property {} of ", target.property)
                   : fmt::format("{} property {} of ", ListName(target.list), target.property);
    if (!target.portId.empty()) text += fmt::format("port {} of ", target.portId);
    return text + "switch " + target.switchId;
}

void AddTargetJson(boost::json::object &document, const Target &target) {
    if (!target.switchId.empty()) document["switch"] = NameToJson(target.switchId);
    if (!target.portId.empty()) document["port"] = NameToJson(target.portId);
    if (target.property.empty()) return;
    document["list"] = ListName(target.list);
    document["name"] = NameToJson(target.property);
}

void CheckName(const char *what, const std::string &name, std::size_t fieldSize) {
    if (name.empty()) throw Error(ErrorKind::Usage, fmt::format("the {} is empty", what));
    if (name.size() < fieldSize) return;
    throw Error(ErrorKind::Usage, fmt::format("the {} is too long", what))
        .At(name)
        .Because(fmt::format("it has {} bytes, the module takes {}", name.size(), fieldSize - 1));
}

Target TargetOf(const Options &options) {
    if (options.global + options.host + (options.portId.has_value() ? 1 : 0) > 1)
        throw Error(ErrorKind::Usage, "--global, --host and --port exclude each other");
    Target target;
    target.switchId = options.switchName;
    CheckName("switch id", target.switchId, sizeof(DVSHYPRequest::switchName));
    target.portId = options.portId.value_or(options.portName);
    if (options.portId || !options.portName.empty())
        CheckName("port id", target.portId, sizeof(DVSHYPRequest::portId));
    target.property = options.propName;
    if (!target.property.empty())
        CheckName("property name", target.property, sizeof(DVSHYPRequest::propName));
    target.list = options.portId ? DVS_PROP_CLASS_PORT
                  : options.host ? DVS_PROP_CLASS_HOST
                                 : DVS_PROP_CLASS_GLOBAL;
    return target;
}

std::string ResolveTarget(Context &context, Target &target) {
    const LoadedState loaded = LookAtModule(context);
    const Switch *sw = FindNamed(loaded.state.switches, target.switchId, [](const Switch &) { return true; });
    if (!sw) return "switch \"" + target.switchId + "\"";
    target.switchId = sw->name;
    if (target.portId.empty() || target.isNewPort) return {};
    const Entry *port =
        FindNamed(sw->entries, target.portId, [](const Entry &entry) { return entry.role == Role::Port; });
    if (!port) return "port \"" + target.portId + "\" on switch \"" + target.switchId + "\"";
    target.portId = port->name;
    return {};
}

Error MissingError(const Target &target, const std::string &missing, const std::string &title) {
    Error error(ErrorKind::NotThere, title);
    error.source = "kernel:";
    if (!missing.empty()) {
        error.why = "there is no " + missing;
        error.next = "dvsctl show kernel: lists what there is";
        return error;
    }
    error.why = target.property.empty() ? "the module does not have it" : "there is no " + ShowTarget(target);
    error.next = target.property.empty() ? "dvsctl show kernel: lists what there is"
                                         : fmt::format("dvsctl show kernel: --switch '{}' lists the "
                                                       "properties; --global, --host and --port ID choose "
                                                       "the list",
                                                       target.switchId);
    return error;
}

Answer CallFor(Context &context, Target &target, const std::string &title, const TargetCall &call) {
    const auto send = [&] {
        return CallDevice(context, [&](std::vector<std::uint8_t> &reply) { return call(target, reply); });
    };
    Answer answer = send();
    if (answer.status != HYP_NOT_FOUND) return answer;
    const Target asked = target;
    const std::string missing = ResolveTarget(context, target);
    const bool isAlias = asked.switchId != target.switchId || asked.portId != target.portId;
    if (missing.empty() && isAlias) answer = send();
    if (answer.status == HYP_NOT_FOUND && !context.options.ifExists)
        throw Error(MissingError(target, missing, title));
    return answer;
}

std::uint32_t VersionOf(Context &context, const Target &target) {
    const Answer answer = FetchFromDevice(context, [&](void **out, std::uint32_t *size) {
        return DVSHYP_GlobalPropGet(target.switchId.c_str(), kVersionProperty.data(), out, size);
    });
    return answer.status == HYP_OK ? AsNumber(answer.bytes).value_or(0) : 0;
}

Answer FetchFor(Context &context, Target &target, const std::string &title, const TargetFetch &fetch) {
    Answer answer = CallFor(context, target, title, [&](const Target &at, std::vector<std::uint8_t> &reply) {
        Fetched fetched;
        const HYP_ReturnStatus status = fetch(at, fetched.Out(), fetched.Size());
        if (status == HYP_OK) reply.assign(fetched.View().begin(), fetched.View().end());
        return status;
    });
    if (answer.status != HYP_NOT_FOUND) RequireOk(answer, title);
    return answer;
}

} // namespace dvs::ctl
