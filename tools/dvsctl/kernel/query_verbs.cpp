/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl kernel vendor-props`, `extra-props`, `overlay-props`, and `kernel exec`.

#include <algorithm>

#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvs/hyp.h"
#include "form/json/codec.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/kernel/properties.h"
#include "tools/dvsctl/kernel/target.h"
#include "tools/dvsctl/kernel/value_arg.h"
#include "tools/dvsctl/kernel/verbs.h"
#include "tools/dvsctl/sources/files.h"

namespace dvs::ctl {

namespace {

using Query = std::function<HYP_ReturnStatus(const Target &at, DVSData **out, std::uint32_t type)>;

// Without --type: what was set without a type word, and what came out of the store.
std::vector<std::uint32_t> TypesOf(const Options &options) {
    if (options.type) return {TypeOf(options, 0)};
    return {kDefaultType, kStateType};
}

// As a serialized list, which can leave the child process.
HYP_ReturnStatus RunQuery(const Query &query, const Target &at, std::uint32_t type,
                          std::vector<std::uint8_t> &reply) {
    DVSData *list = nullptr;
    HYP_ReturnStatus status = query(at, &list, type);
    if (status != HYP_OK) return status;
    Fetched serialized;
    status = DVSData_Serialize(list, serialized.Out(), serialized.Size(), 0);
    if (status == HYP_OK) reply.assign(serialized.View().begin(), serialized.View().end());
    DVSData_Free(list);
    return status;
}

// Some entries answer to several types: each is listed once.
void AddNew(const std::vector<Property> &from, std::vector<Property> &to) {
    for (const Property &property : from)
        if (std::none_of(to.begin(), to.end(), [&](const Property &p) {
                return p.name == property.name && p.type == property.type &&
                       AsText(p.value) == AsText(property.value);
            }))
            to.push_back(property);
}

Exit ListProperties(Context &context, const char *command, const Query &query) {
    Target target = TargetOf(context.options);
    const std::string title = "cannot list properties of " + ShowTarget(target);
    std::vector<Answer> answers; // what the views lead into
    std::vector<Property> properties;
    const std::vector<std::uint32_t> types = TypesOf(context.options);
    answers.reserve(types.size());
    for (const std::uint32_t type : types) {
        const Answer &answer = answers.emplace_back(
            CallFor(context, target, title, [&](const Target &at, std::vector<std::uint8_t> &reply) {
                return RunQuery(query, at, type, reply);
            }));
        if (answer.status == HYP_NOT_FOUND) continue;
        RequireOk(answer, title);
        AddNew(PropertiesOf(answer.bytes, title), properties);
    }
    boost::json::object document = Envelope(command);
    AddTargetJson(document, target);
    document["list"] = ListName(target.list);
    WriteProperties(context, properties, std::move(document));
    return Exit::Done;
}

} // namespace

Exit RunKernelVendorProps(Context &context) {
    return ListProperties(
        context, "kernel vendor-props", [](const Target &at, DVSData **out, std::uint32_t type) {
            if (at.list == DVS_PROP_CLASS_PORT)
                return DVSHYP_VendorPortPropList(at.switchId.c_str(), at.portId.c_str(), out, type);
            return at.list == DVS_PROP_CLASS_HOST
                       ? DVSHYP_VendorHostPropList(at.switchId.c_str(), out, type)
                       : DVSHYP_VendorGlobalPropList(at.switchId.c_str(), out, type);
        });
}

Exit RunKernelExtraProps(Context &context) {
    return ListProperties(
        context, "kernel extra-props", [](const Target &at, DVSData **out, std::uint32_t type) {
            return at.list == DVS_PROP_CLASS_PORT
                       ? DVSHYP_ExtraConfigPortPropList(at.switchId.c_str(), at.portId.c_str(), out, type)
                       : DVSHYP_ExtraConfigPropList(at.switchId.c_str(), out, type);
        });
}

Exit RunKernelOverlayProps(Context &context) {
    return ListProperties(
        context, "kernel overlay-props", [](const Target &at, DVSData **out, std::uint32_t type) {
            return DVSHYP_OvlPropList(at.switchId.c_str(), type, at.list == DVS_PROP_CLASS_GLOBAL, out);
        });
}

Exit RunKernelExec(Context &context) {
    const Options &options = context.options;
    // An empty name is the module itself.
    Target target;
    if (!options.switchName.empty()) target = TargetOf(options);
    CheckName("command text", options.text, sizeof(DVSHYPRequest::cmd));
    const std::string input =
        options.file ? ReadWholeFile(context, *options.file, *options.file, Accept::Pipes) : std::string();
    const std::string title = fmt::format("the module did not carry out {}", Quote(options.text));
    if (options.dryRun) {
        if (options.json) {
            boost::json::object document = Envelope("kernel exec");
            AddTargetJson(document, target);
            document["text"] = NameToJson(options.text);
            document["is_sent"] = false;
            context.out.Json(std::move(document));
        } else {
            context.out.Write(fmt::format("would send {}\n", Quote(options.text)));
            context.out.Remark("what it would change only the module knows; nothing was sent (--dry-run)\n");
        }
        return Exit::Done;
    }
    const TargetFetch fetch = [&](const Target &at, void **out, std::uint32_t *size) {
        return DVSHYP_CmdExec(at.switchId.c_str(), options.text.c_str(),
                              input.empty() ? nullptr : input.data(),
                              static_cast<std::uint32_t>(input.size()), out, size);
    };
    const Answer answer =
        target.switchId.empty()
            ? FetchFromDevice(context,
                              [&](void **out, std::uint32_t *size) { return fetch(target, out, size); })
            : FetchFor(context, target, title, fetch);
    RequireOk(answer, title);
    if (options.json) {
        boost::json::object document = Envelope("kernel exec");
        AddTargetJson(document, target);
        document["text"] = NameToJson(options.text);
        document["is_sent"] = true;
        document["reply"] = ValueToJson(answer.bytes);
        context.out.Json(std::move(document));
        return Exit::Done;
    }
    std::string_view reply = AsText(answer.bytes);
    if (options.raw) {
        context.out.Write(reply);
        return Exit::Done;
    }
    while (!reply.empty() && (reply.back() == '\0' || reply.back() == '\n'))
        reply.remove_suffix(1);
    for (std::size_t at = 0; at < reply.size();) {
        const std::size_t end = std::min(reply.find('\n', at), reply.size());
        context.out.Write(Escape(reply.substr(at, end - at)) + "\n");
        at = end + 1;
    }
    return Exit::Done;
}

} // namespace dvs::ctl
