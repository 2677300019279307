/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_COMMAND_H
#define DVSCTL_CLI_COMMAND_H

// The shape of the command table: a verb is one row, its options are rows of their own. Parsing, help and
// error reporting are derived from the rows (cli.cpp); a verb is a function that reads Options and writes to
// the Output.
//
// To add a verb: write its function in a file of its own, declare it in commands.h, add its row to
// commands.cpp. A verb of two words ("store list") is a row with that name.

#include <optional>
#include <span>
#include <string>
#include <variant>

#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

/// Where the value of an option goes: a flag, a number, an operand (required), or a text that may be absent.
using OptionTarget = std::variant<bool Options::*, double Options::*, std::string Options::*,
                                  std::optional<std::string> Options::*>;

struct OptionRow {
    const char *name;    ///< "--switch", "-q,--quiet", or the operand's name ("SRC")
    const char *value;   ///< what stands for its value in the help ("ID"); null for flags and operands
    OptionTarget target; ///< member of Options
    const char *help;    ///< one sentence
};

struct Command {
    const char *name;                   ///< "show", "store list"
    const char *summary;                ///< one line for the list of verbs
    std::span<const OptionRow> options; ///< operands first, in order
    const char *details;                ///< paragraphs for --help; may be empty
    const char *examples;               ///< lines for --help
    Exit (*run)(Context &context);      ///< throws Error for anything but its plain results
};

/// The part of the table that is about a config store.
std::span<const Command> StoreCommands();

/// The table, in the order of the help.
std::span<const Command> Commands();

/// The part of the table that is about the switching module.
std::span<const Command> KernelCommands();

/// The options every verb has.
std::span<const OptionRow> CommonOptions();

} // namespace dvs::ctl

#endif
