#!/bin/bash
# SPDX-License-Identifier: Apache-2.0
# From a bare machine to a first tour: installs missing packages, builds, and takes the example site through a state file,
# verification, display, a change, a comparison, and back. Works in a temporary directory and leaves only build/release
# behind.
set -euo pipefail
from=$PWD
cd "$(dirname "$0")"

usage() {
    cat <<'EOF'
Usage: ./quickstart.sh [--built DIR]

Installs missing packages (apt, as root or through sudo), builds build/release, then demonstrates dvsctl.

  --built DIR    use the programs of this build directory; install and build nothing
  --help         print this help
EOF
}

build=
while [ $# -gt 0 ]; do
    case $1 in
    --built) build=$(cd "$from" && realpath "${2:?--built requires a directory}") && shift ;;
    --help | -h) usage && exit 0 ;;
    *) usage >&2 && exit 2 ;;
    esac
    shift
done

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

say() { printf '\n\033[1m== %s\033[0m\n' "$*"; }
[ -t 1 ] && [ -z "${NO_COLOR:-}" ] || say() { printf '\n== %s\n' "$*"; }
# Prints a command as a user would type it, then runs it.
run() {
    local word line=
    for word in "$@"; do
        case $word in
        *[!A-Za-z0-9_.,:/=@%+-]*) line+=" '$word'" ;;
        *) line+=" $word" ;;
        esac
    done
    printf '$ dvsctl%s\n' "$line"
    "$dvsctl" "$@" --no-pager
}

if [ -z "$build" ]; then
    build=$PWD/build/release
    cmake/install-packages.sh
    say "Building build/release (the first time takes a few minutes)"
    cmake --preset release >"$work/configure.log" 2>&1 || { cat "$work/configure.log" >&2; exit 1; }
    cmake --build --preset release --target dvs dvsctl dvs-emulator -- --quiet
fi
dvsctl=$build/bin/dvsctl
emulator=$build/bin/dvs-emulator
root=$PWD
cp examples/site-basic.json examples/site.json "$work/"
cd "$work"

say "Convert the example site from JSON to a state file"
run copy json:site-basic.json site.db

say "Verify every nested buffer"
run verify site.db

say "Show the storage switch"
run show site.db --switch storage

say "List one setting of every switch and port"
run show site.db --props '*.alias' --columns switch,port,kind,value

say "Convert a larger site with typed fields: trunks, teaming, shaping, mirroring, pools"
run copy json:site.json campus.db
run show campus.db --switch campus --port web-1

say "Describe one of these properties and its byte layout"
run props com.orbeno.etherswitch.port.vlan

say "Change the VLAN of web-1; compare by meaning, then by bytes"
sed 's/"vlan_id": 100/"vlan_id": 150/' site.json >moved.json
run diff json:site.json json:moved.json && exit 1 || [ $? -eq 1 ] # 1: they differ, as expected
run diff json:site.json json:moved.json --raw && exit 1 || [ $? -eq 1 ]

say "Generate a test state: realistic, any size, every known property, reproducible by seed"
run generate --switches 4 --ports 100 --seed 7 trial.db
run show trial.db --props '*.vlan' --columns port,value --no-headings | head -n 8 || true

say "Annotate the first bytes of the smaller site"
run hexdump site.db | head -n 24 || true

say "Edit a copy: larger frames, one port unblocked, one new port"
run copy site.db json:edit.json
python3 - edit.json <<'PYTHON'
import json
import sys

path = sys.argv[1]
with open(path, encoding="utf-8") as file:
    site = json.load(file)
storage = site["switches"][1]
for setting in storage["global"]:
    if setting["name"].endswith(".mtu"):
        setting["value"] = 9000
for port in storage["ports"]:
    if port["id"] == "105":
        port["properties"] = [p for p in port["properties"] if not p["name"].endswith(".block")]
storage["ports"].append({
    "id": "107",
    "properties": [{"name": "com.orbeno.common.port.alias", "type": 16, "value": "nfs-c"}],
})
with open(path, "w", encoding="utf-8") as file:
    json.dump(site, file, ensure_ascii=False)
PYTHON

say "Preview the edit (dry run)"
run copy --dry-run json:edit.json site.db

say "Write the edit to a second state file and compare the two"
run copy json:edit.json edited.db
run diff site.db edited.db && exit 1 || [ $? -eq 1 ] # 1: they differ, as expected

say "Round trip: state file to JSON to state file gives the same bytes"
run copy site.db json:back.json
run copy json:back.json back.db
cmp site.db back.db
echo "site.db and back.db are equal, byte for byte."

say "Corrupt one byte in the name of port nfs-b: verify detects and locates it"
cp site.db damaged.db
offset=$(grep -abo nfs-b damaged.db | head -n 1 | cut -d: -f1)
printf 'X' | dd of=damaged.db bs=1 seek="$offset" conv=notrunc status=none
run verify damaged.db && exit 1 || [ $? -eq 6 ] # 6: malformed

say "Save the state file to a new config store, in one transaction"
export DVS_CONFIGSTORE=$work/configstore.db
run copy --dry-run site.db store: | head -n 3
run copy site.db store:
run verify store:
run store list

say "Show port web-1 as the store holds it, in typed fields"
run show store: --switch production --port web-1
run schema ports.settings | head -n 8

say "Load the state back: it is the same except for intended round-trip changes"
run copy store: loaded.db
run diff site.db loaded.db --ignore-types --switch production && exit 1 || [ $? -eq 1 ]
cat <<'TEXT'
Why (docs/config-store.md has the full table):
- Switches of these classes have the host's port limit, so the save writes that limit.
- The store has one MTU field; every property for the MTU is loaded from it.
- A store has one object per port id and no port kinds: shadow, zombie and local-cache ports come back as active ones.
  If two ports have the same id, the later one's settings win ("web-3").
- The store keeps flags as booleans; text flags come back in the fixed form that their readers expect.
- Loaded properties have the type of the store's settings (--ignore-types hides this difference).
TEXT
run copy loaded.db store:again.db
run diff loaded.db store:again.db --switch production # the second round trip changes nothing

say "Save the edit too; the store keeps the previous version"
run copy --dry-run edited.db store:
run copy edited.db store:
run store history
run store restore --revision 1 --dry-run
run store restore --revision 1
run diff loaded.db store:

say "Start the emulator, a live switching module, with the example's state file"
cp site.db module.db
export DVS_EMULATOR=$work/module.socket DVS_CONFIGSTORE=$work/live.db
"$emulator" --socket "$DVS_EMULATOR" --state module.db >ready &
module=$!
trap 'kill "$module" 2>/dev/null || true; rm -rf "$work"' EXIT
until [ -s ready ]; do kill -0 "$module" && sleep 0.1; done
cat ready
run verify kernel:
run copy kernel: store:
run copy store: saved.db

say "Change the live module: one VLAN, one new port"
run kernel prop set production com.orbeno.etherswitch.port.vlan '{"vlan_id": 100}' --port web-1 --dry-run
run kernel prop set production com.orbeno.etherswitch.port.vlan '{"vlan_id": 100}' --port web-1
run kernel port add production 77
run kernel ports production

say "Save the live state to the store and show what changed"
run copy kernel: store:
run diff saved.db store: && exit 1 || [ $? -eq 1 ]

say "Load it back into an empty module"
run kernel state cleanup
run copy store: kernel:
run kernel prop get production com.orbeno.etherswitch.port.vlan --port web-1
kill "$module"
wait "$module" # it saves its state and exits with 0

printf '\nEnd of the dvsctl tour. Next: %s --help, README.md, docs/json-form.md; ./test.sh runs the tests.\n' "${dvsctl#"$root"/}"
