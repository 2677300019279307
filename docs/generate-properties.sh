#!/bin/bash
# SPDX-License-Identifier: Apache-2.0
# Writes docs/properties.md from the tables in configstore/. A test compares the file with the tables.
set -euo pipefail
cd "$(dirname "$0")/.."
preset=${1:-debug}
cmake --preset "$preset" >/dev/null
cmake --build --preset "$preset" --target propdoc -- --quiet
new=$(mktemp docs/.properties.XXXXXX)
trap 'rm -f "$new"' EXIT
"build/$preset/bin/propdoc" >"$new"
chmod 644 "$new"
mv "$new" docs/properties.md
