#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Checks that includes point down only.

Usage: layers_check.py SOURCE_DIR
       layers_check.py --self-test

LAYERS has a row for every folder with sources: what its files may include besides the public headers and the folder
itself. "platform" means the contract headers in platform/include: nothing above them knows which host is below. A
folder without a row is a fault, so a new one is placed by whoever adds it.
"""

import pathlib
import re
import sys
import tempfile

LIBRARY = ["base", "dvsdata", "dvsstate", "dvsfile", "kernel", "configstore", "platform"]
LAYERS = {
    # from the bottom up; an entry with a slash is one header
    "include/dvs": [],
    "base": [],
    "platform/include": [],
    "platform/embedded": ["base", "platform"],
    "platform/host": ["base", "platform"],
    "dvsdata": ["base"],
    "dvsstate": ["base", "dvsdata", "platform"],
    "dvsfile": ["base", "dvsdata", "platform"],
    "kernel": ["base", "dvsdata", "dvsstate", "dvsfile", "platform"],
    "configstore": ["base", "dvsdata", "dvsstate", "dvsfile", "kernel", "platform"],
    "form": LIBRARY,
    "emulator": LIBRARY + ["platform/embedded/emulator_wire.h", "platform/embedded/host_limits.h"],
    "tools/dvsctl": LIBRARY + ["form", "platform/embedded/configstore/admin.h", "platform/embedded/configstore/log.h"],
    "tools/propdoc": LIBRARY + ["form"],
    "examples": [],
    "bench": LIBRARY + ["form", "emulator", "platform/embedded", "tests"],
    "tests": None,  # may look behind every header
}
# Found by their folder's own include path.
OWN_NAMES = {"platform/include": "platform"}
SUFFIXES = (".h", ".hpp", ".cpp", ".c")
INCLUDE = re.compile(r'^\s*#\s*include\s+"([^"]+)"', re.M)
NOT_SOURCES = {"build", "docs", "cmake"}


def folder_of(path):
    """The row for a file, by its path from the root: the longest that fits; None when there is none."""
    fitting = [folder for folder in LAYERS if path.startswith(folder + "/")]
    return max(fitting, key=len, default=None)


def target_of(included, source):
    """The file that an include means, as a path from the root; None when there is no such file."""
    for root in ("", "include/", "platform/include/", "tests/"):
        if (source / root / included).is_file():
            return root + included
    return None


def fault_of(folder, included, source):
    if LAYERS[folder] is None:
        return None
    if "/" not in included:
        return "is not a path from the root, which would name its layer"
    target = target_of(included, source)
    if target is None:
        return "does not exist"
    below = folder_of(target)
    if below in (folder, "include/dvs") or included in LAYERS[folder]:
        return None
    if OWN_NAMES.get(below, below) in LAYERS[folder]:
        return None
    return "points up"


def check(source):
    """Faults as lines, and the number of files read."""
    faults, files = [], 0
    for path in sorted(source.rglob("*")):
        name = path.relative_to(source).as_posix()
        if path.suffix not in SUFFIXES or name.split("/")[0] in NOT_SOURCES or name.startswith("."):
            continue
        files += 1
        folder = folder_of(name)
        if folder is None:
            faults.append(f"{name} is in a folder without a layer")
            continue
        for included in INCLUDE.findall(path.read_text(encoding="utf-8")):
            fault = fault_of(folder, included, source)
            if fault:
                faults.append(f"{name} includes {included}, which {fault}")
    return faults, files


GOOD = {
    "include/dvs/data.h": "",
    "base/hash.h": "",
    "platform/include/platform/runtime.h": "",
    "platform/embedded/text.cpp": '#include "platform/runtime.h"\n#include "base/hash.h"\n',
    "platform/embedded/configstore/admin.h": '#include "dvs/data.h"\n',
    "dvsdata/list.h": '#include "dvs/data.h"\n#include "base/hash.h"\n',
    "dvsstate/table.h": '#include "dvsdata/list.h"\n#include "platform/runtime.h"\n',
    "configstore/save.cpp": '#include "dvsstate/table.h"\n',
    "form/model.h": '#include "dvsstate/table.h"\n#include <string>\n',
    "tools/dvsctl/show.cpp": '#include "form/model.h"\n#include "platform/embedded/configstore/admin.h"\n',
    "tests/support/kit.h": "",
    "tests/any_test.cpp": '#include "any_support.h"\n#include "platform/embedded/configstore/admin.h"\n',
}
BAD = {
    "dvsdata/bad.cpp": '#include "dvsstate/table.h"\n',
    "dvsdata/seam.cpp": '#include "platform/runtime.h"\n',
    "base/bad.h": '#include "dvsdata/list.h"\n',
    "include/dvs/bad.h": '#include "base/hash.h"\n',
    "dvsstate/bad.cpp": '  #  include "form/model.h"\n',
    "configstore/bad.cpp": '#include "platform/embedded/configstore/admin.h"\n',
    "platform/embedded/bad.cpp": '#include "dvsdata/list.h"\n',
    "form/bad.cpp": '#include "tools/dvsctl/show.cpp"\n',
    "tools/dvsctl/bad.cpp": '#include "platform/embedded/text.cpp"\n',
    "tools/dvsctl/short.cpp": '#include "show.cpp"\n',
    "kernel/bad.cpp": '#include "support/kit.h"\n',
    "kernel/missing.cpp": '#include "kernel/nothing.h"\n',
    "newcomer/good.cpp": "",
}


def self_test():
    """Each good file passes beside the others, each bad one is reported, alone."""
    with tempfile.TemporaryDirectory() as directory:
        source = pathlib.Path(directory)

        def put(name, text):
            (source / name).parent.mkdir(parents=True, exist_ok=True)
            (source / name).write_text(text, encoding="utf-8")

        for name, text in GOOD.items():
            put(name, text)
        if check(source) != ([], len(GOOD)):
            return f"sound includes: {check(source)}"
        for name, text in BAD.items():
            put(name, text)
            faults, files = check(source)
            if len(faults) != 1 or not faults[0].startswith(name) or files != len(GOOD) + 1:
                return f"{name}: {faults}"
            (source / name).unlink()
    return None


def main():
    if sys.argv[1] == "--self-test":
        failure = self_test()
        print(failure or f"{len(BAD)} wrong includes: each is found")
        return 1 if failure else 0
    faults, files = check(pathlib.Path(sys.argv[1]))
    print("\n".join(faults) if faults else f"{files} files: every include points down")
    return 1 if faults or files == 0 else 0


if __name__ == "__main__":
    sys.exit(main())
