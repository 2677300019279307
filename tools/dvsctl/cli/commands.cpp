/* SPDX-License-Identifier: Apache-2.0 */
// The table of verbs.

#include "tools/dvsctl/cli/commands.h"

#include <vector>

#include "tools/dvsctl/cli/command.h"

namespace dvs::ctl {

namespace {

// Rows that several verbs share.
constexpr OptionRow kSource = {"SRC", nullptr, &Options::source, "the source to look at"};
constexpr OptionRow kSwitch = {"--switch", "ID", &Options::switchId, "only the switch of this id or alias"};
constexpr OptionRow kPort = {"--port", "ID", &Options::portId, "only ports of this id or alias"};
constexpr OptionRow kProps = {"--props", "GLOB", &Options::props,
                              "only properties whose names match, as '*.mtu'"};
constexpr OptionRow kFull = {"--full", nullptr, &Options::full, "long values whole"};
constexpr OptionRow kRaw = {"--raw", nullptr, &Options::raw,
                            "bytes also of properties whose meaning is known"};
constexpr OptionRow kPersistent = {"--persistent", nullptr, &Options::persistent,
                                   "of kernel: only what is worth keeping"};
constexpr OptionRow kDryRun = {"--dry-run", nullptr, &Options::dryRun,
                               "show what would change, and change nothing"};

constexpr OptionRow kShowOptions[] = {
    kSource, kSwitch, kPort, kProps, kRaw, kFull, kPersistent,
};
constexpr OptionRow kVerifyOptions[] = {kSource, kPersistent};
constexpr OptionRow kDiffOptions[] = {
    {"A", nullptr, &Options::source, "the source before"},
    {"B", nullptr, &Options::target, "the source after"},
    kSwitch,
    kPort,
    kProps,
    {"--order", nullptr, &Options::order, "another order of the same entries is a difference too"},
    {"--ignore-types", nullptr, &Options::ignoreTypes, "another type word with the same value is none"},
    kRaw,
    kFull,
    kPersistent,
};
constexpr OptionRow kCopyOptions[] = {
    {"FROM", nullptr, &Options::source, "the source to read"},
    {"TO", nullptr, &Options::target, "the source to replace"},
    {"--switch", "ID", &Options::switchId, "only the switch of this id or alias; a store keeps its others"},
    kDryRun,
    {"--may-exist", nullptr, &Options::mayExist, "replace what TO holds (this is the default)"},
    {"--no-replace", nullptr, &Options::noReplace, "refuse when TO holds something already"},
    kRaw,
    kFull,
    kPersistent,
};
constexpr OptionRow kHexdumpOptions[] = {kSource, kSwitch, kPort};

constexpr OptionRow kGenerateOptions[] = {
    {"TO", nullptr, &Options::target, "the source to replace"},
    {"--switches", "N", &Options::switchCount,
     "how many switches, of all classes in turn (default 3, at most 32)"},
    {"--ports", "M", &Options::portCount, "how many ports each has (default 16)"},
    {"--seed", "S", &Options::seed, "what the values are drawn from (default 1)"},
    {"--class", "NAME", &Options::className, "all of this class instead, as vswitch"},
    {"--switch-version", "N", &Options::switchVersion, "all of this version: 4 to 12, 100, or 107 to 112"},
    kDryRun,
    {"--may-exist", nullptr, &Options::mayExist, "replace what TO holds (this is the default)"},
    {"--no-replace", nullptr, &Options::noReplace, "refuse when TO holds something already"},
    kFull,
};
constexpr OptionRow kPropsOptions[] = {
    {"NAME", nullptr, &Options::name, "a property's name, or a pattern as '*.vlan'"},
};

constexpr Command kCommands[] = {
    {"show", "Show switches, ports and properties as a tree", kShowOptions,
     "A value is shown as text where it is text, as a number where it has four bytes, else as bytes with its "
     "length.\n"
     "Columns: switch, port, kind, list, name, type, size, value, offset. With one of the first four, every "
     "line stands\n"
     "for itself, which suits grep and awk.\n",
     "  dvsctl show /etc/orbeno/dvsdata.db\n"
     "  dvsctl show state.db --switch production --port web-1\n"
     "  dvsctl show json:site.json --props '*.mtu'\n"
     "  dvsctl show state.db --columns switch,port,name,value --no-headings\n"
     "  dvsctl show state.db --json | jq '.switches[].ports[] | select(.kind == \"shadow\").id'\n",
     RunShow},
    {"verify", "Check every byte structure of a state and name the first fault", kVerifyOptions,
     "Looks at every nested buffer without loading anything. Reports what is sound, and for a damaged state "
     "where the\n"
     "fault is, by path and byte offset, and where a load would stop. Exit status 6 when something is "
     "damaged.\n",
     "  dvsctl verify /etc/orbeno/dvsdata.db\n"
     "  dvsctl verify --quiet state.db && echo sound\n"
     "  dvsctl verify state.db --json\n",
     RunVerify},
    {"diff", "Compare two sources by switch, property and port", kDiffOptions,
     "+ is only in B, - is only in A, ~ is in both and differs. The order of entries and bytes without "
     "meaning do not\n"
     "count. Exit status 0 when the states are the same, 1 when they differ, 2 and more for trouble.\n"
     "Columns: change, what, switch, port, list, name, before, after, type-before, type-after.\n",
     "  dvsctl diff state.db json:site.json\n"
     "  dvsctl diff before.db after.db --switch production\n"
     "  dvsctl diff before.db after.db --columns change,port,name,before,after\n",
     RunDiff},
    {"copy", "Copy a state from one source to another", kCopyOptions,
     "Reads and verifies FROM, then replaces TO, durably: after a failure TO is as it was. The JSON form "
     "keeps every\n"
     "name, value, type and order; edit it with any editor and copy it back.\n",
     "  dvsctl copy json:examples/site-basic.json state.db\n"
     "  dvsctl copy state.db json:state.json\n"
     "  dvsctl copy --dry-run json:state.json state.db\n"
     "  dvsctl copy state.db json:- | jq .\n",
     RunCopy},
    {"hexdump", "Show every byte and what it is", kHexdumpOptions,
     "Annotates the serialized form, nested buffers inside their entries, also of a damaged state: the "
     "faults are marked\n"
     "where they are. Exit status 6 when something is damaged.\n",
     "  dvsctl hexdump state.db\n"
     "  dvsctl hexdump broken.db | grep '!!'\n"
     "  dvsctl hexdump state.db --switch dvs-1 --port 7\n",
     RunHexdump},
    {"props", "List and explain the properties whose meaning is known", kPropsOptions,
     "Without NAME a table. With it, of each property: its list, what it is for, where the store has it, "
     "what "
     "is odd\n"
     "about it, the layout of its bytes, and the fields of its typed form.\n"
     "Columns: list, name, path, type, converter, size, form, quirks, meaning.\n",
     "  dvsctl props\n"
     "  dvsctl props com.orbeno.etherswitch.port.vlan\n"
     "  dvsctl props '*.teaming*'\n"
     "  dvsctl props --columns name,quirks\n",
     RunProps},
    {"generate", "Make a state of any size for trials", kGenerateOptions,
     "Realistic values, by the rules of each switch's class and version: uplinks and guests, ports of every "
     "kind, some\n"
     "without names. With 2 switches of 2 ports or more, every property that has a place in the config store "
     "is there.\n"
     "The same numbers give the same bytes on any machine.\n",
     "  dvsctl generate --switches 32 --ports 512 --seed 7 trial.db\n"
     "  dvsctl generate --switches 1 --ports 2 --class vswitch json:-\n"
     "  dvsctl generate --dry-run --seed 8 trial.db\n",
     RunGenerate},
};

constexpr OptionRow kCommonOptions[] = {
    {"--json", nullptr, &Options::json, "results and errors as one JSON document on standard output"},
    {"--if-exists", nullptr, &Options::ifExists,
     "a source, switch, port or property that is not there is no error"},
    {"--timeout", "SECONDS", &Options::timeout, "how long to wait for others (default 30)"},
    {"--columns", "LIST", &Options::columns, "the columns of a table, separated by commas"},
    {"--no-headings", nullptr, &Options::noHeadings, "no first line over tables"},
    {"--no-pager", nullptr, &Options::noPager, "never start a pager"},
    {"-q,--quiet", nullptr, &Options::quiet, "only results and errors, no remarks"},
    {"-v,--verbose", nullptr, &Options::verbose, "the library's messages on standard error as they come"},
};

} // namespace

std::span<const Command> Commands() {
    static const std::vector<Command> all = [] {
        std::vector<Command> commands(std::begin(kCommands), std::end(kCommands));
        commands.insert(commands.end(), StoreCommands().begin(), StoreCommands().end());
        commands.insert(commands.end(), KernelCommands().begin(), KernelCommands().end());
        return commands;
    }();
    return all;
}

std::span<const OptionRow> CommonOptions() {
    return kCommonOptions;
}

} // namespace dvs::ctl
