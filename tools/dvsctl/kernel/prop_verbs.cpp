/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl kernel prop …` and `kernel uplink …`: single values, read and written.

#include <charconv>

#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "configstore/typed/typed_value.h"
#include "dvs/hyp.h"
#include "dvs/state.h"
#include "form/json/codec.h"
#include "form/json/typed.h"
#include "form/value.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/kernel/change.h"
#include "tools/dvsctl/kernel/value_arg.h"
#include "tools/dvsctl/kernel/verbs.h"
#include "tools/dvsctl/verbs/version_warning.h"

namespace dvs::ctl {

namespace {

using SwitchGet = HYP_ReturnStatus (*)(const char *, const char *, void **, std::uint32_t *);
using PortGet = HYP_ReturnStatus (*)(const char *, const char *, const char *, void **, std::uint32_t *);
using SwitchSet = HYP_ReturnStatus (*)(const char *, const char *, const void *, std::uint32_t,
                                       std::uint32_t);
using SwitchClear = HYP_ReturnStatus (*)(const char *, const char *);

/// The calls of a switch's lists, in the order of DVS_PROP_CLASS_*; a port's stand alone.
struct ListCalls {
    SwitchGet get, smartNicGet;
    SwitchSet set, plannedSet;
    SwitchClear clear, plannedClear;
};

constexpr ListCalls kLists[] = {
    {DVSHYP_GlobalPropGet, DVSHYP_SmartNICGlobalPropGet, DVSHYP_GlobalPropSet, DVSState_GlobalPropSet,
     DVSHYP_GlobalPropClear, DVSState_GlobalPropClear},
    {DVSHYP_HostPropGet, DVSHYP_SmartNICHostPropGet, DVSHYP_HostPropSet, DVSState_HostPropSet,
     DVSHYP_HostPropClear, DVSState_HostPropClear},
};

std::uint32_t SizeOf(const NewValue &value) {
    return static_cast<std::uint32_t>(value.bytes.size());
}

HYP_ReturnStatus Get(const Target &at, bool smartNic, void **out, std::uint32_t *size) {
    const char *sw = at.switchId.c_str(), *name = at.property.c_str();
    if (at.list == DVS_PROP_CLASS_PORT) {
        const PortGet get = smartNic ? DVSHYP_SmartNICPortDataGet : DVSHYP_PortDataGet;
        return get(sw, at.portId.c_str(), name, out, size);
    }
    const ListCalls &calls = kLists[at.list];
    return (smartNic ? calls.smartNicGet : calls.get)(sw, name, out, size);
}

HYP_ReturnStatus Set(const Target &at, const NewValue &value) {
    const char *sw = at.switchId.c_str(), *name = at.property.c_str();
    if (at.list == DVS_PROP_CLASS_PORT)
        return DVSHYP_PortDataSet(sw, at.portId.c_str(), name, value.bytes.data(), SizeOf(value), value.type);
    return kLists[at.list].set(sw, name, value.bytes.data(), SizeOf(value), value.type);
}

HYP_ReturnStatus PlanSet(const Target &at, const NewValue &value) {
    const char *sw = at.switchId.c_str(), *name = at.property.c_str();
    if (at.list != DVS_PROP_CLASS_PORT)
        return kLists[at.list].plannedSet(sw, name, value.bytes.data(), SizeOf(value), value.type);
    DVSPort *port = DVSState_PortFind(sw, at.portId.c_str());
    if (!port) return HYP_NOT_FOUND;
    return DVSState_PortDataSet(port, name, value.bytes.data(), SizeOf(value), value.type);
}

HYP_ReturnStatus Clear(const Target &at) {
    const char *sw = at.switchId.c_str(), *name = at.property.c_str();
    if (at.list == DVS_PROP_CLASS_PORT) return DVSHYP_PortDataClear(sw, at.portId.c_str(), name);
    return kLists[at.list].clear(sw, name);
}

HYP_ReturnStatus PlanClear(const Target &at) {
    const char *sw = at.switchId.c_str(), *name = at.property.c_str();
    if (at.list != DVS_PROP_CLASS_PORT) return kLists[at.list].plannedClear(sw, name);
    DVSPort *port = DVSState_PortFind(sw, at.portId.c_str());
    return port ? DVSState_PortDataClear(port, name) : static_cast<HYP_ReturnStatus>(HYP_NOT_FOUND);
}

HYP_ReturnStatus CheckPort(const Target &at) {
    const DVSPort *port = DVSState_PortFind(at.switchId.c_str(), at.portId.c_str());
    return static_cast<HYP_ReturnStatus>(port ? HYP_OK : HYP_NOT_FOUND);
}

typed::View MeaningOf(Context &context, const Target &target, Bytes value) {
    return typed::Describe(static_cast<std::uint32_t>(target.list), target.property, value,
                           {VersionOf(context, target)}, typed::Ask::kResult);
}

/// One value on its way out: raw, as a line, or as JSON. Without one (--if-exists) nothing, or no "value".
void WriteValue(Context &context, const char *command, const Target &target, const Answer &answer,
                boost::json::object extra) {
    const Options &options = context.options;
    const bool isThere = answer.status == HYP_OK;
    if (options.json) {
        boost::json::object document = Envelope(command);
        AddTargetJson(document, target);
        for (auto &[key, value] : extra)
            document[key] = value;
        document["is_there"] = isThere;
        if (isThere) {
            document["size"] = answer.bytes.size();
            document["value"] = ValueToJson(answer.bytes);
            if (!target.property.empty()) AddMeaning(MeaningOf(context, target, answer.bytes), document);
        }
        context.out.Json(std::move(document));
        return;
    }
    if (!isThere) return;
    if (options.raw) {
        context.out.Write(AsText(answer.bytes));
        return;
    }
    std::string line = ShowValue(answer.bytes, options.full);
    if (!target.property.empty()) {
        const typed::View view = MeaningOf(context, target, answer.bytes);
        const bool adds = view.state == typed::State::kTyped && !view.summary.empty() &&
                          LookAt(answer.bytes).form == ValueForm::Raw;
        if (adds) line = Escape(view.summary) + "  " + line;
        if (view.state == typed::State::kDamaged) line += "  (does not fit: " + Escape(view.reason) + ")";
    }
    context.out.Write(line + "\n");
}

int UplinkOf(const Options &options) {
    int uplink = 0;
    const std::string &text = options.number;
    const char *end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, uplink);
    if (error != std::errc() || stop != end)
        throw Error(ErrorKind::Usage, "the uplink is no number").At(text).Try("uplinks are counted from 0");
    return uplink;
}

} // namespace

Exit RunKernelPropGet(Context &context) {
    const bool smartNic = context.options.smartNic;
    Target target = TargetOf(context.options);
    const Answer answer = FetchFor(
        context, target, "cannot read " + ShowTarget(target),
        [&](const Target &at, void **out, std::uint32_t *size) { return Get(at, smartNic, out, size); });
    WriteValue(context, "kernel prop get", target, answer, {});
    return Exit::Done;
}

Exit RunKernelPropSet(Context &context) {
    const Target target = TargetOf(context.options);
    const NewValue value = ValueOf(context, target, [&] { return VersionOf(context, target); });
    return CarryOut(context, {"kernel prop set", target, "set", "set",
                              " to " + ShowValue(value.bytes, context.options.full),
                              [&](const Target &at) { return Set(at, value); },
                              [&](const Target &at) { return PlanSet(at, value); }});
}

Exit RunKernelPropClear(Context &context) {
    const Target target = TargetOf(context.options);
    std::optional<Error> warning;
    if (target.list == DVS_PROP_CLASS_GLOBAL && target.property == kVersionProperty)
        warning = VersionlessWarning(target.switchId, std::nullopt);
    return CarryOut(context,
                    {"kernel prop clear", target, "clear", "cleared", "", Clear, PlanClear, warning});
}

Exit RunKernelUplinkGet(Context &context) {
    const int uplink = UplinkOf(context.options);
    Target target = TargetOf(context.options);
    const Answer answer =
        FetchFor(context, target, fmt::format("cannot read uplink {} of {}", uplink, ShowTarget(target)),
                 [&](const Target &at, void **out, std::uint32_t *size) {
                     return DVSHYP_UplinkDataGet(at.switchId.c_str(), at.portId.c_str(), uplink, out, size);
                 });
    WriteValue(context, "kernel uplink get", target, answer, {{"uplink", uplink}});
    return Exit::Done;
}

Exit RunKernelUplinkSet(Context &context) {
    const int uplink = UplinkOf(context.options);
    const Target target = TargetOf(context.options);
    const NewValue value = ValueOf(context, target, [] { return 0u; });
    return CarryOut(context, {"kernel uplink set",
                              target,
                              fmt::format("set uplink {} of", uplink),
                              fmt::format("set uplink {} of", uplink),
                              " to " + ShowValue(value.bytes, context.options.full),
                              [&](const Target &at) {
                                  return DVSHYP_UplinkDataSet(at.switchId.c_str(), at.portId.c_str(), uplink,
                                                              value.bytes.data(), SizeOf(value), value.type);
                              },
                              CheckPort,
                              {},
                              false});
}

} // namespace dvs::ctl
