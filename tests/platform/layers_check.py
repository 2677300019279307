#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Checks that includes point down only.

Usage: layers_check.py SOURCE_DIR

The table has, for each folder of the library, what it may include besides the public headers and itself. Of the
platform that is the contract headers: nothing above the seam knows which host is below it.
"""

import pathlib
import re
import sys

LAYERS = {
    # folder: folders below it
    "include/dvs": [],
    "platform/include": [],
    "base": [],
    "dvsdata": ["base"],
    "dvsstate": ["base", "dvsdata", "platform"],
    "dvsfile": ["base", "dvsdata", "platform"],
    "kernel": ["base", "dvsdata", "dvsstate", "dvsfile", "platform"],
    "configstore": ["base", "dvsdata", "dvsstate", "dvsfile", "kernel", "platform"],
    "platform/embedded": ["base", "platform"],
    "form": ["base", "dvsdata", "dvsstate", "dvsfile", "kernel", "configstore", "platform"],
}
INCLUDE = re.compile(r'^\s*#\s*include\s+"([^"]+)"', re.M)


def may_include(folder, included, source):
    top = included.split("/")[0]
    if "/" not in included:
        return False  # the path from the root says which layer it is
    if top == "dvs":
        return True
    if included.startswith(folder + "/"):
        return True
    if top == "platform":
        return top in LAYERS[folder] and (source / "platform/include" / included).is_file()
    return top in LAYERS[folder]


def main():
    source = pathlib.Path(sys.argv[1])
    faults, files = [], 0
    for folder in LAYERS:
        for path in sorted((source / folder).rglob("*")):
            if path.suffix not in (".h", ".cpp", ".c"):
                continue
            files += 1
            for included in INCLUDE.findall(path.read_text(encoding="utf-8")):
                if not may_include(folder, included, source):
                    faults.append(f"{path.relative_to(source)} includes {included}")
    print("\n".join(faults) if faults else f"{files} files: every include points down")
    return 1 if faults or files == 0 else 0


if __name__ == "__main__":
    sys.exit(main())
