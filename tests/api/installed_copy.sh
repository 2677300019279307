#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
# installed_copy.sh CMAKE BUILD_DIR LIBDIR CC SOURCE [FLAGS…]: a C program compiles, links and
# runs against an installed copy alone, as with a package of the library.
set -eu
cmake=$1 build=$2 libdir=$3 cc=$4 source=$5
shift 5
prefix=$(mktemp -d)
trap 'rm -rf "$prefix"' EXIT
"$cmake" --install "$build" --prefix "$prefix" >/dev/null
"$cc" -std=c11 -Wall -Wextra -Wpedantic -Werror "$@" "-I$prefix/include" "$source" -o "$prefix/program" \
    "-L$prefix/$libdir" -ldvs "-Wl,-rpath,$prefix/$libdir" "-Wl,-rpath-link,$prefix/$libdir"
"$prefix/program"
