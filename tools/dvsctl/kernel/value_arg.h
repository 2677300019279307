/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_KERNEL_VALUE_ARG_H
#define DVSCTL_KERNEL_VALUE_ARG_H

// Property values from the command line: text, numbers, digits, files, and the config store's typed form of
// the properties that have one.

#include <cstdint>
#include <string>
#include <vector>

#include "tools/dvsctl/kernel/target.h"

namespace dvs::ctl {

/// A value and the type word it is set with.
struct NewValue {
    std::vector<std::uint8_t> bytes;
    std::uint32_t type = 0;
};

/// The value of VALUE, --as, --file and --type for the property that the target names (none for uplink data).
/// `switchVersion` is asked for only where a typed value may depend on it. Throws Error(Usage) for a command
/// line that does not say what is meant, Error(Malformed) for a value that the property cannot have.
NewValue ValueOf(Context &context, const Target &target, const std::function<std::uint32_t()> &switchVersion);

/// The serialized property list of a new port: of --file (a serialized list, or a port as the JSON form of
/// states has it) with --kind, or an empty one. Throws Error.
std::vector<std::uint8_t> PortDataOf(Context &context);

/// A number in decimal or, with 0x, hexadecimal. Throws Error(Usage) naming `what`.
std::uint32_t NumberOf(const std::string &text, const char *what);

/// The type word of --type, or `otherwise`.
std::uint32_t TypeOf(const Options &options, std::uint32_t otherwise);

} // namespace dvs::ctl

#endif
