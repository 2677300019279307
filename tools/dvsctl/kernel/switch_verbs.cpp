/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl kernel switch …` and `kernel state …`: one library call each, and the same on the table.

#include <fmt/format.h>

#include "dvs/hyp.h"
#include "dvs/state.h"
#include "tools/dvsctl/kernel/change.h"
#include "tools/dvsctl/kernel/value_arg.h"
#include "tools/dvsctl/kernel/verbs.h"
#include "tools/dvsctl/verbs/version_warning.h"

namespace dvs::ctl {

namespace {

HYP_ReturnStatus CheckSwitch(const Target &target) {
    const DVSwitch *sw = DVSState_SwitchFind(target.switchId.c_str());
    return static_cast<HYP_ReturnStatus>(sw ? HYP_OK : HYP_NOT_FOUND);
}

HYP_ReturnStatus PlanMaxPorts(const Target &target, std::uint32_t ports) {
    DVSwitch *sw = DVSState_SwitchFind(target.switchId.c_str());
    if (!sw) return HYP_NOT_FOUND;
    if (ports > uwMaxNumActivePortsSystemWide) return HYP_LIMIT_EXCEEDED;
    sw->newMaxPorts = ports;
    return HYP_OK;
}

bool RemoveLeftover(DVSPort *port, void *) {
    const std::string switchId = DVS_SwitchId(port->owner), portId = DVS_PortId(port);
    // The walk allows removing the port it is at.
    if (port->portType == DVS_PORT_ZOMBIE)
        (void)DVSState_PortRemoveZombie(switchId.c_str(), portId.c_str());
    else if (port->portType == DVS_PORT_LOCAL_CACHE)
        (void)DVSState_LocalCachePortRemove(switchId.c_str(), portId.c_str());
    return false;
}

bool SanitizeSwitch(DVSwitch *sw, void *) {
    DVSState_PortForEach(sw, RemoveLeftover, nullptr);
    return false;
}

const std::string &Required(const std::optional<std::string> &option, const char *name) {
    if (!option) throw Error(ErrorKind::Usage, fmt::format("{} is missing", name));
    return *option;
}

} // namespace

Exit RunKernelSwitchAdd(Context &context) {
    const Options &options = context.options;
    const std::string className = Required(options.className, "--class");
    CheckName("class", className, sizeof(DVSHYPRequest::propName));
    const std::uint32_t ports = NumberOf(Required(options.maxPorts, "--max-ports"), "port limit");
    const std::uint32_t version = NumberOf(Required(options.switchVersion, "--switch-version"), "version");
    const Target target = TargetOf(options);
    return CarryOut(context,
                    {"kernel switch add", target, "add", "added",
                     fmt::format(" ({}, version {}, {} ports at most)", className, version, ports),
                     [=](const Target &t) {
                         return DVSHYP_SwitchAdd(t.switchId.c_str(), className.c_str(), ports, version);
                     },
                     [=](const Target &t) {
                         return DVSState_SwitchAdd(t.switchId.c_str(), className.c_str(), ports, version);
                     },
                     VersionlessWarning(target.switchId, version)});
}

Exit RunKernelSwitchRemove(Context &context) {
    return CarryOut(context, {"kernel switch remove", TargetOf(context.options), "remove", "removed", "",
                              [](const Target &t) { return DVSHYP_SwitchRemove(t.switchId.c_str()); },
                              [](const Target &t) { return DVSState_SwitchRemove(t.switchId.c_str()); }});
}

Exit RunKernelSwitchAssociate(Context &context) {
    return CarryOut(context, {"kernel switch associate",
                              TargetOf(context.options),
                              "associate",
                              "associated",
                              "",
                              [](const Target &t) { return DVSHYP_SwitchAssociate(t.switchId.c_str()); },
                              CheckSwitch,
                              {},
                              false});
}

Exit RunKernelSwitchDissociate(Context &context) {
    return CarryOut(context, {"kernel switch dissociate",
                              TargetOf(context.options),
                              "dissociate",
                              "dissociated",
                              "",
                              [](const Target &t) { return DVSHYP_SwitchDissociate(t.switchId.c_str()); },
                              CheckSwitch,
                              {},
                              false});
}

Exit RunKernelSwitchSetVersion(Context &context) {
    const std::uint32_t version = NumberOf(context.options.number, "version");
    return CarryOut(
        context, {"kernel switch set-version", TargetOf(context.options), "set the version of",
                  "set the version of", fmt::format(" to {}", version),
                  [=](const Target &t) { return DVSHYP_SwitchSetVersion(t.switchId.c_str(), version); },
                  [=](const Target &t) { return DVSState_SwitchSetVersion(t.switchId.c_str(), version); }});
}

Exit RunKernelSwitchSetMaxPorts(Context &context) {
    const std::uint32_t ports = NumberOf(context.options.number, "port limit");
    return CarryOut(context,
                    {"kernel switch set-max-ports", TargetOf(context.options), "set the port limit of",
                     "set the port limit of", fmt::format(" to {}", ports),
                     [=](const Target &t) { return DVSHYP_SwitchSetMaxPorts(t.switchId.c_str(), ports); },
                     [=](const Target &t) { return PlanMaxPorts(t, ports); }});
}

Exit RunKernelStateSanitize(Context &context) {
    return CarryOut(context, {"kernel state sanitize",
                              {},
                              "sanitize",
                              "sanitized",
                              "",
                              [](const Target &) { return DVSHYP_StateSanitize(); },
                              [](const Target &) {
                                  DVSState_SwitchForEach(SanitizeSwitch, nullptr);
                                  return static_cast<HYP_ReturnStatus>(HYP_OK);
                              }});
}

Exit RunKernelStateCleanup(Context &context) {
    return CarryOut(context, {"kernel state cleanup",
                              {},
                              "empty",
                              "emptied",
                              "",
                              [](const Target &) { return DVSHYP_StateCleanup(); },
                              [](const Target &) { return DVSState_ConfigReset(); }});
}

} // namespace dvs::ctl
