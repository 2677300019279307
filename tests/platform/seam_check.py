#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Checks that the platform archive can be replaced header by header.

Usage: seam_check.py NM ARCHIVE HEADER...

The archive must define every function that a contract header declares, in a member that defines only functions of
that header. Only then can a program define its own set and take the rest from the archive.
"""

import re
import subprocess
import sys

DECLARATION = re.compile(r"^[A-Za-z_][\w:<>* ]*?\*{0,3}\b(\w+)\((?!\*)[^;{]*\)(?:\s*__attribute__\s*\(\(.*\)\))?;", re.M)
STRONG = set("TDBRSC")


def declared(path):
    text = re.sub(r"/\*.*?\*/|//[^\n]*", "", open(path, encoding="utf-8").read(), flags=re.S)
    one_per_line = re.sub(r";\s*", ";\n", text)
    return set(DECLARATION.findall(one_per_line))


def members(nm, archive):
    """Each member with the plain names it defines for others. Names of templates and inline functions are weak."""
    out = subprocess.run([nm, "-g", "--defined-only", "-C", archive], check=True, capture_output=True, text=True).stdout
    found, member = {}, None
    for line in out.splitlines():
        if line.endswith(":"):
            member = line[:-1]
            found[member] = set()
        elif line.strip():
            _, kind, name = line.split(None, 2)
            if kind in STRONG:
                found[member].add(name.split("(")[0].split("::")[-1] if name.startswith("configstore::")
                                  else name.split("(")[0])
    return found


def main():
    nm, archive, headers = sys.argv[1], sys.argv[2], sys.argv[3:]
    contracts = {header: declared(header) for header in headers}
    found = members(nm, archive)
    faults = []
    for header, names in contracts.items():
        if not names:
            faults.append(f"{header}: no function found in it")
        defined = set()
        for member, symbols in found.items():
            if not symbols & names:
                continue
            defined |= symbols & names
            for other in sorted(symbols - names):
                faults.append(f"{member}: defines {other} beside functions of {header}")
        for name in sorted(names - defined):
            faults.append(f"{header}: {name} is not in the archive")
    print("\n".join(faults) if faults else f"{len(headers)} headers, {len(found)} members: sound")
    return 1 if faults else 0


if __name__ == "__main__":
    sys.exit(main())
