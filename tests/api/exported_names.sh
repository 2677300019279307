#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
# exported_names.sh NM LIBRARY LIST: the library exports the names of the list, no more and no fewer.
set -eu
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
# Sanitizers and coverage add names; only the library's own names are compared.
"$1" -D --defined-only "$2" | awk '$2 != "A" { sub(/@.*/, "", $3); print $3 }' | LC_ALL=C sort >"$work/exported"
grep -E '^[A-Za-z_]' "$3" >"$work/listed"
LC_ALL=C sort -c "$work/listed"
diff -u "$work/listed" "$work/exported"
