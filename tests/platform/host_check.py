#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Checks the build for a host that has the real services (-DDVS_PLATFORM=host).

Usage: host_check.py CMAKE NM SOURCE_DIR LIBRARY_ARCHIVE C_COMPILER CXX_COMPILER [LINK_FLAG...]

Configures that build and compiles its own part, the device. The library's objects do not depend on the platform, so
the objects of this build are linked with that device. Only functions of the other contract headers may stay undefined.
The check fails if the library uses anything of the embedded platform.
"""

import pathlib
import subprocess
import sys
import tempfile

sys.dont_write_bytecode = True  # no cache files in the source tree
import seam_check  # noqa: E402

DEVICE = "device.h"


def dynamic_names(nm, library, which):
    """The plain names in a library's dynamic symbol table, without versions and parameters."""
    out = subprocess.run([nm, "-D", "-C", which, library], check=True, capture_output=True, text=True).stdout
    fields = (line.split(None, 2 if which == "--defined-only" else 1) for line in out.splitlines())
    return {field[-1].split("@")[0].split("(")[0] for field in fields if field[-2] not in ("w", "v")}


def undefined(nm, library):
    """Names that no linked library defines. A sanitizer's runtime defines many of the system's names."""
    names = dynamic_names(nm, library, "--undefined-only")
    for line in subprocess.run(["ldd", library], check=True, capture_output=True, text=True).stdout.splitlines():
        path = next((word for word in line.split() if word.startswith("/")), None)
        if path:
            names -= dynamic_names(nm, path, "--defined-only")
    # Names of the compiler itself.
    return {name for name in names if not name.startswith("__")}


def main():
    cmake, nm, source, archive, c_compiler, cxx_compiler, *flags = sys.argv[1:]
    headers = sorted(pathlib.Path(source, "platform/include/platform").glob("*.h"))
    contracts = {header.name: seam_check.declared(header) for header in headers}
    with tempfile.TemporaryDirectory() as work:
        subprocess.run([cmake, "-G", "Ninja", "-S", source, "-B", work, "-DDVS_PLATFORM=host", "-DDVS_WERROR=ON",
                        f"-DCMAKE_C_COMPILER={c_compiler}", f"-DCMAKE_CXX_COMPILER={cxx_compiler}"],
                       check=True, stdout=subprocess.DEVNULL)
        subprocess.run([cmake, "--build", work, "--target", "dvs_platform"], check=True, stdout=subprocess.DEVNULL)
        library = f"{work}/libhost.so"
        subprocess.run([cxx_compiler, *flags, "-shared", "-o", library, "-Wl,--whole-archive", archive,
                        f"{work}/lib/libdvsplatform.a", "-Wl,--no-whole-archive"], check=True)
        left = undefined(nm, library)
    expected = set()
    for header, names in contracts.items():
        if header != DEVICE:
            expected |= {f"configstore::{name}" if header == "configstore.h" else name for name in names}
    faults = [f"{name} is wanted, and no contract header has it" for name in sorted(left - expected)]
    if not left & expected:
        faults.append("nothing of the contracts is wanted: the check looks at the wrong thing")
    print("\n".join(faults) if faults else f"{len(left)} functions are left to the host: sound")
    return 1 if faults else 0


if __name__ == "__main__":
    sys.exit(main())
