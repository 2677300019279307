/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl kernel port …`, `kernel ports` and `kernel find-external-id`.

#include <cstring>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvs/hyp.h"
#include "dvs/state.h"
#include "dvsstate/names.h"
#include "form/json/codec.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/cli/table.h"
#include "tools/dvsctl/kernel/change.h"
#include "tools/dvsctl/kernel/properties.h"
#include "tools/dvsctl/kernel/value_arg.h"
#include "tools/dvsctl/kernel/verbs.h"
#include "tools/dvsctl/verbs/show.h"

namespace dvs::ctl {

namespace {

struct ListedPort {
    std::string id;
    std::uint32_t kind, connection;
};

constexpr Column kPortColumns[] = {
    // name, right, by default
    {"port", false, true},
    {"kind", false, true},
    {"connection", true, true},
};

std::vector<std::uint32_t> KindsOf(const Options &options) {
    if (!options.kind) return {DVS_PORT_ACTIVE, DVS_PORT_SHADOW, DVS_PORT_ZOMBIE, DVS_PORT_LOCAL_CACHE};
    if (const auto kind = KindFromName(*options.kind)) return {*kind};
    throw Error(ErrorKind::Usage, fmt::format("there is no kind of port \"{}\"", *options.kind))
        .Because("the kinds are active, shadow, zombie, local-cache");
}

std::string_view FieldText(const char *field, std::size_t size) {
    return {field, strnlen(field, size)};
}

void AddPorts(Bytes list, std::uint32_t kind, std::vector<ListedPort> &ports) {
    for (std::size_t at = 0; at + sizeof(DVSHYPPortListEntry) <= list.size();
         at += sizeof(DVSHYPPortListEntry)) {
        DVSHYPPortListEntry entry;
        std::memcpy(&entry, list.data() + at, sizeof entry);
        ports.push_back(
            {std::string(FieldText(entry.portId, sizeof entry.portId)), kind, entry.connectionId});
    }
}

HYP_ReturnStatus ListPorts(const Target &at, std::uint32_t kind, std::vector<std::uint8_t> &reply) {
    DVSHYPPortList *list = nullptr;
    const HYP_ReturnStatus status = DVSHYP_SwitchPortList(at.switchId.c_str(), &list, kind);
    if (status != HYP_OK) return status;
    const auto *start = reinterpret_cast<const std::uint8_t *>(list) + sizeof(DVSHYPPortList);
    reply.assign(start, start + std::size_t{list->numEntries} * sizeof(DVSHYPPortListEntry));
    DVSHYP_DataFree(list);
    return HYP_OK;
}

} // namespace

Exit RunKernelPortAdd(Context &context) {
    Target target = TargetOf(context.options);
    target.isNewPort = true;
    const std::vector<std::uint8_t> data = PortDataOf(context);
    const auto size = static_cast<std::uint32_t>(data.size());
    return CarryOut(context, {"kernel port add", target, "add", "added", "",
                              [&](const Target &t) {
                                  return DVSHYP_PortAdd(t.switchId.c_str(), t.portId.c_str(), data.data(),
                                                        size);
                              },
                              [&](const Target &t) {
                                  return DVSState_PortDeserialize(t.switchId.c_str(), t.portId.c_str(),
                                                                  data.data(), size);
                              }});
}

Exit RunKernelPortRemove(Context &context) {
    return CarryOut(
        context, {"kernel port remove", TargetOf(context.options), "remove", "removed", "",
                  [](const Target &t) { return DVSHYP_PortRemove(t.switchId.c_str(), t.portId.c_str()); },
                  [](const Target &t) { return DVSState_PortRemove(t.switchId.c_str(), t.portId.c_str()); }});
}

Exit RunKernelPortFind(Context &context) {
    Target target = TargetOf(context.options);
    const std::string title = "cannot find " + ShowTarget(target);
    const Answer answer = CallFor(context, target, title, [](const Target &at, std::vector<std::uint8_t> &) {
        return DVSHYP_PortFind(at.switchId.c_str(), at.portId.c_str());
    });
    const bool isThere = answer.status != HYP_NOT_FOUND;
    if (isThere) RequireOk(answer, title);
    if (context.options.json) {
        boost::json::object document = Envelope("kernel port find");
        AddTargetJson(document, target);
        document["is_there"] = isThere;
        context.out.Json(std::move(document));
    } else {
        context.out.Remark(
            fmt::format("{} {}\n", Escape(ShowTarget(target)), isThere ? "is there" : "is not there"));
    }
    return Exit::Done;
}

Exit RunKernelPortState(Context &context) {
    const Options &options = context.options;
    Target target = TargetOf(options);
    const std::string title = "cannot read " + ShowTarget(target);
    const Answer answer =
        FetchFor(context, target, title, [&](const Target &at, void **out, std::uint32_t *size) {
            if (!options.persistent)
                return DVSHYP_PortStateGet(at.switchId.c_str(), at.portId.c_str(), out, size);
            return DVSHYP_PersistentPortStateGet(at.switchId.c_str(), at.portId.c_str(), state::kStateVersion,
                                                 out, size);
        });
    const bool isThere = answer.status == HYP_OK;
    const std::vector<Property> properties =
        isThere ? PropertiesOf(answer.bytes, title) : std::vector<Property>();
    if (options.raw && !options.json) {
        context.out.Write(AsText(answer.bytes));
        return Exit::Done;
    }
    boost::json::object document = Envelope("kernel port state");
    AddTargetJson(document, target);
    document["is_there"] = isThere;
    WriteProperties(context, properties, std::move(document),
                    Owner{DVS_PROP_CLASS_PORT, isThere ? VersionOf(context, target) : 0});
    return Exit::Done;
}

Exit RunKernelPorts(Context &context) {
    Target target = TargetOf(context.options);
    const std::string title = "cannot list the ports of " + ShowTarget(target);
    std::vector<ListedPort> ports;
    for (const std::uint32_t kind : KindsOf(context.options)) {
        const Answer answer =
            CallFor(context, target, title, [kind](const Target &at, std::vector<std::uint8_t> &reply) {
                return ListPorts(at, kind, reply);
            });
        if (answer.status != HYP_NOT_FOUND) RequireOk(answer, title);
        AddPorts(answer.bytes, kind, ports);
    }
    if (context.options.json) {
        boost::json::object document = Envelope("kernel ports");
        AddTargetJson(document, target);
        boost::json::array array;
        for (const ListedPort &port : ports)
            array.push_back({{"port", NameToJson(port.id)},
                             {"kind", ShowKind(port.kind)},
                             {"connection", port.connection}});
        document["ports"] = std::move(array);
        context.out.Json(std::move(document));
        return Exit::Done;
    }
    Table table(kPortColumns, context.options);
    for (const ListedPort &port : ports)
        table.Add({{ShowName(port.id)}, {ShowKind(port.kind)}, {std::to_string(port.connection)}});
    if (!ports.empty()) table.Write(context.out);
    return Exit::Done;
}

Exit RunKernelFindExternalId(Context &context) {
    const Options &options = context.options;
    Target target = TargetOf(options);
    CheckName("external id", options.text, sizeof(DVSHYPExternalIdResult::externalId));
    const std::string title = "cannot find the external id " + options.text;
    const Answer answer =
        CallFor(context, target, title, [&](const Target &at, std::vector<std::uint8_t> &reply) {
            DVSHYPExternalIdResult *result = nullptr;
            const HYP_ReturnStatus status =
                DVSHYP_PortGetByExternalId(at.switchId.c_str(), options.text.c_str(), &result);
            if (status != HYP_OK) return status;
            const auto id = AsBytes(FieldText(result->portId, sizeof result->portId));
            reply.assign(id.begin(), id.end());
            DVSHYP_DataFree(result);
            return status;
        });
    if (answer.status != HYP_NOT_FOUND) RequireOk(answer, title);
    target.portId = AsText(answer.bytes);
    if (target.portId.empty() && !options.ifExists)
        throw Error(ErrorKind::NotThere, title)
            .In("kernel:")
            .Because("no port of switch " + target.switchId + " carries it")
            .Try("dvsctl show kernel: --props '*.external.id' lists the ids there are");
    if (options.json) {
        boost::json::object document = Envelope("kernel find-external-id");
        AddTargetJson(document, target);
        document["external_id"] = NameToJson(options.text);
        document["is_there"] = !target.portId.empty();
        context.out.Json(std::move(document));
    } else if (!target.portId.empty()) {
        context.out.Write(ShowName(target.portId) + "\n");
    }
    return Exit::Done;
}

} // namespace dvs::ctl
