#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
# Usage: released_names.sh SYMBOLS RELEASED_SYMBOLS
# Succeeds when every name of the first release is still in the list of exported names.
set -eu

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
grep -E '^[A-Za-z_]' "$1" | sort >"$work/now"
grep -E '^[A-Za-z_]' "$2" | sort >"$work/released"
[ -s "$work/released" ] || { echo "$2 has no names" >&2; exit 1; }
comm -13 "$work/now" "$work/released" >"$work/missing"
[ -s "$work/missing" ] || exit 0
echo "Exported by the first release and missing from $1:" >&2
cat "$work/missing" >&2
exit 1
