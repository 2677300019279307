/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_KERNEL_TARGET_H
#define DVSCTL_KERNEL_TARGET_H

// What a kernel verb is about. The module knows switches and ports by id; people know them by alias, too.
// An alias is looked up only when nothing has that id, so that it never costs a call where it is not needed.

#include <functional>
#include <optional>
#include <string>

#include <boost/json/fwd.hpp>

#include "dvs/configstore.h"
#include "tools/dvsctl/kernel/device.h"

namespace dvs::ctl {

struct Target {
    std::string switchId;
    std::string portId;               ///< empty: not about a port
    std::string property;             ///< empty: not about a property
    int list = DVS_PROP_CLASS_GLOBAL; ///< DVS_PROP_CLASS_*: where the property is
    bool isNewPort = false;           ///< the port is about to be added: its id is no alias
};

/// "property N of port P of switch S", for messages; not escaped.
std::string ShowTarget(const Target &target);
void AddTargetJson(boost::json::object &document, const Target &target);

/// "global", "host" or "port".
const char *ListName(int list);

/// The target of SWITCH and the options --port, --global and --host. Throws Error(Usage), also for names that
/// the request record would cut: it would be about something else then.
Target TargetOf(const Options &options);

/// Throws Error(Usage) when the name has no room in its field of the request record.
void CheckName(const char *what, const std::string &name, std::size_t fieldSize);

/// Looks the target up in the module's state and puts ids in the place of aliases. What is not there is named
/// by the result ("switch \"x\""), which is empty when switch and port are there.
std::string ResolveTarget(Context &context, Target &target);

/// The error that says what of a target is not there; `missing` is from ResolveTarget.
Error MissingError(const Target &target, const std::string &missing, const std::string &title);

/// The version that the module gives for the target's switch; 0 when it gives none.
std::uint32_t VersionOf(Context &context, const Target &target);

/// A library call about a target.
using TargetCall = std::function<HYP_ReturnStatus(const Target &target, std::vector<std::uint8_t> &reply)>;

/// Makes the call; where the module knows no such thing, once more with the ids of aliases. Gives every
/// answer but a missing target, for which it throws (with --if-exists it gives the answer HYP_NOT_FOUND).
Answer CallFor(Context &context, Target &target, const std::string &title, const TargetCall &call);

/// The same for library calls that hand out a buffer; throws for every refusal.
using TargetFetch = std::function<HYP_ReturnStatus(const Target &target, void **out, std::uint32_t *size)>;
Answer FetchFor(Context &context, Target &target, const std::string &title, const TargetFetch &fetch);

} // namespace dvs::ctl

#endif
