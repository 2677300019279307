/* SPDX-License-Identifier: Apache-2.0 */
// The rows of the verbs that are about the switching module, for the table of verbs (commands.cpp).

#include "tools/dvsctl/cli/command.h"
#include "tools/dvsctl/kernel/verbs.h"

namespace dvs::ctl {

namespace {

// Rows that several verbs share.
constexpr OptionRow kSwitch = {"SWITCH", nullptr, &Options::switchName, "a switch's id or alias"};
constexpr OptionRow kPort = {"PORT", nullptr, &Options::portName, "a port's id or alias"};
constexpr OptionRow kNewPort = {"PORT", nullptr, &Options::portName, "the port's id"};
constexpr OptionRow kName = {"NAME", nullptr, &Options::propName, "the property's name"};
constexpr OptionRow kUplink = {"UPLINK", nullptr, &Options::number, "the uplink's number"};
constexpr OptionRow kGlobal = {"--global", nullptr, &Options::global, "of the global list (the default)"};
constexpr OptionRow kHost = {"--host", nullptr, &Options::host, "of the host list"};
constexpr OptionRow kOfPort = {"--port", "ID", &Options::portId, "of this port, by id or alias"};
constexpr OptionRow kValue = {"VALUE", nullptr, &Options::value, "the value, or @PATH for a file's bytes"};
constexpr OptionRow kFile = {"--file", "PATH", &Options::file,
                             "the file's bytes are the value; - is standard input"};
constexpr OptionRow kAs = {"--as", "FORM", &Options::as,
                           "how VALUE is meant: text, number (four bytes), hex, json"};
constexpr OptionRow kType = {"--type", "WORD", &Options::type,
                             "the type word (default: 0x10 for known properties, else 0x20)"};
constexpr OptionRow kOnlyType = {"--type", "WORD", &Options::type,
                                 "only entries of this type (default: 0x20, then 0x10)"};
constexpr OptionRow kMayExist = {"--may-exist", nullptr, &Options::mayExist,
                                 "one that is there already is no error, and stays as it is"};
constexpr OptionRow kReplace = {"--may-exist", nullptr, &Options::mayExist,
                                "replace a value that is there (this is the default)"};
constexpr OptionRow kDryRun = {"--dry-run", nullptr, &Options::dryRun,
                               "show what would change, and change nothing"};
constexpr OptionRow kRaw = {"--raw", nullptr, &Options::raw, "the bytes as they are"};
constexpr OptionRow kFull = {"--full", nullptr, &Options::full, "long values whole"};
constexpr OptionRow kKind = {"--kind", "KIND", &Options::kind, "active, shadow, zombie or local-cache"};

constexpr OptionRow kSwitchAddOptions[] = {
    {"SWITCH", nullptr, &Options::switchName, "the switch's id"},
    {"--class", "NAME", &Options::className, "its class, as etherswitch"},
    {"--max-ports", "N", &Options::maxPorts, "its port limit"},
    {"--switch-version", "N", &Options::switchVersion, "its version number"},
    kMayExist,
    kDryRun,
};
constexpr OptionRow kSwitchOptions[] = {kSwitch, kDryRun};
constexpr OptionRow kVersionOptions[] = {
    kSwitch, {"VERSION", nullptr, &Options::number, "4 to 12, 100, or 107 to 112"}, kDryRun};
constexpr OptionRow kMaxPortsOptions[] = {
    kSwitch, {"PORTS", nullptr, &Options::number, "the new limit"}, kDryRun};
constexpr OptionRow kPropGetOptions[] = {
    kSwitch, kName, kGlobal, kHost, kOfPort, {"--smartnic", nullptr, &Options::smartNic, "ask the SmartNIC"},
    kRaw,    kFull};
constexpr OptionRow kPropSetOptions[] = {kSwitch, kName, kValue, kGlobal,  kHost,   kOfPort,
                                         kAs,     kFile, kType,  kReplace, kDryRun, kFull};
constexpr OptionRow kPropClearOptions[] = {kSwitch, kName, kGlobal, kHost, kOfPort, kDryRun, kFull};
constexpr OptionRow kPortAddOptions[] = {
    kSwitch,   kNewPort,
    kKind,     {"--file", "PATH", &Options::file, "its properties: a port in JSON, or a serialized list"},
    kMayExist, kDryRun};
constexpr OptionRow kPortOptions[] = {kSwitch, kPort, kDryRun};
constexpr OptionRow kPortFindOptions[] = {kSwitch, kPort};
constexpr OptionRow kPortStateOptions[] = {
    kSwitch,
    kPort,
    {"--persistent", nullptr, &Options::persistent, "only what is worth keeping"},
    kRaw,
    kFull};
constexpr OptionRow kUplinkGetOptions[] = {kSwitch, kPort, kUplink, kRaw, kFull};
constexpr OptionRow kUplinkSetOptions[] = {kSwitch, kPort, kUplink,  kValue,  kAs,
                                           kFile,   kType, kReplace, kDryRun, kFull};
constexpr OptionRow kStateOptions[] = {kDryRun, kFull};
constexpr OptionRow kPortsOptions[] = {
    kSwitch, {"--kind", "KIND", &Options::kind, "only active, shadow, zombie or local-cache ports"}};
constexpr OptionRow kVendorOptions[] = {kSwitch, kGlobal, kHost, kOfPort, kOnlyType, kFull};
constexpr OptionRow kExtraOptions[] = {kSwitch, kOfPort, kOnlyType, kFull};
constexpr OptionRow kOverlayOptions[] = {kSwitch, kGlobal, kHost, kOnlyType, kFull};
constexpr OptionRow kFindOptions[] = {
    kSwitch, {"EXTERNAL-ID", nullptr, &Options::text, "the id that the port's virtual adapter carries"}};
constexpr OptionRow kExecOptions[] = {
    {"SWITCH", nullptr, &Options::switchName, "a switch's id or alias; '' for the module itself"},
    {"TEXT", nullptr, &Options::text, "the module's own command"},
    {"--file", "PATH", &Options::file, "the command's input"},
    kRaw,
    kDryRun,
};

constexpr Command kCommands[] = {
    {"kernel switch add", "Add a switch to the module", kSwitchAddOptions, "",
     "  dvsctl kernel switch add dvs-1 --class etherswitch --max-ports 512 --switch-version 8\n",
     RunKernelSwitchAdd},
    {"kernel switch remove", "Remove a switch with its ports", kSwitchOptions, "",
     "  dvsctl kernel switch remove dvs-1 --dry-run\n"
     "  dvsctl kernel switch remove dvs-1 --if-exists\n",
     RunKernelSwitchRemove},
    {"kernel switch associate", "Associate a switch with the host's networking", kSwitchOptions, "",
     "  dvsctl kernel switch associate production\n", RunKernelSwitchAssociate},
    {"kernel switch dissociate", "Take a switch's association back", kSwitchOptions, "",
     "  dvsctl kernel switch dissociate production\n", RunKernelSwitchDissociate},
    {"kernel switch set-version", "Set a switch's version", kVersionOptions, "",
     "  dvsctl kernel switch set-version production 12\n", RunKernelSwitchSetVersion},
    {"kernel switch set-max-ports", "Set a switch's port limit", kMaxPortsOptions, "",
     "  dvsctl kernel switch set-max-ports production 1024\n", RunKernelSwitchSetMaxPorts},
    {"kernel prop get", "Read a property", kPropGetOptions, "",
     "  dvsctl kernel prop get production com.orbeno.common.portset.mtu\n"
     "  dvsctl kernel prop get production com.orbeno.etherswitch.port.vlan --port web-1\n"
     "  dvsctl kernel prop get production com.orbeno.common.version --smartnic\n"
     "  dvsctl kernel prop get production x.blob --raw > blob\n",
     RunKernelPropGet},
    {"kernel prop set", "Set a property", kPropSetOptions,
     "A property that the config store knows takes VALUE as its store field: a number, a text, true, or "
     "JSON\n"
     "(docs/properties.md). For any other, VALUE is text, and what could be a number too wants --as. JSON "
     "is\n"
     "then the form that `show --json` gives values: {\"hex\": \"01ff\"}.\n",
     "  dvsctl kernel prop set production com.orbeno.common.portset.mtu 9000\n"
     "  dvsctl kernel prop set production com.orbeno.etherswitch.port.vlan '{\"vlan_id\": 100}' --port "
     "web-1\n"
     "  dvsctl kernel prop set production com.orbeno.extraconfig.site.owner 'Network team'\n"
     "  dvsctl kernel prop set production x.limit 1500 --as number --host\n"
     "  dvsctl kernel prop set production x.blob @blob --type 0x18 --dry-run\n",
     RunKernelPropSet},
    {"kernel prop clear", "Remove a property", kPropClearOptions, "",
     "  dvsctl kernel prop clear production com.orbeno.common.port.block --port web-1 --if-exists\n",
     RunKernelPropClear},
    {"kernel port add", "Add a port to a switch", kPortAddOptions,
     "The JSON of a port is what `show --json` lists under \"ports\".\n",
     "  dvsctl kernel port add production 77\n"
     "  echo '{\"properties\": [{\"name\": \"com.orbeno.common.port.alias\", \"value\": \"web-9\"}]}' |\n"
     "    dvsctl kernel port add production 78 --file -\n"
     "  dvsctl kernel port add production 79 --kind shadow --may-exist\n",
     RunKernelPortAdd},
    {"kernel port remove", "Remove a port from a switch", kPortOptions, "",
     "  dvsctl kernel port remove production 77\n", RunKernelPortRemove},
    {"kernel port find", "Ask whether the module has a port", kPortFindOptions,
     "Exit status 4 when it does not.\n", "  dvsctl kernel port find production web-1 --quiet && echo yes\n",
     RunKernelPortFind},
    {"kernel port state", "List a port's properties", kPortStateOptions,
     "Columns: name, type, size, value.\n",
     "  dvsctl kernel port state production web-1\n"
     "  dvsctl kernel port state production web-1 --persistent --json\n"
     "  dvsctl kernel port state production web-1 --raw > port.list\n",
     RunKernelPortState},
    {"kernel uplink get", "Read the data that a port keeps for an uplink", kUplinkGetOptions, "",
     "  dvsctl kernel uplink get production web-1 0\n", RunKernelUplinkGet},
    {"kernel uplink set", "Set the data that a port keeps for an uplink", kUplinkSetOptions, "",
     "  dvsctl kernel uplink set production web-1 0 7 --as number\n", RunKernelUplinkSet},
    {"kernel ports", "List a switch's ports with their connection ids", kPortsOptions,
     "Columns: port, kind, connection.\n",
     "  dvsctl kernel ports production\n"
     "  dvsctl kernel ports production --kind active --columns port --no-headings\n",
     RunKernelPorts},
    {"kernel vendor-props", "List properties that are not the platform's own", kVendorOptions,
     "Columns: name, type, size, value.\n",
     "  dvsctl kernel vendor-props production --host\n"
     "  dvsctl kernel vendor-props production --port web-1\n",
     RunKernelVendorProps},
    {"kernel extra-props", "List extra-configuration properties", kExtraOptions,
     "Columns: name, type, size, value.\n", "  dvsctl kernel extra-props production --columns name,value\n",
     RunKernelExtraProps},
    {"kernel overlay-props", "List the overlay network's properties", kOverlayOptions,
     "Columns: name, type, size, value.\n", "  dvsctl kernel overlay-props production --host\n",
     RunKernelOverlayProps},
    {"kernel find-external-id", "Find a port by its virtual adapter's external id", kFindOptions,
     "The first port whose stored id is a leading part of the one asked for. Exit status 4 when none is.\n",
     "  dvsctl kernel find-external-id production 4f0c-11\n", RunKernelFindExternalId},
    {"kernel exec", "Send a text command of the module's own", kExecOptions, "",
     "  dvsctl kernel exec '' help\n"
     "  dvsctl kernel exec production ports\n"
     "  dvsctl kernel exec '' 'fault command=19,nth=3,status=0x0bad0014'\n",
     RunKernelExec},
    {"kernel state sanitize", "Remove the zombie and local-cache ports of every switch", kStateOptions, "",
     "  dvsctl kernel state sanitize --dry-run\n", RunKernelStateSanitize},
    {"kernel state cleanup", "Remove every switch from the module", kStateOptions,
     "To fill it instead, copy a state to kernel:.\n",
     "  dvsctl copy kernel: before.db && dvsctl kernel state cleanup\n", RunKernelStateCleanup},
};

} // namespace

std::span<const Command> KernelCommands() {
    return kCommands;
}

} // namespace dvs::ctl
