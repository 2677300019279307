#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
# Installs missing Debian packages of packages.txt. Used by quickstart.sh and test.sh.
set -eu

here=$(dirname "$0")
missing=
for package in $(sed 's/#.*//' "$here/packages.txt"); do
    dpkg-query -W -f '${Status}' "$package" 2>/dev/null | grep -q 'install ok installed' || missing="$missing $package"
done
[ -n "$missing" ] || exit 0

if ! command -v apt-get >/dev/null 2>&1; then
    echo "These packages are missing and there is no apt-get to install them with:$missing" >&2
    exit 1
fi
as_root=
if [ "$(id -u)" -ne 0 ]; then
    as_root=$(command -v sudo || true)
    if [ -z "$as_root" ]; then
        echo "These packages are missing; install them as root:$missing" >&2
        exit 1
    fi
fi
echo "Installing:$missing"
export DEBIAN_FRONTEND=noninteractive
log=$(mktemp)
trap 'rm -f "$log"' EXIT
# shellcheck disable=SC2086 # word splitting is intended
if ! { $as_root apt-get update -qq && $as_root apt-get install -y -qq --no-install-recommends $missing; } >"$log" 2>&1; then
    cat "$log" >&2
    exit 1
fi
