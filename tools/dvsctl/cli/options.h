/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_OPTIONS_H
#define DVSCTL_CLI_OPTIONS_H

// What the command line was given. Filled by cli.cpp from the option rows of the command table; every verb
// reads the members it asked for. A member that was not given keeps its default.

#include <optional>
#include <string>

namespace dvs::ctl {

struct Options {
    // Every verb has these.
    bool json = false;                  ///< results and errors as one JSON document on standard output
    bool quiet = false;                 ///< no remarks, only results and errors
    bool verbose = false;               ///< the library's messages on standard error as they come
    bool noHeadings = false;            ///< tables without their first line
    bool noPager = false;               ///< never start a pager
    bool ifExists = false;              ///< what is not there counts as empty, and is not an error
    double timeout = 30;                ///< seconds that waiting for somebody else may take
    std::optional<std::string> columns; ///< names of the columns to show, separated by commas

    // What changes something has these.
    bool dryRun = false;    ///< show what would change, change nothing
    bool mayExist = false;  ///< what is to be made may be there already
    bool noReplace = false; ///< the opposite, for copies: refuse a target that holds something

    // Operands and the options of single verbs.
    std::string source;                  ///< SRC, A or FROM
    std::string target;                  ///< B or TO
    std::optional<std::string> switchId; ///< only this switch
    std::optional<std::string> portId;   ///< only this port (of any kind)
    std::optional<std::string> props;    ///< only properties whose names match this pattern
    std::optional<std::string> store;    ///< the config store's database, for verbs that are about a store
    std::optional<std::string> layer;    ///< "current" or "desired"
    std::optional<std::string> revision; ///< of the store, a number
    std::optional<std::string> name;     ///< an operand that may be absent: a switch, a field, a file
    std::optional<std::string> switchCount, portCount, seed; ///< of what is generated, numbers
    bool raw = false;                                        ///< bytes, not typed fields
    bool full = false;                                       ///< long values whole
    bool order = false;                                      ///< the order of entries counts as a difference
    bool ignoreTypes = false;                                ///< type words do not count as a difference
    bool persistent = false;                                 ///< of kernel: only what is worth keeping

    // Verbs about the switching module. Numbers are read by the verbs, which know what they are for.
    std::string switchName, portName, propName;                    ///< what it is about
    std::string number;                                            ///< VERSION, PORTS or UPLINK
    std::string text;                                              ///< TEXT or EXTERNAL-ID
    std::optional<std::string> value;                              ///< VALUE
    std::optional<std::string> file;                               ///< the bytes of this file instead
    std::optional<std::string> as;                                 ///< how VALUE is meant
    std::optional<std::string> type;                               ///< type word
    std::optional<std::string> kind;                               ///< of ports
    std::optional<std::string> className, maxPorts, switchVersion; ///< of a new switch
    bool global = false, host = false;                             ///< which list of a switch
    bool smartNic = false;                                         ///< asked of the SmartNIC
};

} // namespace dvs::ctl

#endif
