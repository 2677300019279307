/* SPDX-License-Identifier: Apache-2.0 */
// The rows of the verbs that are about a config store, for the table of verbs (commands.cpp).

#include "tools/dvsctl/cli/command.h"
#include "tools/dvsctl/cli/commands.h"

namespace dvs::ctl {

namespace {

// Rows that several verbs share.
constexpr OptionRow kStore = {"--store", "PATH", &Options::store,
                              "the store's database (default: DVS_CONFIGSTORE or the host's own)"};
constexpr OptionRow kLayer = {"--layer", "LAYER", &Options::layer, "current (the default) or desired"};
constexpr OptionRow kOnlyLayer = {"--layer", "LAYER", &Options::layer, "only current or only desired"};
constexpr OptionRow kSwitch = {"SWITCH", nullptr, &Options::source, "a switch's id or name"};
constexpr OptionRow kOnlySwitch = {"--switch", "ID", &Options::switchId, "the same as SWITCH"};
constexpr OptionRow kDryRun = {"--dry-run", nullptr, &Options::dryRun,
                               "show what would change, and change nothing"};
constexpr OptionRow kFull = {"--full", nullptr, &Options::full, "long values whole"};

constexpr OptionRow kListOptions[] = {kStore, kOnlyLayer};
constexpr OptionRow kExportOptions[] = {
    kSwitch,
    {"FILE", nullptr, &Options::name, "where the document goes (default: standard output)"},
    {"--revision", "N", &Options::revision, "the document that the switch had as of this revision"},
    kStore,
    kLayer,
};
constexpr OptionRow kImportOptions[] = {
    {"FILE", nullptr, &Options::source, "the document; - is standard input"},
    {"--switch", "ID", &Options::switchId, "whose it is (default: the document's \"uuid\")"},
    kStore,
    kLayer,
    kDryRun,
    {"--may-exist", nullptr, &Options::mayExist, "replace the switch's document (this is the default)"},
    {"--no-replace", nullptr, &Options::noReplace, "refuse when the store holds the switch already"},
    kFull,
};
constexpr OptionRow kDeleteOptions[] = {kSwitch, kStore, kLayer, kDryRun};
constexpr OptionRow kHistoryOptions[] = {
    {"SWITCH", nullptr, &Options::name, "only this switch, by id or name"},
    kOnlySwitch,
    kStore,
    kOnlyLayer,
};
constexpr OptionRow kRestoreOptions[] = {
    {"SWITCH", nullptr, &Options::name, "only this switch, by id or name (default: the whole store)"},
    kOnlySwitch,
    {"--revision", "N", &Options::revision, "as of this revision; 0 is the empty store"},
    kStore,
    kLayer,
    kDryRun,
    kFull,
};
constexpr OptionRow kBackupOptions[] = {
    {"TO", nullptr, &Options::target, "the file to make"},
    {"--may-exist", nullptr, &Options::mayExist, "replace the file when it is there"},
    kStore,
    kDryRun,
};
constexpr OptionRow kUpgradeOptions[] = {
    {"FILE", nullptr, &Options::source, "the state file of the older host"},
    kStore,
    kDryRun,
    kFull,
};
constexpr OptionRow kCheckOptions[] = {kStore};
constexpr OptionRow kSchemaOptions[] = {
    {"FIELD", nullptr, &Options::name, "a field's path, as ports.settings.vlan"},
};

constexpr Command kCommands[] = {
    {"store list", "List the objects of the config store", kListOptions,
     "Columns: switch, name, layer, revision, time, size, key, group, component. Times are UTC.\n",
     "  dvsctl store list\n"
     "  dvsctl store list --store /var/lib/dvs/configstore.db --json\n"
     "  dvsctl store list --columns switch,revision --no-headings\n",
     RunStoreList},
    {"store export", "Print a switch's document", kExportOptions,
     "The document as the store keeps it, indented. Edit it with any editor and import it again.\n",
     "  dvsctl store export production\n"
     "  dvsctl store export production before.json --revision 4\n"
     "  dvsctl store export production | jq .ports\n",
     RunStoreExport},
    {"store import", "Put a document into the store, checked", kImportOptions,
     "Refused, with the field, are members that the schema does not have, types, ranges and texts that it "
     "does not\n"
     "allow, keys that occur twice, and absurd depth. Then nothing is stored.\n",
     "  dvsctl store import production.json\n"
     "  dvsctl store import --dry-run production.json\n"
     "  dvsctl store import --layer desired production.json\n",
     RunStoreImport},
    {"store delete", "Delete a switch from the store", kDeleteOptions,
     "Its document goes into history. With --if-exists, a switch that is not there is no error.\n",
     "  dvsctl store delete production\n"
     "  dvsctl store delete --if-exists --dry-run production\n",
     RunStoreDelete},
    {"store history", "List what was saved, changed and deleted, the latest first", kHistoryOptions,
     "A revision is one transaction: a save of many switches is one. Events: added, changed, deleted; what "
     "is "
     "in the\n"
     "store now is marked. Columns: revision, time, event, switch, layer, size, present.\n",
     "  dvsctl store history\n"
     "  dvsctl store history production\n"
     "  dvsctl store history --json | jq '.events[0]'\n",
     RunStoreHistory},
    {"store restore", "Bring back a switch, or the whole store, as of a revision", kRestoreOptions,
     "One transaction: all of it or nothing. What is replaced goes into history, so a restore can be undone "
     "the same\n"
     "way.\n",
     "  dvsctl store restore --revision 3\n"
     "  dvsctl store restore --revision 3 --dry-run\n"
     "  dvsctl store restore production --revision 2\n",
     RunStoreRestore},
    {"store backup", "Copy the store's database while others write to it", kBackupOptions,
     "A whole, consistent copy with its history (mode 0600), durable when the verb is done. To bring it "
     "back, "
     "stop the\n"
     "writers, remove the database with its -wal and -shm files, and put the copy in its place.\n",
     "  dvsctl store backup /backup/configstore.db\n"
     "  dvsctl store backup --may-exist latest.db\n",
     RunStoreBackup},
    {"store upgrade", "Carry the identity of switches over from an older host's state file", kUpgradeOptions,
     "Writes name, id, port limit and port set of each switch that has a port set; everything else of such a "
     "switch is\n"
     "written anew by the next save. Other switches stay as they are.\n",
     "  dvsctl store upgrade /etc/orbeno/dvsdata.db\n"
     "  dvsctl store upgrade --dry-run old.db\n",
     RunStoreUpgrade},
    {"store check", "Check the database and every document in it", kCheckOptions,
     "Looks at the database's own structure and holds every document, past ones included, against the "
     "schema. "
     "Exit\n"
     "status 7 when something is wrong.\n",
     "  dvsctl store check\n"
     "  dvsctl store check --json | jq .problems\n",
     RunStoreCheck},
    {"schema", "Show the schema of the store's documents, or explain a field", kSchemaOptions,
     "The whole schema is a JSON Schema document. In a field's path, the ids of instances may be left out.\n",
     "  dvsctl schema > switches.schema.json\n"
     "  dvsctl schema settings\n"
     "  dvsctl schema ports.settings.vlan\n",
     RunSchema},
};

} // namespace

std::span<const Command> StoreCommands() {
    return kCommands;
}

} // namespace dvs::ctl
