#!/bin/bash
# SPDX-License-Identifier: Apache-2.0
# From a bare machine to a first look: installs what is missing, builds, and takes the example site through a state
# file, verification, display, a change, the difference, and back. Works in a directory of its own and leaves nothing
# behind but build/release.
set -euo pipefail
from=$PWD
cd "$(dirname "$0")"

usage() {
    cat <<'EOF'
Usage: ./quickstart.sh [--built DIR]

Installs missing packages (apt, as root or through sudo), builds build/release, shows dvsctl at work.

  --built DIR    take the programs of this build directory, and install and build nothing
  --help         this text
EOF
}

build=
while [ $# -gt 0 ]; do
    case $1 in
    --built) build=$(cd "$from" && realpath "${2:?--built wants a directory}") && shift ;;
    --help | -h) usage && exit 0 ;;
    *) usage >&2 && exit 2 ;;
    esac
    shift
done

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

say() { printf '\n\033[1m== %s\033[0m\n' "$*"; }
[ -t 1 ] && [ -z "${NO_COLOR:-}" ] || say() { printf '\n== %s\n' "$*"; }
# Prints a command as one would type it, then runs it.
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

say "The example site, written as JSON, becomes a state file"
run copy json:site-basic.json site.db

say "Every nested buffer of it is checked"
run verify site.db

say "What is in it: the storage switch"
run show site.db --switch storage

say "One setting of every switch and port, one line each"
run show site.db --props '*.alias' --columns switch,port,kind,value

say "A site with more to it, written in typed fields: trunks, teaming, shaping, mirroring, pools"
run copy json:site.json campus.db
run show campus.db --switch campus --port web-1

say "What one of these properties is, and where its bytes are"
run props com.orbeno.etherswitch.port.vlan

say "Another VLAN for web-1: compared by meaning, then by bytes"
sed 's/"vlan_id": 100/"vlan_id": 150/' site.json >moved.json
run diff json:site.json json:moved.json && exit 1 || [ $? -eq 1 ] # 1: they differ, as they should
run diff json:site.json json:moved.json --raw && exit 1 || [ $? -eq 1 ]

say "A state of any size for trials: realistic, every known property, the same for the same seed"
run generate --switches 4 --ports 100 --seed 7 trial.db
run show trial.db --props '*.vlan' --columns port,value --no-headings | head -n 8 || true

say "The first bytes of the smaller site, and what they are"
run hexdump site.db | head -n 24 || true

say "A colleague edits a copy: larger frames, a port unblocked, a new port"
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

say "What the edit would change, without changing it"
run copy --dry-run json:edit.json site.db

say "The edit goes to a state file of its own; the difference to the first one"
run copy json:edit.json edited.db
run diff site.db edited.db && exit 1 || [ $? -eq 1 ] # 1: they differ, as they should

say "And back: state file to JSON to state file gives the same bytes"
run copy site.db json:back.json
run copy json:back.json back.db
cmp site.db back.db
echo "site.db and back.db are equal, byte for byte."

say "One wrong byte in the name of port nfs-b: recognised, and located"
cp site.db damaged.db
offset=$(grep -abo nfs-b damaged.db | head -n 1 | cut -d: -f1)
printf 'X' | dd of=damaged.db bs=1 seek="$offset" conv=notrunc status=none
run verify damaged.db && exit 1 || [ $? -eq 6 ] # 6: malformed

say "The main job: the state file goes into a fresh config store, in one transaction"
export DVS_CONFIGSTORE=$work/configstore.db
run copy --dry-run site.db store: | head -n 3
run copy site.db store:
run verify store:
run store list

say "The store keeps typed fields: the port web-1 as it reads them"
run show store: --switch production --port web-1
run schema ports.settings | head -n 8

say "Loaded back, the state is the same but for what a round trip changes by design"
run copy store: loaded.db
run diff site.db loaded.db --ignore-types --switch production && exit 1 || [ $? -eq 1 ]
cat <<'TEXT'
Why (docs/config-store.md has the whole table):
- Switches of these classes have the host's port limit, and that is what is saved of them.
- The MTU is one field of the store, and every property that stands for it is loaded from there.
- A store has one object for each port id, and no kinds: shadow, zombie and local-cache ports come back as active ones,
  and of two ports with one id the later one's settings win ("web-3").
- Flags are booleans there; as texts they come back with the bytes that their readers have always been given.
- What is loaded is of the type that the store's settings have (left out of this difference by --ignore-types).
TEXT
run copy loaded.db store:again.db
run diff loaded.db store:again.db --switch production # nothing more changes the second time

say "The colleague's edit is saved too; the store remembers what was before"
run copy --dry-run edited.db store:
run copy edited.db store:
run store history
run store restore --revision 1 --dry-run
run store restore --revision 1
run diff loaded.db store:

say "A live switching module: the emulator, started on the example's state file"
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

say "Changes to the live module: one VLAN, one new port"
run kernel prop set production com.orbeno.etherswitch.port.vlan '{"vlan_id": 100}' --port web-1 --dry-run
run kernel prop set production com.orbeno.etherswitch.port.vlan '{"vlan_id": 100}' --port web-1
run kernel port add production 77
run kernel ports production

say "The live state goes into the store; what that changed there"
run copy kernel: store:
run diff saved.db store: && exit 1 || [ $? -eq 1 ]

say "Loaded back into an emptied module"
run kernel state cleanup
run copy store: kernel:
run kernel prop get production com.orbeno.etherswitch.port.vlan --port web-1
kill "$module"
wait "$module" # it saves its state and ends with 0

printf '\nThat was dvsctl. Next: %s --help, README.md, docs/json-form.md; ./test.sh runs the tests.\n' "${dvsctl#"$root"/}"
